#include "device/CurlLibrary.h"

#include "device/Loader.h"
#include "foundation/HostInformation.h"
#include "foundation/Log.h"

#include <dlfcn.h>

namespace cimple
{

namespace
{

constexpr const char* libraryFiles[] = {"/lib/libcurl.so.4", "/usr/lib/libcurl.so.4", "libcurl.so", "curl.dll"};

/// ftp, http, https and tftp.
constexpr std::uint16_t curlSchemes[] = {4, 5, 6, 8};

void* openCurl(const DynamicLoader& loader)
{
    for (const char* file : libraryFiles)
        if (void* library = loader.open(file, RTLD_NOW | RTLD_GLOBAL))
            return library;
    return nullptr;
}

} // namespace

void UpdateCURLCapabilities(Array<std::uint16_t>& uriSchemes)
{
    TVR_LOG(TVR_DBG, "Inside UpdateCURLCapabilities");
    if (IsReadOnlyFS())
        return;
    const DynamicLoader& loader = dynamicLoaderInUse();
    void* library = openCurl(loader);
    if (!library)
    {
        TVR_LOG(TVR_INFO, "libcurl is not present. only file type URIScheme will be supported");
        return;
    }
    if (loader.close(library) != 0)
        TVR_LOG(TVR_DBG, "ERROR: UNABLE TO CLOSE DYNAMIC LIB");
    uriSchemes.append(curlSchemes, std::size(curlSchemes));
}

} // namespace cimple
