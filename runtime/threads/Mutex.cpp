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
}

int Mutex::try_lock()
{
    const int error = pthread_mutex_trylock(&_mutex);
    return error == 0 || error == EBUSY ? error : -1;
}

void Mutex::unlock()
{
    pthread_mutex_unlock(&_mutex);
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
    pthread_cond_wait(&_cond, &mutex._mutex);
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
