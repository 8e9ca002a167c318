// The data file that keeps the log's parameters, and the start of logging.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/LogDataFile.h"
#include "foundation/TVR_CIMLogger.h"
#include "foundation/TVR_FileLogger.h"

namespace cimple
{
namespace
{

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

// --- text ----------------------------------------------------------------------------------------------

struct ParseRow
{
    std::string text;
    LogDataFault fault;
    int mode;
    int level;
    int enabled; ///< noValue if it was not read
    std::string path;
};
constexpr int noValue = 99;

class LogDataText : public testing::TestWithParam<ParseRow>
{};

TEST_P(LogDataText, IsReadUpToTheFirstFault)
{
    const ParseRow& row = GetParam();
    const LogData data = parseLogData(row.text);
    EXPECT_EQ(static_cast<int>(data.fault), static_cast<int>(row.fault));
    EXPECT_EQ(data.mode, row.mode);
    EXPECT_EQ(data.level, row.level);
    EXPECT_EQ(data.enabled.value_or(noValue), row.enabled);
    EXPECT_EQ(data.path, row.path);
}

using F = LogDataFault;
INSTANTIATE_TEST_SUITE_P(
    Rows, LogDataText,
    testing::Values(
        ParseRow{"2,5,1\n/var/log/x", F::None, 2, 5, 1, "/var/log/x"},
        ParseRow{"4,1,0\n/var/log/x\r\n/ignored\n", F::None, 4, 1, 0, "/var/log/x"},
        ParseRow{"1,3,1\n/ignored", F::None, 1, 3, 1, ""}, ParseRow{"3,3,1", F::None, 3, 3, 1, ""},
        ParseRow{"0,3,0\n", F::None, 0, 3, 0, ""}, ParseRow{"2,0,1\n/x", F::None, 2, 0, 1, "/x"},
        ParseRow{" +1 , 2,7x", F::None, 1, 2, 7, ""}, ParseRow{",,1,,2,,3", F::None, 1, 2, 3, ""},
        ParseRow{"", F::ModeMissing, 0, 0, noValue, ""}, ParseRow{",,,", F::ModeMissing, 0, 0, noValue, ""},
        ParseRow{"5,1,1", F::ModeInvalid, 5, 0, noValue, ""}, ParseRow{"-1,1,1", F::ModeInvalid, -1, 0, noValue, ""},
        ParseRow{"4294967298,1,1", F::ModeInvalid, INT32_MAX, 0, noValue, ""},
        ParseRow{"\n2,5,1\n/x", F::LevelMissing, 0, 0, noValue, ""}, ParseRow{"2", F::LevelMissing, 2, 0, noValue, ""},
        ParseRow{"2,6,1", F::LevelInvalid, 2, 6, noValue, ""}, ParseRow{"2,-2,1", F::LevelInvalid, 2, -2, noValue, ""},
        ParseRow{"2,5", F::EnabledMissing, 2, 5, noValue, ""}, ParseRow{"1,5,-1", F::EnabledInvalid, 1, 5, -1, ""},
        ParseRow{"2,5,1\n", F::PathMissing, 2, 5, 1, ""}, ParseRow{"2,5,1\n\n", F::None, 2, 5, 1, ""},
        ParseRow{std::string("2,5,1\0,9\n/x", 11), F::None, 2, 5, 1, "/x"},
        // The first line holds 19 characters; what is beyond counts as the second.
        ParseRow{"2,5,1,00000000000000/path\n", F::None, 2, 5, 1, "0/path"},
        ParseRow{"2,5,1\n" + std::string(300, 'p'), F::None, 2, 5, 1, std::string(255, 'p')}));

// --- file ----------------------------------------------------------------------------------------------

class LogDataFile : public LogTest
{
protected:
    void write(const std::string& text) { writeFile(dataFile, text); }

