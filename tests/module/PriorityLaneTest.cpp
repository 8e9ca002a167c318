// Priority lanes: units that an adapter serves before others, as instances that come and go.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using broker::Value;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

/// Port A0 has lanes, and so has its virtual port; port B0 has none. The running driver serves unit 3, the stored
/// configuration does not.
const char* const lanesHost = R"({
  "targets": [{"name": "t", "wwpn": "5063D20000000001", "units": [{"lun": 0}, {"lun": 3}, {"lun": 300}]},
              {"name": "u", "wwpn": "5063D20000000002", "units": [{"lun": 0}]}],
  "adapters": [
    {"name": "A", "serialNumber": "S1", "driverParameters": [{"name": "p"}],
     "ports": [{"wwpn": "1000027A000000A0", "targets": ["t", "u"],
                "priorityLanes": [{"target": "t", "lun": 3, "configState": 0}],
                "virtualPorts": [{"wwpn": "2001027A000000A0", "targets": ["t"]}]}]},
    {"name": "B", "serialNumber": "S2", "ports": [{"wwpn": "1000027A000000B0", "targets": ["t"]}]}]})";

/// Reads the fabric when somebody asks for it, and not before.
class LaneHost : public Host
{
public:
    LaneHost() : Host(lanesHost)
    {
        write("/etc/tavrin_fc_provider.conf", "TVR_PROVIDER_CACHE_TIMEOUT = 10\n"
                                              "TVR_PROVIDER_REFRESH_ADAPTERDATA = FALSE\n"
                                              "TVR_PROVIDER_REFRESH_SANDATA = FALSE\n");
    }
};

const std::string driver = "Driver:1000027A000000A0:5063D20000000001:";
const std::string config = "Config:1000027A000000A0:5063D20000000001:";
const std::string otherTarget = "Driver:1000027A000000A0:5063D20000000002:";
const std::string virtualDriver = "Driver:2001027A000000A0:5063D20000000001:";
const std::string lane3 = driver + "3:PrioLane";

std::vector<std::string> onlyLanes(std::vector<std::string> ids)
{
    std::erase_if(ids, [](const std::string& id) { return !id.ends_with(":PrioLane"); });
    return ids;
}

std::vector<std::string> lanes(Host& host)
{
    std::vector<std::string> ids;
    for (const broker::Object& object : host.instancesOf("TVRHBA_DriverParams"))
        ids.push_back(text(object, "InstanceID"));
    return onlyLanes(ids);
}

/// The lanes that the associations of a class refer to.
std::vector<std::string> tied(Host& host, const std::string& association)
{
    std::vector<std::string> ids;
    for (const broker::Object& object : host.instancesOf(association))
        ids.push_back(object.get("SettingData").asPath().key("InstanceID")->asString());
    return onlyLanes(ids);
}

void buildFabric(Host& host)
{
    host.instancesOf("TVRHBA_StorageVolume");
}

broker::Path pathOf(const Value& id)
{
    return {"root/tavrin", "TVRHBA_DriverParams", {{"InstanceID", id}}};
}

broker::Path pathOf(const std::string& id)
{
    return pathOf(Value::string(id));
}

CMPIrc create(Host& host, const Value& id)
{
    const broker::NamesReply reply = host.broker().createInstance({pathOf(id), {{"InstanceID", id}}});
    EXPECT_EQ(reply.paths, reply.ok() ? std::vector{pathOf(id)} : std::vector<broker::Path>());
    return reply.status;
}

CMPIrc create(Host& host, const std::string& id)
{
    return create(host, Value::string(id));
}

CMPIrc remove(Host& host, const std::string& id)
{
    return host.broker().deleteInstance(pathOf(id)).status;
}

std::uint64_t disableAll(Host& host, const Value& initiator, const Value& target, const Value& option)
{
    const broker::MethodReply reply = host.broker().invokeMethod(
        host.instancesOf("TVRHBA_FCHBADriverParamService").at(0).path, "DisableAllPrioLaneLuns",
        {{"InitiatorWWPN", initiator}, {"TargetWWPN", target}, {"Option", option}});
    EXPECT_TRUE(reply.ok()) << reply.message;
    return reply.returnValue.asUnsigned();
}

