// The text of the log data file: "mode,level,enabled" and, on a second line, the path of the log file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace cimple
{

/// Sizes of the buffers that hold the two lines, terminator included.
inline constexpr std::size_t logDataFirstLine = 20;
inline constexpr std::size_t logDataSecondLine = 256;

enum class LogDataFault
{
    None,
    ModeMissing,
    ModeInvalid,
    LevelMissing,
    LevelInvalid,
    EnabledMissing,
    EnabledInvalid,
    PathMissing, ///< of a mode that writes to a file
};

/// What was read up to the fault, if any.
struct LogData
{
    std::int32_t mode = 0;               ///< 0 to 4
    std::int32_t level = 0;              ///< 0 to 5
    std::optional<std::int32_t> enabled; ///< counts even when it is negative and thus a fault
    std::string path;                    ///< only for modes that write to a file
    LogDataFault fault = LogDataFault::None;
};

LogData parseLogData(std::string_view text);

/// Whether the path of a log file is read back as it is.
bool fitsLogData(std::string_view path);

} // namespace cimple