    const std::string dataFile = root / "etc/tavrin_fc_provider.dmp";
    const std::string path = root / "provider.log";
    CapturingSink sink;
    TVR_FileLogger file;
};

TEST_F(LogDataFile, OpensTheLogFileOfAModeThatNeedsOne)
{
    write("2,5,1\n" + path);
    logger.readDataFile();
    EXPECT_EQ(logger.getMode(), 2);
    EXPECT_EQ(logger.getLevel(), 5);
    EXPECT_TRUE(logger.isEnabled());
    for (int level = 1; level <= 5; ++level)
        TVR_LOG(level, "level %d", level);
    for (int level = 1; level <= 5; ++level)
        EXPECT_THAT(fileText(path), HasSubstr("level " + std::to_string(level)));
}

TEST_F(LogDataFile, LeavesTheLevelAloneWhenItIsZero)
{
    logger.setLevel(3);
    write("2,0,1\n" + path);
    logger.readDataFile();
    EXPECT_EQ(logger.getLevel(), 3);
    EXPECT_EQ(logger.getMode(), 2);
}

TEST_F(LogDataFile, DisablesAndStops)
{
    logger.enable();
    logger.setMode(4);
    write("0,3,0\n/ignored");
    logger.readDataFile();
    EXPECT_FALSE(logger.isEnabled());
    EXPECT_EQ(logger.getMode(), 0);
    EXPECT_EQ(sink.stops, 1);
    EXPECT_THAT(sink.take(TVR_ERR), IsEmpty());
}

TEST_F(LogDataFile, OpensTheLogFileErrorsOnlyInFirstFailureMode)
{
    logger.setFfdcMode();
    write("2,5,1\n" + path);
    logger.readDataFile();
    TVR_LOG(TVR_WARN, "a warning");
    TVR_LOG(TVR_ERR, "an error");
    EXPECT_THAT(fileText(path), testing::AllOf(HasSubstr("an error"), Not(HasSubstr("a warning"))));
}

struct FaultRow
{
    const char* text;
    std::string message; ///< '@' stands for the path; empty for no message
    bool enabled;
};

class LogDataFaults : public LogDataFile, public testing::WithParamInterface<FaultRow>
{};

TEST_P(LogDataFaults, LeaveModeAndLevelAndSayWhy)
{
    logger.setMode(1);
    logger.setLevel(4);
    write(GetParam().text);
    logger.readDataFile();
    EXPECT_EQ(logger.getMode(), 1);
    EXPECT_EQ(logger.getLevel(), 4);
    EXPECT_EQ(logger.isEnabled(), GetParam().enabled);
    std::string message = GetParam().message;
    if (const std::size_t at = message.find('@'); at != std::string::npos)
        message.replace(at, 1, dataFile);
    if (message.empty())
        EXPECT_THAT(sink.take(TVR_ERR), IsEmpty());
    else
        EXPECT_THAT(sink.take(TVR_ERR), ElementsAre(LogLine{TVR_ERR, message}));
}

INSTANTIATE_TEST_SUITE_P(
    Rows, LogDataFaults,
    testing::Values(FaultRow{"", "Unable to read Log Mode from config data file - @", false},
                    FaultRow{"5,1,1", "Invalid value for Log Mode from config data file -@-5", false},
                    FaultRow{"-1,1,1", "Invalid value for Log Mode from config data file -@-4294967295", false},
                    FaultRow{"2", "Unable to read Log Level from config data file - @", false},
                    FaultRow{"2,6", "Invalid value for Log Level from config data file -@-6", false},
                    FaultRow{"2,5", "Unable to read Log Enabled from config data file - @", false},
                    FaultRow{"3,5,-1", "Invalid value for Log Enabled from config data file - @", true},
                    FaultRow{"2,5,1\n", "", true}, FaultRow{"2,5,1\n/nonexistent/folder/log", "", true}));

TEST_F(LogDataFile, IsNamedWhenItIsMissing)
{
    logger.setMode(1);
    logger.readDataFile();
    EXPECT_THAT(sink.take(TVR_ERR), ElementsAre(LogLine{TVR_CRIT, "File access failed with No such file or directory"},
                                                LogLine{TVR_ERR, "Unable to open config data file - " + dataFile}));
    EXPECT_EQ(logger.getMode(), 1);
}

TEST_F(LogDataFile, KeepsTheParametersInExactlyThisText)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    logger.setMode(4);
    logger.setLevel(3);
    logger.enable();
    logger.writeDataFile();
    EXPECT_EQ(fileText(dataFile), "4,3,1\n" + path);

