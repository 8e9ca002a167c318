// The broker's codes of the CIM types.
#pragma once

#include "runtime/cmpi/Cmpi.h"
#include "runtime/values/Types.h"

#include <algorithm>
#include <array>
#include <cstddef>

namespace cimple
{

/// By type code.
inline constexpr std::array<CMPIType, num_types> cmpi_type_codes{
    CMPI_boolean, CMPI_uint8,  CMPI_sint8,  CMPI_uint16, CMPI_sint16, CMPI_uint32, CMPI_sint32,
    CMPI_uint64,  CMPI_sint64, CMPI_real32, CMPI_real64, CMPI_char16, CMPI_string, CMPI_dateTime,
};

/// The type that a scalar code of the broker stands for; num_types for any other code.
constexpr std::size_t type_of_cmpi_code(CMPIType code)
{
    const auto* found = std::find(cmpi_type_codes.begin(), cmpi_type_codes.end(), code);
    return static_cast<std::size_t>(found - cmpi_type_codes.begin());
}

} // namespace cimple
