// The diagnostic tests as a client sees them: what is published of each, what it is joined to, and its help.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"
#include "tests/module/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <span>
#include <sstream>

using namespace module_test;
using broker::Value;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

/// The facts of a test by the names that the texts below have for them.
using Facts = std::map<std::string, std::string>;

Facts facts(const char* name, const char* type, const char* testTypes, const char* characteristics, const char* loops,
            const char* loopControls, const char* executionControl, const char* overrides, const char* serviceMode,
            const char* description)
{
    return {{"name", name},
            {"type", type},
            {"types", testTypes},
            {"characteristics", characteristics},
            {"loops", loops},
            {"controls", loopControls},
            {"execution", executionControl},
            {"overrides", overrides},
            {"mode", serviceMode},
            {"description", description},
            {"echo", std::string(overrides).find("Echo") != std::string::npos ? "2" : ""},
            {"ping", std::string(overrides).find("Ping") != std::string::npos ? "2" : ""},
            {"target", std::string(overrides).find("Target") != std::string::npos ? "2" : ""}};
}

const char* const buffer = R"({"BufferSize", "BufferPattern"})";

const Facts tests[] = {
    facts("TVR:FCHBA Beacon Test", "2", "{2}", "{0}", "5", "{3, 4}", "{32768}", "", "{32768}",
          "Test causes a port's LEDs to flash on and off, allowing the port to be easily visually identified"),
    facts("TVR:FCHBA Echo Test", "3", "{3, 5}", "{4, 10}", "100", "{3}", "{1}",
          R"({"TargetDevice", "EchoMechanism", "LUN", "BufferSize", "BufferPattern"})", "{4}",
          "Test verifies the data path from host to target"),
    facts("TVR:FCHBA External Loopback Test", "4", "{2, 5}", "{4, 10}", "100", "{2, 3}", "{1}", buffer, "{4}",
          "Test verifies that the entire data path through an FCHBA is working properly"),
    facts("TVR:FCHBA Host Loopback Test", "5", "{2}", "{4}", "100", "{2, 3}", "{1}", buffer, "{4}",
          "Test verifies the FC HBA hostbus interface"),
    facts("TVR:FCHBA Internal Loopback Test", "6", "{2}", "{4}", "100", "{2, 3}", "{1}", buffer, "{4}",
          "Test verifies the integrity of internal data paths in the FCHBA"),
    facts("TVR:FCHBA Ping Test", "7", "{5}", "{4, 10}", "100", "{3}", "{1}",
          R"({"TargetDevice", "PingMechanism", "LUN", "BufferSize", "BufferPattern"})", "{4}",
          "Test verifies the existence and accessibility of devices on the SAN"),
    facts("TVR:FCHBA Status Test", "10", "{4}", "{0}", "", "{32768}", "{32768}", "", "{32768}",
          "Test checks the health of the FCHBA, not including the FC optics"),
    facts("TVR:FCHBA Reset Test", "8", "{2}", "{4}", "", "{32768}", "{32768}", "", "{32768}",
          "Test causes the FCHBA to re-initialize itself"),
    facts("TVR:FCHBA Self Test", "9", "{2}", "{4}", "", "{32768}", "{32768}", "", "{32768}",
          "Test allows all components of the FCHBA to be tested"),
    facts("TVR:FCHBA D-Port Test", "32769", "{2, 32768}", "{4, 10}", "", "{32768}", "{32768}", "", "{32768}",
          "Test allows to identify marginal link level failures"),
};

/// The properties of the class's instance for each test, or for each test and <port>. <fact> stands for a fact of the
/// test, <fact?> for nothing; a line with a fact that the test does not have is left out. All else is null.
struct ClassRow
{
    const char* className;
    const char* properties;
};

