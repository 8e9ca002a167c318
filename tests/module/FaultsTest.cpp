// A host on which something goes wrong: what is lost, what is served all the same, and what the log says.
#include "tests/module/Changes.h"
#include "tests/module/Clock.h"
#include "tests/module/Host.h"
#include "tests/module/LibCurl.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <ostream>

using namespace module_test;

namespace
{

// The default host has four adapters of one port each; these are the ends of the ports' names.
constexpr const char* everyPort = "0210 0211 0240 0241";

struct Lines
{
    const char* text; ///< level and text; "" ends the list
    std::size_t count;
};

struct Calls
{
    const char* function;
    std::size_t count;
};

struct Row
{
    const char* name;
    std::vector<const char*> faults;
    const char* ports; ///< ends of the names of those that have a PCI device
    std::size_t cards;
    std::size_t units; ///< targets that were made
    std::vector<Lines> lines;
    std::vector<Calls> calls;
};

void PrintTo(const Row& row, std::ostream* out)
{
    *out << row.name;
}

// Units that the four ports see: 4 on the first (two each on array and library), none on the second, whose link is
// down, 5 on the third (three on the arrays, two on the shelf) and 3 on the fourth.
constexpr std::size_t everyUnit = 12;
// Those among them that are no disks answer a Read Capacity with a check condition; one of them on the third port.
constexpr std::size_t noDisks = 5;

const Row rows[] = {
    {"NoFault",
     {},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_WARN] GetOASLunList failed. Unsupported Hardware", 7}, // for each pair of a port and a remote one
      {"[TVR_WARN]", 7},
      {"[TVR_ERR]", 0},
      {"[TVR_DBG] HBA_SendScsiInquiry_t(0x80) returns 9.", noDisks},
      {"[TVR_DBG] HBA_GetFcpTargetMapping_t() found no target mappings", 1}},
     {{"HBA_GetAdapterAttributes", 4}, {"HBA_GetAdapterPortAttributes", 8}, {"HBA_RefreshInformation", 0}}},

    // --- one adapter
    {"Name",
     {R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-2", "status": 1})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_WARN] Error hbaStatus = 1, Skipping Adapter# 1", 1}, {"[TVR_ERR]", 0}},
     {{"HBA_GetAdapterAttributes", 3}}},
    {"BothOfACard",
     {R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-1", "status": 1})",
      R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-2", "status": 2})"},
     "0240 0241",
     1,
     8,
     {{"[TVR_WARN] Error hbaStatus = 1, Skipping Adapter# 0", 1},
      {"[TVR_WARN] Error hbaStatus = 2, Skipping Adapter# 1", 1}},
     {}},
    {"Open",
     {R"({"function": "HBA_OpenAdapter", "subject": "Tavrin-TV1602-2", "hostile": "zeroHandle"})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] HBA_OpenAdapter failed, skipping Adapter Tavrin-TV1602-2", 1},
      {"[TVR_ERR] Catch ALL error during creating adapter..., Skipping Adapter# 1", 1}},
     {}},
    {"Attributes",
     {R"({"function": "HBA_GetAdapterAttributes", "subject": "Tavrin-TV1602-2", "status": 1})"},
     "0210 0240 0241",
     3, // the adapter stays, nameless and without ports, on a card of its own
     everyUnit,
     {{"[TVR_ERR] Error hbaStatus=1, skipping Adapter Tavrin-TV1602-2", 1}, {"[TVR_ERR] Catch ALL", 0}},
     {}},
    {"AttributesStaleOnce",
     {R"({"function": "HBA_GetAdapterAttributes", "subject": "Tavrin-TV1602-2", "status": 8, "to": 1})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_ERR]", 0}},
     {{"HBA_GetAdapterAttributes", 5}, {"HBA_RefreshInformation", 1}}},
    {"AttributesStaleForEver",
     {R"({"function": "HBA_GetAdapterAttributes", "subject": "Tavrin-TV1602-2", "status": 8})"},
     "0210 0240 0241",
     3,
     everyUnit,
     {{"[TVR_ERR] Error hbaStatus=8, skipping Adapter Tavrin-TV1602-2", 1}},
     {{"HBA_GetAdapterAttributes", 5}, {"HBA_RefreshInformation", 1}}},
    {"FirstPort",
     {R"({"function": "HBA_GetAdapterPortAttributes", "subject": "Tavrin-TV1602-2", "status": 4})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] (portIndex = 0) failed with hbaStatus 4", 1},
      {"[TVR_ERR] Catch ALL error during creating adapter..., Skipping Adapter# 1", 1}},
     {{"HBA_GetAdapterPortAttributes", 7}}},
    {"FirstPortStaleForEver",
     {R"({"function": "HBA_GetAdapterPortAttributes", "subject": "Tavrin-TV1602-2", "status": 8})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] (portIndex = 0) failed with hbaStatus 8", 1}},
     {{"HBA_GetAdapterPortAttributes", 8}, {"HBA_RefreshInformation", 1}}},
    {"RmAttributes",
     {R"({"function": "LRM_GetHBAAttributes", "subject": "1000027A51160211", "status": 1})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] ERROR: RM_GetHBAAttributes call failed (1)", 1},
      {"[TVR_ERR] Catch ALL error during creating adapter..., Skipping Adapter# 1", 1}},
     {}},
    {"OneAttribute",
     {R"({"function": "LRM_GetDriverType", "subject": "1000027A51160211", "status": 1})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_DBG] ERROR: RM_GetHBAAttributeValue HA__DriverType call failed (1)", 1}, {"[TVR_ERR]", 0}},
     {}},

    // --- one port
    {"PortOpen",
     {R"({"function": "HBA_OpenAdapter", "subject": "Tavrin-TV1602-2", "from": 2, "hostile": "zeroHandle"})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] HBA_OpenAdapter failed, skipping Adapter Tavrin-TV1602-2", 1},
      {"[TVR_ERR] Failed to fetch information for port: [0] on adapter: [Tavrin-TV1602-2]", 1},
      {"[TVR_ERR] Catch ALL", 0}},
     {}},
    {"PortAttributes",
     {R"({"function": "HBA_GetAdapterPortAttributes", "subject": "Tavrin-TV3202-1", "from": 2, "status": 4})"},
     "0210 0211 0241",
     2,
     7,
     {{"[TVR_ERR] (portIndex=0) failed with hbaStatus 4", 1},
      {"[TVR_ERR] Failed to fetch information for port: [0] on adapter: [Tavrin-TV3202-1]", 1}},
     {}},
    {"PortAttributesStaleAnyTimes",
     {R"({"function": "HBA_GetAdapterPortAttributes", "subject": "Tavrin-TV1602-2", "from": 2, "to": 20, "status": 8})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_ERR]", 0}},
     {{"HBA_GetAdapterPortAttributes", 27}, {"HBA_RefreshInformation", 19}}},
    {"PortAttributesStaleForEver",
     {R"({"function": "HBA_GetAdapterPortAttributes", "subject": "Tavrin-TV1602-2", "from": 2, "status": 8})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] (portIndex=0) failed with hbaStatus 8", 1}},
     {}},
    {"RmPortAttributes",
     {R"({"function": "LRM_GetPortAttributes", "subject": "1000027A51160211", "status": 97})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] RM_GetPortAttributes call failed (97)", 1},
      {"[TVR_ERR] Failed to fetch information for port: [0] on adapter: [Tavrin-TV1602-2]", 1}},
     {}},

    // --- targets
    {"FabricOpen",
     {R"({"function": "HBA_OpenAdapter", "subject": "Tavrin-TV3202-1", "from": 3, "hostile": "zeroHandle"})"},
     everyPort,
     2,
     7,
     {{"[TVR_ERR] HBA_OpenAdapter failed, skipping Adapter Tavrin-TV3202-1", 1},
      {"[TVR_ERR] Issue with Target Rescan - moving to the next Port", 1}},
     {}},
    {"TargetOpen",
     {R"({"function": "HBA_OpenAdapter", "subject": "Tavrin-TV3202-1", "from": 4, "to": 5, "hostile": "zeroHandle"})"},
     everyPort,
     2,
     10,
     {{"[TVR_ERR] HBA_OpenAdapter failed, skipping Adapter Tavrin-TV3202-1", 2},
      {"[TVR_ERR] target creation failed - moving to the next target", 2}},
     {}},
    {"Mapping",
     {R"({"function": "HBA_GetFcpTargetMapping", "subject": "Tavrin-TV3202-1", "status": 1})"},
     everyPort,
     2,
     7,
     {{"[TVR_ERR] Error hbaStatus=1", 1}, {"[TVR_DBG] Successful target info fetched", 3}},
     {{"HBA_GetFcpTargetMapping", 4}}},
    {"MappingStaleOnce",
     {R"({"function": "HBA_GetFcpTargetMapping", "subject": "Tavrin-TV3202-1", "status": 8, "to": 1})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_DBG] Refresh and retry ... ", 1}},
     {{"HBA_GetFcpTargetMapping", 5}, {"HBA_RefreshInformation", 1}}},
    {"MappingNeverLargeEnough",
     {R"({"function": "HBA_GetFcpTargetMapping", "subject": "Tavrin-TV3202-1", "status": 7})"},
     everyPort,
     2,
     7,
     {{"[TVR_DBG] Increasing the buffer to = 256", 3},
      {"[TVR_DBG] Successful target info fetched", 4},
      {"[TVR_ERR]", 0}},
     {{"HBA_GetFcpTargetMapping", 6}}},
    {"InquiryConditionTwice",
     {R"({"function": "HBA_SendScsiInquiry", "subject": "Tavrin-TV3202-1", "status": 9, "to": 2})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_DBG] HBA_SendScsiInquiry_t(0x80) returns 9.", noDisks}},
     {{"HBA_SendScsiInquiry", 3 * everyUnit + 2}}},
    {"InquiryConditionThrice",
     {R"({"function": "HBA_SendScsiInquiry", "subject": "Tavrin-TV3202-1", "status": 9, "to": 3})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_DBG] HBA_SendScsiInquiry_t(0x80) returns 9.", noDisks + 1}, {"[TVR_DBG] DeviceType......", everyUnit - 1}},
     {{"HBA_SendScsiInquiry", 3 * everyUnit + 2}}},
    {"InquiryFails",
     {R"({"function": "HBA_SendScsiInquiry", "subject": "Tavrin-TV3202-1", "status": 1})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_DBG] HBA_SendScsiInquiry_t(0x80) returns 1.", 15}},
     {{"HBA_SendScsiInquiry", 3 * everyUnit}}},
    {"CapacityConditionForEver",
     {R"({"function": "HBA_SendReadCapacity", "subject": "Tavrin-TV3202-1", "status": 9})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_DBG] HBA_SendScsiInquiry_t(0x80) returns 9.", noDisks + 4}},
     {}},

    // --- the whole library
    {"NoAdapterCount",
     {R"({"function": "HBA_LoadLibrary", "status": 1})"},
     "",
     0,
     0,
     {{"[TVR_CRIT] HBAAPI reports that there are NO HBAs in the system.", 1}},
     {{"HBA_GetAdapterName", 0}}},
    {"HugeAdapterCount",
     {R"({"function": "HBA_GetNumberOfAdapters", "hostile": "hugeCount"})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_WARN] Error hbaStatus = 6, Skipping Adapter# ", 4092}},
     {{"HBA_GetAdapterName", 4096}}},
    {"EndlessName",
     {R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-2", "hostile": "unterminatedText"})"},
     "0210 0240 0241",
     2,
     everyUnit,
     {{"[TVR_ERR] HBA_OpenAdapter failed, skipping Adapter XXXX", 1}},
     {}},
    {"HugePortCount",
     {R"({"function": "HBA_GetAdapterAttributes", "subject": "Tavrin-TV1602-2", "hostile": "hugeCount"})"},
     everyPort,
     2,
     everyUnit,
     {{"[TVR_ERR] Failed to fetch information for port: [", 255}},
     {}},
    {"HugeTargetCount",
     {R"({"function": "HBA_GetFcpTargetMapping", "subject": "Tavrin-TV3202-2", "hostile": "hugeCount"})"},
     everyPort,
     2,
     9 + 256,
     {},
     {}},
};