std::uint64_t disableAll(Host& host, const std::string& initiator, const std::string& target, std::uint16_t option)
{
    return disableAll(host, Value::string(initiator), Value::string(target), Value::uint16(option));
}

// --- what the library lists

TEST(PriorityLane, IsASettingOfItsPortOnceTheFabricIsKnown)
{
    setHostNames({});
    LaneHost host;
    EXPECT_THAT(lanes(host), IsEmpty());
    EXPECT_EQ(host.calls("LRM_GetOASLunList"), 0u);
    buildFabric(host);
    for (const char* association : {"TVRHBA_DriverServiceElementSettingData", "TVRHBA_DriverParameterAffectsFCPort"})
        EXPECT_THAT(tied(host, association), ElementsAre(lane3)) << association;
    EXPECT_THAT(lanes(host), ElementsAre(lane3));
    EXPECT_EQ(describe(theOne(host, "TVRHBA_DriverParams", "InstanceID", lane3)), R"(
Caption = "TVR:PrioLane"
ChangeableType = 1
Description = "Priority Lane"
ElementName = "Priority Lane"
InstanceID = "Driver:1000027A000000A0:5063D20000000001:3:PrioLane"
Option = 0
current = 1
def = 0
deviceID = "1000027a000000a0"
dynamic = 0
exportFlag = 1
help = "Priority Lane"
highRange = 1
lowRange = 0
paramname = "TVR:PrioLane"
paramno = 3
)");
    host.unload();
}

TEST(PriorityLane, ReadsNoMoreThanWhatIsAskedFor)
{
    LaneHost host;
    buildFabric(host);
    const auto reads = [&](auto request)
    {
        const std::uint64_t before = host.calls("LRM_GetOASLunList");
        request();
        return host.calls("LRM_GetOASLunList") - before;
    };
    const auto get = [&](const std::string& id) { EXPECT_TRUE(host.broker().getInstance(pathOf(id)).ok()) << id; };
    EXPECT_EQ(reads([&] { get("1000027A000000A0:p"); }), 0u);
    EXPECT_EQ(reads([&] { get(lane3); }), 1u);
    EXPECT_EQ(reads([&] { lanes(host); }), 6u) << "two targets of the port and one of its virtual port, both options";
    host.unload();
}

TEST(PriorityLane, FollowsTheDriverAndStaysWhereTheLibraryDoesNotTell)
{
    LaneHost host;
    buildFabric(host);
    EXPECT_EQ(create(host, config + "0:PrioLane"), CMPI_RC_OK);
    host.addFault(R"({"function": "LRM_GetOASLunList", "status": 4, "to": 7})");
    EXPECT_THAT(lanes(host), ElementsAre(lane3, config + "0:PrioLane")) << "six reads fail";
    EXPECT_TRUE(host.broker().getInstance(pathOf(lane3)).ok()) << "and a seventh";
    host.reboot();
    EXPECT_EQ(host.broker().getInstance(pathOf(lane3)).status, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_THAT(tied(host, "TVRHBA_DriverParameterAffectsFCPort"), ElementsAre(config + "0:PrioLane"));
    EXPECT_THAT(lanes(host), ElementsAre(driver + "0:PrioLane", config + "0:PrioLane"));
    host.unload();
}

TEST(PriorityLane, OutlivesARefreshOfTheAdapters)
{
    stopClock();
    LaneHost host;
    for (const bool fabric : {false, true})
    {
        SCOPED_TRACE(fabric);
        if (fabric)
            buildFabric(host);
        else
            for (const std::string& path : {config, virtualDriver})
                EXPECT_EQ(create(host, path + "0:PrioLane"), CMPI_RC_OK);
        const std::vector<std::string> before = lanes(host);
        EXPECT_THAT(before, ElementsAre(lane3, config + "0:PrioLane", virtualDriver + "0:PrioLane"));
        const std::size_t refreshes = host.logged("[TVR_DBG] PERF: DataFetch_Handler Thread END");
        advanceClock(std::chrono::hours(1));
        host.instancesOf("TVRHBA_Card");
        ASSERT_TRUE(host.awaitRefresh(refreshes + 1));
        EXPECT_THAT(tied(host, "TVRHBA_DriverServiceElementSettingData"), testing::ElementsAreArray(before));
        EXPECT_THAT(tied(host, "TVRHBA_DriverParamAffectsVirtualFCPort"), ElementsAre(virtualDriver + "0:PrioLane"));
        EXPECT_THAT(lanes(host), testing::ElementsAreArray(before));
    }
    host.unload();
}

TEST(PriorityLane, OfAHostileListIsNone)
{
    for (const char* hostile : {"allOnes", "hugeCount"})
    {
        LaneHost host;
        host.addFault(R"({"function": "LRM_GetOASLunList", "hostile": ")" + std::string(hostile) + "\"}");
        buildFabric(host);
        EXPECT_THAT(lanes(host), SizeIs(hostile == std::string("hugeCount") ? 1 : 0)) << hostile;
        host.unload();
    }
}

