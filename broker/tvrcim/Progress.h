// A sign on the terminal that long work goes on.
#pragma once

#include <condition_variable>
#include <mutex>
#include <ostream>
#include <string>
#include <thread>

namespace tvrcim
{

/// Shows from the first second on what is at work and since when, in one line, which goes with the object. Nobody else
/// writes to the terminal meanwhile.
class Progress
{
public:
    /// Does nothing where `terminal` is null.
    Progress(std::ostream* terminal, std::string what);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

private:
    void show();

    std::ostream* _terminal;
    std::string _what;
    std::mutex _mutex; ///< guards _ended
    std::condition_variable _end;
    bool _ended = false;
    std::thread _thread;
};

} // namespace tvrcim
