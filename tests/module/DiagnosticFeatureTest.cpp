// The diagnostic tests as a client sees them: what is published of each, what it is joined to, and its help.
#include "broker/values/ValueText.h"
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"
#include "tests/module/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>

using namespace module_test;
using broker::Value;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

struct TestRow
{
    const char* name;
    const char* type;
    const char* testTypes;
    const char* characteristics;
    const char* loops; ///< null for a test without them
    const char* loopControls;
    const char* executionControl;
    const char* overrides; ///< null for none
    const char* mechanism; ///< of a test with a target
    const char* serviceMode;
    const char* description;
};

const char* const buffer = R"({"BufferSize", "BufferPattern"})";

const TestRow tests[] = {
    {"TVR:FCHBA Beacon Test", "2", "{2}", "{0}", "5", "{3, 4}", "{32768}", nullptr, nullptr, "{32768}",
     "Test causes a port's LEDs to flash on and off, allowing the port to be easily visually identified"},
    {"TVR:FCHBA Echo Test", "3", "{3, 5}", "{4, 10}", "100", "{3}", "{1}",
     R"({"TargetDevice", "EchoMechanism", "LUN", "BufferSize", "BufferPattern"})", "EchoMechanism", "{4}",
     "Test verifies the data path from host to target"},
    {"TVR:FCHBA External Loopback Test", "4", "{2, 5}", "{4, 10}", "100", "{2, 3}", "{1}", buffer, nullptr, "{4}",
     "Test verifies that the entire data path through an FCHBA is working properly"},
    {"TVR:FCHBA Host Loopback Test", "5", "{2}", "{4}", "100", "{2, 3}", "{1}", buffer, nullptr, "{4}",
     "Test verifies the FC HBA hostbus interface"},
    {"TVR:FCHBA Internal Loopback Test", "6", "{2}", "{4}", "100", "{2, 3}", "{1}", buffer, nullptr, "{4}",
     "Test verifies the integrity of internal data paths in the FCHBA"},
    {"TVR:FCHBA Ping Test", "7", "{5}", "{4, 10}", "100", "{3}", "{1}",
     R"({"TargetDevice", "PingMechanism", "LUN", "BufferSize", "BufferPattern"})", "PingMechanism", "{4}",
     "Test verifies the existence and accessibility of devices on the SAN"},
    {"TVR:FCHBA Status Test", "10", "{4}", "{0}", nullptr, "{32768}", "{32768}", nullptr, nullptr, "{32768}",
     "Test checks the health of the FCHBA, not including the FC optics"},
    {"TVR:FCHBA Reset Test", "8", "{2}", "{4}", nullptr, "{32768}", "{32768}", nullptr, nullptr, "{32768}",
     "Test causes the FCHBA to re-initialize itself"},
    {"TVR:FCHBA Self Test", "9", "{2}", "{4}", nullptr, "{32768}", "{32768}", nullptr, nullptr, "{32768}",
     "Test allows all components of the FCHBA to be tested"},
    {"TVR:FCHBA D-Port Test", "32769", "{2, 32768}", "{4, 10}", nullptr, "{32768}", "{32768}", nullptr, nullptr,
     "{32768}", "Test allows to identify marginal link level failures"},
};

/// Lines as describe() writes them: those without a value are left out.
using Lines = std::map<std::string, std::string>;

std::string quoted(const std::string& text)
{
    return '"' + text + '"';
}
std::string list(const std::string& text)
{
    return "{" + quoted(text) + "}";
}
std::string written(const Lines& lines)
{
    std::string text = "\n";
    for (const auto& [name, value] : lines)
        text += name + " = " + value + "\n";
    return text;
}

Lines service(const std::string& className, const TestRow& test, const std::string& elementName)
{
    return {{"SystemCreationClassName", quoted("CIM_ComputerSystem")},
            {"SystemName", quoted("tavrin-host.example.net")},
            {"CreationClassName", quoted(className)},
            {"Name", quoted(test.name)},
            {"ElementName", quoted(elementName)}};
}
Lines identified(const TestRow& test, const std::string& suffix)
{
    return {{"InstanceID", quoted(test.name)}, {"ElementName", quoted(test.name + suffix)}};
}

Lines testOf(const TestRow& test)
{
    Lines lines = service("TVRHBA_FCHBADiagnosticTest", test, test.name);
    lines["FCHBATestType"] = test.type;
    lines["TestTypes"] = test.testTypes;
    lines["Characteristics"] = test.characteristics;
    return lines;
}

