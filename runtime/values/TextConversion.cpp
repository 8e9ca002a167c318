#include "runtime/values/TextConversion.h"

#include "runtime/values/LowerCase.h"

#include <array>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <locale.h>

namespace cimple
{
namespace
{

constexpr std::size_t max_decimal_digits = 20;
constexpr std::size_t max_hex_digits = 16;
constexpr std::uint64_t max_uint64 = std::numeric_limits<std::uint64_t>::max();

bool is_digit(char c)
{
    return c >= '0' && c <= '9';
}

/// Value of an upper-case hexadecimal digit; -1 for any other character.
int hex_digit(char c)
{
    if (is_digit(c))
        return c - '0';
    return c >= 'A' && c <= 'F' ? c - 'A' + 10 : -1;
}

int parse_hex(const char* digits, std::uint64_t& value)
{
    std::uint64_t result = 0;
    std::size_t count = 0;
    for (; digits[count]; ++count)
    {
        const int digit = hex_digit(digits[count]);
        if (digit < 0 || count == max_hex_digits)
            return -1;
        result = result << 4 | static_cast<unsigned>(digit);
    }
    if (count == 0)
        return -1;
    value = result;
    return 0;
}

int parse_decimal(const char* digits, std::uint64_t& value)
{
    std::uint64_t result = 0;
    std::size_t count = 0;
    for (; digits[count]; ++count)
    {
        if (!is_digit(digits[count]) || count == max_decimal_digits)
            return -1;
        const auto digit = static_cast<unsigned>(digits[count] - '0');
        if (result > (max_uint64 - digit) / 10)
            return -1;
        result = result * 10 + digit;
    }
    if (count == 0)
        return -1;
    value = result;
    return 0;
}

template <class T> int parse_unsigned(const char* text, T& value)
{
    std::uint64_t wide;
    if (text_to_value(text, wide) != 0 || wide > std::numeric_limits<T>::max())
        return -1;
    value = static_cast<T>(wide);
    return 0;
}

template <class T> int parse_signed(const char* text, T& value)
{
    if (!text)
        return -1;
    const bool negative = *text == '-';
    if (negative || *text == '+')
        ++text;
    const std::uint64_t limit = static_cast<std::uint64_t>(std::numeric_limits<T>::max()) + (negative ? 1 : 0);
    std::uint64_t magnitude;
    if (text_to_value(text, magnitude) != 0 || magnitude > limit)
        return -1;
    value = static_cast<T>(negative ? 0 - magnitude : magnitude);
    return 0;
}

const char* skip_sign(const char* p)
{
    return *p == '+' || *p == '-' ? p + 1 : p;
}

const char* skip_digits(const char* p)
{
    while (is_digit(*p))
        ++p;
    return p;
}

bool has_shape_of_real(const char* text)
{
    const char* p = skip_digits(skip_sign(text));
    if (*p != '.' || !is_digit(p[1]))
        return false;
    p = skip_digits(p + 1);
    if (*p == 'e' || *p == 'E')
    {
        p = skip_sign(p + 1);
        if (!is_digit(*p))
            return false;
        p = skip_digits(p);
    }
    return *p == '\0';
}

/// strtod as in the "C" locale, so that the process's decimal comma does not matter.
double parse_c_double(const char* text, char** end)
{
    static const locale_t c_locale = newlocale(LC_ALL_MASK, "C", nullptr);
    return c_locale ? strtod_l(text, end, c_locale) : std::strtod(text, end);
}

float narrow(double wide)
{
    constexpr float infinity = std::numeric_limits<float>::infinity();
    if (std::abs(wide) > std::numeric_limits<float>::max())
        return wide < 0 ? -infinity : infinity;
    return static_cast<float>(wide);
}

struct Small_Integer
{
    char text[4];
    unsigned char size;
};

constexpr std::array<Small_Integer, 128> small_integers = []
{
    std::array<Small_Integer, 128> table{};
    for (unsigned value = 0; value < table.size(); ++value)
    {
        Small_Integer& entry = table[value];
        for (unsigned divisor : {100u, 10u, 1u})
            if (value >= divisor || divisor == 1)
                entry.text[entry.size++] = static_cast<char>('0' + value / divisor % 10);
    }
    return table;
}();

/// Writes the digits of `value` backwards from the end of the buffer and returns the first one.
char* write_digits(std::uint64_t value, char (&buffer)[integer_text_size])
{
    char* p = buffer + integer_text_size - 1;
    *p = '\0';
    do
    {
        *--p = static_cast<char>('0' + value % 10);
        value /= 10;
    } while (value != 0);
    return p;
}

Integer_Text up_to_end(const char* first, const char (&buffer)[integer_text_size])
{
    return {first, static_cast<std::size_t>(buffer + integer_text_size - 1 - first)};
}

} // namespace

int text_to_value(const char* text, bool& value)
{
    const bool is_true = text && eqi(text, "true");
    if (!is_true && !(text && eqi(text, "false")))
        return -1;
    value = is_true;
    return 0;
}

int text_to_value(const char* text, std::uint64_t& value)
{
    if (!text)
        return -1;
    if (text[0] == '0' && (text[1] == 'x' || text[1] == 'X'))
        return parse_hex(text + 2, value);
    return parse_decimal(text, value);
}

int text_to_value(const char* text, std::uint8_t& value)
{
    return parse_unsigned(text, value);
}

int text_to_value(const char* text, std::uint16_t& value)
{
    return parse_unsigned(text, value);
}

int text_to_value(const char* text, std::uint32_t& value)
{
    return parse_unsigned(text, value);
}

int text_to_value(const char* text, std::int8_t& value)
{
    return parse_signed(text, value);
}

int text_to_value(const char* text, std::int16_t& value)
{
    return parse_signed(text, value);
}

int text_to_value(const char* text, std::int32_t& value)
{
    return parse_signed(text, value);
}

int text_to_value(const char* text, std::int64_t& value)
{
    return parse_signed(text, value);
}

int text_to_value(const char* text, double& value)
{
    if (!text || !has_shape_of_real(text))
        return -1;
    char* end = nullptr;
    const double result = parse_c_double(text, &end);
    if (*end != '\0')
        return -1;
    value = result;
    return 0;
}

int text_to_value(const char* text, float& value)
{
    double wide;
    if (text_to_value(text, wide) != 0)
        return -1;
    value = narrow(wide);
    return 0;
}

Integer_Text unsigned_text(std::uint64_t value, char (&buffer)[integer_text_size])
{
    if (value < small_integers.size())
        return {small_integers[value].text, small_integers[value].size};
    return up_to_end(write_digits(value, buffer), buffer);
}

Integer_Text signed_text(std::int64_t value, char (&buffer)[integer_text_size])
{
    if (value >= 0)
        return unsigned_text(static_cast<std::uint64_t>(value), buffer);
    char* first = write_digits(0 - static_cast<std::uint64_t>(value), buffer);
    *--first = '-';
    return up_to_end(first, buffer);
}

} // namespace cimple
