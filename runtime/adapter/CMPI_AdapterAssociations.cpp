// Association operations, with the fallback that saves every association provider from writing them: the
// adapter enumerates the association's instances and follows those that lead to the source.
#include "runtime/adapter/CMPI_AdapterFrame.h"

#include "runtime/cmpi/Converter.h"

#include <algorithm>
#include <iterator>

namespace cimple
{

namespace
{

/// Association classes have two ends; room for more, as the ends of one instance.
constexpr std::size_t max_ends = 16;

bool is_association(const CMPI_Adapter& adapter)
{
    return adapter.meta_class && (adapter.meta_class->flags & META_ASSOCIATION);
}

bool is_one_of(int number, std::initializer_list<int> numbers)
{
    return std::find(numbers.begin(), numbers.end(), number) != numbers.end();
}

/// Answer of the fallback's enumeration in the numbers of the operation that it stands for.
int fallback_status(int enumerated, int failed, int access_denied)
{
    if (enumerated == ENUM_INSTANCES_FAILED)
        return failed;
    return enumerated == ENUM_INSTANCES_ACCESS_DENIED ? access_denied : PROVIDER_OK;
}

/// A handler and its client, which the fallback feeds.
struct Receiver
{
    Instance_Handler handler;
    void* client;

    /// Gives the instance away; true to go on.
    bool give(Instance* instance) const { return handler(instance, PROVIDER_OK, client); }
    void end() const { handler(nullptr, PROVIDER_OK, client); }
};

/// Runs `CMPIrc answer(const Instance* source)` with the keys of the path, and ends the reply of a success.
template <class Answer>
Outcome answer_from(const CMPI_Adapter& adapter, const CMPIObjectPath* path, Reply& reply, Answer answer)
{
    const Meta_Class* mc = adapter.find_class(path);
    if (!mc) // a client that walks associations sees an empty result, and goes on
        return {reply.done(), CMPI_RC_ERR_INVALID_CLASS};
    Ref<> source;
    if (const CMPIrc rc = make_cimple_reference(mc, path, *source.out()); rc != CMPI_RC_OK)
        return rc;
    const CMPIrc rc = answer(source.get());
    return rc != CMPI_RC_OK ? rc : reply.done();
}

// --- references ---------------------------------------------------------------------------------------------

struct Reference_Search
{
    const Instance* source;
    const char* role;
    Receiver receiver;
};

bool pass_matching_reference(Instance* association, int, void* client)
{
    Ref<> owned(association);
    const auto& search = *static_cast<const Reference_Search*>(client);
    if (!association)
        return false;
    if (!references_match(search.source, association, search.role))
        return true;
    return search.receiver.give(owned.release());
}

int references_with_fallback(const CMPI_Adapter& adapter, const Instance* source, const Instance* model,
                             const char* result_class, const char* role, const Receiver& receiver)
{
    if (!is_association(adapter))
        return REFERENCES_FAILED;
    const int answer =
        adapter.call(OP_REFERENCES, adapter.provider, source, model, role, receiver.handler, receiver.client);
    if (is_one_of(answer, {PROVIDER_OK, REFERENCES_FAILED, REFERENCES_ACCESS_DENIED}))
        return answer;

    int enumerated = PROVIDER_OK;
    if (fits_class(adapter.meta_class, result_class)) // servers leave this filter to the provider
    {
        Reference_Search search{source, role, receiver};
        const Selection selection{.end = source};
        enumerated = adapter.call(OP_ENUM_INSTANCES, adapter.provider, model, Instance_Handler(pass_matching_reference),
                                  &search, &selection);
    }
    receiver.end();
    return fallback_status(enumerated, REFERENCES_FAILED, REFERENCES_ACCESS_DENIED);
}

bool send_reference_name(Reply& reply, Instance* association)
{
    nullify(association, false, true, 1);
    return reply.send_path(association, reply.name_space.c_str());
}

bool send_reference(Reply& reply, Instance* association)
{
    if (reply.properties) // without a list the association goes out as it is, what is null in it included
        filter_properties(association, reply.properties, false);
    return reply.send_instance(association, reply.name_space.c_str());
}

/// `cut_model` leaves in the model of the association what the request wants.
template <class CutModel>
CMPIrc answer_references(const CMPI_Adapter& adapter, const Instance* source, const char* result_class,
                         const char* role, CutModel cut_model, Instance_Handler handler, Reply& reply)
{
    const Ref<> model(adapter.meta_class ? create(adapter.meta_class) : nullptr);
    if (!model)
        return CMPI_RC_ERR_FAILED;
    cut_model(model.get());
    return cmpi_status_of(
        references_with_fallback(adapter, source, model.get(), result_class, role, {handler, &reply}));
}

CMPIStatus referenceNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* path, const char* resultClass, const char* role)
{
    return operate(mi, context, "referenceNames", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Reply reply(adapter, context, result, path);
                       const auto cut = [](Instance* model) { nullify(model, false, true, 1); };
                       return answer_from(adapter, path, reply,
                                          [&](const Instance* source) {
                                              return answer_references(adapter, source, resultClass, role, cut,
                                                                       reply_handler<send_reference_name>, reply);
                                          });
                   });
}

CMPIStatus references(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                      const CMPIObjectPath* path, const char* resultClass, const char* role, const char** properties)
{
    return operate(mi, context, "references", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Reply reply(adapter, context, result, path, properties);
                       const auto cut = [&](Instance* model) { filter_properties(model, properties, true); };
                       return answer_from(adapter, path, reply,
                                          [&](const Instance* source) {
                                              return answer_references(adapter, source, resultClass, role, cut,
                                                                       reply_handler<send_reference>, reply);
                                          });
                   });
}

