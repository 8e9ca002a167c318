// Driver parameters that a client sets.
#include "tests/module/Describe.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using broker::Value;
using testing::ElementsAre;

namespace
{

const char* const port = "1000027A51160210";
const char* const otherPort = "1000027A51320240";

broker::Path pathOf(Host& host, const char* className)
{
    return host.instancesOf(className).at(0).path;
}

broker::Path portPath(Host& host)
{
    return theOne(host, "TVRHBA_FCPort", "DeviceID", port).path;
}

struct Arguments
{
    Value permanent = Value::uint8(0);
    Value global = Value::uint8(0);
    Value name = Value::string("device-timeout");
    Value value = Value::string("77");
};

std::vector<broker::Property> argumentsOf(const Value& target, const Arguments& arguments)
{
    return {{"Target", target},
            {"bPermanent", arguments.permanent},
            {"bGlobal", arguments.global},
            {"strParam", arguments.name},
            {"strValue", arguments.value}};
}

std::uint64_t set(Host& host, const Arguments& arguments)
{
    const broker::MethodReply reply =
        host.broker().invokeMethod(pathOf(host, "TVRHBA_FCHBADriverParamService"), "SetDriverParameter",
                                   argumentsOf(Value::reference(portPath(host)), arguments));
    EXPECT_TRUE(reply.ok()) << reply.message;
    return reply.returnValue.asUnsigned();
}

std::uint64_t valueOf(Host& host, const std::string& className, const std::string& id, const char* property)
{
    return theOne(host, className, "InstanceID", id).get(property).asUnsigned();
}

/// Of a parameter: on the port that is its target, on another adapter's, and what holds for all.
std::vector<std::uint64_t> values(Host& host, const std::string& name = "device-timeout")
{
    return {valueOf(host, "TVRHBA_DriverParams", port + (":" + name), "current"),
            valueOf(host, "TVRHBA_DriverParams", otherPort + (":" + name), "current"),
            valueOf(host, "TVRHBA_DriverParamGlobal", "Global:" + name, "glbl"),
            valueOf(host, "TVRHBA_DriverParamGlobal", "Global:" + name, "current")};
}

struct ControlRow
{
    std::uint8_t permanent, global;
    const char* line;
    std::vector<std::uint64_t> at_once, reloaded;
};

TEST(DriverParameterService, SetsAParameterOfOneAdapterOrAllForNowOrForEver)
{
    const std::vector<std::uint64_t> before = {30, 10, 30, 20};
    const ControlRow rows[] = {
        {0, 0, "[TVR_DBG] pParamStr:[device-timeout=77], Ccw:[0]", {77, 10, 30, 20}, before},
        {0, 1, "[TVR_DBG] pParamStr:[device-timeout=77], Ccw:[2]", {77, 77, 77, 77}, before},
        {1, 0, "[TVR_DBG] pParamStr:[device-timeout=77], Ccw:[1]", {77, 10, 30, 20}, {77, 10, 30, 20}},
        {1, 1, "[TVR_DBG] pParamStr:[device-timeout=77], Ccw:[3]", {77, 77, 77, 77}, {77, 77, 77, 77}},
    };
    for (const ControlRow& row : rows)
    {
        SCOPED_TRACE(row.line);
        Host host;
        EXPECT_EQ(values(host), before);
        EXPECT_EQ(set(host, {Value::uint8(row.permanent), Value::uint8(row.global)}), 0u);
        EXPECT_EQ(values(host), row.at_once);
        host.reboot();
        EXPECT_EQ(values(host), row.reloaded);
        EXPECT_THAT(
            logAbout(host, {"tvrcimSetDriverParam", "pDriverParam", "pParamStr", "RM_SetDriverParam",
                            "SetDriverParameter()"}),
            ElementsAre("[TVR_DBG] TVRHBA_FCHBADriverParamService_Provider::SetDriverParameter()",
                        "[TVR_DBG] tvrcimSetDriverParam Parameters ::",
                        "[TVR_DBG] CW1=" + std::to_string(row.global) + " CW2=" + std::to_string(row.permanent) +
                            " pDriverParam=device-timeout pVal=77, deviceID=1000027A51160210",
                        row.line, "[TVR_DBG] Calling RM_SetDriverParam", "[TVR_INFO] tvrcimSetDriverParam succeeded"));
        EXPECT_EQ(host.calls("LRM_SetDriverParam"), 1u);
        host.unload();
    }
}

struct RefusalRow
{
    Arguments arguments;
    const char* fault;
    std::uint64_t status;
    unsigned calls; ///< of the library
    const char* line;
};

TEST(DriverParameterService, AnswersWhatItOrTheLibraryRefuses)
{
    const std::string longest(255 - sizeof "device-timeout", '0'); // behind name and "="
    const Value text = Value::string("device-timeout"), number = Value::string("77");
    const Value zero = Value::uint8(0), two = Value::uint8(2);
    const char* const byLibrary = "[TVR_DBG] RM_SetDriverParam fails with status : 1";
    const char* const tooLong = "[TVR_ERR] The driver parameter's text is too long";
    const RefusalRow rows[] = {
        {{zero, two}, "", 1, 0, "[TVR_ERR] INVALID CW1"},
        {{two, zero}, "", 1, 0, "[TVR_ERR] INVALID CW2"},
        {{zero, zero, Value::null(CMPI_string), number},
         "",
         1,
         0,
         "[TVR_ERR] Null pointer assignment in argument pDriverParam"},
        {{zero, zero, text, Value::null(CMPI_string)}, "", 1, 0, "[TVR_ERR] Null pointer assignment in argument pVal"},
        {{zero, zero, text, Value::string(longest + "77")}, "", 1, 0, tooLong},
        {{zero, zero, Value::string(std::string(10000, 'n')), number}, "", 1, 0, tooLong},
        {{zero, zero, text, Value::string("")}, "", 1, 1, byLibrary},
        {{zero, zero, text, Value::string("12abc")}, "", 1, 1, byLibrary},
        {{zero, zero, text, Value::string("256")}, "", 1, 1, byLibrary}, // up to 255
        {{zero, zero, text, Value::string("-1")}, "", 1, 1, byLibrary},
        {{zero, zero, Value::string("device-timeout=5\n"), number}, "", 1, 1, byLibrary},
        {{zero, zero, Value::string("d\xC3\xA9lai"), number}, "", 1, 1, byLibrary},
        {{zero, zero, Value::string(""), number}, "", 1, 1, byLibrary},
        {{},
         R"({"function": "LRM_SetDriverParam", "status": 97})",
         97,
         1,
         "[TVR_DBG] RM_SetDriverParam fails with status : 97"},
    };
    for (const RefusalRow& row : rows)
    {
        SCOPED_TRACE(row.line);
        Host host;
        if (*row.fault)
            host.addFault(row.fault);
        EXPECT_EQ(set(host, row.arguments), row.status);
        EXPECT_EQ(host.calls("LRM_SetDriverParam"), row.calls);
        EXPECT_EQ(host.logged(row.line), 1u);
        EXPECT_EQ(host.logged("[TVR_ERR] tvrcimSetDriverParam failed with status : " + std::to_string(row.status)), 1u);
        EXPECT_THAT(values(host), ElementsAre(30, 10, 30, 20));
        host.unload();
    }
}

TEST(DriverParameterService, TakesTheLongestTextThatFits)
{
    Host host;
    const std::string value = std::string(255 - sizeof "device-timeout" - 2, '0') + "77";
    EXPECT_EQ(set(host, {Value::uint8(0), Value::uint8(0), Value::string("device-timeout"), Value::string(value)}), 0u);
    EXPECT_THAT(values(host), ElementsAre(77, 10, 30, 20));
    host.unload();
}

TEST(DriverParameterService, ChangesNothingForAWrongServiceOrPort)
{
    Host host;
    const broker::Path service = pathOf(host, "TVRHBA_FCHBADriverParamService");
    broker::Path noService = service;
    noService.setKey("Name", Value::string("another"));
    broker::Path noPort = portPath(host);
    noPort.setKey("DeviceID", Value::string("1000027a51160210"));
    const auto refused = [&](const broker::Path& path, const Value& target)
    {
        const auto reply = host.broker().invokeMethod(path, "SetDriverParameter", argumentsOf(target, {}));
        EXPECT_TRUE(reply.ok()) << reply.message;
        return reply.returnValue.asUnsigned();
    };
    EXPECT_EQ(refused(noService, Value::reference(portPath(host))), 33068u);
    EXPECT_EQ(host.logged("[TVR_ERR] Invalid instance of HBA Driver Parameter Service"), 1u);
    EXPECT_EQ(refused(service, Value::reference(noPort)), 32968u);
    EXPECT_EQ(refused(service, Value::null(CMPI_ref)), 32968u);
    EXPECT_EQ(host.logged("[TVR_ERR] TVRHBA_FCHBADriverParamService_Provider invald fc port ...return"), 2u);
    EXPECT_EQ(host.calls("LRM_SetDriverParam"), 0u);
    host.unload();
}

/// Flags that are not sent are not set.
TEST(DriverParameterService, FlagsMayBeLeftOut)
{
    Host host;
    EXPECT_EQ(set(host, {Value::null(CMPI_uint8), Value::null(CMPI_uint8)}), 0u);
    EXPECT_THAT(values(host), ElementsAre(77, 10, 30, 20));
    host.unload();
}

} // namespace
