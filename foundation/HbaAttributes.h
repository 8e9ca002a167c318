// Attribute records of the HBA API.
#pragma once

#include <time.h> // hbaapi.h uses struct tm

#include <hbaapi.h>

#include <span>

namespace cimple
{

// Copies field by field. Texts of the source may lack a terminator; those of the copy have one.
void copyAdapterAttributes(HBA_ADAPTERATTRIBUTES& out, const HBA_ADAPTERATTRIBUTES& in);
void copyPortAttributes(HBA_PORTATTRIBUTES& out, const HBA_PORTATTRIBUTES& in);

/// Describes an adapter for a log message, one attribute a line; cut to fit `out`, which must not be empty.
void formatNodeAttributes(const HBA_ADAPTERATTRIBUTES* attributes, std::span<char> out);

} // namespace cimple
