// The table of operating system services, over POSIX threads.
#include "broker/tables/BrokerTables.h"

#include <cerrno>
#include <cstring>
#include <memory>
#include <string>

#include <pthread.h>
#include <time.h>

namespace broker
{

namespace
{

char* resolveFileName(const char* libName)
{
    return libName ? strdup(("lib" + std::string(libName) + ".so").c_str()) : nullptr;
}

pthread_t threadOf(void* thread)
{
    return reinterpret_cast<pthread_t>(thread);
}

void* newThread(void* (*start)(void*), void* parm, int detached)
{
    pthread_t thread{};
    if (pthread_create(&thread, nullptr, start, parm) != 0)
        return nullptr;
    if (detached)
        pthread_detach(thread);
    return reinterpret_cast<void*>(thread);
}

int joinThread(void* thread, void** retval)
{
    return pthread_join(threadOf(thread), retval);
}

int exitThread(void* retval)
{
    pthread_exit(retval);
}

int cancelThread(void* thread)
{
    return pthread_cancel(threadOf(thread));
}

int threadSleep(CMPIUint32 msec)
{
    const timespec span{static_cast<time_t>(msec / 1000), static_cast<long>(msec % 1000) * 1'000'000};
    return nanosleep(&span, nullptr);
}

int threadOnce(int* once, void (*init)(void))
{
    static_assert(sizeof(pthread_once_t) == sizeof(int));
    return pthread_once(once, init);
}

int createThreadKey(CMPI_THREAD_KEY_TYPE* key, void (*cleanup)(void*))
{
    return pthread_key_create(key, cleanup);
}

int destroyThreadKey(CMPI_THREAD_KEY_TYPE key)
{
    return pthread_key_delete(key);
}

void* getThreadSpecific(CMPI_THREAD_KEY_TYPE key)
{
    return pthread_getspecific(key);
}

int setThreadSpecific(CMPI_THREAD_KEY_TYPE key, void* value)
{
    return pthread_setspecific(key, value);
}

void* newMutex(int)
{
    auto mutex = std::make_unique<pthread_mutex_t>();
    return pthread_mutex_init(mutex.get(), nullptr) == 0 ? mutex.release() : nullptr;
}

void destroyMutex(void* mutex)
{
    const std::unique_ptr<pthread_mutex_t> owned(static_cast<pthread_mutex_t*>(mutex));
    pthread_mutex_destroy(owned.get());
}

void lockMutex(void* mutex)
{
    pthread_mutex_lock(static_cast<pthread_mutex_t*>(mutex));
}

void unlockMutex(void* mutex)
{
    pthread_mutex_unlock(static_cast<pthread_mutex_t*>(mutex));
}

void* newCondition(int)
{
    auto condition = std::make_unique<pthread_cond_t>();
    return pthread_cond_init(condition.get(), nullptr) == 0 ? condition.release() : nullptr;
}

void destroyCondition(void* condition)
{
    const std::unique_ptr<pthread_cond_t> owned(static_cast<pthread_cond_t*>(condition));
    pthread_cond_destroy(owned.get());
}

int condWait(void* condition, void* mutex)
{
    return pthread_cond_wait(static_cast<pthread_cond_t*>(condition), static_cast<pthread_mutex_t*>(mutex));
}

int timedCondWait(void* condition, void* mutex, timespec* until)
{
    return until ? pthread_cond_timedwait(static_cast<pthread_cond_t*>(condition), static_cast<pthread_mutex_t*>(mutex),
                                          until)
                 : EINVAL;
}

int signalCondition(void* condition)
{
    return pthread_cond_signal(static_cast<pthread_cond_t*>(condition));
}

} // namespace

const CMPIBrokerExtFT servicesTable{
    .ftVersion = 100,
    .resolveFileName = resolveFileName,
    .newThread = newThread,
    .joinThread = joinThread,
    .exitThread = exitThread,
    .cancelThread = cancelThread,
    .threadSleep = threadSleep,
    .threadOnce = threadOnce,
    .createThreadKey = createThreadKey,
    .destroyThreadKey = destroyThreadKey,
    .getThreadSpecific = getThreadSpecific,
    .setThreadSpecific = setThreadSpecific,
    .newMutex = newMutex,
    .destroyMutex = destroyMutex,
    .lockMutex = lockMutex,
    .unlockMutex = unlockMutex,
    .newCondition = newCondition,
    .destroyCondition = destroyCondition,
    .condWait = condWait,
    .timedCondWait = timedCondWait,
    .signalCondition = signalCondition,
};

} // namespace broker
