#include "runtime/Thread_Context.h"

#include <pthread.h>

namespace cimple
{

namespace
{

// No function ends the values of a thread: who pushes a context pops it, and the library may be closed while threads
// live on.
pthread_key_t _thread_context_key;
pthread_once_t _thread_context_key_once = PTHREAD_ONCE_INIT;

/// Gives the key back when the library is closed: a process has few, and may load the library again and again.
struct Key_End
{
    ~Key_End() { pthread_key_delete(_thread_context_key); }
};

void make_key()
{
    pthread_key_create(&_thread_context_key, nullptr);
    static const Key_End end;
}

void set_top(Thread_Context* context)
{
    pthread_once(&_thread_context_key_once, make_key);
    pthread_setspecific(_thread_context_key, context);
}

} // namespace

Thread_Context* Thread_Context::top()
{
    pthread_once(&_thread_context_key_once, make_key);
    return static_cast<Thread_Context*>(pthread_getspecific(_thread_context_key));
}

void Thread_Context::push(Thread_Context* context)
{
    context->prev = top();
    set_top(context);
}

void Thread_Context::pop()
{
    Thread_Context* context = top();
    if (!context)
        return;
    set_top(context->prev);
    context->prev = nullptr;
}

} // namespace cimple
