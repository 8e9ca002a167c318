// World Wide Names: what a client changes, restores and reads, and what the log says of it.
#include "tests/module/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using broker::Value;
using testing::Contains;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

namespace
{

constexpr const char* newWwpn = "1000027A511602AA";
constexpr const char* newWwnn = "2000027A511602AA";
constexpr const char* vport = "2001027A51320240"; ///< of another adapter than the port
constexpr unsigned volatileNames = 0, nonVolatileNames = 1, factoryNames = 2, currentNames = 3, configuredNames = 4;
constexpr unsigned toFactory = 0, toNonVolatile = 1;
constexpr const char* completed =
    "[TVR_INFO] ChangeWWN operation completed. Please restart the CIMOM to use Tavrin CIM provider";

Value typeValue(unsigned type)
{
    return Value::uint16(static_cast<std::uint16_t>(type));
}

class WwnHost : public ServiceHost
{
public:
    explicit WwnHost(const std::string& scenario = "default") : ServiceHost("TVRHBA_FCHBAWWNService", scenario) {}

    Answer change(const Value& wwpn, const Value& wwnn, const Value& type = typeValue(nonVolatileNames))
    {
        return callOnPort("ChangeWWN", "[TVR_DBG] Entering ChangeWWN",
                          {{"NewWWPN", wwpn}, {"NewWWNN", wwnn}, {"Type", type}});
    }
    Answer change(unsigned type, const std::string& wwpn = newWwpn, const std::string& wwnn = newWwnn)
    {
        return change(Value::string(wwpn), Value::string(wwnn), typeValue(type));
    }
    Answer restore(unsigned type)
    {
        return callOnPort("RestoreWWN", "[TVR_DBG] Entering RestoreWWN", {{"Type", typeValue(type)}});
    }
    Answer read(unsigned type)
    {
        return callOnPort("ReadWWN", "[TVR_DBG] Entering ReadWWN", {{"Type", typeValue(type)}});
    }
    Answer capability() { return callOnPort("GetWWNCapability", "[TVR_DBG] Entering GetWWNCapability"); }
};

std::uint64_t operationStatus(const Answer& answer)
{
    return answer.at("WWNOperationStatus").asUnsigned();
}

/// A host of one port that has these `names`, and more members.
std::string withNames(const std::string& names, const std::string& members = "")
{
    return R"({"adapters": [{"name": "Tavrin-1", "serialNumber": "S1", "model": "M1", "ports": [
               {"wwpn": "10:00:00:00:00:00:00:01", "wwnn": "20:00:00:00:00:00:00:01", "names": {)" +
           names + "}" + members + "}]}]}";
}

std::string fault(const std::string& function, const std::string& effect)
{
    return R"({"function": ")" + function + "\", " + effect + "}";
}

// --- names that come into force

TEST(Wwn, ChangedNamesComeWithTheActivationAndGoWithTheRestore)
{
    WwnHost host;
    const Answer changed = host.change(nonVolatileNames);
    EXPECT_EQ(changed.value, 0u);
    EXPECT_EQ(operationStatus(changed), 0u);
    EXPECT_THAT(changed.lines,
                ElementsAre("[TVR_DBG] Writing Non-Volatile World Wide Name.",
                            "[TVR_INFO] ChangeWWN operation initiated", "[TVR_WARN] New WWNs written successfully",
                            "[TVR_WARN] Reset required to activate the new setting", completed));
    EXPECT_THAT(host.portsAfterRefresh(), Contains("1000027A51160210")) << "not before the activation";

    EXPECT_EQ(host.change(nonVolatileNames).value, 0u);
    host.reboot();
    EXPECT_THAT(host.portsAfterRefresh(),
                ElementsAre(newWwpn, "1000027A51160211", "1000027A51320240", "1000027A51320241"));

    const Answer restored = host.restore(toFactory);
    EXPECT_EQ(restored.value, 0u);
    EXPECT_EQ(operationStatus(restored), 0u);
    EXPECT_THAT(restored.lines,
                ElementsAre("[TVR_DBG] Restoring Factory Default World Wide Name...",
                            "[TVR_INFO] RestoreWWN operation initiated.", "[TVR_WARN] WWNs restored successfully",
                            "[TVR_WARN] Please reset the HBA to activate the new setting"));
    host.reboot();
    EXPECT_THAT(host.portsAfterRefresh(), Contains("1000027A51160210"));
    EXPECT_THAT(host.restore(toNonVolatile).lines, ElementsAre("[TVR_DBG] Restoring Non-volatile World Wide Name...",
                                                               "[TVR_INFO] RestoreWWN operation initiated.",
                                                               "[TVR_WARN] WWNs already active. No Restore needed"));
    host.unload();
}

TEST(Wwn, VolatileNamesLastUntilThePowerGoes)
{
    WwnHost host(withNames(R"("capability": "0x100C")"));
    EXPECT_EQ(host.change(nonVolatileNames, "1000000000000002", "2000000000000002").value, 0u);
    EXPECT_THAT(host.portsAfterRefresh(), ElementsAre("1000000000000001"));
    EXPECT_THAT(host.change(volatileNames, "1000000000000003", "2000000000000003").lines,
                Contains("[TVR_DBG] Writing Volatile World Wide Name."));
    host.reboot();
    EXPECT_THAT(host.portsAfterRefresh(), ElementsAre("1000000000000003"));
    EXPECT_EQ(host.change(volatileNames, "1000000000000004", "2000000000000004").value, 0u);
    host.reboot(true);
    EXPECT_THAT(host.portsAfterRefresh(), ElementsAre("1000000000000002"));
    host.unload();
}

// --- what the library answers

constexpr const char* reboot = "[TVR_WARN] Reboot required to activate the new setting";
constexpr const char* reset = "[TVR_WARN] Reset required to activate the new setting";
constexpr const char* untilPowerDown =
    "[TVR_WARN] Volatile names will be active until system power-down or HBA power-cycle";
constexpr const char* restored = "[TVR_WARN] WWNs restored successfully";

TEST(Wwn, EachActivationCodeHasItsLines)
{
    const struct
    {
        unsigned code;
        std::vector<std::string> changed;
        std::vector<std::string> restored;
    } rows[] = {
        {1, {}, {"[TVR_WARN] WWNs already active. No Restore needed"}},
        {2, {}, {}},
        {5, {reboot, untilPowerDown}, {restored, reboot, untilPowerDown}},
        {6, {reboot}, {restored, reboot}},
        {7,
         {reset, untilPowerDown},
         {restored, "[TVR_WARN] Reset the HBA to activate the new setting", untilPowerDown}},
        {8, {reset}, {restored, "[TVR_WARN] Please reset the HBA to activate the new setting"}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.code);
        WwnHost host(withNames("\"activation\": " + std::to_string(row.code)));
        std::vector<std::string> lines = {"[TVR_DBG] Restoring Factory Default World Wide Name...",
                                          "[TVR_INFO] RestoreWWN operation initiated."};
        lines.insert(lines.end(), row.restored.begin(), row.restored.end());
        EXPECT_THAT(host.restore(toFactory).lines, ElementsAreArray(lines));
        host.portsAfterRefresh();

        lines = {"[TVR_DBG] Writing Volatile World Wide Name.", "[TVR_INFO] ChangeWWN operation initiated",
                 "[TVR_WARN] New WWNs written successfully"};
        lines.insert(lines.end(), row.changed.begin(), row.changed.end());
        lines.push_back(completed);
        EXPECT_THAT(host.change(volatileNames).lines, ElementsAreArray(lines));
        EXPECT_THAT(host.portsAfterRefresh(), ElementsAre(row.code == 1 ? newWwpn : "1000000000000001"));
        host.unload();
    }
}

TEST(Wwn, FailuresComeAsTheyAre)
{
    using Call = Answer (*)(WwnHost&);
    const Call change = [](WwnHost& host) { return host.change(nonVolatileNames); };
    const Call restore = [](WwnHost& host) { return host.restore(toFactory); };
    const Call read = [](WwnHost& host) { return host.read(currentNames); };
    const Call capability = [](WwnHost& host) { return host.capability(); };
    const struct
    {
        Call call;
        const char* function;
        unsigned status;
        std::vector<std::string> lines; ///< behind those of every call
    } rows[] = {
        {change,
         "LRM_ChangeWWN",
         92,
         {"[TVR_ERR] WWN Management is not available on this HBA",
          "[TVR_ERR] ChanngeWWN: RM_ChangeWWN call failed with error: 92"}},
        {change,
         "LRM_ChangeWWN",
         89,
         {"[TVR_ERR] WWN NOT SUPPORTED", "[TVR_ERR] ChanngeWWN: RM_ChangeWWN call failed with error: 89"}},
        {change, "LRM_ChangeWWN", 1, {"[TVR_ERR] ChanngeWWN: RM_ChangeWWN call failed with error: 1"}},
        {restore, "LRM_RestoreWWN", 92, {}},
        {read, "LRM_ReadWWN", 92, {"[TVR_ERR] WWN Management is NOT AVAILABLE on this adapter"}},
        {read, "LRM_ReadWWN", 1, {"[TVR_ERR] ReadWWN: RM_ReadWWN call failed with error: 1"}},
        {capability,
         "LRM_GetWWNCapability",
         92,
         {"[TVR_ERR] WWN Management is not available on this HBA",
          "[TVR_ERR] GetWWNCapability: RM_ReadWWNCapability call failed with error: 92"}},
        {capability,
         "LRM_GetWWNCapability",
         2,
         {"[TVR_ERR] GetWWNCapability: RM_ReadWWNCapability call failed with error: 2"}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(std::string(row.function) + " " + std::to_string(row.status));
        WwnHost host;
        host.addFault(fault(row.function, "\"status\": " + std::to_string(row.status)));
        Answer answer = row.call(host);
        EXPECT_EQ(answer.value, row.status);
        std::erase_if(answer.lines, [](const std::string& line) { return !line.starts_with("[TVR_ERR]"); });
        EXPECT_THAT(answer.lines, ElementsAreArray(row.lines));
        EXPECT_TRUE(answer.at("WWPN").isNull());
        EXPECT_TRUE(answer.at("WWNCapability").isNull());
        EXPECT_EQ(host.logged(completed), 0u);
        EXPECT_EQ(host.broker().violations().size(), 0u);
        host.unload();
    }
}

TEST(Wwn, ABusyAdapterIsAskedThreeHundredTimes)
{
    const struct
    {
        const char* busy;
        unsigned value;
        const char* line;
    } rows[] = {
        {R"("status": 97, "to": 299)", 0, "[TVR_WARN] New WWNs written successfully"},
        {R"("status": 97, "to": 300)", 97, "[TVR_ERR] ChanngeWWN: RM_ChangeWWN call failed with error: 97"},
    };
    for (const auto& row : rows)
    {
        WwnHost host;
        host.addFault(fault("LRM_ChangeWWN", row.busy));
        host.addFault(fault("LRM_RestoreWWN", row.busy));
        const Answer changed = host.change(nonVolatileNames);
        EXPECT_EQ(changed.value, row.value);
        ASSERT_GE(changed.lines.size(), 4u);
        EXPECT_EQ(changed.lines[2], "[TVR_DBG] Validating new WWNs...");
        EXPECT_EQ(changed.lines[3], row.line);
        EXPECT_EQ(host.calls("LRM_ChangeWWN"), 300u);
        const Answer restored = host.restore(toFactory);
        EXPECT_EQ(restored.value, row.value);
        EXPECT_EQ(operationStatus(restored), row.value);
        EXPECT_EQ(host.logged("[TVR_DBG] Restoring WWNs..."), 1u);
        EXPECT_EQ(host.calls("LRM_RestoreWWN"), 300u);
        host.unload();
    }
}

// --- what is refused before the library changes anything

TEST(Wwn, WrongArgumentsChangeNothing)
{
    WwnHost host;
    const Value good = Value::string(newWwpn);
    const Value type = typeValue(nonVolatileNames);
    const std::string missingWwpn = "[TVR_ERR] New WWPN has a null pointer";
    const std::string missingWwnn = "[TVR_ERR] New WWNN has a null pointer";
    const std::string noName = "[TVR_ERR] TVRHBA_FCHBAWWNService_Provider::str2HBAName failed";
    const struct
    {
        Value wwpn;
        Value wwnn;
        Value type;
        std::string lastLine;
    } rows[] = {
        {Value::null(CMPI_string), good, type, missingWwpn},
        {Value::string(""), good, type, missingWwpn},
        {Value::null(CMPI_string), Value::null(CMPI_string), typeValue(2), missingWwpn},
        {good, Value::null(CMPI_string), typeValue(2), missingWwnn},
        {good, Value::null(CMPI_string), type, missingWwnn},
        {good, Value::string(""), type, missingWwnn},
        {Value::string("1000027A511602A"), good, type, noName},
        {Value::string("1000027A511602AA7"), good, type, noName},
        {Value::string("10:00:02:7A:51:16:02:AA"), good, type, noName},
        {Value::string("1000027A511602A\xC3\x84"), good, type, noName},
        {Value::string("\""), good, type, noName},
        {Value::string("\"1000027A511602AG\""), good, type, noName},
        {good, Value::string(std::string(10000, '1')), type, noName},
        {good, Value::string("%s%n%s%n%s%n%s%n"), type, noName},
        {good, good, typeValue(2), "[TVR_ERR] ChangeWWN: Type 2 not recognized..."},
        {good, good, typeValue(65535), "[TVR_ERR] ChangeWWN: Type 65535 not recognized..."},
        {good, good, Value::null(CMPI_uint16), "[TVR_ERR] ChangeWWN: Type -1 not recognized..."},
    };
    for (const auto& row : rows)
    {
        const Answer answer = host.change(row.wwpn, row.wwnn, row.type);
        EXPECT_EQ(answer.value, 32968u) << row.lastLine;
        ASSERT_FALSE(answer.lines.empty()) << row.lastLine;
        EXPECT_EQ(answer.lines.back(), row.lastLine);
        EXPECT_TRUE(answer.at("WWNOperationStatus").isNull());
    }
    EXPECT_EQ(host.restore(2).value, 32968u);
    EXPECT_EQ(host.logged("[TVR_ERR] RestoreWWN: Type 2 not recognized..."), 1u);
    EXPECT_EQ(host.read(5).value, 32968u);
    EXPECT_EQ(host.logged("[TVR_ERR] ReadWWN: Type 5 not recognized..."), 1u);
    for (const char* function : {"RM_ValidateWwn", "LRM_ChangeWWN", "LRM_RestoreWWN", "LRM_ReadWWN"})
        EXPECT_EQ(host.calls(function), 0u) << function;
    EXPECT_EQ(host.change(nonVolatileNames, "\"" + std::string(newWwpn) + "\"", "\"" + std::string(newWwnn)).value, 0u)
        << "quotes are no part of a name";
    host.unload();
}

TEST(Wwn, EachMethodAsksForTheServiceAndAPort)
{
    WwnHost host;
    for (const std::string method : {"ChangeWWN", "RestoreWWN", "ReadWWN", "GetWWNCapability"})
        host.expectRefusals(method, "[TVR_DBG] Entering " + method,
                            "[TVR_ERR] Invalid instance of HBA WWN Management Service",
                            "[TVR_ERR] TVRHBA_FCHBAWWNService_Provider invald port ...return");
    host.unload();
}

TEST(Wwn, NamesThatTheLibraryDoesNotTakeChangeNothing)
{
    WwnHost host;
    const Answer wwpn = host.change(nonVolatileNames, "0000000000000000");
    EXPECT_EQ(wwpn.value, 40005u);
    EXPECT_EQ(operationStatus(wwpn), 0u);
    EXPECT_THAT(wwpn.lines, Contains("[TVR_ERR] The supplied 'New WWPN' is not valid"));
    const Answer wwnn = host.change(nonVolatileNames, newWwpn, "3000027A511602AA");
    EXPECT_EQ(wwnn.value, 40005u);
    EXPECT_THAT(wwnn.lines, Contains("[TVR_ERR] The supplied 'New WWNN' is not valid"));
    EXPECT_EQ(host.calls("RM_GetNumberOfLocalAdapters"), 0u);
    EXPECT_EQ(host.calls("LRM_ChangeWWN"), 0u);
    host.unload();
}

// --- names of virtual ports

TEST(Wwn, NamesOfVirtualPortsAreRefused)
{
    WwnHost host;
    for (const bool asWwpn : {true, false})
    {
        const Answer answer = host.change(nonVolatileNames, asWwpn ? vport : newWwpn, asWwpn ? newWwnn : vport);
        EXPECT_EQ(answer.value, 91u);
        EXPECT_EQ(operationStatus(answer), 1u);
        EXPECT_THAT(answer.lines, ElementsAre("[TVR_DBG] Writing Non-Volatile World Wide Name.",
                                              "[TVR_DBG] ChangeWWN: Duplication of vport WWPN detected."));
    }
    EXPECT_EQ(host.calls("RM_GetLocalHBAInfo"), 8u) << "the search goes on to the last of four ports";
    EXPECT_EQ(host.calls("LRM_ChangeWWN"), 0u);
    EXPECT_EQ(host.change(nonVolatileNames, newWwpn, "2002027A51320240").value, 0u)
        << "the node's name of a virtual port is not looked at";
    // The library itself knows more names: here that of another port.
    const Answer ofPort = host.change(nonVolatileNames, "1000027A51160211");
    EXPECT_EQ(ofPort.value, 91u);
    EXPECT_EQ(operationStatus(ofPort), 0u);
    EXPECT_EQ(host.calls("LRM_ChangeWWN"), 2u);

    host.addFault(fault("RM_GetLocalHBAInfo", R"("status": 1, "to": 1)"));
    EXPECT_EQ(operationStatus(host.change(nonVolatileNames, vport)), 1u) << "a port that cannot be read is passed over";
    host.unload();
}

std::string vports(unsigned count)
{
    std::string list;
    for (unsigned i = 0; i < count; ++i)
    {
        char wwpn[17];
        std::snprintf(wwpn, sizeof wwpn, "2%015X", i + 1);
        list += std::string(i ? ", " : "") + R"({"wwpn": ")" + wwpn + "\"}";
    }
    return R"(, "virtualPorts": [)" + list + "]";
}

TEST(Wwn, TheSearchForNamesKeepsItsBounds)
{
    const std::string lastOf1023 = "20000000000003FF";
    const struct
    {
        const char* what;
        std::string scenario;
        std::string fault;
        std::string wwpn;
        std::uint64_t value;
        std::uint64_t lists; ///< calls of LRM_VPList
        std::uint64_t ports = 1;
    } rows[] = {
        {"one call has room for one", withNames("", vports(1)), "", "2000000000000001", 91, 1},
        {"two need another call", withNames("", vports(2)), "", "2000000000000002", 91, 2},
        {"the most that are looked at", withNames("", vports(1023)), "", lastOf1023, 91, 2},
        {"listed twice", withNames("", R"(, "listedTwice": true)"), "", newWwpn, 0, 1, 2},
        {"no such port at that index", withNames("", vports(1)), fault("RM_GetLocalHBAInfo", R"("status": 1)"), newWwpn,
         0, 0},
        {"more local ports than can be", withNames("", vports(1)),
         fault("RM_GetNumberOfLocalAdapters", R"("hostile": "hugeCount")"), newWwpn, 0, 1, 4096},
        {"a list that cannot be read", withNames("", vports(1)), fault("LRM_VPList", R"("status": 1)"), newWwpn, 0, 1},
        {"a count that lies", withNames("", vports(2)), fault("LRM_VPList", R"("hostile": "hugeCount")"), newWwpn, 0,
         1},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.what);
        WwnHost host(row.scenario);
        if (!row.fault.empty())
            host.addFault(row.fault);
        const std::uint64_t before = host.calls("LRM_VPList");
        EXPECT_EQ(host.change(nonVolatileNames, row.wwpn).value, row.value);
        EXPECT_EQ(host.calls("LRM_VPList") - before, row.lists);
        EXPECT_EQ(host.calls("RM_GetLocalHBAInfo"), row.ports);
        host.unload();
    }
    // One virtual port more, and none of them is compared: the library itself refuses the name.
    WwnHost host(withNames("", vports(1024)));
    const Answer answer = host.change(nonVolatileNames, lastOf1023);
    EXPECT_EQ(answer.value, 91u);
    EXPECT_EQ(operationStatus(answer), 0u);
    EXPECT_EQ(host.calls("LRM_ChangeWWN"), 1u);
    host.unload();
}

