// The file sink, the ring sink and the system log's sink.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/TVR_CIMLogger.h"
#include "foundation/TVR_FileLogger.h"
#include "foundation/TVR_SysLogger.h"

#include <sys/stat.h>
#include <sys/syscall.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <fstream>

namespace
{

struct SysLogCall
{
    int priority;
    std::string text;
};
std::vector<SysLogCall> sysLogCalls;
std::vector<std::string> connectionCalls;

bool canTruncate = true; ///< false as where files may only be appended to

} // namespace

// These take the place of the C library's in this program.

extern "C" int ftruncate(int file, off_t size) noexcept
{
    if (canTruncate)
        return static_cast<int>(syscall(SYS_ftruncate, file, size));
    errno = EPERM;
    return -1;
}

extern "C" void openlog(const char* identity, int options, int facility)
{
    connectionCalls.push_back(std::string(identity) + " " + std::to_string(options) + " " + std::to_string(facility));
}

extern "C" void closelog()
{
    connectionCalls.push_back("close");
}

extern "C" void syslog(int priority, const char* format, ...)
{
    char text[4096];
    va_list args;
    va_start(args, format);
    std::vsnprintf(text, sizeof text, format, args);
    va_end(args);
    sysLogCalls.push_back({priority, text});
}

namespace cimple
{
namespace
{

using testing::ElementsAre;
using testing::HasSubstr;
using testing::MatchesRegex;
using testing::Not;

// --- file ----------------------------------------------------------------------------------------------

class FileSink : public LogTest
{
protected:
    FileSink() { logger.setMode(2); }

    TVR_FileLogger file;
    const std::string path = root / "provider.log";
};

TEST_F(FileSink, WritesALinePerMessage)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    TVR_LOG(TVR_INFO, "port %d is up", 3);
    EXPECT_THAT(fileText(path),
                MatchesRegex("\\[threadid =[0-9]+l\\] \\[[0-9]{4}/[0-9]{2}/[0-9]{2} [0-9:.]+[+-][0-9]+\\] "
                             "\\[LogSinksTest.cpp:[0-9]+\\]\\[TVR_INFO\\] port 3 is up\n"));
}

TEST_F(FileSink, KeepsALineALine)
{
    // Foreign text, as a library gives it, and what the line says of it.
    const std::pair<const char*, std::string> rows[] = {
        {"a\n[threadid =1l] forged", "a\\n[threadid =1l] forged"},
        {"\t\r\x1b[2J\x01\x7f", "\\t\\r\\x1b[2J\\x01\\x7f"},
        {"caf\u00e9 \x80\xff \\n", "caf\u00e9 \x80\xff \\n"}, // only control characters
        {"ends with one\n", "ends with one\n"},               // as some messages of the program do
        {"with two\n\n", "with two\\n\n"},
        {"\n", "\n"},
        {"", ""},
    };
    for (const auto& [text, written] : rows)
    {
        ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
        logger.clearAll();
        TVR_LOG(TVR_INFO, "%s", text);
        EXPECT_THAT(fileText(path), testing::EndsWith("[TVR_INFO] " + written + "\n"));
    }
    const std::string controls(20'000, '\x02'); // more than the room for a line
    std::string escaped;
    while (escaped.size() < 4 * controls.size())
        escaped += "\\x02";
    TVR_LOG(TVR_INFO, "%s", controls.c_str());
    EXPECT_THAT(fileText(path), testing::EndsWith("] " + escaped + "\n"));
}

TEST_F(FileSink, NamesEveryLevelAndDropsThoseAbove)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    const char* names[] = {"TVR_INVALID", "TVR_CRIT", "TVR_WARN", "TVR_ERR", "TVR_INFO", "TVR_DBG"};
    for (int level = 0; level <= 5; ++level)
        TVR_LOG(level, "level");
    TVR_LOG(6, "six");
    TVR_LOG(-1, "below");
    std::ifstream lines(path);
    std::string line;
    for (const char* name : names)
    {
        ASSERT_TRUE(std::getline(lines, line));
        EXPECT_THAT(line, HasSubstr("][" + std::string(name) + "] level"));
    }
    ASSERT_TRUE(std::getline(lines, line));
    EXPECT_THAT(line, HasSubstr("][TVR_INVALID] below"));
    EXPECT_FALSE(std::getline(lines, line));
}

TEST_F(FileSink, KeepsCriticalMessagesAndErrorsWhenErrorsOnly)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), true), 0);
    for (int level = 1; level <= 5; ++level)
        TVR_LOG(level, "level %d", level);
    EXPECT_THAT(fileText(path), testing::AllOf(HasSubstr("level 1"), HasSubstr("level 3"), Not(HasSubstr("level 2")),
                                               Not(HasSubstr("level 4")), Not(HasSubstr("level 5"))));
}

