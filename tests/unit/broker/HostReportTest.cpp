// The host for people: readable values, what is wrong, the tree and the picture.
#include "broker/host/HostReport.h"
#include "broker/host/ReadableText.h"
#include "broker/tvrcim/Graphviz.h"
#include "broker/tvrcim/Topology.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace
{

using namespace broker;
using namespace tvrcim;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

TEST(ReadableTexts, NumbersHaveUnits)
{
    EXPECT_EQ(sizeText(0), "0 bytes");
    EXPECT_EQ(sizeText(1023), "1023 bytes");
    EXPECT_EQ(sizeText(536870912000), "500 GiB");
    EXPECT_EQ(sizeText(1649267441664), "1.5 TiB");
    EXPECT_EQ(sizeText(UINT64_MAX), "16 EiB");
    EXPECT_EQ(speedText(0), "");
    EXPECT_EQ(speedText(8000000000), "8 Gbit/s");
    EXPECT_EQ(speedText(2125000000), "2.1 Gbit/s");
    EXPECT_EQ(withSingleBlanks("  OLSTRA   DISK  "), "OLSTRA DISK");
    EXPECT_THAT(lines("one two three éééééééé", 7), ElementsAre("one two", "three", "éééééé…"));
    EXPECT_THAT(lines("  ", 7), IsEmpty());
}

Object objectWith(std::vector<Property> properties)
{
    return {{}, std::move(properties)};
}

TEST(HostKinds, WhatIsWrongHasAWord)
{
    const auto status = [](std::uint16_t value) {
        return objectWith({{"OperationalStatus", Value::array(CMPI_uint16, {Value::uint16(value)})}});
    };
    const auto chip = [](std::uint32_t temperature, std::uint32_t warning, std::uint32_t critical)
    {
        return objectWith({{"BoardTemperature", Value::uint32(temperature)},
                           {"ThresholdWarningTemp", Value::uint32(warning)},
                           {"ThresholdCriticalTemp", Value::uint32(critical)}});
    };
    const auto power = [](float value)
    {
        return objectWith({{"RxPower", Value::real32(value)},
                           {"RxPowerHighAlarm", Value::real32(1.5F)},
                           {"RxPowerHighWarning", Value::real32(1)},
                           {"RxPowerLowWarning", Value::real32(0.03F)},
                           {"RxPowerLowAlarm", Value::real32(0.02F)}});
    };
    const auto cold = [](float temperature)
    {
        return objectWith({{"Temperature", Value::real32(temperature)},
                           {"TemperatureHighAlarm", Value::real32(70)},
                           {"TemperatureHighWarning", Value::real32(0)},
                           {"TemperatureLowWarning", Value::real32(0)}});
    };
    const struct
    {
        const char* kind;
        Object object;
        std::vector<std::string> problems;
    } rows[] = {
        {"FC port", status(2), {}},
        {"FC port", status(1), {"LINK DOWN"}},
        {"FC port", status(10), {"OFFLINE"}},
        {"FC port", status(32788), {"NEEDS RESET"}},
        {"Virtual port", status(32789), {"LINK DOWN", "NEEDS RESET"}},
        {"FC port", status(0), {"STATE UNKNOWN"}},
        {"FC port", objectWith({}), {"STATE UNKNOWN"}},
        {"FC port", objectWith({{"OperationalStatus", Value::array(CMPI_uint16, {})}}), {"STATE UNKNOWN"}},
        {"Chip", chip(84, 85, 95), {}},
        {"Chip", chip(85, 85, 95), {"TEMPERATURE ABOVE WARNING"}},
        {"Chip", chip(95, 85, 95), {"TEMPERATURE ABOVE CRITICAL"}},
        {"Chip", chip(95, 0, 0), {}},
        {"Chip", objectWith({{"BoardTemperature", Value::null(CMPI_uint32)}}), {}},
        {"Transceiver", power(0.5F), {}},
        {"Transceiver", power(1.2F), {"RECEIVE POWER ABOVE WARNING"}},
        {"Transceiver", power(0.025F), {"RECEIVE POWER BELOW WARNING"}},
        {"Transceiver", power(0), {"RECEIVE POWER BELOW CRITICAL"}},
        {"Transceiver", cold(0.5F), {}},
        {"Transceiver", cold(0), {"TEMPERATURE BELOW WARNING"}},
    };
    for (const auto& row : rows)
    {
        std::vector<std::string> problems;
        for (const Problem& problem : kindNamed(row.kind).problems(row.object))
            problems.push_back(problem.text);
        EXPECT_EQ(problems, row.problems) << row.kind << " " << (&row - rows);
    }
}

TEST(Health, FirmwareWaitsWhereAnotherVersionRuns)
{
    const auto software = [](const char* name, const char* version, Software classification)
    {
        const auto number = static_cast<std::uint16_t>(classification);
        return objectWith({{"Name", Value::string(name)},
                           {"VersionString", Value::string(version)},
                           {"Classifications", Value::array(CMPI_uint16, {Value::uint16(number)})}});
    };
    const Object running = software("Operational Firmware", "1.0", Software::firmware);
    const Object same = software("Firmware On Flash", "1.0", Software::firmware);
    const Object newer = software("Firmware On Flash", "1.1", Software::firmware);
    const Object image = software("Firmware On Flash", "1.1", Software::bootCode);
    const Object nothing = objectWith({{"Name", Value::null(CMPI_string)}});
    const struct
    {
        std::vector<const Object*> software;
        const char* waiting;
    } rows[] = {{{&newer, &nothing, &running}, "1.1"},
                {{&running, &same}, ""},
                {{&running, &image}, ""},
                {{&running}, ""},
                {{&newer}, ""},
                {{}, ""}};
    for (const auto& row : rows)
        EXPECT_EQ(waitingFirmware(row.software), row.waiting) << (&row - rows);
}

TEST(HostKinds, ValuesOfOtherTypesAreNoMisfortune)
{
    for (const KindRow& kind : kinds())
        for (const FactRow& row : kind.facts)
            for (const Value& value :
                 {Value::null(CMPI_uint16), Value::string("\xff"), Value::real64(1e300), Value::boolean(true),
                  Value::uint64(UINT64_MAX), Value::array(CMPI_string, {Value::null(CMPI_string)})})
                EXPECT_NO_THROW(row.text(objectWith({{row.property, value}}), row)) << kind.name << " " << row.label;
}

TEST(HostTree, ShowsFactsUnderTheirNodesAndProblemsInTheirLine)
{
    HostNode root{"Host", "h"};
    root.facts = {{"a", "1"}, {"long", "2"}, {"speed", "3", inLine}, {"fabric", "f", inLine | labelled}};
    root.children = {{"Card", "c"}, {"Card", "d"}};
    root.children[0].children = {{"Chip", "x"}};
    root.children[0].children[0].facts = {{"tag", "t"}};
    root.children[1].problems = {{"LINK DOWN"}};
    root.children[1].facts = {{"state", "link down", inLine}, {"speed", "5", inLine}};
    std::ostringstream plain, coloured;
    printTree(plain, root);
    EXPECT_EQ(plain.str(), "Host  h  3, fabric f\n"
                           "│   a     1\n"
                           "│   long  2\n"
                           "├── Card  c\n"
                           "│   └── Chip  x\n"
                           "│           tag  t\n"
                           "└── Card  d  LINK DOWN  5\n");
    printTree(coloured, root, true);
    EXPECT_THAT(coloured.str(), HasSubstr("└── Card  d  \x1b[1;31mLINK DOWN\x1b[0m  5\n"));
}

// --- the picture ------------------------------------------------------------------------------------------------

HostNode unit(const std::string& number)
{
    HostNode node{"Volume", "Volume " + number};
    node.identity = number;
    node.isUnit = true;
    node.units = 1;
    node.bytes = 1ULL << 40;
    return node;
}

HostNode nodeOf(const char* kind, const std::string& name, std::vector<HostNode> children)
{
    HostNode node{kind, name};
    node.children = std::move(children);
    for (const HostNode& child : node.children)
        node.count(child);
    return node;
}

HostNode target(const std::string& name, std::size_t units)
{
    std::vector<HostNode> children;
    for (std::size_t i = 0; i < units; ++i)
        children.push_back(unit(std::to_string(i)));
    return nodeOf(targetKind, name, std::move(children));
}

/// A host with ports, and between them what is not drawn.
HostNode hostWith(std::vector<HostNode> ports)
{
    return nodeOf(hostKind, "h", {nodeOf("Product", "p", {nodeOf("Card", "c", std::move(ports))})});
}

std::size_t count(const std::string& text, const std::string& part)
{
    std::size_t found = 0;
    for (std::size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1))
        ++found;
    return found;
}

