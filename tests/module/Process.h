// What a process holds of the machine, what happens to its files, and processes that end by themselves.
#pragma once

#include "tests/support/Semaphores.h"

#include <cstddef>
#include <filesystem>
#include <functional>
#include <string>
#include <vector>

namespace module_test
{

/// What a module that was unloaded must have given back.
struct Footprint
{
    std::size_t threads = 0;
    std::size_t descriptors = 0;
    std::size_t semaphores = 0; ///< of the module in this process
    std::size_t heap = 0;       ///< bytes in use; 0 where a sanitizer stands in for the allocator
    std::size_t resident = 0;   ///< bytes

    /// The kernel lets go of a joined thread a moment later, so this waits for no more than `threads`, in vain at most
    /// some seconds.
    static Footprint take(std::size_t threads = 1);
};

using test_support::semaphoresOf;

/// Counts changes of a folder from its creation on.
class FolderWatch
{
public:
    /// `events` are those of inotify.
    FolderWatch(const std::filesystem::path& folder, unsigned events);
    ~FolderWatch();
    FolderWatch(const FolderWatch&) = delete;
    FolderWatch& operator=(const FolderWatch&) = delete;

    /// Waits for a change and takes those that are there; false if none came in time.
    bool wait(int milliseconds);
    /// How often the file was changed, as far as its changes were taken.
    std::size_t changes(const std::string& file) const;

private:
    int _descriptor;
    std::vector<std::string> _changed;
};

/// The leak sanitizer passes over this process. For a child of a process with other threads: what these held is
/// nobody's there.
void passOverLeaks();

/// Runs `body` in a child process, which then leaves through exit(). The answer is its exit code: 0 when no expectation
/// failed, or -1 when a signal ended it.
int inChild(const std::function<void()>& body);

} // namespace module_test
