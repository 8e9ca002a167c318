#include "runtime/meta/Value.h"

#include "runtime/meta/InstanceSlots.h"

#include <array>
#include <utility>

namespace cimple
{

namespace
{

void print_element(std::FILE* out, bool value)
{
    std::fputs(value ? "true" : "false", out);
}
void print_element(std::FILE* out, const String& value)
{
    std::fprintf(out, "\"%s\"", value.c_str());
}
void print_element(std::FILE* out, const Datetime& value)
{
    std::fputs(value.text().c_str(), out);
}
template <class Number> void print_element(std::FILE* out, Number value)
{
    if constexpr (std::is_floating_point_v<Number>)
        std::fprintf(out, "%.16g", static_cast<double>(value));
    else if constexpr (std::is_signed_v<Number>)
        std::fprintf(out, "%lld", static_cast<long long>(value));
    else
        std::fprintf(out, "%llu", static_cast<unsigned long long>(value));
}

void print_element(std::FILE* out, const Instance* value)
{
    std::fputs(value ? value->__meta_class->name : "null", out);
}

void print_elements(std::FILE* out, Value::Type element_type, const void* elements, std::size_t count)
{
    const auto print_all = [&]<class T>(std::type_identity<T>)
    {
        const T* element = static_cast<const T*>(elements);
        for (std::size_t i = 0; i < count; ++i)
        {
            std::fputs(i ? ", " : "", out);
            print_element(out, element[i]);
        }
        return true;
    };
    with_type(static_cast<std::uint32_t>(element_type), false, print_all);
}

} // namespace

Value Value::null_of(Type type)
{
    Value value;
    value._type = type;
    value._null = true;
    if (type == INSTANCE_ARRAY)
        value._content = Instances();
    else if (type == INSTANCE)
        value._content = Ref<>();
    else if (is_array(type))
        value._content = Array_Base(array_traits(static_cast<std::uint32_t>(type - array_bit)));
    else if (type == STRING)
        value._content = String();
    else if (type == DATETIME)
        value._content = Datetime();
    return value;
}

void Value::set_scalar(Type type, const void* bytes)
{
    _type = type;
    _null = false;
    if (type == STRING)
        _content = *static_cast<const String*>(bytes);
    else if (type == DATETIME)
        _content = *static_cast<const Datetime*>(bytes);
    else
    {
        Bytes value = {};
        std::memcpy(value.data, bytes, type_width(static_cast<std::uint32_t>(type)));
        _content = value;
    }
}

void Value::set_array(Type type, Array_Base array)
{
    _type = type;
    _null = false;
    _content = std::move(array);
}

void Value::set_instance(Ref<> instance)
{
    _type = INSTANCE;
    _null = false;
    _content = std::move(instance);
}

void Value::set_instances(Instances instances)
{
    _type = INSTANCE_ARRAY;
    _null = false;
    _content = std::move(instances);
}

int Value::get(Ref<>& instance) const
{
    const Ref<>* content = std::get_if<Ref<>>(&_content);
    if (_type != INSTANCE || !content)
        return -1;
    instance = *content;
    return 0;
}

int Value::get(Instances& instances) const
{
    const Instances* content = std::get_if<Instances>(&_content);
    if (_type != INSTANCE_ARRAY || !content)
        return -1;
    instances = *content;
    return 0;
}

const void* Value::scalar() const
{
    if (!is_scalar(_type))
        return nullptr;
    if (_type == STRING)
        return std::get_if<String>(&_content);
    if (_type == DATETIME)
        return std::get_if<Datetime>(&_content);
    const Bytes* bytes = std::get_if<Bytes>(&_content);
    return bytes ? bytes->data : nullptr;
}

const char* Value::type_name(Type type)
{
    static constexpr const char* names[] = {
        "BOOLEAN", "UINT8",  "SINT8",  "UINT16", "SINT16", "UINT32",   "SINT32",   "UINT64",
        "SINT64",  "REAL32", "REAL64", "CHAR16", "STRING", "DATETIME", "INSTANCE",
    };
    static constexpr const char* array_names[] = {
        "BOOLEAN_ARRAY", "UINT8_ARRAY",  "SINT8_ARRAY",  "UINT16_ARRAY",   "SINT16_ARRAY",
        "UINT32_ARRAY",  "SINT32_ARRAY", "UINT64_ARRAY", "SINT64_ARRAY",   "REAL32_ARRAY",
        "REAL64_ARRAY",  "CHAR16_ARRAY", "STRING_ARRAY", "DATETIME_ARRAY", "INSTANCE_ARRAY",
    };
    if (type >= BOOLEAN && type <= INSTANCE)
        return names[type];
    if (type >= BOOLEAN_ARRAY && type <= INSTANCE_ARRAY)
        return array_names[type - array_bit];
    return "none";
}

Value::Type Value::type_of(const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
        return static_cast<Type>(static_cast<const Meta_Property*>(mf)->type);
    case Slot_Kind::array:
        return static_cast<Type>(static_cast<const Meta_Property*>(mf)->type + array_bit);
    case Slot_Kind::reference:
        return INSTANCE;
    case Slot_Kind::reference_array:
        return INSTANCE_ARRAY;
    case Slot_Kind::none:
        break;
    }
    return NONE;
}

