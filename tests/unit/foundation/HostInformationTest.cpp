#include "tests/unit/foundation/LogFixture.h"

#include "foundation/HostInformation.h"

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

    std::filesystem::create_directory(root / "etc/issue"); // opens, and tells an absurd size
    EXPECT_NE(getOSInformation(name, distribution), 0);
    EXPECT_EQ(sink.take(TVR_ERR).back().message, "Unable to allocate the memory to store OSDistributionName");
}

} // namespace
} // namespace cimple