// --- made and taken away by a client

struct ClientRow
{
    std::string id;
    const char* port; ///< association with it
    const char* line;
};

TEST(PriorityLane, ComesAndGoesWithItsInstance)
{
    const char* const physical = "TVRHBA_DriverParameterAffectsFCPort";
    const char* const ofVirtual = "TVRHBA_DriverParamAffectsVirtualFCPort";
    const ClientRow rows[] = {
        {driver + "0:PrioLane", physical, "Input OASState: 1, Lun no: 0, option: 0"},
        {driver + "300:PrioLane", physical, "Input OASState: 1, Lun no: 300, option: 0"},
        {config + "3:PrioLane", physical, "Input OASState: 1, Lun no: 3, option: 1"},
        {otherTarget + "0:PrioLane", physical, "Input OASState: 1, Lun no: 0, option: 0"},
        {virtualDriver + "300:PrioLane", ofVirtual, "Input OASState: 1, Lun no: 300, option: 0"},
    };
    for (const bool fabric : {false, true})
        for (const ClientRow& row : rows)
        {
            SCOPED_TRACE(row.id);
            LaneHost host;
            if (fabric)
                buildFabric(host);
            const std::vector<std::string> others = lanes(host);
            EXPECT_EQ(create(host, row.id), CMPI_RC_OK);
            EXPECT_THAT(tied(host, "TVRHBA_DriverServiceElementSettingData"), testing::Contains(row.id));
            EXPECT_THAT(tied(host, row.port), testing::Contains(row.id));
            EXPECT_THAT(lanes(host), testing::Contains(row.id));
            EXPECT_THAT(lanes(host), testing::IsSupersetOf(others));
            EXPECT_TRUE(host.broker().getInstance(pathOf(row.id)).ok());

            EXPECT_EQ(create(host, row.id), CMPI_RC_ERR_ALREADY_EXISTS);
            EXPECT_EQ(host.calls("LRM_SetOASLunState"), 1u);
            EXPECT_EQ(remove(host, row.id), CMPI_RC_OK);
            for (const char* association : {"TVRHBA_DriverServiceElementSettingData", row.port})
                EXPECT_THAT(tied(host, association), testing::Not(testing::Contains(row.id)));
            EXPECT_THAT(lanes(host), testing::Not(testing::Contains(row.id)));
            EXPECT_EQ(remove(host, row.id), CMPI_RC_ERR_NOT_FOUND);

            EXPECT_THAT(logAbout(host, {"create_instance", "::create()", "OASState: 1", "Duplicate", "Exit Set",
                                        "delete_instance", "Not found"}),
                        ElementsAre("[TVR_DBG] TVRHBA_DriverParams_Provider::create_instance()",
                                    std::string("[TVR_DBG] Enter TVR_MethodWrapper:SetOASLunState ") + row.line,
                                    "[TVR_DBG] Exit SetOASLunState",
                                    "[TVR_DBG] TVRHBA_DriverServiceElementSettingData::create() Succesful",
                                    "[TVR_DBG] TVRHBA_DriverParams_Provider::create_instance() Succesful",
                                    "[TVR_DBG] TVRHBA_DriverParams_Provider::create_instance()",
                                    "[TVR_ERR] TVRHBA_DriverParams_Provider::Duplicate instance found.",
                                    "[TVR_DBG] TVRHBA_DriverParams_Provider::delete_instance()",
                                    "[TVR_DBG] Exit SetOASLunState",
                                    "[TVR_DBG] TVRHBA_DriverParams_Provider::delete_instance()",
                                    "[TVR_ERR] Instance Not found: " + row.id + " "));
            const bool isVirtual = row.port == ofVirtual;
            EXPECT_EQ(host.logged("[TVR_WARN] Could not find the corresponding FC Port instance from initiator. "
                                  "Checking for virtual FC Port"),
                      isVirtual ? 2u : 0u);
            EXPECT_EQ(host.logged("[TVR_ERR] TVRHBA_DriverParams_Provider::"), 1u) << "the duplicate alone";
            host.unload();
        }
}