// --- names and capabilities that are read

TEST(Wwn, EachKindOfNamesIsReadWithItsLine)
{
    const std::string types[] = {"[TVR_DBG] Reading Volatile WWNs.", "[TVR_DBG] Reading Non-Volatile WWNs.",
                                 "[TVR_DBG] Reading Factory Default WWNs.", "[TVR_DBG] Reading current WWNs.",
                                 "[TVR_DBG] Reading configured WWNs."};
    const std::string others = R"({"wwpn": "10:00:00:00:00:00:AB:01", "wwnn": "20:00:00:00:00:00:AB:01"})";
    const std::string same = R"({"wwpn": "10:00:00:00:00:00:00:01", "wwnn": "20:00:00:00:00:00:00:01"})";
    const char* const otherText = "10:00:00:00:00:00:ab:01";
    const char* const sameText = "10:00:00:00:00:00:00:01";
    const std::string byReboot = R"("capability": "0x100C", )";
    const struct
    {
        std::string names;
        unsigned type;
        const char* line;
        std::string wwpn; ///< empty where there are no such names
    } rows[] = {
        {"\"volatile\": " + others, volatileNames, "[TVR_DBG] Volatile WWNs are active", otherText},
        {"", volatileNames, "[TVR_DBG] Volatile WWNs DO NOT EXIST on this adapter", ""},
        {R"("capability": 4)", volatileNames, "[TVR_DBG] Volatile WWNs are NOT SUPPORTED on this adapter", ""},
        {"\"nonVolatile\": " + others, nonVolatileNames, "[TVR_INFO] Non-Volatile WWNs read successfully", otherText},
        {"\"factory\": " + others, factoryNames, "[TVR_INFO] Factory Default WWNs read successfully", otherText},
        {"", currentNames, "[TVR_DBG] Current WWNs: Non-Volatile", sameText},
        {"\"volatile\": " + same, currentNames, "[TVR_DBG] Current WWNs: Volatile", sameText},
        {"", configuredNames, "[TVR_DBG] Configured WWNs DO NOT EXIST", ""},
        {byReboot + "\"volatile\": " + others, configuredNames,
         "[TVR_DBG] Configured WWNs: Volatile (Activation required: warm reboot)", otherText},
        {"\"volatile\": " + others, configuredNames,
         "[TVR_DBG] Configured WWNs: Volatile (Activation required: adapter restart)", otherText},
        {byReboot + "\"nonVolatile\": " + others, configuredNames,
         "[TVR_DBG] Configured WWNs: Non-Volatile (Activation required: warm reboot)", otherText},
        {"\"nonVolatile\": " + others, configuredNames,
         "[TVR_DBG] Configured WWNs: Non-Volatile (Activation required: adapter restart)", otherText},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.line);
        WwnHost host(withNames(row.names));
        const Answer answer = host.read(row.type);
        EXPECT_EQ(answer.value, 0u);
        EXPECT_EQ(operationStatus(answer), 0u);
        EXPECT_EQ(answer.text("WWPN"), row.wwpn);
        std::vector<std::string> lines = {types[row.type], row.line};
        if (!row.wwpn.empty())
        {
            const std::string wwnn = "2" + row.wwpn.substr(1);
            EXPECT_EQ(answer.text("WWNN"), wwnn);
            lines.insert(lines.end(), {"[TVR_DBG] WWPN: " + row.wwpn, "[TVR_DBG] WWNN: " + wwnn});
        }
        EXPECT_THAT(answer.lines, ElementsAreArray(lines));
        host.unload();
    }
}

