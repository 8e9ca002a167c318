// Answers that are kept for a while: whoever asks meanwhile gets what the first has asked for, and who asks while it is
// being made waits for it.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <future>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <utility>

namespace web
{

struct KeptLimits
{
    std::size_t number;
    std::size_t bytes; ///< of all together; what is larger by itself is given to those who wait for it, and not kept
};

/// Value has a size in bytes().
template <class Value> class Kept
{
public:
    using Pointer = std::shared_ptr<const Value>;
    using Time = std::chrono::steady_clock::time_point;
    using Clock = std::function<Time()>;

    explicit Kept(KeptLimits limits, Clock clock = std::chrono::steady_clock::now)
        : _limits(limits), _clock(std::move(clock))
    {}

    /// `make()` gives the value where none is kept. What it throws, all get who wait for it.
    template <class Make> Pointer get(const std::string& key, std::chrono::milliseconds lifetime, Make make)
    {
        std::promise<Pointer> promise;
        const auto [future, number] = find(key, promise);
        if (number == 0)
            return future.get();
        try
        {
            Pointer value = make();
            settle(key, number, lifetime, value->bytes());
            promise.set_value(value);
            return value;
        }
        catch (...)
        {
            forget(key, number);
            promise.set_exception(std::current_exception());
            throw;
        }
    }

    /// What is being made goes to those who wait for it already, and to nobody who comes later.
    void drop()
    {
        const std::scoped_lock lock(_mutex);
        _entries.clear();
    }

private:
    struct Entry
    {
        std::shared_future<Pointer> future;
        std::uint64_t number; ///< tells it from another of the key, made after drop()
        Time end = Time::max();
        std::size_t bytes = 0; ///< not known while it is being made
    };

    /// What is there for the key, or a new entry for the promise with its number, which is not 0.
    std::pair<std::shared_future<Pointer>, std::uint64_t> find(const std::string& key, std::promise<Pointer>& promise)
    {
        const std::scoped_lock lock(_mutex);
        const Time now = _clock();
        std::erase_if(_entries, [&](const auto& entry) { return entry.second.end <= now; });
        if (const auto found = _entries.find(key); found != _entries.end())
            return {found->second.future, 0};
        const auto made = _entries.emplace(key, Entry{promise.get_future().share(), ++_made}).first;
        return {made->second.future, _made};
    }

    void settle(const std::string& key, std::uint64_t number, std::chrono::milliseconds lifetime, std::size_t bytes)
    {
        const std::scoped_lock lock(_mutex);
        const auto found = _entries.find(key);
        if (found == _entries.end() || found->second.number != number)
            return;
        found->second.end = _clock() + lifetime;
        found->second.bytes = bytes;
        while (isTooMuch())
            _entries.erase(oldest());
    }

    void forget(const std::string& key, std::uint64_t number)
    {
        const std::scoped_lock lock(_mutex);
        const auto found = _entries.find(key);
        if (found != _entries.end() && found->second.number == number)
            _entries.erase(found);
    }

    /// Of what has been made; the rest cannot be taken from those who make it.
    bool isTooMuch() const
    {
        std::size_t number = 0;
        std::size_t bytes = 0;
        for (const auto& [key, entry] : _entries)
        {
            number += entry.end != Time::max();
            bytes += entry.bytes;
        }
        return number > _limits.number || bytes > _limits.bytes;
    }

    auto oldest() const
    {
        return std::ranges::min_element(_entries, {}, [](const auto& entry) { return entry.second.end; });
    }

    const KeptLimits _limits;
    const Clock _clock;
    std::mutex _mutex;
    std::map<std::string, Entry> _entries;
    std::uint64_t _made = 0;
};

} // namespace web
