// The parameters of the Fibre Channel driver: those of each port and those for all adapters, as they are now.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

const char* const names[] = {"lun-queue-depth", "adapter-queue-depth", "link-speed", "topology",
                             "link-timeout",    "device-timeout",      "npiv",       "fabric-management",
                             "log-verbose"};
const std::string ports[] = {"1000027A51160210", "1000027A51160211", "1000027A51320240", "1000027A51320241"};

const std::string service = "root/tavrin:TVRHBA_FCHBADriverParamService.Name=\"TVRHBA_FCHBADriverParamService\","
                            "SystemCreationClassName=\"CIM_ComputerSystem\",SystemName=\"tavrin-host.example.net\","
                            "CreationClassName=\"TVRHBA_FCHBADriverParamService\"";

std::vector<std::string> texts(Host& host, const std::string& className, const std::string& property)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf(className))
        all.push_back(text(object, property));
    return all;
}

std::vector<std::string> idsOf(const std::vector<std::string>& of)
{
    std::vector<std::string> ids;
    for (const std::string& port : of)
        for (const char* name : names)
            ids.push_back(port + ":" + name);
    return ids;
}

std::uint64_t current(Host& host, const std::string& className, const std::string& id)
{
    return theOne(host, className, "InstanceID", id).get("current").asUnsigned();
}

/// The parameters that the associations of a class refer to.
std::vector<std::string> settingsOf(Host& host, const std::string& association)
{
    std::vector<std::string> ids;
    for (const broker::Object& object : host.instancesOf(association))
        ids.push_back(object.get("SettingData").asPath().key("InstanceID")->asString());
    return ids;
}

TEST(DriverParameters, AreThoseOfEachPortAndThoseForAll)
{
    setHostNames({});
    Host host;
    EXPECT_THAT(texts(host, "TVRHBA_DriverParams", "InstanceID"),
                ElementsAreArray(idsOf({std::begin(ports), std::end(ports)})));
    EXPECT_EQ(describe(theOne(host, "TVRHBA_DriverParams", "InstanceID", "1000027A51320241:device-timeout")), R"(
Caption = "FC driver parameter"
ChangeableType = 2
Description = "Seconds until commands fail to a device that has gone"
ElementName = "device-timeout"
InstanceID = "1000027A51320241:device-timeout"
current = 10
def = 30
deviceID = "1000027a51320241"
dynamic = 1
exportFlag = 1
help = "Seconds until commands fail to a device that has gone"
highRange = 255
lowRange = 0
paramname = "device-timeout"
paramno = 5
)");
    EXPECT_THAT(texts(host, "TVRHBA_DriverParamGlobal", "InstanceID"),
                ElementsAre("Global:lun-queue-depth", "Global:device-timeout", "Global:log-verbose"));
    EXPECT_EQ(describe(theOne(host, "TVRHBA_DriverParamGlobal", "InstanceID", "Global:log-verbose")), R"(
Caption = "FC driver parameter"
ChangeableType = 2
Description = "Bit mask of what the driver logs"
ElementName = "log-verbose"
InstanceID = "Global:log-verbose"
current = 0
dynamic = 1
exportFlag = 0
glbl = 0
help = "Bit mask of what the driver logs"
highRange = 4294967295
lowRange = 0
paramname = "log-verbose"
paramno = 2
)");
    host.unload();
}

TEST(DriverParameters, AreSettingsOfTheServiceAndOfTheirPorts)
{
    setHostNames({});
    Host host;
    const std::vector<std::string> ids = idsOf({std::begin(ports), std::end(ports)});
    for (const char* association : {"TVRHBA_DriverServiceElementSettingData", "TVRHBA_DriverParameterAffectsFCPort"})
        EXPECT_THAT(settingsOf(host, association), ElementsAreArray(ids));

    const auto of = [&](const std::string& association, const std::string& id)
    {
        for (const broker::Object& object : host.instancesOf(association))
            if (object.get("SettingData").asPath().key("InstanceID")->asString() == id)
                return describe(object);
        return std::string();
    };
    const std::string flags = "IsMaximum = 0\nIsMinimum = 0\nIsPending = 0\n";
    EXPECT_EQ(of("TVRHBA_DriverServiceElementSettingData", "1000027A51160210:npiv"),
              "\nIsCurrent = 1\nIsDefault = 1\n" + flags + "ManagedElement = " + service +
                  "\nSettingData = root/tavrin:TVRHBA_DriverParams.InstanceID=\"1000027A51160210:npiv\"\n");
    EXPECT_EQ(of("TVRHBA_DriverParameterAffectsFCPort", "1000027A51320241:device-timeout"),
              "\nIsCurrent = 1\nIsDefault = 2\n" + flags +
                  "ManagedElement = root/tavrin:TVRHBA_FCPort.SystemCreationClassName=\"CIM_ComputerSystem\","
                  "SystemName=\"tavrin-host.example.net\",CreationClassName=\"TVRHBA_FCPort\","
                  "DeviceID=\"1000027A51320241\"\n"
                  "SettingData = root/tavrin:TVRHBA_DriverParams.InstanceID=\"1000027A51320241:device-timeout\"\n");
    EXPECT_EQ(of("TVRHBA_GlobalDriverServiceElementSettingData", "Global:device-timeout"),
              "\nIsCurrent = 1\nIsDefault = 2\n" + flags + "ManagedElement = " + service +
                  "\nSettingData = root/tavrin:TVRHBA_DriverParamGlobal.InstanceID=\"Global:device-timeout\"\n");
    host.unload();
}

