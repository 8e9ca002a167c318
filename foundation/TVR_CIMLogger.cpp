#include "foundation/TVR_CIMLogger.h"

#include <cstdio>

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
    Auto_Mutex lock(_mutex);
    return _entries;
}

void TVR_CIMLogger::logMessage(int level, const char*, unsigned, const char* message)
{
    if (!message || level > TVR_ERR || !modeWritesRing(TVR_Logger::instance().getMode()))
        return;
    TVR_CIMLogEntry entry{level, Datetime::now(), {}};
    formatText(entry.text, message);
    Auto_Mutex lock(_mutex);
    const std::int32_t index = nextIndex();
    if (_entries.size() < static_cast<std::size_t>(capacity))
        _entries.push_back(entry);
    else
        _entries[static_cast<std::size_t>(index)] = entry;
}

void TVR_CIMLogger::clearLog()
{
    Auto_Mutex lock(_mutex);
    _entries.clear();
    _lastIndex = -1;
}

std::int32_t TVR_CIMLogger::nextIndex()
{
    _lastIndex = (_lastIndex + 1) % capacity;
    return _lastIndex;
}

} // namespace cimple
