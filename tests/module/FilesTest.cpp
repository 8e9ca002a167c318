// Files that are wrong, absent or in the way: the module runs on, and writes nowhere but below its root.
#include "tests/module/Host.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <ostream>
#include <sys/stat.h>

using namespace module_test;
namespace fs = std::filesystem;

namespace
{

constexpr const char* settingsFile = "/etc/tavrin_fc_provider.conf";
constexpr const char* logDataFile = "/etc/tavrin_fc_provider.dmp";
constexpr const char* ffdcFolder = "/opt/ibm/platform/log";
constexpr const char* ffdcLog = "/opt/ibm/platform/log/tavrin_fc_provider_ffdc.log";

/// The files of the machine that the module would use without a root.
std::string machineFiles()
{
    std::string found;
    for (const char* file :
         {settingsFile, logDataFile, "/etc/tvr_smis.conf", "/var/log/tavrin_fc_provider.dmp", ffdcLog})
    {
        struct stat status;
        if (stat(file, &status) == 0)
            found += std::string(file) + " " + std::to_string(status.st_mtim.tv_sec) + "." +
                     std::to_string(status.st_mtim.tv_nsec) + "\n";
    }
    return found;
}

std::vector<std::string> filesBelow(const fs::path& root)
{
    std::vector<std::string> files;
    for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root))
        if (entry.is_regular_file())
            files.push_back(entry.path().string().substr(root.string().size()));
    std::ranges::sort(files);
    return files;
}

// --- settings ------------------------------------------------------------------------------------------

struct SettingsRow
{
    const char* name;
    std::string text;
    const char* timeout;
    const char* adapters;
    const char* fabric;
};

void PrintTo(const SettingsRow& row, std::ostream* out)
{
    *out << row.name;
}

std::string lines(std::size_t count)
{
    std::string text;
    for (std::size_t i = 0; i < count; ++i)
        text += "#\n";
    return text;
}

const SettingsRow settingsRows[] = {
    {"Empty", "", "10", "FALSE", "TRUE"},
    {"Garbage", std::string("\0\xFF\x80=\0==\n====\n\x01", 13), "10", "FALSE", "TRUE"},
    {"LongLine", std::string(100000, 'x') + "\nTVR_PROVIDER_CACHE_TIMEOUT = 7\n", "7", "FALSE", "TRUE"},
    {"NoBlanks", "TVR_PROVIDER_CACHE_TIMEOUT=3", "3", "FALSE", "TRUE"},
    {"TooLong", "TVR_PROVIDER_CACHE_TIMEOUT = 31", "10", "FALSE", "TRUE"},
    {"ZeroThenOne", "TVR_PROVIDER_CACHE_TIMEOUT = 0\nTVR_PROVIDER_CACHE_TIMEOUT = 1\n", "1", "FALSE", "TRUE"},
    {"FirstValidStands", "TVR_PROVIDER_CACHE_TIMEOUT = 20\nTVR_PROVIDER_CACHE_TIMEOUT = 5\n", "20", "FALSE", "TRUE"},
    {"Overflow", "TVR_PROVIDER_CACHE_TIMEOUT = 4294967297", "10", "FALSE", "TRUE"},
    {"LowerCase", "TVR_PROVIDER_REFRESH_SANDATA = false\nTVR_PROVIDER_REFRESH_ADAPTERDATA = true\n", "10", "FALSE",
     "TRUE"},
    {"LowerCaseKey", "tvr_provider_cache_timeout = 5", "10", "FALSE", "TRUE"},
    {"Both", " TVR_PROVIDER_REFRESH_SANDATA\t=  FALSE \r\nTVR_PROVIDER_REFRESH_ADAPTERDATA = TRUE", "10", "TRUE",
     "FALSE"},
    {"Comment", "#TVR_PROVIDER_CACHE_TIMEOUT = 5", "10", "FALSE", "TRUE"},
    {"LastLineRead", lines(999) + "TVR_PROVIDER_CACHE_TIMEOUT = 5", "5", "FALSE", "TRUE"},
    {"LineNotRead", lines(1000) + "TVR_PROVIDER_CACHE_TIMEOUT = 5", "10", "FALSE", "TRUE"},
};

class Settings : public testing::TestWithParam<SettingsRow>
{};

TEST_P(Settings, AreTakenWhereTheyAreValidAndWrittenBackInForm)
{
    const SettingsRow& row = GetParam();
    Host host;
    host.write(settingsFile, row.text);
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_TRUE(std::ranges::any_of(host.log(), [&](const std::string& line)
                                    { return line.ends_with(std::string("; cache timeout = ") + row.timeout); }));
    EXPECT_EQ(host.calls("HBA_GetFcpTargetMapping") > 0, row.fabric == std::string("TRUE"));
    host.unload();
    const std::string written = host.read(settingsFile);
    EXPECT_EQ(written.substr(std::min<std::size_t>(written.size(), 153)),
              std::string("TVR_PROVIDER_CACHE_TIMEOUT = ") + row.timeout + "\nTVR_PROVIDER_REFRESH_ADAPTERDATA = " +
                  row.adapters + "\nTVR_PROVIDER_REFRESH_SANDATA = " + row.fabric + "\n");
}

INSTANTIATE_TEST_SUITE_P(Rows, Settings, testing::ValuesIn(settingsRows),
                         [](const auto& info) { return info.param.name; });

// --- a file system that is in the way -------------------------------------------------------------------

struct FileRow
{
    const char* name;
    std::function<void(Host&)> arrange;
    std::vector<std::string> logged; ///< in provider.log; nothing may be there if the list is empty
    std::vector<std::string> files;  ///< that the module made
};

