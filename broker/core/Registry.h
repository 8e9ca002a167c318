// Objects that live here until somebody who knows them by a pointer takes them out.
#pragma once

#include <cstddef>
#include <memory>
#include <mutex>
#include <unordered_map>
#include <utility>
#include <vector>

namespace broker
{

template <class Key, class T> class Registry
{
public:
    void add(const Key* key, std::unique_ptr<T>&& object)
    {
        const std::lock_guard lock(_mutex);
        _objects.emplace(key, std::move(object));
    }

    /// Null for a pointer that nothing stands under.
    T* find(const Key* key) const
    {
        const std::lock_guard lock(_mutex);
        const auto it = _objects.find(key);
        return it == _objects.end() ? nullptr : it->second.get();
    }

    /// The same.
    std::unique_ptr<T> take(const Key* key)
    {
        const std::lock_guard lock(_mutex);
        auto node = _objects.extract(key);
        return node ? std::move(node.mapped()) : nullptr;
    }

    std::vector<std::unique_ptr<T>> takeAll()
    {
        const std::lock_guard lock(_mutex);
        std::vector<std::unique_ptr<T>> all;
        for (auto& [key, object] : std::exchange(_objects, {}))
            all.push_back(std::move(object));
        return all;
    }

    std::size_t count() const
    {
        const std::lock_guard lock(_mutex);
        return _objects.size();
    }

private:
    mutable std::mutex _mutex;
    std::unordered_map<const Key*, std::unique_ptr<T>> _objects;
};

} // namespace broker
