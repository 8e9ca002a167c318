#include "foundation/CommonHelpers.h"

#include "foundation/Log.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstring>
#include <string_view>

namespace cimple
{

namespace
{

constexpr char upperDigits[] = "0123456789ABCDEF";
constexpr char lowerDigits[] = "0123456789abcdef";

/// `out` has room for 2 characters per byte and the terminator.
void upperHex(const std::uint8_t* bytes, std::size_t count, char* out)
{
    for (std::size_t i = 0; bytes && i < count; ++i)
    {
        *out++ = upperDigits[bytes[i] >> 4];
        *out++ = upperDigits[bytes[i] & 0xF];
    }
    *out = '\0';
}

bool isHexDigit(char c)
{
    return std::isxdigit(static_cast<unsigned char>(c)) != 0;
}

std::uint8_t hexValue(char c)
{
    const int digit = std::isdigit(static_cast<unsigned char>(c)) ? c - '0' : std::tolower(c) - 'a' + 10;
    return static_cast<std::uint8_t>(digit);
}

} // namespace

// --- text forms of bytes ---------------------------------------------------------------------------------

void wwnToUpperHex(const std::uint8_t* wwn, char (&out)[17])
{
    upperHex(wwn, 8, out);
}

String wwnToUpperHex(const std::uint8_t* wwn)
{
    char text[17];
    wwnToUpperHex(wwn, text);
    return text;
}

void bytes16ToUpperHex(const std::uint8_t* bytes, char (&out)[33])
{
    upperHex(bytes, 16, out);
}

void macToDashed(const std::uint8_t* mac, char (&out)[18])
{
    if (!mac)
        return;
    for (std::size_t i = 0; i < 6; ++i)
    {
        out[3 * i] = lowerDigits[mac[i] >> 4];
        out[3 * i + 1] = lowerDigits[mac[i] & 0xF];
        out[3 * i + 2] = i < 5 ? '-' : '\0';
    }
}

int bytesToHexDashed(const std::uint8_t* bytes, char (&out)[18])
{
    macToDashed(bytes, out);
    return bytes ? 0 : 1;
}

void bytesRangeToHex(std::span<const std::uint8_t> record, std::size_t first, std::size_t last, String& out)
{
    constexpr std::size_t header = 8;
    if (record.size() <= header)
        return;
    const std::span<const std::uint8_t> data = record.subspan(header);
    last = std::min(last, data.size());
    out.reserve(first < last ? out.size() + 2 * (last - first) : 0);
    for (std::size_t i = first; i < last; ++i)
    {
        const char digits[] = {upperDigits[data[i] >> 4], upperDigits[data[i] & 0xF]};
        out.append(digits, sizeof digits);
    }
}

int joinBytes(std::span<const std::uint8_t> bytes, const char* separator, std::span<char> out)
{
    const std::size_t limit = out.size() - 1;
    out[limit] = '\0';
    out[0] = '\0';
    std::size_t used = 0;
    for (std::size_t i = 0; i < bytes.size(); ++i)
    {
        char number[4];
        const auto digits = static_cast<std::size_t>(std::snprintf(number, sizeof number, "%d", bytes[i]));
        const char* between = i == 0 ? "" : separator;
        const std::size_t gap = std::strlen(between);
        if (used + gap + digits >= limit)
            return 1;
        std::memcpy(&out[used], between, gap);
        std::memcpy(&out[used + gap], number, digits + 1);
        used += gap + digits;
    }
    return 0;
}

// --- and back --------------------------------------------------------------------------------------------

int stringToWwn(std::uint8_t (&out)[8], const String& text)
{
    const std::string_view digits = text.view();
    if (digits.size() != 16 || !std::all_of(digits.begin(), digits.end(), isHexDigit))
    {
        TVR_LOG(TVR_ERR, "INVALID WWN");
        return 1;
    }
    for (std::size_t i = 0; i < 8; ++i)
        out[i] = static_cast<std::uint8_t>(hexValue(digits[2 * i]) << 4 | hexValue(digits[2 * i + 1]));
    return 0;
}

bool stringToWwn64(std::uint64_t& out, const String& text)
{
    std::uint8_t bytes[8];
    if (stringToWwn(bytes, text) != 0)
        return false;
    out = 0;
    for (const std::uint8_t byte : bytes)
        out = out << 8 | byte;
    return true;
}

int dashedMacToWwnText(char (&out)[24], const char* mac)
{
    constexpr std::size_t size = 17;
    if (!mac || std::strlen(mac) != size)
        return 1;
    for (std::size_t i = 2; i < size; i += 3)
        if (mac[i] != '-')
            return 1;
    std::memcpy(out, mac, size);
    for (std::size_t i = 2; i < size; i += 3)
        out[i] = ':';
    std::memcpy(out + size, ":00:00", sizeof ":00:00");
    return 0;
}

// --- SCSI Inquiry page 0x83 ------------------------------------------------------------------------------

int designatorToRecord(DesignatorRecord* out, std::span<const std::uint8_t> page)
{
    if (!out)
        return 1;
    *out = DesignatorRecord();
    constexpr std::size_t header = 8; // 4 of the page, 4 of the designator
    if (page.size() < header)
        return 1;
    out->peripheralDeviceType = page[0] & 0x1F;
    out->pageCode = page[1];
    out->pageLength = page[3];
    out->designatorType = page[5] & 0x0F;
    const std::span<const std::uint8_t> value = page.subspan(header);
    const std::size_t length = std::min({std::size_t{page[7]}, value.size(), sizeof out->value});
    out->designatorLength = static_cast<std::uint32_t>(length);
    std::copy_n(value.begin(), length, out->value);
    return 0;
}

void descriptorToString(char (&out)[33], const Descriptor* descriptor)
{
    const std::uint32_t length = descriptor ? descriptor->designatorLength : 0;
    if (length == 8 || length == 12 || length == 16)
        return upperHex(descriptor->value, length, out);
    out[0] = '\0';
    TVR_LOG(TVR_ERR, "INVALID Descriptor");
}

// --- bytes and tokens ------------------------------------------------------------------------------------

void reverseBytes(const std::uint8_t* in, std::uint8_t* out, std::uint8_t count)
{
    std::reverse_copy(in, in + count, out);
}

char* splitToken(char* text, const char* separators, char** state)
{
    return strtok_r(text, separators, state);
}

// --- traces ----------------------------------------------------------------------------------------------

void logPair(const char* label, int value)
{
    TVR_LOG(TVR_DBG, "%s: %d", label, value);
}

void logStringPair(const char* label, const String& value)
{
    if (value.empty())
        TVR_LOG(TVR_DBG, "%s: ", label);
    else
        TVR_LOG(TVR_DBG, "%s: %s", label, value.c_str());
}

void logArrayOfInt(const char* label, std::span<const int> values)
{
    char text[1024];
    const int start = std::snprintf(text, sizeof text, "%s: ", label);
    std::size_t used = std::min(static_cast<std::size_t>(std::max(start, 0)), sizeof text - 1);
    for (std::size_t i = 0; i < values.size() && used < sizeof text - 1; ++i)
    {
        const int size = std::snprintf(text + used, sizeof text - used, i == 0 ? "%d" : ",%d", values[i]);
        used += static_cast<std::size_t>(size);
    }
    TVR_LOG(TVR_DBG, "%s", text);
}

} // namespace cimple
