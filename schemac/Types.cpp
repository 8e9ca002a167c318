#include "schemac/Types.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <charconv>
#include <cstdint>
#include <optional>

namespace schemac
{

namespace
{

constexpr TypeRow type_rows[] = {
    {"boolean", "BOOLEAN", "bool", TypeClass::Boolean, 8},
    {"uint8", "UINT8", "std::uint8_t", TypeClass::Unsigned, 8},
    {"sint8", "SINT8", "std::int8_t", TypeClass::Signed, 8},
    {"uint16", "UINT16", "std::uint16_t", TypeClass::Unsigned, 16},
    {"sint16", "SINT16", "std::int16_t", TypeClass::Signed, 16},
    {"uint32", "UINT32", "std::uint32_t", TypeClass::Unsigned, 32},
    {"sint32", "SINT32", "std::int32_t", TypeClass::Signed, 32},
    {"uint64", "UINT64", "std::uint64_t", TypeClass::Unsigned, 64},
    {"sint64", "SINT64", "std::int64_t", TypeClass::Signed, 64},
    {"real32", "REAL32", "float", TypeClass::Real, 32},
    {"real64", "REAL64", "double", TypeClass::Real, 64},
    {"char16", "CHAR16", "std::uint16_t", TypeClass::Unsigned, 16},
    {"string", "STRING", "String", TypeClass::Text, 0},
    {"datetime", "DATETIME", "Datetime", TypeClass::Datetime, 0},
};

/// Qualifiers that are flags, in the order of their bits. `Read` and `In` are true where they are not written
/// and are treated apart.
struct FlagRow
{
    const char* qualifier;
    const char* flag;
};
constexpr FlagRow flag_rows[] = {
    {"Abstract", "META_ABSTRACT"},
    {"Aggregate", "META_AGGREGATE"},
    {"Aggregation", "META_AGGREGATION"},
    {"Association", "META_ASSOCIATION"},
    {"Composition", "META_COMPOSITION"},
    {"Counter", "META_COUNTER"},
    {"Delete", "META_DELETE"},
    {"DN", "META_DN"},
    {"EmbeddedObject", "META_EMBEDDED_OBJECT"},
    {"Exception", "META_EXCEPTION"},
    {"Expensive", "META_EXPENSIVE"},
    {"Experimental", "META_EXPERIMENTAL"},
    {"Gauge", "META_GAUGE"},
    {"IfDeleted", "META_IF_DELETED"},
    {"Indication", "META_INDICATION"},
    {"Invisible", "META_INVISIBLE"},
    {"Key", "META_KEY"},
    {"Large", "META_LARGE"},
    {"OctetString", "META_OCTET_STRING"},
    {"Out", "META_OUT"},
    {"Required", "META_REQUIRED"},
    {"Static", "META_STATIC"},
    {"Terminal", "META_TERMINAL"},
    {"Weak", "META_WEAK"},
    {"Write", "META_WRITE"},
    {"EmbeddedInstance", "META_EMBEDDED_INSTANCE"},
};

std::string joined(std::string flags, const Qualifiers& qualifiers)
{
    for (const FlagRow& row : flag_rows)
        if (is_set(qualifiers, row.qualifier))
            flags += (flags.empty() ? "" : " | ") + std::string(row.flag);
    return flags;
}

const char* kind_flag(FeatureKind kind)
{
    switch (kind)
    {
    case FeatureKind::Property:
        return "META_PROPERTY";
    case FeatureKind::Reference:
        return "META_REFERENCE";
    case FeatureKind::Method:
        break;
    }
    return "META_METHOD";
}

/// True unless the qualifier says false.
bool holds(const Qualifiers& qualifiers, const char* name)
{
    return !find(qualifiers, name) || is_set(qualifiers, name);
}

struct Integer
{
    bool negative;
    std::uint64_t magnitude;
};

std::optional<Integer> parse_integer(std::string_view text)
{
    Integer result{text.starts_with('-'), 0};
    if (text.starts_with('-') || text.starts_with('+'))
        text.remove_prefix(1);
    int base = 10;
    if (text.starts_with("0x") || text.starts_with("0X"))
    {
        text.remove_prefix(2);
        base = 16;
    }
    else if (text.size() > 1 && text.starts_with('0')) // octal in MOF
    {
        return std::nullopt;
    }
    const auto parsed = std::from_chars(text.data(), text.data() + text.size(), result.magnitude, base);
    if (parsed.ec != std::errc() || parsed.ptr != text.data() + text.size())
        return std::nullopt;
    return result;
}

std::string cpp_integer(const TypeRow& type, const Literal& literal)
{
    const auto value = literal.kind == Literal::Kind::Integer ? parse_integer(literal.text) : std::nullopt;
    if (!value)
        return "";
    const bool is_signed = type.type_class == TypeClass::Signed;
    const std::uint64_t half = std::uint64_t(1) << (type.bits - 1);
    const std::uint64_t largest = is_signed ? half - 1 : half - 1 + half;
    if (!value->negative)
        return value->magnitude <= largest ? std::to_string(value->magnitude) + (is_signed ? "" : "u") : "";
    if (!is_signed || value->magnitude > half)
        return "";
    // The smallest number has no literal of its own: its magnitude does not fit.
    return value->magnitude == 0 ? "0" : "-" + std::to_string(value->magnitude - 1) + " - 1";
}

std::string cpp_real(const TypeRow& type, const Literal& literal)
{
    double value = 0;
    const char* begin = literal.text.data() + (literal.text.starts_with('+') ? 1 : 0);
    const char* end = literal.text.data() + literal.text.size();
    const auto parsed = std::from_chars(begin, end, value);
    const bool is_real = literal.kind == Literal::Kind::Real && parsed.ec == std::errc() && parsed.ptr == end;
    return is_real ? std::string(begin, end) + (type.bits == 32 ? "f" : "") : "";
}

/// A timestamp or interval by its shape: digits, a point at 14, and at 21 the sign of an offset or a colon.
bool is_datetime(std::string_view text)
{
    if (text.size() != 25 || text[14] != '.' || std::string_view("+-:").find(text[21]) == std::string_view::npos)
        return false;
    for (std::size_t i = 0; i < text.size(); i++)
        if (i != 14 && i != 21 && !std::isdigit(static_cast<unsigned char>(text[i])))
            return false;
    return text[21] != ':' || text.substr(22) == "000";
}

} // namespace

const TypeRow* find_type(std::string_view name)
{
    const auto row = std::find_if(std::begin(type_rows), std::end(type_rows),
                                  [&](const TypeRow& x) { return same_name(x.name, name); });
    return row == std::end(type_rows) ? nullptr : row;
}

std::string width_of(const TypeRow& type)
{
    return type.bits ? std::to_string(type.bits / 8) : "sizeof(void*)";
}

std::string as_string_literal(std::string_view text)
{
    static constexpr std::string_view special = "\"\\\n\r\t\b\f";
    static constexpr std::string_view letters = "\"\\nrtbf";
    std::string result = "\"";
    for (const char c : text)
    {
        const std::size_t which = special.find(c);
        if (which != std::string_view::npos)
            result += '\\';
        result += which != std::string_view::npos ? letters[which] : c;
    }
    return result + '"';
}

std::string cpp_value(const TypeRow& type, const Literal& literal)
{
    switch (type.type_class)
    {
    case TypeClass::Boolean:
        return literal.kind == Literal::Kind::Boolean ? literal.text : "";
    case TypeClass::Unsigned:
    case TypeClass::Signed:
        return cpp_integer(type, literal);
    case TypeClass::Real:
        return cpp_real(type, literal);
    case TypeClass::Text:
        return literal.kind == Literal::Kind::String ? as_string_literal(literal.text) : "";
    case TypeClass::Datetime:
        break;
    }
    return literal.kind == Literal::Kind::String && is_datetime(literal.text) ? as_string_literal(literal.text) : "";
}

std::string class_flags(const Class& c)
{
    return joined(is_set(c.qualifiers, "Association") ? "" : "META_CLASS", c.qualifiers);
}

std::string feature_flags(const Feature& feature)
{
    std::string flags = kind_flag(feature.kind);
    if (feature.kind == FeatureKind::Property && holds(feature.qualifiers, "Read"))
        flags += " | META_READ";
    return joined(flags, feature.qualifiers);
}

std::string parameter_flags(const Feature& parameter)
{
    std::string flags = kind_flag(parameter.kind);
    if (holds(parameter.qualifiers, "In"))
        flags += " | META_IN";
    return joined(flags, parameter.qualifiers);
}

} // namespace schemac