Lines settingsOf(const TestRow& test)
{
    Lines lines = identified(test, " SettingData");
    lines.merge(Lines{{"OverridedSettingData", "0"},
                      {"HaltOnError", "false"},
                      {"ResultPersistence", "4294967295"},
                      {"LogOptions", "{2, 6}"},
                      {"LogStorage", "{2}"}});
    if (test.loops)
        lines.merge(Lines{{"LoopControl", "{3}"}, {"LoopControlParameter", list(test.loops)}});
    if (test.overrides)
        lines.merge(Lines{{"BufferSizes", "{8}"}, {"BufferPattern", "{49, 97, 50, 98, 51, 99, 52, 100}"}});
    if (test.mechanism)
        lines.merge(
            Lines{{"LUN", "0"}, {"TargetDevice", "\"\""}, {"TargetDeviceFormat", "\"2\""}, {test.mechanism, "2"}});
    return lines;
}

Lines capabilitiesOf(const TestRow& test)
{
    Lines lines = identified(test, " Capabilites");
    lines.merge(Lines{{"SupportedServiceModes", test.serviceMode},
                      {"SupportedLogStorage", "{2}"},
                      {"SupportedLogOptions", "{2, 6}"},
                      {"SupportedLoopControl", test.loopControls},
                      {"SupportedExecutionControls", test.executionControl}});
    if (test.overrides)
        lines["OtherSupportedExecutionControlsDescriptions"] = test.overrides;
    return lines;
}

Lines helpOf(const TestRow& test)
{
    Lines lines = service("TVRHBA_HelpService", test, test.name + std::string(" HelpService"));
    lines.merge(Lines{{"DeliveryOptions", "{1}"},
                      {"OtherDeliveryOptionDescription", "\"String\""},
                      {"DocumentFormat", "{1}"},
                      {"OtherDocumentFormatDescription", "\"String\""},
                      {"DocumentsAvailable", list(test.name)},
                      {"DocumentDescriptions", list(test.description)}});
    return lines;
}

Lines identityOf(const TestRow& test)
{
    Lines lines = identified(test, " DiagnosticIdentity");
    lines.merge(Lines{{"Name", quoted(test.name)},
                      {"MajorVersion", "1"},
                      {"MinorVersion", "3"},
                      {"RevisionNumber", "1"},
                      {"VersionString", "\"1.3.1\""},
                      {"Manufacturer", "\"Tavrin Corporation\""},
                      {"Classifications", "{7}"},
                      {"ClassificationDescriptions", "{\"TVR: FCHBA Diagnostics\"}"},
                      {"Description", "\"TVR FCHBA Diagnostics\""},
                      {"IsEntity", "true"},
                      {"IdentityInfoValue", list(test.name)},
                      {"IdentityInfoType", "{\"TAVRIN:DIAGNOSTICS_NAME\"}"}});
    return lines;
}

Lines logOf(const TestRow& test)
{
    Lines lines = identified(test, " DiagnosticLog");
    lines.merge(Lines{{"Description", "\"TVRHBA_DiagnosticsLog represents the logs for FCHBA CDM tests\""},
                      {"MaxNumberOfRecords", "200"},
                      {"CurrentNumberOfRecords", "0"},
                      {"OperationalStatus", "{2}"},
                      {"HealthState", "5"}});
    return lines;
}

std::vector<std::string> described(Host& host, const std::string& className)
{
    std::vector<std::string> all;
    for (broker::Object object : host.instancesOf(className))
    {
        if (const Value released = object.get("ReleaseDate"); !released.isNull())
        {
            EXPECT_EQ(broker::mofValue(released).substr(0, 9), "\"20261122");
            std::erase_if(object.properties, [](const auto& property) { return property.name == "ReleaseDate"; });
        }
        all.push_back(describe(object));
    }
    return all;
}

