// A provider module as the broker sees it: factory symbols and the head of its registration list.
#pragma once

#include "runtime/adapter/Provider.h"

#include <memory>
#include <string>

namespace broker
{

/// Destroying an image closes the module.
class ModuleImage
{
public:
    virtual ~ModuleImage() = default;
    /// Address of an exported function; null if the module has none of that name.
    virtual void* symbol(const std::string& name) const = 0;
    /// Registration records of the module, linked through `next`.
    virtual const cimple::Registration* registrations() const = 0;
};

/// Opens a shared object in that mode of dlopen(). Throws std::runtime_error when it cannot be opened or lacks
/// `cimple_module`.
std::unique_ptr<ModuleImage> openModule(const std::string& path, int mode);

} // namespace broker