    logger.setMode(0);
    logger.setLevel(5);
    logger.disable();
    ASSERT_TRUE(file.getPath().empty());
    logger.readDataFile();
    EXPECT_EQ(logger.getMode(), 4);
    EXPECT_EQ(logger.getLevel(), 3);
    EXPECT_TRUE(logger.isEnabled());
    EXPECT_EQ(file.getPath(), path.c_str());
}

TEST_F(LogDataFile, IsWrittenWithoutAPathWhereThereIsNone)
{
    logger.setMode(1);
    logger.writeDataFile();
    EXPECT_EQ(fileText(dataFile), "1,5,0\n");
    std::filesystem::remove_all(root / "etc");
    logger.writeDataFile();
    EXPECT_THAT(sink.take(TVR_ERR), ElementsAre(LogLine{TVR_ERR, "Unable to open dump file\n"}));
}

TEST_F(LogDataFile, StaysAsItIsWhereItCannotBeWritten)
{
    write("2,5,1\n/old");
    logger.setMode(1);
    const int status = inChild(
        [&]
        {
            limitFiles(4);
            logger.writeDataFile();
            return sink.take(TVR_ERR) ==
                           std::vector{LogLine{TVR_ERR, "Unable to write dump file - " + dataFile + ": File too large"}}
                       ? 0
                       : 1;
        });
    EXPECT_EQ(status, 0);
    EXPECT_EQ(fileText(dataFile), "2,5,1\n/old");
    EXPECT_THAT(namesIn(root / "etc"), ElementsAre("tavrin_fc_provider.dmp"));
}

TEST_F(LogDataFile, MovesOffAReadOnlyRoot)
{
    logger.readDataFile(); // fails, and thus looks at the root file system anew next time
    setStatvfs(readOnlyRoot);
    const std::string fallback = root / "var/log/tavrin_fc_provider.dmp";
    writeFile(fallback, "1,2,1\n");
    logger.readDataFile();
    EXPECT_EQ(logger.getMode(), 1);
    EXPECT_EQ(logger.getLevel(), 2);
    logger.setMode(3);
    logger.writeDataFile();
    EXPECT_EQ(fileText(fallback), "3,2,1\n");

    setStatvfs(writableRoot);
    std::filesystem::remove(fallback);
    logger.readDataFile();
    EXPECT_FALSE(logger.dataFileAccessible());
    sink.take(TVR_DBG);
    logger.readDataFile();
    EXPECT_EQ(sink.take(TVR_ERR).back().message, "Unable to open config data file - " + dataFile);
}

// --- start of logging ----------------------------------------------------------------------------------

TEST_F(LogDataFile, LetsLoggingContinueAtStart)
{
    write("2,4,1\n" + path);
    EXPECT_EQ(startLogging(file), 0);
    EXPECT_THAT(sink.take(TVR_ERR), ElementsAre(LogLine{TVR_CRIT, " Continuing logs in Tavrin log provider. "}));
    EXPECT_FALSE(logger.isFfdcMode());
    EXPECT_THAT(fileText(path), HasSubstr(" Continuing logs in Tavrin log provider. "));
}

TEST_F(LogDataFile, MakesLoggingFallBackToFirstFailuresWhenMissing)
{
    EXPECT_EQ(startLogging(file), 0);
    EXPECT_EQ(sink.take(TVR_ERR).back(),
              (LogLine{TVR_CRIT, " Please see the default log: /opt/ibm/platform/log/tavrin_fc_provider_ffdc.log"}));
    EXPECT_TRUE(logger.isFfdcMode());
    EXPECT_TRUE(logger.isEnabled());
    EXPECT_EQ(logger.getMode(), 2);
    const std::string fallback = root / "opt/ibm/platform/log/tavrin_fc_provider_ffdc.log";
    EXPECT_EQ(file.getPath(), fallback.c_str());
    TVR_LOG(TVR_WARN, "a warning");
    TVR_LOG(TVR_CRIT, "a critical message");
    EXPECT_THAT(fileText(fallback), testing::AllOf(HasSubstr("a critical message"), Not(HasSubstr("a warning"))));
}

TEST_F(LogDataFile, MeetsAFreshLoggerAfterTheEnd)
{
    // As in a process in which the module ends and starts again: first without a data file on a read-only root, ...
    setStatvfs(readOnlyRoot);
    EXPECT_EQ(startLogging(file), 0);
    TVR_LOG(TVR_CRIT, "of the first life");
    finishLogging();
    EXPECT_EQ(logger.getMode(), 0);
    EXPECT_EQ(logger.getLevel(), 0);
    EXPECT_FALSE(logger.isEnabled());
    EXPECT_FALSE(logger.isFfdcMode());
    TVR_LOG(TVR_CRIT, "between");

    // ... then with one on a root that was mounted anew.
    setStatvfs(writableRoot);
    write("2,5,1\n" + path);
    EXPECT_EQ(startLogging(file), 0);
    EXPECT_EQ(file.getPath(), path.c_str());
    TVR_LOG(TVR_DBG, "of the second life");
    EXPECT_THAT(fileText(path), HasSubstr("of the second life")) << "not for errors only";
    EXPECT_THAT(fileText(path), Not(HasSubstr("between")));
}

TEST_F(LogDataFile, FailsTheStartWithoutAnyLogFile)
{
    std::filesystem::remove_all(root / "opt");
    EXPECT_NE(startLogging(file), 0);
    EXPECT_EQ(sink.take(TVR_ERR).back(), (LogLine{TVR_ERR, "validateAndSetPath() failed"}));
}

} // namespace
} // namespace cimple
