// POSIX threads, mutexes and conditions. A thread started here inherits the caller's broker attachment.
#pragma once

#include <atomic>
#include <pthread.h>

namespace cimple
{

/// lock() of a mutex that cannot be locked is a program fault: it asserts and aborts.
class Mutex
{
public:
    explicit Mutex(bool recursive = false);
    ~Mutex();
    Mutex(const Mutex&) = delete;
    Mutex& operator=(const Mutex&) = delete;

    void lock();
    /// 0, 16 (EBUSY) when another thread holds it, -1 for other errors.
    int try_lock();
    void unlock();
    /// Whether the calling thread holds it.
    bool isMine() const;

private:
    friend class Condition;
    void taken();
    void given();

    pthread_mutex_t _mutex;
    std::atomic<pthread_t> _holder{}; ///< the last one
    std::atomic<unsigned> _holds = 0; ///< by the holder, who alone writes both
};

/// Holds a mutex for a scope; may be released early.
class Auto_Mutex
{
public:
    explicit Auto_Mutex(Mutex& mutex) : _mutex(&mutex) { mutex.lock(); }
    ~Auto_Mutex() { unlock(); }
    Auto_Mutex(const Auto_Mutex&) = delete;
    Auto_Mutex& operator=(const Auto_Mutex&) = delete;
    void unlock()
    {
        if (_mutex)
            _mutex->unlock();
        _mutex = nullptr;
    }

private:
    Mutex* _mutex;
};

/// Lets go of a mutex that is held, for a scope.
class Auto_Unlock
{
public:
    explicit Auto_Unlock(Mutex& mutex) : _mutex(mutex) { mutex.unlock(); }
    ~Auto_Unlock() { _mutex.lock(); }
    Auto_Unlock(const Auto_Unlock&) = delete;
    Auto_Unlock& operator=(const Auto_Unlock&) = delete;

private:
    Mutex& _mutex;
};

class Condition
{
public:
    Condition();
    ~Condition();
    Condition(const Condition&) = delete;
    Condition& operator=(const Condition&) = delete;
    void wait(Mutex& mutex);
    void signal();
    void broadcast();

private:
    pthread_cond_t _cond;
};

/// A handle around a pthread_t; plain to copy and compare.
class Thread
{
public:
    using Proc = void* (*)(void* arg);

    /// Both start `proc(arg)` on a new thread. If the calling thread has a Thread_Context, the new one gets a
    /// context of its own, attached to the broker for its life. It takes no signal of the host; an exception that
    /// leaves `proc` ends it with a null value. Return 0, the error of pthread_create, ENOMEM, or EAGAIN where the
    /// broker gives no context; they never throw.
    static int create_joinable(Thread& thread, Proc proc, void* arg);
    static int create_detached(Thread& thread, Proc proc, void* arg);
    /// Clears `value`, then waits for the thread's end and stores what it returned.
    static int join(Thread& thread, void*& value);
    /// Runs the exit hook of the top context, then ends the calling thread.
    [[noreturn]] static void exit(void* value);
    static Thread self();

    bool operator==(const Thread& other) const { return pthread_equal(_handle, other._handle) != 0; }

private:
    pthread_t _handle{};
};

} // namespace cimple
