// The tool's commands, command line and reports.
#include "tests/unit/broker/FakeModule.h"

#include "broker/host/ReadableText.h"
#include "broker/tvrcim/Arguments.h"
#include "broker/tvrcim/CommandLine.h"
#include "broker/tvrcim/Printing.h"
#include "broker/values/ValueMap.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <fstream>
#include <sstream>
#include <unistd.h>

namespace
{

using namespace broker;
using namespace tvrcim;
using broker_test::Fixture;
using testing::ElementsAre;
using testing::HasSubstr;

CommandLine parse(std::vector<const char*> words)
{
    words.insert(words.begin(), "tvrcim");
    return parseCommandLine(static_cast<int>(words.size()), words.data());
}

TEST(CommandLineTest, OptionsStandBeforeOrBehindTheCommand)
{
    const CommandLine line =
        parse({"--namespace", "root/x", "enum", "TST_Base", "--properties", "a,b", "--format", "json"});
    ASSERT_TRUE(line.proceed);
    EXPECT_EQ(line.settings.nameSpace, "root/x");
    EXPECT_EQ(line.settings.format, Format::json);
    EXPECT_STREQ(line.settings.personality.name, "strict");
    EXPECT_STREQ(parse({"enum", "A", "--server", "open-group"}).settings.personality.name, "open-group");
    EXPECT_EQ(line.settings.command.name, "enum");
    EXPECT_EQ(line.settings.command.target, "TST_Base");
    EXPECT_THAT(line.settings.command.properties.value(), ElementsAre("a", "b"));

    const Command assoc =
        parse({"assoc", "P.k=1", "--class", "A", "--result-class", "R", "--role", "X", "--result-role", "Y", "--names"})
            .settings.command;
    EXPECT_EQ(assoc.filter.assocClass + assoc.filter.resultClass + assoc.filter.role + assoc.filter.resultRole, "ARXY");
    EXPECT_TRUE(assoc.names);
    const Command call = parse({"call", "P.k=1", "Add", "A=1", "B=[1,2]"}).settings.command;
    EXPECT_EQ(call.method, "Add");
    EXPECT_THAT(call.assignments, ElementsAre("A=1", "B=[1,2]"));
    const Command topology = parse({"topology", "--output", "san.svg", "--all"}).settings.command;
    EXPECT_EQ(topology.output, "san.svg");
    EXPECT_TRUE(topology.all);
}

TEST(CommandLineTest, UsageErrorsExitWithTwo)
{
    for (const std::vector<const char*>& words : {std::vector<const char*>{},
                                                  {"nonsense"},
                                                  {"enum"},
                                                  {"set", "P.k=1"},
                                                  {"--format", "xml", "classes"},
                                                  {"--server", "another", "classes"},
                                                  {"--scenario", "/nonexistent", "classes"},
                                                  {"enum", "A", "--unknown"}})
    {
        testing::internal::CaptureStderr();
        const CommandLine line = parse(words);
        EXPECT_FALSE(line.proceed);
        EXPECT_EQ(line.exitCode, exitUsage);
        EXPECT_NE(testing::internal::GetCapturedStderr(), "");
    }
    testing::internal::CaptureStdout();
    EXPECT_EQ(parse({"--help"}).exitCode, 0);
    EXPECT_THAT(testing::internal::GetCapturedStdout(), HasSubstr("host"));
}

/// Runs commands on a broker whose store holds one computer system.
struct Tool : Fixture
{
    Tool()
    {
        EXPECT_EQ(run({"create", "IBMSD_ComputerSystem", "", {"CreationClassName=C", "Name=\"b\\\"x\""}}),
                  "root/ibmse:IBMSD_ComputerSystem.CreationClassName=\"C\",Name=\"b\\\"x\"\n");
    }
    std::string run(const Command& command, Format format = Format::table)
    {
        std::ostringstream out;
        Session session{*broker, "root/ibmse", format, out};
        runCommand(session, command);
        return out.str();
    }
    std::string path = "IBMSD_ComputerSystem.CreationClassName=\"C\",Name=\"b\\\"x\"";
};

TEST(Commands, InstancesGoThroughTheirLife)
{
    Tool tool;
    EXPECT_EQ(tool.run({"get", tool.path}), tool.path + "\n"
                                                        "    CreationClassName  C\n"
                                                        "    Name               b\"x\n"
                                                        "    ElementName        host\n");
    EXPECT_EQ(tool.run({"set", tool.path, "", {"elementname=two\nlines"}}), "changed " + tool.path + "\n");
    Command columns{"enum", "IBMSD_ComputerSystem"};
    columns.properties = std::vector<std::string>{"ElementName", "Name"};
    EXPECT_EQ(tool.run(columns), "ElementName  Name\n"
                                 "two\\nlines   b\"x\n");
    const Json json = Json::parse(tool.run({"enum", "IBMSD_ComputerSystem"}, Format::json));
    EXPECT_EQ(json[0]["properties"]["ElementName"], "two\nlines");
    EXPECT_EQ(json[0]["path"], tool.path);
    EXPECT_EQ(tool.run({"get", tool.path}, Format::mof),
              "instance of IBMSD_ComputerSystem\n{\n    CreationClassName = \"C\";\n    Name = \"b\\\"x\";\n"
              "    ElementName = \"two\nlines\";\n};\n");
    EXPECT_EQ(tool.run({"delete", tool.path}), "deleted " + tool.path + "\n");
    EXPECT_THROW(tool.run({"get", tool.path}), CimError);
    EXPECT_EQ(tool.run({"enum", "IBMSD_ComputerSystem"}), "");
}

TEST(Commands, PathsInJsonLeadBackWhateverTheirBytes)
{
    Tool tool;
    tool.run({"create", "IBMSD_ComputerSystem", "", {"CreationClassName=C", "Name=caf\xe9\n"}});
    const Json names =
        Json::parse(tool.run({.name = "enum", .target = "IBMSD_ComputerSystem", .names = true}, Format::json));
    ASSERT_EQ(names.size(), 2U);
    for (const Json& name : names)
    {
        const Json found = Json::parse(tool.run({"get", name["path"]}, Format::json));
        EXPECT_EQ(found["path"], name["path"]);
    }
}

TEST(Commands, WrongArgumentsAreNamed)
{
    Tool tool;
    const auto refusal = [&](const Command& command) -> std::string
    {
        try
        {
            tool.run(command);
        }
        catch (const UsageError& error)
        {
            return error.what();
        }
        catch (const CimError& error)
        {
            return std::string("CIM ") + error.what();
        }
        return "";
    };
    EXPECT_THAT(refusal({"get", "IBMSD_ComputerSystem.Name=x"}), HasSubstr("CIM CIM_ERR_NOT_FOUND: PATH: there is no"));
    EXPECT_THAT(refusal({"get", "IBMSD_ComputerSystem.Nam=x"}), HasSubstr("'Nam'"));
    EXPECT_THAT(refusal({"set", tool.path, "", {"Colour=red"}}), HasSubstr("'Colour'"));
    EXPECT_THAT(refusal({"set", tool.path, "", {"ElementName=a", "elementname=b"}}),
                HasSubstr("ElementName: it is given twice"));
    EXPECT_THAT(refusal({"set", tool.path, "", {"ElementName"}}), HasSubstr("'ElementName'"));
    EXPECT_THAT(refusal({"call", "root/tavrin:TST_Base.Id=a", "Add", {"A=-1"}}), HasSubstr("A: '-1'"));
    EXPECT_THAT(refusal({"call", "root/tavrin:TST_Base.Id=a", "Add", {"Sum=1"}}), HasSubstr("'Sum'"));
    EXPECT_THAT(refusal({"set", "root/tavrin:TST_Base.Id=a", "", {"Next=TST_Link.Left=a"}}),
                HasSubstr("Next: TST_Link is no TST_Port"));
    EXPECT_THAT(refusal({"set", "root/tavrin:TST_Base.Id=a", "", {"Next=TST_None.Left=a"}}),
                HasSubstr("Next: there is no class 'TST_None'"));
    EXPECT_THAT(refusal({"call", "root/tavrin:TST_Base.Id=a", "Sub"}), HasSubstr("CIM CIM_ERR_METHOD_NOT_FOUND"));
    EXPECT_THAT(refusal({"enum", "Nope"}), HasSubstr("CIM CIM_ERR_INVALID_CLASS"));
    EXPECT_THAT(refusal({"class", "Nope"}), HasSubstr("'Nope'"));
}

TEST(Commands, ClassesAndMethodsAreShown)
{
    Tool tool;
    EXPECT_THAT(tool.run({"class", "TST_Disk"}), HasSubstr("Level     uint16              Read, Write       3 "));
    EXPECT_THAT(tool.run({"class", "TST_Disk"}), HasSubstr("in uint32 A, out uint32 Sum, out string[] Notes"));
    EXPECT_EQ(Json::parse(tool.run({"class", "TST_Disk"}, Format::json))["superclass"], "TST_Base");
    const std::string classes = tool.run({"classes"});
    EXPECT_THAT(classes, HasSubstr("TST_Link  -           association  Left, Right"));
    EXPECT_THAT(classes, testing::Not(HasSubstr("IBMSD")));
    Command all{"classes"};
    all.all = true;
    EXPECT_THAT(tool.run(all), HasSubstr("IBMSD"));

    tool.on("invokeMethod",
            [](const broker_test::Call& call)
            {
                CMPIValue value{};
                value.uint32 = CMGetArg(call.in, "A", nullptr).value.uint32 * 2;
                CMAddArg(call.out, "Sum", &value, CMPI_uint32);
                CMReturnData(call.result, nullptr, CMPI_uint32);
                return CMReturnDone(call.result);
            });
    const Command call{"call", "root/tavrin:TST_Base.Id=a", "Add", {"A=0x10"}};
    EXPECT_EQ(tool.run(call), "PARAMETER   VALUE\n(returned)  null\nSum         32\n");
    EXPECT_EQ(Json::parse(tool.run(call, Format::json)),
              Json::parse(R"({"returnValue":null,"meaning":null,"out":{"Sum":32}})"));
    EXPECT_EQ(tool.violations(), "");
}

/// Scripts see that a method refused, and still get what it answered.
TEST(Commands, AMethodThatReturnsAnotherNumberThanZeroIsARefusal)
{
    Tool tool;
    tool.on("invokeMethod",
            [](const broker_test::Call& call)
            {
                CMPIValue value{};
                value.uint32 = CMGetArg(call.in, "A", nullptr).value.uint32;
                CMReturnData(call.result, &value, CMPI_uint32);
                return CMReturnDone(call.result);
            });
    std::ostringstream out;
    Session session{*tool.broker, "root/tavrin", Format::json, out};
    runCommand(session, {"call", "TST_Base.Id=a", "Add", {"A=0"}});
    out.str("");
    EXPECT_THROW(runCommand(session, {"call", "TST_Base.Id=a", "Add", {"A=7"}}), MethodRefusal);
    EXPECT_EQ(Json::parse(out.str()), Json::parse(R"({"returnValue":7,"meaning":null,"out":{}})"));
}

TEST(Commands, KeysThatTheOthersSettleMayBeLeftOut)
{
    Tool tool;
    const std::string other = "IBMSD_ComputerSystem.CreationClassName=\"C\",Name=\"other\"";
    EXPECT_THAT(tool.run({"get", "IBMSD_ComputerSystem"}), testing::StartsWith(tool.path));
    tool.run({"create", "IBMSD_ComputerSystem", "", {"CreationClassName=C", "Name=other"}});
    EXPECT_EQ(tool.run({"set", "IBMSD_ComputerSystem.name=other", "", {"ElementName="}}), "changed " + other + "\n");
    EXPECT_THAT(tool.run({"get", other}), HasSubstr("    ElementName        \n"));
    EXPECT_EQ(tool.run({"set", other, "", {"ElementName=null"}}), "changed " + other + "\n");
    EXPECT_THAT(tool.run({"get", other}), testing::Not(HasSubstr("ElementName")));
    for (const char* several : {"IBMSD_ComputerSystem", "IBMSD_ComputerSystem.CreationClassName=C"})
        EXPECT_THROW(tool.run({"get", several}), UsageError) << several;
    EXPECT_EQ(tool.run({"delete", "IBMSD_ComputerSystem.Name=other"}), "deleted " + other + "\n");
    EXPECT_THROW(tool.run({"delete", "IBMSD_ComputerSystem.Name=other"}), CimError);
}

/// What goes out for an array of bytes is what the file holds; for another type @ is a character like others.
TEST(Commands, BytesComeFromAFile)
{
    const std::string file = testing::TempDir() + "bytes-" + std::to_string(getpid());
    std::ofstream(file, std::ios::binary) << std::string("\0\xff\n", 3);
    std::vector<FeatureInfo> features(2);
    features[0].name = "Image";
    features[0].type = CMPI_uint8A;
    features[1].name = "URI";
    features[1].type = CMPI_string;
    const std::string owner = "Install";
    Tool tool;
    std::ostringstream out;
    const Session session{*tool.broker, "root/tavrin", Format::table, out};
    const auto values = parseAssignments(session, {"root/tavrin", features, owner}, {"image=@" + file, "URI=@" + file});
    EXPECT_EQ(values[0].value, Value::array(CMPI_uint8, {Value::uint8(0), Value::uint8(0xff), Value::uint8('\n')}));
    EXPECT_EQ(values[1].value, Value::string("@" + file));
    for (const std::string& unreadable : {file + "-none", testing::TempDir()})
        EXPECT_THROW(parseAssignments(session, {"root/tavrin", features, owner}, {"Image=@" + unreadable}), UsageError);
    std::remove(file.c_str());
}

TEST(ValueMaps, NameValuesRangesAndAllOthers)
{
    const cimple::Value_Name rows[] = {
        {"..", "Reserved"}, {"0", "Done"}, {"5..0x0F", "Range"}, {"0x10", "Busy"}, {"0x8000..", "Vendor"}};
    const struct
    {
        std::uint32_t value;
        const char* name;
    } expected[] = {{0, "Done"},      {1, "Reserved"},      {5, "Range"},       {15, "Range"},  {16, "Busy"},
                    {17, "Reserved"}, {0x7fff, "Reserved"}, {0x8000, "Vendor"}, {~0U, "Vendor"}};
    for (const auto& row : expected)
        EXPECT_EQ(valueName(rows, Value::uint32(row.value)), row.name) << row.value;
    EXPECT_EQ(valueName(std::span(rows).subspan(1), Value::uint32(1)), "");
    EXPECT_EQ(valueName(rows, Value::null(CMPI_uint32)), "");
    EXPECT_EQ(namedValueText(rows, Value::array(CMPI_uint16, {Value::uint16(0), Value::null(CMPI_uint16)})),
              "[Done (0), null]");
    const cimple::Value_Name numbers[] = {{"2", "2"}, {"3", "Third"}};
    EXPECT_EQ(namedValueText(numbers, Value::array(CMPI_uint16, {Value::uint16(2), Value::uint16(3)})),
              "[2, Third (3)]");
    const cimple::Value_Name bits[] = {{"0", "Low"}, {"4", "High"}, {"64", "None"}};
    EXPECT_EQ(namedBitsText(bits, Value::array(CMPI_uint8, {Value::uint8(17), Value::uint8(2), Value::uint8(0)})),
              "[Low, High (17), 2, 0]");
}

/// A larger unit is used only where it loses nothing.
TEST(Measures, HaveTheirUnit)
{
    const struct
    {
        const char* unit;
        Value value;
        const char* text;
    } expected[] = {
        {"bit / second", Value::uint64(16'000'000'000), "16 Gbit/s"},
        {"bit / second", Value::uint64(2'500'000'000), "2.5 Gbit/s"},
        {"bit / second", Value::uint64(1'062'500'000), "1062500000 bit/s"},
        {"bit / second", Value::uint64(0), "0 bit/s"},
        {"byte", Value::uint64(1536), "1.5 KiB"},
        {"byte", Value::uint64(1537), "1537 bytes"},
        {"byte", Value::uint64(~0ULL), "18446744073709551615 bytes"},
        {"byte", Value::sint64(-1), "-1 bytes"},
        {"byte", Value::array(CMPI_uint32, {Value::uint32(8), Value::uint32(1024)}), "[8 bytes, 1 KiB]"},
        {"degree celsius", Value::real32(-3.5F), "-3.5 °C"},
        {"hour", Value::uint64(7), "7 hour"},
        {"hour", Value::null(CMPI_uint64), "null"},
    };
    for (const auto& row : expected)
        EXPECT_EQ(measureText(row.unit, row.value), row.text);
}

/// What a class says is looked for from the class upwards, and of the class itself in the class alone.
TEST(SchemaTexts, AreThoseOfTheNearestDeclaration)
{
    ClassInfo network;
    network.name = "CIM_NetworkPort";
    ClassInfo port;
    port.name = "TVRHBA_FCPort";
    port.superclass = &network;
    ClassInfo special;
    special.name = "T_SpecialPort";
    special.superclass = &port;
    EXPECT_EQ(unitOf(special, "maxspeed"), "");
    EXPECT_EQ(unitOf(special, "speed"), "bit / second");
    EXPECT_EQ(valueName(valueNames(special, "LocationIndicator"), Value::uint16(3)), "Off");
    EXPECT_EQ(descriptionOf(special, "FCID"), "The address that the fabric gave the port; 0 without a fabric.");
    EXPECT_NE(descriptionOf(port), "");
    EXPECT_EQ(descriptionOf(special), "");
    ClassInfo service;
    service.name = "TVRHBA_FCHBAWWNService";
    EXPECT_EQ(valueName(valueNames(service, "readwwn", "type"), Value::uint16(2)), "Factory default");
    EXPECT_EQ(bitNames(service, "GetWWNCapability", "WWNCapability").size(), 5U);
    EXPECT_TRUE(bitNames(service, "GetWWNCapability").empty());
}

TEST(Printing, ControlCharactersStayOnTheirLine)
{
    EXPECT_EQ(oneLine("a\tb\nc\x1b[0m\x7f"), "a\\tb\\nc\\x1b[0m\\x7f");
    EXPECT_EQ(oneLine("\xc2\x9b 5 \xc2\xb0 \xff"), "\\xc2\\x9b 5 \xc2\xb0 \\xff");
    EXPECT_EQ(oneLine("a\xe2\x80\xae\xc2\xad日本\xf0\x9f\x98\x80"), "a\\xe2\\x80\\xae\\xc2\\xad日本\xf0\x9f\x98\x80");
    EXPECT_EQ(displayWidth("──é"), 3U);
    std::ostringstream out;
    printJson(out, Json("\xff"));
    EXPECT_EQ(out.str(), "\"\xEF\xBF\xBD\"\n");
}

} // namespace
