// Whole objects: instances, references and method records to the broker's objects and back.
//
// A feature that cannot be converted is logged and left out; the object is made without it. All functions return
// CMPI_RC_OK, or CMPI_RC_ERR_FAILED where nothing else is said. Instances are returned with a count for the caller.
// Broker objects belong to the broker.
#pragma once

#include "runtime/cmpi/Cmpi.h"
#include "runtime/meta/Instance.h"

namespace cimple
{

/// Class name, namespace and keys.
CMPIrc make_cmpi_object_path(const CMPIBroker* broker, const Instance* instance, const char* name_space,
                             CMPIObjectPath*& path);

/// All non-null features, cut down to `properties` (null: all) by the broker. A null path is made. Returns the
/// status of the broker's filter if that fails.
CMPIrc make_cmpi_instance(const CMPIBroker* broker, const Instance* instance, const char* name_space,
                          CMPIObjectPath* path, const char** properties, CMPIInstance*& inst);

/// A key instance; what has no key in the path is null.
CMPIrc make_cimple_reference(const Meta_Class* mc, const CMPIObjectPath* path, Instance*& instance);

/// All properties of `inst`, in the namespace of `path`.
CMPIrc make_cimple_instance(const Meta_Class* mc, const CMPIObjectPath* path, const CMPIInstance* inst,
                            Instance*& instance);

/// The parameter record of a method with its `In` parameters. `mc` gives the repository.
CMPIrc make_cimple_method(const Meta_Class* mc, const Meta_Method* method, const CMPIObjectPath* path,
                          const CMPIArgs* in, Instance*& record);

/// `Out` parameters of a record into `out`; the return value and its type, which are null data of the method's
/// return type when the record's return value is null.
CMPIrc make_cmpi_method(const CMPIBroker* broker, const Instance* record, const char* name_space, CMPIArgs* out,
                        CMPIData& return_data);

} // namespace cimple