class Faults : public testing::TestWithParam<Row>
{};

/// Ends of the names of the ports that have a PCI device, in the order of the adapters.
std::string servedPorts(Host& host)
{
    std::string ports;
    for (const broker::Object& device : host.instancesOf("TVRHBA_PCIDevice"))
    {
        const std::string id = text(device, "DeviceID");
        ports += (ports.empty() ? "" : " ") + id.substr(id.find(':') - 4, 4);
    }
    return ports;
}

TEST_P(Faults, CostNoMoreThanTheirPart)
{
    const Row& row = GetParam();
    Host host;
    for (const char* fault : row.faults)
        host.addFault(fault);
    EXPECT_EQ(servedPorts(host), row.ports);
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), row.cards);
    EXPECT_EQ(host.logged("[TVR_DBG] End Creating Target..."), row.units);
    for (const Lines& lines : row.lines)
        EXPECT_EQ(host.logged(lines.text), lines.count) << lines.text;
    for (const Calls& calls : row.calls)
        EXPECT_EQ(host.calls(calls.function), calls.count) << calls.function;
    host.unload();
}

INSTANTIATE_TEST_SUITE_P(Rows, Faults, testing::ValuesIn(rows), [](const auto& info) { return info.param.name; });

TEST(Faulty, PciRegistersThatCannotBeReadGiveADeviceOfZeros)
{
    Host host;
    host.addFault(R"({"function": "LRM_DiagReadPCIRegistersV2", "subject": "1000027A51160211", "status": 1})");
    std::vector<std::string> ids;
    for (const broker::Object& device : host.instancesOf("TVRHBA_PCIDevice"))
    {
        ids.push_back(text(device, "DeviceID"));
        EXPECT_EQ(device.get("VendorID").asUnsigned() == 0, ids.size() == 2) << ids.back();
    }
    EXPECT_THAT(ids, testing::ElementsAre("1000027A51160210:0xE200", "1000027A51160211:0x0000",
                                          "1000027A51320240:0x7410", "1000027A51320241:0x7410"));
    EXPECT_EQ(host.logged("[TVR_CRIT] RM_DiagReadPCIRegistersV2 call failedi with 1"), 1u);
    host.unload();
}

