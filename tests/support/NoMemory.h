// Memory that runs out on demand. In a program that is linked with it (tests/unit/CMakeLists.txt), every malloc, calloc
// and realloc passes here, and with them operator new; mapped memory, new threads and the memory that a thread takes
// for its values do so where the program's own objects ask. In builds with a sanitizer, whose allocator cannot be
// replaced, it is every operator new, and malloc and its like where the program's own objects call it.
#pragma once

#include <algorithm>
#include <cstddef>
#include <gtest/gtest.h>
#include <limits>
#include <new>

namespace test_support
{

/// While it lives, allocations of its thread fail: `count` of them, after `after` that succeed. One at a time on a
/// thread; what the test itself does in between is counted, too.
class NoMemory
{
public:
    explicit NoMemory(std::size_t after = 0, std::size_t count = std::numeric_limits<std::size_t>::max());
    ~NoMemory();
    NoMemory(const NoMemory&) = delete;
    NoMemory& operator=(const NoMemory&) = delete;

    /// Allocations that were asked for, and those of them that failed.
    std::size_t asked() const { return _asked; }
    std::size_t refused() const { return _refused; }
    /// Bytes of the smallest of them, without those that move a block.
    std::size_t leastAsked() const { return _leastAsked; }

    /// Blocks that the program's own objects have of malloc and its like, on all threads.
    static std::ptrdiff_t liveBlocks();

    /// Counts an allocation; whether it is to fail.
    bool refusesNext();
    void noteSize(std::size_t size) { _leastAsked = std::min(_leastAsked, size); }

private:
    std::size_t _after;
    std::size_t _count;
    std::size_t _asked = 0;
    std::size_t _refused = 0;
    std::size_t _leastAsked = std::numeric_limits<std::size_t>::max();
};

/// Runs `work` with the first allocation failing, then the second, until all succeed. `check(failed)` follows each
/// run, which must leave no block behind; what it throws must be std::bad_alloc. Returns the number of failures.
template <class Work, class Check> std::size_t withEachAllocationFailing(Work work, Check check)
{
    for (std::size_t n = 0;; ++n)
    {
        SCOPED_TRACE(n);
        const std::ptrdiff_t before = NoMemory::liveBlocks();
        bool failed = false;
        try
        {
            const NoMemory memory(n, 1);
            work();
            failed = memory.refused() != 0;
        }
        catch (const std::bad_alloc&)
        {
            failed = true;
        }
        check(failed);
        EXPECT_EQ(NoMemory::liveBlocks(), before) << "the allocation " << (failed ? "failed" : "did not fail");
        if (!failed)
            return n;
    }
}

template <class Work> std::size_t withEachAllocationFailing(Work work)
{
    return withEachAllocationFailing(work, [](bool) {});
}

} // namespace test_support
