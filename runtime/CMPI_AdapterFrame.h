// The common frame of the adapter's operations, and what they answer with. For the adapter's own sources.
#pragma once

#include "runtime/CMPI_Adapter.h"
#include "runtime/CMPI_Thread_Context.h"
#include "runtime/CmpiData.h"
#include "runtime/RuntimeLog.h"
#include "runtime/StatusMap.h"

#include <cxxabi.h>
#include <exception>

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

/// What an operation answers, and the status that its trace line shows.
struct Outcome
{
    Outcome(CMPIrc status) : rc(status), logged(status) {}
    Outcome(CMPIrc status, CMPIrc shown) : rc(status), logged(shown) {}

    CMPIrc rc;
    CMPIrc logged;
};

inline CMPIStatus cmpi_status(CMPIrc rc)
{
    return CMPIStatus{rc, nullptr};
}

/// Runs provider code: no exception reaches the broker, but the end of the thread passes through.
template <class Result, class Work> Result shielded(Result failure, Work work)
{
    try
    {
        return work();
    }
    catch (const abi::__forced_unwind&)
    {
        throw;
    }
    catch (const std::exception& error)
    {
        RUNTIME_LOG(LOG_ERR, "exception: %s", error.what());
    }
    catch (...)
    {
        RUNTIME_LOG(LOG_ERR, "exception");
    }
    return failure;
}

/// Runs `Outcome work(CMPI_Adapter&)` with the adapter's context on the thread and under the adapter's lock.
template <class MI, class Work>
CMPIStatus operate(const MI* mi, const CMPIContext* context, const char* name, Work work)
{
    const Adapter_Use adapter(static_data_of(mi));
    if (!adapter)
        return cmpi_status(CMPI_RC_ERR_FAILED);
    CMPI_Thread_Context thread_context((*adapter).broker, context, adapter.get());
    const Pushed_Context pushed(thread_context);
    Auto_Mutex lock((*adapter).lock);

    RUNTIME_LOG(LOG_DBG, "enter: %s()", name);
    const Outcome outcome = shielded(Outcome(CMPI_RC_ERR_FAILED), [&] { return Outcome(work(*adapter)); });
    RUNTIME_LOG(LOG_DBG, "return: %s(): %s", name, cmpi_status_name(outcome.logged));
    return cmpi_status(outcome.rc);
}

/// The cleanup of all four kinds: it counts down, and with the last of them unloads and destroys.
CMPIrc clean_up(Static_Adapter_Data* data, const CMPIContext* context, bool terminating);

template <class MI> CMPIStatus cleanup(MI* mi, const CMPIContext* context, CMPIBoolean terminating)
{
    return cmpi_status(clean_up(static_data_of(mi), context, terminating != 0));
}

/// Where an operation's results go. The first failure is kept and ends the results.
struct Reply
{
    const CMPIBroker* broker;
    const CMPIContext* context;
    const CMPIResult* result;
    const char** properties; ///< of the request; null: all
    String name_space;       ///< of the request
    CMPIrc status = CMPI_RC_OK;

    Reply(const CMPI_Adapter& adapter, const CMPIContext* ctx, const CMPIResult* to, const CMPIObjectPath* path,
          const char** wanted = nullptr);

    /// All return true to go on.
    bool keep(CMPIrc rc)
    {
        status = rc;
        return rc == CMPI_RC_OK;
    }
    bool send_path(const Instance* instance, const char* ns);
    bool send_instance(const Instance* instance, const char* ns);
    /// Sends what the broker has under the instance's path.
    bool send_fetched(const Instance* instance, const char* ns);
    /// Ends the results of a success; returns the status kept.
    CMPIrc done();
};

/// A provider's handler over a Reply: owns the instance, and skips all work once a status is kept.
template <bool (*send)(Reply& reply, Instance* instance)> bool reply_handler(Instance* instance, int, void* client)
{
    const Ref<> owned(instance);
    Reply& reply = *static_cast<Reply*>(client);
    return instance && reply.status == CMPI_RC_OK && send(reply, instance);
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