void PrintTo(const FileRow& row, std::ostream* out)
{
    *out << row.name;
}

void replaceByFolder(Host& host, const char* file)
{
    fs::remove_all(host.root().string() + file);
    fs::create_directories(host.root().string() + file);
}

void logTo(Host& host, const fs::path& path)
{
    host.write(logDataFile, "2,5,1\n" + path.string());
}

const FileRow fileRows[] = {
    {"Nothing",
     [](Host&) {},
     {"[TVR_CRIT]  Continuing logs in Tavrin log provider. "},
     {settingsFile, "/provider.log"}},
    {"FolderForSettings", [](Host& host) { replaceByFolder(host, settingsFile); }, {"[TVR_INFO]"}, {"/provider.log"}},
    {"NoKernelVersion",
     [](Host& host) { fs::remove(host.root() / "proc/version"); },
     {"[TVR_ERR] getOSInformation() failed"},
     {settingsFile, "/provider.log"}},
    {"NoBanner",
     [](Host& host) { fs::remove(host.root() / "etc/issue"); },
     {"[TVR_ERR] Unable to open the /etc/issue file to get OSDistribution Name", "[TVR_ERR] getOSInformation() failed"},
     {settingsFile, "/provider.log"}},
    {"FolderForBanner",
     [](Host& host) { replaceByFolder(host, "/etc/issue"); },
     {"[TVR_INFO] Tavrin Provider v10.2.261-13 Loaded["},
     {settingsFile, "/provider.log"}},

    // Without a valid data file nothing is logged.
    {"LogModeOfFive", [](Host& host) { host.write(logDataFile, "5,1,1\n"); }, {}, {settingsFile}},
    {"LogLevelOfSix", [](Host& host) { host.write(logDataFile, "2,6,1\n/provider.log"); }, {}, {settingsFile}},
    {"BinaryLogData",
     [](Host& host) { host.write(logDataFile, std::string("\0\x01\xFF,\0,\n", 7) + std::string(70000, '\xFE')); },
     {},
     {settingsFile}},
    {"EmptyLogData", [](Host& host) { host.write(logDataFile, ""); }, {}, {settingsFile}},
    {"FolderForLogData", [](Host& host) { replaceByFolder(host, logDataFile); }, {}, {settingsFile}},
    {"LogIsAFolder", [](Host& host) { logTo(host, host.root() / "etc"); }, {}, {settingsFile}},
    {"LogInNoFolder", [](Host& host) { logTo(host, host.root() / "none/log"); }, {}, {settingsFile}},
    {"LogWithoutOwnersWriteBit",
     [](Host& host)
     {
         host.write("/provider.log", "");
         fs::permissions(host.root() / "provider.log", fs::perms::owner_read);
     },
     {},
     {settingsFile, "/provider.log"}},
    {"LogThroughALinkInAWorldWritableFolder",
     [](Host& host)
     {
         fs::create_directory(host.root() / "open");
         fs::permissions(host.root() / "open", fs::perms::all);
         fs::create_symlink(host.root() / "victim", host.root() / "open/log");
         logTo(host, host.root() / "open/log");
     },
     {},
     {settingsFile}},

    // No data file: first failures only, and only where the folder for them exists.
    {"NoLogData", [](Host& host) { fs::remove(host.root().string() + logDataFile); }, {}, {settingsFile}},
    {"FirstFailures",
     [](Host& host)
     {
         fs::remove(host.root().string() + logDataFile);
         fs::create_directories(host.root().string() + ffdcFolder);
     },
     {},
     {settingsFile, ffdcLog}},
    {"NoFolderEtc",
     [](Host& host)
     {
         fs::remove_all(host.root() / "etc");
         host.write("/etc", "a file");
     },
     {},
     {"/etc"}},
};

class FileSystem : public testing::TestWithParam<FileRow>
{};

TEST_P(FileSystem, DoesNotStopTheModule)
{
    const FileRow& row = GetParam();
    const std::string machine = machineFiles();
    Host host;
    const std::vector<std::string> given = filesBelow(host.root());
    row.arrange(host);
    for (int load = 0; load < 2; ++load)
    {
        EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
        EXPECT_EQ(host.instancesOf("TVRHBA_RegisteredProfile").empty(), false);
        host.unload();
    }
    for (const std::string& line : row.logged)
        EXPECT_GE(host.logged(line), 1u) << line;
    EXPECT_EQ(host.log().empty(), row.logged.empty());

    std::vector<std::string> made = filesBelow(host.root());
    std::erase_if(made, [&](const std::string& file) { return std::ranges::find(given, file) != given.end(); });
    EXPECT_THAT(made, testing::UnorderedElementsAreArray(row.files));
    EXPECT_EQ(machineFiles(), machine);
}

INSTANTIATE_TEST_SUITE_P(Rows, FileSystem, testing::ValuesIn(fileRows),
                         [](const auto& info) { return info.param.name; });

TEST(FirstFailureLog, HasErrorsAndNoWarnings)
{
    Host host;
    fs::remove(host.root().string() + logDataFile);
    fs::create_directories(host.root().string() + ffdcFolder);
    host.addFault(R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-2", "status": 1})");
    host.addFault(R"({"function": "LRM_GetHBAAttributes", "subject": "1000027A51160210", "status": 1})");
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 1u);
    const std::string log = host.read(ffdcLog);
    EXPECT_THAT(log, testing::HasSubstr("[TVR_ERR] ERROR: RM_GetHBAAttributes call failed (1)\n"));
    for (const char* level : {"[TVR_WARN]", "[TVR_INFO]", "[TVR_DBG]"})
        EXPECT_THAT(log, testing::Not(testing::HasSubstr(level)));
    host.unload();
}

} // namespace
