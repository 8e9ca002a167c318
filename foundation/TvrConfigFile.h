// The settings of the instance cache and their file.
#pragma once

#include "runtime/threads/Thread.h"

#include <sys/types.h>

#include <atomic>
#include <cstdint>
#include <optional>
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
    /// Saves.
    ~TvrConfigFile() { save(); }
    TvrConfigFile(const TvrConfigFile&) = delete;
    TvrConfigFile& operator=(const TvrConfigFile&) = delete;

    /// Reads the file and remembers its path; null does nothing. A file that is missing or cannot be read leaves the
    /// settings as they are.
    void load(const char* path);
    /// Writes what was loaded or set and not saved yet to the file of load(), where it is missing or has another text.
    /// On a failure the log says so, and the file stays as it is. A file that load() could not read is left alone
    /// unless a setting was changed; a child that was forked after load() writes nothing.
    void save() noexcept;

    // The setters return 0, or non-zero with nothing changed: the timeout takes 1 to 30, the flags 0 and 1.
    int setCacheTimeout(unsigned minutes);
    int setRefreshAdapterData(unsigned value);
    int setRefreshSANData(unsigned value);

    std::int32_t getCacheTimeout() const;
    bool getRefreshAdapterData() const;
    bool getRefreshSANData() const;

private:
    std::optional<CacheSettings> takePending();
    template <class T> int set(T CacheSettings::*field, T value);
    template <class T> T get(T CacheSettings::*field) const;

    CacheSettings _settings;
    bool _isPending = false; ///< something was loaded or set since save()
    std::string _path;
    std::atomic<pid_t> _loader{0}; ///< the process of load()
    mutable Mutex _mutex;          ///< guards _settings and _isPending
};

} // namespace cimple
