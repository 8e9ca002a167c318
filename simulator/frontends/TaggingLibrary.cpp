#include "simulator/frontends/FrontEnd.h"

#include <cstdio>
#include <dlfcn.h>
#include <string>

namespace tvrsim
{

void loadTaggingLibrary(SimulatedHost& host)
{
    // It stays loaded, as a library of the system would.
    static void* library = nullptr;
    Dl_info own;
    if (library || !host.hasTagging() || dladdr(reinterpret_cast<void*>(&loadTaggingLibrary), &own) == 0)
        return;
    const std::string path = own.dli_fname;
    const std::string file = path.substr(0, path.rfind('/') + 1) + "libtvrsim_tagging.so";
    library = dlopen(file.c_str(), RTLD_NOW | RTLD_GLOBAL);
    if (!library)
        std::fprintf(stderr, "simulator: %s\n", dlerror());
}

} // namespace tvrsim
