#include "runtime/cmpi/CmpiData.h"

#include "runtime/cmpi/Converter.h"
#include "runtime/cmpi/TypeCodes.h"
#include "runtime/log/RuntimeLog.h"

#include <cstring>
#include <utility>

namespace cimple
{

namespace
{

constexpr std::uint32_t embedded = META_EMBEDDED_INSTANCE | META_EMBEDDED_OBJECT;

/// References may lead to instances whose keys are references again: a client decides how deep.
constexpr int max_depth = 32;
thread_local int depth = 0;

class Depth
{
public:
    Depth() { ++depth; }
    ~Depth() { --depth; }
    Depth(const Depth&) = delete;
    Depth& operator=(const Depth&) = delete;
    bool allowed() const { return depth <= max_depth; }
};

// --- broker to runtime ------------------------------------------------------------------------------------

int read_string(const CMPIString* string, Value& value)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    String text;
    if (text_of(string, text, &status))
        return value.set_scalar(Value::STRING, &text), 0;
    if (status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMGetCharsPtr() failed");
        return -1;
    }
    RUNTIME_LOG(LOG_INFO, "ignored null CMPI string");
    value = Value::null_of(Value::STRING);
    return 0;
}

int read_datetime(const CMPIDateTime* datetime, Value& value)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    String text;
    Datetime time;
    const CMPIString* string = datetime ? CMGetStringFormat(datetime, &status) : nullptr;
    if (status.rc != CMPI_RC_OK || !text_of(string, text) || !time.parse(text.c_str()))
    {
        RUNTIME_LOG(LOG_WARN, "CMGetStringFormat() failed");
        return -1;
    }
    value.set_scalar(Value::DATETIME, &time);
    return 0;
}

/// Class of an object path, from the repository.
const Meta_Class* class_of(const Meta_Repository* repository, const CMPIObjectPath* path)
{
    String class_name;
    CMPIStatus status{CMPI_RC_OK, nullptr};
    if (!text_of(CMGetClassName(path, &status), class_name) || status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMGetClassName() failed");
        return nullptr;
    }
    const Meta_Class* mc = find_class(repository, class_name.c_str());
    if (!mc)
        RUNTIME_LOG(LOG_WARN, "failed to find meta class: %s", class_name.c_str());
    return mc;
}

/// Either `path` alone, or the path of `inst` and its properties.
Ref<> make_instance(const Meta_Repository* repository, const CMPIObjectPath* path, const CMPIInstance* inst)
{
    const Depth nesting;
    Ref<> result;
    if ((!path && !inst) || !nesting.allowed())
    {
        RUNTIME_LOG(LOG_WARN, "null instance");
        return result;
    }
    if (inst)
    {
        CMPIStatus status{CMPI_RC_OK, nullptr};
        path = CMGetObjectPath(inst, &status);
        if (!path || status.rc != CMPI_RC_OK)
        {
            RUNTIME_LOG(LOG_WARN, "CMGetObjectPath() failed");
            return result;
        }
    }
    const Meta_Class* mc = class_of(repository, path);
    if (!mc)
        return result;
    const CMPIrc rc =
        inst ? make_cimple_instance(mc, path, inst, *result.out()) : make_cimple_reference(mc, path, *result.out());
    if (rc != CMPI_RC_OK)
        result.reset();
    return result;
}

int read_instance(const Meta_Repository* repository, const CMPIData& data, Value& value)
{
    const bool is_path = data.type == CMPI_ref;
    Ref<> instance = make_instance(repository, is_path ? data.value.ref : nullptr, is_path ? nullptr : data.value.inst);
    if (!instance)
    {
        RUNTIME_LOG(LOG_WARN, "failed to create CIMPLE instance");
        return -1;
    }
    value.set_instance(std::move(instance));
    return 0;
}

/// The next element of an array as a non-null value, or false with the reason logged.
bool read_element(const Meta_Repository* repository, const CMPIData& array, CMPICount index, Value& element,
                  const char* mismatch, const char* null_element)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPIData data = CMGetArrayElementAt(array.value.array, index, &status);
    if (status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMGetArrayElementAt() failed");
        return false;
    }
    if (!CMIsNullValue(data) && data.type != (array.type & ~CMPI_ARRAY))
    {
        RUNTIME_LOG(LOG_WARN, "%s", mismatch);
        return false;
    }
    if (CMIsNullValue(data))
    {
        RUNTIME_LOG(LOG_WARN, "%s", null_element);
        return false;
    }
    if (cmpi_to_cimple_value(repository, data, element) != 0)
        return false;
    if (element.null())
    {
        RUNTIME_LOG(LOG_WARN, "%s", null_element);
        return false;
    }
    return true;
}

