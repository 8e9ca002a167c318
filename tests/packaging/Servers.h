// Command-line tools that stand in for those of two CIM servers: they write what they are called with into a log, and
// keep as much state as the script that calls them can see.
#pragma once

#include "tests/packaging/Folder.h"

#include <string>

class Servers
{
public:
    /// The script, its data and a few tools of the system are all that is there.
    Servers();

    /// A server with a provider folder and, in the namespaces that it begins with, a CIM schema without the
    /// experimental classes.
    void installSmallFootprint() const;
    void installOpenGroup() const;
    void startOpenGroup() const;

    /// Of its units that one is active.
    void installSystemd(const std::string& unit) const;

    /// Runs the script. What it printed has "ROOT" for the test's folder and "TMP" for its temporary one.
    struct Run
    {
        int exitCode;
        std::string text; ///< both streams
    };
    Run run(const std::string& arguments) const;

    /// Runs one of the script's files as package managers do: with the system's tools in PATH, and none of a server's.
    Run runByPackage(const std::string& command) const;
    /// What the tool's check of the host says of CIM servers.
    std::string check() const;

    /// What the tools that change something were called with since the last time, a call a line.
    std::string takeCalls() const;

    /// All files below a server's folder with their contents.
    std::string stateOf(const std::string& server) const;

    const Folder& root() const { return _root; }

private:
    void tool(const std::string& name, const std::string& body, const std::string& folder = "bin") const;
    void serverTool(const std::string& name, const std::string& body) const;
    Run shell(const std::string& environment, const std::string& command) const;
    std::string readable(std::string text) const;

    Folder _root;
};
