// How provider code reaches the broker without holding its handles: a per-thread stack of contexts.
#pragma once

#include "runtime/meta/Instance.h"
#include "runtime/values/String.h"

namespace cimple
{

/// An enumeration that a context made; its content is the context's own.
struct Instance_Enumeration;

/// A thread's way to the broker. The operations are those of `cimom`, which calls the top of the stack.
/// Instances are passed in for reading, and returned with a count for the caller.
class Thread_Context
{
public:
    Thread_Context* prev = nullptr; ///< the context beneath this one

    Thread_Context() = default;
    Thread_Context(const Thread_Context&) = delete;
    Thread_Context& operator=(const Thread_Context&) = delete;
    virtual ~Thread_Context() = default;

    /// Makes the context of a thread that the calling thread is about to start; `arg` is that thread's argument. Null
    /// or an exception: the thread is not started.
    virtual Thread_Context* thread_create_hook(void* arg) = 0;
    /// First and last on the new thread. A start hook that throws leaves the thread without a context.
    virtual void thread_start_hook() = 0;
    virtual void thread_exit_hook() = 0;

    /// Null on failure.
    virtual Instance_Enumeration* instance_enumerator_create(const char* name_space, const Instance* model) = 0;
    virtual void instance_enumerator_destroy(Instance_Enumeration* enumeration) = 0;
    virtual bool instance_enumerator_more(Instance_Enumeration* enumeration) = 0;
    virtual void instance_enumerator_next(Instance_Enumeration* enumeration) = 0;
    virtual Instance* instance_enumerator_get(Instance_Enumeration* enumeration) = 0;

    virtual Instance* get_instance(const char* name_space, const Instance* model) = 0;
    virtual int create_instance(const char* name_space, const Instance* instance) = 0;
    virtual int delete_instance(const char* name_space, const Instance* instance) = 0;
    virtual int modify_instance(const char* name_space, const Instance* instance) = 0;
    virtual int invoke_method(const char* name_space, const Instance* reference, Instance* method) = 0;
    virtual void allow_unload(bool allow) = 0;
    virtual bool get_username(String& username) = 0;

    /// Top of the calling thread's stack; null when the thread has none.
    static Thread_Context* top();
    /// Throws std::bad_alloc where the thread cannot keep it.
    static void push(Thread_Context* context);
    static void pop();
};

/// Keeps a context on the calling thread's stack for a scope.
class Pushed_Context
{
public:
    explicit Pushed_Context(Thread_Context& context) { Thread_Context::push(&context); }
    ~Pushed_Context() { Thread_Context::pop(); }
    Pushed_Context(const Pushed_Context&) = delete;
    Pushed_Context& operator=(const Pushed_Context&) = delete;
};

} // namespace cimple
