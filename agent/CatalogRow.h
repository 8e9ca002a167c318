// The rows of the catalog as the compiler sees them: what it knows of a class by the record of that class.
#pragma once

#include "agent/ClassCatalog.h"

namespace cimple
{

/// The row of a class that the module serves.
template <class Record> struct CatalogRow;

/// Where the cache keeps the instances of a class, and the second such place of a class that has one.
template <class Record> struct MapPlace;
template <class Record> struct SecondMapPlace;

#define TVR_CLASS(name, form, group, does)                                                                             \
    class TVRHBA_##name;                                                                                               \
    template <> struct CatalogRow<TVRHBA_##name>                                                                       \
    {                                                                                                                  \
        static constexpr const char* providerName = "TVRHBA_" #name "_Provider";                                       \
        static constexpr EnumerationForm enumeration = EnumerationForm::form;                                          \
        static constexpr unsigned duties = does;                                                                       \
    };                                                                                                                 \
    template <> struct MapPlace<TVRHBA_##name>                                                                         \
    {                                                                                                                  \
        static constexpr Instance_Map InstanceCache::*map = &InstanceCache::m_TVRHBA_##name##_map;                     \
    };
#define TVR_HOST_MAP(name, group)                                                                                      \
    class name;                                                                                                        \
    template <> struct MapPlace<name>                                                                                  \
    {                                                                                                                  \
        static constexpr Instance_Map InstanceCache::*map = &InstanceCache::m_##name##_map;                            \
    };
#define TVR_SECOND_MAP(place, name, group)                                                                             \
    template <> struct SecondMapPlace<TVRHBA_##name>                                                                   \
    {                                                                                                                  \
        static constexpr Instance_Map InstanceCache::*map = &InstanceCache::m_TVRHBA_##place##_map;                    \
    };
#include "agent/ClassCatalog.def"

/// Null where the class has one map alone.
template <class Record> constexpr Instance_Map InstanceCache::*secondMap()
{
    if constexpr (requires { SecondMapPlace<Record>::map; })
        return SecondMapPlace<Record>::map;
    else
        return nullptr;
}

} // namespace cimple
