#include "device/ForeignText.h"

#include "device/TVR_MethodWrapper.h"
#include "foundation/CommonHelpers.h"
#include "foundation/Log.h"

#include <exception>

namespace cimple
{

std::string wwnText(const HBA_WWN& wwn)
{
    char text[17];
    wwnToUpperHex(wwn.wwn, text);
    return text;
}

std::string lunText(std::uint64_t field)
{
    char text[17];
    lunToText(field, text);
    return text;
}

void lunToText(std::uint64_t field, char (&text)[17])
{
    std::uint8_t bytes[sizeof field];
    std::memcpy(bytes, &field, sizeof field);
    wwnToUpperHex(bytes, text);
}

HBA_WWN wwnOf(const std::string& text)
{
    HBA_WWN wwn{};
    if (!TVR_MethodWrapper::string2HBAName(&wwn, text))
    {
        TVR_LOG(TVR_ERR, "TVR_MethodWrapper::string2HBAName failed");
        throw std::exception();
    }
    return wwn;
}

} // namespace cimple
