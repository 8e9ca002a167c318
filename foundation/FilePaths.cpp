#include "foundation/FilePaths.h"

#include <cstdlib>

namespace cimple
{

namespace
{

const char* fixedPath(FilePath file)
{
    switch (file)
    {
    case FilePath::ProviderConfig:
        return "/etc/tavrin_fc_provider.conf";
    case FilePath::WebLaunchConfig:
        return "/etc/tvr_smis.conf";
    case FilePath::LogData:
        return "/etc/tavrin_fc_provider.dmp";
    case FilePath::LogDataFallback:
        return "/var/log/tavrin_fc_provider.dmp";
    case FilePath::FfdcLog:
        return "/opt/ibm/platform/log/tavrin_fc_provider_ffdc.log";
    case FilePath::KernelVersion:
        return "/proc/version";
    case FilePath::OsDistribution:
        return "/etc/issue";
    case FilePath::SystemLog:
        return "/var/log/messages";
    case FilePath::TagTableFolder:
        return "/tmp";
    }
    return "";
}

} // namespace

std::string filePath(FilePath file)
{
    const char* root = secure_getenv("TVR_FILE_ROOT");
    return std::string(root ? root : "") + fixedPath(file);
}

} // namespace cimple
