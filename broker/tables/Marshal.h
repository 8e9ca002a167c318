// Values across the CMPI boundary, and the checks of values and paths against class definitions.
#pragma once

#include "broker/tables/Handles.h"

#include <string>
#include <vector>

namespace broker
{

/// Reads a value as a provider passes it (`value` null for a null value; characters as the pointer itself). The answer
/// has CMPI_string for character types. A bad handle or an unknown type is a violation and changes `status`.
Value fromCmpi(const Core& core, const CMPIValue* value, CMPIType type, const char* function, CMPIStatus& status);

/// The value as data of the frame's objects, with `state` added.
CMPIData toCmpi(Frame& frame, const Value& value, CMPIValueState state = CMPI_goodValue);
/// The same for a key: integers have the 64-bit type that the options ask for.
CMPIData keyToCmpi(Frame& frame, const Value& value);

/// toCmpi() in this thread's frame; null data without one.
CMPIData answer(const Core& core, const Value& value, const char* function, CMPIStatus* rc);

/// The entry at `index`, as the functions that go through named values by index find it; its name as a string unless
/// `name` is null. An index behind the end answers null and CMPI_RC_ERR_NO_SUCH_PROPERTY.
const Property* entryAt(const Core& core, const std::vector<Property>& list, CMPICount index, CMPIString** name,
                        const char* function, CMPIStatus* rc);

/// The same integer as another integer type, if it fits; other values as they are.
Value narrowed(const Value& value, CMPIType type);

/// Handles for values; the class comes from the core's table.
PathHandle* makePath(Frame& frame, Path path);
InstanceHandle* makeInstance(Frame& frame, Object object);

/// Why `value` cannot stand for the feature; empty if it can.
std::string misfit(const Core& core, const FeatureInfo& feature, const Value& value);

/// What is wrong with a path that names an instance: an unknown class, no namespace, a missing or null key. Empty if
/// nothing is.
std::string pathFault(const Core& core, const Path& path);

/// A null-terminated name list as CMPI passes it. It refers to the names.
class NameList
{
public:
    explicit NameList(const std::vector<std::string>* names);
    /// Null when the list stands for everything.
    const char** get() { return _all ? nullptr : _pointers.data(); }

private:
    bool _all;
    std::vector<const char*> _pointers;
};

std::vector<std::string> readNames(const char* const* names);

} // namespace broker
