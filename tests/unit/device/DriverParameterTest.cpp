#include "FakeHost.h"

#include "device/TVR_MethodWrapper.h"

#include <cstring>
#include <gmock/gmock.h>

using namespace cimple;
using testing::ElementsAreArray;
using testing::SizeIs;

namespace
{

constexpr const char* portId = "1000112233123456";

/// A list of 64 entries fits at the first call, and a longer one is asked for once more.
struct Row
{
    std::size_t count;        ///< of parameters
    std::deque<int> statuses; ///< of the calls, before the library does its work
    int status;               ///< of the query
    int calls;
    std::vector<std::string> global; ///< its log behind the entry, for all adapters
    std::vector<std::string> port;   ///< the same for a port
};

const Row rows[] = {
    {0,
     {},
     0,
     1,
     {"5 RM_GetDriverParamsGlobal: status=0", "5 number of driver parameters 0"},
     {"5 RM_GetDriverParams: status=0", "5 number of driver parameters 0"}},
    {64,
     {},
     0,
     1,
     {"5 RM_GetDriverParamsGlobal: status=0", "5 number of driver parameters 64"},
     {"5 RM_GetDriverParams: status=0", "5 number of driver parameters 64"}},
    {65,
     {},
     0,
     2,
     {"5 RM_GetDriverParamsGlobal: status=7", "5 RM_GetDriverParamsGlobal: status=0",
      "5 number of driver parameters 65"},
     {"5 RM_GetDriverParams: status=7", "5 RM_GetDriverParams: status=0", "5 number of driver parameters 65"}},
    {3,
     {191},
     0,
     2,
     {"5 RM_GetDriverParamsGlobal: status=191", "5 RM_GetDriverParamsGlobal: status=0",
      "5 number of driver parameters 3"},
     {"5 RM_GetDriverParams: status=191", "5 RM_GetDriverParams: status=0", "5 number of driver parameters 3"}},
    {3,
     {4},
     4,
     1,
     {"5 RM_GetDriverParamsGlobal: status=4",
      "5 ERROR: tvrcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed (a) (4)"},
     {"5 RM_GetDriverParams: status=4", "5 RM_GetDriverParams:failed"}},
    {3,
     {7, 191},
     191,
     2,
     {"5 RM_GetDriverParamsGlobal: status=7", "5 RM_GetDriverParamsGlobal: status=191",
      "5 ERROR: tvrcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed (b) (191)"},
     {"5 RM_GetDriverParams: status=7", "5 RM_GetDriverParams: status=191", "5 RM_GetDriverParams:failed"}},
};

TEST(DriverParameterQuery, AsksAgainOnceForALongerList)
{
    for (const Row& row : rows)
        for (const char* device : {static_cast<const char*>(nullptr), portId})
        {
            LoadedHost host;
            for (std::size_t i = 0; i < row.count; ++i)
                host.driverParameters.emplace_back().lowRange = static_cast<std::uint32_t>(i);
            const std::string function = device ? "LRM_GetDriverParams" : "LRM_GetDriverParamsGlobal";
            host.statuses[function] = row.statuses;
            std::vector<RM_DriverParam> out(1);
            LogCapture log;
            EXPECT_EQ(TVR_MethodWrapper::tvrcimGetDriverParam(device, &out), row.status);
            EXPECT_EQ(host.calls[function], row.calls);
            ASSERT_THAT(out, SizeIs(row.status == 0 ? row.count : 1)); // a failure leaves it
            EXPECT_TRUE(row.status != 0 || row.count == 0 || out.back().lowRange == row.count - 1);

            std::erase_if(log.lines, [](const std::string& line)
                          { return line.find("river") == line.npos || line.ends_with("()"); });
            EXPECT_THAT(log.lines, ElementsAreArray(device ? row.port : row.global));
        }
}

TEST(DriverParameterQuery, RefusesAWrongNameAndANullOutput)
{
    LoadedHost host;
    std::vector<RM_DriverParam> out;
    EXPECT_EQ(TVR_MethodWrapper::tvrcimGetDriverParam("short", &out), 1);
    EXPECT_EQ(TVR_MethodWrapper::tvrcimGetDriverParam(portId, nullptr), 1);
    EXPECT_EQ(host.calls["LRM_GetDriverParams"], 0);
}

} // namespace
