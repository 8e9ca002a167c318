// The provider procedure of every class: one template over its provider.
#pragma once

#include "agent/ProviderExtension.h"
#include "runtime/Provider.h"

namespace cimple
{

/// Namespaces in which the module's classes are served and its profiles registered.
inline constexpr const char* providerNamespace = "root/tavrin";
inline constexpr const char* interopNamespace = "root/pg_interop";
/// Where the schema of the classes was taken from, and the platform classes that the module asks the broker for.
inline constexpr const char* schemaDirectory = "/tmp/tvr_ibm/schema/cim_schema_2.26.0Experimental-MOFs";
inline constexpr const char* platformClasses = "IBMSD_ComputerSystem IBMSD_Chassis PG_RegisteredProfile";

/// Unknown names give -1, methods of the schema without a body 131.
template <class Provider> int invokeMethod(const Instance* reference, Instance* record)
{
    const char* name = record->__meta_class->name;
    if constexpr (HasMethods<Provider>)
    {
        for (const MethodRow& row : Provider::methods())
            if (eqi(row.name, name))
                return row.call(reference, record);
    }
    const bool known = find_feature(&Provider::Record::static_meta_class, name, META_METHOD) != nullptr;
    return known ? INVOKE_METHOD_UNSUPPORTED : NO_SUCH_OPERATION;
}

/// Association operations have no body in any class: the adapter enumerates and filters.
template <class Provider> int associationAnswer(int unsupported)
{
    return Provider::Record::static_meta_class.flags & META_ASSOCIATION ? unsupported : NO_SUCH_OPERATION;
}

template <class Provider>
int providerProc(const Registration*, int operation, void* arg0, void* arg1, void* arg2, void* arg3, void*, void*,
                 void*, void*)
{
    auto* provider = static_cast<Provider*>(arg0);
    switch (operation)
    {
    case OP_GET_META_CLASS:
        *static_cast<const Meta_Class**>(arg0) = &Provider::Record::static_meta_class;
        return 0;
    case OP_GET_REPOSITORY:
        *static_cast<const Meta_Repository**>(arg0) = Provider::Record::static_meta_class.meta_repository;
        return 0;
    case OP_CREATE_PROVIDER:
        *static_cast<void**>(arg0) = new Provider;
        return 0;
    case OP_DESTROY_PROVIDER:
        delete provider;
        return 0;
    case OP_LOAD:
        return provider->load();
    case OP_UNLOAD:
        return provider->unload();
    case OP_GET_INSTANCE:
        return GET_INSTANCE_UNSUPPORTED;
    case OP_ENUM_INSTANCES:
    {
        auto handler = reinterpret_cast<Instance_Handler>(arg2);
        const int status = provider->enum_instances(static_cast<const Instance*>(arg1), handler, arg3);
        handler(nullptr, status, arg3);
        return status;
    }
    case OP_CREATE_INSTANCE:
        return CREATE_INSTANCE_UNSUPPORTED;
    case OP_DELETE_INSTANCE:
        return DELETE_INSTANCE_UNSUPPORTED;
    case OP_MODIFY_INSTANCE:
        if constexpr (HasModifyInstance<Provider>)
            return provider->modify_instance(static_cast<const Instance*>(arg1), static_cast<const Instance*>(arg2));
        return MODIFY_INSTANCE_UNSUPPORTED;
    case OP_INVOKE_METHOD:
        return invokeMethod<Provider>(static_cast<const Instance*>(arg1), static_cast<Instance*>(arg2));
    case OP_ASSOCIATORS:
        return associationAnswer<Provider>(ASSOCIATORS_UNSUPPORTED);
    case OP_REFERENCES:
        return associationAnswer<Provider>(REFERENCES_UNSUPPORTED);
    case OP_ASSOCIATORS_WITH_PROPERTIES:
        return associationAnswer<Provider>(ASSOCIATORS_PROPERTIES_UNSUPPORTED);
    default:
        return NO_SUCH_OPERATION;
    }
}

} // namespace cimple
