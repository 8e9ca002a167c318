// Raw memory for the runtime's records, aligned for what a slot holds. Where there is none, std::bad_alloc is thrown:
// the operation fails, the process goes on.
#pragma once

#include "runtime/base/Bulk.h"

#include <atomic>
#include <cstddef>
#include <cstdlib>
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
    return block ? block : detail::require(std::malloc(size));
}

inline void* allocate_zeroed(std::size_t size)
{
    void* block = Bulk::take(size);
    return block ? block : detail::require(std::calloc(1, size));
}

/// Gives back what these have given. Accepts null.
inline void deallocate(void* block) noexcept
{
    if (Bulk::has(block))
        Bulk::give_back(block);
    else
        std::free(block);
}

/// Of memory that is given back with std::free: at first null. A failure leaves the block as it was.
inline void* reallocate(void* block, std::size_t size)
{
    return detail::require(std::realloc(block, size));
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
