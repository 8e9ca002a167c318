#include "device/Loader.h"

#include "device/EntryPoints.h"
#include "foundation/Log.h"

#include <array>
#include <cstdio>
#include <dlfcn.h>
#include <string>
#include <utility>

namespace cimple
{

std::atomic<bool> hbaLibMissing{false};
std::atomic<bool> lrmLibMissing{false};
std::atomic<bool> rmLibMissing{false};
std::atomic<bool> cpqLibMissing{false};

namespace
{

enum Slot : std::size_t
{
    hbaApiSlot,
    localRmSlot,
    fallbackRmSlot,
    globalSlot, ///< never opened: a null handle searches the global scope of the process
    slotCount,
};

DynamicLoader dynamicLoader = {
    [](const char* file, int mode) { return ::dlopen(file, mode); },
    [](void* library, const char* name) { return ::dlsym(library, name); },
    [](void* library) { return ::dlclose(library); },
    []() -> const char* { return ::dlerror(); },
};

std::array<std::atomic<void*>, slotCount> slots{};
std::array<std::atomic<void*>, entryPoints.size()> firstLookups{};
/// The look-ups of every row that is called are in `firstLookups`, absent ones included.
std::atomic<bool> allResolved{false};

const char* loaderError()
{
    const char* text = dynamicLoader.error();
    return text ? text : "";
}

/// What was found in a library is stale once it is closed, and when another was opened.
void forgetLookups()
{
    for (auto& entry : firstLookups)
        entry = nullptr;
}

bool openLibrary(Slot slot, const std::string& name)
{
    // The names of the HBA API library carry their own suffix.
    const std::string file = name.starts_with("HBA") ? "lib" + name : "lib" + name + ".so";
    if (slots[slot])
        return true;
    void* library = dynamicLoader.open(file.c_str(), RTLD_NOW);
    if (!library)
    {
        TVR_LOG(TVR_ERR, "dlopen failed :%s", loaderError());
        return false;
    }
    forgetLookups();
    slots[slot] = library;
    return true;
}

void* firstLookup(std::size_t row, Slot slot)
{
    void* library = slots[slot];
    if (!library && slot != globalSlot)
        return nullptr;
    void* entry = firstLookups[row];
    if (!entry && (entry = dynamicLoader.symbol(library, entryPoints[row].name)))
        firstLookups[row] = entry;
    return entry;
}

/// Beside the local RM library the fallback is never opened: its null handle searches the global scope of the process.
void* fallbackLookup(std::size_t row)
{
    void* library = slots[fallbackRmSlot];
    if (rmLibMissing || (!library && !slots[localRmSlot]))
        return nullptr;
    const EntryPoint& point = entryPoints[row];
    const char* secondName = point.family == Family::rmDual ? point.name + 1 : point.name;
    void* entry = dynamicLoader.symbol(library, point.name);
    return entry ? entry : dynamicLoader.symbol(library, secondName);
}

void* lookUp(std::size_t row)
{
    switch (entryPoints[row].family)
    {
    case Family::rmDual:
    case Family::lrmOnly:
    case Family::rmOnly:
        return lrmLibMissing ? fallbackLookup(row) : firstLookup(row, localRmSlot);
    case Family::hbaApi:
        return hbaLibMissing ? fallbackLookup(row) : firstLookup(row, hbaApiSlot);
    case Family::vendorQos:
        return cpqLibMissing ? nullptr : firstLookup(row, globalSlot);
    case Family::vendorClose:
        return fallbackLookup(row);
    }
    return nullptr;
}

void lookUpAbsent()
{
    for (std::size_t row = 0; row < entryPoints.size(); ++row)
        if (entryPoints[row].use == called && !firstLookups[row])
            if (void* entry = lookUp(row))
                firstLookups[row] = entry;
}

} // namespace

DynamicLoader setDynamicLoader(const DynamicLoader& loader)
{
    return std::exchange(dynamicLoader, loader);
}

const DynamicLoader& dynamicLoaderInUse()
{
    return dynamicLoader;
}

int loadAllLibraries()
{
    allResolved = false;
    hbaLibMissing = !openLibrary(hbaApiSlot, "HBAAPI.so.2") && !openLibrary(hbaApiSlot, "HBAAPI.so");
    lrmLibMissing = !openLibrary(localRmSlot, "lrmapi");
    rmLibMissing = lrmLibMissing && !openLibrary(fallbackRmSlot, "rmapi");
    return lrmLibMissing && !rmLibMissing ? 1 : 0;
}

int unloadAllLibraries()
{
    allResolved = false;
    for (auto& slot : slots)
    {
        void* library = slot;
        if (!library)
            continue;
        if (dynamicLoader.close(library) == 0)
        {
            slot = nullptr;
            continue;
        }
        char handle[2 + 2 * sizeof library + 1];
        std::snprintf(handle, sizeof handle, "%p", library);
        TVR_LOG(TVR_ERR, "dlclose for lib %s failed with %s\n", handle, loaderError());
    }
    forgetLookups();
    return 0;
}

void resolveAllEntries()
{
    lookUpAbsent();
    allResolved = true;
}

void resolveAbsentEntries()
{
    if (allResolved)
        lookUpAbsent();
}

void* resolveEntry(std::size_t row)
{
    return allResolved ? firstLookups[row].load() : lookUp(row);
}

} // namespace cimple
