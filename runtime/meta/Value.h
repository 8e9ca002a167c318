// One tagged value of any feature type: what travels between an instance and the broker's objects.
#pragma once

#include "runtime/meta/Instance.h"
#include "runtime/meta/Meta.h"
#include "runtime/values/Array.h"
#include "runtime/values/Datetime.h"
#include "runtime/values/String.h"

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <variant>
#include <vector>

namespace cimple
{

class Value
{
public:
    /// The scalar CIM types, an instance, and arrays of them (128 added).
    enum Type : std::int32_t
    {
        NONE = -1,
        BOOLEAN = 0,
        UINT8,
        SINT8,
        UINT16,
        SINT16,
        UINT32,
        SINT32,
        UINT64,
        SINT64,
        REAL32,
        REAL64,
        CHAR16,
        STRING,
        DATETIME,
        INSTANCE,
        BOOLEAN_ARRAY = 128,
        UINT8_ARRAY,
        SINT8_ARRAY,
        UINT16_ARRAY,
        SINT16_ARRAY,
        UINT32_ARRAY,
        SINT32_ARRAY,
        UINT64_ARRAY,
        SINT64_ARRAY,
        REAL32_ARRAY,
        REAL64_ARRAY,
        CHAR16_ARRAY,
        STRING_ARRAY,
        DATETIME_ARRAY,
        INSTANCE_ARRAY,
    };
    static constexpr std::int32_t array_bit = 128;

    using Instances = std::vector<Ref<>>; ///< elements may be null

    Value() = default;

    Type type() const { return _type; }
    bool null() const { return _null; }
    void set_null(bool null) { _null = null; }

    /// Null of a type, with an empty content.
    static Value null_of(Type type);

    // Setters make the value non-null and give it the tag named or implied.

    /// `bytes` point to a value of the scalar type `type` (BOOLEAN to DATETIME) as a slot holds it.
    void set_scalar(Type type, const void* bytes);
    /// The elements' type comes from the tag of the array.
    void set_array(Type type, Array_Base array);
    void set_instance(Ref<> instance);
    void set_instances(Instances instances);

    // Typed getters return 0, or -1 without touching the target when the tag differs.

    /// T is the C++ type of the tag, as cim_type_of has it; char16 and uint16 are told apart by `tag`.
    template <class T> int get(T& value, Type tag = static_cast<Type>(cim_type_of<T>)) const;
    int get(Ref<>& instance) const;
    int get(Instances& instances) const;
    /// Arrays of any scalar type, without a copy; null when the tag is another.
    const Array_Base* array() const { return std::get_if<Array_Base>(&_content); }
    const Instances* instances() const { return std::get_if<Instances>(&_content); }
    /// The value of a scalar as a slot holds it; null when the tag is that of an instance or array.
    const void* scalar() const;

    /// "none", "BOOLEAN", "UINT8_ARRAY", "INSTANCE" ...
    static const char* type_name(Type type);
    /// The tag of a feature; -1 for a method.
    static Type type_of(const Meta_Feature* mf);

    /// A dump for diagnosis.
    void print(std::FILE* out) const;

private:
    /// Storage of a number or boolean.
    struct Bytes
    {
        alignas(std::uint64_t) unsigned char data[sizeof(std::uint64_t)];
    };

    Type _type = NONE;
    bool _null = false;
    std::variant<Bytes, String, Datetime, Ref<>, Array_Base, Instances> _content;
};

constexpr bool is_array(Value::Type type)
{
    return type != Value::NONE && (type & Value::array_bit) != 0;
}
constexpr bool is_scalar(Value::Type type)
{
    return type >= Value::BOOLEAN && type <= Value::DATETIME;
}
constexpr bool is_integer(Value::Type type)
{
    return type >= Value::UINT8 && type <= Value::SINT64;
}

template <class T> int Value::get(T& value, Type tag) const
{
    if (_type != tag || !is_scalar(tag))
        return -1;
    value = *static_cast<const T*>(scalar());
    return 0;
}

/// Result of assign().
enum class Assign_Result
{
    ok,
    type_mismatch,
    null_instance,
    wrong_class,
};

/// Reads the slot of a feature, its null byte included. Returns 0, or -1 for a method.
int read_feature(const Instance* instance, const Meta_Feature* mf, Value& value);

/// Writes the slot of a feature and its null byte. The tag must be that of the feature; an instance must be of
/// the reference's class. The former content is released.
Assign_Result assign(Instance* instance, const Meta_Feature* mf, const Value& value);

} // namespace cimple
