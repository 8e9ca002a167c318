#include "runtime/threads/cimom.h"

#include "runtime/base/Assert.h"
#include "runtime/threads/Thread_Context.h"

#include <cstdio>

namespace cimple
{

namespace
{

/// Result of `call` on the thread's context, or `failure` when it has none.
template <class Result, class Call> Result with_context(Result failure, Call call)
{
    Thread_Context* context = Thread_Context::top();
    return context ? call(*context) : failure;
}

} // namespace

bool Instance_Enumerator::more() const
{
    return _handle && with_context(false, [&](auto& context) { return context.instance_enumerator_more(_handle); });
}

void Instance_Enumerator::next()
{
    Thread_Context* context = Thread_Context::top();
    if (context && _handle)
        context->instance_enumerator_next(_handle);
}

Instance* Instance_Enumerator::get() const
{
    Thread_Context* context = Thread_Context::top();
    return context && _handle ? context->instance_enumerator_get(_handle) : nullptr;
}

void Instance_Enumerator::destroy()
{
    Thread_Context* context = Thread_Context::top();
    if (context && _handle)
    {
        context->instance_enumerator_destroy(_handle);
        _handle = nullptr;
    }
}

int cimom::enum_instances(const char* name_space, const Instance* model, Instance_Enumerator& enumerator)
{
    return with_context(-1,
                        [&](auto& context)
                        {
                            enumerator.destroy();
                            enumerator._handle = context.instance_enumerator_create(name_space, model);
                            return enumerator._handle ? 0 : -1;
                        });
}

int cimom::enum_instances(const char*, const Instance*, Array<Instance>&)
{
    std::fputs("NOT IMPLEMENTED.", stderr);
    CIMPLE_ASSERT(0);
    return -1;
}

Instance* cimom::get_instance(const char* name_space, const Instance* model)
{
    return with_context<Instance*>(nullptr, [&](auto& context) { return context.get_instance(name_space, model); });
}

int cimom::create_instance(const char* name_space, const Instance* instance)
{
    return with_context(-1, [&](auto& context) { return context.create_instance(name_space, instance); });
}

int cimom::delete_instance(const char* name_space, const Instance* instance)
{
    return with_context(-1, [&](auto& context) { return context.delete_instance(name_space, instance); });
}

int cimom::modify_instance(const char* name_space, const Instance* instance)
{
    return with_context(-1, [&](auto& context) { return context.modify_instance(name_space, instance); });
}

int cimom::invoke_method(const char* name_space, const Instance* reference, Instance* method)
{
    return with_context(-1, [&](auto& context) { return context.invoke_method(name_space, reference, method); });
}

void cimom::allow_unload(bool allow)
{
    if (Thread_Context* context = Thread_Context::top())
        context->allow_unload(allow);
}

bool cimom::get_username(String& username)
{
    return with_context(false, [&](auto& context) { return context.get_username(username); });
}

} // namespace cimple
