// What every builder of instances uses: make, insert or log, join.
#pragma once

#include "agent/Maps.h"
#include "agent/Namespaces.h"
#include "agent/SharedEnds.h"
#include "runtime/base/Immortal.h"
#include "runtime/base/Memory.h"
#include "runtime/meta/Instance.h"

#include <cstdint>
#include <initializer_list>
#include <new>
#include <optional>
#include <string_view>
#include <type_traits>

namespace cimple
{

/// Status of routines that build instances.
enum BuildStatus : std::uint32_t
{
    BUILD_DONE = 0,
    BUILD_NO_INSTANCE = 0x8000, ///< an instance could not be allocated
    BUILD_FAILED = 0x8001,      ///< a step failed; the caller stops
};

/// Logs why a step ends, and is its status.
inline BuildStatus failed(const LogText& why, BuildStatus status = BUILD_FAILED)
{
    why.log();
    return status;
}

/// The namespace of the module's classes as one shared text.
const String& moduleNamespace();

/// A new instance as the schema's defaults have it, in the namespace of the module's classes.
template <class Record> Ref<Record> fresh()
{
    Ref<Record> instance(create<Record>(true));
    instance->__name_space = moduleNamespace();
    return instance;
}

/// The same without defaults: what its builder does not name stays null.
template <class Record> Ref<Record> empty()
{
    Ref<Record> instance(create<Record>());
    nullify(instance.get(), true, true, 1);
    instance->__name_space = moduleNamespace();
    return instance;
}

/// The keys of what is weak to the system.
void setSystem(auto& element, const auto& system)
{
    element.SystemCreationClassName.set(system.CreationClassName.value);
    element.SystemName.set(system.Name.value);
}

/// What `make` gives; null when memory ran out on the way.
template <class Make> auto unlessOutOfMemory(Make make) -> decltype(make())
{
    try
    {
        return make();
    }
    catch (const std::bad_alloc&)
    {
        note_missing_memory();
        return {};
    }
}

/// Puts what `make` gives in the map, and is what stands there: null, with `refused` in the log, if the map did not
/// take it. Nothing, with `notMade` in the log, when memory ran out on the way.
template <class Record, class Make>
std::optional<Record*> insertMade(const TypedMap<Record>& map, Make make, const LogText& notMade,
                                  const LogText& refused)
{
    const std::optional<Record*> inserted =
        unlessOutOfMemory([&] { return std::optional<Record*>(map.insert(make(), refused)); });
    if (!inserted)
        notMade.log();
    return inserted;
}

/// What came of an association.
enum class Joined
{
    Made,
    NoEnd,      ///< one of the ends is absent: there is nothing to associate
    NoInstance, ///< no instance could be made; the log says so
    Refused,    ///< the map has one with these keys; the log has the text
};

/// Makes an association with defaults, has it filled by `fill(association)`, and puts it in the map. For associations
/// of which the ends are at hand as copies; join() makes these.
template <class Association, class Fill>
Joined insertFilled(const TypedMap<Association>& map, const LogText& refused, Fill fill)
{
    const std::optional<Association*> made = insertMade(
        map,
        [&]
        {
            Ref<Association> association = fresh<Association>();
            fill(*association);
            return association;
        },
        {TVR_CRIT, "Could not create the instance of the Association class"}, refused);
    if (!made)
        return Joined::NoInstance;
    return *made ? Joined::Made : Joined::Refused;
}

/// Makes an association with defaults whose two references hold copies of the ends, as these are now, has it filled by
/// `fill(association)`, and puts it in the map.
template <class Association, class First, class Second, class Holder1, class Holder2, class Fill>
Joined join(const TypedMap<Association>& map, First* Holder1::*firstRole, const std::type_identity_t<First>* first,
            Second* Holder2::*secondRole, const std::type_identity_t<Second>* second, const LogText& refused, Fill fill)
{
    if (!first || !second)
        return Joined::NoEnd;
    return insertFilled(map, refused,
                        [&](Association& association)
                        {
                            association.*firstRole = shared_end(first).release();
                            association.*secondRole = shared_end(second).release();
                            fill(association);
                        });
}

/// The same in the first map of the association's class.
template <class Association, class First, class Second, class Holder1, class Holder2, class Fill>
Joined join(InstanceCache& cache, First* Holder1::*firstRole, const std::type_identity_t<First>* first,
            Second* Holder2::*secondRole, const std::type_identity_t<Second>* second, const LogText& refused, Fill fill)
{
    return join(mapOf<Association>(cache), firstRole, first, secondRole, second, refused, fill);
}

template <class Association, class First, class Second, class Holder1, class Holder2>
Joined join(InstanceCache& cache, First* Holder1::*firstRole, const std::type_identity_t<First>* first,
            Second* Holder2::*secondRole, const std::type_identity_t<Second>* second, const LogText& refused)
{
    return join<Association>(cache, firstRole, first, secondRole, second, refused, [](Association&) {});
}

/// The parts one behind the other.
String joinTexts(std::initializer_list<std::string_view> parts);

/// Text by a printf format, of any length.
String formatText(const char* format, ...) __attribute__((format(printf, 1, 2)));

/// The name of a class as one shared text.
template <class Record> const String& className()
{
    static Immortal<const String> name(Record::static_meta_class.name);
    return *name;
}

} // namespace cimple
