// The fixed paths of the program: one table.
#pragma once

#include <string>

namespace cimple
{

enum class FilePath
{
    ProviderConfig,  ///< cache settings, read at start and written at the end
    WebLaunchConfig, ///< URL of the management page
    LogData,         ///< log mode, level and path across restarts
    LogDataFallback, ///< the same where the root file system is read-only
    FfdcLog,         ///< log of a provider without readable log data
    KernelVersion,
    OsDistribution,
    SystemLog,      ///< holds the kernel driver's lines
    TagTableFolder, ///< FC tag tables on their way to and from a client
};

/// The path of the table behind the root prefix of this moment: the environment variable TVR_FILE_ROOT, which tests
/// and demos set so that they touch no file of the host. Ignored in a process with raised privileges.
std::string filePath(FilePath file);

} // namespace cimple
