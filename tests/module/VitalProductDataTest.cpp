// Vital product data as a client sees them: of ports, of cards, and in what they complete.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::ElementsAre;
using testing::SizeIs;

namespace
{

constexpr const char* device = "1000027A51320240";

std::string createVpdFailed(const std::string& wwpn)
{
    return "[TVR_DBG] FC port " + wwpn + " CreateVPD failed";
}

std::vector<std::string> textsOf(Host& host, const std::string& className, const std::string& property)
{
    std::vector<std::string> texts;
    for (const broker::Object& object : host.instancesOf(className))
        texts.push_back(text(object, property));
    return texts;
}

/// One adapter for each text: the members of it that matter, then those of its port.
std::string hostOf(const std::vector<std::pair<std::string, std::string>>& adapters)
{
    std::string list;
    for (std::size_t i = 0; i < adapters.size(); i++)
    {
        const std::string number = std::to_string(i);
        list += (i ? R"(, {"name": "a)" : R"({"name": "a)") + number + R"(", )" + adapters[i].first +
                R"(, "ports": [{"wwpn": "100000000000000)" + number + R"(", "pci": {"deviceId": 1}, )" +
                adapters[i].second + "}]}";
    }
    return R"({"adapters": [)" + list + "]}";
}

TEST(VitalProductData, OfPortsAndCards)
{
    setHostNames({});
    Host host;
    EXPECT_EQ(describe(theOne(host, "TVRHBA_VitalProductData", "InstanceID", std::string("TVR FC HBA:VPD:") + device)),
              R"(
ChangeableType = 0
Description = "Vital product data of the FC port."
ElementName = "TVR HBA VPD:TV32B71155:Port:0"
IdentifyingDescriptions = {"VPD:PRODUCT_NAME", "VPD:EXT_CAPABILITY", "VPD:EC_LEVEL", "VPD:FABRIC_GEOGRAPHY", "VPD:LOCATION", "VPD:MANUFACTURER_ID", "VPD:PCI_GEOGRAPHY", "VPD:PART_NUMBER", "VPD:SERIAL_NUMBER"}
InstanceID = "TVR FC HBA:VPD:1000027A51320240"
OtherIdentifyingInfo = {"Tavrin TV3202 16Gb 2-port PCIe Fibre Channel Adapter", "01080010", "A-7306", "FC01", "SLOT 5", "1D7A", "0000:08", "TV3202-M16", "TV32B71155"}
)");
    EXPECT_EQ(describe(theOne(host, "TVRHBA_FRUVitalProductData", "InstanceID", "TVR FC HBA:FRU VPD:TV16A02417")), R"(
ChangeableType = 0
Description = "Vital product data of the card."
ElementName = "TVR HBA FRU:TV16A02417"
IdentifyingDescriptions = {"VPD:PRODUCT_NAME", "VPD:EC_LEVEL", "VPD:MANUFACTURER_ID", "VPD:PART_NUMBER", "VPD:SERIAL_NUMBER", "VPD:YA"}
InstanceID = "TVR FC HBA:FRU VPD:TV16A02417"
OtherIdentifyingInfo = {"Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter", "C-5124", "1D7A", "TV1602-M8", "TV16A02417", "RACK 12 SLOT 3"}
)");
    EXPECT_THAT(textsOf(host, "TVRHBA_VitalProductData", "ElementName"),
                ElementsAre("TVR HBA VPD:TV16A02417:Port:0", "TVR HBA VPD:TV16A02417:Port:1",
                            "TVR HBA VPD:TV32B71155:Port:0", "TVR HBA VPD:TV32B71155:Port:1"));
    EXPECT_THAT(textsOf(host, "TVRHBA_FRUVitalProductData", "ElementName"),
                ElementsAre("TVR HBA FRU:TV16A02417", "TVR HBA FRU:TV32B71155"));
    EXPECT_THAT(host.instancesOf("TVRHBA_ElementVPD"), SizeIs(4));
    EXPECT_THAT(host.instancesOf("TVRHBA_FRUElementVPD"), SizeIs(2));
    EXPECT_EQ(host.calls("LRM_GetVPD"), 4u) << "once a port";

    const broker::Object pciDevice = theOne(host, "TVRHBA_PCIDevice", "DeviceID", std::string(device) + ":0x7410");
    const broker::Reply vpd = host.broker().associators(pciDevice.path, {.assocClass = "TVRHBA_ElementVPD"});
    ASSERT_THAT(vpd.objects, SizeIs(1)) << vpd.message;
    EXPECT_EQ(text(vpd.objects[0], "InstanceID"), std::string("TVR FC HBA:VPD:") + device);
    const broker::Reply fru = host.broker().associators(theOne(host, "TVRHBA_Card", "Tag", "TV32B71155").path,
                                                        {.assocClass = "TVRHBA_FRUElementVPD"});
    ASSERT_THAT(fru.objects, SizeIs(1)) << fru.message;
    EXPECT_EQ(text(fru.objects[0], "InstanceID"), "TVR FC HBA:FRU VPD:TV32B71155");
    host.unload();
}

TEST(VitalProductData, PortsWithoutThemDoWithout)
{
    Host host;
    host.addFault(R"({"function": "LRM_GetVPD", "subject": "10:00:02:7A:51:16:02:10", "status": 2})");
    host.addFault(R"({"function": "LRM_GetVPD", "subject": "10:00:02:7A:51:32:02:40", "status": 149})");
    host.addFault(R"({"function": "LRM_GetVPD", "subject": "10:00:02:7A:51:32:02:41", "status": 1})");
    EXPECT_THAT(textsOf(host, "TVRHBA_VitalProductData", "InstanceID"), ElementsAre("TVR FC HBA:VPD:1000027A51160211"));
    EXPECT_THAT(textsOf(host, "TVRHBA_FRUVitalProductData", "InstanceID"), ElementsAre("TVR FC HBA:FRU VPD:TV16A02417"))
        << "told by the second port";
    EXPECT_THAT(host.instancesOf("TVRHBA_PCIDevice"), SizeIs(4));
    EXPECT_THAT(host.instancesOf("TVRHBA_ElementVPD"), SizeIs(1));
    EXPECT_TRUE(theOne(host, "TVRHBA_Card", "Tag", "TV32B71155").get("CanBeFRUed").isNull());
    EXPECT_THAT(
        logAbout(host, {"CreateVPD", "FRU related", "FRU update"}),
        ElementsAre(createVpdFailed("1000027A51160210"), createVpdFailed(device), createVpdFailed("1000027A51320241")));
    host.unload();
}

TEST(VitalProductData, NoAreaDoesHarm)
{
    const char* const hostile[] = {R"("hostile": "hugeLength")", R"("hostile": "allOnes")", R"("truncate": 3)",
                                   R"("truncate": 40)"};
    for (const char* const effect : hostile)
    {
        SCOPED_TRACE(effect);
        Host host;
        host.addFault(std::string(R"({"function": "LRM_GetVPD", )") + effect + "}");
        for (const broker::Object& vpd : host.instancesOf("TVRHBA_VitalProductData"))
            EXPECT_EQ(vpd.get("OtherIdentifyingInfo").asList().size(),
                      vpd.get("IdentifyingDescriptions").asList().size());
        EXPECT_THAT(host.instancesOf("TVRHBA_PCIDevice"), SizeIs(4));
        EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateAdapterMaps: cleanExit"), 1u);
        host.unload();
    }
    // An area that is cut off tells of what is whole; one without a field tells nothing.
    Host host(hostOf({{R"("serialNumber": "S1")", R"("vpd": {"raw": "90 FF FF 50 4E 02 41 42 53 4E 09 43"})"},
                      {R"("serialNumber": "S2")", R"("vpd": {"raw": "78"})"}}));
    const broker::Object vpd = theOne(host, "TVRHBA_VitalProductData", "InstanceID", "TVR FC HBA:VPD:1000000000000000");
    EXPECT_EQ(vpd.get("OtherIdentifyingInfo").asList().at(0).asString(), "AB");
    EXPECT_THAT(host.instancesOf("TVRHBA_VitalProductData"), SizeIs(1));
    EXPECT_THAT(logAbout(host, {"CreateVPD"}), ElementsAre(createVpdFailed("1000000000000001")));
    host.unload();
}

TEST(VitalProductData, CompleteWhatTheAdapterLeavesEmpty)
{
    const std::string vpd = R"("vpd": {"product": "P", "readOnly": {"PN": "PN1", "SN": "SN1", "EC": "EC1", "MN": "MN1"},
                                       "readWrite": {"YA": "tag"}})";
    Host host(hostOf({{R"("serialNumber": "S1", "manufacturer": "", "modelDescription": "D")", vpd},
                      {R"("serialNumber": "S2", "model": "M", "hardwareVersion": "H")", R"("vpd": {"raw": "78"})"}}));
    const broker::Object card = theOne(host, "TVRHBA_Card", "Tag", "S1");
    const std::pair<const char*, const char*> expected[] = {
        {"Manufacturer", "MN1"}, {"Model", "P"},
        {"Name", "P"},           {"Description", "D"},
        {"PartNumber", "PN1"},   {"VendorEquipmentType", "PN1"},
        {"SerialNumber", "S1"},  {"Version", "EC1"},
        {"UserTracking", "tag"}, {"SKU", ""},
        {"Tag", "S1"},           {"TVRSerialNumber", "S1"},
    };
    for (const auto& [property, value] : expected)
        EXPECT_EQ(text(card, property), value) << property;
    EXPECT_TRUE(card.get("CanBeFRUed").asBoolean());
    // The ends of associations lead to the card as it is now.
    const broker::Reply cards =
        host.broker().associators(theOne(host, "TVRHBA_Product", "IdentifyingNumber", "S1").path,
                                  {.assocClass = "TVRHBA_ProductPhysicalComponent"});
    ASSERT_THAT(cards.objects, SizeIs(1)) << cards.message;
    EXPECT_EQ(text(cards.objects[0], "PartNumber"), "PN1");

    const broker::Object other = theOne(host, "TVRHBA_Card", "Tag", "S2");
    EXPECT_EQ(text(other, "PartNumber"), "M");
    EXPECT_TRUE(other.get("VendorEquipmentType").isNull());
    host.unload();
}