TEST(DriverParameters, RefreshLogsEachParameter)
{
    Host host;
    host.instancesOf("TVRHBA_Card");
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.logged("[TVR_DBG] TVR_MethodWrapper::tvrcimGetDriverParam()"), 5u);
    EXPECT_EQ(host.logged("[TVR_DBG] number of driver parameters 9"), 4u);
    EXPECT_EQ(host.logged("[TVR_DBG] saving the values of driver parameter 8"), 4u);
    EXPECT_THAT(logAbout(host, {"RM_GetDriverParamsGlobal", "number of driver parameters 3", "Done with the Driver"}),
                ElementsAre("[TVR_DBG] RM_GetDriverParamsGlobal: status=0", "[TVR_DBG] number of driver parameters 3",
                            "[TVR_DBG] Done with the Driver Parameter fetching"));
    host.unload();
}

// --- live

TEST(DriverParameters, ShowWhatTheyAreNow)
{
    Host host;
    const std::string id = ports[0] + ":link-timeout";
    EXPECT_EQ(current(host, "TVRHBA_DriverParams", id), 30u);
    host.setDriverParameter(ports[0].c_str(), "link-timeout", 45);
    host.setDriverParameter(nullptr, "log-verbose", 7);
    EXPECT_EQ(current(host, "TVRHBA_DriverParams", id), 45u);
    EXPECT_EQ(current(host, "TVRHBA_DriverParams", ports[1] + ":link-timeout"), 30u);
    EXPECT_EQ(current(host, "TVRHBA_DriverParamGlobal", "Global:log-verbose"), 7u);

    // A get sees it too, and the associations lead to it.
    const broker::Object parameter = theOne(host, "TVRHBA_DriverParams", "InstanceID", id);
    const broker::Reply got = host.broker().getInstance(parameter.path);
    ASSERT_THAT(got.objects, SizeIs(1)) << got.message;
    EXPECT_EQ(got.objects[0].get("current").asUnsigned(), 45u);
    for (const char* association : {"TVRHBA_DriverServiceElementSettingData", "TVRHBA_DriverParameterAffectsFCPort"})
    {
        EXPECT_THAT(settingsOf(host, association), ElementsAreArray(idsOf({std::begin(ports), std::end(ports)})));
        const broker::Reply ends = host.broker().associators(parameter.path, {.assocClass = association});
        EXPECT_THAT(ends.objects, SizeIs(1)) << association << ": " << ends.message;
    }
    EXPECT_EQ(host.logged("[TVR_INFO]  Entering BuildCimpleInfo()") > 1, true);
    EXPECT_EQ(host.logged("[TVR_DBG] Done with the Driver Parameter fetching"), 1u); // all this is one refresh
    host.unload();
}

struct FaultRow
{
    const char* fault; ///< added after the first refresh
    const char* line;
    std::uint64_t ofPort; ///< value of a parameter of the port with the fault after its change from 30 to 45
    std::uint64_t forAll; ///< the same of one for all adapters, from 0 to 7
};

const FaultRow faults[] = {
    {R"({"function": "LRM_GetDriverParams", "subject": "1000027A51160210", "status": 4})",
     "[TVR_DBG] RM_GetDriverParams:failed", 30, 7},
    {R"({"function": "LRM_GetDriverParams", "subject": "1000027A51160210", "status": 191, "to": 1})",
     "[TVR_DBG] RM_GetDriverParams: status=191", 45, 7},
    {R"({"function": "LRM_GetDriverParams", "subject": "1000027A51160210", "status": 7, "to": 2})",
     "[TVR_DBG] RM_GetDriverParams:failed", 30, 7},
    {R"({"function": "LRM_GetDriverParamsGlobal", "status": 4})",
     "[TVR_DBG] ERROR: tvrcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed (a) (4)", 45, 0},
    {R"({"function": "LRM_GetDriverParamsGlobal", "status": 7, "to": 2})",
     "[TVR_DBG] ERROR: tvrcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed (b) (7)", 45, 0},
};

TEST(DriverParameters, StayWhereTheLibraryFails)
{
    for (const FaultRow& row : faults)
    {
        Host host;
        EXPECT_THAT(host.instancesOf("TVRHBA_DriverParams"), SizeIs(36));
        host.addFault(row.fault);
        host.setDriverParameter(ports[0].c_str(), "link-timeout", 45);
        host.setDriverParameter(ports[3].c_str(), "link-timeout", 45);
        host.setDriverParameter(nullptr, "log-verbose", 7);
        std::vector<std::uint64_t> values;
        const std::vector<broker::Object> parameters = host.instancesOf("TVRHBA_DriverParams");
        for (const broker::Object& object : parameters)
            if (text(object, "paramname") == "link-timeout")
                values.push_back(object.get("current").asUnsigned());
        EXPECT_THAT(values, ElementsAre(row.ofPort, 30, 30, 45)) << row.fault;
        EXPECT_THAT(settingsOf(host, "TVRHBA_DriverParameterAffectsFCPort"),
                    ElementsAreArray(idsOf({std::begin(ports), std::end(ports)})));
        EXPECT_EQ(current(host, "TVRHBA_DriverParamGlobal", "Global:log-verbose"), row.forAll) << row.fault;
        EXPECT_EQ(host.logged(row.line), 1u) << row.fault;
        host.unload();
    }
}

