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

/// What a map is cleared with.
enum class MapGroup
{
    Adapter,                    ///< clearAdapterMaps(), as all that follow up to Diagnostics
    Dump,                       ///< dump service and its data
    RecordLog,                  ///< both record logs, with the capabilities and the use of the provider's
    SoftwareUpdate,             ///< installation service
    SoftwareUpdateAssociations, ///< of that service
    DriverLog,                  ///< entries of both logs, and the capabilities and the use of the driver's
    PortVirtualization,
    Diagnostics,       ///< what can be tested and how
    DiagnosticRecords, ///< of tests that ran; they outlive a refresh
    DiagnosticJobs,    ///< of tests that run; they outlive a refresh
    San,               ///< clearSANMaps()
};

/// What the provider of a class does beyond reading.
enum Does : unsigned
{
    Reads = 0,
    Methods = 1, ///< extrinsic methods with a body
    Modifies = 2,
    Creates = 4,
    Deletes = 8,
};

struct ClassRow
{
    const char* name;
    const Meta_Class* meta_class;
    EnumerationForm form;
    bool association;
    Instance_Map InstanceCache::*map;
};

/// All classes, in linking order.
std::span<const ClassRow> classCatalog();

/// A map and what it is cleared with.
struct MapRow
{
    Instance_Map InstanceCache::*map;
    const Meta_Class* meta_class;
    MapGroup group;
};

/// The maps of all classes, of the host, and the second maps.
std::span<const MapRow> allMaps();

/// Empties all maps of a group.
void clearGroup(InstanceCache& cache, MapGroup group);

} // namespace cimple
