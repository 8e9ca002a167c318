#include "tests/module/Changes.h"

#include "simulator/FirmwareFile.h"
#include "tests/module/Describe.h"

namespace module_test
{

using broker::Value;

const char* const changeableHost = R"({
  "targets": [{"name": "t", "wwpn": "5063D20000000001", "units": [{"lun": 0}, {"lun": 3}]}],
  "adapters": [
    {"name": "A", "serialNumber": "S1", "model": "M", "tagging": {"on": true}, "features": {"200": 1},
     "attributes": {"bootCodeEnabled": 1, "diagVersion": 4}, "driverParameters": [{"name": "p", "high": 100}],
     "ports": [{"wwpn": "1000027A000000A0", "targets": ["t"], "beacon": "off",
                "priorityLanes": [{"target": "t", "lun": 3}]}]}]})";

namespace
{

const std::string lane = "Driver:1000027A000000A0:5063D20000000001:0:PrioLane";

const char* const tagTable =
    "<?xml version=\"1.0\"?><CruxConfig><theSystem><CruxVersion>1</CruxVersion><CreationDate>now</CreationDate>"
    "<HostName>h</HostName><Adapter>a<Configuration><numberOfEntries>1</numberOfEntries><Row>"
    "<src_wwpn>1000027A000000A0</src_wwpn><tgt_wwpn>5063D20000000001</tgt_wwpn><tag>9</tag></Row></Configuration>"
    "</Adapter></theSystem></CruxConfig>";

broker::Path laneAs(const std::string& name)
{
    return {"root/tavrin", "TVRHBA_DriverParams", {{"InstanceID", Value::string(name)}}};
}

Change method(const broker::Path& service, const std::string& name, const std::vector<broker::Property>& in)
{
    return {name, [=](broker::Broker& broker)
            {
                const broker::MethodReply reply = broker.invokeMethod(service, name, in);
                const std::string status = broker::statusName(reply.status);
                return reply.ok() ? status + " " + std::to_string(reply.returnValue.asUnsigned()) : status;
            }};
}

Change change(const std::string& name, std::function<CMPIrc(broker::Broker&)> ask)
{
    return {name, [=](broker::Broker& broker) { return std::string(broker::statusName(ask(broker))) + " 0"; }};
}

Value instance(const char* className, const std::vector<broker::Property>& properties)
{
    broker::Object object;
    object.path.className = className;
    object.properties = properties;
    return Value::instance(object);
}

Value list(CMPIType type, const Value::List& values)
{
    return Value::array(type, values);
}

Change diagnose(const broker::Path& port, broker::Path service, const std::string& test,
                std::vector<broker::Property> settings = {})
{
    service.setKey("Name", Value::string("TVR:FCHBA " + test + " Test"));
    settings.push_back({"ManagedElement", Value::reference(port)});
    Change run = method(service, "RunDiagnosticService", settings);
    run.name += " " + test;
    return run;
}

} // namespace

void removeLane(broker::Broker& broker)
{
    broker.deleteInstance(laneAs(lane));
}

std::string changeableFirmware()
{
    return tvrsim::firmwareText("M", "2.0", "program");
}

