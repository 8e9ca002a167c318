// Version texts of firmware, such as "1.11a5", and of other software, such as "12.4.243.20".
#pragma once

#include "runtime/values/String.h"

#include <cstdint>

namespace cimple
{

struct FirmwareVersion
{
    std::uint16_t major = 0;
    std::uint16_t minor = 0;
    std::uint16_t revision = 0;
    std::uint16_t build = 0;
    String releaseType; ///< one letter
    String testRelease; ///< "r" and a digit for a test release, otherwise empty
};

/// Status of parseVersion() for every text that is not a version.
inline constexpr int invalidVersion = 32769;

/// Reads "D.DDLD" (D a digit, L a letter) with an optional suffix. Returns 0, or invalidVersion with the numbers
/// of `out` unchanged.
int parseVersion(const char* text, FirmwareVersion& out);

/// Reads up to four numbers with dots between them; a missing one leaves its slot as it was. Text above 63
/// characters is cut.
void parseDottedVersion(const char* text, std::uint16_t (&out)[4]);

} // namespace cimple
