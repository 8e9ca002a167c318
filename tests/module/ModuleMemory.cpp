#include "tests/module/ModuleMemory.h"

#include "tests/support/Sanitized.h"

#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <dlfcn.h>
#include <execinfo.h>
#include <link.h>
#include <malloc.h>
#include <new>
#include <stdexcept>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <unistd.h>

#if !TVR_SANITIZED
extern "C" void* __libc_malloc(std::size_t size);
extern "C" void* __libc_calloc(std::size_t count, std::size_t size);
extern "C" void* __libc_realloc(void* block, std::size_t size);
#endif

namespace module_test
{

namespace
{

/// Where an object of the process is mapped.
struct Image
{
    std::uintptr_t begin = 0;
    std::uintptr_t end = 0;
    bool has(const void* address) const
    {
        const auto at = reinterpret_cast<std::uintptr_t>(address);
        return at >= begin && at < end;
    }
};

Image module;
Image cppLibrary;
Image cLibrary;
Image loader;
Image self;
std::atomic<std::size_t> counted{0};
std::atomic<std::size_t> refused{0};
std::atomic<bool> counting{false};
thread_local bool looking = false;

Image imageOf(const void* address)
{
    struct Search
    {
        const void* address;
        Image found;
    } search{address, {}};
    dl_iterate_phdr(
        [](dl_phdr_info* info, std::size_t, void* client)
        {
            auto& wanted = *static_cast<Search*>(client);
            Image image{~std::uintptr_t{0}, 0};
            for (int i = 0; i < info->dlpi_phnum; i++)
                if (const auto& header = info->dlpi_phdr[i]; header.p_type == PT_LOAD)
                {
                    image.begin = std::min<std::uintptr_t>(image.begin, info->dlpi_addr + header.p_vaddr);
                    image.end = std::max<std::uintptr_t>(image.end, info->dlpi_addr + header.p_vaddr + header.p_memsz);
                }
            if (!image.has(wanted.address))
                return 0;
            wanted.found = image;
            return 1;
        },
        &search);
    return search.found;
}

/// What works for its caller. The loader does so for the memory of a thread.
bool isLibrary(const void* address)
{
    return cppLibrary.has(address) || cLibrary.has(address) || loader.has(address);
}

/// The first on the stack that is neither an allocator nor a library that works for its caller.
bool moduleAsks(const void* caller)
{
    if (module.has(caller))
        return true;
    if (!isLibrary(caller))
        return false;
    void* frames[24];
    const int count = backtrace(frames, 24);
    int i = 0;
    while (i < count && self.has(frames[i])) // of this file
        i++;
    while (i < count && isLibrary(frames[i]))
        i++;
    return i < count && module.has(frames[i]);
}

bool isCounted(const void* caller)
{
    if (!counting.load(std::memory_order_relaxed) || looking)
        return false;
    looking = true; // backtrace may allocate
    const bool asks = moduleAsks(caller);
    looking = false;
    return asks;
}

bool isRefused(const void* caller)
{
    return isCounted(caller) && ++counted == refused;
}

} // namespace

void refuseAllocation(std::size_t number)
{
    void* library = dlopen(TVR_MODULE_FILE, RTLD_NOW | RTLD_NOLOAD);
    if (!library)
        throw std::logic_error("the module is not mapped");
    module = imageOf(dlsym(library, "cimple_module"));
    dlclose(library);
    cppLibrary = imageOf(dlsym(RTLD_DEFAULT, "__cxa_throw"));
    cLibrary = imageOf(dlsym(RTLD_DEFAULT, "fopen"));
    loader = imageOf(dlsym(RTLD_DEFAULT, "__tls_get_addr"));
    self = imageOf(reinterpret_cast<const void*>(&refuseAllocation));
    void* frame;
    backtrace(&frame, 1); // loads what it needs
    counted = 0;
    refused = number;
    counting = true;
}

std::size_t allocationsOfModule()
{
    counting = false;
    return counted;
}

} // namespace module_test

#if TVR_SANITIZED

// All forms: the sanitizer's own would not fit these.
void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    return module_test::isRefused(__builtin_return_address(0)) ? nullptr : std::malloc(size ? size : 1);
}

void* operator new[](std::size_t size, const std::nothrow_t&) noexcept
{
    return module_test::isRefused(__builtin_return_address(0)) ? nullptr : std::malloc(size ? size : 1);
}

void* operator new(std::size_t size)
{
    void* block = module_test::isRefused(__builtin_return_address(0)) ? nullptr : std::malloc(size ? size : 1);
    return block ? block : throw std::bad_alloc();
}

void* operator new[](std::size_t size)
{
    void* block = module_test::isRefused(__builtin_return_address(0)) ? nullptr : std::malloc(size ? size : 1);
    return block ? block : throw std::bad_alloc();
}

void operator delete(void* block) noexcept
{
    std::free(block);
}

void operator delete[](void* block) noexcept
{
    std::free(block);
}

void operator delete(void* block, std::size_t) noexcept
{
    std::free(block);
}

void operator delete[](void* block, std::size_t) noexcept
{
    std::free(block);
}

#else

// The executable's symbols stand before those of the C library, for all libraries of the process.
extern "C" __attribute__((visibility("default"))) void* malloc(std::size_t size) noexcept
{
    if (module_test::isRefused(__builtin_return_address(0)))
        return errno = ENOMEM, nullptr;
    return __libc_malloc(size);
}

extern "C" __attribute__((visibility("default"))) void* calloc(std::size_t count, std::size_t size) noexcept
{
    if (module_test::isRefused(__builtin_return_address(0)))
        return errno = ENOMEM, nullptr;
    return __libc_calloc(count, size);
}

extern "C" __attribute__((visibility("default"))) void* realloc(void* block, std::size_t size) noexcept
{
    if (module_test::isRefused(__builtin_return_address(0)))
        return errno = ENOMEM, nullptr;
    return __libc_realloc(block, size);
}

/// Chunks for many blocks: without them each block is an allocation of its own, and is counted.
extern "C" __attribute__((visibility("default"))) void* mmap(void* at, std::size_t size, int access, int flags,
                                                             int file, off_t offset) noexcept
{
    if (module_test::isCounted(__builtin_return_address(0)))
        return errno = ENOMEM, MAP_FAILED;
    return reinterpret_cast<void*>(syscall(SYS_mmap, at, size, access, flags, file, offset));
}

#endif
