// Extrinsic methods.
#include "runtime/adapter/CMPI_AdapterFrame.h"

#include "runtime/cmpi/Converter.h"

namespace cimple
{

namespace
{

/// Copies `Out` parameters into `out` and returns the return value.
///
/// The return value is sent even when it is null, as a null pointer with the method's return type: one server
/// drops the connection of a method that succeeds without data, and both take a null of the proper type.
CMPIrc return_results(const CMPI_Adapter& adapter, const Instance* record, const char* name_space,
                      const CMPIResult* result, CMPIArgs* out)
{
    CMPIData data = {};
    if (const CMPIrc rc = make_cmpi_method(adapter.broker, record, name_space, out, data); rc != CMPI_RC_OK)
        return rc;
    const CMPIrc rc = CMReturnData(result, value_pointer(data), data.type).rc;
    CMReturnDone(result);
    return rc;
}

CMPIrc invoke(const CMPI_Adapter& adapter, const CMPIResult* result, const CMPIObjectPath* path, const char* name,
              const CMPIArgs* in, CMPIArgs* out)
{
    const Meta_Class* mc = adapter.find_class(path);
    if (!mc)
    {
        RUNTIME_LOG(LOG_WARN, "MetaClass not found");
        return CMPI_RC_ERR_FAILED;
    }
    const Meta_Method* method = as_method(find_feature(mc, name, META_METHOD));
    if (!method)
    {
        RUNTIME_LOG(LOG_WARN, "%s", name);
        return CMPI_RC_ERR_METHOD_NOT_FOUND;
    }
    if (eqi(name, mc->name))
        return CMPI_RC_ERR_INVALID_CLASS;

    Ref<> reference;
    if (const CMPIrc rc = make_cimple_reference(mc, path, *reference.out()); rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CIMPLE reference creation failed");
        return rc;
    }
    Ref<> record;
    if (const CMPIrc rc = make_cimple_method(mc, method, path, in, *record.out()); rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CIMPLE make_cimple_method function failed");
        return rc;
    }

    // Whatever is no failure of a method is a success: a class without methods gives a null return value.
    const int answer = adapter.call(OP_INVOKE_METHOD, adapter.provider, reference.get(), record.get());
    if (answer >= INVOKE_METHOD_FAILED && answer <= INVOKE_METHOD_ACCESS_DENIED)
        return cmpi_status_of(answer);
    return return_results(adapter, record.get(), record->__name_space.c_str(), result, out);
}

CMPIStatus invokeMethod(CMPIMethodMI* mi, const CMPIContext* context, const CMPIResult* result,
                        const CMPIObjectPath* path, const char* method, const CMPIArgs* in, CMPIArgs* out)
{
    return operate(mi, context, "invokeMethod", given(result, path, method, in, out),
                   [&](CMPI_Adapter& adapter) { return invoke(adapter, result, path, method, in, out); });
}

} // namespace

void fill_method_functions(CMPIMethodMIFT& table)
{
    replace_table(table, CMPIMethodMIFT{
                             .ftVersion = CMPIVersion100,
                             .miVersion = CMPIVersion100,
                             .miName = nullptr,
                             .cleanup = cleanup<CMPIMethodMI>,
                             .invokeMethod = invokeMethod,
                         });
}

} // namespace cimple
