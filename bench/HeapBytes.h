#pragma once

#include <cstddef>

namespace bench
{

/// Bytes that are in use on the heap, of all threads, and those of the module's chunks of memory.
std::size_t heapBytes();

} // namespace bench
