#include "runtime/meta/Container.h"

#include "runtime/log/RuntimeLog.h"
#include "runtime/meta/InstanceSlots.h"

namespace cimple
{

namespace
{

bool selected(const Meta_Feature* mf, std::uint32_t mask)
{
    return mask == 0 || (mf->flags & mask) != 0;
}

/// Every property and reference array; a single reference that is not set is null of itself.
void nullify_all(Instance* instance)
{
    nullify(instance, true, true, 1);
    for (const Meta_Feature* mf : features_of(instance))
        if (slot_kind(mf) == Slot_Kind::reference_array)
            null_byte(instance, as_reference(mf)) = 1;
}

const char* class_name_of(const Value& value)
{
    Ref<> instance;
    if (value.get(instance) != 0 && value.instances() && !value.instances()->empty())
        instance = value.instances()->front();
    return instance ? instance->__meta_class->name : "";
}

void log_failure(Assign_Result result, const Meta_Record* mc, const Meta_Feature* mf, const Value& value)
{
    switch (result)
    {
    case Assign_Result::ok:
        break;
    case Assign_Result::type_mismatch:
        RUNTIME_LOG(LOG_WARN, "type mismatch: %s.%s", mc->name, mf->name);
        break;
    case Assign_Result::null_instance:
        RUNTIME_LOG(LOG_WARN, "null instance argument");
        break;
    case Assign_Result::wrong_class:
        RUNTIME_LOG(LOG_WARN, "failed to assign instance of %s to %s.%s", class_name_of(value), mc->name, mf->name);
        break;
    }
}

} // namespace

int Container::convert(const Instance* instance, std::uint32_t mask)
{
    if (!instance)
    {
        RUNTIME_LOG(LOG_WARN, "ignored null instance arg");
        return -1;
    }

    const Meta_Record* mc = instance->__meta_class;
    const auto pass = [&](const Meta_Feature* mf)
    {
        if (!selected(mf, mask) || (mf->flags & META_METHOD) || is_null(instance, mf))
            return;
        Value value;
        if (read_feature(instance, mf, value) != 0)
            RUNTIME_LOG(LOG_WARN, "unexpected failure: %s.%s", mc->name, mf->name);
        else if (set_value(mf->name, value, mf->flags) != 0)
            RUNTIME_LOG(LOG_WARN, "conversion error: %s.%s", mc->name, mf->name);
    };
    if (mask == META_KEY)
        for_each_key(mc, pass); // object paths: few of the features
    else
        for (const Meta_Feature* mf : features_of(mc))
            pass(mf);
    return 0;
}

int Container::convert(const Meta_Record* mc, std::uint32_t mask, Instance*& instance)
{
    Ref<> made(instance ? nullptr : create(mc));
    Instance* const target = instance ? instance : made.get();
    nullify_all(target);
    const std::size_t size = get_size();
    for (std::size_t i = 0; i < size; ++i)
        set_entry(i, mc, mask, target);
    if (made)
        instance = made.release();
    return 0;
}

void Container::set_entry(std::size_t index, const Meta_Record* mc, std::uint32_t mask, Instance* instance)
{
    String name;
    if (get_name(index, name) != 0)
        return RUNTIME_LOG(LOG_WARN, "get_name() failed: class=%s, index=%u", mc->name, static_cast<unsigned>(index));
    const Meta_Feature* mf = find_feature(mc, name.c_str(), property_or_reference);
    if (!mf)
        return RUNTIME_LOG(LOG_WARN, "unknown feature: %s.%s", mc->name, name.c_str());
    if (!selected(mf, mask))
        return;
    const Value::Type type = Value::type_of(mf);
    if (type == Value::NONE)
        return RUNTIME_LOG(LOG_WARN, "unexpected error: %s.%s", mc->name, mf->name);
    Value value;
    if (get_value(index, type, value) != 0)
        return RUNTIME_LOG(LOG_WARN, "conversion error: %s.%s", mc->name, mf->name);
    log_failure(assign(instance, mf, value), mc, mf, value);
}

} // namespace cimple
