// The maps of the cache, reached by the type of what they hold.
#pragma once

#include "agent/CatalogRow.h"
#include "agent/LogText.h"
#include "runtime/meta/Instance.h"

namespace cimple
{

/// Puts the instance in the map, which owns it from then on. If equal keys are there or the instance is null, logs the
/// text, releases the instance and returns null.
Instance* insertInstance(Instance_Map& map, Ref<> instance, const LogText& failure);

/// A map of instances of one class. The records that it hands out stay the map's.
template <class Record> class TypedMap
{
public:
    explicit TypedMap(Instance_Map& map) : _map(map) {}

    std::size_t size() const { return _map.size(); }
    /// Null when out of range.
    Record* at(std::size_t index) const { return static_cast<Record*>(_map.at(index)); }
    Record* first() const { return at(0); }
    /// The one with the keys of `instance`, which may be of a superclass's type; null if there is none.
    Record* withKeysOf(const Instance* instance) const { return static_cast<Record*>(_map.lookup(instance)); }
    /// First entry, in order of insertion, for which `matches(record)` holds; null if there is none.
    template <class Predicate> Record* findFirst(Predicate matches) const
    {
        for (std::size_t i = 0; Record* entry = at(i); i++)
            if (matches(std::as_const(*entry)))
                return entry;
        return nullptr;
    }
    /// The same from the last entry.
    template <class Predicate> Record* findLast(Predicate matches) const
    {
        for (std::size_t i = size(); i-- > 0;)
            if (Record* entry = at(i); entry && matches(std::as_const(*entry)))
                return entry;
        return nullptr;
    }
    /// As insertInstance().
    Record* insert(Ref<Record> instance, const LogText& failure) const
    {
        return static_cast<Record*>(insertInstance(_map, Ref<>(instance.release()), failure));
    }
    /// Destroys the entries for which `matches(record)` holds; how many there were.
    template <class Predicate> std::size_t removeIf(Predicate matches) const
    {
        std::size_t removed = 0;
        for (std::size_t i = size(); i-- > 0;)
            if (const Record* entry = at(i); entry && matches(*entry))
            {
                Ref<>(_map.remove_at(i)).reset();
                removed++;
            }
        return removed;
    }
    void clear() const { _map.clear(); }

private:
    Instance_Map& _map;
};

/// The map of a class.
template <class Record> TypedMap<Record> mapOf(InstanceCache& cache)
{
    return TypedMap<Record>(cache.*MapPlace<Record>::map);
}

/// The second map of a class that has one.
template <class Record> TypedMap<Record> secondMapOf(InstanceCache& cache)
{
    return TypedMap<Record>(cache.*SecondMapPlace<Record>::map);
}

} // namespace cimple
