// The way of a module's up-calls into a server that lets one through at a time.
#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>

namespace broker
{

/// Held by a thread while its up-call runs, with all that other providers of the module do for it on the same thread.
class UpcallChannel
{
public:
    /// Waits until the channel is free or the calling thread's own; false if that takes longer than `limit`.
    bool enter(std::chrono::milliseconds limit);
    void leave();

private:
    std::mutex _mutex;
    std::condition_variable _freed;
    std::thread::id _owner;
    unsigned _depth = 0;
};

} // namespace broker
