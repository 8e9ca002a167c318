// The PCI device of each port, word by word of what the RM library reads.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdio>
#include <map>

using namespace module_test;
using testing::ElementsAre;
using testing::ElementsAreArray;

namespace
{

/// A word of the chip-dependent area and the property that shows it.
using Word = std::pair<unsigned, const char*>;
using Words = std::vector<Word>;

const Words conventional = {
    {0, "FeatureEnable"}, {1, "PCIXCommand"}, {2, "PCIXStatus"},  {3, "PwrMgtCaps"}, {4, "PwrMgtCtrl"},
    {5, "MSICtrl"},       {6, "MSILowAddr"},  {7, "MSIHighAddr"}, {8, "MSIData"},    {9, "VPDAddr"},
};
const Words hotSwap = {{11, "HotSwap"}};
const Words errorCorrecting = {
    {0, "FeatureEnable"},    {1, "PCIXCommand"},  {2, "PCIXStatus"}, {3, "ECCControlStatus"}, {4, "ECCFirstAddress"},
    {5, "ECCSecondAddress"}, {6, "ECCAttribute"}, {7, "PwrMgtCaps"}, {8, "PwrMgtCtrl"},       {9, "MSICtrl"},
    {10, "MSILowAddr"},      {11, "MSIHighAddr"}, {12, "MSIData"},   {13, "VPDAddr"},         {15, "HotSwap"},
};
const Words express = {
    {0, "FeatureEnable"},
    {6, "PwrMgtCaps"},
    {7, "PwrMgtCtrl"},
    {8, "MSICtrl"},
    {9, "MSILowAddr"},
    {10, "MSIHighAddr"},
    {11, "MSIData"},
    {48, "EnhancedCapHdrAER"},
    {49, "UncorrectableErrStat"},
    {50, "UncorrectableErrMask"},
    {51, "UncorrectableErrSeverity"},
    {52, "CorrectableErrStat"},
    {53, "CorrectableErrMask"},
    {54, "AdvErrCapCtl"},
    {55, "HeaderLog0x0"},
    {56, "HeaderLog0x4"},
    {57, "HeaderLog0x8"},
    {58, "HeaderLog0xC"},
    {59, "EnhancedCapHdrPBUDG"},
    {60, "DataSelectReg"},
    {61, "DataReg"},
    {62, "PowerBudget"},
};
const Words expressLow = {
    {1, "PCIECap"},           {2, "PCIEDeviceCapReg"},         {3, "PCIEDeviceStatusCtrl"},
    {4, "PCIEDeviceLinkCap"}, {5, "PCIEDeviceLinkStatusCtrl"}, {12, "VPDAddr"},
};
const Words expressHigh = {
    {12, "MSIMaskBits"},
    {13, "MSIPendingBits"},
    {14, "MSIXCtrl"},
    {15, "MSIXTableOffset"},
    {16, "MSIXPBAOffset"},
    {17, "VPDAddr"},
    {21, "PCIECap"},
    {22, "PCIEDeviceCapReg"},
    {23, "PCIEDeviceStatusCtrl"},
    {24, "PCIEDeviceLinkCap"},
    {25, "PCIEDeviceLinkStatusCtrl"},
    {26, "SlotCap"},
    {27, "SlotStatusCtrlReg"},
    {28, "RootCapCtrlReg"},
    {29, "RootStatusReg"},
    {30, "DeviceCap2Reg"},
    {31, "DeviceStatusCtl2Reg"},
    {32, "LinkCap2Reg"},
    {33, "LinkStatus2Ctl2Reg"},
    {34, "SlotCap2Reg"},
    {35, "SlotStatusCtl2Reg"},
};

struct Form
{
    std::uint32_t type;
    std::vector<Words> words;
    std::vector<unsigned> vpdData;
    std::vector<const char*> log;
};

const Form forms[] = {
    {0, {}, {}, {}},
    {1, {conventional}, {10}, {"[TVR_DBG] Creating TVRHBA_PCIDevice for Ondrial"}},
    {2,
     {conventional, hotSwap},
     {10},
     {"[TVR_DBG] Creating TVRHBA_PCIDevice for Ondrial", "[TVR_DBG] Creating TVRHBA_PCIDevice for VARN"}},
    {3, {errorCorrecting}, {14}, {"[TVR_DBG] Creating TVRHBA_PCIDevice for Solmar"}},
    {4, {express, expressLow}, {13}, {"[TVR_DBG] Creating TVRHBA_PCIDevice for Ostrel "}},
    {5, {express, expressHigh}, {18, 19, 20}, {"[TVR_DBG] Creating TVRHBA_PCIDevice for Calder "}},
    {0xFFFF'FFFF, {express, expressHigh}, {18, 19, 20}, {"[TVR_DBG] Creating TVRHBA_PCIDevice for Calder "}},
};

/// A field of the configuration header; all have values of their own, with the highest bit set.
struct HeaderRow
{
    const char* member; ///< in a scenario
    const char* property;
    std::uint32_t value;
};

const HeaderRow header[] = {
    {"vendorId", "VendorID", 0x8A01},
    {"command", "Command", 0x8A02},
    {"status", "PCIStatus", 0x8A03},
    {"revision", "RevisionID", 0x84},
    {"progIf", "ProgIf", 0x85},
    {"subClass", "SubClass", 0x86},
    {"baseClass", "BaseClass", 0x87},
    {"cacheLineSize", "CacheLineSize", 0x88},
    {"latencyTimer", "LatencyTimer", 0x89},
    {"headerType", "HeaderType", 0x8A},
    {"builtInSelfTest", "BuiltInSelfTest", 0x8B},
    {"baseAddress0", "BaseAddresses0", 0x8A0B0C10},
    {"baseAddress1", "BaseAddresses1", 0x8A0B0C11},
    {"baseAddress2", "BaseAddresses2", 0x8A0B0C12},
    {"baseAddress3", "BaseAddresses3", 0x8A0B0C13},
    {"baseAddress4", "BaseAddresses4", 0x8A0B0C14},
    {"baseAddress5", "BaseAddresses5", 0x8A0B0C15},
    {"cis", "CIS", 0x8A0B0C16},
    {"subVendorId", "SubVendorID", 0x8A17},
    {"subsystemId", "SubsystemID", 0x8A18},
    {"expansionRomBaseAddress", "ExpansionROMBaseAddress", 0x8A0B0C19},
    {"capabilitiesPointer", "CapabilitiesPtr", 0x9A},
    {"interruptLine", "InterruptLine", 0x9B},
    {"interruptPin", "InterruptPin", 0x9C},
    {"minimumGrant", "MinimumGrant", 0x9D},
    {"maximumLatency", "MaximumLatency", 0x9E},
};

std::uint32_t areaWord(std::size_t form, unsigned word)
{
    return static_cast<std::uint32_t>(0xA000'0000 | form << 8 | word);
}

std::string hex(std::uint64_t value)
{
    char text[24];
    std::snprintf(text, sizeof(text), "0x%llX", static_cast<unsigned long long>(value));
    return text;
}

std::string number(const broker::Object& device, const char* property)
{
    const broker::Value& value = device.get(property);
    return value.isNull() ? "null" : hex(value.asUnsigned());
}

/// An adapter for each form, with every byte of its registers set.
std::string hostOfAllForms()
{
    std::string adapters;
    for (std::size_t i = 0; i < std::size(forms); i++)
    {
        const std::string number = std::to_string(i);
        std::string members, area;
        for (const HeaderRow& row : header)
            members += std::string("\"") + row.member + "\": " + std::to_string(row.value) + ", ";
        for (unsigned word = 0; word < 63; word++)
            area += (word ? ", " : "") + std::to_string(areaWord(i, word));
        adapters += std::string(i ? "," : "") + R"({"name": "a)" + number + R"(", "serialNumber": "S)" + number +
                    R"(", "model": "M", "nodeWwn": "200000000000000)" + number +
                    R"(", "attributes": {"pciBusNumber": 510, "pciFunctionNumber": 258},
                        "ports": [{"wwpn": "100000000000000)" +
                    number + R"(", "pci": {"type": )" + std::to_string(forms[i].type) + R"(, "deviceId": "0xF0A)" +
                    number + R"(", )" + members + R"("area": [)" + area + "]}}]}";
    }
    return R"({"adapters": [)" + adapters + "]}";
}