TEST(Wwn, CapabilitiesAreReadBitByBit)
{
    const std::string readOnly = "[TVR_INFO] Read Only mode: World Wide Name Management is not supported in this mode";
    const struct
    {
        unsigned bits;
        std::vector<std::string> lines;
    } rows[] = {
        {0x200C,
         {"[TVR_DBG] Can change Non-Volatile WWNs", "[TVR_DBG] Can change Volatile WWNs",
          "[TVR_INFO] Activation requirement: Reset HBA"}},
        {0x1004,
         {"[TVR_DBG] Can change Non-Volatile WWNs", "[TVR_DBG] Cannot change Volatile WWNs",
          "[TVR_INFO] Activation requirement: Reboot"}},
        {0x3008,
         {"[TVR_DBG] Cannot change Non-Volatile WWNs", "[TVR_DBG] Can change Volatile WWNs",
          "[TVR_INFO] Activation requirement: Reboot", "[TVR_INFO] Activation requirement: Reset HBA"}},
        {0x0001, {readOnly, "[TVR_DBG] Cannot change Non-Volatile WWNs", "[TVR_DBG] Cannot change Volatile WWNs"}},
    };
    for (const auto& row : rows)
    {
        WwnHost host(withNames("\"capability\": " + std::to_string(row.bits)));
        const Answer answer = host.capability();
        EXPECT_EQ(answer.value, 0u);
        EXPECT_EQ(answer.at("WWNCapability").asUnsigned(), row.bits);
        EXPECT_THAT(answer.lines, ElementsAreArray(row.lines));
        if (!(row.bits & 4))
        {
            EXPECT_EQ(host.change(nonVolatileNames).value, 89u);
        }
        host.unload();
    }
}

} // namespace
