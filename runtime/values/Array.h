// Untyped array core with a thin typed front. Arrays are deep-copied when assigned; they are not shared.
#pragma once

#include "runtime/values/Types.h"

#include <concepts>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <type_traits>

namespace cimple
{

/// How to treat elements; a null function means that bytes are enough.
struct Array_Traits
{
    std::size_t element_size;
    void (*construct)(void* element, const void* from); ///< copy-construct
    void (*destruct)(void* element);
    bool (*equal)(const void* a, const void* b);
};

/// A single pointer to `traits`, `size`, `cap` and the elements. A fresh array has room for 8 elements; that of
/// a CIM type takes the memory with the first element. A reservation above `cap` reallocates to exactly the
/// requested count, not to a doubled one. Positions and counts outside the array are asserted. Where memory is
/// missing or an element's copy throws, the array holds what it held, or the first part of what was appended.
class Array_Base
{
public:
    explicit Array_Base(const Array_Traits* traits);
    Array_Base(const Array_Traits* traits, const void* elements, std::size_t count);
    Array_Base(const Array_Base& other);
    Array_Base(Array_Base&& other) noexcept; // leaves `other` without a representation: destroy or assign only
    ~Array_Base();
    Array_Base& operator=(const Array_Base& other);
    Array_Base& operator=(Array_Base&& other) noexcept;

    const Array_Traits* traits() const;
    std::size_t size() const;
    std::size_t capacity() const;
    void* data();
    const void* data() const;
    void* at(std::size_t index);
    const void* at(std::size_t index) const;

    void reserve(std::size_t capacity);
    /// New elements are copies of `fill`, or zero-filled when the type has no constructor and `fill` is null.
    void resize(std::size_t size, const void* fill = nullptr);
    void insert(std::size_t pos, const void* elements, std::size_t count);
    void append(const void* elements, std::size_t count = 1);
    void prepend(const void* elements, std::size_t count = 1);
    void remove(std::size_t pos, std::size_t count = 1);
    void clear();
    void swap(Array_Base& other) noexcept;

    /// Index of an equal element or -1. Without an equality function the bytes are compared and a hit
    /// returns 1, whatever the index: callers test that case only for -1.
    std::ptrdiff_t find(const void* element) const;
    /// Same size and equal elements.
    bool equal(const Array_Base& other) const;

    struct Rep;

private:
    bool owns_memory() const;
    bool holds(const void* element) const;
    void take_memory(std::size_t capacity);
    void ensure(std::size_t capacity);
    void replace(Rep* rep);
    void rebuild(std::size_t pos, std::size_t removed, const void* elements, std::size_t count);

    Rep* _rep;
};

class Instance;

/// Traits by CIM type code, and those of Instance pointers (plain pointers: no counting).
const Array_Traits* array_traits(std::uint32_t type);
const Array_Traits* instance_array_traits();

namespace detail
{

template <class T> void construct_element(void* element, const void* from)
{
    std::construct_at(static_cast<T*>(element), *static_cast<const T*>(from));
}

template <class T> void destruct_element(void* element)
{
    std::destroy_at(static_cast<T*>(element));
}

template <class T> bool equal_elements(const void* a, const void* b)
{
    return *static_cast<const T*>(a) == *static_cast<const T*>(b);
}

/// Functions only where bytes are not enough.
template <class T> constexpr Array_Traits make_array_traits()
{
    static_assert(alignof(T) <= alignof(void*), "elements lie behind the head of a representation");
    Array_Traits traits{sizeof(T), nullptr, nullptr, nullptr};
    if constexpr (!std::is_trivially_copyable_v<T>)
    {
        traits.construct = construct_element<T>;
        traits.destruct = destruct_element<T>;
        if constexpr (std::equality_comparable<T>)
            traits.equal = equal_elements<T>;
    }
    return traits;
}

template <class T> inline constexpr Array_Traits generic_array_traits = make_array_traits<T>();

} // namespace detail

/// Traits of T: those of the CIM type or of Instance pointers where T is one, generic ones otherwise.
template <class T> const Array_Traits* array_traits_of()
{
    if constexpr (cim_type_of<T> >= 0)
        return array_traits(cim_type_of<T>);
    else if constexpr (std::is_same_v<T, Instance*>)
        return instance_array_traits();
    else
        return &detail::generic_array_traits<T>;
}

template <class T> class Array : public Array_Base
{
public:
    Array() : Array_Base(array_traits_of<T>()) {}
    Array(std::initializer_list<T> elements) : Array_Base(array_traits_of<T>(), elements.begin(), elements.size()) {}

    T* data() { return static_cast<T*>(Array_Base::data()); }
    const T* data() const { return static_cast<const T*>(Array_Base::data()); }
    T& operator[](std::size_t index) { return *static_cast<T*>(Array_Base::at(index)); }
    const T& operator[](std::size_t index) const { return *static_cast<const T*>(Array_Base::at(index)); }
    T* begin() { return data(); }
    T* end() { return data() + size(); }
    const T* begin() const { return data(); }
    const T* end() const { return data() + size(); }

    void append(const T& element) { Array_Base::append(&element); }
    /// New elements are value-initialised, or copies of `fill`.
    void resize(std::size_t size)
    {
        const T fill{};
        Array_Base::resize(size, &fill);
    }
    void resize(std::size_t size, const T* fill) { Array_Base::resize(size, fill); }
    void append(const T* elements, std::size_t count) { Array_Base::append(elements, count); }
    void prepend(const T& element) { Array_Base::prepend(&element); }
    void insert(std::size_t pos, const T& element) { Array_Base::insert(pos, &element, 1); }
    std::ptrdiff_t find(const T& element) const { return Array_Base::find(&element); }
    bool operator==(const Array& other) const { return equal(other); }
};

} // namespace cimple
