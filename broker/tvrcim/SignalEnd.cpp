#include "broker/tvrcim/SignalEnd.h"

#include <chrono>
#include <condition_variable>
#include <csignal>
#include <future>
#include <initializer_list>
#include <mutex>
#include <string>
#include <thread>

#include <pthread.h>
#include <semaphore.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace tvrcim
{

struct SignalEnd::State
{
    std::mutex mutex; ///< guards what follows
    std::condition_variable interrupt;
    bool ending = false;
    bool notes = false;
    bool noted = false;
    broker::Broker* broker = nullptr;
    std::filesystem::path folder;
};

namespace
{

/// How long an operation may hold the module when a signal has come.
constexpr std::chrono::seconds unloadLimit{2};

/// Those that the process does not ignore.
sigset_t endingSignals()
{
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : {SIGHUP, SIGINT, SIGTERM})
    {
        struct sigaction present = {};
        sigaction(signal, nullptr, &present);
        if (present.sa_handler != SIG_IGN)
            sigaddset(&signals, signal);
    }
    return signals;
}

void unloadInTime(broker::Broker& broker)
{
    std::promise<void> unloaded;
    std::future<void> end = unloaded.get_future();
    std::thread(
        [&broker, unloaded = std::move(unloaded)]() mutable
        {
            broker.unload();
            unloaded.set_value();
        })
        .detach();
    end.wait_for(unloadLimit);
}

/// The module's semaphores have names in the system, which outlive a process that does not end it in order.
void unlinkSemaphores()
{
    for (const char* name : {"/TVR_RM_INIT_LIB_", "/TVR_RM_INIT_LIB_DONE_"})
        sem_unlink((name + std::to_string(getpid())).c_str());
}

} // namespace

SignalEnd::SignalEnd() : _state(std::make_shared<State>())
{
    const sigset_t signals = endingSignals();
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
    std::thread(
        [signals, state = _state]
        {
            int signal = 0;
            std::unique_lock lock(state->mutex, std::defer_lock);
            for (bool noted = true; noted;)
            {
                if (lock)
                    lock.unlock();
                sigwait(&signals, &signal);
                lock.lock();
                noted = signal == SIGINT && state->notes && !state->noted;
                state->noted |= noted;
                state->interrupt.notify_all();
            }
            state->ending = true;
            lock.unlock(); // from here on the broker and the folder stay as they are
            if (state->broker)
                unloadInTime(*state->broker);
            unlinkSemaphores();
            if (!state->folder.empty())
            {
                std::error_code error;
                std::filesystem::remove_all(state->folder, error);
            }
            constexpr int endedBySignal = 128;
            // Not by _exit(): that of a sanitizer flushes the streams, which the interrupted thread may hold.
            syscall(SYS_exit_group, endedBySignal + signal);
        })
        .detach();
}

/// The lock, unless a signal has come.
std::unique_lock<std::mutex> SignalEnd::lockIfNone()
{
    std::unique_lock lock(_state->mutex);
    if (_state->ending)
    {
        lock.unlock();
        for (;;)
            pause();
    }
    return lock;
}

void SignalEnd::removes(const std::filesystem::path& folder)
{
    const auto lock = lockIfNone();
    _state->folder = folder;
}

void SignalEnd::unloads(broker::Broker* broker)
{
    const auto lock = lockIfNone();
    _state->broker = broker;
}

void SignalEnd::passIfNone()
{
    lockIfNone();
}

void SignalEnd::notesInterrupt(bool notes)
{
    const auto lock = lockIfNone();
    _state->notes = notes;
    _state->noted = false;
}

bool SignalEnd::awaitInterrupt(std::chrono::milliseconds limit)
{
    auto lock = lockIfNone();
    return _state->interrupt.wait_for(lock, limit, [this] { return _state->noted; });
}

} // namespace tvrcim
