// What the library says of tests, in words for people.
#pragma once

#include "device/RmApi.h"

#include <cstdint>

namespace cimple
{

/// Of a status that ends a test before it has a result.
const char* MapDiagStatus(RM_STATUS status);

/// Of what a test that has finished came to, an RM_DiagResult.
const char* MapDiagResultStatus(std::uint32_t result);

} // namespace cimple
