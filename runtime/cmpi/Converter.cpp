#include "runtime/cmpi/Converter.h"

#include "runtime/cmpi/CmpiContainers.h"
#include "runtime/log/RuntimeLog.h"
#include "runtime/meta/InstanceSlots.h"

#include <vector>

namespace cimple
{

namespace
{

/// Names of the keys, ended by a null pointer.
std::vector<const char*> key_names(const Meta_Record* mc)
{
    std::vector<const char*> names;
    for_each_key(mc, [&](const Meta_Feature* mf) { names.push_back(mf->name); });
    names.push_back(nullptr);
    return names;
}

void set_name_space_of(Instance* instance, const CMPIObjectPath* path)
{
    String name_space;
    if (text_of(CMGetNameSpace(path, nullptr), name_space))
        set_name_space(instance, name_space.c_str(), false);
}

/// Reads a container into a new instance in the namespace of `path`.
CMPIrc read(Container& container, const Meta_Record* mc, std::uint32_t mask, const CMPIObjectPath* path,
            Instance*& instance)
{
    Ref<> made;
    instance = nullptr;
    if (container.convert(mc, mask, *made.out()) != 0)
        return CMPI_RC_ERR_FAILED;
    set_name_space_of(made.get(), path);
    instance = made.release();
    return CMPI_RC_OK;
}

} // namespace

CMPIrc make_cmpi_object_path(const CMPIBroker* broker, const Instance* instance, const char* name_space,
                             CMPIObjectPath*& path)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    path = CMNewObjectPath(broker, name_space, instance->__meta_class->name, &status);
    if (!path || status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMNewObjectPath() failed");
        return CMPI_RC_ERR_FAILED;
    }
    CMPIObjectPath_Container container(broker, nullptr, name_space, path);
    if (container.convert(instance, META_KEY) != 0)
    {
        RUNTIME_LOG(LOG_WARN, "Container::convert() failed");
        return CMPI_RC_ERR_FAILED;
    }
    return CMPI_RC_OK;
}

CMPIrc make_cmpi_instance(const CMPIBroker* broker, const Instance* instance, const char* name_space,
                          CMPIObjectPath* path, const char** properties, CMPIInstance*& inst)
{
    if (!path)
    {
        RUNTIME_LOG(LOG_WARN, "No ObjectPath built before call to make_CMPI_instance");
        if (make_cmpi_object_path(broker, instance, name_space, path) != CMPI_RC_OK)
            return CMPI_RC_ERR_FAILED;
    }
    // A broker keeps the pointers of a filter and looks at them with each property that is set.
    const std::vector<const char*> keys = properties ? key_names(instance->__meta_class) : std::vector<const char*>();
    CMPIStatus status{CMPI_RC_OK, nullptr};
    inst = CMNewInstance(broker, path, &status);
    if (!inst || status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMNewInstance() failed");
        return CMPI_RC_ERR_FAILED;
    }
    if (properties)
    {
        // With the key names the keys stay in the instance, hidden where the list does not name them; a broker
        // takes the path of the result from there.
        status = CMSetPropertyFilter(inst, properties, const_cast<const char**>(keys.data()));
        if (status.rc != CMPI_RC_OK)
            return status.rc;
    }
    CMPIInstance_Container container(broker, nullptr, name_space, inst);
    if (container.convert(instance, 0) != 0)
    {
        RUNTIME_LOG(LOG_WARN, "Container::convert() failed");
        return CMPI_RC_ERR_FAILED;
    }
    return CMPI_RC_OK;
}

CMPIrc make_cimple_reference(const Meta_Class* mc, const CMPIObjectPath* path, Instance*& instance)
{
    CMPIObjectPath_Container container(nullptr, mc->meta_repository, nullptr, const_cast<CMPIObjectPath*>(path));
    return read(container, mc, META_KEY, path, instance);
}

CMPIrc make_cimple_instance(const Meta_Class* mc, const CMPIObjectPath* path, const CMPIInstance* inst,
                            Instance*& instance)
{
    CMPIInstance_Container container(nullptr, mc->meta_repository, nullptr, const_cast<CMPIInstance*>(inst));
    return read(container, mc, 0, path, instance);
}

CMPIrc make_cimple_method(const Meta_Class* mc, const Meta_Method* method, const CMPIObjectPath* path,
                          const CMPIArgs* in, Instance*& record)
{
    CMPIArgs_Container container(nullptr, mc->meta_repository, nullptr, const_cast<CMPIArgs*>(in));
    return read(container, method, META_IN, path, record);
}

CMPIrc make_cmpi_method(const CMPIBroker* broker, const Instance* record, const char* name_space, CMPIArgs* out,
                        CMPIData& return_data)
{
    CMPIArgs_Container container(broker, nullptr, name_space, out);
    if (container.convert(record, META_OUT) != 0)
        return CMPI_RC_ERR_FAILED;
    return_data = container.return_data();
    if (return_data.type == CMPI_null)
    {
        const Meta_Feature* mf = find_feature(record->__meta_class, "return_value", property_or_reference);
        return_data.type = mf ? cmpi_type_of(Value::type_of(mf), mf->flags) : CMPI_uint32;
        return_data.state = CMPI_nullValue;
    }
    return CMPI_RC_OK;
}

} // namespace cimple
