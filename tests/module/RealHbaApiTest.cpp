// Discovery through the machine's HBA API common library, with the simulator as the vendor's library under it.
//
// The common library reads /etc/hba.conf and nothing else. So the test stands in a mount namespace of its own, in
// which that folder has a file of the test's.
#include "tests/module/Clock.h"
#include "tests/module/Host.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <fstream>
#include <map>
#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

using namespace module_test;
using namespace std::chrono_literals;
namespace fs = std::filesystem;

namespace
{

/// The machine's HBA API library under an /etc/hba.conf of the test's, for the calling thread and those that it makes.
class CommonLibrary
{
public:
    /// False if the machine does not let the process do this; `problem` says why.
    bool open()
    {
        if (unshare(CLONE_NEWNS) != 0 || mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0)
            return fails("a private mount namespace", std::strerror(errno));
        if (!configure())
            return fails("/etc/hba.conf", std::strerror(errno));
        // Opened by its path, it serves the module's dlopen by name.
        _library = dlopen(TVR_HBA_API_FILE, RTLD_NOW);
        return _library || fails("the HBA API library", dlerror());
    }
    ~CommonLibrary()
    {
        if (_library)
            dlclose(_library);
        for (const fs::path& place : _mounts)
            umount2(place.c_str(), MNT_DETACH);
        std::error_code ignored;
        fs::remove_all(_folder, ignored);
    }

    std::string problem;

private:
    /// Where the machine has no such file to stand before, the whole folder is one with links to the machine's files.
    bool configure()
    {
        std::string name = (fs::temp_directory_path() / "tvr-hba-XXXXXX").string();
        if (!mkdtemp(name.data()))
            return false;
        _folder = name;
        fs::create_directories(_folder / "etc");
        std::ofstream(_folder / "etc/hba.conf")
            << "com.tavrin.simulator " << TVR_SIMULATOR_FOLDER << "/libtvrsim_vendor.so\n";
        if (fs::exists("/etc/hba.conf"))
            return bind(_folder / "etc/hba.conf", "/etc/hba.conf");
        fs::create_directories(_folder / "machine");
        if (!bind("/etc", _folder / "machine"))
            return false;
        for (const fs::directory_entry& entry : fs::directory_iterator("/etc"))
            fs::create_symlink(_folder / "machine" / entry.path().filename(),
                               _folder / "etc" / entry.path().filename());
        return bind(_folder / "etc", "/etc");
    }
    bool bind(const fs::path& from, const fs::path& to)
    {
        if (mount(from.c_str(), to.c_str(), nullptr, MS_BIND | MS_REC, nullptr) != 0)
            return false;
        _mounts.insert(_mounts.begin(), to); // the latest is undone first
        return true;
    }
    bool fails(const char* what, const char* why)
    {
        problem = std::string("no ") + what + ": " + why;
        return false;
    }

    fs::path _folder;
    std::vector<fs::path> _mounts;
    void* _library = nullptr;
};

/// A machine that refuses the namespace cannot run these tests; one that builds for everybody must.
#define TVR_NEED_COMMON_LIBRARY(library)                                                                               \
    if (!(library).open())                                                                                             \
    {                                                                                                                  \
        if (std::getenv("CI"))                                                                                         \
            FAIL() << (library).problem;                                                                               \
        GTEST_SKIP() << (library).problem;                                                                             \
    }                                                                                                                  \
    static_assert(true)

constexpr Libraries withoutHbaApi{.hbaApi = false};
constexpr const char* counted[] = {"TVRHBA_Card",        "TVRHBA_PCIDevice", "TVRHBA_PhysicalConnector",
                                   "TVRHBA_LogicalDisk", "TVRHBA_TapeDrive", "TVRHBA_SCSIArbitraryLogicalUnit"};

std::map<std::string, std::size_t> countsOf(Host& host)
{
    std::map<std::string, std::size_t> counts;
    counts["TVRHBA_Card"] = host.instancesOf("TVRHBA_Card").size();
    EXPECT_TRUE(host.awaitRefresh());
    for (const char* name : counted)
        counts[name] = host.instancesOf(name).size();
    counts["targets"] = host.logged("[TVR_DBG] End Creating Target...");
    counts["errors"] = host.logged("[TVR_ERR]") + host.logged("[TVR_WARN]") + host.logged("[TVR_CRIT] HBAAPI");
    return counts;
}

TEST(RealHbaApi, ServesWhatTheStandInServes)
{
    std::map<std::string, std::size_t> expected;
    {
        Host host;
        expected = countsOf(host);
        host.unload();
    }
    ASSERT_EQ(expected["TVRHBA_Card"], 2u);
    ASSERT_GT(expected["targets"], 0u);

    CommonLibrary library;
    TVR_NEED_COMMON_LIBRARY(library);
    Host host("default", withoutHbaApi);
    for (int load = 0; load < 2; ++load)
    {
        EXPECT_EQ(countsOf(host), expected);
        host.unload();
        fs::remove(host.root() / "provider.log");
    }
    EXPECT_EQ(host.calls("HBA_GetVersion"), 2u) << "only the common library asks the vendor's for it";
}

TEST(RealHbaApi, AdapterThatFailsAddsANamelessOneAtEachRefreshAndCostsNoOther)
{
    CommonLibrary library;
    TVR_NEED_COMMON_LIBRARY(library);
    stopClock();
    Host host("default", withoutHbaApi);
    host.addFault(R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-2", "status": 1})");
    constexpr std::size_t refreshes = 8;
    for (std::size_t i = 1; i <= refreshes; ++i)
    {
        host.instancesOf("TVRHBA_Card");
        ASSERT_TRUE(host.awaitRefresh(i));
        EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 3u);
        EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
        EXPECT_EQ(host.logged("[TVR_DBG] Number of Adapters detected = " + std::to_string(3 + i)), 1u);
        advanceClock(10min);
    }
    // One more nameless entry at each refresh, each skipped once.
    EXPECT_EQ(host.logged("[TVR_WARN] Error hbaStatus = 1, Skipping Adapter# "), refreshes * (refreshes + 1) / 2);
    EXPECT_EQ(host.logged("[TVR_ERR]"), 0u);
    host.unload();
    EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 3u);
    EXPECT_EQ(host.logged("[TVR_DBG] Number of Adapters detected = 4"), 2u) << "a new load begins anew";
    host.unload();
}

} // namespace
