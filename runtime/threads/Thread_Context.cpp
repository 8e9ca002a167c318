#include "runtime/threads/Thread_Context.h"

#include <atomic>
#include <mutex>
#include <new>
#include <pthread.h>

namespace cimple
{

namespace
{

// No function ends the values of a thread: who pushes a context pops it. The key is never given back: the module's
// image stays mapped, and threads may still use the key while the process ends.
pthread_key_t _thread_context_key;
pthread_once_t _thread_context_key_once = PTHREAD_ONCE_INIT;
std::atomic<bool> _has_thread_context_key{false};

void make_key()
{
    _has_thread_context_key = pthread_key_create(&_thread_context_key, nullptr) == 0;
}

/// A process has few keys, and may have none left for a while.
bool make_key_again()
{
    static std::mutex trying;
    const std::lock_guard guard(trying);
    if (!_has_thread_context_key)
        make_key();
    return _has_thread_context_key;
}

bool has_key()
{
    pthread_once(&_thread_context_key_once, make_key);
    return _has_thread_context_key || make_key_again();
}

/// A thread takes memory with its first value.
void set_top(Thread_Context* context)
{
    if (!has_key() || pthread_setspecific(_thread_context_key, context) != 0)
        throw std::bad_alloc();
}

} // namespace

Thread_Context* Thread_Context::top()
{
    return has_key() ? static_cast<Thread_Context*>(pthread_getspecific(_thread_context_key)) : nullptr;
}

void Thread_Context::push(Thread_Context* context)
{
    Thread_Context* const former = top();
    set_top(context);
    context->prev = former;
}

void Thread_Context::pop()
{
    Thread_Context* context = top();
    if (!context)
        return;
    pthread_setspecific(_thread_context_key, context->prev); // the thread has the memory for it already
    context->prev = nullptr;
}

} // namespace cimple