/// What the area's properties of a form hold; those of other forms are null.
std::map<std::string, std::uint32_t> expectedWords(std::size_t form)
{
    std::map<std::string, std::uint32_t> words;
    for (const Words& part : forms[form].words)
        for (const auto& [word, property] : part)
            words[property] = areaWord(form, word);
    return words;
}

void expectArea(const broker::Object& device, std::size_t form)
{
    const std::map<std::string, std::uint32_t> words = expectedWords(form);
    for (const Words* part : {&conventional, &hotSwap, &errorCorrecting, &express, &expressLow, &expressHigh})
        for (const auto& [word, property] : *part)
        {
            const auto expected = words.find(property);
            EXPECT_EQ(number(device, property), expected == words.end() ? "null" : hex(expected->second)) << property;
        }

    std::vector<std::uint64_t> vpdData, expectedVpdData;
    if (const broker::Value& value = device.get("VPDData"); !value.isNull())
        for (const broker::Value& element : value.asList())
            vpdData.push_back(element.asUnsigned());
    for (const unsigned word : forms[form].vpdData)
        expectedVpdData.push_back(areaWord(form, word));
    EXPECT_EQ(vpdData, expectedVpdData);
}

TEST(PciDevice, EachFormOfRegistersFillsItsProperties)
{
    setHostNames({});
    Host host(hostOfAllForms());
    const std::vector<broker::Object> devices = host.instancesOf("TVRHBA_PCIDevice");
    ASSERT_EQ(devices.size(), std::size(forms));
    std::vector<std::string> lines;
    for (std::size_t i = 0; i < devices.size(); i++)
    {
        SCOPED_TRACE("form " + std::to_string(forms[i].type));
        const broker::Object& device = devices[i];
        const std::string wwpn = "100000000000000" + std::to_string(i);
        EXPECT_EQ(text(device, "DeviceID"), wwpn + ":0xF0A" + std::to_string(i));
        EXPECT_EQ(text(device, "ElementName"), "Tavrin:FCAdapter" + std::to_string(i));
        EXPECT_EQ(text(device, "CreationClassName"), "TVRHBA_PCIDevice");
        EXPECT_EQ(text(device, "SystemCreationClassName"), "CIM_ComputerSystem");
        EXPECT_EQ(text(device, "SystemName"), "tavrin-host.example.net");
        for (const char* state : {"HealthState", "EnabledState", "RequestedState", "PrimaryStatus"})
            EXPECT_EQ(device.get(state).asUnsigned(), 5u) << state;
        EXPECT_EQ(device.get("BusNumber").asUnsigned(), 254u);
        EXPECT_EQ(device.get("FunctionNumber").asUnsigned(), 2u);
        EXPECT_EQ(device.get("PCIType").asUnsigned(), forms[i].type);
        for (const HeaderRow& row : header)
            EXPECT_EQ(number(device, row.property), hex(row.value)) << row.property;
        expectArea(device, i);

        lines.push_back("[TVR_DBG] MAC address in std::string format = " + wwpn + " and size = 16");
        lines.insert(lines.end(), forms[i].log.begin(), forms[i].log.end());
    }
    EXPECT_THAT(logAbout(host, {"MAC address", "Creating TVRHBA_PCIDevice"}), ElementsAreArray(lines));
    host.unload();
}

TEST(PciDevice, RegistersThatCannotBeReadAreZero)
{
    Host host;
    host.addFault(R"({"function": "LRM_DiagReadPCIRegistersV2", "subject": "10:00:02:7A:51:32:02:40", "status": 5})");
    const broker::Object device = theOne(host, "TVRHBA_PCIDevice", "DeviceID", "1000027A51320240:0x0000");
    EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 4u);
    for (const HeaderRow& row : header)
        EXPECT_EQ(device.get(row.property).asUnsigned(), 0u) << row.property;
    EXPECT_EQ(device.get("PCIType").asUnsigned(), 0u);
    EXPECT_EQ(device.get("BusNumber").asUnsigned(), 8u);
    EXPECT_TRUE(device.get("FeatureEnable").isNull());
    EXPECT_TRUE(device.get("VPDData").isNull());
    EXPECT_THAT(logAbout(host, {"RM_DiagReadPCIRegistersV2 call"}),
                ElementsAre("[TVR_CRIT] RM_DiagReadPCIRegistersV2 call failedi with 5"));
    host.unload();
}

} // namespace
