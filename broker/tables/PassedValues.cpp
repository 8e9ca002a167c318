#include "broker/tables/PassedValues.h"

#include <algorithm>
#include <iterator>

namespace broker
{

Object filtered(Object object, const PropertyList& list)
{
    if (list)
    {
        std::erase_if(object.properties,
                      [&](const Property& property)
                      {
                          return std::none_of(list->begin(), list->end(),
                                              [&](const std::string& name) { return sameName(name, property.name); });
                      });
    }
    return object;
}

namespace
{

Value delivered(Value value, NullElements nullElements)
{
    if (nullElements == NullElements::kept || value.isNull() || value.type() != CMPI_stringA)
        return value;
    Value::List elements = value.asList();
    if (nullElements == NullElements::left_out)
        std::erase_if(elements, [](const Value& element) { return element.isNull(); });
    std::replace_if(
        elements.begin(), elements.end(), [](const Value& element) { return element.isNull(); }, Value::string(""));
    return Value::array(CMPI_string, std::move(elements));
}

} // namespace

std::vector<Property> delivered(std::vector<Property> properties, NullElements nullElements)
{
    for (Property& property : properties)
        property.value = delivered(std::move(property.value), nullElements);
    return properties;
}

namespace
{

Value withoutEmptyKeys(const Value& value)
{
    if (value.isNull())
        return value;
    if (value.isArray())
    {
        Value::List elements;
        std::transform(value.asList().begin(), value.asList().end(), std::back_inserter(elements),
                       [](const Value& element) { return withoutEmptyKeys(element); });
        return Value::array(static_cast<CMPIType>(value.type() & ~CMPI_ARRAY), std::move(elements));
    }
    return value.type() == CMPI_ref ? Value::reference(withoutEmptyKeys(value.asPath(), true)) : value;
}

} // namespace

Path withoutEmptyKeys(Path path, bool source)
{
    for (Property& key : path.keys)
    {
        const bool empty = key.value.type() == CMPI_string && !key.value.isNull() && key.value.asString().empty();
        key.value = empty && source ? Value::null(CMPI_string) : withoutEmptyKeys(key.value);
    }
    return path;
}

std::vector<Property> withoutEmptyKeys(std::vector<Property> properties)
{
    for (Property& property : properties)
        property.value = withoutEmptyKeys(property.value);
    return properties;
}

} // namespace broker
