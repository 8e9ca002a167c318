#include "Scenarios.h"

#include "simulator/JsonNode.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>
#include <iterator>

namespace tvrsim
{
namespace
{

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;

std::string errorOf(const std::string& text)
{
    try
    {
        readScenario(text, "test.json");
    }
    catch (const ScenarioError& error)
    {
        return error.what();
    }
    return "no error";
}

std::string withPort(const std::string& member)
{
    return R"({"adapters": [{"name": "A", "ports": [{"wwpn": "1000000000000001", )" + member + "}]}]}";
}

std::string withUnit(const std::string& members)
{
    return R"({"targets": [{"name": "T", "wwpn": "5000000000000001", "units": [{"lun": 0}, {)" + members + "}]}]}";
}

std::string phases(int count)
{
    std::string text = R"({"id": 210})";
    for (int i = 1; i < count; ++i)
        text += R"(, {"id": 210})";
    return text;
}

std::string withFault(const std::string& members)
{
    return R"({"faults": [{)" + members + "}]}";
}

TEST(ScenarioReader, ErrorsNameFilePlaceAndExpectation)
{
    struct Case
    {
        std::string text;
        const char* place;
        const char* message;
    };
    const Case cases[] = {
        {"{\n  \"adapters\": [,]}", "", "line 2, column 16"},
        {"[]", "/", "expected an object, found an array"},
        {R"({"adaptors": []})", "/", "unknown member \"adaptors\", expected one of: adapters, description, "},
        {R"({"adapters": {}})", "/adapters", "expected an array, found an object"},
        {R"({"adapters": [{}]})", "/adapters/0", "expected a member \"name\""},
        {R"({"adapters": [{"name": 7}]})", "/adapters/0/name", "expected a text of at most 255 bytes, found 7"},
        {R"({"adapters": [{"name": "A", "stale": 1}]})", "/adapters/0/stale", "expected true or false, found 1"},
        {R"({"adapters": [{"name": "A", "features": {"x": 1}}]})", "/adapters/0/features", "a number as the member's"},
        {R"({"adapters": [{"name": "A", "temperature": {"board": 256}}]})", "/adapters/0/temperature/board",
         "expected a number from 0 to 255, found 256"},
        {R"({"adapters": [{"name": "A", "attributes": {"sliMode": -1}}]})", "/adapters/0/attributes/sliMode",
         "expected a number from 0 to 4294967295, found -1"},
        {R"({"adapters": [{"name": "A", "attributes": {"ieeeAddress": "0"}}]})", "/adapters/0/attributes/ieeeAddress",
         "pairs of hexadecimal digits, found \"0\""},
        {R"({"adapters": [{"name": "A"}, {"name": "A"}]})", "/adapters/1", "expected a name of its own"},
        {R"({"adapters": [{"name": "A", "template": "t"}]})", "/adapters/0/template", "the name of a member of /templ"},
        {withPort(R"("wwnn": "12")"), "/adapters/0/ports/0/wwnn", "expected a WWN of 16 hexadecimal digits, found"},
        {withPort(R"("state": "up")"), "/adapters/0/ports/0/state", R"(or "online" or "offline")"},
        {withPort(R"("targets": ["T"])"), "/adapters/0/ports/0/targets/0",
         "expected the name of a target, found \"T\""},
        {withPort(R"("fcId": "0x1FFFFFFFF")"), "/adapters/0/ports/0/fcId", "expected a number from 0 to 4294967295"},
        {withPort(R"("virtualPorts": [{"wwpn": "1000000000000001"}])"), "/adapters/0/ports/0/virtualPorts/0",
         "found 10:00:00:00:00:00:00:01 twice"},
        {withPort(R"("pci": {"revision": 256})"), "/adapters/0/ports/0/pci/revision", "a number from 0 to 255"},
        {withPort(R"("vpd": {"readOnly": {"PNX": "1"}})"), "/adapters/0/ports/0/vpd/readOnly/PNX",
         "a keyword of two characters"},
        {withPort(R"("vpd": {"raw": "82", "product": "P"})"), "/adapters/0/ports/0/vpd", "unknown member \"product\""},
        {withPort(R"("diagnostics": {"ping": {}})"), "/adapters/0/ports/0/diagnostics", "unknown member \"ping\""},
        {withPort(R"("diagnostics": {"echo": {"endState": "done"}})"), "/adapters/0/ports/0/diagnostics/echo/endState",
         R"(or "cancelled" or "finished")"},
        {withPort(R"("diagnostics": {"dport": {"result": 256}})"), "/adapters/0/ports/0/diagnostics/dport/result",
         "expected a number from 0 to 255"},
        {withPort(R"("diagnostics": {"dport": {"phases": [{}]}})"), "/adapters/0/ports/0/diagnostics/dport/phases/0",
         "expected a member \"id\""},
        {withPort(R"("diagnostics": {"dport": {"phases": [{"id": 210, "latency": 1, "localErrors": 1}]}})"),
         "/adapters/0/ports/0/diagnostics/dport/phases/0", "either a latency or errors"},
        {withPort(R"("diagnostics": {"dport": {"phases": [)" + phases(38) + "]}}"),
         "/adapters/0/ports/0/diagnostics/dport/phases/37", "expected at most 37 phases"},
        {withUnit(R"("lun": 0)"), "/targets/0/units/1/lun", "expected a number that no other unit of the target has"},
        {withUnit(R"("lun": 16384)"), "/targets/0/units/1/lun", "expected a number from 0 to 16383"},
        {withUnit(R"("lun": 1, "vendor": "NINE CHAR")"), "/targets/0/units/1/vendor", "at most 8 bytes"},
        {withUnit(R"("lun": 1, "designators": [{"value": "0G"}])"), "/targets/0/units/1/designators/0/value", "pairs"},
        {withFault(R"("function": "HBA_OpenAdaptor", "status": 1)"), "/faults/0/function", "the name of a function"},
        {withFault(R"("function": "RM_InitLib")"), "/faults/0", "exactly one of: status, delayMs, gate"},
        {withFault(R"("function": "RM_InitLib", "status": 1, "delayMs": 1)"), "/faults/0", "exactly one of"},
        {withFault(R"("function": "RM_InitLib", "truncate": 1)"), "/faults/0/truncate", "no output that can be cut"},
        {withFault(R"("function": "HBA_OpenAdapter", "hostile": "allOnes")"), "/faults/0/hostile",
         "a kind that HBA_OpenAdapter can show: zeroHandle, found \"allOnes\""},
        {R"({"generate": {"adapters": 256, "portsPerAdapter": 16, "targetsPerPort": 1, "unitsPerTarget": 1024}})",
         "/generate", "expected at most 1048576 units"},
    };
    for (const Case& c : cases)
    {
        SCOPED_TRACE(c.text);
        EXPECT_THAT(errorOf(c.text), AllOf(StartsWith(std::string("test.json: ") + c.place), HasSubstr(c.message)));
    }
    EXPECT_THROW(readScenarioFile("/nowhere.json"), ScenarioError);
}

TEST(ScenarioReader, MembersReachTheModel)
{
    const Scenario scenario = readScenario(twoPorts, "test");
    const Port& port = scenario.adapters.at(0).ports.at(0);
    EXPECT_EQ(port.wwpn, portA);
    EXPECT_EQ(port.wwnn, portA) << "the port's own name where none is given";
    EXPECT_THAT(port.targets, ElementsAre(1, 0));
    EXPECT_EQ(scenario.targets[0].units[0].number, 0u) << "units are sorted";
    EXPECT_EQ(scenario.targets[0].fcId, 0x10203u);

    const RM_PciRegisters& pci = port.pci.value();
    EXPECT_EQ(pci.pciType, 4u);
    EXPECT_EQ(pci.header[0], 0x34);
    EXPECT_EQ(pci.header[1], 0x12);
    EXPECT_EQ(pci.header[20], 4) << "little-endian";
    EXPECT_EQ(pci.header[23], 1);
    EXPECT_EQ(pci.area[1], 8u);
}

TEST(ScenarioReader, VitalProductDataAreLaidOutForTheBus)
{
    const auto areaOf = [](const std::string& members)
    {
        const RM_VpdArea area = readScenario(withPort(members), "test").adapters.at(0).ports.at(0).vpd.value();
        return std::string(reinterpret_cast<const char*>(area.data), area.length);
    };
    EXPECT_EQ(
        areaOf(R"("vpd": {"product": "Card", "readOnly": {"SN": "7", "CP": {"value": "01 00"}},
                                "readWrite": {"YA": "tag"}})"),
        std::string("\x82\x04\0Card\x90\x0d\0CP\x02\x01\0SN\x01\x37RV\x01K\x91\x0d\0YA\x03tagRW\x04\0\0\0\0x", 40))
        << "with a checksum";
    EXPECT_EQ(areaOf(R"("vpd": {"raw": "90 FF FF"})"), "\x90\xff\xff");
}

TEST(ScenarioReader, ObjectsAreLaidOverTheirTemplates)
{
    const Scenario scenario = readScenario(R"({
      "templates": {"card": {"model": "M", "serialNumber": "S", "temperature": {"board": 1, "critical": 2},
                             "ports": [{"template": "port", "wwpn": "1000000000000001"}]},
                    "port": {"fcId": 5}},
      "adapters": [{"template": "card", "name": "A", "serialNumber": null, "temperature": {"board": 3}}]})",
                                           "test");
    const Adapter& adapter = scenario.adapters.at(0);
    EXPECT_EQ(adapter.model, "M");
    EXPECT_EQ(adapter.serialNumber, "");
    EXPECT_EQ(adapter.attributes.at(0).value, std::string("\x03\x00\x02\x00", 4));
    EXPECT_EQ(adapter.ports.at(0).fcId, 5u);
}

