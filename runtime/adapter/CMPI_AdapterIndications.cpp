// Indication operations. No factory symbol of the module leads here today; the adapter is complete all the same.
#include "runtime/adapter/CMPI_AdapterFrame.h"

#include "runtime/base/Assert.h"
#include "runtime/cmpi/Converter.h"

namespace cimple
{

namespace
{

CMPIStatus authorizeFilter(CMPIIndicationMI*, const CMPIContext*, const CMPISelectExp*, const char*,
                           const CMPIObjectPath*, const char*)
{
    return cmpi_status(CMPI_RC_OK);
}

/// One header set has one argument more; brokers do not pass it, and none is read.
template <class... Rest> CMPIStatus mustPoll(CMPIIndicationMI*, const CMPIContext*, Rest...)
{
    return cmpi_status(CMPI_RC_OK);
}

String query_of(const CMPISelectExp* filter)
{
    String query;
    text_of(CMGetSelExpString(filter, nullptr), query);
    return query;
}

std::size_t position_of(const Array<Indication_Filter>& filters, const String& query)
{
    std::size_t i = 0;
    while (i < filters.size() && !(filters[i].query == query))
        ++i;
    return i;
}

CMPIStatus activateFilter(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp* filter, const char*,
                          const CMPIObjectPath*, CMPIBoolean)
{
    return operate(mi, context, "activateFilter", given(filter),
                   [&](CMPI_Adapter& adapter)
                   {
                       const String query = query_of(filter);
                       const std::lock_guard guard(adapter.static_data->guard);
                       const std::size_t place = position_of(adapter.filters, query);
                       if (place < adapter.filters.size())
                           ++adapter.filters[place].count;
                       else
                           adapter.filters.append(Indication_Filter{query, 1});
                       return CMPI_RC_OK;
                   });
}

CMPIStatus deActivateFilter(CMPIIndicationMI* mi, const CMPIContext* context, const CMPISelectExp* filter, const char*,
                            const CMPIObjectPath*, CMPIBoolean)
{
    return operate(mi, context, "deActivateFilter", given(filter),
                   [&](CMPI_Adapter& adapter)
                   {
                       const String query = query_of(filter);
                       const std::lock_guard guard(adapter.static_data->guard);
                       const std::size_t place = position_of(adapter.filters, query);
                       if (place < adapter.filters.size() && --adapter.filters[place].count == 0)
                           adapter.filters.remove(place);
                       return CMPI_RC_OK;
                   });
}

/// Under the leaf lock: the adapter's lock may be held by a call that waits for the provider's thread.
std::size_t active_filters(const CMPI_Adapter& adapter)
{
    const std::lock_guard guard(adapter.static_data->guard);
    return adapter.filters.size();
}

void deliver(const CMPI_Adapter& adapter, const CMPIContext* context, const Instance* indication)
{
    const char* name_space = indication->__name_space.c_str();
    CMPIObjectPath* path = nullptr;
    CMPIInstance* inst = nullptr;
    if (make_cmpi_object_path(adapter.broker, indication, name_space, path) == CMPI_RC_OK &&
        make_cmpi_instance(adapter.broker, indication, name_space, path, nullptr, inst) == CMPI_RC_OK)
        CBDeliverIndication(adapter.broker, context, name_space, inst);
}

/// Runs on a provider's thread, which has a context of this broker.
bool deliver_indication(Instance* indication, void* client)
{
    const Ref<> owned(indication);
    if (!indication)
        return false;
    auto& adapter = *static_cast<CMPI_Adapter*>(client);
    const auto* thread_context = static_cast<const CMPI_Thread_Context*>(Thread_Context::top());
    CIMPLE_ASSERT(thread_context != 0);
    const auto deliver_to_all = [&]
    {
        for (std::size_t left = active_filters(adapter); left > 0; --left)
            deliver(adapter, thread_context->context, indication);
        return true;
    };
    return shielded(true, deliver_to_all); // one that is lost does not end the provider's delivery
}

CMPIStatus enableIndications(CMPIIndicationMI* mi, const CMPIContext* context)
{
    return operate(mi, context, "enableIndications", true,
                   [&](CMPI_Adapter& adapter)
                   {
                       if (adapter.indications_enabled)
                           return CMPI_RC_OK;
                       adapter.indications_enabled = true;
                       return cmpi_status_of(adapter.call(OP_ENABLE_INDICATIONS, adapter.provider,
                                                          Indication_Proc(deliver_indication), &adapter));
                   });
}

CMPIStatus disableIndications(CMPIIndicationMI* mi, const CMPIContext* context)
{
    return operate(mi, context, "disableIndications", true,
                   [&](CMPI_Adapter& adapter)
                   {
                       if (!adapter.indications_enabled)
                           return CMPI_RC_OK;
                       const int answer = adapter.call(OP_DISABLE_INDICATIONS, adapter.provider);
                       adapter.indications_enabled = false;
                       return cmpi_status_of(answer);
                   });
}

} // namespace

// One header set has slots of a later version in this table whatever the version asked for; they stay null.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wmissing-field-initializers"
void fill_indication_functions(CMPIIndicationMIFT& table)
{
    replace_table(table, CMPIIndicationMIFT{
                             .ftVersion = CMPIVersion100,
                             .miVersion = CMPIVersion100,
                             .miName = nullptr,
                             .cleanup = cleanup<CMPIIndicationMI>,
                             .authorizeFilter = authorizeFilter,
                             .mustPoll = mustPoll,
                             .activateFilter = activateFilter,
                             .deActivateFilter = deActivateFilter,
                             .enableIndications = enableIndications,
                             .disableIndications = disableIndications,
                         });
}
#pragma GCC diagnostic pop

} // namespace cimple
