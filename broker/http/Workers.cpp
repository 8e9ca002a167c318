#include "broker/http/Workers.h"

#include <exception>

namespace http
{

Workers::~Workers()
{
    {
        const std::lock_guard lock(_mutex);
        _ends = true;
    }
    _given.notify_all();
    for (const pthread_t thread : _threads)
        pthread_join(thread, nullptr);
}

bool Workers::give(Work work)
{
    const std::lock_guard lock(_mutex);
    if (_idle <= _waiting.size() && _threads.size() < _most && !start() && _threads.empty())
        return false;
    _waiting.push_back(std::move(work));
    _given.notify_one();
    return true;
}

bool Workers::full()
{
    const std::lock_guard lock(_mutex);
    return _waiting.size() >= _most;
}

/// A regular expression of the HTTP library goes a frame deeper with each byte of a header, so the stack is not left to
/// the limits of whoever starts the process.
bool Workers::start()
{
    constexpr std::size_t stackBytes = 8 << 20;
    _threads.reserve(_most);
    pthread_attr_t attributes;
    if (pthread_attr_init(&attributes) != 0)
        return false;
    pthread_t thread{};
    const bool made =
        pthread_attr_setstacksize(&attributes, stackBytes) == 0 && pthread_create(&thread, &attributes, run, this) == 0;
    pthread_attr_destroy(&attributes);
    if (made)
        _threads.push_back(thread);
    return made;
}

void* Workers::run(void* workers)
{
    static_cast<Workers*>(workers)->serve();
    return nullptr;
}

void Workers::serve()
{
    std::unique_lock lock(_mutex);
    while (true)
    {
        _idle++;
        _given.wait(lock, [this] { return _ends || !_waiting.empty(); });
        _idle--;
        if (_waiting.empty())
            return;
        const Work work = std::move(_waiting.front());
        _waiting.pop_front();
        lock.unlock();
        try
        {
            work();
        }
        catch (const std::exception&)
        {}
        lock.lock();
    }
}

} // namespace http
