#include "foundation/HostInformation.h"

#include "foundation/FilePaths.h"
#include "foundation/Log.h"

#include <sys/statvfs.h>

#include <atomic>
#include <exception>
#include <fstream>
#include <string>

namespace cimple
{

namespace
{

std::atomic<Statvfs> askFileSystem{statvfs};
std::atomic<bool> isChecked{false};
std::atomic<bool> isReadOnly{false};

} // namespace

bool IsReadOnlyFS()
{
    TVR_LOG(TVR_DBG, " Inside IsReadOnlyFS()");
    if (isChecked)
        return isReadOnly;
    struct statvfs status;
    if (askFileSystem.load()("/", &status) != 0)
        return isReadOnly;
    // The answer before the mark: another thread may look between the two.
    if (status.f_flag & ST_RDONLY)
        isReadOnly = true;
    isChecked = true;
    return isReadOnly;
}

void setStatvfs(Statvfs function)
{
    askFileSystem = function ? function : statvfs;
    isChecked = false;
    isReadOnly = false;
}

int getOSInformation(String& osName, String& osDistribution)
{
    TVR_LOG(TVR_DBG, "Inside  getOSInformation");
    osName = "Unknown";
    osDistribution = "Unknown";

    TVR_LOG(TVR_DBG, "Under _LINUX -- getting the os name and version");
    std::ifstream version(filePath(FilePath::KernelVersion));
    if (!version)
        return 1;
    char line[256];
    version.getline(line, sizeof line);
    osName = line;

    TVR_LOG(TVR_DBG, "Under _LINUX -- Getting the OS Distribution Name");
    std::ifstream issue(filePath(FilePath::OsDistribution), std::ios::ate);
    if (!issue)
        return TVR_LOG(TVR_ERR, "Unable to open the /etc/issue file to get OSDistribution Name"), 1;
    std::string banner;
    try
    {
        banner.resize(static_cast<std::size_t>(issue.tellg()));
    }
    catch (const std::exception&)
    {
        return TVR_LOG(TVR_ERR, "Unable to allocate the memory to store OSDistributionName"), 1;
    }
    issue.seekg(0);
    issue.read(banner.data(), static_cast<std::streamsize>(banner.size()));
    osDistribution = banner.c_str();
    return 0;
}

} // namespace cimple
