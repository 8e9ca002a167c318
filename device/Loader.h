// The libraries behind the bindings: opened at run time, so that a host without them still loads the module.
#pragma once

#include <atomic>
#include <cstddef>

namespace cimple
{

/// The four calls of the system's dynamic loader. Tests put their own in place.
struct DynamicLoader
{
    void* (*open)(const char* file, int mode);
    void* (*symbol)(void* library, const char* name);
    int (*close)(void* library);
    const char* (*error)();
};

/// Not while another thread is in a binding. Returns the loader that was in use.
DynamicLoader setDynamicLoader(const DynamicLoader& loader);

/// The loader in use, for libraries that are not behind bindings.
const DynamicLoader& dynamicLoaderInUse();

/// What the last loadAllLibraries() did not find; clear before the first.
extern std::atomic<bool> hbaLibMissing; ///< neither form of the HBA API library
extern std::atomic<bool> lrmLibMissing; ///< the local RM library
extern std::atomic<bool> rmLibMissing;  ///< the fallback RM library, tried only without the local one
extern std::atomic<bool> cpqLibMissing; ///< stays clear: the QoS interface has no library of its own

/// Opens the HBA API library and an RM library. 1 if the fallback RM library is in use, otherwise 0, also when
/// neither is there. A library that is open already is not opened again.
int loadAllLibraries();

/// Closes them; not while another thread is in a binding. Returns 0. From then on every binding answers as
/// for an absent entry point, until the libraries are loaded again.
int unloadAllLibraries();

/// Looks every entry point up that a binding calls, so that no binding does so until the libraries are loaded or
/// unloaded again: a look-up takes the lock of the system's loader, and a thread that somebody waits for under this
/// lock must not ask for it.
void resolveAllEntries();

/// Looks again for those that resolveAllEntries() did not find: a library that is initialised may load others, which
/// define them. For the end of an initialisation and for the head of a method; not on a thread that somebody may wait
/// for in a dlclose, nor while the libraries are unloaded. Does nothing before resolveAllEntries().
void resolveAbsentEntries();

/// Entry point of a row of `entryPoints`, or null. The first look-up is kept until a library is opened again;
/// look-ups in the fallback library are made anew on every call.
void* resolveEntry(std::size_t row);

} // namespace cimple