TEST(PriorityLane, OfAllUnitsLastsAsLongAsEachHasOne)
{
    const std::string all = driver + "256:PrioLane";
    LaneHost host;
    buildFabric(host);
    EXPECT_EQ(create(host, all), CMPI_RC_OK);
    EXPECT_EQ(host.logged("[TVR_DBG] Lun for all: -1"), 1u);
    EXPECT_THAT(lanes(host), ElementsAre(driver + "0:PrioLane", lane3, all, driver + "300:PrioLane"));
    EXPECT_TRUE(host.broker().getInstance(pathOf(all)).ok());
    EXPECT_EQ(remove(host, lane3), CMPI_RC_OK);
    EXPECT_THAT(tied(host, "TVRHBA_DriverServiceElementSettingData"),
                ElementsAre(driver + "0:PrioLane", driver + "300:PrioLane"));
    EXPECT_EQ(create(host, all), CMPI_RC_OK);
    EXPECT_EQ(remove(host, all), CMPI_RC_OK);
    EXPECT_THAT(tied(host, "TVRHBA_DriverServiceElementSettingData"), IsEmpty());
    EXPECT_THAT(lanes(host), IsEmpty());
    host.unload();
}

struct RefusedName
{
    Value id;
    CMPIrc status;
    const char* line;
};

