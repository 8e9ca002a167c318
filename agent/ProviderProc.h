// The provider procedure of every class: one template over its provider.
#pragma once

#include "agent/Namespaces.h"
#include "agent/ProviderExtension.h"
#include "runtime/adapter/Provider.h"

namespace cimple
{

/// Unknown names give -1, methods of the schema without a body 131.
template <class Provider> int invokeMethod(const Instance* reference, Instance* record)
{
    const char* name = record->__meta_class->name;
    if constexpr (HasMethods<Provider>)
    {
        for (const MethodRow& row : Provider::methods())
            if (eqi(row.method->name, name)) // one of a superclass has slots of its own
                return static_cast<const void*>(row.method) == record->__meta_class ? row.call(reference, record)
                                                                                    : INVOKE_METHOD_FAILED;
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
int providerProc(const Registration*, int operation, void* arg0, void* arg1, void* arg2, void* arg3, void* arg4, void*,
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
        const auto* selection = static_cast<const Selection*>(arg4);
        const int status = provider->enum_instances(static_cast<const Instance*>(arg1), handler, arg3,
                                                    selection ? *selection : Selection());
        handler(nullptr, status, arg3);
        return status;
    }
    case OP_CREATE_INSTANCE:
        if constexpr (HasCreateInstance<Provider>)
            return arg1 ? changeOutcome(CREATE_INSTANCE_FAILED,
                                        [&] { return provider->create_instance(static_cast<Instance*>(arg1)); })
                        : CREATE_INSTANCE_INVALID_PARAMETER;
        return CREATE_INSTANCE_UNSUPPORTED;
    case OP_DELETE_INSTANCE:
        if constexpr (HasDeleteInstance<Provider>)
            return arg1 ? changeOutcome(DELETE_INSTANCE_FAILED,
                                        [&] { return provider->delete_instance(static_cast<const Instance*>(arg1)); })
                        : DELETE_INSTANCE_FAILED;
        return DELETE_INSTANCE_UNSUPPORTED;
    case OP_MODIFY_INSTANCE:
        if constexpr (HasModifyInstance<Provider>)
            return arg1 ? changeOutcome(MODIFY_INSTANCE_FAILED,
                                        [&] {
                                            return provider->modify_instance(static_cast<const Instance*>(arg1),
                                                                             static_cast<const Instance*>(arg2));
                                        })
                        : MODIFY_INSTANCE_INVALID_PARAMETER;
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
