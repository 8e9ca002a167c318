#include "runtime/Array.h"

#include "runtime/Memory.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <functional>
#include <limits>
#include <utility>

namespace cimple
{

/// Head of a representation; the elements lie directly behind it. A `cap` of 0 marks the shared empty one of
/// its traits, which is never written.
struct alignas(std::max_align_t) Array_Base::Rep
{
    const Array_Traits* traits;
    std::size_t size;
    std::size_t cap;

    char* elements() { return reinterpret_cast<char*>(this + 1); }
};

namespace
{

constexpr std::size_t first_capacity = 8;

/// By type code, then Instance pointers.
constexpr std::size_t num_known_traits = num_types + 1;
constexpr Array_Traits known_traits[num_known_traits] = {
    detail::make_array_traits<bool>(),         detail::make_array_traits<std::uint8_t>(),
    detail::make_array_traits<std::int8_t>(),  detail::make_array_traits<std::uint16_t>(),
    detail::make_array_traits<std::int16_t>(), detail::make_array_traits<std::uint32_t>(),
    detail::make_array_traits<std::int32_t>(), detail::make_array_traits<std::uint64_t>(),
    detail::make_array_traits<std::int64_t>(), detail::make_array_traits<float>(),
    detail::make_array_traits<double>(),       detail::make_array_traits<std::uint16_t>(),
    detail::make_array_traits<String>(),       detail::make_array_traits<Datetime>(),
    detail::make_array_traits<Instance*>(),
};

template <std::size_t... I> constexpr auto make_empty_reps(std::index_sequence<I...>)
{
    return std::array<Array_Base::Rep, sizeof...(I)>{Array_Base::Rep{&known_traits[I], 0, 0}...};
}

/// One per known traits record: most arrays of an instance stay empty and take no memory of their own.
constinit auto empty_reps = make_empty_reps(std::make_index_sequence<num_known_traits>());

bool is_known(const Array_Traits* traits)
{
    return !std::less<>()(traits, known_traits) && std::less<>()(traits, known_traits + num_known_traits);
}

/// Elements of the CIM types are plain values and handles; those of other types may point into themselves.
bool moves_as_bytes(const Array_Traits* traits)
{
    return !traits->construct || is_known(traits);
}

std::size_t block_size(const Array_Traits* traits, std::size_t capacity)
{
    constexpr std::size_t head = sizeof(Array_Base::Rep);
    CIMPLE_ASSERT(capacity <= (std::numeric_limits<std::size_t>::max() - head) / traits->element_size);
    return head + capacity * traits->element_size;
}

Array_Base::Rep* make_rep(const Array_Traits* traits, std::size_t capacity)
{
    return new (allocate(block_size(traits, capacity))) Array_Base::Rep{traits, 0, capacity};
}

void copy_construct(const Array_Traits* traits, void* element, const void* from)
{
    if (traits->construct)
        traits->construct(element, from);
    else
        std::memcpy(element, from, traits->element_size);
}

/// Moves `count` elements from `src` to `dst`, which is raw memory where the ranges do not overlap.
void relocate(const Array_Traits* traits, char* dst, char* src, std::size_t count)
{
    const std::size_t width = traits->element_size;
    if (moves_as_bytes(traits))
    {
        std::memmove(dst, src, count * width);
        return;
    }
    const bool backwards = std::less<>()(src, dst);
    for (std::size_t i = 0; i < count; ++i)
    {
        const std::size_t at = (backwards ? count - 1 - i : i) * width;
        traits->construct(dst + at, src + at);
        traits->destruct(src + at);
    }
}

bool equal_bytes_or_values(const Array_Traits* traits, const void* a, const void* b)
{
    return traits->equal ? traits->equal(a, b) : std::memcmp(a, b, traits->element_size) == 0;
}

} // namespace

const Array_Traits* array_traits(std::uint32_t type)
{
    CIMPLE_ASSERT(type < num_types);
    return &known_traits[type];
}

const Array_Traits* instance_array_traits()
{
    return &known_traits[num_types];
}

Array_Base::Array_Base(const Array_Traits* traits)
    : _rep(is_known(traits) ? &empty_reps[static_cast<std::size_t>(traits - known_traits)]
                            : make_rep(traits, first_capacity))
{}

Array_Base::Array_Base(const Array_Base& other) : Array_Base(other.traits())
{
    append(other.data(), other.size());
}

Array_Base::Array_Base(Array_Base&& other) noexcept : _rep(std::exchange(other._rep, nullptr)) {}

Array_Base::~Array_Base()
{
    if (!_rep || !owns_memory())
        return;
    destruct(0, _rep->size);
    std::free(_rep);
}

Array_Base& Array_Base::operator=(const Array_Base& other)
{
    if (this != &other)
        Array_Base(other).swap(*this);
    return *this;
}

Array_Base& Array_Base::operator=(Array_Base&& other) noexcept
{
    swap(other);
    return *this;
}

bool Array_Base::owns_memory() const
{
    return _rep->cap != 0;
}

const Array_Traits* Array_Base::traits() const
{
    return _rep->traits;
}

std::size_t Array_Base::size() const
{
    return _rep->size;
}

std::size_t Array_Base::capacity() const
{
    return owns_memory() ? _rep->cap : first_capacity;
}

void* Array_Base::data()
{
    return _rep->elements();
}

const void* Array_Base::data() const
{
    return _rep->elements();
}

void* Array_Base::at(std::size_t index)
{
    CIMPLE_ASSERT(index < _rep->size);
    return _rep->elements() + index * _rep->traits->element_size;
}

const void* Array_Base::at(std::size_t index) const
{
    return const_cast<Array_Base*>(this)->at(index);
}

bool Array_Base::holds(const void* element) const
{
    const char* first = _rep->elements();
    const char* last = first + _rep->size * _rep->traits->element_size;
    return !std::less<>()(element, static_cast<const void*>(first)) &&
           std::less<>()(element, static_cast<const void*>(last));
}

/// Moves the elements to a block for exactly `capacity` of them.
void Array_Base::take_memory(std::size_t capacity)
{
    const Array_Traits* traits = _rep->traits;
    if (owns_memory() && moves_as_bytes(traits))
    {
        _rep = static_cast<Rep*>(reallocate(_rep, block_size(traits, capacity)));
        _rep->cap = capacity;
        return;
    }
    Rep* rep = make_rep(traits, capacity);
    relocate(traits, rep->elements(), _rep->elements(), _rep->size);
    rep->size = _rep->size;
    if (owns_memory())
        std::free(_rep);
    _rep = rep;
}

/// Memory of its own for at least `capacity` elements.
void Array_Base::ensure(std::size_t capacity)
{
    if (!owns_memory())
        take_memory(std::max(capacity, first_capacity));
    else if (capacity > _rep->cap)
        take_memory(capacity);
}

void Array_Base::reserve(std::size_t capacity)
{
    if (capacity > this->capacity())
        ensure(capacity);
}

void Array_Base::destruct(std::size_t pos, std::size_t count)
{
    const Array_Traits* traits = _rep->traits;
    if (!traits->destruct)
        return;
    for (std::size_t i = pos; i < pos + count; ++i)
        traits->destruct(_rep->elements() + i * traits->element_size);
}

void Array_Base::resize(std::size_t size, const void* fill)
{
    const Array_Traits* traits = _rep->traits;
    if (size < _rep->size)
        return remove(size, _rep->size - size);
    if (size == _rep->size)
        return;
    if (fill && holds(fill))
    {
        const Array_Base copy(*this); // `fill` may move with the growth
        const auto distance = static_cast<const char*>(fill) - _rep->elements();
        return resize(size, static_cast<const char*>(copy.data()) + distance);
    }
    CIMPLE_ASSERT(fill || !traits->construct);
    ensure(size);
    for (; _rep->size < size; ++_rep->size)
    {
        char* element = _rep->elements() + _rep->size * traits->element_size;
        if (fill)
            copy_construct(traits, element, fill);
        else
            std::memset(element, 0, traits->element_size);
    }
}

void Array_Base::insert(std::size_t pos, const void* elements, std::size_t count)
{
    CIMPLE_ASSERT(pos <= _rep->size);
    if (count == 0)
        return;
    if (holds(elements))
    {
        Array_Base copy(_rep->traits); // `elements` may move with the growth
        copy.append(elements, count);
        return insert(pos, copy.data(), count);
    }
    const Array_Traits* traits = _rep->traits;
    const std::size_t width = traits->element_size;
    const std::size_t tail = _rep->size - pos;
    ensure(_rep->size + count);
    relocate(traits, _rep->elements() + (pos + count) * width, _rep->elements() + pos * width, tail);
    // Counted one by one: should a constructor throw, what lies behind the gap is lost but never freed twice.
    _rep->size = pos;
    for (std::size_t i = 0; i < count; ++i, ++_rep->size)
        copy_construct(traits, _rep->elements() + (pos + i) * width, static_cast<const char*>(elements) + i * width);
    _rep->size += tail;
}

void Array_Base::append(const void* elements, std::size_t count)
{
    insert(_rep->size, elements, count);
}

void Array_Base::prepend(const void* elements, std::size_t count)
{
    insert(0, elements, count);
}

void Array_Base::remove(std::size_t pos, std::size_t count)
{
    CIMPLE_ASSERT(pos <= _rep->size && count <= _rep->size - pos);
    if (count == 0)
        return;
    const std::size_t width = _rep->traits->element_size;
    char* gap = _rep->elements() + pos * width;
    destruct(pos, count);
    relocate(_rep->traits, gap, gap + count * width, _rep->size - pos - count);
    _rep->size -= count;
}

void Array_Base::clear()
{
    remove(0, _rep->size);
}

void Array_Base::swap(Array_Base& other) noexcept
{
    std::swap(_rep, other._rep);
}

std::ptrdiff_t Array_Base::find(const void* element) const
{
    const Array_Traits* traits = _rep->traits;
    for (std::size_t i = 0; i < _rep->size; ++i)
    {
        if (equal_bytes_or_values(traits, at(i), element))
            return traits->equal ? static_cast<std::ptrdiff_t>(i) : 1;
    }
    return -1;
}

bool Array_Base::equal(const Array_Base& other) const
{
    const Array_Traits* traits = _rep->traits;
    if (_rep->size != other._rep->size || traits->element_size != other._rep->traits->element_size)
        return false;
    for (std::size_t i = 0; i < _rep->size; ++i)
    {
        if (!equal_bytes_or_values(traits, at(i), other.at(i)))
            return false;
    }
    return true;
}

} // namespace cimple