TEST_F(FileSink, RefusesAPathAndStaysWithTheOldOne)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    const std::string readOnly = root / "read-only";
    writeFile(readOnly, "kept\n");
    chmod(readOnly.c_str(), 0444);
    const std::string belowFile = path + "/below";
    const std::string folder = root / "etc";
    for (const char* refused : {static_cast<const char*>(nullptr), "", readOnly.c_str(), belowFile.c_str(),
                                folder.c_str(), "/nonexistent/folder/log"})
        EXPECT_EQ(file.validateAndSetPath(refused, true), -1) << (refused ? refused : "null");
    EXPECT_EQ(file.getPath(), path.c_str());
    TVR_LOG(TVR_DBG, "still here");
    EXPECT_THAT(fileText(path), HasSubstr("still here"));
    EXPECT_EQ(fileText(readOnly), "kept\n");
}

TEST_F(FileSink, CreatesAFileThatOnlyTheOwnerWrites)
{
    const mode_t before = umask(0);
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    umask(before);
    struct stat status;
    ASSERT_EQ(stat(path.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 07777, 0644u);
}

constexpr const char* ownLine = "[threadid =12l] [2026/11/22 18:00:00.000000+000] [A.cpp:1][TVR_ERR] a\n";

/// What the data file names: who may have put a file or a link there, and what becomes of it.
TEST_F(FileSink, TakesWhatRootAloneCanHavePutUnderAPath)
{
    if (geteuid() != 0)
        GTEST_SKIP() << "root's links";
    const std::string target = root / "target";
    const std::string named = root / "etc/named";
    const struct
    {
        mode_t folder;
        bool link;
        const char* text; ///< none for no file
        bool appended;
        bool cleared;
    } rows[] = {
        {0755, true, "precious\n", true, false},  {0755, false, "precious\n", true, false},
        {0755, true, ownLine, true, true},        {0755, true, nullptr, true, true},
        {0775, true, "precious\n", false, false}, {0775, false, "precious\n", false, false},
        {0775, true, "", false, false},           {0775, true, nullptr, false, false},
        {01777, true, ownLine, false, false},     {0775, false, ownLine, true, true},
        {01777, false, nullptr, true, true},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(testing::Message() << std::oct << row.folder << (row.link ? " link " : " file ")
                                        << (row.text ? row.text : "none"));
        logger.setMode(0); // as at a start, when no path is known
        logger.setMode(2);
        std::filesystem::remove(named);
        std::filesystem::remove(target);
        const std::string& there = row.link ? target : named;
        if (row.text)
            writeFile(there, row.text);
        if (row.link)
            std::filesystem::create_symlink(target, named);
        chmod((root / "etc").c_str(), row.folder);
        EXPECT_EQ(file.validateAndSetPath(named.c_str(), false), row.appended ? 0 : -1);
        TVR_LOG(TVR_ERR, "one");
        logger.setMode(4);
        EXPECT_EQ(fileText(there).find("one") != std::string::npos, row.appended);
        EXPECT_EQ(std::filesystem::exists(there), row.text || row.appended);
        logger.clearAll();
        EXPECT_EQ(fileText(there) == "", row.cleared || std::string_view(row.text ? row.text : "").empty());
        TVR_LOG(TVR_ERR, "two");
        EXPECT_EQ(fileText(there).find("two") != std::string::npos, row.appended) << "it goes on";
    }
}

TEST_F(FileSink, TakesFromAClientNewFilesAndLogsAlone)
{
    const std::string folder = root / "logs";
    std::filesystem::create_directory(folder);
    std::filesystem::create_directory(folder + "/folder");
    mkfifo((folder + "/pipe").c_str(), 0600);
    writeFile(folder + "/log", ownLine);
    writeFile(folder + "/empty", "");
    writeFile(folder + "/other", "root:x:0:0\n");
    writeFile(folder + "/almost", "[threadid =l] [");
    writeFile(folder + "/read-only", ownLine);
    chmod((folder + "/read-only").c_str(), 0444);
    std::filesystem::create_symlink(folder + "/log", folder + "/link");
    std::filesystem::create_symlink(folder + "/nowhere", folder + "/broken");
    const std::string longest = folder + "/" + std::string(254 - folder.size(), 'n');
    const std::pair<std::string, int> rows[] = {
        {folder + "/new", 0},
        {folder + "/log", 0},
        {folder + "/empty", 0},
        {longest, 0},
        {longest + "n", -1},
        {folder + "/other", -1},
        {folder + "/almost", -1},
        {folder + "/link", -1},
        {folder + "/broken", -1},
        {folder + "/folder", -1},
        {folder + "/pipe", -1},
        {folder + "/read-only", -1},
        {folder + "/new/below", -1},
        {folder + "/none/x", -1},
        {"/dev/null", -1},
        {folder + "/a\nb", -1},
        {folder + "/a\rb", -1},
        {"relative", -1},
        {folder + std::string("/a\0b", 4), -1},
    };
    for (const auto& [named, status] : rows)
    {
        EXPECT_EQ(file.validateAndSetClientPath(named), status) << named;
        if (status == 0)
        {
            EXPECT_EQ(file.getPath().view(), named);
        }
    }
    EXPECT_EQ(fileText(folder + "/other"), "root:x:0:0\n");
    EXPECT_FALSE(std::filesystem::exists(folder + "/nowhere"));
}

/// Whoever may write to the folder of a log puts another file, or a link to one, under its name.
TEST_F(FileSink, LeavesAFileAloneThatTookTheLogsPlace)
{
    const std::string other = root / "other";
    for (const bool link : {true, false})
    {
        std::filesystem::remove(path);
        ASSERT_EQ(file.validateAndSetClientPath(path), 0);
        TVR_LOG(TVR_ERR, "one");
        std::filesystem::remove(path);
        writeFile(other, "precious\n");
        if (link)
            std::filesystem::create_symlink(other, path);
        else
            std::filesystem::rename(other, path);
        logger.setMode(4); // opens it again
        logger.clearAll();
        logger.writeDataFile();
        logger.readDataFile();
        TVR_LOG(TVR_ERR, "two");
        EXPECT_EQ(fileText(link ? other : path), "precious\n");
    }
}

TEST_F(FileSink, AppendsAndGoesOnAfterAClear)
{
    writeFile(path, ownLine);
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    TVR_LOG(TVR_ERR, "one");
    EXPECT_THAT(fileText(path), testing::AllOf(testing::StartsWith(ownLine), HasSubstr("one")));
    canTruncate = false;
    logger.clearAll();
    canTruncate = true;
    TVR_LOG(TVR_ERR, "kept on");
    EXPECT_THAT(fileText(path), testing::AllOf(HasSubstr("one"), HasSubstr("kept on")));
    logger.clearAll();
    EXPECT_EQ(fileText(path), "");
    TVR_LOG(TVR_ERR, "two");
    TVR_LOG(TVR_ERR, "three");
    EXPECT_THAT(fileText(path), testing::AllOf(HasSubstr("two"), HasSubstr("three")));
}

TEST_F(FileSink, ForgetsThePathWhenStoppedWhileOpen)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    logger.setMode(0);
    EXPECT_TRUE(file.getPath().empty());
    logger.setMode(2);
    TVR_LOG(TVR_ERR, "lost");
    EXPECT_EQ(fileText(path), "");
}

