// A growing byte buffer for the assembly of text.
#pragma once

#include "runtime/values/TextConversion.h"

#include <concepts>
#include <cstdarg>
#include <cstddef>

namespace cimple
{

/// Starts empty and without memory. One byte behind `cap` is always there for a NUL.
class Buffer
{
public:
    Buffer() = default;
    Buffer(Buffer&& other) noexcept;
    Buffer& operator=(Buffer&& other) noexcept;
    ~Buffer();

    const char* data() const { return _data; }
    std::size_t size() const { return _size; }
    std::size_t capacity() const { return _cap; }
    /// The text with a NUL behind it; never null.
    const char* c_str() const { return _data ? _data : ""; }

    /// Up to 4,096 bytes become a capacity of 4,096; above, the capacity is exactly the request.
    void reserve(std::size_t capacity);
    /// Opens a gap at `pos` (at most size()). A full buffer grows to the next power of two.
    void insert(std::size_t pos, const char* data, std::size_t size);
    void remove(std::size_t pos, std::size_t size);
    void clear();

    void append(const char* data, std::size_t size);
    void append(const char* text);
    void append(char c) { append(&c, 1); }

    /// Decimal digits of an integer.
    template <std::integral T> void append_integer(T value)
    {
        char digits[integer_text_size];
        const Integer_Text text = integer_text(value, digits);
        append(text.data, text.size);
    }

    /// Text of a printf format, of any length.
    void appendf(const char* format, ...) __attribute__((format(printf, 2, 3)));
    void vappendf(const char* format, std::va_list args) __attribute__((format(printf, 2, 0)));

private:
    void set_capacity(std::size_t capacity);
    bool holds(const char* data) const;

    char* _data = nullptr;
    std::size_t _size = 0;
    std::size_t _cap = 0;
};

} // namespace cimple
