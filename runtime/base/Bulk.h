// Memory for what a thread makes in great numbers.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

namespace cimple
{

/// While it lives, allocate() on its thread takes small blocks one behind the other from chunks of its own. Blocks may
/// outlive it and be given back by any thread; a chunk goes back to the system, as a whole, with the last of its
/// blocks. That suits what is made together and dies together.
///
/// In a build with an address sanitizer there are no such blocks: it would not see their use after their end.
class Bulk
{
public:
    /// `expected` are the bytes of all blocks, about. What fills most of a huge page gets one, for which the system is
    /// asked once; the rest gets the pages that it needs, for all of which it is asked at once.
    explicit Bulk(std::size_t expected);
    ~Bulk();
    Bulk(const Bulk&) = delete;
    Bulk& operator=(const Bulk&) = delete;

    /// A zeroed block from the chunks of this thread's Bulk, aligned for what a slot holds; null without one, for a
    /// large block, and where the system gives no chunk.
    static void* take(std::size_t size) noexcept
    {
        Bulk* bulk = running;
        return bulk && size <= largest_block ? bulk->take_block(size) : nullptr;
    }
    /// Blocks of chunks lie half way between the addresses that malloc() gives, which are aligned for every plain type.
    static bool has(const void* block)
    {
        static_assert(alignof(std::max_align_t) == 2 * slot_alignment);
        return (reinterpret_cast<std::uintptr_t>(block) & slot_alignment) != 0;
    }
    /// What to ask malloc() for: allocators that a server is started with may align less what is smaller.
    static std::size_t heap_size(std::size_t size) { return std::max(size, alignof(std::max_align_t)); }
    /// Of a block that it has.
    static void give_back(void* block) noexcept;

private:
    struct Chunk;

    static constexpr std::size_t slot_alignment = 8;
    static constexpr std::size_t largest_block = 4096;

    void* take_block(std::size_t size) noexcept
    {
        constexpr std::size_t step = 2 * slot_alignment;
        const std::size_t room = (size + step - 1) & ~(step - 1);
        if (room > static_cast<std::size_t>(_end - _next))
            return take_from_new_chunk(room);
        _taken++;
        void* block = _next;
        _next += room;
        return block;
    }
    void* take_from_new_chunk(std::size_t room) noexcept;
    void close_chunk() noexcept;

    static constinit thread_local Bulk* running;

    Bulk* const _outer;
    Chunk* _chunk = nullptr;
    char* _next = nullptr;
    char* _end = nullptr;
    std::int64_t _taken = 0; ///< blocks of the chunk
    std::size_t _expected;   ///< bytes that no chunk was made for
    bool _refused = false;   ///< the system gave no chunk: it is asked no more
};

} // namespace cimple