TEST(ScenarioReader, ShippedScenariosAreRead)
{
    std::size_t read = 0;
    for (const auto& file : std::filesystem::directory_iterator(TVRSIM_SCENARIO_FOLDER))
    {
        SCOPED_TRACE(file.path());
        EXPECT_NO_THROW(readScenarioFile(file.path()));
        ++read;
    }
    EXPECT_GE(read, 7u);
}

TEST(ScenarioReader, DefaultHostShowsEveryKindOfDevice)
{
    const Scenario scenario = readScenario(defaultScenarioText, "default");
    std::set<std::string> cards;
    std::size_t down = 0, virtualPorts = 0;
    for (const Adapter& adapter : scenario.adapters)
    {
        cards.insert(adapter.serialNumber);
        for (const Port& port : adapter.ports)
        {
            down += port.state != HBA_PORTSTATE_ONLINE;
            virtualPorts += port.virtualPorts.size();
        }
    }
    std::set<unsigned> types;
    for (const Target& target : scenario.targets)
        for (const LogicalUnit& unit : target.units)
            types.insert(unit.deviceType);
    EXPECT_EQ(scenario.adapters.size(), 4u);
    EXPECT_EQ(cards.size(), 2u);
    EXPECT_EQ(down, 1u);
    EXPECT_EQ(virtualPorts, 1u);
    EXPECT_THAT(types, ElementsAre(0, 1, 8, 13, 17));
}

