// The log sink of the system log. It is silent for all levels in use; see write().
#pragma once

#include "foundation/Log.h"

namespace cimple
{

/// Registered with the logger from construction to destruction.
class TVR_SysLogger final : public TVR_LoggerInterface
{
public:
    TVR_SysLogger();
    ~TVR_SysLogger() override;

    static constexpr unsigned levels = levelsUpTo(TVR_INVALID);

    /// Passes on only messages of level 0 or below, as they are: the system log escapes what needs it. Needs no sink
    /// object: messages may come this way, without the logger's mutex, while the sink is being destroyed.
    static void write(int level, const char* message);

    void logMessage(int level, const char* file, unsigned line, const char* message) override;
    void start() override {}
    void stop() override {}
    void clearLog() override {}
    unsigned takes() const override { return levels; }
};

} // namespace cimple