const ClassRow classes[] = {
    {"TVRHBA_FCHBADiagnosticTest", R"(
<system>
CreationClassName = "TVRHBA_FCHBADiagnosticTest"
Name = "<name>"
ElementName = "<name>"
FCHBATestType = <type>
TestTypes = <types>
Characteristics = <characteristics>)"},
    {"TVRHBA_FCHBADiagnosticSettingData", R"(
InstanceID = "<name>"
ElementName = "<name> SettingData"
OverridedSettingData = 0
HaltOnError = false
ResultPersistence = 4294967295
LogOptions = {2, 6}
LogStorage = {2}
LoopControl = {3}<loops?>
LoopControlParameter = {"<loops>"}
BufferSizes = {8}<overrides?>
BufferPattern = {49, 97, 50, 98, 51, 99, 52, 100}<overrides?>
LUN = 0<target?>
TargetDevice = ""<target?>
TargetDeviceFormat = "<target>"
EchoMechanism = <echo>
PingMechanism = <ping>)"},
    {"TVRHBA_FCHBADiagnosticServiceCapabilities", R"(
InstanceID = "<name>"
ElementName = "<name> Capabilites"
SupportedServiceModes = <mode>
SupportedLogStorage = {2}
SupportedLogOptions = {2, 6}
SupportedLoopControl = <controls>
SupportedExecutionControls = <execution>
OtherSupportedExecutionControlsDescriptions = <overrides>)"},
    {"TVRHBA_HelpService", R"(
<system>
CreationClassName = "TVRHBA_HelpService"
Name = "<name>"
ElementName = "<name> HelpService"
DeliveryOptions = {1}
OtherDeliveryOptionDescription = "String"
DocumentFormat = {1}
OtherDocumentFormatDescription = "String"
DocumentsAvailable = {"<name>"}
DocumentDescriptions = {"<description>"})"},
    {"TVRHBA_DiagnosticIdentity", R"(
InstanceID = "<name>"
Name = "<name>"
ElementName = "<name> DiagnosticIdentity"
MajorVersion = 1
MinorVersion = 3
RevisionNumber = 1
VersionString = "1.3.1"
Manufacturer = "Tavrin Corporation"
Classifications = {7}
ClassificationDescriptions = {"TVR: FCHBA Diagnostics"}
Description = "TVR FCHBA Diagnostics"
IsEntity = true
IdentityInfoValue = {"<name>"}
IdentityInfoType = {"TAVRIN:DIAGNOSTICS_NAME"})"},
    {"TVRHBA_DiagnosticsLog", R"(
InstanceID = "<name>"
ElementName = "<name> DiagnosticLog"
Description = "TVRHBA_DiagnosticsLog represents the logs for FCHBA CDM tests"
MaxNumberOfRecords = 200
CurrentNumberOfRecords = 0
OperationalStatus = {2}
HealthState = 5)"},
    {"TVRHBA_DiagElementSettingData", R"(
ManagedElement = <test>
SettingData = root/tavrin:TVRHBA_FCHBADiagnosticSettingData.InstanceID="<name>"
IsDefault = 1)"},
    {"TVRHBA_DiagElementCapabilities", R"(
ManagedElement = <test>
Capabilities = root/tavrin:TVRHBA_FCHBADiagnosticServiceCapabilities.InstanceID="<name>")"},
    {"TVRHBA_ServiceAvailableToElement", R"(
ServiceProvided = <help>
UserOfService = <test>)"},
    {"TVRHBA_DiagElementSoftwareIdentity", R"(
Antecedent = root/tavrin:TVRHBA_DiagnosticIdentity.InstanceID="<name>"
Dependent = <test>
ElementSoftwareStatus = {2, 6})"},
    {"TVRHBA_JobElementSettingData", R"(
ManagedElement = <test>
SettingData = root/tavrin:TVRHBA_JobSettingData.InstanceID="TVR:FCHBA JobSettingData"
IsDefault = 1)"},
    {"TVRHBA_UseOfLog", R"(
Antecedent = root/tavrin:TVRHBA_DiagnosticsLog.InstanceID="<name>"
Dependent = <test>)"},
    {"TVRHBA_AvailableDiagnosticService", R"(
ServiceProvided = <test>
UserOfService = <port>
EstimatedDurationOfService = 0)"},
    {"TVRHBA_ServiceAffectsElement", R"(
AffectedElement = <port>
AffectingElement = <test>
ElementEffects = {5})"},
    {"TVRHBA_DiagServiceConformsToProfile", R"(
ConformantStandard = root/pg_interop:TVRHBA_RegisteredProfile.InstanceID="TVR:FCHBA Diagnostics"
ManagedElement = <test>)"},
    {"TVRHBA_DiagHostedService", R"(
Antecedent = <host>
Dependent = <test>)"},
    {"TVRHBA_HostedService", R"(
Antecedent = <host>
Dependent = <help>)"},
};

// What all tests share of it: paths, and the keys of a service.
const Facts common = {
    {"system", "SystemCreationClassName = \"CIM_ComputerSystem\"\nSystemName = \"tavrin-host.example.net\""},
    {"host", R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")"},
    {"test", R"(root/tavrin:TVRHBA_FCHBADiagnosticTest.Name="<name>",SystemCreationClassName="CIM_ComputerSystem",)"
             R"(SystemName="tavrin-host.example.net",CreationClassName="TVRHBA_FCHBADiagnosticTest")"},
    {"help", R"(root/tavrin:TVRHBA_HelpService.Name="<name>",SystemCreationClassName="CIM_ComputerSystem",)"
             R"(SystemName="tavrin-host.example.net",CreationClassName="TVRHBA_HelpService")"},
    {"port", R"(root/tavrin:TVRHBA_PortController.SystemCreationClassName="CIM_ComputerSystem",)"
             R"(SystemName="tavrin-host.example.net",CreationClassName="TVRHBA_PortController",DeviceID="<wwpn>")"},
};
const char* const ports[] = {"1000027A51160210", "1000027A51160211", "1000027A51320240", "1000027A51320241"};

