#include "logs/RecordLog.h"

#include "agent/MethodCall.h"
#include "agent/RecordLogs.h"
#include "foundation/ClientText.h"
#include "foundation/FilePaths.h"
#include "logs/DriverLog.h"
#include "runtime/adapter/Provider.h"

namespace cimple
{

namespace
{

constexpr LogText noLog = {TVR_ERR, "Invalid instance of Record Log"};
constexpr LogText noPath = {TVR_ERR, "Setting the trace path failed"};
constexpr MethodEnd wrongLog = {33068};
constexpr MethodEnd wrongValue = {32968};

// CIM_EnabledLogicalElement
constexpr std::uint16_t enabled = 2;
constexpr std::uint16_t disabled = 3;
// CIM_ManagedSystemElement.OperationalStatus
constexpr std::uint16_t ok = 2;
constexpr std::uint16_t stopped = 10;

bool isDriverLog(ProviderAgent& agent, const String& id)
{
    return id == driverLogId(agent);
}

TVRHBA_RecordLog& knownLog(ProviderAgent& agent, const Instance* reference)
{
    TVRHBA_RecordLog* log = mapOf<TVRHBA_RecordLog>(agent).withKeysOf(reference);
    if (!log)
        MethodCall::end(noLog, wrongLog);
    return *log;
}

int valueUpTo(int most, const Property<std::uint16_t>& value, const LogText& outOfRange)
{
    if (value.null || value.value < 1 || value.value > most)
        MethodCall::end(outOfRange, wrongValue);
    return value.value;
}

/// What the data file gets holds once it is read back, as after a restart. A file that cannot be written holds the old
/// parameters, which are not to undo the change.
void keepParameters()
{
    if (TVR_Logger::instance().writeDataFile())
        TVR_Logger::instance().readDataFile();
}

void setState(TVRHBA_RecordLog& log, std::uint16_t state, std::uint16_t status)
{
    log.RequestedState.set(state);
    log.EnabledState.set(state);
    log.OperationalStatus.set({status});
}

std::uint32_t setLogParams(const Instance* reference, TVRHBA_RecordLog_SetLogParams_method& parameters)
{
    MethodCall call({});
    ProviderAgent& agent = call.agent();
    TVR_Logger& logger = TVR_Logger::instance();
    const auto* named = cast<TVRHBA_RecordLog>(reference); // the driver's need not be in the cache
    if (named && !named->InstanceID.null && isDriverLog(agent, named->InstanceID.value))
        MethodCall::end({TVR_CRIT, "SetLogParams is not supported for Driver Record Log Instance"},
                        {0, INVOKE_METHOD_UNSUPPORTED});
    TVRHBA_RecordLog& log = knownLog(agent, reference);
    const int level = valueUpTo(TVR_DBG, parameters.LogLevel, {TVR_ERR, "Log level provided is out of range"});
    const int mode = valueUpTo(4, parameters.LogMode, {TVR_ERR, "Log mode provided is out of range"});
    const String path = parameters.TracePath.null ? String() : parameters.TracePath.value;
    if (modeWritesFile(mode) && (path.empty() || agent.m_fileLogger.validateAndSetClientPath(path) != 0))
        MethodCall::end(noPath, wrongValue);
    TVR_LOG(TVR_CRIT, "Changing the record log parameters %d-%d-%s", level, mode, path.c_str());
    logger.clearFfdcMode();
    logger.setLevel(level);
    logger.setMode(mode);
    const String used = agent.m_fileLogger.getPath();
    TVR_LOG(TVR_DBG, "Setting path as %s", used.c_str());
    log.TracePath.set(clientText(used.view()));
    log.LogLevel.set(static_cast<std::uint16_t>(level));
    log.LogMode.set(static_cast<std::uint16_t>(mode));
    keepParameters();
    return 0;
}

std::uint32_t clearLog(const Instance* reference, CIM_Log_ClearLog_method&)
{
    MethodCall call({});
    ProviderAgent& agent = call.agent();
    TVRHBA_RecordLog& log = knownLog(agent, reference);
    if (isDriverLog(agent, log.InstanceID.value))
    {
        agent.m_deviceEvents.clear();
        log.CurrentNumberOfRecords.set(0);
        return 0;
    }
    TVR_Logger::instance().clearAll();
    TVR_LOG(TVR_WARN, "Cleared all the logs");
    return 0;
}

void enableLogging(const ProviderAgent& agent)
{
    if (agent.m_fileLogger.getPath().view() == filePath(FilePath::FfdcLog))
    {
        TVR_LOG(TVR_ERR, "The tracepath has not been set yet. Until the tracepath is set, FFDC will be used to log "
                         "messages.");
        return;
    }
    TVR_Logger::instance().enable();
    TVR_Logger::instance().clearFfdcMode();
}

void enable(ProviderAgent& agent, TVRHBA_RecordLog& log, bool isDriver)
{
    enableLogging(agent);
    setState(log, enabled, ok);
    if (!isDriver)
        return TVR_LOG(TVR_WARN, "FC Record Logs enabled");
    agent.m_deviceEvents.clear();
    readDriverLog(agent);
    log.CurrentNumberOfRecords.set(agent.m_deviceEvents.strings().size());
}

void disable(ProviderAgent& agent, TVRHBA_RecordLog& log, bool isDriver)
{
    TVR_LOG(TVR_WARN, "Logs disabled");
    TVR_Logger::instance().disable();
    setState(log, disabled, stopped);
    if (isDriver)
        agent.m_deviceEvents.clear();
}

std::uint32_t requestStateChange(const Instance* reference,
                                 CIM_EnabledLogicalElement_RequestStateChange_method& parameters)
{
    MethodCall call({});
    ProviderAgent& agent = call.agent();
    TVRHBA_RecordLog& log = knownLog(agent, reference);
    const bool isDriver = isDriverLog(agent, log.InstanceID.value);
    if (isDriver)
        TVR_LOG(TVR_DBG, "Instance of FC Driver Record Log");
    const std::uint16_t state = parameters.RequestedState.null ? 0 : parameters.RequestedState.value;
    if (state == enabled)
        enable(agent, log, isDriver);
    else if (state == disabled)
        disable(agent, log, isDriver);
    else
        MethodCall::end({TVR_ERR, "Invalid input"}, wrongValue);
    if (!isDriver)
        keepParameters();
    return 0;
}

} // namespace

std::span<const MethodRow> recordLogMethods()
{
    return methodTable<TVRHBA_RecordLog, &setLogParams, &clearLog, &requestStateChange>;
}

} // namespace cimple
