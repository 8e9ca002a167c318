// What logging asks of the heap: nothing for a line, and nothing at all for what no sink takes.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/TVR_CIMLogger.h"
#include "foundation/TVR_FileLogger.h"
#include "foundation/TVR_SysLogger.h"
#include "tests/support/NoMemory.h"

namespace cimple
{
namespace
{

using test_support::NoMemory;
using testing::EndsWith;

class LogMemory : public LogTest
{
protected:
    const std::string path = root / "log";
};

TEST_F(LogMemory, FileSinkWritesLinesWithoutAny)
{
    TVR_FileLogger file;
    logger.setMode(2);
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    const std::string longer(3'000, 'x');
    {
        const NoMemory none;
        TVR_LOG(TVR_ERR, "port %d: %s", 3, "failed\n");
        TVR_LOG(TVR_DBG, "%s", longer.c_str());
    }
    const std::string text = fileText(path);
    EXPECT_THAT(text, testing::HasSubstr("[TVR_ERR] port 3: failed\n\n"));
    EXPECT_THAT(text, EndsWith("[TVR_DBG] " + longer.substr(0, 1'023) + "\n")) << "cut";
}

TEST_F(LogMemory, APathThatFindsNoneLeavesTheOldOneInUse)
{
    TVR_FileLogger file;
    logger.setMode(2);
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    const std::string other = path + ".of a name that has no room in the object itself";
    const std::size_t refusals =
        test_support::withEachAllocationFailing([&] { file.validateAndSetPath(other.c_str(), false); },
                                                [&](bool failed)
                                                {
                                                    TVR_LOG(TVR_ERR, "marker");
                                                    const std::string used = failed ? path : other;
                                                    EXPECT_EQ(file.getPath().view(), used);
                                                    EXPECT_EQ(fileText(other).empty(), failed);
                                                });
    EXPECT_GT(refusals, 0u);
}

TEST_F(LogMemory, RingDropsWhatFindsNoneAndGoesOn)
{
    TVR_CIMLogger ring;
    logger.setMode(1);
    int dropped = 0;
    for (int i = 0; i < 20; ++i)
    {
        TVR_LOG(TVR_ERR, "kept");
        const NoMemory none;
        TVR_LOG(TVR_ERR, "kept where there is room");
        dropped += none.refused() != 0;
    }
    EXPECT_GT(dropped, 0);
    const std::size_t held = ring.entries().size();
    EXPECT_EQ(held, static_cast<std::size_t>(40 - dropped));
    for (std::size_t i = held; i < 1'025; ++i)
        TVR_LOG(TVR_ERR, "%zu", i);
    EXPECT_EQ(ring.entries().size(), 1'024u);
    EXPECT_STREQ(ring.entries()[0].text, "[1024]") << "indexes did not run ahead of what was dropped";
}

TEST_F(LogMemory, SinksComeAndGoWithoutAny)
{
    const NoMemory none;
    const TVR_FileLogger file;
    TVR_CIMLogger ring;
    EXPECT_FALSE(logger.addSink(&ring));
    EXPECT_TRUE(logger.removeSink(&ring));
    EXPECT_TRUE(logger.addSink(&ring));
}

/// True if a message was formatted: a long one asks for memory. Its arguments are evaluated with it, or not at all.
bool isFormatted(int level)
{
    static const std::string text(2'000, 'x');
    const NoMemory counted(0, 0);
    bool evaluated = false;
    TVR_LOG(level, "%s", (evaluated = true, text.c_str()));
    const std::size_t asked = counted.asked();
    EXPECT_EQ(evaluated, asked != 0);
    TVR_Logger::instance().log("file", lineAddress(1), level, "%s", text.c_str());
    EXPECT_EQ(counted.asked() != asked, evaluated) << "called without the macro";
    return evaluated;
}

TEST_F(LogMemory, OnlyWhatASinkTakesIsFormatted)
{
    TVR_FileLogger file;
    TVR_CIMLogger ring;
    struct Row
    {
        int mode;
        bool hasFile;
        bool errorsOnly;
        const char* taken; ///< by level, 0 to 6
    };
    const Row rows[] = {
        {0, true, false, "0000000"}, {1, true, false, "1111000"}, {2, true, false, "1111110"},
        {2, true, true, "0101000"},  {2, false, true, "0000000"}, {3, true, false, "0000000"},
        {4, true, true, "1111000"},  {4, true, false, "1111110"}, {4, false, false, "1111000"},
    };
    for (const bool modeFirst : {true, false})
        for (const Row& row : rows)
        {
            logger.setMode(4); // for mode 0 closes the file that is open
            ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
            logger.setMode(0);
            ASSERT_TRUE(file.getPath().empty());
            if (modeFirst)
                logger.setMode(row.mode);
            if (row.hasFile)
                file.validateAndSetPath(path.c_str(), row.errorsOnly);
            if (!modeFirst)
                logger.setMode(row.mode);
            std::string taken;
            for (int level = 0; level <= 6; ++level)
                taken += isFormatted(level) ? '1' : '0';
            EXPECT_EQ(taken, row.taken) << row.mode << row.hasFile << row.errorsOnly << modeFirst;
        }
}

TEST_F(LogMemory, OnlyWhatTheSystemLogTakesIsFormattedWhileDisabled)
{
    TVR_CIMLogger ring;
    logger.setMode(1);
    EXPECT_TRUE(isFormatted(TVR_ERR)) << "without the system log's sink all hear";
    const TVR_SysLogger system;
    EXPECT_FALSE(isFormatted(TVR_ERR));
    logger.enable();
    EXPECT_TRUE(isFormatted(TVR_ERR));
    logger.removeSink(&ring);
    EXPECT_FALSE(isFormatted(TVR_ERR));
    const CapturingSink any; // says nothing of what it takes, and so takes all
    EXPECT_TRUE(isFormatted(6));
}

} // namespace
} // namespace cimple
