// A sign on the terminal that long work goes on.
#pragma once

#include <condition_variable>
#include <mutex>
#include <ostream>
#include <string>
#include <thread>
#include <utility>

namespace tvrcim
{

/// Shows from the first second on what is at work and since when, in one line, which goes with the object. Nobody else
/// writes to the terminal meanwhile.
class Progress
{
public:
    /// Does nothing where `terminal` is null.
    Progress(std::ostream* terminal, std::string what);
    /// Says it line by line instead, for a file or a pipe: at once, when it changes and now and then.
    static Progress inLines(std::ostream* out, std::string what) { return {out, std::move(what), true}; }
    ~Progress();
    /// What is at work by now.
    void change(std::string what);
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

private:
    Progress(std::ostream* out, std::string what, bool lines);
    void show();
    void showInLines();

    std::ostream* _terminal;
    bool _lines = false;
    std::mutex _mutex; ///< guards _ended, _what and _changed
    std::string _what;
    bool _changed = false;
    std::condition_variable _end;
    bool _ended = false;
    std::thread _thread;
};

} // namespace tvrcim
