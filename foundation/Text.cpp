#include "foundation/Text.h"

#include <algorithm>
#include <cstdlib>
#include <string>

namespace cimple
{

std::int32_t parseDecimal(std::string_view text)
{
    const long value = std::strtol(std::string(text).c_str(), nullptr, 10);
    return static_cast<std::int32_t>(std::clamp<long>(value, INT32_MIN, INT32_MAX));
}

} // namespace cimple
