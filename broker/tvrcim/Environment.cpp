#include "broker/tvrcim/Environment.h"

#include <array>
#include <cstdlib>
#include <fstream>
#include <initializer_list>
#include <stdexcept>

#include <dlfcn.h>
#include <unistd.h>

namespace tvrcim
{

namespace fs = std::filesystem;

namespace
{

fs::path executableFolder()
{
    std::error_code error;
    const fs::path executable = fs::read_symlink("/proc/self/exe", error);
    return error ? fs::path() : executable.parent_path();
}

/// The first of the folders that has the file; empty if none has. Folders are named from the executable's: the same one
/// serves where it is built and where it is installed, and knows neither place.
fs::path locate(std::initializer_list<fs::path> folders, const std::string& file)
{
    for (const fs::path& folder : folders)
    {
        std::error_code error;
        if (fs::is_regular_file(folder / file, error))
            return folder / file;
    }
    return {};
}

void* openLibrary(const std::string& file)
{
    const fs::path folder = executableFolder();
    const fs::path path = locate({folder / "../simulator", folder / "../lib/tavrin-fc-simulator"}, file);
    if (path.empty())
        throw std::runtime_error("the simulator's " + file + " is not installed; use --hardware for real adapters");
    void* library = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
    if (!library)
        throw std::runtime_error(std::string("cannot open the simulator: ") + dlerror());
    return library; // stays open: the simulated host lives as long as the process
}

void copyText(const fs::path& from, const fs::path& to)
{
    // Read as a stream, since files below /proc tell no size.
    std::ofstream(to) << std::ifstream(from).rdbuf();
}

} // namespace

std::string findModule()
{
    const std::string file = "libtavrin_fc_provider.so";
    const fs::path folder = executableFolder();
    const fs::path path = locate({folder / "../module", folder / "../lib", folder / "../lib64/cmpi",
                                  folder / "../lib/cmpi", folder / "../lib/" TVRCIM_MULTIARCH "/cmpi"},
                                 file);
    return path.empty() ? file : path.lexically_normal().string();
}

std::string findRegistration(const std::string& module)
{
    const fs::path path(module);
    std::string name = path.stem();
    const std::string file = name.erase(0, name.starts_with("lib") ? 3 : 0) + ".reg";
    const fs::path beside = path.has_parent_path() ? path.parent_path() : executableFolder();
    const char* installed = "share/tavrin-fc-provider/mof"; // the module is in lib/cmpi or in lib/<architecture>/cmpi
    return locate({beside, beside / "../generated/mof", beside / "../.." / installed, beside / "../../.." / installed,
                   executableFolder() / ".." / installed, executableFolder() / "../generated/mof"},
                  file)
        .string();
}

std::string findRegisterScript()
{
    const std::string file = "tavrin-fc-register";
    const fs::path path = locate({executableFolder() / "../sbin"}, file);
    return path.empty() ? file : path.string();
}

void startSimulator(const std::string& scenario)
{
    void* core = openLibrary("libtvrsim.so");
    openLibrary("liblrmapi.so");
    openLibrary("libHBAAPI.so.2");
    if (scenario.empty())
        return;
    using Load = int (*)(const char* path, char* error, std::size_t errorSize); // 1 for success
    const auto load = reinterpret_cast<Load>(dlsym(core, "tvrsim_load_scenario"));
    std::array<char, 1024> error{};
    if (!load || load(scenario.c_str(), error.data(), error.size()) != 1)
        throw std::runtime_error(load ? error.data() : "the simulator cannot load scenarios");
}

FileRoot::FileRoot(SignalEnd& signals)
{
    if (std::getenv("TVR_FILE_ROOT"))
        return;
    std::string name = (fs::temp_directory_path() / "tvrcim-XXXXXX").string();
    if (!mkdtemp(name.data()))
        throw std::runtime_error("cannot make a folder in " + fs::temp_directory_path().string());
    _path = name;
    signals.removes(_path);
    for (const char* folder : {"etc", "proc", "tmp", "var/log", "opt/ibm/platform/log"})
        fs::create_directories(_path / folder);
    for (const char* file : {"proc/version", "etc/issue"})
        copyText(fs::path("/") / file, _path / file);
    std::ofstream(_path / "etc/tvr_smis.conf") << "https://fabricore.example.net/weblaunch\n";
    setenv("TVR_FILE_ROOT", name.c_str(), 1);
}

FileRoot::~FileRoot()
{
    if (!_path.empty())
    {
        std::error_code error;
        fs::remove_all(_path, error);
    }
}

} // namespace tvrcim