std::vector<Change> changesOf(Host& host, test_support::FileServer& server)
{
    server.put("/uri.grp", changeableFirmware());
    server.put("/table.xml", tagTable);
    const auto pathOf = [&](const char* className) { return host.instancesOf(className).at(0).path; };
    const broker::Path names = pathOf("TVRHBA_FCHBAWWNService"), boot = pathOf("TVRHBA_BootBIOSService"),
                       software = pathOf("TVRHBA_SoftwareInstallationService"),
                       parameters = pathOf("TVRHBA_FCHBADriverParamService"), tags = pathOf("TVRHBA_FCTagService");
    const broker::Object help = host.instancesOf("TVRHBA_HelpService").at(0);
    const broker::Path test = pathOf("TVRHBA_FCHBADiagnosticTest"), port = pathOf("TVRHBA_PortController");
    const broker::Object setting = host.instancesOf("TVRHBA_ProviderConfigSetting").at(0);
    const broker::Path driverLog = pathOf("TVRHBA_RecordLog"), log = host.instancesOf("TVRHBA_RecordLog").back().path;
    const broker::Property target = {"Target", Value::reference(pathOf("TVRHBA_FCPort"))};
    const broker::Path dumps = pathOf("TVRHBA_DumpService");
    const broker::Property controller = {"Target", Value::reference(port)};
    const broker::Object dumpData = host.instancesOf("TVRHBA_DumpData").at(0);
    Value::List image;
    for (const char byte : changeableFirmware())
        image.push_back(Value::uint8(static_cast<std::uint8_t>(byte)));
    return {
        method(names, "GetWWNCapability", {target}),
        method(names, "ReadWWN", {target, {"Type", Value::uint16(2)}}),
        method(names, "ChangeWWN",
               {target,
                {"NewWWPN", Value::string("1000027A000000A0")},
                {"NewWWNN", Value::string("2000027A000000A0")},
                {"Type", Value::uint16(1)}}),
        method(names, "RestoreWWN", {target, {"Type", Value::uint16(0)}}),
        method(boot, "EnableBootBIOS", {target}),
        method(boot, "DisableBootBIOS", {target}),
        method(boot, "GetBootBIOSStatus", {target}),
        method(software, "InstallFromByteStream",
               {target,
                {"Image", list(CMPI_uint8, image)},
                {"InstallOptions", list(CMPI_uint16, {Value::uint16(32768)})},
                {"InstallOptionsValues", list(CMPI_string, {Value::string("stream.grp")})}}),
        method(software, "InstallFromURI", {target, {"URI", Value::string(server.uri("/uri.grp"))}}),
        method(software, "SetPortEnabled", {target, {"PortEnabled", Value::uint32(1)}}),
        method(software, "GetHBAFeatures", {target}),
        method(parameters, "SetDriverParameter",
               {target, {"strParam", Value::string("p")}, {"strValue", Value::string("7")}}),
        change("create lane",
               [](auto& broker) {
                   return broker.createInstance({laneAs(lane), {{"InstanceID", Value::string(lane)}}}).status;
               }),
        change("delete lane", [](auto& broker) { return broker.deleteInstance(laneAs(lane)).status; }),
        method(parameters, "DisableAllPrioLaneLuns",
               {{"InitiatorWWPN", Value::string("1000027A000000A0")},
                {"TargetWWPN", Value::string("5063D20000000001")},
                {"Option", Value::uint16(0)}}),
        change("modify setting", [setting](auto& broker)
               { return broker.modifyInstance(changed(setting, "current", setting.get("current"))).status; }),
        method(dumps, "GenerateDump", {controller}),
        method(dumps, "GetDumpFileNames", {controller}),
        change("modify dump data", [dumpData](auto& broker)
               { return broker.modifyInstance(changed(dumpData, "RetentionCount", Value::uint32(6))).status; }),
        method(dumps, "DeleteDump", {controller}),
        method(tags, "SetGlobalFlag", {target, {"State", Value::uint32(1)}}),
        method(tags, "GetGlobalFlag", {target}),
        method(tags, "SetConfigTable", {target, {"URI", Value::string(server.uri("/table.xml"))}}),
        method(tags, "GetConfigTable", {target, {"URI", Value::string(server.uri("/out.xml", "joe:se%20cret@"))}}),
        diagnose(port, test, "Host Loopback",
                 {{"DiagnosticSettings", instance("TVRHBA_FCHBADiagnosticSettingData",
                                                  {{"InstanceID", Value::string("TVR:FCHBA Host Loopback Test")},
                                                   {"BufferPattern", list(CMPI_uint8, {Value::uint8('f')})}})},
                  {"JobSettings",
                   instance("TVRHBA_JobSettingData", {{"InstanceID", Value::string("TVR:FCHBA JobSettingData")},
                                                      {"DeleteOnCompletion", Value::boolean(true)}})}}),
        diagnose(port, test, "Status"),
        diagnose(port, test, "Beacon"),
        diagnose(port, test, "D-Port"),
        method(pathOf("TVRHBA_DiagnosticsLog"), "ClearLog", {}),
        method(help.path, "GetHelp",
               {{"RequestedDocument", Value::string(text(help, "Name"))},
                {"Format", Value::uint16(1)},
                {"RequestedDelivery", Value::uint16(1)}}),
        method(log, "SetLogParams",
               {{"LogLevel", Value::uint16(5)},
                {"LogMode", Value::uint16(4)},
                {"TracePath", Value::string((host.root() / "provider.log").string())}}),
        method(log, "RequestStateChange", {{"RequestedState", Value::uint16(2)}}),
        method(driverLog, "RequestStateChange", {{"RequestedState", Value::uint16(2)}}),
        method(driverLog, "ClearLog", {}),
        method(software, "ResetHBA", {target}),
    };
}

} // namespace module_test
