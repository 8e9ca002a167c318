#include "runtime/values/Buffer.h"

#include "runtime/base/Assert.h"
#include "runtime/base/Memory.h"

#include <bit>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <functional>
#include <utility>

namespace cimple
{
namespace
{

constexpr std::size_t min_reservation = 4096;
constexpr std::size_t first_format_size = 128;

} // namespace

Buffer::Buffer(Buffer&& other) noexcept
    : _data(std::exchange(other._data, nullptr)), _size(std::exchange(other._size, 0)),
      _cap(std::exchange(other._cap, 0))
{}

Buffer& Buffer::operator=(Buffer&& other) noexcept
{
    std::swap(_data, other._data);
    std::swap(_size, other._size);
    std::swap(_cap, other._cap);
    return *this;
}

Buffer::~Buffer()
{
    std::free(_data);
}

bool Buffer::holds(const char* data) const
{
    return _data && !std::less<>()(data, const_cast<const char*>(_data)) &&
           std::less<>()(data, const_cast<const char*>(_data) + _size);
}

void Buffer::set_capacity(std::size_t capacity)
{
    _data = static_cast<char*>(reallocate(_data, _data ? _size + 1 : 0, capacity + 1));
    _data[_size] = '\0';
    _cap = capacity;
}

void Buffer::reserve(std::size_t capacity)
{
    if (capacity > _cap)
        set_capacity(capacity <= min_reservation ? min_reservation : capacity);
}

void Buffer::insert(std::size_t pos, const char* data, std::size_t size)
{
    CIMPLE_ASSERT(pos <= _size);
    CIMPLE_ASSERT(size <= SIZE_MAX / 4 - _size);
    if (size == 0)
        return;
    if (holds(data))
    {
        Buffer copy; // `data` may move with the growth
        copy.append(data, size);
        return insert(pos, copy._data, size);
    }
    if (_size + size > _cap)
        set_capacity(std::bit_ceil(_size + size));
    std::memmove(_data + pos + size, _data + pos, _size - pos);
    std::memcpy(_data + pos, data, size);
    _size += size;
    _data[_size] = '\0';
}

void Buffer::remove(std::size_t pos, std::size_t size)
{
    CIMPLE_ASSERT(pos <= _size && size <= _size - pos);
    if (size == 0)
        return;
    std::memmove(_data + pos, _data + pos + size, _size - pos - size + 1);
    _size -= size;
}

void Buffer::clear()
{
    remove(0, _size);
}

void Buffer::append(const char* data, std::size_t size)
{
    if (size != 0 && !_data)
        reserve(size);
    insert(_size, data, size);
}

void Buffer::append(const char* text)
{
    append(text, std::strlen(text));
}

void Buffer::appendf(const char* format, ...)
{
    std::va_list args;
    va_start(args, format);
    vappendf(format, args);
    va_end(args);
}

void Buffer::vappendf(const char* format, std::va_list args)
{
    std::size_t room = first_format_size;
    for (;;)
    {
        reserve(_size + room);
        std::va_list copy; // each try uses up its list
        va_copy(copy, args);
        const int needed = std::vsnprintf(_data + _size, room, format, copy);
        va_end(copy);
        if (needed < 0) // a text that cannot be made, in a buffer of any size
        {
            _data[_size] = '\0';
            return;
        }
        if (static_cast<std::size_t>(needed) < room)
        {
            _size += static_cast<std::size_t>(needed);
            return;
        }
        room = static_cast<std::size_t>(needed) + 1;
    }
}

} // namespace cimple
