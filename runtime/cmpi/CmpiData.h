// One value in the broker's form and in the runtime's.
#pragma once

#include "runtime/cmpi/Cmpi.h"
#include "runtime/meta/Value.h"

#include <cstdint>

namespace cimple
{

/// Type code of a tag. An instance travels as object path or as instance, whichever the flags of its feature say.
CMPIType cmpi_type_of(Value::Type type, std::uint32_t flags);
/// Tag of a type code; NONE for a code that no feature has.
Value::Type value_type_of(CMPIType type);

/// Copies the text of a broker's string. False, with `text` untouched, for a null string or a null text, which
/// some brokers put into strings, and on failure, which `status` tells from the former.
bool text_of(const CMPIString* string, String& text, CMPIStatus* status = nullptr);

/// Broker to runtime. The classes of object paths and instances are looked up in the repository. The tag follows
/// the data's type, also for null data. Returns 0, or -1 with the reason in the runtime log.
int cmpi_to_cimple_value(const Meta_Repository* repository, const CMPIData& data, Value& value);

/// Runtime to broker; `flags` are the feature's, `name_space` that of instances which have none of their own.
/// Objects made here belong to the broker. Returns 0, or -1 with the reason in the runtime log.
int _to_cmpi_data(const CMPIBroker* broker, const char* name_space, const Value& value, std::uint32_t flags,
                  CMPIData& data);

/// The value pointer of the broker's setters: null for null data, whose type still counts.
inline const CMPIValue* value_pointer(const CMPIData& data)
{
    return CMIsNullValue(data) ? nullptr : &data.value;
}

} // namespace cimple
