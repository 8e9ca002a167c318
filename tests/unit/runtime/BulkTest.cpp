// Blocks of a chunk, and when the chunk goes back to the system.
#include "runtime/base/Bulk.h"
#include "runtime/base/Memory.h"
#include "tests/support/NoMemory.h"
#include "tests/support/Sanitized.h"
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <cstring>
#include <limits>
#include <new>
#include <string>
#include <sys/mman.h>
#include <thread>
#include <unistd.h>
#include <vector>

namespace cimple
{
namespace
{

#ifdef TVR_NO_BULK_MEMORY
constexpr bool hasBlocks = false;
#else
constexpr bool hasBlocks = true;
#endif

bool isMapped(const void* block)
{
    const auto size = static_cast<std::uintptr_t>(sysconf(_SC_PAGESIZE));
    auto* page = reinterpret_cast<void*>(reinterpret_cast<std::uintptr_t>(block) & ~(size - 1));
    unsigned char resident;
    return mincore(page, 1, &resident) == 0;
}

class BulkOf : public testing::TestWithParam<std::size_t>
{
    void SetUp() override
    {
        if (!hasBlocks)
            GTEST_SKIP() << "the sanitizer's allocator has them all";
    }
};

TEST_P(BulkOf, GivesEachChunkBackWithTheLastOfItsBlocks)
{
    constexpr std::size_t count = 40'000, size = 100; // three chunks
    std::vector<char*> blocks;
    {
        const Bulk bulk(GetParam());
        for (std::size_t i = 0; i < count; i++)
        {
            blocks.push_back(static_cast<char*>(allocate(size)));
            std::memset(blocks.back(), static_cast<int>(i), size);
        }
    }
    for (std::size_t i = 0; i < count; i++)
    {
        ASSERT_TRUE(Bulk::has(blocks[i]));
        ASSERT_EQ(std::string(blocks[i], size), std::string(size, static_cast<char>(i))) << i;
    }
    std::thread(
        [&]
        {
            for (std::size_t i = 1; i < count; i++)
                deallocate(blocks[i]);
        })
        .join();
    EXPECT_FALSE(isMapped(blocks.back()));
    EXPECT_TRUE(isMapped(blocks.front()));
    deallocate(blocks.front());
    EXPECT_FALSE(isMapped(blocks.front()));
}

TEST_P(BulkOf, HasWhatAnInstanceIsMadeOf)
{
    Ref<T_Disk> disk;
    {
        const Bulk bulk(GetParam());
        disk.reset(create<T_Disk>(true));
        disk->Name.set("a text that is as long as the names of units are");
        disk->Parts.value.append(create<T_Disk>(true));
    }
    EXPECT_TRUE(Bulk::has(disk.get()));
    Ref<T_Disk> copy(clone_of(disk.get()));
    EXPECT_FALSE(Bulk::has(copy.get()));
    const void* place = disk.get();
    disk.reset();
    EXPECT_TRUE(isMapped(place)) << "the copy shares its texts";
    copy.reset();
    EXPECT_FALSE(isMapped(place));
}

TEST_P(BulkOf, LeavesToTheHeapWhatIsLargeOrOfAnotherThread)
{
    const Bulk bulk(GetParam());
    void* small = allocate(16);
    EXPECT_TRUE(Bulk::has(small));
    void* large = allocate(1 << 16);
    EXPECT_FALSE(Bulk::has(large));
    deallocate(large);
    std::thread(
        []
        {
            void* others = allocate(16);
            EXPECT_FALSE(Bulk::has(others));
            deallocate(others);
        })
        .join();
    {
        const Bulk inner(0);
        void* inners = allocate(16);
        EXPECT_TRUE(Bulk::has(inners));
        deallocate(inners);
    }
    void* again = allocate_zeroed(64);
    EXPECT_TRUE(Bulk::has(again));
    EXPECT_EQ(std::string(static_cast<char*>(again), 64), std::string(64, '\0'));
    deallocate(again);
    deallocate(small);
}

TEST_P(BulkOf, LeavesToTheHeapWhatItGetsNoChunkFor)
{
    const Bulk bulk(GetParam());
    void* block;
    {
        const test_support::NoMemory memory(0, 1);
        block = allocate(16);
        EXPECT_EQ(memory.refused(), 1u) << "the chunk";
    }
    EXPECT_FALSE(Bulk::has(block));
    {
        const test_support::NoMemory memory(0, 1);
        EXPECT_THROW(allocate(16), std::bad_alloc) << "the system is asked for no other chunk";
    }
    deallocate(block);
}

TEST_P(BulkOf, ArraysGrowOutOfIt)
{
    constexpr std::uint32_t count = 5'000; // more than a block
    const Bulk bulk(GetParam());
    Array<std::uint32_t> numbers;
    Array<String> texts;
    for (std::uint32_t i = 0; i < count; i++)
    {
        numbers.append(i);
        texts.append(String(std::to_string(i).c_str()));
    }
    for (std::uint32_t i = 0; i < count; i++)
    {
        ASSERT_EQ(numbers[i], i);
        ASSERT_EQ(texts[i], std::to_string(i).c_str());
    }
}

TEST_P(BulkOf, RefusesWhatNoMemoryIsAsLargeAs)
{
    if (TVR_SANITIZED)
        GTEST_SKIP() << "the sanitizer's allocator ends the process";
    const Bulk bulk(GetParam());
    Array<std::uint8_t> bytes;
    bytes.append(1);
    constexpr std::size_t head = 3 * sizeof(void*);
    EXPECT_THROW(bytes.reserve(std::numeric_limits<std::size_t>::max() - head), std::bad_alloc);
    bytes.append(2);
    EXPECT_EQ(bytes.size(), 2u);
}

INSTANTIATE_TEST_SUITE_P(Expecting, BulkOf, testing::Values(0, 10'000'000));

/// jemalloc and its like give any address that eight divides for eight bytes and less.
TEST(BulkAndHeap, AreNotMistakenForEachOtherWhateverTheAllocator)
{
    for (const std::size_t size : {0, 1, 8, 15, 16, 24})
    {
        const test_support::NoMemory counting(std::numeric_limits<std::size_t>::max());
        deallocate(allocate(size));
        deallocate(allocate_zeroed(size));
        EXPECT_GE(counting.leastAsked(), alignof(std::max_align_t)) << size;
    }
}

} // namespace
} // namespace cimple
