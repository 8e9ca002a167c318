// Reading files whole, up to a limit.
#include "foundation/File.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <fstream>
#include <random>

namespace cimple
{
namespace
{

TEST(ReadTextFile, GivesTheFileUpToTheLimit)
{
    const std::string path = testing::TempDir() + "ReadTextFile.txt";
    std::mt19937 random(7);
    std::string content(10'000, '\0');
    for (char& c : content)
        c = static_cast<char>(random());
    std::ofstream(path) << content;

    for (const std::size_t limit : {0, 1, 4095, 4096, 4097, 9'999, 10'000, 1'000'000})
        EXPECT_EQ(readTextFile(path.c_str(), limit), content.substr(0, limit)) << limit;
    std::remove(path.c_str());
    EXPECT_EQ(readTextFile(path.c_str(), 10), std::nullopt);
    EXPECT_EQ(errno, ENOENT);
}

} // namespace
} // namespace cimple
