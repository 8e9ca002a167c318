// The messages of the product log, as a sink gets them.
#pragma once

#include "foundation/Log.h"

#include <mutex>
#include <string>
#include <vector>

namespace test_support
{

/// Collects from its making on what is logged up to a level, from whatever thread.
class LogCollector : private cimple::TVR_LoggerInterface
{
public:
    explicit LogCollector(int level) : _level(level) { cimple::TVR_Logger::instance().addSink(this); }
    /// Stops collecting; before the end of its life, during which no message may come in.
    void stopCollecting() { cimple::TVR_Logger::instance().removeSink(this); }

    std::vector<std::string> messages() const
    {
        const std::lock_guard lock(_mutex);
        return _messages;
    }

private:
    void logMessage(int level, const char*, unsigned, const char* message) override
    {
        const std::lock_guard lock(_mutex);
        if (level <= _level)
            _messages.push_back(message);
    }
    void start() override {}
    void stop() override {}
    void clearLog() override {}

    const int _level;
    mutable std::mutex _mutex;
    std::vector<std::string> _messages;
};

} // namespace test_support
