#include "runtime/values/Array.h"

#include "runtime/base/Assert.h"
#include "runtime/base/Memory.h"

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
struct Array_Base::Rep
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
constexpr auto known_traits = with_all_types(
    [](auto... code) {
        return std::array{detail::make_array_traits<Slot_Type<code>>()..., detail::make_array_traits<Instance*>()};
    });

template <std::size_t... I> constexpr auto make_empty_reps(std::index_sequence<I...>)
{
    return std::array<Array_Base::Rep, sizeof...(I)>{Array_Base::Rep{&known_traits[I], 0, 0}...};
}

/// One per known traits record: most arrays of an instance stay empty and take no memory of their own.
constinit auto empty_reps = make_empty_reps(std::make_index_sequence<known_traits.size()>());

bool is_known(const Array_Traits* traits)
{
    return !std::less<>()(traits, known_traits.begin()) && std::less<>()(traits, known_traits.end());
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

void destruct_elements(Array_Base::Rep* rep, std::size_t pos, std::size_t count)
{
    const Array_Traits* traits = rep->traits;
    if (!traits->destruct)
        return;
    for (std::size_t i = pos; i < pos + count; ++i)
        traits->destruct(rep->elements() + i * traits->element_size);
}

void drop(Array_Base::Rep* rep)
{
    destruct_elements(rep, 0, rep->size);
    deallocate(rep);
}

/// A representation in the making: it dies with its elements unless it is taken.
class Draft
{
public:
    Draft(const Array_Traits* traits, std::size_t capacity) : _rep(make_rep(traits, capacity)) {}
    ~Draft()
    {
        if (_rep)
            drop(_rep);
    }
    Draft(const Draft&) = delete;
    Draft& operator=(const Draft&) = delete;

    void append(const void* elements, std::size_t count)
    {
        const std::size_t width = _rep->traits->element_size;
        for (std::size_t i = 0; i < count; ++i, ++_rep->size)
            copy_construct(_rep->traits, _rep->elements() + _rep->size * width,
                           static_cast<const char*>(elements) + i * width);
    }
    Array_Base::Rep* take() { return std::exchange(_rep, nullptr); }

private:
    Array_Base::Rep* _rep;
};

Array_Base::Rep* fresh_rep(const Array_Traits* traits)
{
    return is_known(traits) ? &empty_reps[static_cast<std::size_t>(traits - known_traits.data())]
                            : make_rep(traits, first_capacity);
}

Array_Base::Rep* filled_rep(const Array_Traits* traits, const void* elements, std::size_t count)
{
    if (count == 0)
        return fresh_rep(traits);
    Draft draft(traits, count); // most are never added to
    draft.append(elements, count);
    return draft.take();
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

Array_Base::Array_Base(const Array_Traits* traits) : _rep(fresh_rep(traits)) {}

Array_Base::Array_Base(const Array_Traits* traits, const void* elements, std::size_t count)
    : _rep(filled_rep(traits, elements, count))
{}

Array_Base::Array_Base(const Array_Base& other) : Array_Base(other.traits(), other.data(), other.size()) {}

Array_Base::Array_Base(Array_Base&& other) noexcept : _rep(std::exchange(other._rep, nullptr)) {}

Array_Base::~Array_Base()
{
    if (!_rep || !owns_memory())
        return;
    drop(_rep);
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
        _rep = static_cast<Rep*>(reallocate(_rep, block_size(traits, _rep->size), block_size(traits, capacity)));
        _rep->cap = capacity;
        return;
    }
    Draft moved(traits, capacity);
    moved.append(_rep->elements(), _rep->size);
    replace(moved.take());
}

void Array_Base::replace(Rep* rep)
{
    if (owns_memory())
        drop(_rep);
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
    if (tail != 0 && !moves_as_bytes(traits))
        return rebuild(pos, 0, elements, count);
    ensure(_rep->size + count);
    char* gap = _rep->elements() + pos * width;
    std::memmove(gap + count * width, gap, tail * width);
    // Counted one by one: a copy that throws keeps what was appended. Elements that move as bytes copy without
    // throwing.
    _rep->size = pos;
    for (std::size_t i = 0; i < count; ++i, ++_rep->size)
        copy_construct(traits, gap + i * width, static_cast<const char*>(elements) + i * width);
    _rep->size += tail;
}

/// A copy with `removed` elements at `pos` replaced by `count` others takes the place of this array.
void Array_Base::rebuild(std::size_t pos, std::size_t removed, const void* elements, std::size_t count)
{
    const std::size_t behind = pos + removed;
    Draft copy(_rep->traits, std::max(_rep->cap, _rep->size - removed + count));
    copy.append(_rep->elements(), pos);
    copy.append(elements, count);
    copy.append(_rep->elements() + behind * _rep->traits->element_size, _rep->size - behind);
    replace(copy.take());
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
    const std::size_t tail = _rep->size - pos - count;
    if (tail != 0 && !moves_as_bytes(_rep->traits))
        return rebuild(pos, count, nullptr, 0);
    char* gap = _rep->elements() + pos * width;
    destruct_elements(_rep, pos, count);
    std::memmove(gap, gap + count * width, tail * width);
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
        if (equal_bytes_or_values(traits, at(i), element))
            return traits->equal ? static_cast<std::ptrdiff_t>(i) : 1;
    return -1;
}

bool Array_Base::equal(const Array_Base& other) const
{
    const Array_Traits* traits = _rep->traits;
    if (_rep->size != other._rep->size || traits->element_size != other._rep->traits->element_size)
        return false;
    for (std::size_t i = 0; i < _rep->size; ++i)
        if (!equal_bytes_or_values(traits, at(i), other.at(i)))
            return false;
    return true;
}

} // namespace cimple
