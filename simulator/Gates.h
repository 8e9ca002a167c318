// Gates hold calls of the simulated libraries, so that a test can look at the caller while it waits.
#pragma once

#include <chrono>
#include <condition_variable>
#include <map>
#include <mutex>
#include <string>

namespace tvrsim
{

/// Named gates. A gate that was never closed is open.
class Gates
{
public:
    void close(const std::string& name);
    void open(const std::string& name);
    void openAll();

    /// Returns once the gate is open.
    void pass(const std::string& name);

    /// Waits until `calls` calls stand at the gate. False if that did not happen in time.
    bool await(const std::string& name, unsigned calls, std::chrono::milliseconds time);

private:
    struct Gate
    {
        bool closed = false;
        unsigned waiting = 0;
    };

    std::mutex _mutex;
    std::condition_variable _changed;
    std::map<std::string, Gate> _gates;
};

} // namespace tvrsim
