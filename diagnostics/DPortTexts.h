// The words for what the test of a link finds.
#pragma once

#include "device/RmApi.h"
#include "runtime/values/String.h"

#include <cstdint>
#include <span>

namespace cimple
{

/// Empty for what has no words.
const char* DPortPhaseToString(std::uint8_t id);
const char* DPortResultToString(std::uint8_t result);

/// The names of the set bits, the lowest first. Each but that of the highest has a comma behind it.
String DPortErrorsToString(std::uint32_t mask);

/// The phases in the record, which may claim to have more.
std::span<const RM_DPortPhase> phasesOf(const RM_DPortResults& results);

} // namespace cimple
