// The threads that serve connections: as many as are needed at a time, up to a number.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <vector>

#include <pthread.h>

namespace http
{

class Workers
{
public:
    /// What it throws ends it alone.
    using Work = std::function<void()>;

    explicit Workers(std::size_t most) : _most(most) {}
    /// Waits until all that was given is done.
    ~Workers();
    Workers(const Workers&) = delete;
    Workers& operator=(const Workers&) = delete;

    /// False where no thread can be had, now or when another has done its work. Throws std::bad_alloc.
    bool give(Work work);
    /// Whether as much waits as can be at work.
    bool full();

private:
    static void* run(void* workers);
    void serve();
    bool start();

    const std::size_t _most;
    std::mutex _mutex;
    std::condition_variable _given;
    std::deque<Work> _waiting;
    std::vector<pthread_t> _threads;
    std::size_t _idle = 0;
    bool _ends = false;
};

} // namespace http
