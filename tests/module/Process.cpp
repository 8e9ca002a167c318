#include "tests/module/Process.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <malloc.h>
#include <poll.h>
#include <stdexcept>
#include <sys/inotify.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

namespace module_test
{

namespace
{

namespace fs = std::filesystem;

std::size_t entries(const char* folder)
{
    return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder), fs::directory_iterator()));
}

std::size_t residentBytes()
{
    std::size_t total = 0, resident = 0;
    std::ifstream("/proc/self/statm") >> total >> resident;
    return resident * static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
}

bool leaksPass = false;

/// A test counts from none.
[[maybe_unused]] const bool fresh = (test_support::forgetSemaphoresOf(getpid()), true);

} // namespace

/// Asked by the leak sanitizer.
extern "C" __attribute__((visibility("default"))) int __lsan_is_turned_off()
{
    return leaksPass;
}

Footprint Footprint::take(std::size_t threads)
{
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(5);
    while (entries("/proc/self/task") > threads && std::chrono::steady_clock::now() < end)
        std::this_thread::yield();
    return {entries("/proc/self/task"), entries("/proc/self/fd"), semaphoresOf(getpid()), mallinfo2().uordblks,
            residentBytes()};
}

FolderWatch::FolderWatch(const fs::path& folder, unsigned events) : _descriptor(inotify_init1(IN_CLOEXEC | IN_NONBLOCK))
{
    if (_descriptor < 0 || inotify_add_watch(_descriptor, folder.c_str(), events) < 0)
        throw std::runtime_error("cannot watch " + folder.string());
}

FolderWatch::~FolderWatch()
{
    close(_descriptor);
}

bool FolderWatch::wait(int milliseconds)
{
    pollfd ready{_descriptor, POLLIN, 0};
    if (poll(&ready, 1, milliseconds) <= 0)
        return false;
    alignas(inotify_event) char buffer[65536];
    const ssize_t size = read(_descriptor, buffer, sizeof buffer);
    for (ssize_t at = 0; at < size;)
    {
        const auto* event = reinterpret_cast<const inotify_event*>(buffer + at);
        if (event->len > 0)
            _changed.emplace_back(event->name);
        at += static_cast<ssize_t>(sizeof *event) + event->len;
    }
    return size > 0;
}

std::size_t FolderWatch::changes(const std::string& file) const
{
    return static_cast<std::size_t>(std::ranges::count(_changed, file));
}

void passOverLeaks()
{
    leaksPass = true;
}

int inChild(const std::function<void()>& body)
{
    std::fflush(nullptr);
    const auto failures = []
    { return testing::UnitTest::GetInstance()->current_test_info()->result()->total_part_count(); };
    const int before = failures(); // the child inherits those of the test so far
    const pid_t child = fork();
    if (child == 0)
    {
        test_support::forgetSemaphoresOf(getpid());
        body();
        std::exit(failures() > before ? 1 : 0);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) != child)
        throw std::runtime_error("no child process");
    if (WIFSIGNALED(status))
        test_support::forgetSemaphoresOf(child);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

} // namespace module_test