TEST(PriorityLane, OfAWrongNameIsNotMade)
{
    const char* const noLane = "[TVR_ERR] InstanceID size = 0, PrioLane parameter not found in InstanceID: ";
    const char* const noPort = "[TVR_DBG] Could not find the valid FC or Virtual FC instance";
    const char* const noUnit = "[TVR_ERR] TVRHBA_DriverParams_Provider:: Invalid target or LUN";
    const char* const noOption = "[TVR_DBG] TVRHBA_DriverParams_Provider:: Invalid option";
    const std::string port = "1000027A000000A0:5063D20000000001:";
    const CMPIrc invalid = CMPI_RC_ERR_INVALID_PARAMETER, failed = CMPI_RC_ERR_FAILED;
    const auto text = [](const std::string& value) { return Value::string(value); };
    const RefusedName rows[] = {
        {Value::null(CMPI_string), invalid, noLane},
        {text(""), invalid, noLane},
        {text(driver + "0"), invalid, noLane},
        {text(std::string(10000, ':')), invalid, noLane},
        {text("PrioLane"), failed, noPort},
        {text(":::::PrioLane"), failed, noPort},
        {text("Driver::5063D20000000001:0:PrioLane"), failed, noPort},
        {text("Driver:1000027a000000a0:5063D20000000001:0:PrioLane"), failed, noPort},
        {text("Driver:\"1000027A000000A0\":5063D20000000001:0:PrioLane"), failed, noPort},
        {text("Driver:" + std::string(10000, 'A') + ":5063D20000000001:0:PrioLane"), failed, noPort},
        {text("Driver:5063D20000000001:1000027A000000A0:0:PrioLane"), failed, noPort},
        {text(port + "0:PrioLane"), failed, noPort},
        {text("driver:" + port + "0:PrioLane"), invalid, noOption},
        {text(":" + port + "0:PrioLane"), invalid, noOption},
        {text("Tr\xC3\xA4ger:" + port + "0:PrioLane"), invalid, noOption},
        {text("Driver:1000027A000000A0:PrioLane"), invalid, noUnit},
        {text("Driver:1000027A000000A0::0:PrioLane"), invalid, noUnit},
        {text("Driver:1000027A000000A0:\"5063D20000000001:0:PrioLane"), invalid, noUnit},
        {text("Driver:1000027A000000A0:5063d20000000001:0:PrioLane"), invalid, noUnit},
        {text("Driver:1000027A000000A0:5063D20000000001FF:0:PrioLane"), invalid, noUnit},
        {text(driver + ":PrioLane"), invalid, noUnit},
        {text(driver + "abc:PrioLane"), invalid, noUnit},
        {text(driver + "-1:PrioLane"), invalid, noUnit},
        {text(driver + "+1:PrioLane"), invalid, noUnit},
        {text(driver + "00:PrioLane"), invalid, noUnit},
        {text(driver + "0x3:PrioLane"), invalid, noUnit},
        {text(driver + "2147483648:PrioLane"), invalid, noUnit},
        {text(driver + "99999999999:PrioLane"), invalid, noUnit},
        {text(driver + "0:PrioLane:"), invalid, noUnit},
        {text(driver + "0:PrioLanes"), invalid, noUnit},
        {text(driver + "0:3:PrioLane"), invalid, noUnit},
    };
    LaneHost host;
    buildFabric(host);
    for (const RefusedName& row : rows)
    {
        SCOPED_TRACE(row.id.isNull() ? "null" : row.id.asString().substr(0, 80));
        const std::size_t before = host.logged(row.line);
        EXPECT_EQ(create(host, row.id), row.status);
        EXPECT_EQ(host.logged(row.line), before + 1);
    }
    EXPECT_EQ(host.logged("[TVR_ERR] Also could not find the virtual FC port instance from initiator."), 8u);
    EXPECT_EQ(remove(host, "1000027A000000A0:p"), CMPI_RC_ERR_FAILED) << "a parameter of the driver";
    EXPECT_EQ(host.logged("[TVR_ERR] Also could not find the corresponding virtual FC port instance from initiator."),
              1u);
    EXPECT_EQ(remove(host, std::string(10000, 'x')), CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(host.calls("LRM_SetOASLunState"), 0u);
    EXPECT_THAT(lanes(host), ElementsAre(lane3));
    EXPECT_THAT(host.instancesOf("TVRHBA_DriverParams"), SizeIs(2));
    host.unload();
}

TEST(PriorityLane, ThatTheLibraryRefusesChangesNothing)
{
    LaneHost host;
    buildFabric(host);
    const auto refusals = [&] { return host.logged("[TVR_DBG]  Operation failure. PrioLane State has not been set"); };
    EXPECT_EQ(create(host, driver + "4:PrioLane"), CMPI_RC_ERR_FAILED) << "no such unit";
    EXPECT_EQ(create(host, "Driver:1000027A000000A0:5063D20000000009:0:PrioLane"), CMPI_RC_ERR_FAILED) << "or target";
    EXPECT_EQ(create(host, "Driver:1000027A000000B0:5063D20000000001:0:PrioLane"), CMPI_RC_ERR_FAILED) << "or lanes";
    EXPECT_EQ(refusals(), 3u);
    host.addFault(R"({"function": "LRM_SetOASLunState", "status": 4})");
    EXPECT_EQ(create(host, driver + "0:PrioLane"), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(remove(host, lane3), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(host.logged("[TVR_ERR] TVRHBA_DriverParams_Provider::SetOASLunState failed"), 1u);
    EXPECT_EQ(disableAll(host, "1000027A000000A0", "5063D20000000001", 0), 4u);
    EXPECT_EQ(host.logged("[TVR_ERR] Disable PriorityLaneLunStates failed"), 1u);
    EXPECT_EQ(refusals(), 6u);
    EXPECT_THAT(tied(host, "TVRHBA_DriverServiceElementSettingData"), ElementsAre(lane3));
    EXPECT_THAT(lanes(host), ElementsAre(lane3));
    host.unload();
}

// --- all at once

TEST(PriorityLane, AllOfOneTargetAndOptionGoTogether)
{
    struct Row
    {
        const char* initiator;
        std::uint16_t option;
        std::string prefix; ///< of those that go
    };
    const Row rows[] = {
        {"1000027A000000A0", 0, driver}, {"1000027A000000A0", 1, config}, {"2001027A000000A0", 0, virtualDriver}};
    for (const bool fabric : {false, true})
        for (const Row& row : rows)
        {
            SCOPED_TRACE(row.prefix);
            LaneHost host;
            if (fabric)
                buildFabric(host);
            std::vector<std::string> left;
            for (const std::string& path : {config, driver, otherTarget, virtualDriver})
            {
                EXPECT_EQ(create(host, path + "0:PrioLane"), CMPI_RC_OK);
                left.push_back(path + "0:PrioLane");
            }
            if (fabric)
                left.push_back(lane3);
            std::erase_if(left, [&](const std::string& id) { return id.starts_with(row.prefix); });
            EXPECT_EQ(disableAll(host, row.initiator, "5063D20000000001", row.option), 0u);
            EXPECT_THAT(tied(host, "TVRHBA_DriverServiceElementSettingData"), testing::UnorderedElementsAreArray(left));
            if (!fabric && row.prefix != driver)
                left.push_back(lane3); // the path is known by now
            EXPECT_THAT(lanes(host), testing::UnorderedElementsAreArray(left));
            const std::vector<std::string> lines =
                logAbout(host, {"DisableAllPrio", "Option: ", "Final ParseStr", "Invalid"});
            ASSERT_GE(lines.size(), 4u);
            EXPECT_THAT(std::vector(lines.end() - 4, lines.end()),
                        ElementsAre("[TVR_DBG] TVRHBA_FCHBADriverParamService_Provider::DisableAllPrioLaneLuns()",
                                    "[TVR_DBG] Option: " + std::to_string(row.option) + ".",
                                    "[TVR_DBG] Final ParseStr: " + row.prefix.substr(0, row.prefix.size() - 1),
                                    "[TVR_DBG] DisableAllPrioLaneLuns Succeeded"));
            host.unload();
        }
}

TEST(PriorityLane, AllOfUnknownPortsOrOptionsStay)
{
    const auto text = [](const std::string& value) { return Value::string(value); };
    const Value port = text("1000027A000000A0"), target = text("5063D20000000001"), none = Value::null(CMPI_string);
    const Value running = Value::uint16(0);
    const char* const noPorts = "[TVR_ERR] Invalid Initiator fc port or Target device";
    const struct
    {
        Value initiator, target, option;
        const char* line;
    } rows[] = {
        {none, target, running, noPorts},
        {text(""), target, running, noPorts},
        {text("1000027A000000A"), target, running, noPorts},
        {text(std::string(10000, 'A')), target, running, noPorts},
        {port, none, running, noPorts},
        {port, text(""), running, noPorts},
        {port, text("5063D20000000009"), running, noPorts},
        {port, text("5063d20000000001"), running, noPorts},
        {port, text("\"5063D20000000001"), running, noPorts},
        {port, text("5063D20000000001:3"), running, noPorts},
        {text("1000027A000000B0"), text("5063D20000000002"), running, noPorts}, // another port's
        {text("2001027A000000A0"), text("5063D20000000002"), running, noPorts},
        {port, target, Value::uint16(2), "[TVR_DBG] Option: 2."},
        {port, target, Value::uint16(0xFFFF), "[TVR_DBG] Option: 65535."},
        {port, target, Value::null(CMPI_uint16), "[TVR_DBG] Option: 0."},
    };
    LaneHost host;
    buildFabric(host);
    for (const auto& row : rows)
    {
        const std::size_t before = host.logged(row.line);
        EXPECT_EQ(disableAll(host, row.initiator, row.target, row.option), 32968u);
        EXPECT_EQ(host.logged(row.line), before + 1);
    }
    broker::Path service = host.instancesOf("TVRHBA_FCHBADriverParamService").at(0).path;
    service.setKey("Name", text("another"));
    const auto reply = host.broker().invokeMethod(
        service, "DisableAllPrioLaneLuns", {{"InitiatorWWPN", port}, {"TargetWWPN", target}, {"Option", running}});
    EXPECT_EQ(reply.returnValue.asUnsigned(), 33068u);
    EXPECT_EQ(host.calls("LRM_SetOASLunState"), 0u);
    EXPECT_THAT(lanes(host), ElementsAre(lane3));
    host.unload();
}

/// Before there is a fabric the library knows what the maps do not.
TEST(PriorityLane, TargetsAreTheLibrarysToKnowWithoutAFabric)
{
    LaneHost host;
    EXPECT_EQ(disableAll(host, "1000027A000000A0", "5063D20000000009", 0), 5u);
    EXPECT_EQ(disableAll(host, "1000027A000000A0", "5063D20000000001", 0), 0u);
    buildFabric(host);
    EXPECT_THAT(lanes(host), IsEmpty());
    host.unload();
}

} // namespace