TEST(Faulty, MappingOfMoreEntriesThanTheFirstBufferIsFetchedAgain)
{
    Host host(R"({"generate": {"seed": 3, "adapters": 1, "portsPerAdapter": 1, "targetsPerPort": 100,
                               "unitsPerTarget": 3}})");
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 1u);
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.logged("[TVR_DBG] Increasing the buffer to = 300"), 1u);
    EXPECT_EQ(host.calls("HBA_GetFcpTargetMapping"), 2u);
    EXPECT_EQ(host.logged("[TVR_DBG] End Creating Target..."), 300u);
    host.unload();
}

TEST(Faulty, AdaptersOfOtherKindsAreSkippedWithoutAWord)
{
    Host host("mixed");
    EXPECT_EQ(servedPorts(host), "0002 0008");
    EXPECT_EQ(host.logged("[TVR_WARN] Error hbaStatus = 1, Skipping Adapter# 6"), 1u);
    EXPECT_EQ(host.logged("[TVR_WARN] Error"), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] FC AdapterName : [Tavrin-O1]"), 0u);
    EXPECT_EQ(host.logged("[TVR_DBG] FC AdapterName : [Tavrin-NIC10-1]"), 0u);
    EXPECT_EQ(host.logged("[TVR_DBG] FC AdapterName : ["), 5u);
    EXPECT_EQ(host.logged("[TVR_DBG] ~FCAdapter"), 3u) << "function types 1 to 3 are let go of";
    host.unload();
}

