#include "tests/unit/foundation/LogFixture.h"

#include "foundation/HostInformation.h"
#include "foundation/TVR_FileLogger.h"
#include "tests/support/NoMemory.h"

#include <sys/stat.h>

namespace cimple
{
namespace
{

using testing::ElementsAre;

class Host : public LogTest
{
protected:
    CapturingSink sink;
    String name;
    String distribution;
};

TEST_F(Host, PathsFollowTheRootOfTheMoment)
{
    EXPECT_EQ(filePath(FilePath::SystemLog), root / "var/log/messages");
    {
        const TemporaryRoot other;
        EXPECT_EQ(filePath(FilePath::SystemLog), other / "var/log/messages");
    }
    unsetenv("TVR_FILE_ROOT");
    EXPECT_EQ(filePath(FilePath::ProviderConfig), "/etc/tavrin_fc_provider.conf");
}

int calls = 0;

int failingRoot(const char*, struct statvfs*)
{
    ++calls;
    return -1;
}

template <unsigned long Flags> int countedRoot(const char* path, struct statvfs* status)
{
    ++calls;
    EXPECT_STREQ(path, "/");
    return mountedRoot<Flags>(path, status);
}

TEST_F(Host, IsAskedForItsRootFileSystemUntilItAnswers)
{
    calls = 0;
    setStatvfs(failingRoot);
    EXPECT_FALSE(IsReadOnlyFS());
    EXPECT_FALSE(IsReadOnlyFS());
    EXPECT_EQ(calls, 2);
    EXPECT_THAT(sink.take(TVR_DBG),
                ElementsAre(LogLine{TVR_DBG, " Inside IsReadOnlyFS()"}, LogLine{TVR_DBG, " Inside IsReadOnlyFS()"}));
    setStatvfs(countedRoot<ST_RDONLY | ST_NOSUID>);
    EXPECT_TRUE(IsReadOnlyFS());
    EXPECT_TRUE(IsReadOnlyFS());
    EXPECT_EQ(calls, 3);
    setStatvfs(countedRoot<ST_NOSUID>);
    EXPECT_FALSE(IsReadOnlyFS());
    EXPECT_FALSE(IsReadOnlyFS());
    EXPECT_EQ(calls, 4);
}

TEST_F(Host, TellsItsKernelLineAndItsWholeBanner)
{
    writeFile(root / "proc/version", "Linux version 6.1.0 (builder)\nsecond line\n");
    writeFile(root / "etc/issue", "Debian GNU/Linux 12 \\n \\l\n\n");
    EXPECT_EQ(getOSInformation(name, distribution), 0);
    EXPECT_EQ(name, "Linux version 6.1.0 (builder)");
    EXPECT_EQ(distribution, "Debian GNU/Linux 12 \\n \\l\n\n");
    EXPECT_THAT(sink.take(TVR_DBG), ElementsAre(LogLine{TVR_DBG, "Inside  getOSInformation"},
                                                LogLine{TVR_DBG, "Under _LINUX -- getting the os name and version"},
                                                LogLine{TVR_DBG, "Under _LINUX -- Getting the OS Distribution Name"}));
    writeFile(root / "proc/version", std::string(1000, 'v'));
    writeFile(root / "etc/issue", "");
    EXPECT_EQ(getOSInformation(name, distribution), 0);
    EXPECT_EQ(name.size(), 255u);
    EXPECT_EQ(distribution, "");
}

TEST_F(Host, IsUnknownWhereAFileIsMissing)
{
    EXPECT_EQ(getOSInformation(name, distribution), 1);
    EXPECT_EQ(name, "Unknown");
    EXPECT_EQ(distribution, "Unknown");

    writeFile(root / "proc/version", "Linux\n");
    EXPECT_NE(getOSInformation(name, distribution), 0);
    EXPECT_EQ(name, "Linux");
    EXPECT_EQ(distribution, "Unknown");
    EXPECT_EQ(sink.take(TVR_ERR).back().message, "Unable to open the /etc/issue file to get OSDistribution Name");

    ASSERT_EQ(mkfifo((root / "etc/issue").c_str(), 0600), 0); // opening it the plain way would wait for a writer
    EXPECT_NE(getOSInformation(name, distribution), 0);
    EXPECT_EQ(sink.take(TVR_ERR).back().message, "Unable to open the /etc/issue file to get OSDistribution Name");
}

TEST_F(Host, KeepsItsKernelLineWhereItsBannerFindsNoMemory)
{
    writeFile(root / "proc/version", "Linux\n");
    writeFile(root / "etc/issue", std::string(5'000, 'i'));
    logger.setMode(2);
    TVR_FileLogger file;
    ASSERT_EQ(file.validateAndSetPath((root / "log").c_str(), true), 0);
    logger.removeSink(&sink); // it needs memory itself
    std::size_t told = 0;
    int status = 0;
    const auto ask = [&]
    {
        status = -1; // should it throw
        status = getOSInformation(name, distribution);
    };
    const auto check = [&](bool failed)
    {
        EXPECT_TRUE(status == 0 || failed);
        if (status == 1)
        {
            ++told;
            EXPECT_EQ(name, "Linux");
            EXPECT_EQ(distribution, "Unknown");
        }
        name = distribution = String();
    };
    test_support::withEachAllocationFailing(ask, check);
    EXPECT_GE(told, 3u) << "the file's name, its content, the text";
    std::size_t lines = 0;
    std::ifstream log(root / "log");
    for (std::string line; std::getline(log, line); ++lines)
        EXPECT_THAT(line, testing::EndsWith("[TVR_ERR] Unable to allocate the memory to store OSDistributionName"));
    EXPECT_EQ(lines, told);
}

TEST_F(Host, BannerOfAGigabyteIsCutToWhatClientsCanUse)
{
    writeFile(root / "proc/version", "Linux\n");
    writeFile(root / "etc/issue", std::string(65'535, 'i') + "end");
    std::filesystem::resize_file(root / "etc/issue", 1 << 30);
    EXPECT_EQ(getOSInformation(name, distribution), 0);
    EXPECT_EQ(distribution, (std::string(65'535, 'i') + "e").c_str());
}

} // namespace
} // namespace cimple
