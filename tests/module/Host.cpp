#include "tests/module/Host.h"

#include "tests/module/Process.h"
#include "tests/module/RefreshLines.h"
#include "tests/support/Eventually.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <dlfcn.h>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <unistd.h>

namespace module_test
{

namespace
{

namespace fs = std::filesystem;

void* openLibrary(const char* file)
{
    void* library = dlopen((fs::path(TVR_SIMULATOR_FOLDER) / file).c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!library)
        throw std::runtime_error(dlerror());
    return library;
}

void* controlFunction(const char* name)
{
    static void* const simulator = openLibrary("libtvrsim.so");
    return dlsym(simulator, name);
}

/// A control function of the simulator, which stays loaded for the life of the process. Looked up at the first use at
/// its place only: a dlclose in another thread holds look-ups back.
#define TVR_CONTROL(name)                                                                                              \
    (*[]                                                                                                               \
     {                                                                                                                 \
         static auto* const function = reinterpret_cast<decltype(::name)*>(controlFunction(#name));                    \
         return function;                                                                                              \
     }())

void loadScenario(const std::string& scenario)
{
    char error[1024] = "";
    const bool isText = scenario.find('{') != std::string::npos;
    const std::string file = (fs::path(TVR_SCENARIO_FOLDER) / (scenario + ".json")).string();
    const int loaded = isText ? TVR_CONTROL(tvrsim_load_scenario_text)(scenario.c_str(), error, sizeof(error))
                              : TVR_CONTROL(tvrsim_load_scenario)(file.c_str(), error, sizeof(error));
    if (!loaded)
        throw std::runtime_error(error);
}

fs::path makeRoot()
{
    std::string name = (fs::temp_directory_path() / "tvr-module-XXXXXX").string();
    if (!mkdtemp(name.data()))
        throw std::runtime_error("no temporary folder");
    return name;
}

/// The server that the environment names; without, the strict one.
const broker::Personality& chosenPersonality()
{
    const char* name = std::getenv("TVR_BROKER_PERSONALITY");
    const broker::Personality* personality = name ? broker::findPersonality(name) : &broker::strict;
    if (!personality)
        throw std::runtime_error(std::string("there is no personality ") + name);
    return *personality;
}

/// The part of a log line from the level on: "[threadid =1l] [time] [File.cpp:12][TVR_DBG] text".
std::string fromLevel(const std::string& line)
{
    const std::size_t level = line.find("][TVR_");
    return level == std::string::npos ? line : line.substr(level + 1);
}

} // namespace

Host::Host(const std::string& scenario, Libraries libraries) : _root(makeRoot())
{
    options.module = TVR_MODULE_FILE;
    options.registration = TVR_REGISTRATION_FILE;
    options.personality = chosenPersonality();
    // A server that calls fewer cleanups ends its process then, which only the tests of that end can do.
    options.personality.cleanupCalls = broker::CleanupCalls::each;
    write("/proc/version", "Linux version 6.1.0 (test)\n");
    write("/etc/issue", "Debian GNU/Linux 12 \\n \\l\n");
    write("/etc/tavrin_fc_provider.dmp", "2,5,1\n" + (_root / "provider.log").string());
    write("/etc/tvr_smis.conf", "# Management page\n  https://fabricore.example.net/weblaunch\n");
    setenv("TVR_FILE_ROOT", _root.c_str(), 1);
    loadScenario(scenario);
    if (libraries.hbaApi)
        _libraries.push_back(openLibrary("libHBAAPI.so.2"));
    if (libraries.localRm)
        _libraries.push_back(openLibrary("liblrmapi.so"));
    if (libraries.fallbackRm)
        _libraries.push_back(openLibrary("librmapi.so"));
}

Host::~Host()
{
    TVR_CONTROL(tvrsim_clear_faults)(); // opens every gate, so that the refresh can end
    _broker.reset();
    for (void* library : _libraries)
        dlclose(library);
    std::error_code ignored;
    fs::remove_all(_root, ignored);
}

broker::Broker& Host::broker()
{
    if (!_broker)
        _broker = std::make_unique<broker::Broker>(options);
    return *_broker;
}

void Host::unload()
{
    for (const broker::CleanupAnswer& answer : broker().unload())
        EXPECT_EQ(answer.status, CMPI_RC_OK) << answer.className;
    for (const broker::Violation& violation : broker().violations())
        ADD_FAILURE() << violation.text;
    // The process of a server that calls fewer cleanups ends here, and with it what the module still holds.
    if (options.personality.cleanupCalls == broker::CleanupCalls::each)
    {
        EXPECT_EQ(TVR_CONTROL(tvrsim_open_handles)(), 0u);
        EXPECT_EQ(semaphoresOf(getpid()), 0u);
    }
    _broker.reset();
}

broker::Reply Host::enumerate(const std::string& className)
{
    return broker().enumerateInstances("root/tavrin", className);
}

std::vector<broker::Object> Host::instancesOf(const std::string& className)
{
    broker::Reply reply = enumerate(className);
    EXPECT_TRUE(reply.ok()) << className << ": " << broker::statusName(reply.status) << " " << reply.message;
    return std::move(reply.objects);
}

void Host::write(const std::string& path, const std::string& text) const
{
    const fs::path file = _root.string() + path;
    fs::create_directories(file.parent_path());
    std::ofstream(file) << text;
}

std::string Host::read(const std::string& path) const
{
    std::ostringstream text;
    text << std::ifstream(_root.string() + path).rdbuf();
    return text.str();
}

std::vector<std::string> Host::log() const
{
    std::vector<std::string> lines;
    std::ifstream file(_root / "provider.log");
    for (std::string line; std::getline(file, line);)
        lines.push_back(fromLevel(line));
    return lines;
}

std::size_t Host::logged(const std::string& levelAndText) const
{
    const std::vector<std::string> lines = log();
    return static_cast<std::size_t>(std::count_if(
        lines.begin(), lines.end(), [&](const std::string& line) { return line.starts_with(levelAndText); }));
}

bool Host::awaitLog(const std::string& levelAndText, std::size_t lines) const
{
    return test_support::eventually([&] { return logged(levelAndText) >= lines; });
}

bool Host::awaitRefresh(std::size_t refreshes) const
{
    return awaitLog(ended, refreshes);
}

void Host::rememberState()
{
    TVR_CONTROL(tvrsim_remember_host)();
}

std::string Host::stateDifference() const
{
    char text[256] = "";
    TVR_CONTROL(tvrsim_host_difference)(text, sizeof(text));
    return text;
}

void Host::addFault(const std::string& row)
{
    char error[1024] = "";
    if (!TVR_CONTROL(tvrsim_add_fault)(row.c_str(), error, sizeof(error)))
        throw std::runtime_error(error);
}

bool Host::takesFault(const std::string& row)
{
    return TVR_CONTROL(tvrsim_add_fault)(row.c_str(), nullptr, 0) != 0;
}

void Host::clearFaults()
{
    TVR_CONTROL(tvrsim_clear_faults)();
}

std::uint64_t Host::calls(const std::string& function) const
{
    return TVR_CONTROL(tvrsim_call_count)(function.c_str());
}

void Host::setPortState(const char* wwpn, std::uint32_t state)
{
    if (!TVR_CONTROL(tvrsim_set_port_state)(wwpn, state))
        throw std::runtime_error(std::string("no port ") + wwpn);
}

void Host::setAttribute(const char* wwpn, const char* attribute)
{
    char error[1024] = "";
    if (!TVR_CONTROL(tvrsim_set_attribute)(wwpn, attribute, error, sizeof(error)))
        throw std::runtime_error(error);
}

void Host::setDiagnostics(const char* wwpn, const char* diagnostics)
{
    char error[1024] = "";
    if (!TVR_CONTROL(tvrsim_set_diagnostics)(wwpn, diagnostics, error, sizeof(error)))
        throw std::runtime_error(error);
}

void Host::setDriverParameter(const char* wwpn, const char* name, std::uint32_t current)
{
    if (!TVR_CONTROL(tvrsim_set_driver_parameter)(wwpn, name, current))
        throw std::runtime_error(std::string("no driver parameter ") + name);
}

void Host::reboot(bool powerDown)
{
    TVR_CONTROL(tvrsim_reboot)(powerDown);
}

void Host::openGate(const std::string& gate)
{
    TVR_CONTROL(tvrsim_open_gate)(gate.c_str());
}

bool Host::awaitGate(const std::string& gate, unsigned calls)
{
    return TVR_CONTROL(tvrsim_await_gate)(gate.c_str(), calls, 20000) != 0;
}

std::string text(const broker::Object& object, const std::string& property)
{
    const broker::Value& value = object.get(property);
    return value.isNull() ? std::string() : value.asString();
}

} // namespace module_test
