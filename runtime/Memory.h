// Raw memory for the runtime's records. Nothing here throws: a process without memory ends in an assertion.
#pragma once

#include "runtime/Assert.h"

#include <cstddef>
#include <cstdlib>

namespace cimple
{

/// Uninitialised memory, aligned for every plain type; given back with std::free.
inline void* allocate(std::size_t size)
{
    void* block = std::malloc(size);
    CIMPLE_ASSERT(block != nullptr);
    return block;
}

inline void* allocate_zeroed(std::size_t size)
{
    void* block = std::calloc(1, size);
    CIMPLE_ASSERT(block != nullptr);
    return block;
}

inline void* reallocate(void* block, std::size_t size)
{
    block = std::realloc(block, size);
    CIMPLE_ASSERT(block != nullptr);
    return block;
}

} // namespace cimple
