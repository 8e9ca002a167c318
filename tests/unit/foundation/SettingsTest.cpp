// The settings of the instance cache and the URL of the management page, as texts and as files.
#include "tests/unit/foundation/LogFixture.h"

#include "foundation/TVR_FileLogger.h"
#include "foundation/TvrConfigFile.h"
#include "foundation/WebLaunchConfig.h"
#include "tests/support/NoMemory.h"

#include <sys/stat.h>

#include <cerrno>
#include <functional>
#include <tuple>

namespace cimple
{
namespace
{

using testing::ElementsAre;
using testing::IsEmpty;

constexpr const char* defaultText = "##################################################\n"
                                    "# Tavrin HBA CIM Provider Configuration Settings #\n"
                                    "##################################################\n"
                                    "TVR_PROVIDER_CACHE_TIMEOUT = 10\n"
                                    "TVR_PROVIDER_REFRESH_ADAPTERDATA = FALSE\n"
                                    "TVR_PROVIDER_REFRESH_SANDATA = TRUE\n";

struct SettingsRow
{
    std::string text;
    int timeout;
    bool adapter;
    bool san;
};

class SettingsText : public testing::TestWithParam<SettingsRow>
{};

TEST_P(SettingsText, AppliesTheFirstValidLineOfEachKey)
{
    CacheSettings settings;
    parseSettings(GetParam().text, settings);
    EXPECT_EQ(settings.cacheTimeout, GetParam().timeout);
    EXPECT_EQ(settings.refreshAdapterData, GetParam().adapter);
    EXPECT_EQ(settings.refreshSANData, GetParam().san);
}

std::string repeated(int times, const std::string& text)
{
    std::string all;
    for (int i = 0; i < times; ++i)
        all += text;
    return all;
}

INSTANTIATE_TEST_SUITE_P(
    Rows, SettingsText,
    testing::Values(SettingsRow{"", 10, false, true}, SettingsRow{defaultText, 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT=3", 3, false, true},
                    SettingsRow{"\t TVR_PROVIDER_CACHE_TIMEOUT \v=\f 30 \r\n", 30, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = 31\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = 31\nTVR_PROVIDER_CACHE_TIMEOUT = 20\n", 20, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = 4\nTVR_PROVIDER_CACHE_TIMEOUT = 20\n", 4, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = 0\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = -1\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = 4294967299\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = \n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = 7 = 8\n", 7, false, true},
                    SettingsRow{"tvr_provider_cache_timeout = 3\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUTS = 3\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT 3\n= 3\n=\n", 10, false, true},
                    SettingsRow{"  # TVR_PROVIDER_CACHE_TIMEOUT = 3\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_REFRESH_SANDATA = true\n", 10, false, true},
                    SettingsRow{"TVR_PROVIDER_REFRESH_SANDATA = false\nTVR_PROVIDER_REFRESH_SANDATA=FALSE", 10, false,
                                false},
                    SettingsRow{"TVR_PROVIDER_REFRESH_ADAPTERDATA = TRUE\nTVR_PROVIDER_REFRESH_ADAPTERDATA = FALSE\n",
                                10, true, true},
                    SettingsRow{"TVR_PROVIDER_REFRESH_ADAPTERDATA = TRUE TRUE\n", 10, false, true},
                    SettingsRow{repeated(999, "\n") + "TVR_PROVIDER_CACHE_TIMEOUT = 3\n", 3, false, true},
                    SettingsRow{repeated(1000, "\n") + "TVR_PROVIDER_CACHE_TIMEOUT = 3\n", 10, false, true},
                    SettingsRow{std::string(1100, '#') + "\nTVR_PROVIDER_CACHE_TIMEOUT = 3\n", 3, false, true},
                    SettingsRow{"TVR_PROVIDER_CACHE_TIMEOUT = " + std::string(1100, ' ') + "3\n", 10, false, true}));

// --- file ----------------------------------------------------------------------------------------------

class SettingsFile : public LogTest
{
protected:
    const std::string path = root / "etc/tavrin_fc_provider.conf";
    CapturingSink sink;
};

TEST_F(SettingsFile, IsCreatedWithTheDefaultsAtTheEnd)
{
    {
        TvrConfigFile config;
        config.load(path.c_str());
        EXPECT_EQ(config.getCacheTimeout(), 10);
        EXPECT_FALSE(config.getRefreshAdapterData());
        EXPECT_TRUE(config.getRefreshSANData());
        EXPECT_FALSE(std::filesystem::exists(path));
    }
    EXPECT_EQ(fileText(path), defaultText);
    EXPECT_THAT(sink.lines, IsEmpty());
}

TEST_F(SettingsFile, IsReadEvenAfterAFailureElsewhere)
{
    writeFile(path, "TVR_PROVIDER_CACHE_TIMEOUT = 3\n");
    TvrConfigFile config;
    errno = ENOENT;
    config.load(path.c_str());
    EXPECT_EQ(config.getCacheTimeout(), 3);
}

TEST_F(SettingsFile, TakesChangesOnlyAtTheEnd)
{
    const std::string before = "TVR_PROVIDER_CACHE_TIMEOUT = 3\nunknown\n";
    writeFile(path, before);
    {
        TvrConfigFile config;
        config.load(path.c_str());
        EXPECT_EQ(config.setCacheTimeout(30), 0);
        EXPECT_EQ(config.setRefreshAdapterData(1), 0);
        EXPECT_EQ(config.setRefreshSANData(0), 0);
        EXPECT_EQ(fileText(path), before);
    }
    TvrConfigFile again;
    again.load(path.c_str());
    EXPECT_EQ(again.getCacheTimeout(), 30);
    EXPECT_TRUE(again.getRefreshAdapterData());
    EXPECT_FALSE(again.getRefreshSANData());
}

TEST_F(SettingsFile, SettersRefuseWhatIsOutOfRange)
{
    TvrConfigFile config;
    for (const unsigned minutes : {0u, 31u, 0xFFFFFFFFu, 0x80000001u})
        EXPECT_NE(config.setCacheTimeout(minutes), 0) << minutes;
    EXPECT_NE(config.setRefreshAdapterData(2), 0);
    EXPECT_NE(config.setRefreshSANData(0xFFFFFFFFu), 0);
    EXPECT_EQ(config.getCacheTimeout(), 10);
    EXPECT_FALSE(config.getRefreshAdapterData());
    EXPECT_TRUE(config.getRefreshSANData());
    EXPECT_EQ(config.setCacheTimeout(1), 0);
    EXPECT_EQ(config.getCacheTimeout(), 1);
}

TEST_F(SettingsFile, IsNamedWhenItExistsAndDoesNotOpen)
{
    const std::string below = path + "/below"; // stat() fails with something else than ENOENT
    writeFile(path, "");
    TvrConfigFile config;
    config.load(nullptr);
    config.load(below.c_str());
    EXPECT_THAT(sink.lines, ElementsAre(LogLine{TVR_ERR, "Unable to open provider config setting file - " + below}));
    EXPECT_EQ(config.getCacheTimeout(), 10);
}

TEST_F(SettingsFile, IsLeftAloneWhereItSaysTheSame)
{
    writeFile(path, defaultText);
    struct stat before;
    ASSERT_EQ(stat(path.c_str(), &before), 0);
    {
        TvrConfigFile config;
        config.load(path.c_str());
        config.setCacheTimeout(12);
        config.setCacheTimeout(10);
    }
    struct stat after;
    ASSERT_EQ(stat(path.c_str(), &after), 0);
    EXPECT_EQ(after.st_ino, before.st_ino);
    EXPECT_EQ(after.st_mtim.tv_nsec, before.st_mtim.tv_nsec);
}

TEST_F(SettingsFile, IsWrittenOnceAtTheEnd)
{
    TvrConfigFile config;
    config.save(); // nothing was loaded
    config.load(path.c_str());
    config.save();
    EXPECT_EQ(fileText(path), defaultText);
    writeFile(path, "of another process");
    config.save();
    EXPECT_EQ(fileText(path), "of another process");
    config.setCacheTimeout(11);
    config.save();
    EXPECT_THAT(fileText(path), testing::HasSubstr("TIMEOUT = 11\n"));
}

TEST_F(SettingsFile, IsNotWrittenByAChildOfTheProcessThatReadIt)
{
    TvrConfigFile config;
    config.load(path.c_str());
    EXPECT_EQ(inChild(
                  [&]
                  {
                      config.save();
                      return 0;
                  }),
              0);
    EXPECT_FALSE(std::filesystem::exists(path));
    EXPECT_EQ(inChild(
                  [&]
                  {
                      config.load(path.c_str()); // a child that uses the module itself
                      config.save();
                      return 0;
                  }),
              0);
    EXPECT_EQ(fileText(path), defaultText);
}

TEST_F(SettingsFile, SurvivesProcessesThatStartAndEndTogether)
{
    const std::string given = "# by hand\nTVR_PROVIDER_CACHE_TIMEOUT = 17\n"; // to be brought into form
    for (int round = 0; round < 20; ++round)
    {
        writeFile(path, given);
        int gate[2];
        ASSERT_EQ(pipe(gate), 0);
        std::vector<pid_t> children;
        for (int i = 0; i < 6; ++i)
        {
            children.push_back(fork());
            if (children.back() != 0)
                continue;
            char none;
            close(gate[1]);
            std::ignore = read(gate[0], &none, 1); // until the parent closes it
            TvrConfigFile config;
            config.load(path.c_str());
            config.save();
            _exit(0);
        }
        close(gate[0]);
        close(gate[1]);
        for (const pid_t child : children)
            waitpid(child, nullptr, 0);
        ASSERT_THAT(fileText(path), testing::HasSubstr("TIMEOUT = 17\n"));
    }
    EXPECT_THAT(namesIn(root / "etc"), ElementsAre("tavrin_fc_provider.conf"));
}

TEST_F(SettingsFile, IsNamedAndKeptWhenItCannotBeWritten)
{
    struct Row
    {
        const char* reason;
        std::function<void()> arrange;
    };
    const Row rows[] = {
        {"File too large", [] { limitFiles(100); }},
        {"Too many levels of symbolic links",
         [&]
         {
             std::filesystem::rename(path, path + ".real");
             std::filesystem::create_symlink(path + ".real", path);
             chmod((root / "etc").c_str(), 01777);
         }},
    };
    for (const Row& row : rows)
    {
        writeFile(path, "old");
        const int status = inChild(
            [&]
            {
                TvrConfigFile config;
                config.load(path.c_str());
                row.arrange();
                config.save();
                return sink.take(TVR_ERR) == std::vector{LogLine{TVR_ERR, "Unable to write provider config setting "
                                                                          "file - " +
                                                                              path + ": " + row.reason}}
                           ? 0
                           : 1;
            });
        EXPECT_EQ(status, 0) << row.reason;
        EXPECT_EQ(fileText(path), "old") << row.reason;
    }
}

TEST_F(SettingsFile, IsLeftAloneWhereItCouldNotBeRead)
{
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    {
        TvrConfigFile config;
        config.load(path.c_str());
        EXPECT_THAT(sink.take(TVR_ERR),
                    ElementsAre(LogLine{TVR_ERR, "Unable to open provider config setting file - " + path}));
        std::filesystem::remove(path); // as if descriptors had run out for the time of the start
        writeFile(path, "of the administrator");
    }
    EXPECT_EQ(fileText(path), "of the administrator");
    EXPECT_THAT(sink.lines, IsEmpty());
}

TEST_F(SettingsFile, NeedsNoMemoryToFail)
{
    writeFile(path, "old");
    logger.setMode(2);
    TVR_FileLogger file;
    ASSERT_EQ(file.validateAndSetPath((root / "log").c_str(), false), 0);
    logger.removeSink(&sink); // it needs memory itself
    TvrConfigFile config;
    config.load(path.c_str());
    {
        const test_support::NoMemory none;
        config.save();
    }
    EXPECT_EQ(fileText(path), "old");
    EXPECT_THAT(fileText(root / "log"), testing::HasSubstr("Unable to write provider config setting file - " + path +
                                                           ": Cannot allocate memory\n"));
}

// --- management page -----------------------------------------------------------------------------------

TEST(WebLaunchText, GivesTheFirstLineThatIsNoComment)
{
    const std::pair<std::string, const char*> rows[] = {
        {"", ""},
        {"\n \t\n# comment\n  # another\n", ""},
        {"# comment\n\n  https://host/page \nhttps://other\n", "https://host/page "},
        {"https://host/page\r\n", "https://host/page"},
        {"https://host/page", "https://host/page"},
        {std::string("https://host\0/page\n", 19), "https://host"},
    };
    for (const auto& [text, url] : rows)
        EXPECT_EQ(parseWebLaunchUrl(text), url) << text;
    EXPECT_EQ(parseWebLaunchUrl(std::string(300, 'u')).size(), 255u);
}

TEST_F(SettingsFile, WebLaunchConfigReadsItsOwn)
{
    const std::string webLaunch = root / "etc/tvr_smis.conf";
    EXPECT_TRUE(WebLaunchConfig().getUrl().empty());
    EXPECT_THAT(sink.lines, ElementsAre(LogLine{TVR_INFO, "WebLaunch config file '" + webLaunch + "' not found."}));
    writeFile(webLaunch, "# page\nhttps://host/page\n");
    EXPECT_EQ(WebLaunchConfig().getUrl(), "https://host/page");
}

} // namespace
} // namespace cimple