TEST_F(FileSink, OpensAFileThatWentAwayAgainWhenStarted)
{
    ASSERT_EQ(file.validateAndSetPath(path.c_str(), false), 0);
    std::filesystem::remove(path);
    logger.setMode(1);
    EXPECT_FALSE(std::filesystem::exists(path)) << "not in a mode without a file";
    logger.setMode(4);
    TVR_LOG(TVR_ERR, "back");
    EXPECT_THAT(fileText(path), HasSubstr("back"));
}

// --- ring ----------------------------------------------------------------------------------------------

class RingSink : public LogTest
{
protected:
    RingSink() { logger.setMode(1); }
    TVR_CIMLogger ring;
};

TEST_F(RingSink, StoresTheThreeErrorLevelsInBrackets)
{
    for (int level = 1; level <= 5; ++level)
        TVR_LOG(level, "level %d", level);
    const auto entries = ring.entries();
    ASSERT_EQ(entries.size(), 3u);
    for (int i = 0; i < 3; ++i)
    {
        EXPECT_EQ(entries[i].level, i + 1);
        EXPECT_EQ(entries[i].text, "[level " + std::to_string(i + 1) + "]");
        EXPECT_TRUE(entries[i].timestamp.is_timestamp());
    }
}

TEST_F(RingSink, KeepsTheTextAsItIsForClients)
{
    TVR_LOG(TVR_ERR, "%s", "two\nlines\x1b");
    EXPECT_STREQ(ring.entries().at(0).text, "[two\nlines\x1b]");
}

