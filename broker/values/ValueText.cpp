#include "broker/values/ValueText.h"

#include "broker/values/Json.h"
#include "broker/values/PathText.h"
#include "runtime/cmpi/TypeCodes.h"

#include <nlohmann/json.hpp>

#include <array>
#include <charconv>
#include <stdexcept>
#include <utility>

namespace broker
{

namespace
{

std::string realText(const Value& value)
{
    std::array<char, 64> buffer{};
    const double number = value.asReal();
    const auto result = value.type() == CMPI_real32
                            ? std::to_chars(buffer.data(), buffer.data() + buffer.size(), static_cast<float>(number))
                            : std::to_chars(buffer.data(), buffer.data() + buffer.size(), number);
    return {buffer.data(), result.ptr};
}

std::string integerText(const Value& value)
{
    return isSignedInteger(value.type()) ? std::to_string(value.asSigned()) : std::to_string(value.asUnsigned());
}

template <class ElementText>
std::string joined(const Value::List& list, const char* open, const char* close, ElementText elementText)
{
    std::string text = open;
    for (const Value& element : list)
        text += (&element == &list.front() ? "" : ", ") + elementText(element);
    return text + close;
}

[[noreturn]] void refuse(std::string_view text, CMPIType type)
{
    throw std::invalid_argument("'" + std::string(text) + "' is no " + typeText(type));
}

template <class Number> Number parseNumber(std::string_view text, CMPIType type, int base = 10)
{
    Number number{};
    std::from_chars_result result{};
    if constexpr (std::is_floating_point_v<Number>)
        result = std::from_chars(text.data(), text.data() + text.size(), number);
    else
        result = std::from_chars(text.data(), text.data() + text.size(), number, base);
    if (text.empty() || result.ec != std::errc() || result.ptr != text.data() + text.size())
        refuse(text, type);
    return number;
}

Value parseInteger(std::string_view text, CMPIType type)
{
    const std::string_view digits = text.starts_with('+') ? text.substr(1) : text;
    std::uint64_t bits = 0;
    if (isSignedInteger(type))
        bits = static_cast<std::uint64_t>(parseNumber<std::int64_t>(digits, type));
    else if (digits.starts_with("0x") || digits.starts_with("0X"))
        bits = parseNumber<std::uint64_t>(digits.substr(2), type, 16);
    else
        bits = parseNumber<std::uint64_t>(digits, type);
    Value value = Value::integer(type, bits);
    if (value.asUnsigned() != bits)
        throw std::invalid_argument("'" + std::string(text) + "' is out of the range of " + typeText(type));
    return value;
}

bool parseBoolean(std::string_view text)
{
    if (sameName(text, "true") || sameName(text, "false"))
        return sameName(text, "true");
    refuse(text, CMPI_boolean);
}

DateTime parseDateTime(std::string_view text)
{
    const auto parsed = DateTime::parse(text);
    return parsed ? *parsed : (refuse(text, CMPI_dateTime), DateTime());
}

std::string_view trimmed(std::string_view text)
{
    const auto first = text.find_first_not_of(' ');
    return first == std::string_view::npos ? std::string_view()
                                           : text.substr(first, text.find_last_not_of(' ') - first + 1);
}

/// The text between brackets as elements between commas, for arrays that are no JSON.
Value parsePlainArray(const Target& target, std::string_view text)
{
    const Target element = target.element();
    Value::List list;
    text = text.substr(1, text.size() - 2);
    while (!text.empty())
    {
        const auto comma = text.find(',');
        list.push_back(parseValue(element, trimmed(text.substr(0, comma))));
        text = comma == std::string_view::npos ? std::string_view() : text.substr(comma + 1);
    }
    return Value::array(element.type, std::move(list));
}

Value parseArray(const Target& target, std::string_view text)
{
    if (!text.starts_with('[') || !text.ends_with(']'))
        throw std::invalid_argument("an array is written [a,b], not '" + std::string(text) + "'");
    const Json json = parseJson(text);
    return json.is_discarded() ? parsePlainArray(target, text) : valueFromJson(target, json);
}

} // namespace

std::string typeText(CMPIType type)
{
    const auto element = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    const char* name = cimple::type_name(static_cast<std::uint32_t>(cimple::type_of_cmpi_code(element)));
    if (element == CMPI_ref || element == CMPI_instance)
        name = element == CMPI_ref ? "reference" : "instance";
    return name ? std::string(name) + (type & CMPI_ARRAY ? "[]" : "") : "type " + std::to_string(type);
}

double decimalOf(const Value& real)
{
    const std::string text = realText(real);
    double number = real.asReal(); // as it is where it is no number
    std::from_chars(text.data(), text.data() + text.size(), number);
    return number;
}

std::string valueText(const Value& value)
{
    if (value.isNull())
        return "null";
    if (value.isArray())
        return joined(value.asList(), "[", "]", valueText);
    switch (value.type())
    {
    case CMPI_boolean:
        return value.asBoolean() ? "true" : "false";
    case CMPI_real32:
    case CMPI_real64:
        return realText(value);
    case CMPI_string:
        return value.asString();
    case CMPI_dateTime:
        return value.asDateTime().text();
    case CMPI_ref:
        return fullPathText(value.asPath());
    case CMPI_instance:
        return jsonText(toJson(value));
    default:
        return integerText(value);
    }
}

std::string mofValue(const Value& value)
{
    if (value.isNull())
        return "NULL";
    if (value.isArray())
        return joined(value.asList(), "{", "}", mofValue);
    const CMPIType type = value.type();
    const bool bare =
        isInteger(type) || type == CMPI_char16 || type == CMPI_boolean || type == CMPI_real32 || type == CMPI_real64;
    return bare ? valueText(value) : quoteText(valueText(value));
}

Value parseScalar(const Target& target, std::string_view text)
{
    if (isInteger(target.type) || target.type == CMPI_char16)
        return parseInteger(text, target.type);
    switch (target.type)
    {
    case CMPI_boolean:
        return Value::boolean(parseBoolean(text));
    case CMPI_real32:
        return Value::real32(parseNumber<float>(text, target.type));
    case CMPI_real64:
        return Value::real64(parseNumber<double>(text, target.type));
    case CMPI_dateTime:
        return Value::dateTime(parseDateTime(text));
    case CMPI_ref:
        return Value::reference(parsePath(text, target.classes, target.nameSpace, target.depth));
    case CMPI_string:
        return Value::string(std::string(text));
    default:
        throw std::invalid_argument("a value of " + typeText(target.type) + " cannot be written as text");
    }
}

std::string quoteText(std::string_view text)
{
    std::string result = "\"";
    for (const char c : text)
    {
        if (c == '"' || c == '\\')
            result += '\\';
        result += c;
    }
    return result + '"';
}

Value parseValue(const Target& target, std::string_view text)
{
    if (text == "null")
        return Value::null(target.type);
    if (target.type & CMPI_ARRAY)
        return parseArray(target, text);
    if (target.type == CMPI_instance || (text.size() > 1 && text.starts_with('"') && text.ends_with('"')))
    {
        const Json json = parseJson(text);
        if (json.is_discarded())
            throw std::invalid_argument("'" + std::string(text) + "' is no JSON");
        return json.is_string() ? parseScalar(target, json.get<std::string>()) : valueFromJson(target, json);
    }
    return parseScalar(target, text);
}

} // namespace broker