int read_array(const Meta_Repository* repository, const CMPIData& data, Value::Type type, Value& value)
{
    if (!data.value.array)
        return value = Value::null_of(type), 0;

    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPICount count = CMGetArrayCount(data.value.array, &status);
    if (status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMGetArrayCount() failed");
        return -1;
    }

    Value element;
    if (type == Value::INSTANCE_ARRAY)
    {
        Value::Instances instances;
        for (CMPICount i = 0; i < count; ++i)
        {
            if (!read_element(repository, data, i, element, "type mismatch", "encountered null instance element"))
                return -1;
            Ref<> instance;
            element.get(instance);
            instances.push_back(std::move(instance));
        }
        value.set_instances(std::move(instances));
        return 0;
    }

    Array_Base elements(array_traits(static_cast<std::uint32_t>(type - Value::array_bit)));
    for (CMPICount i = 0; i < count; ++i)
    {
        if (!read_element(repository, data, i, element, "array element type mismatch",
                          "encountered null array element"))
            return -1;
        if (i == 0)
            elements.reserve(count);
        elements.append(element.scalar());
    }
    value.set_array(type, std::move(elements));
    return 0;
}

// --- runtime to broker ------------------------------------------------------------------------------------

int write_string(const CMPIBroker* broker, const String& text, CMPIValue& value)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    value.string = CMNewString(broker, text.c_str(), &status);
    if (!value.string || status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMNewString() failed");
        return -1;
    }
    return 0;
}

int write_datetime(const CMPIBroker* broker, const Datetime& time, CMPIValue& value)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    value.dateTime = CMNewDateTimeFromChars(broker, time.text().c_str(), &status);
    if (!value.dateTime || status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMNewDateTimeFromChars() failed");
        return -1;
    }
    return 0;
}

/// `bytes` hold a value of the scalar type, as in a slot or in an array.
int write_scalar(const CMPIBroker* broker, Value::Type type, const void* bytes, CMPIValue& value)
{
    if (type == Value::STRING)
        return write_string(broker, *static_cast<const String*>(bytes), value);
    if (type == Value::DATETIME)
        return write_datetime(broker, *static_cast<const Datetime*>(bytes), value);
    std::memcpy(&value, bytes, type_width(static_cast<std::uint32_t>(type))); // all members start at offset 0
    return 0;
}

int write_instance(const CMPIBroker* broker, const char* name_space, const Instance* instance, CMPIType type,
                   CMPIValue& value)
{
    const Depth nesting;
    if (!instance || !nesting.allowed())
    {
        RUNTIME_LOG(LOG_WARN, "null instance argument");
        return -1;
    }
    if (!instance->__name_space.empty())
        name_space = instance->__name_space.c_str();
    if (!name_space || !*name_space)
    {
        RUNTIME_LOG(LOG_WARN, "null namespace");
        return -1;
    }
    const char* class_name = instance->__meta_class->name;
    if (!class_name || !*class_name)
    {
        RUNTIME_LOG(LOG_WARN, "null classname");
        return -1;
    }
    if (type != CMPI_ref && type != CMPI_instance)
    {
        RUNTIME_LOG(LOG_WARN, "unexpected type");
        return -1;
    }

    CMPIObjectPath* path = nullptr;
    if (make_cmpi_object_path(broker, instance, name_space, path) != CMPI_RC_OK)
        return -1;
    if (type == CMPI_ref)
        return value.ref = path, 0;
    return make_cmpi_instance(broker, instance, name_space, path, nullptr, value.inst) == CMPI_RC_OK ? 0 : -1;
}