TEST(DiagnosticFeature, EachTestHasTheseInstances)
{
    setHostNames({});
    Host host;
    host.options.personality.schemaDefaults = false; // what the module leaves null stays null
    const std::initializer_list<std::pair<const char*, Lines (*)(const TestRow&)>> classes = {
        {"TVRHBA_FCHBADiagnosticTest", testOf},
        {"TVRHBA_FCHBADiagnosticSettingData", settingsOf},
        {"TVRHBA_FCHBADiagnosticServiceCapabilities", capabilitiesOf},
        {"TVRHBA_HelpService", helpOf},
        {"TVRHBA_DiagnosticIdentity", identityOf},
        {"TVRHBA_DiagnosticsLog", logOf},
    };
    for (const auto& [className, linesOf] : classes)
    {
        std::vector<std::string> expected;
        for (const TestRow& test : tests)
            expected.push_back(written(linesOf(test)));
        EXPECT_EQ(described(host, className), expected) << className;
    }
    EXPECT_THAT(described(host, "TVRHBA_JobSettingData"), ElementsAre(R"(
DeleteOnCompletion = false
ElementName = "TVR:FCHBA JobSettingData"
InstanceID = "TVR:FCHBA JobSettingData"
)"));
    host.unload();
}

// --- associations

/// What stands at an end of an association for a test.
using End = std::string (*)(const TestRow& test);

std::string weakPath(const std::string& className, const TestRow& test)
{
    return "root/tavrin:" + className + ".Name=\"" + test.name +
           "\",SystemCreationClassName=\"CIM_ComputerSystem\",SystemName=\"tavrin-host.example.net\","
           "CreationClassName=\"" +
           className + "\"";
}
template <const auto& className> std::string weak(const TestRow& test)
{
    return weakPath(className, test);
}
template <const auto& className> std::string idPath(const TestRow& test)
{
    return std::string("root/tavrin:") + className + ".InstanceID=\"" + test.name + "\"";
}
constexpr char testClass[] = "TVRHBA_FCHBADiagnosticTest", helpClass[] = "TVRHBA_HelpService",
               settingsClass[] = "TVRHBA_FCHBADiagnosticSettingData",
               capabilitiesClass[] = "TVRHBA_FCHBADiagnosticServiceCapabilities",
               identityClass[] = "TVRHBA_DiagnosticIdentity", logClass[] = "TVRHBA_DiagnosticsLog";

constexpr End theTest = weak<testClass>, help = weak<helpClass>, settings = idPath<settingsClass>,
              capabilities = idPath<capabilitiesClass>, identity = idPath<identityClass>, log = idPath<logClass>;
constexpr End jobSettings = [](const TestRow&)
{ return std::string(R"(root/tavrin:TVRHBA_JobSettingData.InstanceID="TVR:FCHBA JobSettingData")"); };
constexpr End profile = [](const TestRow&)
{ return std::string(R"(root/pg_interop:TVRHBA_RegisteredProfile.InstanceID="TVR:FCHBA Diagnostics")"); };
constexpr End computerSystem = [](const TestRow&)
{
    return std::string(
        R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")");
};

std::string controllerPath(const std::string& wwpn)
{
    return "root/tavrin:TVRHBA_PortController.SystemCreationClassName=\"CIM_ComputerSystem\",SystemName="
           "\"tavrin-host.example.net\",CreationClassName=\"TVRHBA_PortController\",DeviceID=\"" +
           wwpn + "\"";
}

const char* const ports[] = {"1000027A51160210", "1000027A51160211", "1000027A51320240", "1000027A51320241"};

struct AssociationRow
{
    const char* className;
    const char* firstRole;
    End first;
    const char* secondRole;
    End second;
    Lines more = {};
};

const AssociationRow associations[] = {
    {"TVRHBA_DiagElementSettingData", "ManagedElement", theTest, "SettingData", settings, {{"IsDefault", "1"}}},
    {"TVRHBA_DiagElementCapabilities", "ManagedElement", theTest, "Capabilities", capabilities},
    {"TVRHBA_ServiceAvailableToElement", "ServiceProvided", help, "UserOfService", theTest},
    {"TVRHBA_DiagElementSoftwareIdentity",
     "Antecedent",
     identity,
     "Dependent",
     theTest,
     {{"ElementSoftwareStatus", "{2, 6}"}}},
    {"TVRHBA_JobElementSettingData", "ManagedElement", theTest, "SettingData", jobSettings, {{"IsDefault", "1"}}},
    {"TVRHBA_UseOfLog", "Antecedent", log, "Dependent", theTest},
    {"TVRHBA_DiagServiceConformsToProfile", "ConformantStandard", profile, "ManagedElement", theTest},
    {"TVRHBA_DiagHostedService", "Antecedent", computerSystem, "Dependent", theTest},
    {"TVRHBA_HostedService", "Antecedent", computerSystem, "Dependent", help},
};

TEST(DiagnosticFeature, AssociationsJoinTheseInstances)
{
    setHostNames({});
    Host host;
    host.options.personality.schemaDefaults = false; // what the module leaves null stays null
    for (const AssociationRow& row : associations)
    {
        std::vector<std::string> expected;
        for (const TestRow& test : tests)
        {
            Lines lines = {{row.firstRole, row.first(test)}, {row.secondRole, row.second(test)}};
            lines.insert(row.more.begin(), row.more.end());
            expected.push_back(written(lines));
        }
        EXPECT_EQ(described(host, row.className), expected) << row.className;
    }
    std::vector<std::string> available, affects;
    for (const TestRow& test : tests)
        for (const char* wwpn : ports)
        {
            available.push_back(written({{"ServiceProvided", theTest(test)},
                                         {"UserOfService", controllerPath(wwpn)},
                                         {"EstimatedDurationOfService", "0"}}));
            affects.push_back(written({{"AffectedElement", controllerPath(wwpn)},
                                       {"AffectingElement", theTest(test)},
                                       {"ElementEffects", "{5}"}}));
        }
    EXPECT_EQ(described(host, "TVRHBA_AvailableDiagnosticService"), available);
    EXPECT_EQ(described(host, "TVRHBA_ServiceAffectsElement"), affects);
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
