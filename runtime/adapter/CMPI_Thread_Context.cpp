#include "runtime/adapter/CMPI_Thread_Context.h"

#include "runtime/adapter/CMPI_AdapterFrame.h"
#include "runtime/cmpi/CmpiContainers.h"
#include "runtime/cmpi/Converter.h"
#include "runtime/meta/InstanceSlots.h"

#include <memory>
#include <stdexcept>
#include <utility>

namespace cimple
{

CMPI_Thread_Context::CMPI_Thread_Context(const CMPIBroker* mb, const CMPIContext* ctx, CMPI_Adapter* owner)
    : broker(mb), context(ctx), adapter(owner), _adapter_data(owner ? owner->static_data : nullptr)
{}

CMPI_Thread_Context::CMPI_Thread_Context(const CMPI_Thread_Context& creator, const CMPIContext* prepared)
    : broker(creator.broker), context(prepared), adapter(creator.adapter), _adapter_data(creator._adapter_data)
{}

// --- threads ------------------------------------------------------------------------------------------------

Thread_Context* CMPI_Thread_Context::thread_create_hook(void*)
{
    // The broker frees a prepared context with the thread that attached it, and in no other way: it comes last.
    std::unique_ptr<CMPI_Thread_Context> made(new CMPI_Thread_Context(*this, nullptr));
    made->context = CBPrepareAttachThread(broker, context);
    return made->context ? made.release() : nullptr;
}

void CMPI_Thread_Context::thread_start_hook()
{
    if (CBAttachThread(broker, context).rc != CMPI_RC_OK) // an up-call would crash one of the brokers
        throw std::runtime_error("CBAttachThread() failed");
    _attached = true;
    if (const Broker_Memory_FT* memory = broker_memory(broker))
        _mark = memory->mark(broker, nullptr);
}

void CMPI_Thread_Context::thread_exit_hook()
{
    // A thread that ends early through Thread::exit() may have a context of a broker's call on top, which has
    // nothing to detach.
    if (!_attached)
        return;
    _attached = false;
    // One of the brokers frees what a thread got from it only here, and crashes at the thread's end without it.
    if (void* mark = std::exchange(_mark, nullptr))
        broker_memory(broker)->release(broker, mark);
    CBDetachThread(broker, context);
    context = nullptr; // freed by the broker
}

// --- enumeration --------------------------------------------------------------------------------------------

struct Instance_Enumeration
{
    CMPIEnumeration* enumeration;
    const Meta_Class* meta_class;
    Ref<> current; ///< null at the end
};

namespace
{

/// Anything but an instance of the class ends the iteration. Only the type and the pointer of the data tell: one
/// broker marks valid data as null, and what it writes to the status of a fetch is not to be relied on either.
Ref<> fetch(CMPIEnumeration* enumeration, const Meta_Class* mc)
{
    Ref<> instance;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    if (!CMHasNext(enumeration, &status) || status.rc != CMPI_RC_OK)
        return instance;
    const CMPIData data = CMGetNext(enumeration, &status);
    if (data.type != CMPI_instance || !data.value.inst)
        return instance;
    status.rc = CMPI_RC_OK;
    const CMPIObjectPath* path = CMGetObjectPath(data.value.inst, &status);
    if (!path || status.rc != CMPI_RC_OK)
        return instance;
    if (make_cimple_instance(mc, path, data.value.inst, *instance.out()) != CMPI_RC_OK)
        instance.reset();
    return instance;
}

} // namespace

Instance_Enumeration* CMPI_Thread_Context::instance_enumerator_create(const char* name_space, const Instance* model)
{
    CMPIObjectPath* path = path_of(name_space, model);
    if (!path)
        return nullptr;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIEnumeration* enumeration = CBEnumInstances(broker, context, path, nullptr, &status);
    if (!enumeration || status.rc != CMPI_RC_OK)
        return nullptr;
    const Meta_Class* mc = model->__meta_class;
    return new Instance_Enumeration{enumeration, mc, fetch(enumeration, mc)};
}

void CMPI_Thread_Context::instance_enumerator_destroy(Instance_Enumeration* enumeration)
{
    delete enumeration; // the broker's part belongs to the broker
}

bool CMPI_Thread_Context::instance_enumerator_more(Instance_Enumeration* enumeration)
{
    return static_cast<bool>(enumeration->current);
}

void CMPI_Thread_Context::instance_enumerator_next(Instance_Enumeration* enumeration)
{
    if (enumeration->current)
        enumeration->current = fetch(enumeration->enumeration, enumeration->meta_class);
}

Instance* CMPI_Thread_Context::instance_enumerator_get(Instance_Enumeration* enumeration)
{
    return Ref<>(enumeration->current).release();
}

// --- single instances ---------------------------------------------------------------------------------------

CMPIObjectPath* CMPI_Thread_Context::path_of(const char* name_space, const Instance* instance)
{
    CMPIObjectPath* path = nullptr;
    if (!context || !instance || make_cmpi_object_path(broker, instance, name_space, path) != CMPI_RC_OK)
        return nullptr;
    return path;
}

CMPIInstance* CMPI_Thread_Context::instance_of(const char* name_space, const Instance* instance, CMPIObjectPath* path)
{
    CMPIInstance* inst = nullptr;
    if (!path || make_cmpi_instance(broker, instance, name_space, path, nullptr, inst) != CMPI_RC_OK)
        return nullptr;
    return inst;
}

Instance* CMPI_Thread_Context::get_instance(const char* name_space, const Instance* model)
{
    CMPIObjectPath* path = path_of(name_space, model);
    if (!path)
        return nullptr;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIInstance* inst = CBGetInstance(broker, context, path, nullptr, &status);
    if (!inst || status.rc != CMPI_RC_OK)
        return nullptr;
    Ref<> instance;
    make_cimple_instance(model->__meta_class, path, inst, *instance.out()); // leaves it null when it fails
    return instance.release();
}

int CMPI_Thread_Context::create_instance(const char* name_space, const Instance* instance)
{
    CMPIObjectPath* path = path_of(name_space, instance);
    CMPIInstance* inst = instance_of(name_space, instance, path);
    if (!inst)
        return -1;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CBCreateInstance(broker, context, path, inst, &status);
    return status.rc == CMPI_RC_OK ? 0 : -1;
}

int CMPI_Thread_Context::modify_instance(const char* name_space, const Instance* instance)
{
    CMPIObjectPath* path = path_of(name_space, instance);
    CMPIInstance* inst = instance_of(name_space, instance, path);
    return inst && CBModifyInstance(broker, context, path, inst, nullptr).rc == CMPI_RC_OK ? 0 : -1;
}

int CMPI_Thread_Context::delete_instance(const char* name_space, const Instance* instance)
{
    CMPIObjectPath* path = path_of(name_space, instance);
    return path && CBDeleteInstance(broker, context, path).rc == CMPI_RC_OK ? 0 : -1;
}

// --- methods ------------------------------------------------------------------------------------------------

namespace
{

/// Reads `Out` parameters back into the record; entries of other names or types are logged and skipped.
void read_out_arguments(const CMPIArgs* out, const Meta_Repository* repository, Instance* method)
{
    CMPIArgs_Container container(nullptr, repository, nullptr, const_cast<CMPIArgs*>(out));
    Ref<> results;
    container.convert(method->__meta_class, META_OUT, *results.out());
    for (const Meta_Feature* mf : features_of(method))
    {
        Value value;
        if ((mf->flags & META_OUT) && read_feature(results.get(), mf, value) == 0)
            assign(method, mf, value);
    }
}

/// The trace line of the step that fails, and the call's status.
int method_call_failed(unsigned line = __builtin_LINE())
{
    RUNTIME_LOG_AT(LOG_WARN, base_name(__FILE__), line, "failed");
    return -1;
}

int read_return_value(const CMPIData& data, const Meta_Repository* repository, Instance* method)
{
    const Meta_Feature* mf = find_feature(method->__meta_class, "return_value", property_or_reference);
    Value value;
    if (!mf || cmpi_to_cimple_value(repository, data, value) != 0 || assign(method, mf, value) != Assign_Result::ok)
        return method_call_failed();
    return 0;
}

} // namespace

int CMPI_Thread_Context::invoke_method(const char* name_space, const Instance* reference, Instance* method)
{
    if (!name_space || !reference || !method)
        return method_call_failed();
    const Meta_Repository* repository = reference->__meta_class->meta_repository;
    if (!repository)
        return method_call_failed();
    if (!top())
        return method_call_failed();
    if (!broker)
        return method_call_failed();
    if (!context)
        return method_call_failed();

    CMPIStatus status{CMPI_RC_OK, nullptr};
    const Meta_Record* record = method->__meta_class;
    CMPIObjectPath* path = record->flags & META_STATIC
                               ? CMNewObjectPath(broker, name_space, reference->__meta_class->name, &status)
                               : path_of(name_space, reference);
    if (!path || status.rc != CMPI_RC_OK)
        return method_call_failed();
    CMPIArgs* in = CMNewArgs(broker, &status);
    if (!in || status.rc != CMPI_RC_OK)
        return method_call_failed();
    CMPIArgs* out = CMNewArgs(broker, &status);
    if (!out || status.rc != CMPI_RC_OK)
        return method_call_failed();

    CMPIArgs_Container(broker, repository, name_space, in).convert(method, META_IN);
    const CMPIData data = CBInvokeMethod(broker, context, path, record->name, in, out, &status);
    if (status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "failed[%u]", static_cast<unsigned>(status.rc));
        return -1;
    }
    read_out_arguments(out, repository, method);
    return read_return_value(data, repository, method);
}

// --- the rest -----------------------------------------------------------------------------------------------

void CMPI_Thread_Context::allow_unload(bool allow)
{
    const Adapter_Use current(_adapter_data);
    if (current && current.get() == adapter)
        adapter->allow_unload = allow;
}

bool CMPI_Thread_Context::get_username(String& username)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIData data = {};
    if (context)
        data = CMGetContextEntry(context, CMPIPrincipal, &status);
    if (!context || status.rc != CMPI_RC_OK || CMIsNullValue(data) || data.type != CMPI_string)
    {
        RUNTIME_LOG(LOG_ERR, "username not OK cmpirc=%d", static_cast<int>(status.rc));
        return false;
    }
    // Without authentication one broker gives an empty text, another a string without text.
    username.clear();
    text_of(data.value.string, username);
    return true;
}

} // namespace cimple
