// The narrow interface between the runtime and a class provider: one procedure and its registration record.
#pragma once

#include "runtime/meta/Instance.h"

namespace cimple
{

struct Registration;

/// What a provider procedure is asked to do. The number fixes the arguments (see Provider_Proc).
enum Operation : int
{
    OP_GET_META_CLASS = 0,
    OP_CREATE_PROVIDER = 1,
    OP_DESTROY_PROVIDER = 2,
    OP_LOAD = 3,
    OP_UNLOAD = 4,
    OP_GET_INSTANCE = 5,
    OP_ENUM_INSTANCES = 6,
    OP_CREATE_INSTANCE = 7,
    OP_DELETE_INSTANCE = 8,
    OP_MODIFY_INSTANCE = 9,
    OP_INVOKE_METHOD = 10,
    OP_ENABLE_INDICATIONS = 11,
    OP_DISABLE_INDICATIONS = 12,
    OP_GET_REPOSITORY = 13,
    OP_ASSOCIATORS = 14,
    OP_REFERENCES = 15,
    OP_ASSOCIATORS_WITH_PROPERTIES = 16,
};

/// One numbering for all provider results: the tens say which operation answered.
enum Provider_Status : int
{
    PROVIDER_OK = 0,
    LOAD_FAILED = 30,
    GET_INSTANCE_NOT_FOUND = 60,
    GET_INSTANCE_UNSUPPORTED = 61,
    GET_INSTANCE_INVALID_PARAMETER = 62,
    GET_INSTANCE_ACCESS_DENIED = 63,
    GET_INSTANCE_FAILED = 64,
    ENUM_INSTANCES_FAILED = 70,
    ENUM_INSTANCES_ACCESS_DENIED = 71,
    CREATE_INSTANCE_DUPLICATE = 80,
    CREATE_INSTANCE_UNSUPPORTED = 81,
    CREATE_INSTANCE_INVALID_PARAMETER = 82,
    CREATE_INSTANCE_ACCESS_DENIED = 83,
    CREATE_INSTANCE_FAILED = 84,
    DELETE_INSTANCE_NOT_FOUND = 90,
    DELETE_INSTANCE_UNSUPPORTED = 91,
    DELETE_INSTANCE_ACCESS_DENIED = 92,
    DELETE_INSTANCE_FAILED = 93,
    MODIFY_INSTANCE_NOT_FOUND = 100,
    MODIFY_INSTANCE_UNSUPPORTED = 101,
    MODIFY_INSTANCE_INVALID_PARAMETER = 102,
    MODIFY_INSTANCE_ACCESS_DENIED = 103,
    MODIFY_INSTANCE_FAILED = 104,
    ASSOCIATORS_FAILED = 110,
    ASSOCIATORS_UNSUPPORTED = 111,
    ASSOCIATORS_ACCESS_DENIED = 112,
    REFERENCES_FAILED = 120,
    REFERENCES_UNSUPPORTED = 121,
    REFERENCES_ACCESS_DENIED = 122,
    INVOKE_METHOD_FAILED = 130,
    INVOKE_METHOD_UNSUPPORTED = 131,
    INVOKE_METHOD_ACCESS_DENIED = 132,
    ENABLE_INDICATIONS_FAILED = 140,
    DISABLE_INDICATIONS_FAILED = 150,
    ASSOCIATORS_PROPERTIES_FAILED = 170,
    ASSOCIATORS_PROPERTIES_UNSUPPORTED = 171,
    ASSOCIATORS_PROPERTIES_ACCESS_DENIED = 172,
    NO_SUCH_OPERATION = -1,
};

/// Receives an instance, which it owns from then on, and returns true to go on. It never throws. An enumeration ends
/// with a call of a null instance and the final status. One that answers with what it has, because it could not show
/// the rest, says so before by a call of a null instance and ENUM_INSTANCES_FAILED: a short list is a success, but an
/// instance that is not in it is not known to be missing.
using Instance_Handler = bool (*)(Instance* instance, int status, void* client);

/// What the asker of an enumeration looks at. It says so for the sake of speed alone: a provider may pass over it and
/// show all.
struct Selection
{
    const Instance* keys = nullptr; ///< only the first instance with these keys
    const Instance* end = nullptr;  ///< only associations that refer to the instance with these keys
    bool names = false;             ///< only the keys of what is shown
};

/// Receives an indication, which it owns; null ends the delivery. Returns true for an instance.
using Indication_Proc = bool (*)(Instance* indication, void* client);

/// The arguments by operation (pointers; function pointers travel as void*):
///   get meta class       const Meta_Class** out
///   create provider      void** out              destroy, load, unload   void* provider
///   get instance         provider, const Instance* model, Instance** out
///   enum instances       provider, const Instance* model, Instance_Handler, void* client,
///                        const Selection* (null: all)
///   create, delete       provider, Instance*
///   modify               provider, const Instance* instance, const Instance* model
///   invoke method        provider, const Instance* reference, Instance* method record
///   enable indications   provider, Indication_Proc, void* client      disable   provider
///   get repository       const Meta_Repository** out
///   associators (both)   provider, const Instance*, const char* assoc class, const char* result class,
///                        const char* role, const char* result role, Instance_Handler, void* client
///   references           provider, const Instance* instance, const Instance* model, const char* role,
///                        Instance_Handler, void* client
/// Create, delete and modify with null for the instance ask whether the class has the operation: the answer is
/// "unsupported" or any other number (a body says invalid parameter or failed), and nothing is done.
using Provider_Proc = int (*)(const Registration* registration, int operation, void* arg0, void* arg1, void* arg2,
                              void* arg3, void* arg4, void* arg5, void* arg6, void* arg7);

/// One per class provider, linked in the order of the class catalog; `cimple_module` returns the last one.
struct Registration
{
    const char* module_name;
    const char* provider_name;
    Provider_Proc proc;
    const Meta_Class* meta_class;
    const Registration* next; ///< the record linked before this one; null at the first
};

} // namespace cimple