void Value::print(std::FILE* out) const
{
    std::fprintf(out, "Value\n");
    std::fprintf(out, "{\n");
    std::fprintf(out, "    type=%s\n", type_name(_type));
    std::fprintf(out, "    null=%s\n", _null ? "true" : "false");
    std::fprintf(out, "    value=");
    if (const void* bytes = scalar())
        print_elements(out, _type, bytes, 1);
    else if (const Array_Base* elements = array())
        print_elements(out, static_cast<Type>(_type - array_bit), elements->data(), elements->size());
    else if (const Ref<>* instance = std::get_if<Ref<>>(&_content))
        print_element(out, static_cast<const Instance*>(instance->get()));
    else if (const Instances* list = instances())
        std::fprintf(out, "%zu instances", list->size());
    std::fprintf(out, "\n");
    std::fprintf(out, "}\n");
}

namespace
{

/// A counted reference for a Value; counts are not part of an instance's value.
Ref<> share(const Instance* instance)
{
    return Ref<>(const_cast<Instance*>(ref(instance)));
}

Value::Instances share_all(std::span<Instance* const> references)
{
    Value::Instances instances;
    instances.reserve(references.size());
    for (const Instance* reference : references)
        instances.push_back(share(reference));
    return instances;
}

void store_scalar(Instance* instance, const Meta_Property* mp, const Value& value)
{
    const auto store = [&]<class T>(std::type_identity<T>)
    { return slot<T>(instance, mp->offset) = *static_cast<const T*>(value.scalar()), true; };
    with_type(mp->type, false, store);
}

bool accepts(const Meta_Reference* mr, const Instance* instance)
{
    return !instance || is_subclass(mr->meta_class, instance->__meta_class);
}

Assign_Result store_reference(Instance* instance, const Meta_Reference* mr, const Value& value)
{
    Ref<> target;
    value.get(target);
    if (!target && !value.null())
        return Assign_Result::null_instance;
    if (!accepts(mr, target.get()))
        return Assign_Result::wrong_class;
    Instance*& place = reference_slot(instance, mr);
    unref(std::exchange(place, target.release()));
    return Assign_Result::ok;
}

Assign_Result store_references(Instance* instance, const Meta_Reference* mr, const Value& value)
{
    Value::Instances targets;
    value.get(targets);
    for (const Ref<>& target : targets)
        if (!accepts(mr, target.get()))
            return Assign_Result::wrong_class;
    Reference_List elements;
    elements.reserve(targets.size());
    for (Ref<>& target : targets)
        elements.append(std::move(target));
    elements.swap(array_slot(instance, mr->offset));
    null_byte(instance, mr) = value.null();
    return Assign_Result::ok;
}

} // namespace

int read_feature(const Instance* instance, const Meta_Feature* mf, Value& value)
{
    const Value::Type type = Value::type_of(mf);
    const auto* mp = as_property(mf);
    const auto* mr = as_reference(mf);
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
        value.set_scalar(type, &slot<char>(instance, mp->offset));
        value.set_null(null_byte(instance, mp) != 0);
        return 0;
    case Slot_Kind::array:
        value.set_array(type, array_slot(instance, mp->offset));
        value.set_null(null_byte(instance, mp) != 0);
        return 0;
    case Slot_Kind::reference:
        value.set_instance(share(reference_slot(instance, mr)));
        value.set_null(reference_slot(instance, mr) == nullptr);
        return 0;
    case Slot_Kind::reference_array:
        value.set_instances(share_all(references_in(instance, mr)));
        value.set_null(null_byte(instance, mr) != 0);
        return 0;
    case Slot_Kind::none:
        break;
    }
    return -1;
}

Assign_Result assign(Instance* instance, const Meta_Feature* mf, const Value& value)
{
    const Value::Type type = Value::type_of(mf);
    if (type == Value::NONE || value.type() != type)
        return Assign_Result::type_mismatch;
    if (const auto* mr = as_reference(mf))
        return mr->subscript == 0 ? store_reference(instance, mr, value) : store_references(instance, mr, value);

    const auto* mp = as_property(mf);
    if (mp->subscript != 0)
        array_slot(instance, mp->offset) = *value.array();
    else if (!value.null())
        store_scalar(instance, mp, value);
    null_byte(instance, mp) = value.null();
    return Assign_Result::ok;
}

} // namespace cimple
