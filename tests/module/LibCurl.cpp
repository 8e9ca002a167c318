#include "tests/module/LibCurl.h"

#include <dlfcn.h>
#include <mutex>

namespace module_test
{

namespace
{

std::mutex mutex;
std::string present;
bool isReal = false; ///< `present` is the machine's libcurl
std::vector<std::string> tried;
bool isSet = false; ///< a test asks what is tried

bool isLibCurl(const std::string& file)
{
    return file.find("libcurl.") != file.npos || file == "curl.dll";
}

using Open = void* (*)(const char*, int);

void* openOf(const char* file, int mode)
{
    static const Open next = reinterpret_cast<Open>(dlsym(RTLD_NEXT, "dlopen"));
    if (!file || !isLibCurl(file))
        return next(file, mode);
    const std::lock_guard lock(mutex);
    if (isSet)
        tried.push_back(file);
    if (file != present)
        return nullptr;
    // It stays mapped: libraries that it needs leave memory behind when they are closed, which a sanitizer would
    // report.
    if (isReal)
        return next("libcurl.so.4", mode | RTLD_NODELETE);
    return next(nullptr, mode); // a handle that can be closed
}

void set(const std::string& file, bool real)
{
    const std::lock_guard lock(mutex);
    present = file;
    isReal = real;
    isSet = true;
    tried.clear();
}

} // namespace

void setLibCurl(const std::string& file)
{
    set(file, false);
}

void setRealLibCurl(const std::string& file)
{
    set(file, true);
}

std::vector<std::string> triedLibCurls()
{
    const std::lock_guard lock(mutex);
    return tried;
}

} // namespace module_test

/// Stands before the C library's function for all libraries of the process, the module among them.
extern "C" __attribute__((visibility("default"))) void* dlopen(const char* file, int mode)
{
    return module_test::openOf(file, mode);
}
