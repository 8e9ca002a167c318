#include "foundation/TvrConfigFile.h"

#include "foundation/File.h"
#include "foundation/Log.h"
#include "foundation/Text.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iterator>
#include <new>
#include <utility>

namespace cimple
{

using namespace std::string_view_literals;

namespace
{

constexpr std::size_t maximumLines = 1000;
constexpr std::size_t lineBuffer = 1024;

constexpr bool isValidTimeout(std::int64_t minutes)
{
    return minutes >= 1 && minutes <= 30;
}

bool readTimeout(std::string_view value, CacheSettings& settings)
{
    const std::int32_t minutes = parseDecimal(value);
    if (!isValidTimeout(minutes))
        return false;
    settings.cacheTimeout = minutes;
    return true;
}

template <bool CacheSettings::*flag> bool readFlag(std::string_view value, CacheSettings& settings)
{
    if (value != "TRUE"sv && value != "FALSE"sv)
        return false;
    settings.*flag = value == "TRUE"sv;
    return true;
}

struct Key
{
    std::string_view name;
    /// Stores a valid value and returns true.
    bool (*read)(std::string_view value, CacheSettings& settings);
};

constexpr Key keys[] = {
    {"TVR_PROVIDER_CACHE_TIMEOUT", readTimeout},
    {"TVR_PROVIDER_REFRESH_ADAPTERDATA", readFlag<&CacheSettings::refreshAdapterData>},
    {"TVR_PROVIDER_REFRESH_SANDATA", readFlag<&CacheSettings::refreshSANData>},
};

const char* flagText(bool flag)
{
    return flag ? "TRUE" : "FALSE";
}

} // namespace

void parseSettings(std::string_view text, CacheSettings& settings)
{
    bool isRead[std::size(keys)] = {};
    Line_Reader lines(text);
    for (std::size_t count = 0; count < maximumLines; ++count)
    {
        const auto next = lines.next(lineBuffer);
        if (!next)
            return;
        const std::string_view line = trim(*next);
        const std::size_t equals = line.find('=');
        if (line.starts_with('#') || equals == std::string_view::npos)
            continue;
        const std::string_view name = trim(line.substr(0, equals));
        const std::string_view value = trim(line.substr(equals + 1));
        for (std::size_t i = 0; i < std::size(keys); ++i)
            if (name == keys[i].name && !isRead[i])
                isRead[i] = keys[i].read(value, settings);
    }
}

std::string formatSettings(const CacheSettings& settings)
{
    char text[512];
    std::snprintf(text, sizeof text,
                  "##################################################\n"
                  "# Tavrin HBA CIM Provider Configuration Settings #\n"
                  "##################################################\n"
                  "TVR_PROVIDER_CACHE_TIMEOUT = %d\n"
                  "TVR_PROVIDER_REFRESH_ADAPTERDATA = %s\n"
                  "TVR_PROVIDER_REFRESH_SANDATA = %s\n",
                  settings.cacheTimeout, flagText(settings.refreshAdapterData), flagText(settings.refreshSANData));
    return text;
}

void TvrConfigFile::load(const char* path)
{
    if (!path)
        return;
    _path = path;
    _loader = getpid();
    struct stat status;
    errno = 0;
    stat(path, &status);
    const bool isMissing = errno == ENOENT;
    const auto text = isMissing ? std::optional(std::string()) : readTextFile(path, maximumLines * lineBuffer);
    if (!text)
        return TVR_LOG(TVR_ERR, "Unable to open provider config setting file - %s", path);
    Auto_Mutex lock(_mutex);
    parseSettings(*text, _settings);
    _isPending = true;
}

std::optional<CacheSettings> TvrConfigFile::takePending()
{
    Auto_Mutex lock(_mutex);
    return std::exchange(_isPending, false) ? std::optional(_settings) : std::nullopt;
}

void TvrConfigFile::save() noexcept
{
    if (_loader != getpid()) // in a child the mutex may be held by a thread that only its parent has
        return;
    const auto settings = takePending();
    if (!settings)
        return;
    try
    {
        if (!failed(replaceFile(_path.c_str(), formatSettings(*settings))))
            return;
    }
    catch (const std::bad_alloc&)
    {
        errno = ENOMEM;
    }
    TVR_LOG(TVR_ERR, "Unable to write provider config setting file - %s: %s", _path.c_str(), std::strerror(errno));
}

template <class T> int TvrConfigFile::set(T CacheSettings::*field, T value)
{
    Auto_Mutex lock(_mutex);
    _settings.*field = value;
    _isPending = true;
    return 0;
}

int TvrConfigFile::setCacheTimeout(unsigned minutes)
{
    return isValidTimeout(minutes) ? set(&CacheSettings::cacheTimeout, static_cast<std::int32_t>(minutes)) : -1;
}

int TvrConfigFile::setRefreshAdapterData(unsigned value)
{
    return value <= 1 ? set(&CacheSettings::refreshAdapterData, value == 1) : -1;
}

int TvrConfigFile::setRefreshSANData(unsigned value)
{
    return value <= 1 ? set(&CacheSettings::refreshSANData, value == 1) : -1;
}

template <class T> T TvrConfigFile::get(T CacheSettings::*field) const
{
    Auto_Mutex lock(_mutex);
    return _settings.*field;
}

std::int32_t TvrConfigFile::getCacheTimeout() const
{
    return get(&CacheSettings::cacheTimeout);
}

bool TvrConfigFile::getRefreshAdapterData() const
{
    return get(&CacheSettings::refreshAdapterData);
}

bool TvrConfigFile::getRefreshSANData() const
{
    return get(&CacheSettings::refreshSANData);
}

} // namespace cimple