TEST(Faulty, LibraryThatLiesAboutEverythingIsServedAsFarAsItGoes)
{
    Host host("hostile");
    EXPECT_EQ(servedPorts(host), "0000");
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 1u);
    EXPECT_EQ(host.logged("[TVR_ERR] Failed to fetch information for port: ["), 255u);
    for (const std::string& name : host.broker().servedClasses())
        EXPECT_TRUE(host.enumerate(name).ok()) << name;
    host.unload();
}

/// Whatever a library answers to a change, the module ends it, and is as before once the library is.
TEST(Faults, OfEachFunctionEndTheChangesThatNeedIt)
{
    test_support::FileServer server;
    setRealLibCurl("libcurl.so");
    Host host(changeableHost);
    const std::filesystem::path before = std::filesystem::current_path();
    std::filesystem::create_directory(host.root() / "work");
    std::filesystem::create_directories(host.root() / "tmp");
    std::filesystem::current_path(host.root() / "work");
    host.instancesOf("TVRHBA_LogicalDisk");
    const std::vector<Change> changes = changesOf(host, server);
    const auto ask = [&](bool succeeds)
    {
        removeLane(host.broker());
        for (const Change& change : changes)
        {
            const std::string answer = change.ask(host.broker());
            if (succeeds)
            {
                EXPECT_EQ(answer, "CIM_ERR_OK 0") << change.name;
            }
        }
        host.awaitRefresh(host.logged("[TVR_DBG] PERF: ---Created DataFetch_Handler"));
        for (const char* className : {"TVRHBA_FCPort", "TVRHBA_DriverParams", "TVRHBA_SoftwareIdentity"})
            EXPECT_TRUE(host.enumerate(className).ok()) << className;
        for (const auto& file : std::filesystem::directory_iterator("."))
            std::filesystem::remove(file);
    };
    for (const char* function :
         {"CPQFC_QoSGetConfig", "CPQFC_QoSSetConfig", "LRM_ChangeWWN", "LRM_DownloadFirmware", "LRM_GetDriverParams",
          "LRM_GetHBAAttributes", "LRM_GetHBAFeatureList", "LRM_GetOASLunList", "LRM_GetWWNCapability", "LRM_ReadWWN",
          "LRM_SetOASLunState", "LRM_SetPortEnabled", "LRM_VPList", "RM_GetLocalHBAInfo", "RM_GetNumberOfLocalAdapters",
          "RM_ImportHBAFileA", "RM_StatusString"})
        for (const char* fault : {R"("status": 1)", R"("hostile": "hugeCount")"})
        {
            SCOPED_TRACE(std::string(function) + " " + fault);
            if (host.takesFault(R"({"function": ")" + std::string(function) + "\", " + fault + "}"))
                ask(false);
            host.clearFaults();
        }
    advanceClock(std::chrono::hours(24)); // what the faults left in the cache is outdated
    host.instancesOf("TVRHBA_FCPort");
    EXPECT_TRUE(host.awaitRefresh(host.logged("[TVR_DBG] PERF: ---Created DataFetch_Handler")));
    ask(true);
    std::filesystem::current_path(before);
    host.unload();
}

} // namespace
