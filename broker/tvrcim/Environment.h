// What must be in place before the module is opened: the simulator's libraries, a scenario, a file tree of its own.
#pragma once

#include "broker/tvrcim/SignalEnd.h"

#include <filesystem>
#include <optional>
#include <string>

namespace tvrcim
{

/// The provider module beside this executable: in the build tree, in an installation, or by the loader's search path.
std::string findModule();

/// The registration file of a module: beside it, in the build tree, or in an installation; empty if there is none.
std::string findRegistration(const std::string& module);

/// The script that registers the module in CIM servers: of the tool's installation, or a name to look for in PATH.
std::string findRegisterScript();

/// Opens the simulator's libraries, so that the module finds them by name, and loads a scenario file unless its name is
/// empty (the simulator then shows its default host). Throws std::runtime_error with the reason.
void startSimulator(const std::string& scenario);

/// A temporary file tree that the process's fixed paths lead into; removed with the object.
class FileRoot
{
public:
    /// Does nothing when TVR_FILE_ROOT is set already. The tree is removed by the signals too.
    explicit FileRoot(SignalEnd& signals);
    ~FileRoot();
    FileRoot(const FileRoot&) = delete;
    FileRoot& operator=(const FileRoot&) = delete;

private:
    std::filesystem::path _path;
};

} // namespace tvrcim
