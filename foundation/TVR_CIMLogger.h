// The log sink that keeps recent errors in memory, for clients to read as log records.
#pragma once

#include "foundation/Log.h"
#include "runtime/Datetime.h"

#include <cstdint>
#include <vector>

namespace cimple
{

struct TVR_CIMLogEntry
{
    std::int32_t level;
    Datetime timestamp;
    char text[200]; ///< the message in brackets, cut to fit
};

/// A ring of the newest critical messages, warnings and errors; works in modes 1 and 4. Registered with the logger
/// from construction to destruction.
class TVR_CIMLogger final : public TVR_LoggerInterface
{
public:
    static constexpr std::int32_t capacity = 1024;

    TVR_CIMLogger();
    ~TVR_CIMLogger() override;

    /// A copy of the records in ring order: when the ring has wrapped, the oldest stands behind the newest.
    std::vector<TVR_CIMLogEntry> entries() const;

    void logMessage(int level, const char* file, unsigned line, const char* message) override;
    void start() override {}
    void stop() override {}
    void clearLog() override;

private:
    /// Place of the next record; the mutex is held.
    std::int32_t nextIndex();

    mutable Mutex _mutex; ///< taken after the logger's
    std::int32_t _lastIndex = -1;
    std::vector<TVR_CIMLogEntry> _entries;
};

} // namespace cimple
