#include "foundation/LogDataFile.h"

#include "foundation/CommonHelpers.h"
#include "foundation/File.h"
#include "foundation/Log.h"
#include "foundation/TVR_FileLogger.h"
#include "foundation/Text.h"

#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>

namespace cimple
{

// --- text ----------------------------------------------------------------------------------------------

namespace
{

LogDataFault parseParameters(std::string_view line, LogData& data)
{
    std::string text(line);
    char* state = nullptr;
    const char* token = splitToken(text.data(), ",", &state);
    if (!token)
        return LogDataFault::ModeMissing;
    data.mode = parseDecimal(token);
    if (static_cast<std::uint32_t>(data.mode) >= 5)
        return LogDataFault::ModeInvalid;

    token = splitToken(nullptr, ",", &state);
    if (!token)
        return LogDataFault::LevelMissing;
    data.level = parseDecimal(token);
    if (static_cast<std::uint32_t>(data.level) > TVR_DBG)
        return LogDataFault::LevelInvalid;

    token = splitToken(nullptr, ",", &state);
    if (!token)
        return LogDataFault::EnabledMissing;
    data.enabled = parseDecimal(token);
    return *data.enabled < 0 ? LogDataFault::EnabledInvalid : LogDataFault::None;
}

std::string_view cutAtLast(std::string_view text, char c)
{
    return text.substr(0, text.rfind(c));
}

void logFault(const LogData& data, const char* path)
{
    switch (data.fault)
    {
    case LogDataFault::ModeMissing:
        return TVR_LOG(TVR_ERR, "Unable to read Log Mode from config data file - %s", path);
    case LogDataFault::ModeInvalid:
        return TVR_LOG(TVR_ERR, "Invalid value for Log Mode from config data file -%s-%u", path,
                       static_cast<std::uint32_t>(data.mode));
    case LogDataFault::LevelMissing:
        return TVR_LOG(TVR_ERR, "Unable to read Log Level from config data file - %s", path);
    case LogDataFault::LevelInvalid:
        return TVR_LOG(TVR_ERR, "Invalid value for Log Level from config data file -%s-%u", path,
                       static_cast<std::uint32_t>(data.level));
    case LogDataFault::EnabledMissing:
        return TVR_LOG(TVR_ERR, "Unable to read Log Enabled from config data file - %s", path);
    case LogDataFault::EnabledInvalid:
        return TVR_LOG(TVR_ERR, "Invalid value for Log Enabled from config data file - %s", path);
    case LogDataFault::PathMissing:
    case LogDataFault::None:
        return;
    }
}

} // namespace

LogData parseLogData(std::string_view text)
{
    LogData data;
    Line_Reader lines(text);
    data.fault = parseParameters(lines.next(logDataFirstLine).value_or(""), data);
    if (data.fault != LogDataFault::None || !modeWritesFile(data.mode))
        return data;
    if (const auto line = lines.next(logDataSecondLine))
        data.path = cutAtLast(cutAtLast(*line, '\r'), '\n');
    else
        data.fault = LogDataFault::PathMissing;
    return data;
}

bool fitsLogData(std::string_view path)
{
    return parseLogData(std::string("2,0,0\n").append(path)).path == path;
}

// --- file ----------------------------------------------------------------------------------------------

void TVR_Logger::resolveDataPath()
{
    _dataFile = IsReadOnlyFS() ? FilePath::LogDataFallback : FilePath::LogData;
    _dataPathResolved = true;
}

std::string TVR_Logger::dataPath()
{
    if (!_dataPathResolved)
        resolveDataPath();
    return filePath(_dataFile);
}

bool TVR_Logger::dataFileAccessible()
{
    if (access(dataPath().c_str(), R_OK) == 0)
        return true;
    TVR_LOG(TVR_CRIT, "File access failed with %s", std::strerror(errno));
    return false;
}

void TVR_Logger::readDataFile()
{
    if (!dataFileAccessible())
        resolveDataPath();
    const std::string path = dataPath();
    const auto text = readTextFile(path.c_str(), logDataFirstLine + logDataSecondLine);
    if (!text)
        return TVR_LOG(TVR_ERR, "Unable to open config data file - %s", path.c_str());

    const LogData data = parseLogData(*text);
    if (data.enabled)
        _enabled = *data.enabled;
    if (data.fault != LogDataFault::None)
        return logFault(data, path.c_str());
    if (modeWritesFile(data.mode))
    {
        Auto_Mutex lock(_mutex);
        TVR_FileLogger* sink = fileSink();
        if (sink && sink->setPath(data.path.c_str(), _ffdcMode) != 0)
            return;
    }
    setLevel(data.level);
    setMode(data.mode);
}

std::string TVR_Logger::dataText()
{
    char parameters[64];
    std::snprintf(parameters, sizeof parameters, "%d,%d,%d\n", getMode(), getLevel(), isEnabled() ? 1 : 0);
    std::string text = parameters;
    Auto_Mutex lock(_mutex);
    if (const TVR_FileLogger* sink = fileSink())
        text += sink->getPath().c_str();
    return text;
}

bool TVR_Logger::writeDataFile()
{
    const std::string path = dataPath();
    const Replacement replacement = replaceFile(path.c_str(), dataText());
    if (replacement == Replacement::NotOpened)
        TVR_LOG(TVR_ERR, "Unable to open dump file\n");
    else if (replacement == Replacement::NotWritten)
        TVR_LOG(TVR_ERR, "Unable to write dump file - %s: %s", path.c_str(), std::strerror(errno));
    return !failed(replacement);
}

} // namespace cimple
