// The log sink that keeps recent errors in memory, for clients to read as log records.
#pragma once

#include "foundation/Log.h"
#include "runtime/values/Datetime.h"

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
/// from construction to destruction. A message that finds no memory is dropped.
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
    unsigned takes() const override;

private:
    /// An entry as long as it is not asked for: without a value that would need memory of its own.
    struct Record
    {
        std::int32_t level;
        std::uint64_t usec;
        std::int32_t utc;
        bool isTimestamp;
        char text[sizeof TVR_CIMLogEntry::text];
    };

    // The mutex is held.
    bool append(const Record& record); ///< false if there is no memory
    std::int32_t nextIndex();          ///< place of the next record

    mutable Mutex _mutex; ///< taken after the logger's
    std::int32_t _lastIndex = -1;
    std::vector<Record> _records;
};

} // namespace cimple
