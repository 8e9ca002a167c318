// The search for lines in a log of any size and of any content.
#include "logs/NewestLines.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

using testing::ElementsAre;
using testing::IsEmpty;

namespace cimple
{
namespace
{

class NewestLines : public testing::Test
{
protected:
    ~NewestLines() override { std::filesystem::remove_all(path); }

    void write(const std::string& text) const { std::ofstream(path, std::ios::binary) << text; }

    std::vector<std::string> search(const std::string& keyword = "key") const
    {
        std::vector<std::string> lines;
        newestLinesWith(path.c_str(), keyword,
                        [&](std::string_view line)
                        {
                            lines.emplace_back(line);
                            return true;
                        });
        return lines;
    }

    const std::string path = testing::TempDir() + "newest-" + std::to_string(getpid());
};

/// What a reader gets who goes from line to line.
std::vector<std::string> oneByOne(const std::string& text, const std::string& keyword)
{
    std::vector<std::string> lines;
    for (std::size_t begin = 0; begin < text.size();)
    {
        const std::size_t end = std::min(text.find('\n', begin), text.size());
        const std::string line = text.substr(begin, end - begin);
        if (line.find(keyword) != line.npos)
            lines.push_back(line.substr(0, longestLine));
        begin = end + 1;
    }
    std::ranges::reverse(lines);
    return lines;
}

TEST_F(NewestLines, AreThoseOfAReaderOfLines)
{
    constexpr std::size_t block = 256 * 1024;
    const std::string filler(block - 10, 'x');
    std::vector<std::string> texts = {
        "",
        "\n\n",
        "key",
        "a key\nnone\nmonkeys\n",
        "\nkey\nlast key without an end",
        std::string("key \0 behind\n\0key\n", 18),
        std::string(longestLine + 1, 'y') + "key\nkey\n",
        "key" + std::string(3 * block, 'z') + "\nshort key\n",
        std::string(3 * block, 'z') + "key" + std::string(block, 'z'),
    };
    for (std::size_t shift = 0; shift < 24; shift++) // the keyword, or a line feed, across the seam of two blocks
        for (const char* at : {"key", "\nkey", "key\n", "\n key \n"})
        {
            std::string text = filler;
            texts.push_back(text.replace(text.size() - shift, 0, at) + std::string(block, 'w'));
        }
    std::mt19937 random(7);
    for (int i = 0; i < 40; i++)
    {
        std::string& text = texts.emplace_back();
        for (std::size_t size = random() % (2 * block); text.size() < size;)
            text += std::string(random() % 3 ? random() % 90 : random() % 40000, 'q') + (random() % 2 ? "key" : "ke") +
                    (random() % 4 ? "\n" : "y");
    }
    for (const std::string& text : texts)
    {
        write(text);
        EXPECT_EQ(search(), oneByOne(text, "key")) << text.substr(0, 40) << "... of " << text.size();
    }
}

TEST_F(NewestLines, EndWhenNoMoreAreWanted)
{
    write("key 1\nkey 2\nkey 3\nkey 4\n");
    std::vector<std::string> lines;
    newestLinesWith(path.c_str(), "key",
                    [&](std::string_view line)
                    {
                        lines.emplace_back(line);
                        return lines.size() < 2;
                    });
    EXPECT_THAT(lines, ElementsAre("key 4", "key 3"));
}

TEST_F(NewestLines, OfWhatIsNoFileAreNone)
{
    EXPECT_THAT(search(), IsEmpty()) << "missing";
    std::filesystem::create_directory(path);
    EXPECT_THAT(search(), IsEmpty()) << "a folder";
    std::filesystem::remove(path);
    mkfifo(path.c_str(), 0600);
    EXPECT_THAT(search(), IsEmpty()) << "a pipe, which blocks who opens it";
    std::filesystem::remove(path);
    std::filesystem::create_symlink("/dev/zero", path);
    EXPECT_THAT(search(), IsEmpty()) << "a device without an end";
}

/// The file is emptied, or grows, while its lines are handed out.
TEST_F(NewestLines, OfAChangingFileAreThoseThatAreThere)
{
    std::string text;
    while (text.size() < 1 << 20)
        text += "key " + std::to_string(text.size()) + "\n";
    for (const bool grows : {false, true})
    {
        write(text);
        std::size_t lines = 0;
        newestLinesWith(path.c_str(), "key",
                        [&](std::string_view)
                        {
                            if (lines++ % 1000 == 0)
                                grows ? static_cast<void>(std::ofstream(path, std::ios::app) << text)
                                      : std::filesystem::resize_file(path, 0);
                            return true;
                        });
        EXPECT_EQ(lines == oneByOne(text, "key").size(), grows);
        EXPECT_GT(lines, 0u);
    }
}

TEST_F(NewestLines, OfAHugeFileWithoutALineNeedLittleMemoryAndTime)
{
    write("a key at the head");
    std::filesystem::resize_file(path, std::uintmax_t{1} << 33); // zero bytes, none of them on the disk
    rusage before;
    getrusage(RUSAGE_SELF, &before);
    const std::vector<std::string> lines = search();
    rusage after;
    getrusage(RUSAGE_SELF, &after);
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].size(), longestLine);
    EXPECT_LT(after.ru_maxrss - before.ru_maxrss, 8 * 1024) << "KiB";
}

} // namespace
} // namespace cimple