TEST(DriverParameters, OfAFailingRefreshAreThereOnceTheLibraryAnswers)
{
    Host host;
    host.addFault(R"({"function": "LRM_GetDriverParams", "status": 4, "to": 8})");
    host.addFault(R"({"function": "LRM_GetDriverParamsGlobal", "status": 4, "to": 2})");
    for (const char* className : {"TVRHBA_DriverParams", "TVRHBA_DriverParamGlobal"})
    {
        EXPECT_THAT(host.instancesOf(className), IsEmpty()) << className;
        EXPECT_THAT(host.instancesOf(className), testing::Not(IsEmpty())) << className;
    }
    EXPECT_THAT(settingsOf(host, "TVRHBA_GlobalDriverServiceElementSettingData"), SizeIs(3));
    EXPECT_THAT(host.instancesOf("TVRHBA_FCPort"), SizeIs(4));
    host.unload();
}

// --- what a library may say

std::string hostWith(const std::string& parameters)
{
    return R"({"adapters": [{"name": "a", "serialNumber": "S", "model": "M", "driverParameters": [)" + parameters +
           R"(], "ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]}]})";
}

TEST(DriverParameters, MayBeMoreThanTheFirstCallHasRoomFor)
{
    std::string list;
    for (int i = 0; i < 65; ++i)
        list += (i ? ", " : "") + std::string(R"({"name": "p)") + std::to_string(i) + "\"}";
    Host host(hostWith(list));
    EXPECT_THAT(host.instancesOf("TVRHBA_DriverParams"), SizeIs(65));
    EXPECT_GE(host.logged("[TVR_DBG] RM_GetDriverParams: status=7"), 1u);
    EXPECT_THAT(host.instancesOf("TVRHBA_DriverParamGlobal"), IsEmpty());
    host.unload();
}

TEST(DriverParameters, OfOneNameAreOne)
{
    Host host(hostWith(R"({"name": "p", "default": 1}, {"name": "q"}, {"name": "p", "default": 2})"));
    EXPECT_THAT(texts(host, "TVRHBA_DriverParams", "InstanceID"),
                ElementsAre("1000000000000001:p", "1000000000000001:q"));
    EXPECT_EQ(current(host, "TVRHBA_DriverParams", "1000000000000001:p"), 1u);
    EXPECT_GE(host.logged("[TVR_CRIT] Insert Failed : m_TVRHBA_DriverParams_map"), 1u);
    EXPECT_THAT(host.instancesOf("TVRHBA_DriverParameterAffectsFCPort"), SizeIs(2));
    host.unload();
}

TEST(DriverParameters, AreBoundedByTheirRoom)
{
    struct Row
    {
        const char* hostile;
        std::size_t count;
        std::string id;
    };
    const Row rows[] = {
        {"hugeCount", 2, "1000000000000001:p"}, // the rest of the room is 63 times the empty name
        {"unterminatedText", 1, "1000000000000001:" + std::string(32, 'X')},
        {"allOnes", 1, "1000000000000001:" + std::string(32, '\xFF')},
    };
    for (const Row& row : rows)
    {
        Host host(hostWith(R"({"name": "p", "help": "h"})"));
        host.addFault(std::string(R"({"function": "LRM_GetDriverParams", "hostile": ")") + row.hostile + "\"}");
        const std::vector<std::string> ids = texts(host, "TVRHBA_DriverParams", "InstanceID");
        EXPECT_THAT(ids, SizeIs(row.count)) << row.hostile;
        EXPECT_THAT(ids, Contains(row.id));
        host.unload();
    }
}

/// Whoever follows an association gets each end by itself: that must not read all of them each time.
TEST(DriverParameters, FollowingAnAssociationReadsEachEndOnce)
{
    Host host;
    const auto callsOf = [&](const char* service, const char* association, const char* function)
    {
        const broker::Object from = host.instancesOf(service).at(0);
        const std::uint64_t before = host.calls(function);
        const broker::Reply reply = host.broker().associators(from.path, {association});
        EXPECT_TRUE(reply.ok()) << reply.message;
        EXPECT_FALSE(reply.objects.empty());
        EXPECT_EQ(host.calls(function) - before, reply.objects.size()) << association;
    };
    callsOf("TVRHBA_FCHBADriverParamService", "TVRHBA_DriverServiceElementSettingData", "LRM_GetDriverParams");
    callsOf("TVRHBA_FCHBAWWNService", "TVRHBA_FCHBAWWNServiceAffectsFCPort", "LRM_GetPortAttributes");
    host.unload();
}

} // namespace
