// Instance operations: enumerate, get, create, modify, delete.
#include "runtime/adapter/CMPI_AdapterFrame.h"

#include "runtime/cmpi/Converter.h"

namespace cimple
{

namespace
{

// --- enumeration --------------------------------------------------------------------------------------------

/// Instance of the path's class with the path's keys, as the model of a request.
CMPIrc make_model(const CMPI_Adapter& adapter, const CMPIObjectPath* path, Ref<>& model)
{
    const Meta_Class* mc = adapter.find_class(path);
    return mc ? make_cimple_reference(mc, path, *model.out()) : CMPI_RC_ERR_FAILED;
}

/// What the enumeration itself said; numbers that it does not know count as success.
CMPIrc enumeration_status(int provider_status)
{
    const bool failed = provider_status == ENUM_INSTANCES_FAILED || provider_status == ENUM_INSTANCES_ACCESS_DENIED;
    return failed ? cmpi_status_of(provider_status) : CMPI_RC_OK;
}

/// Enumerates into `reply`; the provider's failure goes before one of the conversion.
int enumerate(const CMPI_Adapter& adapter, const Instance* model, Instance_Handler handler, Reply& reply,
              const Selection& selection)
{
    const int answer = adapter.call(OP_ENUM_INSTANCES, adapter.provider, model, handler, &reply, &selection);
    if (const CMPIrc rc = enumeration_status(answer); rc != CMPI_RC_OK)
        reply.status = rc;
    return answer;
}

bool send_request_path(Reply& reply, Instance* instance)
{
    return reply.send_path(instance, reply.name_space.c_str());
}

bool send_request_instance(Reply& reply, Instance* instance)
{
    return reply.send_instance(instance, reply.name_space.c_str());
}

CMPIStatus enumInstanceNames(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                             const CMPIObjectPath* path)
{
    return operate(mi, context, "enumInstanceNames", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Ref<> model;
                       if (const CMPIrc rc = make_model(adapter, path, model); rc != CMPI_RC_OK)
                           return rc;
                       nullify(model.get(), false, true, 1);
                       Reply reply(adapter, context, result, path);
                       const int answer =
                           enumerate(adapter, model.get(), reply_handler<send_request_path>, reply, {.names = true});
                       return answer == PROVIDER_OK ? reply.done() : reply.status;
                   });
}

CMPIStatus enumInstances(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                         const CMPIObjectPath* path, const char** properties)
{
    return operate(mi, context, "enumInstances", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Ref<> model;
                       if (const CMPIrc rc = make_model(adapter, path, model); rc != CMPI_RC_OK)
                           return rc;
                       if (properties)
                           filter_properties(model.get(), properties, true);
                       else
                           nullify(model.get(), false, true, 1);
                       Reply reply(adapter, context, result, path, properties);
                       enumerate(adapter, model.get(), reply_handler<send_request_instance>, reply, {});
                       return reply.done();
                   });
}

// --- get ----------------------------------------------------------------------------------------------------

/// Keeps the first instance with the model's keys.
struct Key_Search
{
    const Instance* model;
    Ref<> found;
    bool cut_short = false; ///< the provider gave up before it had shown all
};

bool search_by_key(Instance* instance, int status, void* client)
{
    Ref<> candidate(instance);
    auto& search = *static_cast<Key_Search*>(client);
    if (!instance && status == ENUM_INSTANCES_FAILED)
        search.cut_short = true;
    if (!instance || search.found)
        return false;
    if (!key_eq(search.model, instance))
        return true;
    search.found = std::move(candidate);
    return false;
}

/// Asks the provider, and looks through its enumeration where it does not implement the operation.
int get_with_fallback(const CMPI_Adapter& adapter, const Instance* model, Ref<>& instance)
{
    const int answer = adapter.call(OP_GET_INSTANCE, adapter.provider, model, instance.out());
    if (answer != GET_INSTANCE_UNSUPPORTED)
        return answer;
    Key_Search search{model, {}};
    const Selection selection{.keys = model};
    const int enumerated =
        adapter.call(OP_ENUM_INSTANCES, adapter.provider, model, Instance_Handler(search_by_key), &search, &selection);
    if (enumerated == PROVIDER_OK && !search.found && search.cut_short)
        return GET_INSTANCE_FAILED; // what was not shown may have been it
    if (enumerated != PROVIDER_OK || !search.found)
        return GET_INSTANCE_NOT_FOUND;
    instance = std::move(search.found);
    return PROVIDER_OK;
}

CMPIStatus getInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* path, const char** properties)
{
    return operate(mi, context, "getInstance", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       Ref<> model;
                       if (const CMPIrc rc = make_model(adapter, path, model); rc != CMPI_RC_OK)
                           return rc;
                       nullify(model.get(), true, true, 0);
                       if (properties)
                           filter_properties(model.get(), properties, true);

                       Ref<> instance;
                       const CMPIrc rc = cmpi_status_of(get_with_fallback(adapter, model.get(), instance));
                       if (rc != CMPI_RC_OK || !instance)
                           return rc != CMPI_RC_OK ? rc : CMPI_RC_ERR_FAILED;
                       Reply reply(adapter, context, result, path, properties);
                       send_request_instance(reply, instance.get());
                       return reply.done();
                   });
}

