#include "runtime/cmpi/CmpiContainers.h"

#include "runtime/log/RuntimeLog.h"
#include "runtime/values/TextConversion.h"

#include <cstring>
#include <utility>

namespace cimple
{

// --- reading ----------------------------------------------------------------------------------------------

int CMPI_Container::get_name(std::size_t index, String& name)
{
    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIString* string = nullptr;
    entry_at(static_cast<CMPICount>(index), &string, &status);
    return status.rc == CMPI_RC_OK && text_of(string, name) ? 0 : -1;
}

int CMPI_Container::get_value(std::size_t index, Value::Type type, Value& value)
{
    if (index >= get_size())
    {
        RUNTIME_LOG(LOG_WARN, "bounds error");
        return -1;
    }

    CMPIStatus status{CMPI_RC_OK, nullptr};
    CMPIString* name = nullptr;
    const CMPIData data = entry_at(static_cast<CMPICount>(index), &name, &status);
    if (status.rc != CMPI_RC_OK)
        return -1;
    if (read(data, type, value) != 0)
    {
        RUNTIME_LOG(LOG_WARN, "cmpi_to_cimple_value() failed");
        return -1;
    }
    if (value.type() != type && relax(type, value) != 0)
        return -1;
    if (value.type() != type)
    {
        String text;
        text_of(name, text);
        RUNTIME_LOG(LOG_WARN, "type mismatch on %s: %s/%s", text.c_str(), Value::type_name(value.type()),
                    Value::type_name(type));
        return -1;
    }
    return 0;
}

int CMPI_Container::read(const CMPIData& data, Value::Type, Value& value)
{
    return cmpi_to_cimple_value(meta_repository, data, value);
}

int CMPI_Container::relax(Value::Type, Value&)
{
    return 0;
}

int CMPI_Container::set_value(const char* name, const Value& value, std::uint32_t flags)
{
    CMPIData data;
    if (_to_cmpi_data(broker, name_space, value, flags, data) != 0)
    {
        RUNTIME_LOG(LOG_WARN, "_to_cmpi_data() failed: feature=%s", name);
        return -1;
    }
    return add_entry(name, data).rc == CMPI_RC_OK ? 0 : -1;
}

// --- keys -----------------------------------------------------------------------------------------------------

namespace
{

/// Stores `number` as the integer or boolean type `To` where it fits.
template <class To, class From> int narrow_to(From number, Value::Type type, Value& value)
{
    To narrow{};
    if constexpr (std::is_same_v<To, bool>)
    {
        if (number != 0 && number != 1)
            return -1;
        narrow = number != 0;
    }
    else
    {
        if (!std::in_range<To>(number))
            return -1;
        narrow = static_cast<To>(number);
    }
    value.set_scalar(type, &narrow);
    return 0;
}

template <class From> int narrow(From number, Value::Type type, Value& value)
{
    if (type != Value::BOOLEAN && !is_integer(type))
        return 0; // no integer asked for: the type check refuses it
    const auto to = [&]<class To>(std::type_identity<To>)
    {
        if constexpr (std::is_integral_v<To>)
            return narrow_to<To>(number, type, value);
        else
            return -1;
    };
    return with_type(static_cast<std::uint32_t>(type), -1, to);
}

} // namespace

int CMPIObjectPath_Container::read(const CMPIData& data, Value::Type type, Value& value)
{
    if (type == Value::STRING && data.type == CMPI_null)
        value = Value::null_of(type);
    else if (CMPI_Container::read(data, type, value) != 0)
        return -1;
    if (type == Value::STRING && value.type() == type && value.null())
    {
        const String empty;
        value.set_scalar(type, &empty);
    }
    return 0;
}

int CMPIObjectPath_Container::relax(Value::Type type, Value& value)
{
    if (value.type() != Value::UINT64 && value.type() != Value::SINT64)
        return 0;
    if (value.null() && type >= Value::BOOLEAN && type <= Value::SINT64)
        return value = Value::null_of(type), 0;
    std::uint64_t unsigned_number = 0;
    if (value.get(unsigned_number) == 0)
        return narrow(unsigned_number, type, value);
    std::int64_t signed_number = 0;
    value.get(signed_number);
    return narrow(signed_number, type, value);
}

// --- text of arguments --------------------------------------------------------------------------------------

namespace
{

int cast_cmpi_string_to_scalar(const char* text, Value::Type type, Value& value)
{
    if (type == Value::REAL32 || type == Value::REAL64)
    {
        RUNTIME_LOG(LOG_INFO, "cast_cmpi_string_to_scalar(): Not supported");
        return -1;
    }
    if (type != Value::BOOLEAN && !is_integer(type))
    {
        RUNTIME_LOG(LOG_WARN, "Default case - unsupported type");
        return -1;
    }
    const auto parse = [&]<class T>(std::type_identity<T>)
    {
        if constexpr (std::is_integral_v<T>)
        {
            T parsed{};
            if (text_to_value(text, parsed) == 0)
                return value.set_scalar(type, &parsed), 0;
        }
        return -1;
    };
    return with_type(static_cast<std::uint32_t>(type), -1, parse);
}

} // namespace

int CMPIArgs_Container::relax(Value::Type type, Value& value)
{
    if (value.null() && type == Value::INSTANCE_ARRAY)
        return value = Value::null_of(type), 0;
    String text;
    if (value.null() || value.get(text) != 0 || !is_scalar(type))
        return 0;
    if (text.empty())
    {
        RUNTIME_LOG(LOG_INFO, "ignored null CMPI string");
        value = Value::null_of(type);
        return 0;
    }
    RUNTIME_LOG(LOG_WARN, "converting string to registered parameter type");
    return cast_cmpi_string_to_scalar(text.c_str(), type, value);
}

// --- the broker's functions -----------------------------------------------------------------------------------

std::size_t CMPIArgs_Container::get_size()
{
    return CMGetArgCount(_args, nullptr);
}

CMPIData CMPIArgs_Container::entry_at(CMPICount index, CMPIString** name, CMPIStatus* status)
{
    return CMGetArgAt(_args, index, name, status);
}

CMPIStatus CMPIArgs_Container::add_entry(const char* name, const CMPIData& data)
{
    constexpr char return_value[] = "return_value";
    if (std::strncmp(name, return_value, sizeof return_value) == 0)
        return _return_data = data, CMPIStatus{CMPI_RC_OK, nullptr};
    return CMAddArg(_args, name, value_pointer(data), data.type);
}

std::size_t CMPIObjectPath_Container::get_size()
{
    return CMGetKeyCount(_path, nullptr);
}

CMPIData CMPIObjectPath_Container::entry_at(CMPICount index, CMPIString** name, CMPIStatus* status)
{
    return CMGetKeyAt(_path, index, name, status);
}

CMPIStatus CMPIObjectPath_Container::add_entry(const char* name, const CMPIData& data)
{
    return CMAddKey(_path, name, value_pointer(data), data.type);
}

std::size_t CMPIInstance_Container::get_size()
{
    return CMGetPropertyCount(_instance, nullptr);
}

CMPIData CMPIInstance_Container::entry_at(CMPICount index, CMPIString** name, CMPIStatus* status)
{
    return CMGetPropertyAt(_instance, index, name, status);
}

CMPIStatus CMPIInstance_Container::add_entry(const char* name, const CMPIData& data)
{
    return CMSetProperty(_instance, name, value_pointer(data), data.type);
}

} // namespace cimple
