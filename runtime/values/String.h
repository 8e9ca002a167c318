// Shared text with copy on write: the string type of every CIM slot.
#pragma once

#include <atomic>
#include <compare>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

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
    /// Of `size` characters, all of which `fill(characters)` writes.
    template <class Fill>
    requires std::invocable<Fill, char*> String(std::size_t size, Fill fill) : String()
    {
        if (size != 0)
            fill(make_filled(size));
    }
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
    struct Empty_Rep;
    static Empty_Rep _empty; // shared by all empty strings; never counted, written or freed

    static Rep* share(Rep* rep) noexcept;
    static void release(Rep* rep) noexcept;
    static void free(Rep* rep) noexcept;
    static Rep* make(std::size_t capacity);
    bool has_room(std::size_t capacity) const;
    Rep* copy_of_text(std::size_t capacity) const;
    void make_room(std::size_t capacity);
    char* make_filled(std::size_t size);

    Rep* _rep;
};

/// Head of a representation; the text lies directly behind it.
struct String::Rep
{
    std::atomic<std::uint32_t> refs;
    std::size_t size;
    std::size_t cap;

    char* text() { return reinterpret_cast<char*>(this + 1); }
};

struct String::Empty_Rep
{
    Rep rep;
    char nul;
};

inline String::Rep* String::share(Rep* rep) noexcept
{
    if (rep != &_empty.rep)
        rep->refs.fetch_add(1, std::memory_order_relaxed);
    return rep;
}

inline void String::release(Rep* rep) noexcept
{
    if (rep != &_empty.rep && rep->refs.fetch_sub(1, std::memory_order_acq_rel) == 1)
        free(rep);
}

inline String::String() noexcept : _rep(&_empty.rep) {}
inline String::String(const String& other) noexcept : _rep(share(other._rep)) {}
inline String::String(String&& other) noexcept : _rep(std::exchange(other._rep, &_empty.rep)) {}
inline String::~String()
{
    release(_rep);
}

inline const char* String::c_str() const
{
    return _rep->text();
}
inline std::size_t String::size() const
{
    return _rep->size;
}
inline bool String::empty() const
{
    return _rep->size == 0;
}
inline std::string_view String::view() const
{
    return {_rep->text(), _rep->size};
}
inline bool String::shares(const String& other) const
{
    return _rep == other._rep;
}

/// Exact, byte for byte, with length.
bool operator==(const String& a, const String& b);
bool operator==(const String& a, const char* b);
std::strong_ordering operator<=>(const String& a, const String& b);

/// Case-insensitive compare; a null text reads as empty.
bool eqi(const String& a, const String& b);
bool eqi(const String& a, const char* b);

} // namespace cimple
