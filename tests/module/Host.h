// A process with a simulated host, files of its own and the module: what every module test stands on.
#pragma once

#include "broker/core/Broker.h"
#include "simulator/Control.h"

#include <filesystem>
#include <memory>
#include <string>
#include <vector>

namespace module_test
{

/// The simulator's libraries, loaded by path so that the module finds them by name. Absent libraries stay absent: the
/// library path of a test process does not lead to them.
struct Libraries
{
    bool hbaApi = true;
    bool localRm = true;
    bool fallbackRm = false;
};

class Host
{
public:
    /// A fresh host from a scenario: a name of simulator/scenarios without its ending, or JSON text. Files live in a
    /// temporary folder that the module takes for the root; everything is logged to a file in it.
    explicit Host(const std::string& scenario = "default", Libraries libraries = {});
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    /// The broker with the module in it, made on first use.
    broker::Broker& broker();
    /// Options of the broker, for changes before its first use. It plays the server that the environment variable
    /// TVR_BROKER_PERSONALITY names, the strict one without it.
    broker::Options options;
    /// Unloads the module and checks that it left nothing behind.
    void unload();
    /// Ends the broker alone: the next use makes another one.
    void closeBroker() { _broker.reset(); }
    /// The same with the former broker alive, as a server is for threads of a library that it closed.
    void setBrokerAside() { _former = std::move(_broker); }

    broker::Reply enumerate(const std::string& className);
    std::vector<broker::Object> instancesOf(const std::string& className);

    std::filesystem::path root() const { return _root; }
    /// Writes a file below the root, with its folders.
    void write(const std::string& path, const std::string& text) const;
    std::string read(const std::string& path) const;
    /// Lines of the module's log so far, without thread, time and place: "[TVR_DBG] text".
    std::vector<std::string> log() const;
    /// How many lines of the log have this text behind their level, such as "[TVR_ERR] dlopen failed".
    std::size_t logged(const std::string& levelAndText) const;
    /// Waits until the log has at least so many such lines; false if that does not happen in time.
    bool awaitLog(const std::string& levelAndText, std::size_t lines = 1) const;
    /// Waits until the module has done so many refreshes.
    bool awaitRefresh(std::size_t refreshes = 1) const;

    /// Remembers the state of the simulated host, and names what differs from it; empty if nothing does.
    void rememberState();
    std::string stateDifference() const;
    void addFault(const std::string& row);
    /// The same for a row that the function may have no use for; false then.
    bool takesFault(const std::string& row);
    void clearFaults();
    std::uint64_t calls(const std::string& function) const;
    void setPortState(const char* wwpn, std::uint32_t state);
    /// One attribute of a port, of its statistics or of its adapter: {"name": value}, as in a scenario.
    void setAttribute(const char* wwpn, const char* attribute);
    /// How the tests of a port go: what a scenario has under "diagnostics".
    void setDiagnostics(const char* wwpn, const char* diagnostics);
    /// Of the adapter behind a port, or of the driver where `wwpn` is null.
    void setDriverParameter(const char* wwpn, const char* name, std::uint32_t current);
    /// Names of ports come into force that wait for a restart of the host; without power the volatile ones are lost.
    void reboot(bool powerDown = false);
    /// Lets calls go on that a fault row holds at a gate.
    void openGate(const std::string& gate);
    /// Waits until so many calls are held at a gate; false if that does not happen in time.
    bool awaitGate(const std::string& gate, unsigned calls = 1);

private:
    std::filesystem::path _root;
    std::vector<void*> _libraries;
    std::unique_ptr<broker::Broker> _former;
    std::unique_ptr<broker::Broker> _broker;
};

/// Text of a property; empty when it is null or absent.
std::string text(const broker::Object& object, const std::string& property);

} // namespace module_test
