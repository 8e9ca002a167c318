// What the allocator keeps behind large requests and results.
#pragma once

#include <cstddef>

#include <malloc.h>

namespace http
{

/// The allocator keeps what a large request or result needed, for each of its arenas anew.
inline void giveBackMemory(std::size_t bytes)
{
    constexpr std::size_t large = 1 << 20;
    if (bytes > large)
        malloc_trim(0);
}

} // namespace http
