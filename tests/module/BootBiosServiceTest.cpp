// Boot code of the adapters: what a client switches and asks for.
#include "tests/module/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::ElementsAre;
using testing::ElementsAreArray;

namespace
{

class BootHost : public ServiceHost
{
public:
    BootHost() : ServiceHost("TVRHBA_BootBIOSService", "default") {}

    static std::string entryOf(const std::string& method)
    {
        const std::string entry = "[TVR_DBG] TVRHBA_BootBIOSService_Provider::" + method;
        return method == "GetBootBIOSStatus" ? entry : entry + "()";
    }
    Answer on(const std::string& method) { return callOnPort(method, entryOf(method)); }
    std::uint64_t state() { return on("GetBootBIOSStatus").at("nBootBIOSStatus").asUnsigned(); }
};

std::vector<std::string> linesOfSet(const char* letter)
{
    return {"[TVR_DBG] Entering TVR_MethodWrapper::tvrcimSetBootBiosState",
            std::string("[TVR_DBG] CtrlWord is  ") + letter, "[TVR_DBG] BootBios State has been set",
            "[TVR_INFO] TVRHBA_BootBIOSService_Provider::tvrcimSetBootBiosState O.K."};
}

TEST(BootBios, WhatIsSwitchedIsReadAtOnce)
{
    BootHost host;
    EXPECT_EQ(host.logged("[TVR_DBG] TVRHBA_BootBIOSService_Provider::load()"), 1u);
    const Answer first = host.on("GetBootBIOSStatus");
    EXPECT_EQ(first.value, 0u);
    EXPECT_EQ(first.at("nBootBIOSStatus").asUnsigned(), 1u);
    EXPECT_THAT(first.lines, ElementsAre("[TVR_DBG] Entering TVR_MethodWrapper::tvrcimGetBootBiosState",
                                         "[TVR_DBG] _BootCodeEnabled: [ 1 ]",
                                         "[TVR_INFO] TVRHBA_BootBIOSService_Provider::tvrcimGetBootBiosState O.K."));
    const Answer disabled = host.on("DisableBootBIOS");
    EXPECT_EQ(disabled.value, 0u);
    EXPECT_THAT(disabled.lines, ElementsAreArray(linesOfSet("D")));
    EXPECT_EQ(host.state(), 0u);
    const Answer enabled = host.on("EnableBootBIOS");
    EXPECT_EQ(enabled.value, 0u);
    EXPECT_THAT(enabled.lines, ElementsAreArray(linesOfSet("E")));
    EXPECT_EQ(host.state(), 1u);
    host.unload();
}

TEST(BootBios, FailuresOfTheLibraryChangeNothing)
{
    const std::string failedToGet = "[TVR_ERR] TVRHBA_BootBIOSService_Provider::tvrcimGetBootBiosState failed";
    const std::string failedToSet = "[TVR_ERR] TVRHBA_BootBIOSService_Provider::tvrcimSetBootBiosState failed";
    const struct
    {
        const char* fault; ///< or an attribute
        const char* method;
        std::uint64_t value;
        std::vector<std::string> last; ///< lines
    } rows[] = {
        {R"({"function": "LRM_SetBootBiosState", "status": 97})",
         "DisableBootBIOS",
         97,
         {"[TVR_ERR] ERROR: RM_SetBootBiosState failure: 97", failedToSet}},
        {R"({"function": "LRM_SetBootBiosState", "status": 2})",
         "EnableBootBIOS",
         2,
         {"[TVR_ERR] ERROR: RM_SetBootBiosState failure: 2", failedToSet}},
        {R"({"function": "LRM_GetHBAAttributes", "status": 8})",
         "GetBootBIOSStatus",
         1,
         {"[TVR_ERR] ERROR: RM_GetHBAAttributes call failed (8)", failedToGet}},
        {R"({"function": "RM_GetAttributeValue", "status": 5})",
         "GetBootBIOSStatus",
         1,
         {"[TVR_DBG] ERROR: RM_GetHBAAttributeValue HA__BootCodeEnabled call failed (5)", failedToGet}},
        {R"({"raw": {"0x214": "01"}})",
         "GetBootBIOSStatus",
         1,
         {"[TVR_DBG] ERROR: RM_GetHBAAttributeValue HA__BootCodeEnabled call failed (1)", failedToGet}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.fault);
        BootHost host;
        if (std::string(row.fault).find("function") != std::string::npos)
            host.addFault(row.fault);
        else
            host.setAttribute("1000027A51160210", row.fault);
        Answer answer = host.on(row.method);
        EXPECT_EQ(answer.value, row.value);
        EXPECT_TRUE(answer.at("nBootBIOSStatus").isNull());
        ASSERT_GE(answer.lines.size(), row.last.size());
        answer.lines.erase(answer.lines.begin(), answer.lines.end() - static_cast<std::ptrdiff_t>(row.last.size()));
        EXPECT_THAT(answer.lines, ElementsAreArray(row.last));
        host.unload();
    }
}

TEST(BootBios, EachMethodAsksForTheServiceAndAPort)
{
    BootHost host;
    for (const std::string method : {"EnableBootBIOS", "DisableBootBIOS", "GetBootBIOSStatus"})
        host.expectRefusals(method, BootHost::entryOf(method), "[TVR_ERR] Invalid instance of Boot BIOS Service",
                            method == "GetBootBIOSStatus"
                                ? "[TVR_ERR] TVRHBA_BootBIOSService_Provider GetBootBIOS invald fc port ...return"
                                : "[TVR_ERR] TVRHBA_BootBIOSService_Provider invald fc port ...return");
    EXPECT_EQ(host.calls("LRM_SetBootBiosState"), 0u);
    EXPECT_EQ(host.state(), 1u);
    host.unload();
}

} // namespace
