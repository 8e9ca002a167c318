#include "tests/unit/cmpi/FakeProvider.h"

namespace cimple::fake
{

namespace
{

/// The provider behind a registration, for which the procedure gets no other argument.
std::vector<Provider*>& providers()
{
    static std::vector<Provider*> list;
    return list;
}

Provider& provider_of(const Registration* registration)
{
    for (Provider* provider : providers())
    {
        if (&provider->registration == registration)
            return *provider;
    }
    std::abort();
}

} // namespace

Provider::Provider(const Meta_Class& meta_class)
    : asked{}, answers{}, registration{"module", "T_Provider", proc, &meta_class, nullptr}
{
    answers[OP_GET_INSTANCE] = GET_INSTANCE_UNSUPPORTED;
    answers[OP_CREATE_INSTANCE] = CREATE_INSTANCE_UNSUPPORTED;
    answers[OP_DELETE_INSTANCE] = DELETE_INSTANCE_UNSUPPORTED;
    answers[OP_MODIFY_INSTANCE] = MODIFY_INSTANCE_UNSUPPORTED;
    answers[OP_ASSOCIATORS] = ASSOCIATORS_UNSUPPORTED;
    answers[OP_REFERENCES] = REFERENCES_UNSUPPORTED;
    answers[OP_ASSOCIATORS_WITH_PROPERTIES] = ASSOCIATORS_PROPERTIES_UNSUPPORTED;
    providers().push_back(this);
}

Provider::~Provider()
{
    std::erase(providers(), this);
}

int Provider::enumerate(const Instance* with_model, Instance_Handler handler, void* client)
{
    model.reset(clone(with_model));
    for (const Ref<>& instance : instances)
    {
        if (!handler(clone(instance.get()), PROVIDER_OK, client))
            break;
    }
    if (cut_short)
        handler(nullptr, ENUM_INSTANCES_FAILED, client);
    handler(nullptr, answers[OP_ENUM_INSTANCES], client);
    return answers[OP_ENUM_INSTANCES];
}

int Provider::proc(const Registration* registration, int operation, void* arg0, void* arg1, void* arg2, void* arg3,
                   void* arg4, void*, void* arg6, void* arg7)
{
    Provider& self = provider_of(registration);
    ++self.asked[static_cast<std::size_t>(operation)];
    switch (operation)
    {
    case OP_GET_META_CLASS:
        *static_cast<const Meta_Class**>(arg0) = registration->meta_class;
        break;
    case OP_GET_REPOSITORY:
        *static_cast<const Meta_Repository**>(arg0) = &test_repository;
        break;
    case OP_CREATE_PROVIDER:
        *static_cast<void**>(arg0) = &self;
        break;
    case OP_LOAD:
        self.on_load();
        break;
    case OP_ENUM_INSTANCES:
        return self.enumerate(static_cast<const Instance*>(arg1), reinterpret_cast<Instance_Handler>(arg2), arg3);
    case OP_MODIFY_INSTANCE:
        self.model.reset(clone(static_cast<const Instance*>(arg2)));
        [[fallthrough]];
    case OP_CREATE_INSTANCE:
    case OP_DELETE_INSTANCE:
        self.received.reset(clone(static_cast<const Instance*>(arg1)));
        break;
    case OP_INVOKE_METHOD:
        self.received.reset(clone(static_cast<const Instance*>(arg1)));
        self.method(static_cast<Instance*>(arg2));
        break;
    case OP_ASSOCIATORS_WITH_PROPERTIES:
        self.seen_role = arg4 ? static_cast<const char*>(arg4) : "";
        if (self.on_associators)
            self.on_associators(reinterpret_cast<Instance_Handler>(arg6), arg7);
        break;
    default:
        break;
    }
    return self.answers[static_cast<std::size_t>(operation)];
}

} // namespace cimple::fake
