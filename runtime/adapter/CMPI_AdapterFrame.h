// The common frame of the adapter's operations, and what they answer with. For the adapter's own sources.
#pragma once

#include "runtime/adapter/CMPI_Adapter.h"
#include "runtime/adapter/CMPI_Thread_Context.h"
#include "runtime/adapter/StatusMap.h"
#include "runtime/cmpi/CmpiData.h"
#include "runtime/log/RuntimeLog.h"
#include "runtime/log/Shielded.h"

#include <optional>

namespace cimple
{

/// The static block behind a record of the broker.
template <class MI> Static_Adapter_Data* static_data_of(const MI* mi)
{
    // Some header sets point to const data.
    return mi ? static_cast<Static_Adapter_Data*>(const_cast<void*>(static_cast<const void*>(mi->hdl))) : nullptr;
}

/// Keeps the adapter of a block alive for a scope.
class Adapter_Use
{
public:
    explicit Adapter_Use(Static_Adapter_Data* data);
    ~Adapter_Use();
    Adapter_Use(const Adapter_Use&) = delete;
    Adapter_Use& operator=(const Adapter_Use&) = delete;
    explicit operator bool() const { return _adapter != nullptr; }
    CMPI_Adapter& operator*() const { return *_adapter; }
    CMPI_Adapter* get() const { return _adapter; }

private:
    CMPI_Adapter* _adapter = nullptr;
};

/// A broker's own statuses begin above those of CIM; a client knows none of them.
inline CMPIrc status_for_client(CMPIrc rc)
{
    constexpr int first_of_broker = 100;
    return static_cast<int>(rc) < first_of_broker ? rc : CMPI_RC_ERR_FAILED;
}

/// What an operation answers, and the status that its trace line shows.
struct Outcome
{
    Outcome(CMPIrc status) : Outcome(status, status) {}
    Outcome(CMPIrc status, CMPIrc shown) : rc(status_for_client(status)), logged(shown) {}

    CMPIrc rc;
    CMPIrc logged;
};

inline CMPIStatus cmpi_status(CMPIrc rc)
{
    return CMPIStatus{rc, nullptr};
}

/// An operation as its trace lines show it: by its name, at the place that gives the name.
struct Traced_Operation
{
    consteval Traced_Operation(const char* its_name, const char* path = __builtin_FILE(),
                               int its_line = __builtin_LINE())
        : name(its_name), file(base_name(path)), line(its_line)
    {}

    const char* name;
    const char* file;
    int line;
};

/// Runs `Outcome work(CMPI_Adapter&)` with the adapter's context on the thread and under the adapter's lock.
template <class Work>
CMPIrc run_in_frame(CMPI_Adapter& adapter, const CMPIContext* context, const Traced_Operation& operation, Work work)
{
    CMPI_Thread_Context thread_context(adapter.broker, context, &adapter);
    const Pushed_Context pushed(thread_context);
    Auto_Mutex lock(adapter.lock);

    RUNTIME_LOG_AT(LOG_DBG, operation.file, operation.line, "enter: %s()", operation.name);
    const Outcome outcome = shielded(Outcome(CMPI_RC_ERR_FAILED), [&] { return Outcome(work(adapter)); });
    RUNTIME_LOG_AT(LOG_DBG, operation.file, operation.line, "return: %s(): %s", operation.name,
                   cmpi_status_name(outcome.logged));
    return outcome.rc;
}

/// True if the broker gave what an operation cannot do without.
template <class... Handle> bool given(const Handle*... handles)
{
    return ((handles != nullptr) && ...);
}

/// Every operation of the broker on an adapter. `complete` tells that all arguments which `work` needs were given.
template <class MI, class Work>
CMPIStatus operate(const MI* mi, const CMPIContext* context, const Traced_Operation& operation, bool complete,
                   Work work)
{
    if (!mi)
        return cmpi_status(CMPI_RC_ERR_INVALID_PARAMETER);
    const Adapter_Use adapter(static_data_of(mi));
    if (!adapter)
        return cmpi_status(CMPI_RC_ERR_FAILED);
    const auto checked = [&](CMPI_Adapter& self)
    { return context && complete ? Outcome(work(self)) : Outcome(CMPI_RC_ERR_INVALID_PARAMETER); };
    return cmpi_status(
        shielded(CMPI_RC_ERR_FAILED, [&] { return run_in_frame(*adapter, context, operation, checked); }));
}

/// The cleanup of all four kinds: it counts down, and with the last of them the adapter ends, at once or with the last
/// request in flight.
CMPIrc clean_up(Static_Adapter_Data* data, const CMPIContext* context, bool terminating);

template <class MI> CMPIStatus cleanup(MI* mi, const CMPIContext* context, CMPIBoolean terminating)
{
    if (!mi)
        return cmpi_status(CMPI_RC_ERR_INVALID_PARAMETER);
    return cmpi_status(clean_up(static_data_of(mi), context, terminating != 0));
}

/// Where an operation's results go. The first failure is kept and ends the results.
struct Reply
{
    const CMPI_Adapter& adapter;
    const CMPIBroker* broker;
    const CMPIContext* context;
    const CMPIResult* result;
    const char** properties; ///< of the request; null: all
    String name_space;       ///< of the request
    CMPIrc status = CMPI_RC_OK;

    Reply(const CMPI_Adapter& owner, const CMPIContext* ctx, const CMPIResult* to, const CMPIObjectPath* path,
          const char** wanted = nullptr);

    /// All return true to go on.
    bool keep(CMPIrc rc)
    {
        status = rc;
        return rc == CMPI_RC_OK;
    }
    bool send_path(const Instance* instance, const char* ns);
    bool send_instance(const Instance* instance, const char* ns);
    bool send_instance(const Instance* instance, const char* ns, CMPIObjectPath* path);
    /// Sends what the broker has under the instance's path, or the instance itself where the adapter answers for it.
    bool send_fetched(const Instance* instance, const char* ns);
    /// Ends the results of a success; returns the status kept.
    CMPIrc done();
};

/// A provider's handler over a Reply: owns the instance, and skips all work once a status is kept. What fails here
/// ends the results and does not unwind through the provider.
template <bool (*send)(Reply& reply, Instance* instance)> bool reply_handler(Instance* instance, int, void* client)
{
    const Ref<> owned(instance);
    Reply& reply = *static_cast<Reply*>(client);
    if (!instance || reply.status != CMPI_RC_OK)
        return false;
    const auto go_on = shielded(std::optional<bool>(), [&] { return std::optional(send(reply, instance)); });
    return go_on ? *go_on : reply.keep(CMPI_RC_ERR_FAILED);
}

// The function tables' entries, by theme.
void fill_instance_functions(CMPIInstanceMIFT& table);
void fill_method_functions(CMPIMethodMIFT& table);
void fill_association_functions(CMPIAssociationMIFT& table);
void fill_indication_functions(CMPIIndicationMIFT& table);

/// Writes a table over one that may have const members.
template <class Table> void replace_table(Table& table, const Table& content)
{
    std::destroy_at(&table);
    std::construct_at(&table, content);
}

} // namespace cimple
