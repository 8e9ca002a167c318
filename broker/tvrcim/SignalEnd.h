// The end of the process by SIGHUP, SIGINT or SIGTERM: it leaves nothing of the module and no files behind.
#pragma once

#include "broker/core/Broker.h"

#include <chrono>
#include <filesystem>
#include <memory>
#include <mutex>

namespace tvrcim
{

/// Waits for the signals on a thread of its own. One that comes unloads the module, or gives it up when an operation
/// holds it for long, unlinks what the module named in the system, removes the folder, and ends the process with 128
/// plus its number, as shells report it. A signal that the process was started to ignore stays ignored.
class SignalEnd
{
public:
    /// Must be made before other threads start, since they inherit the signal mask.
    SignalEnd();
    SignalEnd(const SignalEnd&) = delete;
    SignalEnd& operator=(const SignalEnd&) = delete;

    void removes(const std::filesystem::path& folder);
    /// The broker whose module is unloaded; null takes it back. Does not return when a signal has come.
    void unloads(broker::Broker* broker);
    /// Does not return when a signal has come.
    void passIfNone();
    /// Whether SIGINT is noted from now on, once, rather than end the process; the next one does that.
    void notesInterrupt(bool notes);
    /// Whether one was noted, after at most so long.
    bool awaitInterrupt(std::chrono::milliseconds limit);

private:
    std::unique_lock<std::mutex> lockIfNone();

    struct State;
    std::shared_ptr<State> _state;
};

/// Work that SIGINT does not end but asks to end, as long as the object lives. `signals` may be null.
class Interruptible
{
public:
    explicit Interruptible(SignalEnd* signals) : _signals(signals) { note(true); }
    ~Interruptible() { note(false); }
    Interruptible(const Interruptible&) = delete;
    Interruptible& operator=(const Interruptible&) = delete;

private:
    void note(bool notes)
    {
        if (_signals)
            _signals->notesInterrupt(notes);
    }

    SignalEnd* _signals;
};

/// Entrusts a broker to the signals as long as it lives itself.
class UnloadedBySignal
{
public:
    UnloadedBySignal(SignalEnd& signals, broker::Broker& broker) : _signals(signals) { _signals.unloads(&broker); }
    ~UnloadedBySignal() { _signals.unloads(nullptr); }
    UnloadedBySignal(const UnloadedBySignal&) = delete;
    UnloadedBySignal& operator=(const UnloadedBySignal&) = delete;

private:
    SignalEnd& _signals;
};

} // namespace tvrcim
