// What a client's run of a test is given: the settings of the cache, changed by what the client sends along.
//
// A change is made to the one instance in the cache, so that it holds for later runs as well, until the next refresh of
// the adapters. The ends of associations are copies, and keep the defaults.
#pragma once

#include "agent/InstanceCache.h"
#include "runtime/values/Array.h"

#include <cstdint>
#include <optional>
#include <string_view>

namespace cimple
{

class Instance;
class String;
class TVRHBA_FCHBADiagnosticSettingData;
class TVRHBA_JobSettingData;

/// Null if there is none.
TVRHBA_JobSettingData* getDefaultTVRHBA_JobSettingDataInstance(InstanceCache& cache);
TVRHBA_FCHBADiagnosticSettingData* getDefaultTVRHBA_FCHBADiagnosticSettingDataInstance(InstanceCache& cache,
                                                                                       std::string_view testName);

/// The settings in the cache with what is valid of `input` in them; null if the input is not meant for them. What is
/// not valid has its line in the log, and its default stays. The caller holds the data lock.
TVRHBA_JobSettingData* getTVRHBA_JobSettingDataInstance(InstanceCache& cache, const Instance* input);
TVRHBA_FCHBADiagnosticSettingData*
getTVRHBA_FCHBADiagnosticSettingDataInstance(InstanceCache& cache, const Instance* input, std::string_view testName);

/// The number that a loop parameter begins with, or none: 1 to 4000 in at most four characters.
std::optional<std::uint32_t> loopCount(std::string_view parameter);

/// The pattern in just `size` bytes, cut or continued by the digit 0; none if it is not of hexadecimal digits alone, or
/// the size is 0.
std::optional<Array<std::uint8_t>> fitPattern(const Array<std::uint8_t>& pattern, std::uint32_t size);

} // namespace cimple
