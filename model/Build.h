// What every builder of instances uses: make, insert or log, associate, find.
#pragma once

#include "agent/InstanceCache.h"
#include "foundation/Log.h"
#include "runtime/Instance.h"

#include <type_traits>

namespace cimple
{

/// The literal text of a refused insert, with the place that names it.
struct InsertFailure
{
    InsertFailure(const char* text, const char* file = __builtin_FILE(), unsigned line = __builtin_LINE())
        : text(text), file(file), line(line)
    {}
    const char* text;
    const char* file;
    unsigned line;
};

/// Puts the instance in the map, which owns it from then on. If equal keys are there, logs the text at level 1,
/// releases the instance and returns null.
Instance* insertInstance(Instance_Map& map, Instance* instance, const InsertFailure& failure);

template <class Record> Record* insert(Instance_Map& map, Ref<Record> instance, const InsertFailure& failure)
{
    return static_cast<Record*>(insertInstance(map, instance.release(), failure));
}

/// A new association with defaults whose two references hold clones of the ends. Without one of the ends there is
/// nothing to associate: the result is null.
template <class Association, class First, class Second, class Holder1, class Holder2>
Ref<Association> associate(First* Holder1::*firstRole, const std::type_identity_t<First>* first,
                           Second* Holder2::*secondRole, const std::type_identity_t<Second>* second)
{
    if (!first || !second)
        return {};
    Ref<Association> association(create<Association>(true));
    if (!association)
    {
        TVR_LOG(TVR_CRIT, "Could not create the instance of the Association class");
        return {};
    }
    association.get()->*firstRole = clone_of(first);
    association.get()->*secondRole = clone_of(second);
    return association;
}

/// First entry, in order of insertion, for which `matches(record)` holds; null if there is none. The class of the
/// map's entries is Record.
template <class Record, class Predicate> Record* findFirst(const Instance_Map& map, Predicate matches)
{
    for (std::size_t i = 0; Instance* entry = map.at(i); i++)
        if (matches(*static_cast<const Record*>(entry)))
            return static_cast<Record*>(entry);
    return nullptr;
}

/// The same from the last entry.
template <class Record, class Predicate> Record* findLast(const Instance_Map& map, Predicate matches)
{
    for (std::size_t i = map.size(); i-- > 0;)
        if (auto* entry = static_cast<Record*>(map.at(i)); entry && matches(*entry))
            return entry;
    return nullptr;
}

/// Text by a printf format, of any length.
String formatText(const char* format, ...) __attribute__((format(printf, 1, 2)));

/// The name of a class as one shared text.
template <class Record> const String& className()
{
    static const String name(Record::static_meta_class.name);
    return name;
}

} // namespace cimple
