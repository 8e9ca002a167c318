// Dispatch of messages and the state of the logger.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/DeviceEventBuffer.h"
#include "foundation/TVR_CIMLogger.h"
#include "foundation/TVR_FileLogger.h"

#include <cerrno>

namespace cimple
{
namespace
{

using testing::ElementsAre;

class Dispatch : public LogTest
{};

TEST_F(Dispatch, HandsTheFormattedTextToEverySinkWithItsPlaceInTheSource)
{
    CapturingSink first;
    CapturingSink second;
    const std::string text(5000, 'x');
    errno = EDOM;
    TVR_LOG(TVR_WARN, "%d-%s", 7, text.c_str());
    const unsigned line = __LINE__ - 1;
    EXPECT_EQ(errno, EDOM) << "a log call between a failure and its errno";
    EXPECT_THAT(first.lines, ElementsAre(LogLine{TVR_WARN, "7-" + text}));
    EXPECT_EQ(second.lines, first.lines);
    EXPECT_EQ(first.lastFile, "LogTest.cpp");
    EXPECT_EQ(first.lastLine, line);
}

TEST_F(Dispatch, KeepsTextsAroundTheSizeOfItsBufferWhole)
{
    CapturingSink sink;
    for (std::size_t size = 1020; size < 1030; ++size)
        TVR_LOG(TVR_INFO, "%s", std::string(size, 'a').c_str());
    ASSERT_EQ(sink.lines.size(), 10u);
    for (std::size_t i = 0; i < 10; ++i)
        EXPECT_EQ(sink.lines[i].message.size(), 1020 + i);
}

TEST_F(Dispatch, IsAnExpression)
{
    CapturingSink sink;
    const auto failing = [] { return TVR_LOG(TVR_ERR, "failed"), 42; };
    EXPECT_EQ(failing(), 42);
    EXPECT_THAT(sink.lines, ElementsAre(LogLine{TVR_ERR, "failed"}));
}

TEST_F(Dispatch, RegistersASinkOnce)
{
    CapturingSink sink;
    EXPECT_FALSE(logger.addSink(&sink));
    EXPECT_TRUE(logger.removeSink(&sink));
    EXPECT_FALSE(logger.removeSink(&sink));
    TVR_LOG(TVR_CRIT, "unheard");
    EXPECT_TRUE(logger.addSink(&sink));
    TVR_LOG(TVR_CRIT, "heard");
    EXPECT_THAT(sink.lines, ElementsAre(LogLine{TVR_CRIT, "heard"}));
}

TEST_F(Dispatch, StartsStopsAndClearsEverySink)
{
    CapturingSink sink;
    for (const int mode : {1, 3, 0, 17})
        logger.setMode(mode);
    logger.clearAll();
    EXPECT_EQ(logger.getMode(), 17) << "values are checked by those who set them";
    EXPECT_EQ(sink.starts, 3);
    EXPECT_EQ(sink.stops, 1);
    EXPECT_EQ(sink.clears, 1);
}

TEST_F(Dispatch, TakesLevelsFromOneToFive)
{
    logger.setLevel(2);
    for (const int level : {0, -1, 6, 100})
    {
        logger.setLevel(level);
        EXPECT_EQ(logger.getLevel(), 2) << level;
    }
    for (const int level : {1, 5})
    {
        logger.setLevel(level);
        EXPECT_EQ(logger.getLevel(), level);
    }
}

class LoggingSink final : public TVR_LoggerInterface
{
public:
    LoggingSink() { TVR_Logger::instance().addSink(this); }
    ~LoggingSink() override { TVR_Logger::instance().removeSink(this); }
    void logMessage(int, const char*, unsigned, const char*) override
    {
        ++messages;
        TVR_LOG(TVR_ERR, "from within");
    }
    void start() override { TVR_LOG(TVR_ERR, "from start"); }
    void stop() override {}
    void clearLog() override { TVR_LOG(TVR_ERR, "from clear"); }
    int messages = 0;
};

TEST_F(Dispatch, DropsWhatASinkLogsItself)
{
    LoggingSink sink;
    logger.setMode(1);
    TVR_LOG(TVR_ERR, "from outside");
    logger.clearAll();
    TVR_LOG(TVR_ERR, "from outside again");
    EXPECT_EQ(sink.messages, 2);
}

TEST_F(Dispatch, ModesSayWhichSinksWork)
{
    TVR_FileLogger file;
    TVR_CIMLogger ring;
    const std::string path = root / "log";
    struct Row
    {
        int mode;
        bool ring;
        bool file;
    };
    for (const Row row : {Row{1, true, false}, {2, false, true}, {3, false, false}, {4, true, true}, {0, false, false}})
    {
        ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
        logger.setMode(row.mode);
        logger.clearAll();
        writeFile(path, ""); // a stopped sink has forgotten it
        TVR_LOG(TVR_ERR, "message");
        EXPECT_EQ(!ring.entries().empty(), row.ring) << row.mode;
        EXPECT_EQ(!fileText(path).empty(), row.file) << row.mode;
    }
}

TEST_F(Dispatch, DeviceEventsFillUpAndSkipEmptyLines)
{
    CapturingSink sink;
    DeviceEventBuffer buffer(2);
    EXPECT_EQ(buffer.add(""), 0);
    EXPECT_TRUE(sink.lines.empty());
    EXPECT_EQ(buffer.add("one"), 0);
    EXPECT_EQ(buffer.add("two"), 0);
    EXPECT_EQ(buffer.add("three"), 1);
    EXPECT_THAT(buffer.strings(), ElementsAre(String("one"), String("two")));
    EXPECT_EQ(sink.lines.size(), 3u);
    EXPECT_EQ(sink.lines[0], (LogLine{TVR_DBG, "Handlelog ---  Prior to Inserting into DeviceLog Vector"}));
    buffer.clear();
    EXPECT_EQ(buffer.add("four"), 0);
    EXPECT_EQ(DeviceEventBuffer().add("x"), 0);
}

} // namespace
} // namespace cimple