// The page that documents the format.

std::string documentation()
{
    std::ifstream stream(TVRSIM_SCENARIO_FOLDER "/../../docs/scenarios.md");
    return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
}

TEST(ScenarioDocumentation, NamesEveryAttributeAndHostileKind)
{
    const std::string page = documentation();
    for (const auto rows : {adapterAttributeRows, portAttributeRows, statisticsRows, serverAttributeRows})
        for (const AttributeRow& row : rows)
            EXPECT_NE(page.find(std::string("`") + row.key + '`'), std::string::npos) << row.key;
    for (const HostileRow& row : hostileRows)
        EXPECT_NE(page.find(std::string("`") + row.name + '`'), std::string::npos) << row.name;
}

TEST(ScenarioDocumentation, ExamplesAreScenarios)
{
    const std::string page = documentation();
    const std::string begin = "```json\n", end = "```";
    std::size_t examples = 0;
    for (std::size_t place = page.find(begin); place != std::string::npos; place = page.find(begin, place))
    {
        place += begin.size();
        const std::string example = page.substr(place, page.find(end, place) - place);
        EXPECT_NO_THROW(readScenario(example, "example")) << example;
        ++examples;
    }
    EXPECT_GE(examples, 5u);
}

} // namespace
} // namespace tvrsim