TEST(Topology, TargetsOfSeveralPortsAreDrawnOnce)
{
    const std::string dot = topologyDot(
        hostWith({nodeOf("FC port", "a", {target("t", 2)}), nodeOf("FC port", "b", {target("t", 3), target("u", 1)})}));
    EXPECT_EQ(count(dot, "label=\"Target t\""), 1u) << dot;
    EXPECT_EQ(count(dot, "label=\"Volume "), 4u) << dot;
    EXPECT_THAT(dot, Not(HasSubstr("Product")));
    for (const char* edge : {"n0 -> n1\n", "n1 -> n2\n", "n2 -> n3 [label=\"2 units\"]", "n4 -> n3 [label=\"3 units\"]",
                             "n4 -> n5 [label=\"1 unit\"]", "{rank=same; n2; n4}", "{rank=same; n3; n5}"})
        EXPECT_THAT(dot, HasSubstr(edge));
}

TEST(Topology, ManyAreOneBoxWithTheirNumber)
{
    std::vector<HostNode> targets;
    for (int i = 0; i < 9; ++i)
        targets.push_back(target(std::to_string(i), 2));
    const HostNode host = hostWith({nodeOf("FC port", "a", {target("t", 5)}), nodeOf("FC port", "b", targets)});
    const std::string dot = topologyDot(host);
    EXPECT_THAT(dot, HasSubstr("label=\"5 units, 5 TiB\\n5 volumes\""));
    EXPECT_THAT(dot, HasSubstr("label=\"9 targets\\n18 units, 18 TiB\""));
    EXPECT_EQ(count(dot, "label=\"Volume "), 0u);
    EXPECT_EQ(count(topologyDot(host, true), "label=\"Volume "), 23u);
    // Units that no target leads to.
    EXPECT_THAT(topologyDot(nodeOf(hostKind, "h", target("t", 6).children)), HasSubstr("label=\"6 units, 6 TiB"));
}

