#include "runtime/base/Assert.h"
#include "runtime/threads/Thread.h"

#include <cerrno>

namespace cimple
{

Mutex::Mutex(bool recursive)
{
    pthread_mutexattr_t attributes;
    pthread_mutexattr_init(&attributes);
    pthread_mutexattr_settype(&attributes, recursive ? PTHREAD_MUTEX_RECURSIVE : PTHREAD_MUTEX_DEFAULT);
    pthread_mutex_init(&_mutex, &attributes);
    pthread_mutexattr_destroy(&attributes);
}

Mutex::~Mutex()
{
    pthread_mutex_destroy(&_mutex);
}

void Mutex::lock()
{
    if (pthread_mutex_lock(&_mutex) != 0)
        assert_failed("Mutex.cpp", __LINE__, "void cimple::Mutex::lock()",
                      "pthread_mutex_lock(&((MutexRep*)_rep)->mutex) == 0");
    taken();
}

int Mutex::try_lock()
{
    const int error = pthread_mutex_trylock(&_mutex);
    if (error == 0)
        taken();
    return error == 0 || error == EBUSY ? error : -1;
}

void Mutex::unlock()
{
    given();
    pthread_mutex_unlock(&_mutex);
}

bool Mutex::isMine() const
{
    return _holds.load(std::memory_order_acquire) != 0 &&
           pthread_equal(_holder.load(std::memory_order_relaxed), pthread_self());
}

void Mutex::taken()
{
    _holder.store(pthread_self(), std::memory_order_relaxed);
    _holds.store(_holds.load(std::memory_order_relaxed) + 1, std::memory_order_release);
}

void Mutex::given()
{
    _holds.store(_holds.load(std::memory_order_relaxed) - 1, std::memory_order_release);
}

Condition::Condition()
{
    pthread_cond_init(&_cond, nullptr);
}

Condition::~Condition()
{
    pthread_cond_destroy(&_cond);
}

void Condition::wait(Mutex& mutex)
{
    mutex.given();
    pthread_cond_wait(&_cond, &mutex._mutex);
    mutex.taken();
}

void Condition::signal()
{
    pthread_cond_signal(&_cond);
}

void Condition::broadcast()
{
    pthread_cond_broadcast(&_cond);
}

} // namespace cimple
