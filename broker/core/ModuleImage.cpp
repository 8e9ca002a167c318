#include "broker/core/ModuleImage.h"

#include <stdexcept>

#include <dlfcn.h>

namespace broker
{

namespace
{

class SharedObject : public ModuleImage
{
public:
    SharedObject(const std::string& path, int mode) : _handle(dlopen(path.c_str(), mode))
    {
        if (!_handle)
            throw std::runtime_error(std::string("cannot open the module: ") + dlerror());
        _head = reinterpret_cast<const cimple::Registration* (*)()>(dlsym(_handle, "cimple_module"));
        if (!_head)
        {
            dlclose(_handle);
            throw std::runtime_error(path + " is not a provider module: it has no function cimple_module");
        }
    }
    SharedObject(const SharedObject&) = delete;
    SharedObject& operator=(const SharedObject&) = delete;
    ~SharedObject() override { dlclose(_handle); }

    void* symbol(const std::string& name) const override { return dlsym(_handle, name.c_str()); }
    const cimple::Registration* registrations() const override { return _head(); }

private:
    void* _handle;
    const cimple::Registration* (*_head)();
};

} // namespace

std::unique_ptr<ModuleImage> openModule(const std::string& path, int mode)
{
    return std::make_unique<SharedObject>(path, mode);
}

} // namespace broker
