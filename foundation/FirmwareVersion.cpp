#include "foundation/FirmwareVersion.h"

#include "foundation/CommonHelpers.h"
#include "foundation/Log.h"
#include "foundation/Text.h"

#include <cctype>
#include <cstdio>
#include <string_view>

namespace cimple
{

namespace
{

bool isDigit(char c)
{
    return std::isdigit(static_cast<unsigned char>(c)) != 0;
}

bool hasVersionShape(std::string_view text)
{
    return text.size() >= 6 && isDigit(text[0]) && text[1] == '.' && isDigit(text[2]) && isDigit(text[3]) &&
           std::isalpha(static_cast<unsigned char>(text[4])) && isDigit(text[5]);
}

/// Compares what islower() returns, not the character. The C libraries in use return a bit mask that is never 'r',
/// so suffixes are ignored.
bool marksTestRelease(std::string_view text)
{
    return text.size() > 7 && text[6] != ' ' && std::islower(static_cast<unsigned char>(text[6])) == 'r';
}

std::uint16_t digit(char c)
{
    return static_cast<std::uint16_t>(c - '0');
}

int fail()
{
    TVR_LOG(TVR_DBG, "parseVersion Error: Invalid Firmware String");
    return invalidVersion;
}

int parse(std::string_view text, FirmwareVersion& out)
{
    if (!hasVersionShape(text))
        return fail();
    TVR_LOG(TVR_DBG, "Parsed the major, minor, revision & build numbers");
    if (marksTestRelease(text))
    {
        if (!isDigit(text[7]))
            return fail();
        TVR_LOG(TVR_DBG, "parseVersion: This seems to be a Test Release Firmware...");
        out.testRelease.append('r');
        out.testRelease.append(text[7]);
    }
    TVR_LOG(TVR_DBG, "Parsed the revision for Test Firmwares");
    out.major = digit(text[0]);
    out.minor = digit(text[2]);
    out.revision = digit(text[3]);
    out.build = digit(text[5]);
    TVR_LOG(TVR_DBG, "Filled Major, Minor, Revision & Build Numbers");
    out.releaseType = String(text.substr(4, 1));
    TVR_LOG(TVR_DBG, "Filled ReleaseType");
    TVR_LOG(TVR_DBG, "parseVersion: Version parsing success");
    return 0;
}

} // namespace

int parseVersion(const char* text, FirmwareVersion& out)
{
    if (!text)
    {
        TVR_LOG(TVR_DBG, "parseVersion Error: Input FirmwareVersion is Null");
        return invalidVersion;
    }
    TVR_LOG(TVR_DBG, "Input Version String: [%s]", text);
    try
    {
        return parse(text, out);
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "parseVersion: error occurred while parsing...");
        return invalidVersion;
    }
}

void parseDottedVersion(const char* text, std::uint16_t (&out)[4])
{
    char buffer[64];
    std::snprintf(buffer, sizeof buffer, "%s", text ? text : "");
    TVR_LOG(TVR_DBG, "%s", buffer);
    char* state = nullptr;
    const char* token = splitToken(buffer, ".", &state);
    for (std::uint16_t& slot : out)
    {
        if (!token)
            break;
        slot = static_cast<std::uint16_t>(parseDecimal(token));
        token = splitToken(nullptr, ".", &state);
    }
    TVR_LOG(TVR_DBG, "%d, %d, %d, %d", out[0], out[1], out[2], out[3]);
}

} // namespace cimple
