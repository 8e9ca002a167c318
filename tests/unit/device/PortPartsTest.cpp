// What stands at a port: beacon, transceiver, flash memory.
#include "tests/unit/device/FakeHost.h"

#include "device/TVR_MethodWrapper.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace cimple;
using W = TVR_MethodWrapper;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

constexpr const char* portId = "1000112233123456";

TEST(Beacon, EachStateHasItsValueAndLine)
{
    const struct
    {
        std::uint32_t state;
        int status;
        std::uint16_t value; ///< 7 where it stays
        const char* line;
    } rows[] = {
        {1, 0, 7, "5 Beacon state = 'Not available'\n"},
        {2, 0, 3, "5 Beacon state = 'Off'\n"},
        {3, 0, 2, "5 Beacon state = 'On'\n"},
        {4, 0, 7, "5 Beacon state = 'Unknown'\n"},
        {2, 2, 4, "5 Beaconing not supported on host or adapter"},
        {2, 63, 4, "5 Diagnostics not available"},
        {2, 1, 0, "5 Unable to get the beacon state"},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.line);
        LoadedHost host;
        LogCapture log;
        host.beacon = row.state;
        host.statuses["LRM_DiagBeaconState"] = {row.status};
        std::uint16_t value = 7;
        EXPECT_EQ(W::GetBeaconState(portId, &value), 0u);
        EXPECT_EQ(value, row.value);
        EXPECT_EQ(log.count(row.line), 1);
    }
}

TEST(Beacon, WrongArgumentsReachNoLibrary)
{
    LoadedHost host;
    LogCapture log;
    std::uint16_t value = 7;
    EXPECT_EQ(W::GetBeaconState(portId, nullptr), 32968u);
    EXPECT_EQ(log.count("5 INVALID Parameter"), 1);
    EXPECT_EQ(W::GetBeaconState("100011223312345G", &value), 32968u);
    EXPECT_EQ(log.count("3 str2HBAName failed"), 1);
    for (const std::uint16_t wrong : {0, 1, 4, 65535})
        EXPECT_EQ(W::SetBeaconState(wwn(1), wrong), 32968u);
    EXPECT_EQ(value, 7u);
    EXPECT_EQ(host.calls["LRM_DiagBeaconState"] + host.calls["LRM_DiagBeacon"], 0);
}

TEST(Beacon, IsSetAndAFailureIsOnlyLogged)
{
    LoadedHost host;
    LogCapture log;
    EXPECT_EQ(W::SetBeaconState(wwn(1), 2), 0u);
    EXPECT_EQ(host.beacon, 3u);
    EXPECT_EQ(W::SetBeaconState(wwn(1), 3), 0u);
    EXPECT_EQ(host.beacon, 2u);
    EXPECT_EQ(log.count("5 Successfully set the beacon state"), 2);
    host.statuses["LRM_DiagBeacon"] = {1};
    EXPECT_EQ(W::SetBeaconState(wwn(1), 2), 0u);
    EXPECT_EQ(log.count("5 Failed to set the beacon state to 3 "), 1);
}

TEST(Transceiver, IsGivenWholeOrNotAtAll)
{
    LoadedHost host;
    LogCapture log;
    host.transceiver.waveLength = 850;
    std::unique_ptr<RM_SffData> data;
    EXPECT_EQ(W::tvrcimGetDigitalDiagnosticsData("x", data), 1);
    host.statuses["LRM_GetSffData"] = {2, 0};
    EXPECT_EQ(W::tvrcimGetDigitalDiagnosticsData(portId, data), 2);
    EXPECT_EQ(data, nullptr);
    EXPECT_EQ(log.count("5 Unable to obtain transceiver data for this host bus adapter."), 1);
    EXPECT_EQ(W::tvrcimGetDigitalDiagnosticsData(portId, data), 0);
    ASSERT_NE(data, nullptr);
    EXPECT_EQ(data->waveLength, 850u);
}

TEST(FlashContents, CountIsOneMoreThanTheRegionsAndBounded)
{
    LoadedHost host;
    LogCapture log;
    const std::pair<std::uint32_t, std::size_t> rows[] = {{1, 0},   {2, 1},  {64, 63},        {65, 64},
                                                          {66, 64}, {0, 64}, {0xFFFFFFFF, 64}};
    for (const auto& [count, regions] : rows)
    {
        host.flash.count = count;
        std::vector<RM_FlashRegion> out;
        EXPECT_EQ(W::GetFlashContents(portId, out), 0);
        EXPECT_THAT(out, SizeIs(regions)) << count;
    }
    std::vector<RM_FlashRegion> out;
    host.statuses["LRM_DiagGetLoadListParams"] = {63};
    EXPECT_EQ(W::GetFlashContents(portId, out), 63);
    EXPECT_THAT(out, IsEmpty());
    EXPECT_EQ(log.count("5 Failed to retrieve the flash contents. Exited with ErrorCode 63"), 1);
    EXPECT_EQ(W::GetFlashContents(nullptr, out), 1);
}

} // namespace
