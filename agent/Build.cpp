#include "agent/Build.h"

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <string>

namespace cimple
{

Instance* insertInstance(Instance_Map& map, Ref<> instance, const LogText& failure)
{
    if (instance && map.insert(instance.get()) != -1)
        return instance.release();
    failure.log();
    return nullptr;
}

const String& moduleNamespace()
{
    static Immortal<const String> name(providerNamespace);
    return *name;
}

String joinTexts(std::initializer_list<std::string_view> parts)
{
    std::size_t size = 0;
    for (const std::string_view part : parts)
        size += part.size();
    return String(size,
                  [&parts](char* end)
                  {
                      for (const std::string_view part : parts)
                          end = std::copy(part.begin(), part.end(), end);
                  });
}

String formatText(const char* format, ...)
{
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    char brief[256]; // most texts fit, and are formatted once
    const int size = std::vsnprintf(brief, sizeof brief, format, args);
    va_end(args);
    String text(size > 0 ? brief : "");
    if (size > 0 && static_cast<std::size_t>(size) >= sizeof brief)
    {
        std::string whole(static_cast<std::size_t>(size), '\0');
        std::vsnprintf(whole.data(), whole.size() + 1, format, again);
        text = whole;
    }
    va_end(again);
    return text;
}

} // namespace cimple
