// CIM values, object paths and instances as plain values: what clients of the broker hand in and get back, and what
// the objects behind the CMPI handles hold. They refer to nothing of the module and outlive it.
#pragma once

#include "runtime/cmpi/Cmpi.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace broker
{

struct Path;
struct Object;

/// A CIM datetime, kept as its 25-character text.
class DateTime
{
public:
    /// The zero interval.
    DateTime() : _text("00000000000000.000000:000") {}
    /// Nothing for text that is not a timestamp or an interval of 25 characters with every digit in place.
    static std::optional<DateTime> parse(std::string_view text);
    static DateTime now();
    /// Microseconds since 1970 in UTC, or of the interval.
    static DateTime fromMicroseconds(std::uint64_t microseconds, bool interval);

    const std::string& text() const { return _text; }
    bool isInterval() const { return _text[21] == ':'; }
    /// The inverse of fromMicroseconds(); the offset of a timestamp is taken off.
    std::uint64_t microseconds() const;

    bool operator==(const DateTime&) const = default;

private:
    explicit DateTime(std::string text) : _text(std::move(text)) {}
    std::string _text;
};

/// A value of a CIM type, or a null of it. Arrays hold values of their element type, which may be null. The accessors
/// throw std::invalid_argument when the value is null or of another kind.
class Value
{
public:
    using List = std::vector<Value>;

    /// A null without a type.
    Value() = default;
    static Value null(CMPIType type);
    static Value boolean(bool value);
    /// `type` is one of the eight integer types or char16; the value is cut to its width.
    static Value integer(CMPIType type, std::uint64_t value);
    /// The integer of that type that lies at `data`.
    static Value integerAt(CMPIType type, const void* data);
    static Value uint8(std::uint8_t value) { return integer(CMPI_uint8, value); }
    static Value uint16(std::uint16_t value) { return integer(CMPI_uint16, value); }
    static Value uint32(std::uint32_t value) { return integer(CMPI_uint32, value); }
    static Value uint64(std::uint64_t value) { return integer(CMPI_uint64, value); }
    static Value sint8(std::int8_t value) { return integer(CMPI_sint8, static_cast<std::uint64_t>(value)); }
    static Value sint16(std::int16_t value) { return integer(CMPI_sint16, static_cast<std::uint64_t>(value)); }
    static Value sint32(std::int32_t value) { return integer(CMPI_sint32, static_cast<std::uint64_t>(value)); }
    static Value sint64(std::int64_t value) { return integer(CMPI_sint64, static_cast<std::uint64_t>(value)); }
    static Value real32(float value);
    static Value real64(double value);
    static Value string(std::string value);
    static Value dateTime(DateTime value);
    static Value reference(Path value);
    static Value instance(Object value);
    static Value array(CMPIType elementType, List elements);

    /// The CMPI type code, with the array bit for arrays.
    CMPIType type() const { return _type; }
    bool isNull() const { return std::holds_alternative<std::monostate>(_data); }
    bool isArray() const { return (_type & CMPI_ARRAY) != 0; }

    bool asBoolean() const;
    /// Any integer or char16; a negative one as its two's complement.
    std::uint64_t asUnsigned() const;
    std::int64_t asSigned() const;
    double asReal() const;
    const std::string& asString() const;
    const DateTime& asDateTime() const;
    const Path& asPath() const;
    const Object& asObject() const;
    const List& asList() const;

    /// Same type, nullness and content.
    friend bool operator==(const Value& a, const Value& b);

private:
    using Data = std::variant<std::monostate, bool, std::uint64_t, std::int64_t, double, std::string, DateTime,
                              std::shared_ptr<const Path>, std::shared_ptr<const Object>, List>;
    Value(CMPIType type, Data data) : _type(type), _data(std::move(data)) {}
    template <class T> const T& get(const char* wanted) const;

    CMPIType _type = CMPI_null;
    Data _data;
};

/// A named value: a property, a key or an argument.
struct Property
{
    std::string name;
    Value value;

    bool operator==(const Property&) const = default;
};

/// An object path. Without keys it names a class.
struct Path
{
    std::string nameSpace;
    std::string className;
    std::vector<Property> keys;
    std::string host = {};

    /// Value of a key; null if there is none of that name (any case).
    const Value* key(std::string_view name) const;
    void setKey(std::string_view name, Value value);

    bool operator==(const Path&) const = default;
};

/// An instance: its path and the properties that were set, in the order in which they were set.
struct Object
{
    Path path;
    std::vector<Property> properties;

    /// The property's value, or a null without a type if the instance lacks it.
    const Value& get(std::string_view name) const;
    bool has(std::string_view name) const;
    void set(std::string_view name, Value value);

    bool operator==(const Object&) const = default;
};

/// The entry of that name in any case; null if there is none.
const Property* findNamed(const std::vector<Property>& list, std::string_view name);
void setNamed(std::vector<Property>& list, std::string_view name, Value value);

/// Any integer but char16.
bool isInteger(CMPIType type);
bool isSignedInteger(CMPIType type);
/// Bits of an integer type or of char16; 0 for another type.
unsigned integerBits(CMPIType type);

/// An ASCII letter in lower case; names of CIM elements have no others.
inline char lowerLetter(char c)
{
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
}

/// Case-insensitive equality of names.
bool sameName(std::string_view a, std::string_view b);
std::string lowerCase(std::string_view text);

/// Whether two paths name one object: classes, namespaces and keys match whatever the case of names, the order of keys
/// and the width of integers. A missing namespace matches any.
bool sameObject(const Path& a, const Path& b);

} // namespace broker
