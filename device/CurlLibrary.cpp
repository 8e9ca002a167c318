#include "device/CurlLibrary.h"

#include "device/Loader.h"
#include "foundation/HostInformation.h"
#include "foundation/Log.h"

#include <dlfcn.h>

namespace cimple
{

namespace
{

/// The last where the loader's own folders have it, as on hosts with a folder of libraries for each architecture.
constexpr const char* libraryFiles[] = {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "libcurl.so", "curl.dll",
                                        "libcurl.so.4"};

/// ftp, http, https and tftp.
constexpr std::uint16_t curlSchemes[] = {4, 5, 6, 8};

} // namespace

void* openCurl(int mode)
{
    for (const char* file : libraryFiles)
        if (void* library = dynamicLoaderInUse().open(file, mode))
            return library;
    return nullptr;
}

void UpdateCURLCapabilities(Array<std::uint16_t>& uriSchemes)
{
    TVR_LOG(TVR_DBG, "Inside UpdateCURLCapabilities");
    if (IsReadOnlyFS())
        return;
    void* library = openCurl(RTLD_NOW | RTLD_GLOBAL);
    if (!library)
    {
        TVR_LOG(TVR_INFO, "libcurl is not present. only file type URIScheme will be supported");
        return;
    }
    if (dynamicLoaderInUse().close(library) != 0)
        TVR_LOG(TVR_DBG, "ERROR: UNABLE TO CLOSE DYNAMIC LIB");
    uriSchemes.append(curlSchemes, std::size(curlSchemes));
}

} // namespace cimple
