#include "FakeHost.h"

#include "device/Data.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"

#include <cstring>
#include <gmock/gmock.h>

using namespace cimple;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::SizeIs;

namespace
{

class DataTest : public testing::Test
{
protected:
    FCAdapterAttributes& attributes(std::size_t adapter = 0)
    {
        return dynamic_cast<FCAdapterAttributes&>(*data.adapters.at(adapter)->getAttributes());
    }
    FCPort& port(std::size_t index = 0) { return dynamic_cast<FCPort&>(*data.ports.at(index)); }
    std::vector<std::string> names() const
    {
        std::vector<std::string> out;
        for (const Adapter* adapter : data.adapters)
            out.push_back(adapter->name);
        return out;
    }

    LoadedHost host;
    LogCapture log;
    Data data;
};

TEST_F(DataTest, EmptyHost)
{
    EXPECT_EQ(host.calls["HBA_LoadLibrary"], 1);
    data.buildAdapterData();
    EXPECT_FALSE(data.dataValid);
    EXPECT_EQ(data.adapterCount, 0u);
    EXPECT_THAT(log.lines, ElementsAre("5 Data Pointer Constructed.", "5 buildAdapterData", "5 freeAllData: Entry",
                                       "5 freeAllData: cleanExit", "5 buildAdapterData - with hbaapi",
                                       "5 Number of Adapters detected = 0",
                                       "1 HBAAPI reports that there are NO HBAs in the system."));
}

TEST_F(DataTest, WhatTheLoadedLibrariesDefineIsFound)
{
    host.addAdapter(1);
    host.absentSymbols = {"HBA_GetNumberOfAdapters"};
    resolveAllEntries();
    host.onCall["HBA_LoadLibrary"] = [&] { host.absentSymbols.clear(); };
    Data other;
    other.buildAdapterData();
    EXPECT_EQ(other.adapterCount, 1u);
}

TEST_F(DataTest, TreeOfAdaptersAndPorts)
{
    host.addAdapter(2);
    host.addAdapter(1);
    data.buildAdapterData();
    EXPECT_TRUE(data.dataValid);
    EXPECT_EQ(data.adapterCount, 2u);
    EXPECT_THAT(names(), ElementsAre("Tavrin-F0", "Tavrin-F1"));
    ASSERT_THAT(data.ports, SizeIs(3));
    EXPECT_EQ(data.ports[1]->name, "10000000ABCDEF01");
    EXPECT_EQ(data.ports[1]->nodeName, "2000000000000000");
    EXPECT_EQ(data.ports[1]->portIndex, 1u);
    EXPECT_EQ(data.ports[1]->getAdapter(), data.adapters[0]);
    EXPECT_EQ(data.adapters[1]->getAdapterNumber(), 1u);
    EXPECT_EQ(data.adapters[0]->getPort(1), data.ports[1]);
    EXPECT_THROW(data.adapters[0]->getPort(2), std::out_of_range);
    EXPECT_THROW(data.ports[0]->getTarget(0), std::out_of_range);
    EXPECT_THAT(log.notable(), IsEmpty());
    EXPECT_EQ(host.calls["HBA_OpenAdapter"], host.calls["HBA_CloseAdapter"]);

    // A second build starts from nothing.
    host.adapters.pop_back();
    log.lines.clear();
    data.buildAdapterData();
    EXPECT_THAT(names(), ElementsAre("Tavrin-F0"));
    EXPECT_THAT(data.ports, SizeIs(2));
    EXPECT_THAT(log.lines, IsSupersetOf({"5 Freeing adapter: Tavrin-F1", "5 ~FCAdapter", "5 ~Adapter",
                                         "5 Freeing Port: 10000000ABCDEF10", "5 ~FCPort", "5 ~Port"}));
}

/// One adapter of three goes wrong; the two others stay.
struct FaultCase
{
    const char* function;
    std::deque<int> statuses; ///< until the second adapter fails
    std::vector<std::string> lines;
};

TEST_F(DataTest, AFailingAdapterLeavesTheOthers)
{
    const FaultCase cases[] = {
        {"HBA_GetAdapterName", {0, 5}, {"2 Error hbaStatus = 5, Skipping Adapter# 1"}},
        {"HBA_OpenAdapter",
         {0, 0, 1}, // the first adapter is opened for itself and for its port
         {"3 HBA_OpenAdapter failed, skipping Adapter Tavrin-F1",
          "3 Catch ALL error during creating adapter..., Skipping Adapter# 1"}},
        {"HBA_GetAdapterPortAttributes",
         {0, 0, 1},
         {"3 (portIndex = 0) failed with hbaStatus 1",
          "3 Catch ALL error during creating adapter..., Skipping Adapter# 1"}},
        {"HBA_GetAdapterPortAttributes", // stale data is read again once only
         {0, 0, 8, 8},
         {"3 (portIndex = 0) failed with hbaStatus 8",
          "3 Catch ALL error during creating adapter..., Skipping Adapter# 1"}},
        {"LRM_GetHBAAttributes",
         {0, 1},
         {"3 ERROR: RM_GetHBAAttributes call failed (1)",
          "3 Catch ALL error during creating adapter..., Skipping Adapter# 1"}},
    };
    for (int i = 0; i < 3; ++i)
        host.addAdapter(1);
    for (const FaultCase& c : cases)
    {
        log.lines.clear();
        host.statuses = {{c.function, c.statuses}};
        data.buildAdapterData();
        EXPECT_EQ(log.notable(), c.lines);
        EXPECT_THAT(names(), ElementsAre("Tavrin-F0", "Tavrin-F2")) << c.function;
        EXPECT_EQ(data.adapterCount, 2u);
        EXPECT_THAT(data.ports, SizeIs(2));
        EXPECT_TRUE(data.dataValid);
    }
    EXPECT_EQ(host.calls["HBA_RefreshInformation"], 1);
}

TEST_F(DataTest, NetworkNamesAreSkippedWithoutAWord)
{
    host.addAdapter(1).name = "Tavrin-O1";
    host.addAdapter(1).name = "Tavrin-N";
    host.addAdapter(1).name = "Tavrin-";
    data.buildAdapterData();
    EXPECT_THAT(names(), ElementsAre("Tavrin-"));
    EXPECT_EQ(data.adapterCount, 1u);
    EXPECT_THAT(log.notable(), IsEmpty());
    EXPECT_EQ(log.count("5 FC AdapterName : [Tavrin-O1]"), 0);
}

TEST_F(DataTest, FunctionTypesOneToThreeAreNotKept)
{
    for (std::uint32_t type = 0; type < 5; ++type)
        host.addAdapter(1).attributes[RM_HA_FUNCTION_TYPE] = number(type);
    data.buildAdapterData();
    EXPECT_THAT(names(), ElementsAre("Tavrin-F0", "Tavrin-F4"));
    EXPECT_EQ(data.adapterCount, 2u);
    EXPECT_THAT(data.ports, SizeIs(2));
    EXPECT_EQ(data.adapters[1]->getFunctionType(), 4u);
    EXPECT_EQ(log.count("5 Adapter Function type : 2"), 1);
}

TEST_F(DataTest, HostileCountsAreBounded)
{
    host.addAdapter(1).hba.NumberOfPorts = 0xFFFFFFFF;
    host.statuses["HBA_GetNumberOfAdapters"] = {-1};
    data.buildAdapterData();
    EXPECT_THAT(data.ports, SizeIs(1));
    EXPECT_EQ(attributes().numberOfPorts, 0xFFFFFFFF);
    EXPECT_EQ(data.adapterCount, 1u);
    EXPECT_EQ(host.calls["HBA_GetAdapterName"], 4096);
    EXPECT_EQ(host.calls["HBA_GetAdapterPortAttributes"], 1 + 256);
}

TEST_F(DataTest, UnterminatedTextEndsWithItsField)
{
    HBA_ADAPTERATTRIBUTES& hba = host.addAdapter(1).hba;
    std::memset(hba.Manufacturer, 'M', sizeof hba.Manufacturer);
    std::memset(hba.SerialNumber, 'S', sizeof hba.SerialNumber);
    std::memset(hba.DriverName, 'D', sizeof hba.DriverName);
    HBA_PORTATTRIBUTES& port0 = host.adapters[0].ports[0].hba;
    std::memset(port0.OSDeviceName, 'o', sizeof port0.OSDeviceName);
    data.buildAdapterData();
    EXPECT_EQ(attributes().manufacturer, std::string(64, 'M'));
    EXPECT_EQ(attributes().serialNumber, std::string(64, 'S'));
    EXPECT_EQ(attributes().driverName, std::string(256, 'D'));
    EXPECT_EQ(port().getAttributes()->osDeviceName, std::string(256, 'o'));
}

TEST_F(DataTest, AdapterAttributesOfTheHbaApi)
{
    HBA_ADAPTERATTRIBUTES& hba = host.addAdapter(1).hba;
    std::strcpy(hba.Manufacturer, "Tavrin");
    std::strcpy(hba.Model, "TV32");
    std::strcpy(hba.NodeSymbolicName, "from the HBA API");
    hba.VendorSpecificID = 0xE200;
    host.statuses["HBA_GetAdapterAttributes"] = {8};
    data.buildAdapterData();
    const FCAdapterAttributes& a = attributes();
    EXPECT_EQ(a.manufacturer, "Tavrin");
    EXPECT_EQ(a.model, "TV32");
    EXPECT_EQ(a.nodeSymbolicName, "from the HBA API");
    EXPECT_EQ(a.nodeWWN, "2000000000000000");
    EXPECT_EQ(a.port0WWPN, "10000000ABCDEF00");
    EXPECT_EQ(a.vendorSpecificID, 0xE200u);
    EXPECT_EQ(a.driverType, 3u);
    EXPECT_EQ(host.calls["HBA_RefreshInformation"], 1);
    EXPECT_EQ(log.count("5 _DriverType: [ 3 ]"), 1);

    // An adapter that does not describe itself stays, without the fields and the ports they count.
    host.statuses["HBA_GetAdapterAttributes"] = {8, 8};
    host.statuses["LRM_GetDriverType"] = {2};
    data.buildAdapterData();
    EXPECT_EQ(log.count("3 Error hbaStatus=8, skipping Adapter Tavrin-F0"), 1);
    EXPECT_EQ(attributes().manufacturer, "");
    EXPECT_EQ(attributes().driverType, 0u);
    EXPECT_THAT(data.ports, IsEmpty());
    EXPECT_EQ(data.adapterCount, 1u);
}

TEST_F(DataTest, AdapterAttributesOfTheRmLibrary)
{
    using A = FCAdapterAttributes;
    struct Number
    {
        std::uint32_t id;
        std::uint32_t A::*field;
    };
    struct Text
    {
        std::uint32_t id;
        std::string A::*field;
    };
    const Number numbers[] = {
        {0x20e, &A::deviceID},     {0x20f, &A::modelID}, {0x220, &A::diagVersion},  {0x229, &A::portNumber},
        {0x22c, &A::functionType}, {0x225, &A::sliMode}, {0x22b, &A::pciBusNumber}, {0x230, &A::pciFunctionNumber},
    };
    const Text texts[] = {
        {0x207, &A::nodeSymbolicName},  {0x209, &A::optionROMVersion}, {0x210, &A::operationalFirmware},
        {0x211, &A::sli1FirmwareName},  {0x212, &A::sli2FirmwareName}, {0x216, &A::bootBiosVersion},
        {0x221, &A::initialFirmware},   {0x222, &A::kernelVersion},    {0x224, &A::sli3FirmwareName},
        {0x233, &A::spFirmwareVersion}, {0x234, &A::spFirmwareName},   {0x235, &A::ulpFirmwareVersion},
        {0x236, &A::ulpFirmwareName},   {0x24a, &A::subadapterID},     {0x24b, &A::fcUniversalVersion},
        {0x24c, &A::fcX86BiosVersion},  {0x24d, &A::fcEfiVersion},     {0x24e, &A::fcFcodeVersion},
        {0x24f, &A::firmwareOnFlash},
    };
    auto& values = host.addAdapter(0).attributes;
    host.adapters[0].ports.emplace_back().hba.PortWWN = wwn(0x10000000ABCDEF00);
    std::strcpy(host.adapters[0].hba.NodeSymbolicName, "from the HBA API");
    for (const Number& n : numbers)
        values[n.id] = number(n.id * 1000);
    for (const Text& t : texts)
        values[t.id] = "text " + std::to_string(t.id);
    values[0x213] = std::string("\x00\x90\xfa\x01\x02\xff", 6);
    values[0x214] = number(1);
    values[0x227] = number(0xAB034B2D); // degrees, threshold, state, and a byte that means nothing
    data.buildAdapterData();
    ASSERT_THAT(data.adapters, SizeIs(1));
    const A& a = attributes();
    for (const Number& n : numbers)
        EXPECT_EQ(a.*n.field, n.id * 1000) << n.id;
    for (const Text& t : texts)
        EXPECT_EQ(a.*t.field, "text " + std::to_string(t.id));
    EXPECT_EQ(a.ieeeAddress, "00:90:fa:01:02:ff");
    EXPECT_TRUE(a.bootCodeEnabled);
    EXPECT_EQ(a.boardTemperature, 0x2Du);
    EXPECT_EQ(a.boardTemperatureThreshold, 0x4Bu);
    EXPECT_EQ(a.boardTemperatureState, 3u);
    EXPECT_THAT(log.lines,
                IsSupersetOf({"5 _BootCodeEnabled: [ 1 ]", "5 INITIAL_FW_LOAD : [ text 545 ]",
                              "5 Operational Firmware : [ text 528 ]", "5 FC_X86_BIOSVersion : [ text 588 ]"}));
    const auto driverType = std::find(log.lines.begin(), log.lines.end(), "5 _DriverType: [ 3 ]");
    ASSERT_NE(driverType, log.lines.end());
    EXPECT_EQ(driverType[-1], "5 _ModelID: [ 527000 ]");
    EXPECT_EQ(driverType[1], "5 _DiagVersion: [ 544000 ]");
}

TEST_F(DataTest, AStalePortIsReadAgainAndABadOneLeftOut)
{
    host.addAdapter(3);
    // Port 0 for the adapter; then each port, the first after many refreshes, the second not at all.
    auto& statuses = host.statuses["HBA_GetAdapterPortAttributes"];
    statuses.assign(21, 8);
    statuses[0] = 0;
    statuses.insert(statuses.end(), {0, 1});
    data.buildAdapterData();
    EXPECT_EQ(host.calls["HBA_RefreshInformation"], 20);
    ASSERT_THAT(data.ports, SizeIs(2));
    EXPECT_EQ(data.ports[1]->portIndex, 2u);
    EXPECT_THAT(log.notable(), ElementsAre("3 (portIndex=1) failed with hbaStatus 1",
                                           "3 Failed to fetch information for port: [1] on adapter: [Tavrin-F0]"));
}

TEST_F(DataTest, ALibraryThatIsAlwaysStaleDoesNotHoldTheRefresh)
{
    host.addAdapter(1);
    host.statuses["HBA_GetAdapterPortAttributes"].assign(1 + 2000, 8);
    host.statuses["HBA_GetAdapterPortAttributes"].front() = 0;
    data.buildAdapterData();
    EXPECT_EQ(host.calls["HBA_RefreshInformation"], 1000);
    EXPECT_THAT(data.ports, IsEmpty());
    EXPECT_EQ(log.count("3 (portIndex=0) failed with hbaStatus 8"), 1);
}

TEST_F(DataTest, PortAttributes)
{
    FakePort& fake = host.addAdapter(2).ports[0];
    fake.hba.PortFcId = 0x010200;
    fake.hba.PortType = 5;
    fake.hba.PortSupportedFc4Types.bits[31] = 0x80;
    fake.hba.PortActiveFc4Types.bits[0] = 1;
    fake.hba.FabricName = wwn(0x1000ABCD00000000);
    fake.attributes = {{0x322, number(20)}, {0x360, number(1)}};
    data.buildAdapterData();
    const FCPortAttributes& a = *port().getAttributes();
    EXPECT_EQ(a.portFcId, 0x010200u);
    EXPECT_EQ(a.portType, 5u);
    EXPECT_EQ(a.portState, 20u);
    EXPECT_EQ(a.fecState, 1u);
    EXPECT_EQ(a.supportedFc4Types[31], 0x80);
    EXPECT_EQ(a.activeFc4Types[0], 1);
    EXPECT_EQ(a.fabricName, "1000ABCD00000000");
    // The second port's library has neither state: the HBA API's and the default stand.
    EXPECT_EQ(port(1).getAttributes()->portState, 2u);
    EXPECT_EQ(port(1).getAttributes()->fecState, 2u);
    EXPECT_THAT(log.lines, IsSupersetOf({"5 Physical port state for FC Port: 20", "5 FEC state for FC Port: 1"}));

    host.statuses["LRM_GetPortAttributes"] = {64};
    data.buildAdapterData();
    EXPECT_THAT(data.ports, SizeIs(1));
    EXPECT_EQ(log.count("3 RM_GetPortAttributes call failed (64)\n"), 1);
}

TEST_F(DataTest, Statistics)
{
    // In the order of the fields.
    const std::uint32_t ids[] = {0x401, 0x406, 0x408, 0x407, 0x409, 0x40c, 0x40d, 0x40e, 0x40f,
                                 0x410, 0x411, 0x412, 0x413, 0x414, 0x415, 0x404, 0x405, 0x402,
                                 0x403, 0x418, 0x417, 0x422, 0x416, 0x421, 0x423};
    FakePort& fake = host.addAdapter(1).ports[0];
    for (const std::uint32_t id : ids)
        fake.statistics[id] = counter(id * 0x100000000);
    data.buildAdapterData();
    EXPECT_EQ(port().getStatistics(), nullptr);
    EXPECT_TRUE(port().updateStatistics());
    const FCPortStatistics* statistics = port().getStatistics();
    const std::uint64_t* field = &statistics->secondsSinceLastReset;
    for (const std::uint32_t id : ids)
        EXPECT_EQ(*field++, id * 0x100000000) << id;
    EXPECT_EQ(field - 1, &statistics->delimiterErrors);

    // A failed read keeps the old object.
    host.statuses["LRM_GetPortStatistics"] = {1};
    EXPECT_FALSE(port().updateStatistics());
    EXPECT_EQ(port().getStatistics(), statistics);
    EXPECT_EQ(log.count("3 ERROR: RM_GetPortStatistics call failed (1)"), 1);
    EXPECT_EQ(log.count("5 FC Port statistics error occurred,retain the old statistics !!!"), 1);

    // Absent and uncounted values, and one whose halves differ.
    fake.statistics = {{0x401, counter(0xFFFFFFFFFFFFFFFF)}, {0x402, counter(0xFFFFFFFF)}, {0x403, number(1)}};
    EXPECT_TRUE(port().updateStatistics());
    EXPECT_EQ(port().getStatistics()->secondsSinceLastReset, 0xFFFFFFFFu);
    EXPECT_EQ(port().getStatistics()->txBytes, 0xFFFFFFFFu);
    EXPECT_EQ(port().getStatistics()->rxBytes, 0xFFFFFFFFu);
    EXPECT_EQ(port().getStatistics()->txFrames, 0xFFFFFFFFu);
}

} // namespace
