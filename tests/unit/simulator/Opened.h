// The libraries of the simulator, opened by path.
#pragma once

#include <gtest/gtest.h>

#include <dlfcn.h>

#include <string>

namespace tvrsim
{

inline std::string fileOf(const std::string& name)
{
    return std::string(TVRSIM_LIBRARY_FOLDER) + '/' + name;
}

/// A library of the build tree, opened.
class Opened
{
public:
    explicit Opened(const std::string& path) : _handle(dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL))
    {
        EXPECT_NE(_handle, nullptr) << dlerror();
    }
    ~Opened() { dlclose(_handle); }
    Opened(const Opened&) = delete;
    Opened& operator=(const Opened&) = delete;

    void* handle() const { return _handle; }

    template <class Function> Function* function(const char* name) const
    {
        void* found = dlsym(_handle, name);
        EXPECT_NE(found, nullptr) << name;
        return reinterpret_cast<Function*>(found);
    }

private:
    void* const _handle;
};

#define FUNCTION(library, name) library.function<decltype(name)>(#name)

} // namespace tvrsim