/// Makes an array in `data` whose elements `element(i, CMPIValue&)` gives.
template <class Element>
int write_array(const CMPIBroker* broker, std::size_t count, CMPIType element_type, Element element, CMPIData& data)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    data.value.array = CMNewArray(broker, static_cast<CMPICount>(count), element_type, &status);
    if (!data.value.array || status.rc != CMPI_RC_OK)
    {
        RUNTIME_LOG(LOG_WARN, "CMNewArray() failed");
        return -1;
    }
    for (std::size_t i = 0; i < count; ++i)
    {
        CMPIValue value = {};
        if (element(i, value) != 0)
        {
            RUNTIME_LOG(LOG_WARN, "element conversion failed");
            return -1;
        }
        status = CMSetArrayElementAt(data.value.array, static_cast<CMPICount>(i), &value, element_type);
        if (status.rc != CMPI_RC_OK)
        {
            RUNTIME_LOG(LOG_WARN, "CMSetArrayElementAt() failed");
            return -1;
        }
    }
    return 0;
}

} // namespace

CMPIType cmpi_type_of(Value::Type type, std::uint32_t flags)
{
    const CMPIType array = is_array(type) ? CMPI_ARRAY : CMPIType{0};
    const std::int32_t element = type & ~Value::array_bit;
    if (element == Value::INSTANCE)
        return static_cast<CMPIType>((flags & embedded ? CMPI_instance : CMPI_ref) | array);
    return type == Value::NONE ? CMPI_null
                               : static_cast<CMPIType>(cmpi_type_codes[static_cast<std::size_t>(element)] | array);
}

Value::Type value_type_of(CMPIType type)
{
    const std::int32_t array = type & CMPI_ARRAY ? Value::array_bit : 0;
    const CMPIType element = type & ~CMPI_ARRAY;
    if (element == CMPI_ref || element == CMPI_instance)
        return static_cast<Value::Type>(Value::INSTANCE | array);
    const std::size_t scalar = type_of_cmpi_code(element);
    return scalar < num_types ? static_cast<Value::Type>(static_cast<std::int32_t>(scalar) | array) : Value::NONE;
}

bool text_of(const CMPIString* string, String& text, CMPIStatus* status)
{
    CMPIStatus own{CMPI_RC_OK, nullptr};
    const char* chars = string ? CMGetCharsPtr(string, &own) : nullptr;
    if (status)
        *status = own;
    if (!chars || own.rc != CMPI_RC_OK)
        return false;
    text = chars;
    return true;
}

int cmpi_to_cimple_value(const Meta_Repository* repository, const CMPIData& data, Value& value)
{
    const Value::Type type = value_type_of(data.type);
    if (type == Value::NONE)
    {
        RUNTIME_LOG(LOG_WARN, "unknown type");
        return -1;
    }
    if (CMIsNullValue(data))
        return value = Value::null_of(type), 0;
    if (is_array(type))
        return read_array(repository, data, type, value);
    switch (type)
    {
    case Value::INSTANCE:
        return read_instance(repository, data, value);
    case Value::STRING:
        return read_string(data.value.string, value);
    case Value::DATETIME:
        return read_datetime(data.value.dateTime, value);
    case Value::BOOLEAN:
    {
        const bool truth = data.value.boolean != 0; // a broker's byte may be other than 0 and 1
        return value.set_scalar(type, &truth), 0;
    }
    default:
        return value.set_scalar(type, &data.value), 0; // all members start at offset 0
    }
}

int _to_cmpi_data(const CMPIBroker* broker, const char* name_space, const Value& value, std::uint32_t flags,
                  CMPIData& data)
{
    data = CMPIData{};
    if (value.type() == Value::NONE)
    {
        RUNTIME_LOG(LOG_WARN, "missing type");
        return -1;
    }
    data.type = cmpi_type_of(value.type(), flags);
    if (value.null())
        return data.state = CMPI_nullValue, 0;

    const CMPIType element_type = data.type & ~CMPI_ARRAY;
    if (const Value::Instances* instances = value.instances())
    {
        const auto element = [&](std::size_t i, CMPIValue& out)
        { return write_instance(broker, name_space, (*instances)[i].get(), element_type, out); };
        return write_array(broker, instances->size(), element_type, element, data);
    }
    if (const Array_Base* array = value.array())
    {
        const auto type = static_cast<Value::Type>(value.type() - Value::array_bit);
        const auto element = [&](std::size_t i, CMPIValue& out)
        { return write_scalar(broker, type, array->at(i), out); };
        return write_array(broker, array->size(), element_type, element, data);
    }
    if (const void* bytes = value.scalar())
        return write_scalar(broker, value.type(), bytes, data.value);

    Ref<> instance;
    value.get(instance);
    return write_instance(broker, name_space, instance.get(), data.type, data.value);
}

} // namespace cimple