// --- associators --------------------------------------------------------------------------------------------

/// The client's filters; each may be null or empty.
struct Association_Filters
{
    const char* assoc_class;
    const char* result_class;
    const char* role;
    const char* result_role;
};

struct Associator_Search
{
    const Instance* source;
    const Association_Filters& filters;
    Receiver receiver;
};

bool pass_associators(Instance* association, int, void* client)
{
    const Ref<> owned(association);
    const auto& search = *static_cast<const Associator_Search*>(client);
    if (!association)
        return false;
    const Association_Filters& filters = search.filters;
    const Instance* ends[max_ends];
    const std::ptrdiff_t count = get_associators(search.source, association, filters.assoc_class, filters.result_class,
                                                 filters.role, filters.result_role, ends, std::size(ends));
    bool go_on = true;
    for (std::ptrdiff_t i = 0; i < count; ++i)
        if (go_on)
            go_on = search.receiver.give(const_cast<Instance*>(ends[i]));
        else
            unref(ends[i]);
    return go_on;
}

int associators_with_fallback(const CMPI_Adapter& adapter, const Instance* source, const Association_Filters& filters,
                              const Receiver& receiver)
{
    if (!is_association(adapter))
        return ASSOCIATORS_FAILED;
    const int answer = adapter.call(OP_ASSOCIATORS, adapter.provider, source, filters.assoc_class, filters.result_class,
                                    filters.role, filters.result_role, receiver.handler, receiver.client);
    if (is_one_of(answer, {PROVIDER_OK, ASSOCIATORS_FAILED, ASSOCIATORS_ACCESS_DENIED}))
        return answer;

    const Ref<> model(create(adapter.meta_class));
    nullify(model.get(), false, true, 1);
    Associator_Search search{source, filters, receiver};
    const Selection selection{.end = source};
    const int enumerated = adapter.call(OP_ENUM_INSTANCES, adapter.provider, model.get(),
                                        Instance_Handler(pass_associators), &search, &selection);
    receiver.end();
    return fallback_status(enumerated, ASSOCIATORS_FAILED, ASSOCIATORS_ACCESS_DENIED);
}

/// Ends of associations may live in another namespace than the association.
const char* name_space_of(const Reply& reply, const Instance* referent)
{
    return referent->__name_space.empty() ? reply.name_space.c_str() : referent->__name_space.c_str();
}

bool send_associator_name(Reply& reply, Instance* referent)
{
    return reply.send_path(referent, name_space_of(reply, referent));
}

/// The referent's own provider serves the instance; what the association holds was taken when it was made.
bool fetch_associator(Reply& reply, Instance* referent)
{
    return reply.send_fetched(referent, name_space_of(reply, referent));
}

bool send_associator(Reply& reply, Instance* referent)
{
    return reply.send_instance(referent, name_space_of(reply, referent));
}

/// Asks the provider for whole instances first, and falls back on fetching each end from the broker.
CMPIrc answer_associators(const CMPI_Adapter& adapter, const Instance* source, const Association_Filters& filters,
                          Reply& reply)
{
    const int answer =
        adapter.call(OP_ASSOCIATORS_WITH_PROPERTIES, adapter.provider, source, filters.assoc_class,
                     filters.result_class, filters.role, filters.result_role, reply_handler<send_associator>, &reply);
    if (is_one_of(answer, {PROVIDER_OK, ASSOCIATORS_PROPERTIES_FAILED, ASSOCIATORS_PROPERTIES_ACCESS_DENIED}))
        return cmpi_status_of(answer);
    return cmpi_status_of(
        associators_with_fallback(adapter, source, filters, {reply_handler<fetch_associator>, &reply}));
}

CMPIStatus associatorNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                           const CMPIObjectPath* path, const char* assocClass, const char* resultClass,
                           const char* role, const char* resultRole)
{
    const Association_Filters filters{assocClass, resultClass, role, resultRole};
    return operate(mi, context, "associatorNames", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Reply reply(adapter, context, result, path);
                       return answer_from(adapter, path, reply,
                                          [&](const Instance* source)
                                          {
                                              const Receiver receiver{reply_handler<send_associator_name>, &reply};
                                              return cmpi_status_of(
                                                  associators_with_fallback(adapter, source, filters, receiver));
                                          });
                   });
}

CMPIStatus associators(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* path, const char* assocClass, const char* resultClass, const char* role,
                       const char* resultRole, const char** properties)
{
    const Association_Filters filters{assocClass, resultClass, role, resultRole};
    return operate(mi, context, "associators", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Reply reply(adapter, context, result, path, properties);
                       return answer_from(adapter, path, reply,
                                          [&](const Instance* source)
                                          { return answer_associators(adapter, source, filters, reply); });
                   });
}

} // namespace

void fill_association_functions(CMPIAssociationMIFT& table)
{
    replace_table(table, CMPIAssociationMIFT{
                             .ftVersion = CMPIVersion100,
                             .miVersion = CMPIVersion100,
                             .miName = nullptr,
                             .cleanup = cleanup<CMPIAssociationMI>,
                             .associators = associators,
                             .associatorNames = associatorNames,
                             .references = references,
                             .referenceNames = referenceNames,
                         });
}

} // namespace cimple