/// A line with its facts in place; empty where one is missing.
std::string filled(std::string line, const Facts& known)
{
    for (std::size_t begin; (begin = line.find('<')) != line.npos;)
    {
        const std::size_t end = line.find('>', begin);
        std::string name = line.substr(begin + 1, end - begin - 1);
        const bool asked = name.back() == '?';
        if (asked)
            name.pop_back();
        const std::string& value = known.at(name);
        if (value.empty())
            return "";
        line.replace(begin, end - begin + 1, asked ? "" : value);
    }
    return line;
}

/// Lines that are there, in the order of their texts.
std::string sorted(const std::string& text)
{
    std::istringstream stream(text);
    std::vector<std::string> lines;
    for (std::string line; std::getline(stream, line);)
        if (!line.empty())
            lines.push_back(line + "\n");
    std::sort(lines.begin(), lines.end());
    std::string all;
    for (const std::string& line : lines)
        all += line;
    return all;
}

std::string expected(const ClassRow& row, Facts known)
{
    known.insert(common.begin(), common.end());
    std::istringstream stream(row.properties);
    std::string text;
    for (std::string line; std::getline(stream, line);)
        text += filled(line, known) + "\n";
    return sorted(text);
}

TEST(DiagnosticFeature, EachTestHasTheseInstancesAndAssociations)
{
    setHostNames({});
    Host host;
    host.options.personality.schemaDefaults = false; // what the module leaves null stays null
    for (const ClassRow& row : classes)
    {
        const bool ofPorts = std::string(row.properties).find("<port>") != std::string::npos;
        std::vector<std::string> all, actual;
        for (Facts test : tests)
            for (const char* port : std::span(ports).first(ofPorts ? std::size(ports) : 1))
            {
                test["wwpn"] = port;
                all.push_back(expected(row, test));
            }
        for (broker::Object object : host.instancesOf(row.className))
        {
            const bool dated = std::erase_if(object.properties, [](const broker::Property& property)
                                             { return property.name == "ReleaseDate" && !property.value.isNull(); });
            EXPECT_EQ(dated, std::string(row.className) == "TVRHBA_DiagnosticIdentity");
            actual.push_back(sorted(describe(object)));
        }
        EXPECT_EQ(actual, all) << row.className;
    }
    EXPECT_EQ(describe(host.instancesOf("TVRHBA_JobSettingData").at(0)), R"(
DeleteOnCompletion = false
ElementName = "TVR:FCHBA JobSettingData"
InstanceID = "TVR:FCHBA JobSettingData"
)");
    EXPECT_THAT(host.instancesOf("TVRHBA_JobSettingData"), testing::SizeIs(1));
    EXPECT_THAT(logAbout(host, {"FCHBA ManagedElement", "DiagHostService", " DiagVersion"}),
                ElementsAre("[TVR_DBG] Number of FCHBA ManagedElement : 4", "[TVR_DBG] DiagVersion: [ 3 ]",
                            "[TVR_DBG] Updating the CDM DiagHostService profile "));
    host.unload();
}

// --- hosts that do not have it all

TEST(DiagnosticFeature, AHostWithoutPortsHasNone)
{
    Host host("empty");
    EXPECT_THAT(host.instancesOf("TVRHBA_FCHBADiagnosticTest"), IsEmpty());
    EXPECT_THAT(
        logAbout(host, {"Diagnos"}),
        testing::IsSupersetOf({"[TVR_DBG] Unable to create the FCHBA Diagnostic feature, No managed element exist",
                               "[TVR_DBG] FCHBA Diagnositcss either Not Supported/Failed to Create the feature"}));
    host.unload();
}