TEST_F(RingSink, OverwritesTheOldestRecordWhenFull)
{
    for (int i = 0; i < 1025; ++i)
        TVR_LOG(TVR_ERR, "%d", i);
    auto entries = ring.entries();
    ASSERT_EQ(entries.size(), 1024u);
    EXPECT_STREQ(entries[0].text, "[1024]");
    EXPECT_STREQ(entries[1].text, "[1]");
    EXPECT_STREQ(entries[1023].text, "[1023]");

    logger.clearAll();
    EXPECT_TRUE(ring.entries().empty());
    TVR_LOG(TVR_ERR, "first");
    TVR_LOG(TVR_ERR, "second");
    entries = ring.entries();
    ASSERT_EQ(entries.size(), 2u);
    EXPECT_STREQ(entries[1].text, "[second]");
}

TEST_F(RingSink, CutsLongTextsBetweenCharacters)
{
    const std::string letters(196, 'a');
    TVR_LOG(TVR_ERR, "%s", (letters + "b").c_str());
    TVR_LOG(TVR_ERR, "%s", (letters + "bc").c_str());
    TVR_LOG(TVR_ERR, "%s", (letters + "\u20ac and more").c_str());
    TVR_LOG(TVR_ERR, "%s", std::string(300, '\x80').c_str());
    const auto entries = ring.entries();
    ASSERT_EQ(entries.size(), 4u);
    EXPECT_EQ(entries[0].text, "[" + letters + "b]");
    EXPECT_EQ(entries[1].text, "[" + letters + "bc");
    EXPECT_EQ(entries[2].text, "[" + letters);
    EXPECT_GT(std::string(entries[3].text).size(), 190u) << "not UTF-8 in the first place";
}

// --- system log ----------------------------------------------------------------------------------------

class SystemLogSink : public LogTest
{
protected:
    SystemLogSink()
    {
        sysLogCalls.clear();
        connectionCalls.clear();
    }
};

TEST_F(SystemLogSink, HoldsTheConnectionForItsLife)
{
    {
        const TVR_SysLogger sink;
        EXPECT_THAT(connectionCalls, ElementsAre("[TVR][CIM][FC] 24 8"));
    }
    EXPECT_THAT(connectionCalls, ElementsAre("[TVR][CIM][FC] 24 8", "close"));
}

TEST_F(SystemLogSink, IsSilentForTheLevelsInUse)
{
    const TVR_SysLogger sink;
    for (int level = 1; level <= 5; ++level)
        TVR_LOG(level, "quiet");
    EXPECT_TRUE(sysLogCalls.empty());
}

TEST_F(SystemLogSink, PassesTheRestOnAsPlainBoundedText)
{
    const TVR_SysLogger sink;
    TVR_LOG(0, "%s", "100% %n %s");
    TVR_LOG(-5, "%s", std::string(5000, 'x').c_str());
    TVR_LOG(0, "%s", "two\nlines");
    ASSERT_EQ(sysLogCalls.size(), 3u);
    EXPECT_EQ(sysLogCalls[2].text, "[two\nlines]\n") << "the system log escapes";
    EXPECT_EQ(sysLogCalls[0].priority, -1);
    EXPECT_EQ(sysLogCalls[0].text, "[100% %n %s]\n");
    EXPECT_EQ(sysLogCalls[1].text.size(), 2047u);
}

TEST_F(SystemLogSink, IsTheOnlyOneToHearWhileLoggingIsDisabled)
{
    CapturingSink other;
    {
        const TVR_SysLogger sink;
        TVR_LOG(0, "disabled");
        EXPECT_TRUE(other.lines.empty());
        EXPECT_EQ(sysLogCalls.size(), 1u);

        logger.enable();
        TVR_LOG(0, "enabled");
        EXPECT_EQ(other.lines.size(), 1u);
        EXPECT_EQ(sysLogCalls.size(), 2u);
        logger.disable();
    }
    TVR_LOG(0, "disabled, and the sink is gone");
    EXPECT_EQ(other.lines.size(), 2u);
    EXPECT_EQ(sysLogCalls.size(), 2u);
}

} // namespace
} // namespace cimple
