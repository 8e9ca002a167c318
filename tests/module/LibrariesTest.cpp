// Hosts on which one or more of the hardware libraries are absent.
#include "tests/module/Host.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <ostream>

using namespace module_test;

namespace
{

struct Row
{
    const char* name;
    Libraries libraries;
    bool loads;
    std::size_t cards;
    const char* rmPrefix; ///< of the names through which the RM library is called; empty for no calls
    std::vector<const char*> failedToOpen;
};

void PrintTo(const Row& row, std::ostream* out)
{
    *out << row.name;
}

// hbaApi, localRm, fallbackRm
const Row rows[] = {
    {"All", {true, true, true}, true, 2, "LRM_", {}},
    {"HbaApiAndLocalRm", {true, true, false}, true, 2, "LRM_", {}},
    {"HbaApiAndFallbackRm", {true, false, true}, true, 2, "RM_", {"liblrmapi.so"}},
    {"OnlyHbaApi", {true, false, false}, false, 0, "", {"liblrmapi.so", "librmapi.so"}},
    // With the local RM library at hand the fallback is not opened, so nothing stands in for the HBA API.
    {"BothRm", {false, true, true}, true, 0, "LRM_", {"libHBAAPI.so.2", "libHBAAPI.so"}},
    {"OnlyLocalRm", {false, true, false}, true, 0, "LRM_", {"libHBAAPI.so.2", "libHBAAPI.so"}},
    {"OnlyFallbackRm", {false, false, true}, true, 2, "RM_", {"libHBAAPI.so.2", "libHBAAPI.so", "liblrmapi.so"}},
    {"None", {false, false, false}, false, 0, "", {"libHBAAPI.so.2", "libHBAAPI.so", "liblrmapi.so", "librmapi.so"}},
};

class AbsentLibraries : public testing::TestWithParam<Row>
{};

TEST_P(AbsentLibraries, LeaveTheRestOfTheHostServed)
{
    const Row& row = GetParam();
    Host host("default", row.libraries);
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), row.cards);
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 2 * row.cards);
    EXPECT_EQ(host.logged("[TVR_DBG] End Creating Target...") == 0, row.cards == 0);
    EXPECT_EQ(host.instancesOf("TVRHBA_RegisteredProfile").size(), 14u) << "they need no library";
    EXPECT_EQ(host.instancesOf("TVRHBA_RecordLog").size(), (row.loads ? 1u : 0u) + (row.cards ? 1u : 0u));

    // The loader's text names the file with its folder.
    std::vector<std::string> failures;
    for (const std::string& line : host.log())
        if (line.starts_with("[TVR_ERR] dlopen failed :"))
            failures.push_back(line);
    ASSERT_EQ(failures.size(), row.failedToOpen.size());
    for (std::size_t i = 0; i < failures.size(); ++i)
        EXPECT_THAT(failures[i], testing::HasSubstr(std::string("/") + row.failedToOpen[i] + ": "));
    const bool fallback = row.loads && !row.libraries.localRm;
    EXPECT_EQ(host.logged("[TVR_ERR] Error : In Loading Library "), fallback ? 1u : 0u);
    EXPECT_EQ(host.logged("[TVR_ERR] Tavrin CIM Provider load failure"), row.loads ? 0u : 1u);
    EXPECT_EQ(host.logged("[TVR_CRIT] HBAAPI reports that there are NO HBAs in the system."),
              row.loads && row.cards == 0 ? 1u : 0u);

    for (const std::string prefix : {"LRM_", "RM_"})
    {
        const bool used = row.rmPrefix == prefix;
        EXPECT_EQ(host.calls(prefix + "InitLib"), used ? 1u : 0u) << prefix;
        EXPECT_EQ(host.calls(prefix + "GetHBAAttributes"), used && row.cards > 0 ? 5u : 0u)
            << prefix; // each, and diagnostics
        EXPECT_EQ(host.calls(prefix + "DiagReadPCIRegistersV2") > 0, used && row.cards > 0) << prefix;
    }
    EXPECT_EQ(host.calls("HBA_LoadLibrary"), row.cards > 0 ? 1u : 0u);
    host.unload();
    EXPECT_EQ(host.calls("HBA_FreeLibrary") > 0, row.libraries.hbaApi || row.cards > 0);
}

INSTANTIATE_TEST_SUITE_P(Combinations, AbsentLibraries, testing::ValuesIn(rows),
                         [](const auto& info) { return info.param.name; });

} // namespace
