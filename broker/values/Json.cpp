#include "broker/values/Json.h"

#include "broker/values/PathText.h"
#include "broker/values/QualifierText.h"
#include "broker/values/SchemaText.h"

#include <nlohmann/json.hpp>

#include <cmath>
#include <limits>
#include <stdexcept>

namespace broker
{

namespace
{

Json featureToJson(const FeatureInfo& feature)
{
    Json json{{"name", feature.name}, {"type", typeText(feature.type)}};
    if (!feature.referenceClass.empty())
        json["class"] = feature.referenceClass;
    json["qualifiers"] = qualifierNames(feature.flags);
    if (feature.origin)
        json["origin"] = feature.origin->name;
    if (!feature.defaultValue.isNull())
        json["default"] = toJson(feature.defaultValue);
    return json;
}

/// What the schema says of a feature or a parameter: its description, its unit, and the names of values
/// and of bits, by their numbers.
/// Nothing where it says nothing.
void addTexts(Json& json, const ClassInfo& info, std::string_view feature, std::string_view parameter = {})
{
    if (const std::string_view description = descriptionOf(info, feature, parameter); !description.empty())
        json["description"] = description;
    if (const std::string_view unit = unitOf(info, feature, parameter); !unit.empty())
        json["unit"] = unit;
    for (const cimple::Value_Name& row : valueNames(info, feature, parameter))
        json["values"][row.values] = row.name;
    for (const cimple::Value_Name& row : bitNames(info, feature, parameter))
        json["bits"][row.values] = row.name;
}

[[noreturn]] void refuse(const Json& json, CMPIType type)
{
    throw std::invalid_argument(jsonText(json) + " is no " + typeText(type));
}

Value integerFromJson(const Target& target, const Json& json)
{
    if (!json.is_number_integer())
        refuse(json, target.type);
    return parseValue(target, jsonText(json));
}

Value realFromJson(const Target& target, const Json& json)
{
    if (!json.is_number())
        refuse(json, target.type);
    const double number = json.get<double>();
    if (target.type != CMPI_real32)
        return Value::real64(number);
    if (std::abs(number) > std::numeric_limits<float>::max())
        refuse(json, target.type);
    return Value::real32(static_cast<float>(number));
}

} // namespace

Json parseJson(std::string_view text)
{
    return Json::parse(text, nullptr, false);
}

std::string jsonText(const Json& json, bool indented)
{
    return json.dump(indented ? 2 : -1, ' ', false, Json::error_handler_t::replace);
}

Json toJson(const Value& value)
{
    if (value.isNull())
        return nullptr;
    if (value.isArray())
    {
        Json list = Json::array();
        for (const Value& element : value.asList())
            list.push_back(toJson(element));
        return list;
    }
    switch (value.type())
    {
    case CMPI_boolean:
        return value.asBoolean();
    case CMPI_real32:
    case CMPI_real64:
        return std::isfinite(value.asReal()) ? Json(decimalOf(value)) : Json(nullptr);
    case CMPI_instance:
        return {{"class", value.asObject().path.className},
                {"properties", propertiesToJson(value.asObject().properties)}};
    case CMPI_string:
    case CMPI_dateTime:
    case CMPI_ref:
        return valueText(value);
    default:
        return isSignedInteger(value.type()) ? Json(value.asSigned()) : Json(value.asUnsigned());
    }
}

Json propertiesToJson(const std::vector<Property>& properties)
{
    Json json = Json::object();
    for (const Property& property : properties)
        json[property.name] = toJson(property.value);
    return json;
}

Json toJson(const Object& object)
{
    return {{"class", object.path.className},
            {"namespace", object.path.nameSpace},
            {"path", pathText(object.path)},
            {"properties", propertiesToJson(object.properties)}};
}

Json toJson(const ClassInfo& info, const MethodInfo& method)
{
    Json parameters = Json::array();
    for (const FeatureInfo& parameter : method.parameters)
        addTexts(parameters.emplace_back(featureToJson(parameter)), info, method.name, parameter.name);
    Json json{{"name", method.name},
              {"returns", typeText(method.returnType)},
              {"parameters", std::move(parameters)},
              {"qualifiers", qualifierNames(method.flags)},
              {"origin", method.origin ? method.origin->name : ""}};
    addTexts(json, info, method.name);
    return json;
}

Json toJson(const ClassInfo& info)
{
    Json properties = Json::array();
    for (const FeatureInfo& property : info.properties)
        addTexts(properties.emplace_back(featureToJson(property)), info, property.name);
    Json methods = Json::array();
    for (const MethodInfo& method : info.methods)
        methods.push_back(toJson(info, method));
    return {{"name", info.name},
            {"description", descriptionOf(info)},
            {"superclass", info.superclass ? Json(info.superclass->name) : Json(nullptr)},
            {"qualifiers", qualifierNames(info.flags)},
            {"keys", info.keys},
            {"properties", std::move(properties)},
            {"methods", std::move(methods)}};
}

Value valueFromJson(const Target& target, const Json& json)
{
    if (json.is_null())
        return Value::null(target.type);
    if (target.type & CMPI_ARRAY)
    {
        if (!json.is_array())
            refuse(json, target.type);
        const Target element = target.element();
        Value::List list;
        for (const Json& item : json)
            list.push_back(valueFromJson(element, item));
        return Value::array(element.type, std::move(list));
    }
    if (isInteger(target.type) || target.type == CMPI_char16)
        return integerFromJson(target, json);
    switch (target.type)
    {
    case CMPI_boolean:
        return json.is_boolean() ? Value::boolean(json.get<bool>()) : (refuse(json, target.type), Value());
    case CMPI_real32:
    case CMPI_real64:
        return realFromJson(target, json);
    case CMPI_instance:
        return Value::instance(objectFromJson(target.classes, target.nameSpace, json));
    case CMPI_string:
        return json.is_string() ? Value::string(json.get<std::string>()) : (refuse(json, target.type), Value());
    default:
        return json.is_string() ? parseValue(target, json.get<std::string>()) : (refuse(json, target.type), Value());
    }
}

Object objectFromJson(const ClassTable& classes, std::string_view nameSpace, const Json& json)
{
    if (!json.is_object() || !json.contains("class") || !json["class"].is_string())
        throw std::invalid_argument("an instance is an object with a \"class\"");
    const ClassInfo* info = classes.find(json["class"].get<std::string>());
    if (!info)
        throw std::invalid_argument("there is no class '" + json["class"].get<std::string>() + "'");
    Object object;
    object.path.nameSpace = json.value("namespace", std::string(nameSpace));
    object.path.className = info->name;
    const Json properties = json.value("properties", Json::object());
    if (!properties.is_object())
        throw std::invalid_argument("the \"properties\" of an instance are an object");
    for (const auto& [name, value] : properties.items())
    {
        const FeatureInfo* feature = info->property(name);
        if (!feature)
            throw std::invalid_argument(info->name + " has no property '" + name + "'");
        try
        {
            object.set(feature->name, valueFromJson(Target(classes, object.path.nameSpace, *feature), value));
        }
        catch (const std::invalid_argument& error)
        {
            throw std::invalid_argument(info->name + "." + feature->name + ": " + error.what());
        }
        if (feature->isKey())
            object.path.setKey(feature->name, object.get(feature->name));
    }
    return object;
}

} // namespace broker