TEST(DiagnosticFeature, PortsWithoutTheFeatureHaveNoDPortTest)
{
    Host host;
    host.addFault(R"({"function": "LRM_GetHBAFeature", "subject": "1000027A51160211", "status": 2})");
    host.addFault(R"({"function": "LRM_GetHBAFeature", "subject": "1000027A51320240", "hostile": "allOnes"})");
    host.addFault(R"({"function": "LRM_GetHBAAttributes", "subject": "1000027A51160210", "from": 2, "status": 1})");
    std::vector<std::string> offered;
    for (const broker::Object& object : host.instancesOf("TVRHBA_AvailableDiagnosticService"))
        if (object.get("ServiceProvided").asPath().key("Name")->asString() == "TVR:FCHBA D-Port Test")
            offered.push_back(object.get("UserOfService").asPath().key("DeviceID")->asString());
    EXPECT_THAT(offered, ElementsAre("1000027A51160210", "1000027A51320241"));
    EXPECT_THAT(host.instancesOf("TVRHBA_FCHBADiagnosticTest"), testing::SizeIs(10));
    for (const char* className : {"TVRHBA_AvailableDiagnosticService", "TVRHBA_ServiceAffectsElement"})
        EXPECT_THAT(host.instancesOf(className), testing::SizeIs(38)) << className;
    EXPECT_THAT(logAbout(host, {"Tag:200", "DPort", "GetDiagnosticVersion"}),
                ElementsAre("[TVR_ERR] GetDiagnosticVersion:RM_GetHBAAttributes call failed (1)",
                            "[TVR_ERR] Tag:200 not supported for Port 1000027A51160211",
                            "[TVR_WARN] DPort not supported on this port: 1000027A51160211",
                            "[TVR_ERR] Tag:200 not supported for Port 1000027A51320240",
                            "[TVR_WARN] DPort not supported on this port: 1000027A51320240"));
    EXPECT_EQ(text(host.instancesOf("TVRHBA_DiagnosticIdentity").at(0), "VersionString"), "1.0.1");
    host.unload();
}

// --- methods

TEST(DiagnosticFeature, HelpIsTheDescriptionOfTheTest)
{
    ServiceHost host("TVRHBA_HelpService", "default");
    struct Row
    {
        Value document, format, delivery;
        std::uint64_t value;
        std::vector<std::string> lines = {};
    };
    const Value status = Value::string("TVR:FCHBA Status Test"), one = Value::uint16(1), two = Value::uint16(2);
    const std::string invalid = "[TVR_DBG] Invalid Requested Document";
    const std::string unsupported = "[TVR_DBG] Unsupported Delivery options, Use '1' for proper support";
    const auto ask = [&](const Row& row)
    {
        return host.call(
            "GetHelp", "[TVR_DBG] TVRHBA_HelpService_Provider::GetHelp",
            {{"RequestedDocument", row.document}, {"Format", row.format}, {"RequestedDelivery", row.delivery}});
    };
    host.service = theOne(host, "TVRHBA_HelpService", "Name", "TVR:FCHBA Status Test").path;
    for (const Row& row : std::initializer_list<Row>{{status, one, one, 0},
                                                     {status, one, two, 5, {unsupported}},
                                                     {status, two, one, 5, {unsupported}},
                                                     {Value::string("TVR:FCHBA Self Test"), one, one, 4},
                                                     {Value::string(""), two, two, 4},
                                                     {{}, one, one, 5, {invalid}},
                                                     {status, {}, one, 5, {invalid}},
                                                     {status, one, {}, 5, {invalid}}})
    {
        const Answer answer = ask(row);
        EXPECT_EQ(answer.value, row.value);
        EXPECT_EQ(answer.lines, row.lines);
        EXPECT_EQ(answer.text("DocumentInfo"),
                  row.value == 0 ? "Test checks the health of the FCHBA, not including the FC optics" : "");
    }
    host.service.setKey("Name", Value::string("another"));
    const Answer answer = ask({status, one, one, 0});
    EXPECT_EQ(answer.value, 5u);
    EXPECT_THAT(answer.lines, ElementsAre("[TVR_DBG] Invalid instance of Help Service"));
    host.unload();
}

TEST(DiagnosticFeature, LogsAreCleared)
{
    ServiceHost host("TVRHBA_DiagnosticsLog", "default");
    const auto clear = [&] { return host.call("ClearLog", "[TVR_DBG] TVRHBA_DiagnosticsLog_Provider::ClearLog", {}); };
    Answer answer = clear();
    EXPECT_EQ(answer.value, 0u);
    EXPECT_THAT(answer.lines, ElementsAre("[TVR_DBG] Exiting the TVRHBA CDM Clear log",
                                          "[TVR_DBG] Exiting TVRHBA_DiagnosticsLog_Provider::ClearLog"));
    host.service.setKey("InstanceID", Value::string("another"));
    answer = clear();
    EXPECT_EQ(answer.value, 5u);
    EXPECT_THAT(answer.lines, ElementsAre("[TVR_DBG] Invalid instance of Diagnostic Log"));
    host.unload();
}

} // namespace
