#include "model/Build.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <string>

namespace cimple
{

Instance* insertInstance(Instance_Map& map, Instance* instance, const InsertFailure& failure)
{
    if (instance && map.insert(instance) != -1)
        return instance;
    const char* slash = std::strrchr(failure.file, '/');
    TVR_Logger::instance().log(slash ? slash + 1 : failure.file, &failure.line, TVR_CRIT, "%s", failure.text);
    unref(instance);
    return nullptr;
}

String formatText(const char* format, ...)
{
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    const int size = std::vsnprintf(nullptr, 0, format, args);
    va_end(args);
    std::string text(size > 0 ? static_cast<std::size_t>(size) : 0, '\0');
    std::vsnprintf(text.data(), text.size() + 1, format, again);
    va_end(again);
    return String(text);
}

} // namespace cimple
