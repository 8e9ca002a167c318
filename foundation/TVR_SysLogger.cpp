#include "foundation/TVR_SysLogger.h"

#include <syslog.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>

namespace cimple
{

namespace
{

/// By level; TVR_DBG has none. The row of TVR_INVALID is what the sink uses, since it drops the levels above.
constexpr int priorities[] = {-1, LOG_CRIT, LOG_WARNING, LOG_ERR, LOG_INFO};

bool startsWith(const char* text, const char* start, std::size_t size)
{
    return std::strncmp(text, start, size) == 0;
}

/// Of the process to the system log; closed at the end of the process, too, where the sink is still there by then. A
/// forked child leaves it to its parent.
class Connection
{
public:
    ~Connection() { close(); }
    void open()
    {
        openlog("[TVR][CIM][FC]", LOG_NDELAY | LOG_NOWAIT, LOG_USER);
        _opener = getpid();
    }
    void close()
    {
        if (_opener.exchange(0) == getpid())
            closelog();
    }

private:
    std::atomic<pid_t> _opener{0};
};

Connection connection;

} // namespace

TVR_SysLogger::TVR_SysLogger()
{
    TVR_Logger::instance().addSink(this);
    connection.open();
}

TVR_SysLogger::~TVR_SysLogger()
{
    TVR_Logger::instance().removeSink(this);
    connection.close();
}

void TVR_SysLogger::write(int level, const char* message)
{
    if ((levels & levelBit(level)) == 0)
        return;
    char buffer[2048];
    std::snprintf(buffer, sizeof buffer, "[%s]\n", message);
    // These polls are not to fill the system log. The bracket keeps the tests from matching.
    if (startsWith(buffer, "GetInterfaceState", 15) || startsWith(buffer, "GetIPAddressType", 13))
        return;
    syslog(priorities[TVR_INVALID], "%s", buffer);
}

void TVR_SysLogger::logMessage(int level, const char*, unsigned, const char* message)
{
    write(level, message);
}

} // namespace cimple
