#include "foundation/HostInformation.h"

#include "foundation/File.h"
#include "foundation/FilePaths.h"
#include "foundation/Log.h"

#include <sys/statvfs.h>

#include <atomic>
#include <new>
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
    forgetRootFileSystem();
}

void forgetRootFileSystem()
{
    isChecked = false;
    isReadOnly = false;
}

namespace
{

constexpr std::size_t lineBuffer = 256;
constexpr std::size_t maximumBanner = 64 * 1024; // what clients get as a property

/// The text up to its first NUL.
String textOf(const std::string& content)
{
    return content.c_str();
}

} // namespace

int getOSInformation(String& osName, String& osDistribution)
{
    TVR_LOG(TVR_DBG, "Inside  getOSInformation");
    osName = "Unknown";
    osDistribution = "Unknown";

    TVR_LOG(TVR_DBG, "Under _LINUX -- getting the os name and version");
    const auto version = readTextFile(filePath(FilePath::KernelVersion).c_str(), lineBuffer - 1);
    if (!version)
        return 1;
    osName = textOf(version->substr(0, version->find('\n')));

    TVR_LOG(TVR_DBG, "Under _LINUX -- Getting the OS Distribution Name");
    try
    {
        const auto banner = readTextFile(filePath(FilePath::OsDistribution).c_str(), maximumBanner);
        if (!banner)
        {
            TVR_LOG(TVR_ERR, "Unable to open the /etc/issue file to get OSDistribution Name");
            return 1;
        }
        osDistribution = textOf(*banner);
    }
    catch (const std::bad_alloc&)
    {
        TVR_LOG(TVR_ERR, "Unable to allocate the memory to store OSDistributionName");
        return 1;
    }
    return 0;
}

} // namespace cimple
