#include "runtime/base/Bulk.h"

#include <algorithm>
#include <atomic>
#include <new>
#include <sys/mman.h>
#include <utility>

namespace cimple
{

namespace
{

/// Of a chunk, and what it is aligned to, so that a block tells its chunk. That of a huge page.
constexpr std::size_t chunk_size = std::size_t{2} << 20;

/// From so many bytes on a huge page pays, although the system clears all of it.
constexpr std::size_t many = std::size_t{1} << 20;

/// More than the blocks of a chunk: what it counts while blocks are still taken from it.
constexpr std::int64_t open = std::int64_t{1} << 32;

#ifdef TVR_NO_BULK_MEMORY
constexpr bool is_used = false;
#else
constexpr bool is_used = true;
#endif

/// Zeroed memory for a chunk, or null.
char* map_chunk() noexcept
{
    void* mapped =
        mmap(nullptr, 2 * chunk_size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
    if (mapped == MAP_FAILED)
        return nullptr;
    auto* const area = static_cast<char*>(mapped);
    const std::size_t before = -reinterpret_cast<std::uintptr_t>(area) & (chunk_size - 1);
    if (before != 0)
        munmap(area, before);
    munmap(area + before + chunk_size, chunk_size - before);
    return area + before;
}

/// Has the system lay so many bytes of a chunk in memory. Where it does not, they come one page after the other.
void prepare(char* chunk, std::size_t bytes) noexcept
{
    madvise(chunk, chunk_size, bytes >= many ? MADV_HUGEPAGE : MADV_NOHUGEPAGE);
    if (bytes != 0 && bytes < many)
        madvise(chunk, bytes, MADV_POPULATE_WRITE);
}

} // namespace

/// The head of a chunk.
struct Bulk::Chunk
{
    std::atomic<std::int64_t> blocks; ///< that are not given back

    static Chunk* of(void* block)
    {
        return reinterpret_cast<Chunk*>(reinterpret_cast<std::uintptr_t>(block) & ~(chunk_size - 1));
    }
    void count_down(std::int64_t by) noexcept
    {
        if (blocks.fetch_sub(by, std::memory_order_acq_rel) == by)
            munmap(this, chunk_size);
    }
};

constinit thread_local Bulk* Bulk::running = nullptr;

Bulk::Bulk(std::size_t expected) : _outer(std::exchange(running, this)), _expected(expected) {}

Bulk::~Bulk()
{
    close_chunk();
    running = _outer;
}

void Bulk::close_chunk() noexcept
{
    if (_chunk)
        _chunk->count_down(open - _taken);
    _chunk = nullptr;
    _next = _end = nullptr;
    _taken = 0;
}

void* Bulk::take_from_new_chunk(std::size_t room) noexcept
{
    char* const memory = is_used && !_refused ? map_chunk() : nullptr;
    _refused = !memory;
    if (!memory)
        return nullptr;
    prepare(memory, std::min(_expected, chunk_size));
    _expected -= std::min(_expected, chunk_size);
    close_chunk();
    _chunk = new (memory) Chunk{open};
    _next = memory + 2 * slot_alignment + slot_alignment;
    _end = memory + chunk_size;
    return take_block(room);
}

void Bulk::give_back(void* block) noexcept
{
    Chunk::of(block)->count_down(1);
}

} // namespace cimple
