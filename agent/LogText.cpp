#include "agent/LogText.h"

#include <cstring>

namespace cimple
{

void LogText::log(std::uint32_t status) const
{
    if (!text)
        return;
    const char* slash = std::strrchr(file, '/');
    TVR_Logger::instance().log(slash ? slash + 1 : file, &line, level, text, static_cast<int>(status));
}

} // namespace cimple
