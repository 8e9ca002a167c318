#include "broker/values/Value.h"

#include "runtime/cmpi/TypeCodes.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <stdexcept>
#include <type_traits>

namespace broker
{

namespace
{

constexpr std::uint64_t microsecondsPerSecond = 1'000'000;
constexpr std::uint64_t secondsPerDay = 86'400;

std::uint64_t digits(const std::string& text, std::size_t pos, std::size_t count)
{
    std::uint64_t number = 0;
    for (std::size_t i = pos; i < pos + count; ++i)
        number = number * 10 + static_cast<std::uint64_t>(text[i] - '0');
    return number;
}

bool matchesPicture(std::string_view text, std::string_view picture)
{
    return text.size() == picture.size() && std::equal(text.begin(), text.end(), picture.begin(),
                                                       [](char c, char p)
                                                       {
                                                           if (p == 'd')
                                                               return std::isdigit(static_cast<unsigned char>(c)) != 0;
                                                           return p == 's' ? c == '+' || c == '-' : c == p;
                                                       });
}

bool inCalendar(const std::string& text)
{
    return digits(text, 4, 2) >= 1 && digits(text, 4, 2) <= 12 && digits(text, 6, 2) >= 1 && digits(text, 6, 2) <= 31 &&
           digits(text, 8, 2) < 24 && digits(text, 10, 2) < 60 && digits(text, 12, 2) < 60;
}

bool inSpan(const std::string& text)
{
    return digits(text, 8, 2) < 24 && digits(text, 10, 2) < 60 && digits(text, 12, 2) < 60;
}

bool sameKeyValue(const Value& a, const Value& b)
{
    if (isInteger(a.type()) && isInteger(b.type()) && !a.isNull() && !b.isNull())
    {
        const bool signsMatch =
            isSignedInteger(a.type()) == isSignedInteger(b.type()) || static_cast<std::int64_t>(a.asUnsigned()) >= 0;
        return signsMatch && a.asUnsigned() == b.asUnsigned();
    }
    if (a.type() == CMPI_ref && b.type() == CMPI_ref && !a.isNull() && !b.isNull())
        return sameObject(a.asPath(), b.asPath());
    return a == b;
}

} // namespace

std::optional<DateTime> DateTime::parse(std::string_view text)
{
    DateTime result{std::string(text)};
    if (matchesPicture(text, "dddddddddddddd.ddddddsddd") && inCalendar(result._text))
        return result;
    if (matchesPicture(text, "dddddddddddddd.dddddd:000") && inSpan(result._text))
        return result;
    return std::nullopt;
}

DateTime DateTime::now()
{
    timespec time{};
    clock_gettime(CLOCK_REALTIME, &time);
    return fromMicroseconds(static_cast<std::uint64_t>(time.tv_sec) * microsecondsPerSecond +
                                static_cast<std::uint64_t>(time.tv_nsec) / 1000,
                            false);
}

DateTime DateTime::fromMicroseconds(std::uint64_t microseconds, bool interval)
{
    const auto fraction = static_cast<unsigned>(microseconds % microsecondsPerSecond);
    const std::uint64_t seconds = microseconds / microsecondsPerSecond;
    std::array<char, 64> text{};
    if (interval)
    {
        const auto rest = static_cast<unsigned>(seconds % secondsPerDay);
        const auto days = static_cast<unsigned>(std::min<std::uint64_t>(seconds / secondsPerDay, 99'999'999));
        std::snprintf(text.data(), text.size(), "%08u%02u%02u%02u.%06u:000", days, rest / 3600, rest / 60 % 60,
                      rest % 60, fraction);
    }
    else
    {
        constexpr std::uint64_t endOfYear9999 = 253'402'300'799;
        const auto time = static_cast<std::time_t>(std::min(seconds, endOfYear9999));
        std::tm parts{};
        gmtime_r(&time, &parts);
        std::snprintf(text.data(), text.size(), "%04d%02d%02d%02d%02d%02d.%06u+000", parts.tm_year + 1900,
                      parts.tm_mon + 1, parts.tm_mday, parts.tm_hour, parts.tm_min, parts.tm_sec, fraction);
    }
    return DateTime(text.data());
}

std::uint64_t DateTime::microseconds() const
{
    const std::uint64_t fraction = digits(_text, 15, 6);
    if (isInterval())
    {
        const std::uint64_t seconds = digits(_text, 0, 8) * secondsPerDay + digits(_text, 8, 2) * 3600 +
                                      digits(_text, 10, 2) * 60 + digits(_text, 12, 2);
        return seconds * microsecondsPerSecond + fraction;
    }
    std::tm parts{};
    parts.tm_year = static_cast<int>(digits(_text, 0, 4)) - 1900;
    parts.tm_mon = static_cast<int>(digits(_text, 4, 2)) - 1;
    parts.tm_mday = static_cast<int>(digits(_text, 6, 2));
    parts.tm_hour = static_cast<int>(digits(_text, 8, 2));
    parts.tm_min = static_cast<int>(digits(_text, 10, 2));
    parts.tm_sec = static_cast<int>(digits(_text, 12, 2));
    const auto offset = static_cast<std::int64_t>(digits(_text, 22, 3)) * 60 * (_text[21] == '-' ? -1 : 1);
    const std::int64_t seconds = timegm(&parts) - offset;
    return static_cast<std::uint64_t>(seconds) * microsecondsPerSecond + fraction;
}

// --- values --------------------------------------------------------------------------------------------

Value Value::null(CMPIType type)
{
    return {type, std::monostate()};
}

Value Value::boolean(bool value)
{
    return {CMPI_boolean, value};
}

Value Value::integer(CMPIType type, std::uint64_t value)
{
    const unsigned unused = 64 - integerBits(type);
    if (isSignedInteger(type))
        return {type, static_cast<std::int64_t>(value << unused) >> unused};
    return {type, value << unused >> unused};
}

Value Value::integerAt(CMPIType type, const void* data)
{
    std::uint64_t bits = 0;
    std::memcpy(&bits, data, integerBits(type) / 8);
    return integer(type, bits);
}

Value Value::real32(float value)
{
    return {CMPI_real32, static_cast<double>(value)};
}

Value Value::real64(double value)
{
    return {CMPI_real64, value};
}

Value Value::string(std::string value)
{
    return {CMPI_string, std::move(value)};
}

Value Value::dateTime(DateTime value)
{
    return {CMPI_dateTime, std::move(value)};
}

Value Value::reference(Path value)
{
    return {CMPI_ref, std::make_shared<const Path>(std::move(value))};
}

Value Value::instance(Object value)
{
    return {CMPI_instance, std::make_shared<const Object>(std::move(value))};
}

Value Value::array(CMPIType elementType, List elements)
{
    return {static_cast<CMPIType>(elementType | CMPI_ARRAY), std::move(elements)};
}

template <class T> const T& Value::get(const char* wanted) const
{
    if (const T* data = std::get_if<T>(&_data))
        return *data;
    throw std::invalid_argument(std::string("the value is ") + (isNull() ? "null" : "of another type") + ", not " +
                                wanted);
}

bool Value::asBoolean() const
{
    return get<bool>("a boolean");
}

std::uint64_t Value::asUnsigned() const
{
    const auto* number = std::get_if<std::int64_t>(&_data);
    return number ? static_cast<std::uint64_t>(*number) : get<std::uint64_t>("an integer");
}

std::int64_t Value::asSigned() const
{
    return static_cast<std::int64_t>(asUnsigned());
}

double Value::asReal() const
{
    return get<double>("a real");
}

const std::string& Value::asString() const
{
    return get<std::string>("a string");
}

const DateTime& Value::asDateTime() const
{
    return get<DateTime>("a datetime");
}

const Path& Value::asPath() const
{
    return *get<std::shared_ptr<const Path>>("a reference");
}

const Object& Value::asObject() const
{
    return *get<std::shared_ptr<const Object>>("an instance");
}

const Value::List& Value::asList() const
{
    return get<List>("an array");
}

bool operator==(const Value& a, const Value& b)
{
    if (a._type != b._type || a._data.index() != b._data.index())
        return false;
    if (std::holds_alternative<std::shared_ptr<const Path>>(a._data))
        return a.asPath() == b.asPath();
    if (std::holds_alternative<std::shared_ptr<const Object>>(a._data))
        return a.asObject() == b.asObject();
    return a._data == b._data;
}

// --- named values --------------------------------------------------------------------------------------

const Property* findNamed(const std::vector<Property>& list, std::string_view name)
{
    const auto it = std::find_if(list.begin(), list.end(), [&](const Property& p) { return sameName(p.name, name); });
    return it == list.end() ? nullptr : &*it;
}

void setNamed(std::vector<Property>& list, std::string_view name, Value value)
{
    if (const Property* existing = findNamed(list, name))
    {
        const_cast<Property*>(existing)->value = std::move(value);
        return;
    }
    list.push_back({std::string(name), std::move(value)});
}

const Value* Path::key(std::string_view name) const
{
    const Property* property = findNamed(keys, name);
    return property ? &property->value : nullptr;
}

void Path::setKey(std::string_view name, Value value)
{
    setNamed(keys, name, std::move(value));
}

const Value& Object::get(std::string_view name) const
{
    static const Value none;
    const Property* property = findNamed(properties, name);
    return property ? property->value : none;
}

bool Object::has(std::string_view name) const
{
    return findNamed(properties, name) != nullptr;
}

void Object::set(std::string_view name, Value value)
{
    setNamed(properties, name, std::move(value));
}

// --- types and names -----------------------------------------------------------------------------------

bool isInteger(CMPIType type)
{
    return integerBits(type) != 0 && type != CMPI_char16;
}

bool isSignedInteger(CMPIType type)
{
    return cimple::with_type(static_cast<std::uint32_t>(cimple::type_of_cmpi_code(type)), false,
                             []<class T>(std::type_identity<T>)
                             { return std::is_integral_v<T> && std::is_signed_v<T>; });
}

unsigned integerBits(CMPIType type)
{
    return cimple::with_type(static_cast<std::uint32_t>(cimple::type_of_cmpi_code(type)), 0u,
                             []<class T>(std::type_identity<T>)
                             {
                                 const bool number = std::is_integral_v<T> && !std::is_same_v<T, bool>;
                                 return number ? static_cast<unsigned>(8 * sizeof(T)) : 0u;
                             });
}

bool sameName(std::string_view a, std::string_view b)
{
    return a.size() == b.size() &&
           std::equal(a.begin(), a.end(), b.begin(),
                      [](char x, char y) { return x == y || lowerLetter(x) == lowerLetter(y); });
}

std::string lowerCase(std::string_view text)
{
    std::string result(text);
    std::transform(result.begin(), result.end(), result.begin(), lowerLetter);
    return result;
}

bool sameObject(const Path& a, const Path& b)
{
    const bool spacesMatch = a.nameSpace.empty() || b.nameSpace.empty() || sameName(a.nameSpace, b.nameSpace);
    return spacesMatch && sameName(a.className, b.className) && a.keys.size() == b.keys.size() &&
           std::all_of(a.keys.begin(), a.keys.end(),
                       [&](const Property& key)
                       {
                           const Value* other = b.key(key.name);
                           return other && sameKeyValue(key.value, *other);
                       });
}

} // namespace broker
