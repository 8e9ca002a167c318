// The settings of the instance cache and their file.
#pragma once

#include "runtime/Thread.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace cimple
{

struct CacheSettings
{
    bool refreshAdapterData = false;
    bool refreshSANData = true;
    std::int32_t cacheTimeout = 10; ///< minutes, 1 to 30
};

/// Applies the lines "key = value" of a text; what is unknown, invalid or repeats a key that was set is passed over.
void parseSettings(std::string_view text, CacheSettings& settings);
/// The text that parseSettings() reads back.
std::string formatSettings(const CacheSettings& settings);

/// The settings in memory: read from a file at start, changed by clients, written back at the end.
class TvrConfigFile
{
public:
    TvrConfigFile() = default;
    /// Writes the file.
    ~TvrConfigFile() { save(); }
    TvrConfigFile(const TvrConfigFile&) = delete;
    TvrConfigFile& operator=(const TvrConfigFile&) = delete;

    /// Reads the file and remembers its path; null does nothing. A file that is missing or cannot be read leaves the
    /// settings as they are.
    void load(const char* path);
    /// Writes the file of load(); silent when there is none or it cannot be opened.
    void save() const;

    // The setters return 0, or non-zero with nothing changed: the timeout takes 1 to 30, the flags 0 and 1.
    int setCacheTimeout(unsigned minutes);
    int setRefreshAdapterData(unsigned value);
    int setRefreshSANData(unsigned value);

    std::int32_t getCacheTimeout() const;
    bool getRefreshAdapterData() const;
    bool getRefreshSANData() const;

private:
    int setFlag(bool CacheSettings::*flag, unsigned value);
    template <class T> T get(T CacheSettings::*field) const;

    CacheSettings _settings;
    std::string _path;
    mutable Mutex _mutex; ///< guards _settings
};

} // namespace cimple
