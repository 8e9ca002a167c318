// What the services' calls do where no client leads them: a library that throws, and controls that no method has.
#include "tests/unit/device/FakeHost.h"

#include "services/BootBiosCalls.h"
#include "services/WwnCalls.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

using namespace cimple;
using testing::ElementsAre;

namespace
{

TEST(WwnCalls, AnExceptionOfTheLibraryIsAFailure)
{
    LoadedHost host;
    host.onCall["LRM_ChangeWWN"] = host.onCall["LRM_RestoreWWN"] = [] { throw std::runtime_error("broken"); };
    LogCapture log;
    std::uint16_t duplicate = 7;
    EXPECT_EQ(ChangeWWN(wwn(1), wwn(2), wwn(3), 0, &duplicate), 1);
    EXPECT_EQ(duplicate, 0);
    EXPECT_EQ(RestoreWWN(wwn(1), 0), 1);
    EXPECT_THAT(log.notable(), ElementsAre("4 ChangeWWN operation initiated", "3 Error in RM_ChangeWWN",
                                           "3 ChanngeWWN: RM_ChangeWWN call failed with error: 1",
                                           "4 RestoreWWN operation initiated.", "3 Error in RestoreWWN"));
}

TEST(BootBiosCalls, OtherControlsReachNoLibrary)
{
    LoadedHost host;
    LogCapture log;
    EXPECT_EQ(tvrcimSetBootBiosState(wwn(1), nullptr), 4u);
    EXPECT_EQ(log.count("3 Null Pointer Assignment to argument CtrlWord"), 1);
    EXPECT_EQ(tvrcimSetBootBiosState(wwn(1), "x"), 1u);
    EXPECT_EQ(tvrcimSetBootBiosState(wwn(1), ""), 1u);
    EXPECT_EQ(host.calls["LRM_SetBootBiosState"], 0);
    EXPECT_EQ(tvrcimSetBootBiosState(wwn(1), "d"), 0u);
    EXPECT_EQ(log.count("5 CtrlWord is  d"), 1);
    EXPECT_EQ(tvrcimGetBootBiosState(wwn(1), nullptr), 1u);
    EXPECT_EQ(log.count("5 Null Pointer Assignment to argument biosState"), 1);
}

} // namespace
