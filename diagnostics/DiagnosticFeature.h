// The diagnostic tests as instances: the tests of the catalog with their settings, capabilities, help and logs, and the
// ports that they run on.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Why there are no diagnostics.
inline constexpr std::uint32_t noManagedElement = 33068; ///< no port controller
inline constexpr std::uint32_t notSupported = 40002;     ///< no port with a name that the library takes

/// Of the two queries below: a wrong argument, or a feature that is not there.
inline constexpr std::uint32_t queryFailed = 0x8000;

/// Step: empties the maps of the feature and builds it. Its status is not a BuildStatus, but 0 or one of the above.
std::uint32_t createDiagnostics(HostContext& host);

/// Builds the instances of all tests. 0, or why there are none.
std::uint32_t CreateFCHBADiagnosticClassFeature(InstanceCache& cache);

/// Empties a group of maps: 0 for the feature's, 1 for the records, 2 for the jobs, nothing for any other. Returns 0.
std::uint32_t ClearDiagnosticClassMaps(InstanceCache& cache, std::uint32_t kind);

/// The version of an adapter's diagnostics, which stays as it was where the library does not tell it. 0, or queryFailed
/// for a wrong argument.
std::uint32_t GetDiagnosticVersion(const char* deviceId, std::uint32_t* version);

/// 0 if the adapter behind a port has the feature, or queryFailed.
std::uint32_t IsFeatureTagSupported(const char* deviceId, std::uint32_t tag);

} // namespace cimple
