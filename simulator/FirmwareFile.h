// The form of the firmware files that the simulated host takes: a header of text lines, an empty line, the program.
//
//     TVRSIM-FIRMWARE 1
//     family: TV3202
//     version: 12.8.1.0
//     checksum: CBF43926
//
// The checksum is the CRC-32 of the program, as of IEEE 802.3.
#pragma once

#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>
#include <string_view>

namespace tvrsim
{

/// What the library says of a file that it does not take, beyond its general failure.
enum FirmwareStatus : std::int32_t
{
    notFirmware = 120,
    firmwareOfAnother = 121, ///< for another family of adapters
    firmwareDamaged = 122,   ///< the checksum differs
};

struct FirmwareFile
{
    std::string family;
    std::string version;
    bool isWhole = false; ///< the program has the header's checksum
};

inline std::uint32_t crc32(std::string_view bytes)
{
    std::uint32_t crc = 0xFFFF'FFFF;
    for (const char byte : bytes)
    {
        crc ^= static_cast<std::uint8_t>(byte);
        for (int bit = 0; bit < 8; ++bit)
            crc = crc & 1 ? crc >> 1 ^ 0xEDB8'8320 : crc >> 1;
    }
    return ~crc;
}

/// The text of such a file.
inline std::string firmwareText(const std::string& family, const std::string& version, const std::string& program)
{
    char checksum[9];
    std::snprintf(checksum, sizeof checksum, "%08X", crc32(program));
    return "TVRSIM-FIRMWARE 1\nfamily: " + family + "\nversion: " + version + "\nchecksum: " + checksum + "\n\n" +
           program;
}

/// Nothing for a text of another form.
std::optional<FirmwareFile> readFirmware(std::string_view text);

} // namespace tvrsim
