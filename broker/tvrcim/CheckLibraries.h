// The libraries of the adapters as the module finds them.
#pragma once

#include "broker/tvrcim/Findings.h"

#include <string>
#include <vector>

namespace tvrcim
{

/// Of what dlopen() gave.
std::string pathOfLibrary(void* library);

/// One of the libraries under the names that were tried for it.
struct Library
{
    std::string file = {}; ///< under which it was opened; empty where it was not
    std::string path = {};
    std::vector<std::string> tried = {};    ///< the names
    std::vector<std::string> failures = {}; ///< what the loader said of those that it did not open

    bool found() const { return !file.empty(); }
};

/// The libraries of the adapters. They stay open, as the module uses them in this process too.
class Libraries
{
public:
    /// Opens them in the order and under the names in which the module does.
    Libraries();

    bool anyFound() const { return _hbaApi.found() || _rm.found(); }
    /// Whether none is missing; one may serve as both.
    bool allFound() const;
    /// In one line, for who asks anything of a host that has none.
    std::string absence() const;
    /// Of each library: the path, what of it the module calls and it lacks, and, where the module has initialised it,
    /// its version.
    Findings findings(bool initialised) const;

private:
    const Library* hbaApiLibrary() const;
    Finding hbaApi() const;
    Finding rm(bool initialised) const;
    Finding tagging() const;

    Library _hbaApi;
    Library _rm;
};

} // namespace tvrcim