// --- changes ------------------------------------------------------------------------------------------------

/// An operation that few classes have, and what the procedures of the others say.
struct Change
{
    Operation operation;
    Provider_Status unsupported;
};
constexpr Change creation = {OP_CREATE_INSTANCE, CREATE_INSTANCE_UNSUPPORTED};
constexpr Change modification = {OP_MODIFY_INSTANCE, MODIFY_INSTANCE_UNSUPPORTED};
constexpr Change deletion = {OP_DELETE_INSTANCE, DELETE_INSTANCE_UNSUPPORTED};

/// Class of the path, if it is one and the provider has the operation. What the client sent is not looked at before:
/// one broker crashes in its own getters when a client put text into a number.
CMPIrc class_to_change(const CMPI_Adapter& adapter, const CMPIObjectPath* path, Change change, const Meta_Class*& mc)
{
    mc = adapter.find_class(path);
    if (!mc)
        return CMPI_RC_ERR_FAILED;
    const int answer = adapter.call(change.operation, adapter.provider);
    return answer == change.unsupported ? cmpi_status_of(answer) : CMPI_RC_OK;
}

CMPIStatus createInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* path, const CMPIInstance* inst)
{
    return operate(mi, context, "createInstance", given(result, path, inst),
                   [&](CMPI_Adapter& adapter)
                   {
                       const Meta_Class* mc = nullptr;
                       if (const CMPIrc rc = class_to_change(adapter, path, creation, mc); rc != CMPI_RC_OK)
                           return rc;
                       Ref<> instance;
                       if (const CMPIrc rc = make_cimple_instance(mc, path, inst, *instance.out()); rc != CMPI_RC_OK)
                           return rc;
                       const int answer = adapter.call(OP_CREATE_INSTANCE, adapter.provider, instance.get());
                       if (const CMPIrc rc = cmpi_status_of(answer); rc != CMPI_RC_OK)
                           return rc;
                       Reply reply(adapter, context, result, path);
                       send_request_path(reply, instance.get());
                       return reply.done();
                   });
}

/// Clients name the instance by its path and may leave the keys out of the properties.
void complete_keys(Instance* instance, const CMPIObjectPath* path)
{
    if (keys_non_null(instance))
        return;
    Ref<> reference;
    if (make_cimple_reference(instance->__meta_class, path, *reference.out()) == CMPI_RC_OK)
        copy(instance, reference.get(), nullptr, true);
}

CMPIStatus modifyInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* path, const CMPIInstance* inst, const char** properties)
{
    return operate(mi, context, "modifyInstance", given(result, path, inst),
                   [&](CMPI_Adapter& adapter)
                   {
                       const Meta_Class* mc = nullptr;
                       if (const CMPIrc rc = class_to_change(adapter, path, modification, mc); rc != CMPI_RC_OK)
                           return rc;
                       Ref<> instance;
                       if (const CMPIrc rc = make_cimple_instance(mc, path, inst, *instance.out()); rc != CMPI_RC_OK)
                           return rc;
                       complete_keys(instance.get(), path);
                       const Ref<> model(clone(instance.get()));
                       filter_properties(model.get(), properties, true);
                       const int answer =
                           adapter.call(OP_MODIFY_INSTANCE, adapter.provider, instance.get(), model.get());
                       const CMPIrc rc = cmpi_status_of(answer);
                       if (rc == CMPI_RC_OK)
                           CMReturnDone(result);
                       return rc;
                   });
}

CMPIStatus deleteInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* path)
{
    return operate(mi, context, "deleteInstance", given(result, path),
                   [&](CMPI_Adapter& adapter)
                   {
                       const Meta_Class* mc = nullptr;
                       if (const CMPIrc rc = class_to_change(adapter, path, deletion, mc); rc != CMPI_RC_OK)
                           return rc;
                       Ref<> instance;
                       if (const CMPIrc rc = make_cimple_reference(mc, path, *instance.out()); rc != CMPI_RC_OK)
                           return rc;
                       const int answer = adapter.call(OP_DELETE_INSTANCE, adapter.provider, instance.get());
                       const CMPIrc rc = cmpi_status_of(answer);
                       if (rc == CMPI_RC_OK)
                           CMReturnDone(result);
                       return rc;
                   });
}

CMPIStatus execQuery(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                     const char*)
{
    return cmpi_status(CMPI_RC_ERR_NOT_SUPPORTED);
}

} // namespace

void fill_instance_functions(CMPIInstanceMIFT& table)
{
    replace_table(table, CMPIInstanceMIFT{
                             .ftVersion = CMPIVersion100,
                             .miVersion = CMPIVersion100,
                             .miName = nullptr,
                             .cleanup = cleanup<CMPIInstanceMI>,
                             .enumerateInstanceNames = enumInstanceNames,
                             .enumerateInstances = enumInstances,
                             .getInstance = getInstance,
                             .createInstance = createInstance,
                             .modifyInstance = modifyInstance,
                             .deleteInstance = deleteInstance,
                             .execQuery = execQuery,
                         });
}

} // namespace cimple
