#include "runtime/values/String.h"

#include "runtime/base/Assert.h"
#include "runtime/base/Memory.h"
#include "runtime/values/LowerCase.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <limits>
#include <new>

namespace cimple
{
namespace
{

constexpr std::size_t min_capacity = 32;

std::string_view as_view(const char* text)
{
    return text ? std::string_view(text) : std::string_view();
}

bool equal_ignoring_case(std::string_view a, std::string_view b)
{
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](char x, char y) { return to_lower(x) == to_lower(y); });
}

} // namespace

constinit String::Empty_Rep String::_empty = {{2, 0, 0}, '\0'};

/// A private empty representation with room for at least `capacity` characters.
String::Rep* String::make(std::size_t capacity)
{
    // The text of the static empty representation must lie where text() looks for it.
    static_assert(offsetof(Empty_Rep, nul) == sizeof(Rep));
    CIMPLE_ASSERT(capacity <= std::numeric_limits<std::size_t>::max() / 4);
    const std::size_t cap = std::bit_ceil(std::max(capacity, min_capacity));
    Rep* rep = new (allocate(sizeof(Rep) + cap + 1)) Rep{1, 0, cap};
    rep->text()[0] = '\0';
    return rep;
}

void String::free(Rep* rep) noexcept
{
    rep->~Rep();
    deallocate(rep);
}

/// True when the text is private and may grow to `capacity` characters in place.
bool String::has_room(std::size_t capacity) const
{
    return _rep->refs.load(std::memory_order_acquire) == 1 && capacity <= _rep->cap;
}

/// A private representation of the same text with room for `capacity` characters.
String::Rep* String::copy_of_text(std::size_t capacity) const
{
    Rep* rep = make(std::max(capacity, _rep->size));
    std::memcpy(rep->text(), _rep->text(), _rep->size + 1);
    rep->size = _rep->size;
    return rep;
}

void String::make_room(std::size_t capacity)
{
    if (!has_room(capacity))
        release(std::exchange(_rep, copy_of_text(capacity)));
}

/// Takes the place of an empty text by one of `size` characters that are not written yet.
char* String::make_filled(std::size_t size)
{
    _rep = make(size);
    _rep->text()[size] = '\0';
    _rep->size = size;
    return _rep->text();
}

String::String(const char* text) : String(as_view(text)) {}

String::String(const char* text, std::size_t size) : String()
{
    assign(text, size);
}

String::String(std::string_view text) : String(text.data(), text.size()) {}

String::String(const std::string& text) : String(text.data(), text.size()) {}

String& String::operator=(const String& other) noexcept
{
    release(std::exchange(_rep, share(other._rep)));
    return *this;
}

String& String::operator=(String&& other) noexcept
{
    std::swap(_rep, other._rep);
    return *this;
}

String& String::operator=(const char* text)
{
    const std::string_view view = as_view(text);
    assign(view.data(), view.size());
    return *this;
}

void String::assign(const char* text, std::size_t size)
{
    if (size == 0)
        return clear();
    if (has_room(size))
    {
        std::memmove(_rep->text(), text, size); // `text` may be a part of this string
        _rep->text()[size] = '\0';
        _rep->size = size;
        return;
    }
    Rep* rep = make(size);
    std::memcpy(rep->text(), text, size);
    rep->text()[size] = '\0';
    rep->size = size;
    release(std::exchange(_rep, rep));
}

void String::append(char c)
{
    append(&c, 1);
}

void String::append(const char* text)
{
    const std::string_view view = as_view(text);
    append(view.data(), view.size());
}

void String::append(const char* text, std::size_t size)
{
    if (size == 0)
        return;
    Rep* former = _rep; // released last: `text` may be a part of it
    const std::size_t old_size = former->size;
    if (!has_room(old_size + size))
        _rep = copy_of_text(old_size + size);
    std::memcpy(_rep->text() + old_size, text, size);
    _rep->size = old_size + size;
    _rep->text()[_rep->size] = '\0';
    if (former != _rep)
        release(former);
}

String& String::operator+=(const String& text)
{
    append(text.c_str(), text.size());
    return *this;
}

void String::clear()
{
    release(std::exchange(_rep, &_empty.rep));
}

void String::reserve(std::size_t capacity)
{
    if (capacity != 0)
        make_room(capacity);
}

void String::remove(std::size_t pos, std::size_t count)
{
    const std::size_t size = _rep->size;
    if (pos >= size || count == 0)
        return;
    count = std::min(count, size - pos);
    if (count == size)
        return clear();
    make_room(size);
    char* gap = _rep->text() + pos;
    std::memmove(gap, gap + count, size - pos - count + 1);
    _rep->size = size - count;
}

std::size_t String::capacity() const
{
    return _rep->cap;
}

char String::operator[](std::size_t index) const
{
    CIMPLE_ASSERT(index <= _rep->size);
    return _rep->text()[index];
}

std::uint32_t String::shares_count() const
{
    return _rep == &_empty.rep ? 0 : _rep->refs.load(std::memory_order_relaxed);
}

bool operator==(const String& a, const String& b)
{
    return a.shares(b) || (a.size() == b.size() && std::memcmp(a.c_str(), b.c_str(), a.size()) == 0);
}

bool operator==(const String& a, const char* b)
{
    return a.view() == as_view(b);
}

std::strong_ordering operator<=>(const String& a, const String& b)
{
    return a.view() <=> b.view();
}

bool eqi(const String& a, const String& b)
{
    return a.shares(b) || equal_ignoring_case(a.view(), b.view());
}

bool eqi(const String& a, const char* b)
{
    return equal_ignoring_case(a.view(), as_view(b));
}

} // namespace cimple
