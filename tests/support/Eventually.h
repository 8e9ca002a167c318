// Waiting for what another thread or process does.
#pragma once

#include <chrono>
#include <thread>

namespace test_support
{

/// Asks until the condition holds; false if it does not in a minute. By asking again and not by inotify: the kernel
/// takes instances back with delay, and a test that makes many runs out of them.
template <class Condition> bool eventually(Condition holds)
{
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    for (; !holds(); std::this_thread::sleep_for(std::chrono::milliseconds(2)))
        if (std::chrono::steady_clock::now() > end)
            return false;
    return true;
}

} // namespace test_support
