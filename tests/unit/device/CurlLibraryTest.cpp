#include "FakeHost.h"

#include "device/CurlLibrary.h"
#include "foundation/HostInformation.h"

#include <gmock/gmock.h>
#include <sys/statvfs.h>

using namespace cimple;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

namespace
{

constexpr std::uint16_t fileScheme = 3;

std::vector<std::uint16_t> widened()
{
    Array<std::uint16_t> schemes{fileScheme};
    UpdateCURLCapabilities(schemes);
    return {schemes.begin(), schemes.end()};
}

TEST(CurlLibrary, IsLookedForInOrderAndClosed)
{
    const std::string files[] = {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "libcurl.so", "curl.dll",
                                 "libcurl.so.4"};
    std::vector<std::string> calls;
    for (const std::string& file : files)
    {
        FakeHost host;
        host.files = {file};
        EXPECT_THAT(widened(), ElementsAre(3, 4, 5, 6, 8));
        calls.push_back("open " + file);
        std::vector<std::string> expected = calls;
        expected.push_back("close " + file);
        EXPECT_THAT(host.loaderCalls, ElementsAreArray(expected));
    }
    FakeHost host;
    const LogCapture log;
    EXPECT_THAT(widened(), ElementsAre(fileScheme));
    EXPECT_THAT(host.loaderCalls, ElementsAreArray(calls));
    EXPECT_THAT(log.lines, ElementsAre("5 Inside UpdateCURLCapabilities", "5  Inside IsReadOnlyFS()",
                                       "4 libcurl is not present. only file type URIScheme will be supported"));
}

TEST(CurlLibrary, CountsAlsoWhenItDoesNotClose)
{
    FakeHost host;
    host.files = {"libcurl.so"};
    host.closeFails = true;
    const LogCapture log;
    EXPECT_THAT(widened(), ElementsAre(3, 4, 5, 6, 8));
    EXPECT_EQ(log.count("5 ERROR: UNABLE TO CLOSE DYNAMIC LIB"), 1);
}

TEST(CurlLibrary, IsNoUseWhereNothingCanBeWritten)
{
    FakeHost host;
    host.files = {"libcurl.so"};
    setStatvfs(
        [](const char*, struct statvfs* status)
        {
            *status = {};
            status->f_flag = ST_RDONLY;
            return 0;
        });
    EXPECT_THAT(widened(), ElementsAre(fileScheme));
    EXPECT_THAT(host.loaderCalls, IsEmpty());
    setStatvfs(nullptr);
}

} // namespace