TEST(VitalProductData, FirmwareHasTheNumberOfItsCard)
{
    Host host;
    const std::pair<const char*, const char*> numbers[] = {
        {"TVR FC HBA: Operational Firmware v11.4.210.8 TV1602:1000027A51160211", "TV16A02417"},
        {"TVR FC HBA: Operational Firmware v12.0.100.0 TV3202:1000027A51320240", "TV32B71155"},
    };
    for (const auto& [id, number] : numbers)
        EXPECT_EQ(text(theOne(host, "TVRHBA_SoftwareIdentity", "InstanceID", id), "SerialNumber"), number) << id;
    const broker::Object driver =
        theOne(host, "TVRHBA_SoftwareIdentity", "InstanceID", "TVR FC HBA: Driver tvrfc v12.0.0.1");
    EXPECT_TRUE(driver.get("SerialNumber").isNull()) << "it serves all cards";
    host.unload();
}

TEST(VitalProductData, SubAdaptersAreToldApart)
{
    const std::string vpd = R"("vpd": {"readOnly": {"PN": "PN1"}})";
    Host host(hostOf({{R"("serialNumber": "S1", "attributes": {"subadapterId": "1", "portNumber": 0})", vpd},
                      {R"("serialNumber": "S1", "attributes": {"subadapterId": "2", "portNumber": 1})", vpd}}));
    EXPECT_THAT(textsOf(host, "TVRHBA_VitalProductData", "ElementName"),
                ElementsAre("TVR HBA VPD:S1:1:Port:0", "TVR HBA VPD:S1:2:Port:1"));
    EXPECT_THAT(textsOf(host, "TVRHBA_FRUVitalProductData", "ElementName"), ElementsAre("TVR HBA FRU:S1"));
    host.unload();
}

} // namespace
