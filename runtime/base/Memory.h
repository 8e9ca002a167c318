// Raw memory for the runtime's records, aligned for what a slot holds. Where there is none, std::bad_alloc is thrown:
// the operation fails, the process goes on.
#pragma once

#include "runtime/base/Bulk.h"

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <new>

namespace cimple
{

namespace detail
{

inline void* require(void* block)
{
    return block ? block : throw std::bad_alloc();
}

} // namespace detail

/// Uninitialised memory.
inline void* allocate(std::size_t size)
{
    void* block = Bulk::take(size);
    return block ? block : detail::require(std::malloc(Bulk::heap_size(size)));
}

inline void* allocate_zeroed(std::size_t size)
{
    void* block = Bulk::take(size);
    return block ? block : detail::require(std::calloc(1, Bulk::heap_size(size)));
}

/// Gives back what these have given. Accepts null.
inline void deallocate(void* block) noexcept
{
    if (Bulk::has(block))
        Bulk::give_back(block);
    else
        std::free(block);
}

/// Of a block whose first `used` bytes stay; null is none. A failure leaves the block as it was. What comes of null is
/// given back with std::free.
inline void* reallocate(void* block, std::size_t used, std::size_t size)
{
    if (!Bulk::has(block))
        return detail::require(std::realloc(block, size));
    void* moved = std::memcpy(allocate(size), block, used);
    deallocate(block);
    return moved;
}

/// How often something was left out because memory was missing: what is built of the rest is not all there is.
inline std::atomic<unsigned> left_out_for_memory{0};

/// For handlers that pass over a part of a whole, whatever was thrown: counts it if that is missing memory.
inline void note_missing_memory() noexcept
{
    try
    {
        throw;
    }
    catch (const std::bad_alloc&)
    {
        ++left_out_for_memory;
    }
    catch (...)
    {}
}

} // namespace cimple
