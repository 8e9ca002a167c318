// Shared text with copy on write: the string type of every CIM slot.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace cimple
{

/// One pointer to a counted representation (`refs`, `size`, `cap`, text, NUL). Copies share; every mutation
/// first makes the text private. All empty strings share one static representation of capacity 0. Capacity
/// is at least 32 and otherwise the next power of two at or above the length; appending one character to a
/// full string doubles it. The count is atomic, the text is not: one thread mutates a String at a time.
class String
{
public:
    String() noexcept;
    String(const String& other) noexcept;
    String(String&& other) noexcept;
    String(const char* text); // null reads as empty
    String(const char* text, std::size_t size);
    String(std::string_view text);
    String(const std::string& text);
    ~String();
    String& operator=(const String& other) noexcept;
    String& operator=(String&& other) noexcept;
    String& operator=(const char* text);

    void assign(const char* text, std::size_t size);
    void append(char c);
    void append(const char* text);
    void append(const char* text, std::size_t size);
    String& operator+=(const String& text);
    void clear();
    void reserve(std::size_t capacity);
    /// Removes `count` characters at `pos`, both clamped to the text.
    void remove(std::size_t pos, std::size_t count);

    const char* c_str() const;
    std::size_t size() const;
    std::size_t capacity() const;
    bool empty() const;
    char operator[](std::size_t index) const;
    std::string_view view() const;
    /// True when both share one representation: the first test of every compare.
    bool shares(const String& other) const;
    /// Current share count; 0 counts for the static empty text.
    std::uint32_t shares_count() const;

    struct Rep;

private:
    Rep* _rep;
};

/// Exact, byte for byte, with length.
bool operator==(const String& a, const String& b);
bool operator==(const String& a, const char* b);
std::strong_ordering operator<=>(const String& a, const String& b);

/// Case-insensitive compare.
bool eqi(const String& a, const String& b);

} // namespace cimple