TEST(Topology, WhatIsDownIsMarkedAndForeignTextsAreText)
{
    HostNode down = nodeOf("FC port", "a\\\"]; x [&amp;", {});
    down.problems = {{"LINK DOWN", true}};
    down.facts = {{"fabric", std::string(50, 'f'), inLine | labelled | pictured}};
    const std::string dot = topologyDot(hostWith({down}));
    EXPECT_THAT(dot,
                HasSubstr("fillcolor=\"#f4b6b6\", label=\"FC port a\\\\\\\"]; x [&amp;amp;\\nLINK DOWN\\nfabric\\n" +
                          std::string(35, 'f') + "…\"]"));
    EXPECT_THAT(dot, HasSubstr("n1 -> n2 [style=dashed, color=\"#cc0000\"]"));
    down.problems = {{"NEEDS RESET"}};
    EXPECT_THAT(topologyDot(hostWith({down})), HasSubstr("n1 -> n2\n")) << "it has its link";
}

/// A folder with a program dot of a test's making, in front of PATH or in its place.
class Dot
{
public:
    explicit Dot(const char* script)
    {
        std::filesystem::create_directories(_folder);
        if (script)
        {
            std::ofstream(_folder / "dot") << "#!/bin/sh\n" << script << '\n';
            std::filesystem::permissions(_folder / "dot", std::filesystem::perms::owner_all);
        }
        setenv("PATH", script ? (_folder.string() + ":" + _path).c_str() : _folder.c_str(), 1);
    }
    ~Dot()
    {
        setenv("PATH", _path.c_str(), 1);
        std::filesystem::remove_all(_folder);
    }

private:
    std::filesystem::path _folder = testing::TempDir() + "dot-" + std::to_string(getpid());
    std::string _path = std::getenv("PATH");
};

std::string failure(const char* script)
{
    const Dot dot(script);
    try
    {
        drawnByGraphviz(std::string(1 << 20, 'x'), "svg");
    }
    catch (const std::runtime_error& error)
    {
        return error.what();
    }
    return "";
}

TEST(Graphviz, GraphsAndPicturesOfAnySizePass)
{
    const Dot dot("echo \"$1\"; cat; cat /dev/zero | head -c 1000000");
    const std::string graph(1 << 20, 'g');
    EXPECT_EQ(drawnByGraphviz(graph, "svg"), "-Tsvg\n" + graph + std::string(1000000, '\0'));
}

TEST(Graphviz, FailuresSayWhy)
{
    EXPECT_THAT(failure(nullptr), HasSubstr("apt-get install graphviz"));
    EXPECT_THAT(failure("echo no such thing >&2; exit 3"), HasSubstr("no such thing"));
    EXPECT_THAT(failure("exit 0"), HasSubstr("cannot draw"));
    EXPECT_THAT(failure("kill -9 $$"), HasSubstr("signal 9"));
}

} // namespace
