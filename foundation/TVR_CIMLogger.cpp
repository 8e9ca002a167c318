#include "foundation/TVR_CIMLogger.h"

#include "runtime/base/Time.h"

#include <algorithm>
#include <cstdio>
#include <iterator>
#include <new>

namespace cimple
{

namespace
{

/// Formats in brackets, and cuts a longer text at a character's start, so that what clients get stays valid UTF-8.
template <std::size_t N> void formatText(char (&out)[N], const char* message)
{
    const int size = std::snprintf(out, N, "[%s]", message);
    if (size < static_cast<int>(N))
        return;
    std::size_t end = N - 1; // bytes kept of "[" and the message
    while (end > N - 4 && (static_cast<unsigned char>(message[end - 1]) & 0xC0) == 0x80)
        --end;
    out[end] = '\0';
}

} // namespace

TVR_CIMLogger::TVR_CIMLogger()
{
    TVR_Logger::instance().addSink(this);
}

TVR_CIMLogger::~TVR_CIMLogger()
{
    TVR_Logger::instance().removeSink(this);
}

std::vector<TVR_CIMLogEntry> TVR_CIMLogger::entries() const
{
    std::vector<Record> records;
    {
        Auto_Mutex lock(_mutex);
        records = _records;
    }
    std::vector<TVR_CIMLogEntry> entries;
    entries.reserve(records.size());
    for (const Record& record : records)
    {
        TVR_CIMLogEntry& entry = entries.emplace_back();
        entry.level = record.level;
        entry.timestamp.set(record.usec, record.utc, record.isTimestamp);
        std::copy(std::begin(record.text), std::end(record.text), entry.text);
    }
    return entries;
}

unsigned TVR_CIMLogger::takes() const
{
    return modeWritesRing(TVR_Logger::instance().getMode()) ? levelsUpTo(TVR_ERR) : 0;
}

void TVR_CIMLogger::logMessage(int level, const char*, unsigned, const char* message)
{
    if (!message || (takes() & levelBit(level)) == 0)
        return;
    Record record{level, 0, 0, false, {}};
    record.isTimestamp = time_source().now(record.usec, record.utc);
    formatText(record.text, message);
    Auto_Mutex lock(_mutex);
    if (_records.size() == static_cast<std::size_t>(capacity))
        _records[static_cast<std::size_t>(nextIndex())] = record;
    else if (append(record))
        nextIndex();
}

bool TVR_CIMLogger::append(const Record& record)
try
{
    _records.push_back(record);
    return true;
}
catch (const std::bad_alloc&)
{
    return false;
}

void TVR_CIMLogger::clearLog()
{
    Auto_Mutex lock(_mutex);
    _records.clear();
    _lastIndex = -1;
}

std::int32_t TVR_CIMLogger::nextIndex()
{
    _lastIndex = (_lastIndex + 1) % capacity;
    return _lastIndex;
}

} // namespace cimple
