// The class catalog as a table; the rows stand in ClassCatalog.def.
#pragma once

#include "agent/InstanceCache.h"

#include <span>

namespace cimple
{

/// How the instances of a class are enumerated.
enum class EnumerationForm
{
    Plain,  ///< copied from the adapter maps
    San,    ///< copied from the SAN maps, which are built on demand
    Active, ///< refreshed from the hardware, then copied
    Own,    ///< the class's provider has an enumeration of its own
};

/// Who clears the map of a class.
enum class MapGroup
{
    Adapter, ///< clearAdapterMaps()
    San,     ///< clearSANMaps()
    Own,     ///< the subsystem that fills it
};

struct ClassRow
{
    const char* name;
    const Meta_Class* meta_class;
    EnumerationForm form;
    MapGroup group;
    bool association;
    Instance_Map InstanceCache::*map;
};

/// All classes, in linking order.
std::span<const ClassRow> classCatalog();

} // namespace cimple
