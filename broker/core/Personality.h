// The servers that the broker can play: what a provider meets where CIM servers differ.
#pragma once

#include "runtime/cmpi/Cmpi.h"

#include <array>
#include <cstddef>
#include <span>
#include <string_view>

#include <dlfcn.h>

namespace broker
{

/// Association class that a provider is given when the client names none.
enum class Fanout
{
    null_class,
    own_class, ///< the provider's own registered class
};

/// Which of a class's factories are called at its first use.
enum class LoadKinds
{
    lazy, ///< only the kind that the request needs
    all,
};

/// Which loaded providers get a cleanup call when everything is unloaded.
enum class CleanupCalls
{
    each,
    last_of_kind, ///< only the one loaded last of each kind, as if the library were one provider
};

/// Type in which integer keys reach a provider, whatever the class says.
enum class IntegerKeys
{
    signed64,
    unsigned64, ///< signed for a negative one
};

/// What becomes of a property that the class lacks, or of a value of another type than the class says.
enum class WrongProperties
{
    violations,
    accepted, ///< but a property beyond the class keeps its first type, and text for a number is the server's end
    refused,  ///< another type; a property that the class lacks is dropped with success
};

/// Who obeys a property filter.
enum class PropertyFilters
{
    instance, ///< drops what is neither listed nor a named key, also when it is set later
    broker,   ///< the instance ignores it; the result is cut to the request's property list
};

/// What clients get for a null element of a string array.
enum class NullElements
{
    kept,
    left_out,
    empty_text,
};

/// Names of the one interop namespace. Servers know the first ones.
inline constexpr std::array<std::string_view, 3> interopNames{"root/pg_interop", "root/interop", "interop"};

/// One row of the table below. The defaults are those of the strict broker.
struct Personality
{
    const char* name = "strict";

    // What a provider finds at its broker pointer.
    const char* brokerName = "tvrcim";
    unsigned capabilities =
        CMPI_MB_InstanceManipulation | CMPI_MB_AssociationTraversal | CMPI_MB_OSEncapsulationSupport;
    unsigned brokerVersion = 100; ///< of the table of up-calls
    int objectVersion = 100;      ///< of the factory table and of all objects: 1, 100 or 200
    int servicesVersion = 100;
    bool pointerForEach = true; ///< another broker pointer for each provider, or one for all
    bool allServices = true;    ///< without: no join, exit, cancel, sleep and signal
    bool keepsLogs = true;      ///< without: logging and tracing are not supported
    bool marks = false;         ///< has the functions mark and release; a thread with up-calls must end between them

    // Loading.
    int openMode = RTLD_NOW | RTLD_LOCAL;
    LoadKinds loadKinds = LoadKinds::lazy;
    CleanupCalls cleanupCalls = CleanupCalls::each;

    // Requests.
    std::size_t interops = interopNames.size(); ///< so many of the names are known
    bool ownInterop = false; ///< associations of the interop namespace are the module's only if the client names them
    Fanout fanout = Fanout::null_class;
    IntegerKeys integerKeys = IntegerKeys::signed64;
    bool nullForEmptyKeys = false;  ///< in source paths of associations and inside references
    bool bareReferences = true;     ///< without: a key that refers to a path without a namespace is INVALID_CLASS
    bool listOfSuperclass = false;  ///< who enumerates a superclass gets the superclass's properties
    bool skipsNotSupported = false; ///< of several providers; without, one fails the request
    bool nullArguments = true;      ///< without: a null method argument is absent
    CMPIrc missingArgument = CMPI_RC_ERR_NOT_FOUND;
    const char* principal = "root"; ///< null for a string whose characters are a null pointer

    // Values.
    bool schemaDefaults = false; ///< a new instance has them
    WrongProperties wrongProperties = WrongProperties::violations;
    PropertyFilters propertyFilters = PropertyFilters::instance;
    NullElements nullElements = NullElements::kept;

    // Up-calls.
    bool oneUpcall = false;  ///< lets one through at a time, over all providers and what they call from within it
    bool nullStates = false; ///< valid data of an enumeration carry the state of a null value

    std::span<const std::string_view> knownInteropNames() const { return std::span(interopNames).first(interops); }
};

inline constexpr Personality strict{};

/// The small-footprint broker.
inline constexpr Personality smallFootprint{
    .name = "small-footprint",
    .brokerName = "RequestHandler",
    .capabilities = 0x0000013F,
    .brokerVersion = 0,
    .objectVersion = 1,
    .servicesVersion = 200,
    .pointerForEach = false,
    .allServices = false,
    .keepsLogs = false,
    .marks = true,
    .openMode = RTLD_NOW | RTLD_GLOBAL,
    .loadKinds = LoadKinds::all,
    .cleanupCalls = CleanupCalls::last_of_kind,
    .interops = 2,
    .integerKeys = IntegerKeys::unsigned64,
    .nullArguments = false,
    .principal = nullptr,
    .schemaDefaults = true,
    .wrongProperties = WrongProperties::accepted,
    .nullElements = NullElements::left_out,
};

/// The Open Group's server.
inline constexpr Personality openGroup{
    .name = "open-group",
    .brokerName = "Pegasus",
    .capabilities = 0x000081FF,
    .brokerVersion = 200,
    .objectVersion = 200,
    .servicesVersion = 200,
    .openMode = RTLD_LAZY | RTLD_GLOBAL,
    .interops = 1,
    .ownInterop = true,
    .fanout = Fanout::own_class,
    .nullForEmptyKeys = true,
    .bareReferences = false,
    .listOfSuperclass = true,
    .skipsNotSupported = true,
    .missingArgument = CMPI_RC_ERR_NO_SUCH_PROPERTY,
    .principal = "",
    .schemaDefaults = true,
    .wrongProperties = WrongProperties::refused,
    .propertyFilters = PropertyFilters::broker,
    .nullElements = NullElements::empty_text,
    .oneUpcall = true,
    .nullStates = true,
};

inline constexpr std::array personalities{strict, smallFootprint, openGroup};

/// The personality of that name; null if there is none.
constexpr const Personality* findPersonality(std::string_view name)
{
    for (const Personality& personality : personalities)
        if (personality.name == name)
            return &personality;
    return nullptr;
}

} // namespace broker
