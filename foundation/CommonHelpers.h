// Functions that the whole program shares: text forms of World Wide Names and other byte strings, SCSI designators,
// and traces. The headers included here hold the rest of the set.
//
// All texts show the bytes in their stored order and end in a NUL; the size of an output stands in its type.
#pragma once

#include "foundation/FirmwareVersion.h"
#include "foundation/HostInformation.h"
#include "runtime/values/String.h"

#include <cstddef>
#include <cstdint>
#include <span>

namespace cimple
{

// --- text forms of bytes ---------------------------------------------------------------------------------

/// 8 bytes as "10000090FA942779"; null gives an empty text.
void wwnToUpperHex(const std::uint8_t* wwn, char (&out)[17]);
String wwnToUpperHex(const std::uint8_t* wwn);

/// 16 bytes as 32 upper-case digits; null gives an empty text.
void bytes16ToUpperHex(const std::uint8_t* bytes, char (&out)[33]);

/// 6 bytes as "00-90-fa-94-27-79"; null leaves `out` as it is.
void macToDashed(const std::uint8_t* mac, char (&out)[18]);
/// The same text; returns 0, or 1 for null.
int bytesToHexDashed(const std::uint8_t* bytes, char (&out)[18]);

/// Appends upper-case digits of bytes `first` to `last` - 1 of what follows the 8-byte header of `record`, as far as
/// the record goes.
void bytesRangeToHex(std::span<const std::uint8_t> record, std::size_t first, std::size_t last, String& out);

/// Decimal values with `separator` between them. With the limit being the last place of `out`, stops and returns 1
/// once the text would reach it; otherwise 0. `out` must not be empty.
int joinBytes(std::span<const std::uint8_t> bytes, const char* separator, std::span<char> out);

// --- and back --------------------------------------------------------------------------------------------

/// Takes exactly 16 hexadecimal digits. Returns 0, or non-zero with `out` unchanged.
int stringToWwn(std::uint8_t (&out)[8], const String& text);
/// The same with the first digit as the most significant; true on success.
bool stringToWwn64(std::uint64_t& out, const String& text);

/// "00-11-22-33-44-55" as "00:11:22:33:44:55:00:00": a MAC address stands for the WWN with two zero bytes behind it.
/// Returns 0, or non-zero with `out` unchanged for any other form.
int dashedMacToWwnText(char (&out)[24], const char* mac);

// --- SCSI Inquiry page 0x83 ------------------------------------------------------------------------------

struct Descriptor
{
    std::uint32_t designatorType = 0;
    std::uint32_t designatorLength = 0; ///< bytes of `value` in use
    std::uint8_t value[256] = {};
};

struct DesignatorHeader
{
    std::uint8_t peripheralDeviceType = 0;
    std::uint8_t pageCode = 0;
    std::uint32_t pageLength = 0;
};

struct DesignatorRecord : DesignatorHeader, Descriptor
{};

/// Fills the record from the first designator of a response. The designator's length is clamped to the bytes that are
/// there. Returns 0; non-zero for a null record or a response without a designator, whose record is empty.
int designatorToRecord(DesignatorRecord* out, std::span<const std::uint8_t> page);

/// Designators of 8, 12 and 16 bytes as upper-case digits; empty for null and any other length.
void descriptorToString(char (&out)[33], const Descriptor* descriptor);

// --- bytes and tokens ------------------------------------------------------------------------------------

void reverseBytes(const std::uint8_t* in, std::uint8_t* out, std::uint8_t count);

/// As strtok_r().
char* splitToken(char* text, const char* separators, char** state);

// --- traces, all of level TVR_DBG --------------------------------------------------------------------------

void logPair(const char* label, int value);
void logStringPair(const char* label, const String& value);
/// Cut at about a thousand characters.
void logArrayOfInt(const char* label, std::span<const int> values);

} // namespace cimple
