// What the HBA API says of a port, as CIM values.
#pragma once

#include "runtime/values/Array.h"

#include <array>
#include <cstdint>

namespace cimple
{

/// A value of a property and the text beside it.
struct ValueText
{
    std::uint16_t value;
    const char* text;
};

/// PortType and OtherPortType of a port type of the HBA API.
ValueText portType(std::uint32_t type);
/// OperationalStatus and StatusDescriptions of a port in a state of the HBA API or one of the vendor's.
ValueText portStatus(std::uint32_t state);
/// The same of what controls the port, which does not have the vendor's states.
ValueText controllerStatus(std::uint32_t state);

/// Values of SupportedCOS for the bits of a class of service mask; 0 if it has none that is known.
Array<std::uint16_t> classesOfService(std::uint32_t mask);

/// Appends the values of SupportedFC4Types for a list of FC-4 types.
void appendFc4Types(const std::array<std::uint8_t, 32>& types, Array<std::uint16_t>& out);

/// Bits per second of a speed code; 0 if it is none.
std::uint64_t portSpeed(std::uint32_t code);
/// The same of the fastest code in a mask of supported speeds.
std::uint64_t fastestSpeed(std::uint32_t mask);

} // namespace cimple
