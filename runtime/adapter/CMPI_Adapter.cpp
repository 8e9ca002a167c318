// The adapter's life: factory, construction, cleanup.
#include "runtime/adapter/CMPI_AdapterFrame.h"

#include "runtime/cmpi/Converter.h"

#include <algorithm>
#include <cstdio>
#include <memory>
#include <optional>
#include <utility>

namespace cimple
{

void Adapter_Gate::lock()
{
    // Only the owner can find itself here: all others see another thread or none.
    if (_owner.load(std::memory_order_relaxed) != pthread_self())
    {
        _mutex.lock();
        _owner.store(pthread_self(), std::memory_order_relaxed);
    }
    ++_depth;
}

void Adapter_Gate::unlock()
{
    if (--_depth > 0)
        return;
    _owner.store(pthread_t{}, std::memory_order_relaxed);
    _mutex.unlock();
}

// --- construction -------------------------------------------------------------------------------------------

CMPI_Adapter::CMPI_Adapter(const Registration* reg, const CMPIBroker* mb, Static_Adapter_Data* data,
                           const Module_Info* info)
    : registration(reg), proc(reg->proc), broker(mb), static_data(data), module(info)
{
    call(OP_CREATE_PROVIDER, &provider);
}

CMPI_Adapter::CMPI_Adapter(const Registration* reg, const CMPIBroker* mb, const CMPIContext* context,
                           Static_Adapter_Data* data, const char* provider_name, const Module_Info* info)
    : CMPI_Adapter(reg, mb, data, info) // what throws from here on destroys the provider
{
    CMPI_Thread_Context thread_context(broker, context, this);
    const Pushed_Context pushed(thread_context);
    fill_static_data(provider_name);
    // The block knows the adapter already: an exception must not take it away again.
    load_tried = true;
    shielded(0, [&] { return call(OP_LOAD, provider); });
    shielded(0, [&] { return call(OP_GET_META_CLASS, &meta_class); });
}

CMPI_Adapter::~CMPI_Adapter()
{
    if (load_tried)
        shielded(0, [&] { return call(OP_UNLOAD, provider); });
    shielded(0, [&] { return call(OP_DESTROY_PROVIDER, provider); });
}

void CMPI_Adapter::fill_static_data(const char* provider_name)
{
    fill_instance_functions(static_data->instance_ft);
    fill_method_functions(static_data->method_ft);
    fill_indication_functions(static_data->indication_ft);
    fill_association_functions(static_data->association_ft);

    // The names of all four tables go to the instance table; brokers do not look at them.
    const struct
    {
        char* buffer;
        const char* kind;
    } names[] = {
        {static_data->instance_name, "instance"},
        {static_data->method_name, "method"},
        {static_data->indication_name, "indication"},
        {static_data->association_name, "association"},
    };
    for (const auto& name : names)
    {
        std::snprintf(name.buffer, Static_Adapter_Data::name_size, "%s%s", name.kind, provider_name);
        static_data->instance_ft.miName = name.buffer;
    }

    const std::lock_guard guard(static_data->guard);
    static_data->magic = Static_Adapter_Data::alive;
    static_data->adapter = this;
}

static bool serves(const Module_Info& module, const Meta_Class* mc)
{
    for (const Registration* row = module.registrations; row; row = row->next)
        if (row->meta_class == mc)
            return true;
    return false;
}

bool CMPI_Adapter::answers_for(const Instance* end, CMPIrc failure) const
{
    if (!module)
        return false;
    if (!serves(*module, end->__meta_class))
        return true;
    const auto is = [](const Meta_Class* mc, const char* name) { return !name || is_or_derives_from(mc, name); };
    const auto lasts = [&](const Lasting_End& row)
    { return is(meta_class, row.association) && is(end->__meta_class, row.referent); };
    return failure == CMPI_RC_ERR_NOT_FOUND &&
           std::any_of(module->lasting_ends.begin(), module->lasting_ends.end(), lasts);
}

const Meta_Class* CMPI_Adapter::find_class(const CMPIObjectPath* path) const
{
    String name;
    const Meta_Repository* repository = nullptr;
    if (!path || !text_of(CMGetClassName(path, nullptr), name))
        return nullptr;
    call(OP_GET_REPOSITORY, &repository);
    return cimple::find_class(repository, name.c_str());
}

// --- factory ------------------------------------------------------------------------------------------------

namespace
{

/// Takes the adapter out of its block; it unloads and dies with its last user, which may be a request in flight.
void retire(Static_Adapter_Data* data)
{
    std::unique_ptr<CMPI_Adapter> last;
    const std::lock_guard guard(data->guard);
    CMPI_Adapter* adapter = std::exchange(data->adapter, nullptr);
    data->magic = Static_Adapter_Data::dead;
    if (adapter && --adapter->users == 0)
        last.reset(adapter);
}

CMPI_Adapter* current_adapter(Static_Adapter_Data* data)
{
    const std::lock_guard guard(data->guard);
    return data->adapter;
}

template <class MI, class Table> void* fill_record(Static_Adapter_Data* data, MI& mi, const Table& table)
{
    if (mi.hdl != data) // running operations read a record that is filled
    {
        mi.hdl = data;
        mi.ft = &table;
    }
    return &mi;
}

void* record_of(Static_Adapter_Data* data, char type)
{
    switch (type)
    {
    case 'I':
        return fill_record(data, data->instance_mi, data->instance_ft);
    case 'M':
        return fill_record(data, data->method_mi, data->method_ft);
    case 'A':
        return fill_record(data, data->association_mi, data->association_ft);
    case 'N':
        return fill_record(data, data->indication_mi, data->indication_ft);
    default:
        return nullptr;
    }
}

} // namespace

int cimple_cmpi_adapter(Static_Adapter_Data* static_data, const Registration* registration, const CMPIBroker* broker,
                        const CMPIContext* context, const char* provider_name, char type, void** out_mi,
                        const Module_Info* module)
{
    *out_mi = nullptr;
    return shielded(-1,
                    [&]
                    {
                        const std::lock_guard gate(static_data->gate);
                        void* record = record_of(static_data, type);
                        if (!record)
                            return -1;
                        if (CMPI_Adapter* adapter = current_adapter(static_data))
                        {
                            ++adapter->load_count;
                            adapter->broker = broker;
                        }
                        else
                            new CMPI_Adapter(registration, broker, context, static_data, provider_name, module);
                        *out_mi = record;
                        return 0;
                    });
}

// --- use and cleanup ----------------------------------------------------------------------------------------

Adapter_Use::Adapter_Use(Static_Adapter_Data* data)
{
    if (!data)
        return;
    const std::lock_guard guard(data->guard);
    _adapter = data->adapter;
    if (_adapter)
        ++_adapter->users;
}

Adapter_Use::~Adapter_Use()
{
    if (!_adapter)
        return;
    bool last = false;
    {
        const std::lock_guard guard(_adapter->static_data->guard);
        last = --_adapter->users == 0;
    }
    if (last)
        delete _adapter;
}

namespace
{

struct Cleanup_Answer
{
    CMPIrc rc;
    const char* text; ///< of the trace line
};

Cleanup_Answer count_down(CMPI_Adapter& adapter, bool terminating)
{
    if (!terminating && !adapter.allow_unload)
        return {CMPI_RC_DO_NOT_UNLOAD, "cleanup do not unload"};
    if (adapter.load_count == 1)
    {
        retire(adapter.static_data);
        return {CMPI_RC_OK, "cleanup unload"};
    }
    --adapter.load_count;
    return {CMPI_RC_OK, "cleanup decrement"};
}

} // namespace

/// Every factory call and cleanup takes its turn at the gate.
static CMPIrc clean_up_behind_gate(Static_Adapter_Data* data, const CMPIContext* context, bool terminating)
{
    const std::lock_guard gate(data->gate);
    std::optional<Adapter_Use> adapter(data);
    if (!*adapter)
        return CMPI_RC_ERR_FAILED;
    CMPI_Thread_Context thread_context((**adapter).broker, context, adapter->get());
    const Pushed_Context pushed(thread_context);

    RUNTIME_LOG(LOG_DBG, "enter: %s()", "cleanup");
    const Cleanup_Answer answer = shielded(Cleanup_Answer{CMPI_RC_ERR_FAILED, cmpi_status_name(CMPI_RC_ERR_FAILED)},
                                           [&] { return count_down(**adapter, terminating); });
    thread_context.adapter = nullptr;
    adapter.reset(); // without requests in flight the provider unloads here, while the thread still has its context
    RUNTIME_LOG(LOG_DBG, "return: %s(): %s", "cleanup", answer.text);
    return answer.rc;
}

CMPIrc clean_up(Static_Adapter_Data* data, const CMPIContext* context, bool terminating)
{
    if (!data)
        return CMPI_RC_ERR_FAILED;
    return shielded(CMPI_RC_ERR_FAILED, [&] { return clean_up_behind_gate(data, context, terminating); });
}

// --- replies ------------------------------------------------------------------------------------------------

Reply::Reply(const CMPI_Adapter& owner, const CMPIContext* ctx, const CMPIResult* to, const CMPIObjectPath* path,
             const char** wanted)
    : adapter(owner), broker(owner.broker), context(ctx), result(to), properties(wanted)
{
    text_of(CMGetNameSpace(path, nullptr), name_space);
}

bool Reply::send_path(const Instance* instance, const char* ns)
{
    CMPIObjectPath* path = nullptr;
    return keep(make_cmpi_object_path(broker, instance, ns, path)) && keep(CMReturnObjectPath(result, path).rc);
}

bool Reply::send_instance(const Instance* instance, const char* ns)
{
    CMPIObjectPath* path = nullptr;
    return keep(make_cmpi_object_path(broker, instance, ns, path)) && send_instance(instance, ns, path);
}

bool Reply::send_instance(const Instance* instance, const char* ns, CMPIObjectPath* path)
{
    CMPIInstance* inst = nullptr;
    return keep(make_cmpi_instance(broker, instance, ns, path, properties, inst)) &&
           keep(CMReturnInstance(result, inst).rc);
}

bool Reply::send_fetched(const Instance* instance, const char* ns)
{
    CMPIObjectPath* path = nullptr;
    if (!keep(make_cmpi_object_path(broker, instance, ns, path)))
        return false;
    CMPIStatus fetched{CMPI_RC_OK, nullptr};
    const CMPIInstance* inst = CBGetInstance(broker, context, path, properties, &fetched);
    if (fetched.rc == CMPI_RC_OK && !inst)
        fetched.rc = CMPI_RC_ERR_FAILED;
    if (fetched.rc != CMPI_RC_OK)
        RUNTIME_LOG(LOG_WARN, "failed[%u]", static_cast<unsigned>(fetched.rc));
    if (fetched.rc != CMPI_RC_OK && adapter.answers_for(instance, fetched.rc))
        return send_instance(instance, ns, path);
    return keep(fetched.rc) && keep(CMReturnInstance(result, inst).rc);
}

CMPIrc Reply::done()
{
    if (status == CMPI_RC_OK)
        CMReturnDone(result);
    return status;
}

} // namespace cimple
