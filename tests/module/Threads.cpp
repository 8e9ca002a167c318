#include "tests/module/Threads.h"

#include <atomic>
#include <cerrno>
#include <dlfcn.h>
#include <pthread.h>

namespace
{

using Create = int (*)(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);

std::atomic<bool> refused{false};

} // namespace

namespace module_test
{

void refuseThreads(bool refuse)
{
    refused = refuse;
}

} // namespace module_test

// The sanitizers' own function, which must see every thread; null without them.
extern "C" __attribute__((weak)) int __interceptor_pthread_create(pthread_t*, const pthread_attr_t*, void* (*)(void*),
                                                                  void*);

/// Stands before the C library's function for all libraries of the process, the module among them.
extern "C" __attribute__((visibility("default"))) int
pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*start)(void*), void* arg) noexcept
{
    if (refused)
        return EAGAIN;
    static const Create next = __interceptor_pthread_create
                                   ? __interceptor_pthread_create
                                   : reinterpret_cast<Create>(dlsym(RTLD_NEXT, "pthread_create"));
    return next(thread, attributes, start, arg);
}
