// Blocks of a chunk, and when the chunk goes back to the system.
#include "runtime/base/Bulk.h"
#include "runtime/base/Memory.h"
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>

#include <cstring>
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
    constexpr std::size_t count = 40'000, size = 100; // two chunks
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
        deallocate(allocate(16));
    }
    void* again = allocate_zeroed(64);
    EXPECT_TRUE(Bulk::has(again));
    EXPECT_EQ(std::string(static_cast<char*>(again), 64), std::string(64, '\0'));
    deallocate(again);
}

INSTANTIATE_TEST_SUITE_P(Expecting, BulkOf, testing::Values(0, 10'000'000));

} // namespace
} // namespace cimple
