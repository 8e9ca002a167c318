// The shared objects themselves: what they export, and that they serve one host.
#include "Opened.h"
#include "Scenarios.h"

#include "simulator/Control.h"
#include "simulator/EntryPoints.h"

#include <gmock/gmock.h>

#include <time.h> // vendorhbaapi.h uses struct tm

#include <vendorhbaapi.h>

#include <sched.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <fstream>

namespace tvrsim
{
namespace
{

using testing::ElementsAreArray;

/// Names of the dynamic symbols that a shared object defines, sorted.
std::vector<std::string> definedSymbols(const std::string& file)
{
    std::vector<std::string> names;
    FILE* output = popen(("nm -D --defined-only --format=posix '" + file + "'").c_str(), "r");
    std::array<char, 512> line;
    while (output && std::fgets(line.data(), line.size(), output))
        names.push_back(std::string(line.data()).substr(0, std::string(line.data()).find(' ')));
    EXPECT_TRUE(output && pclose(output) == 0) << "nm " << file;
    std::ranges::sort(names);
    return names;
}

TEST(Libraries, ExportTheirEntryPointsAndNothingElse)
{
    EXPECT_THAT(definedSymbols(fileOf("liblrmapi.so")), ElementsAreArray(exportedNames(Library::local)));
    EXPECT_THAT(definedSymbols(fileOf("librmapi.so")), ElementsAreArray(exportedNames(Library::fallback)));
    EXPECT_THAT(definedSymbols(fileOf("libHBAAPI.so.2")), ElementsAreArray(exportedNames(Library::hbaApi)));
    EXPECT_THAT(definedSymbols(fileOf("libtvrsim_tagging.so")), ElementsAreArray(exportedNames(Library::tagging)));
    EXPECT_THAT(definedSymbols(fileOf("libtvrsim_vendor.so")), testing::ElementsAre("HBA_RegisterLibraryV2"));
    EXPECT_THAT(definedSymbols(fileOf("libtvrsim.so")), testing::Each(testing::StartsWith("tvrsim_")));
    EXPECT_THAT(exportedNames(Library::fallback), testing::Not(testing::Contains(testing::StartsWith("LRM_"))));
}

TEST(Libraries, AreFoundBySonameOnceLoaded)
{
    EXPECT_EQ(dlopen("liblrmapi.so", RTLD_NOW | RTLD_NOLOAD), nullptr);
    const Opened byPath(fileOf("liblrmapi.so"));
    const Opened byName("liblrmapi.so");
    EXPECT_EQ(byPath.handle(), byName.handle());
}

TEST(Libraries, ShareOneHostThatOutlivesThem)
{
    const Opened control(fileOf("libtvrsim.so"));
    ASSERT_TRUE(FUNCTION(control, tvrsim_load_scenario_text)(twoPorts, nullptr, 0));
    const auto count = FUNCTION(control, tvrsim_call_count);
    {
        const Opened hba(fileOf("libHBAAPI.so.2")), rm(fileOf("liblrmapi.so")), fallback(fileOf("librmapi.so"));
        ASSERT_EQ(FUNCTION(hba, HBA_LoadLibrary)(), HBA_STATUS_OK);
        EXPECT_EQ(FUNCTION(fallback, HBA_GetNumberOfAdapters)(), 1u);

        char name[256] = "";
        ASSERT_EQ(FUNCTION(hba, HBA_GetAdapterName)(0, name), HBA_STATUS_OK);
        const HBA_HANDLE handle = FUNCTION(hba, HBA_OpenAdapter)(name);
        HBA_FCPTARGETMAPPING mapping{};
        mapping.NumberOfEntries = 1;
        EXPECT_EQ(FUNCTION(hba, HBA_GetFcpTargetMapping)(handle, &mapping), HBA_STATUS_ERROR_MORE_DATA);
        EXPECT_EQ(mapping.NumberOfEntries, 5u);
        EXPECT_EQ(FUNCTION(control, tvrsim_open_handles)(), 1u);
        FUNCTION(hba, HBA_CloseAdapter)(handle);

        std::vector<std::byte> buffer(RM_PORT_STATISTICS_SIZE);
        std::uint32_t size = RM_PORT_STATISTICS_SIZE, length = 0;
        RM_STATUS status = RM_ERROR;
        const auto read = rm.function<RM_GetAttributeValue_t>("RM_GetAttributeValue");
        ASSERT_EQ(rm.function<RM_GetPortStatistics_t>("LRM_GetPortStatistics")(toHba(portA), buffer.data(), &size),
                  RM_OK);
        ASSERT_NE(read(buffer.data(), RM_PS_RX_FRAMES, &length, &status), nullptr);
        EXPECT_EQ(length, 8u);
        EXPECT_EQ(status, RM_OK);
        EXPECT_EQ(read(buffer.data(), RM_PS_TX_BYTES, &length, &status), nullptr);
        EXPECT_NE(status, RM_OK);
    }
    EXPECT_EQ(count("LRM_GetPortStatistics"), 1u);
    EXPECT_EQ(count("RM_GetPortStatistics"), 0u);
    EXPECT_EQ(count("RM_GetAttributeValue"), 2u);
    FUNCTION(control, tvrsim_reset_counts)();
    EXPECT_EQ(count("LRM_GetPortStatistics"), 0u);
}

TEST(Libraries, ControlReportsMistakes)
{
    const Opened control(fileOf("libtvrsim.so"));
    char error[48];
    EXPECT_FALSE(FUNCTION(control, tvrsim_load_scenario)("/nowhere.json", error, sizeof error));
    EXPECT_STREQ(error, "/nowhere.json: cannot be read");
    EXPECT_FALSE(FUNCTION(control, tvrsim_add_fault)("{}", error, sizeof error));
    EXPECT_STREQ(error, "fault: /: expected a member \"function\"");
    EXPECT_FALSE(FUNCTION(control, tvrsim_set_attribute)("12", R"({"sliMode": 4})", error, sizeof error));
    EXPECT_EQ(std::string(error).size(), sizeof error - 1) << "cut to the caller's room";
    EXPECT_FALSE(FUNCTION(control, tvrsim_set_port_state)("0000000000000001", HBA_PORTSTATE_OFFLINE));
}

/// Adapters of a process that never loaded a scenario, as its exit code.
[[noreturn]] void exitWithAdapterCount(const char* scenarioFile)
{
    if (scenarioFile)
        setenv("TVR_SIM_SCENARIO", scenarioFile, 1);
    const Opened hba(fileOf("libHBAAPI.so.2"));
    FUNCTION(hba, HBA_LoadLibrary)();
    _exit(static_cast<int>(FUNCTION(hba, HBA_GetNumberOfAdapters)()));
}

TEST(LibrariesDeathTest, FirstScenarioComesFromTheEnvironmentOrIsTheDefault)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe"); // a new process, in which nothing was loaded
    const auto adapters = static_cast<int>(readScenario(defaultScenarioText, "default").adapters.size());
    EXPECT_EXIT(exitWithAdapterCount(nullptr), testing::ExitedWithCode(adapters), "^$");
    EXPECT_EXIT(exitWithAdapterCount(TVRSIM_SCENARIO_FOLDER "/mixed.json"), testing::ExitedWithCode(8), "^$");
    EXPECT_EXIT(exitWithAdapterCount("/nowhere.json"), testing::ExitedWithCode(0),
                "simulator: /nowhere.json: cannot be read");
}

// The vendor library under Debian's common library.

constexpr const char* commonLibrary = "/usr/lib/libHBAAPI.so.2";
constexpr int cannotMount = 77;

/// In a process of its own: puts a configuration file that names the vendor library in the place of the system's,
/// for this process alone, and walks the adapters. Returns an exit code: 0, cannotMount or the step that failed.
int walkThroughCommonLibrary()
{
    const std::string file = testing::TempDir() + "/hba-" + std::to_string(getpid()) + ".conf";
    std::ofstream(file) << "example.simulated " << fileOf("libtvrsim_vendor.so") << '\n';
    const bool mounted = unshare(CLONE_NEWNS) == 0 && mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
                         mount(file.c_str(), "/etc/hba.conf", nullptr, MS_BIND, nullptr) == 0;
    std::remove(file.c_str());
    if (!mounted)
        return cannotMount;

    const Opened common(commonLibrary);
    const Opened control(fileOf("libtvrsim.so"));
    int step = 0;
    const auto check = [&step](bool good)
    {
        ++step;
        if (!good)
            _exit(step);
    };
    check(FUNCTION(control, tvrsim_load_scenario_text)(twoPorts, nullptr, 0));
    check(FUNCTION(common, HBA_LoadLibrary)() == HBA_STATUS_OK);
    check(FUNCTION(common, HBA_GetNumberOfAdapters)() == 1);
    char name[] = "Tavrin-A";
    const HBA_HANDLE handle = FUNCTION(common, HBA_OpenAdapter)(name);
    check(handle != 0);
    HBA_PORTATTRIBUTES port{};
    check(FUNCTION(common, HBA_GetAdapterPortAttributes)(handle, 1, &port) == HBA_STATUS_OK);
    check(fromHba(port.PortWWN) == portB);
    std::vector<std::byte> buffer(offsetof(HBA_FCPTARGETMAPPING, entry) + 5 * sizeof(HBA_FCPSCSIENTRY));
    auto* mapping = reinterpret_cast<HBA_FCPTARGETMAPPING*>(buffer.data());
    mapping->NumberOfEntries = 5;
    check(FUNCTION(common, HBA_GetFcpTargetMapping)(handle, mapping) == HBA_STATUS_OK);
    std::uint8_t response[8], sense[18];
    const auto inquiry = FUNCTION(common, HBA_SendScsiInquiry);
    const HBA_FCPID& unit = mapping->entry[0].FcpId;
    check(inquiry(handle, unit.PortWWN, unit.FcpLun, 0, 0, response, sizeof response, sense, sizeof sense) ==
          HBA_STATUS_SCSI_CHECK_CONDITION);
    check(sense[2] == 6);
    FUNCTION(common, HBA_CloseAdapter)(handle);
    check(FUNCTION(common, HBA_FreeLibrary)() == HBA_STATUS_OK);
    check(FUNCTION(control, tvrsim_call_count)("HBA_SendScsiInquiry") == 1);
    return 0;
}

TEST(Libraries, VendorLibraryServesTheCommonLibrary)
{
    if (access(commonLibrary, R_OK) != 0)
        GTEST_SKIP() << commonLibrary << " is not installed";
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0)
        _exit(walkThroughCommonLibrary());
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    if (WEXITSTATUS(status) == cannotMount)
        GTEST_SKIP() << "this process may not mount over /etc/hba.conf";
    EXPECT_EQ(WEXITSTATUS(status), 0) << "the number of the step that failed";
}

} // namespace
} // namespace tvrsim
