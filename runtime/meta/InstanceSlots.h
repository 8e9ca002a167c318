// Where the features of an instance lie: the one place that turns a meta record into memory of the instance.
//
//   scalar property    the value, then its null byte
//   array property     an array handle, then its null byte
//   single reference   a pointer; null is null, there is no byte
//   reference array    an array of Instance pointers, then its null byte
#pragma once

#include "runtime/meta/Instance.h"
#include "runtime/meta/Meta.h"
#include "runtime/values/Array.h"

#include <algorithm>
#include <span>

namespace cimple
{

enum class Slot_Kind
{
    none, ///< methods take no room
    scalar,
    array,
    reference,
    reference_array,
};

inline Slot_Kind slot_kind(const Meta_Feature* mf)
{
    if (mf->flags & META_PROPERTY)
        return static_cast<const Meta_Property*>(mf)->subscript == 0 ? Slot_Kind::scalar : Slot_Kind::array;
    if (mf->flags & META_REFERENCE)
        return static_cast<const Meta_Reference*>(mf)->subscript == 0 ? Slot_Kind::reference
                                                                      : Slot_Kind::reference_array;
    return Slot_Kind::none;
}

/// The single reference that a feature is; null for all others.
inline const Meta_Reference* as_single_reference(const Meta_Feature* mf)
{
    return slot_kind(mf) == Slot_Kind::reference ? static_cast<const Meta_Reference*>(mf) : nullptr;
}

inline std::span<const Meta_Feature* const> features_of(const Meta_Record* record)
{
    return {record->meta_features, record->num_meta_features};
}

inline std::span<const Meta_Feature* const> features_of(const Instance* instance)
{
    return features_of(instance->__meta_class);
}

/// True if `test(index)` holds for the index of each key among the features; stops at the first for which it does not.
template <class Test> bool all_keys(const Meta_Record* record, Test test)
{
    // Parameter records stand on their method, which lists no keys.
    const auto* mc = record->flags & META_METHOD ? nullptr : static_cast<const Meta_Class*>(record);
    if (mc && mc->keys)
        return std::all_of(mc->keys, mc->keys + mc->num_keys, test);
    const auto features = features_of(record);
    for (std::size_t i = 0; i < features.size(); ++i)
        if ((features[i]->flags & META_KEY) && !test(i))
            return false;
    return true;
}

/// Calls `use(feature)` for each key.
template <class Use> void for_each_key(const Meta_Record* record, Use use)
{
    all_keys(record, [&](std::size_t index) { return use(features_of(record)[index]), true; });
}

/// The slot of a feature as a T, which must be what lies there.
template <class T> T& slot(Instance* instance, std::uint32_t offset)
{
    return *reinterpret_cast<T*>(reinterpret_cast<char*>(instance) + offset);
}
template <class T> const T& slot(const Instance* instance, std::uint32_t offset)
{
    return *reinterpret_cast<const T*>(reinterpret_cast<const char*>(instance) + offset);
}

inline Array_Base& array_slot(Instance* instance, std::uint32_t offset)
{
    return slot<Array_Base>(instance, offset);
}
inline const Array_Base& array_slot(const Instance* instance, std::uint32_t offset)
{
    return slot<Array_Base>(instance, offset);
}

inline Instance*& reference_slot(Instance* instance, const Meta_Reference* mr)
{
    return slot<Instance*>(instance, mr->offset);
}
inline const Instance* reference_slot(const Instance* instance, const Meta_Reference* mr)
{
    return slot<Instance*>(instance, mr->offset);
}

/// Elements of a reference array; each may be null.
inline std::span<Instance* const> references_in(const Instance* instance, const Meta_Reference* mr)
{
    const Array_Base& array = array_slot(instance, mr->offset);
    return {static_cast<Instance* const*>(array.data()), array.size()};
}

/// Makes what the copy of a reference holds.
using Copy_Referent = Instance*(const Instance* referent);

inline Instance* share_referent(const Instance* referent)
{
    return const_cast<Instance*>(ref(referent));
}

/// A copy of an instance whose texts, times, arrays and references are all empty: nothing of it is counted, and bytes
/// are enough.
Instance* clone_empty(const Instance* instance);

/// Counted instances for the slot of a reference array: what does not get there is released.
class Reference_List
{
public:
    Reference_List() = default;
    ~Reference_List()
    {
        for (const Instance* element : _elements)
            unref(element);
    }
    Reference_List(const Reference_List&) = delete;
    Reference_List& operator=(const Reference_List&) = delete;

    void reserve(std::size_t capacity) { _elements.reserve(capacity); }
    void append(Ref<> element)
    {
        _elements.append(element.get());
        static_cast<void>(element.release());
    }
    void append_copies(std::span<Instance* const> elements, Copy_Referent copy)
    {
        reserve(_elements.size() + elements.size());
        for (const Instance* element : elements)
            append(Ref<>(copy(element)));
    }
    /// Takes the former elements of the slot in exchange.
    void swap(Array_Base& slot) { _elements.swap(slot); }

private:
    Array<Instance*> _elements;
};

inline std::uint32_t null_offset(const Meta_Property* mp)
{
    return mp->offset + (mp->subscript == 0 ? type_widths[mp->type] : static_cast<std::uint32_t>(sizeof(Array_Base)));
}

/// Null byte of a property, or of a reference array (a single reference has none).
inline std::uint8_t& null_byte(Instance* instance, const Meta_Property* mp)
{
    return slot<std::uint8_t>(instance, null_offset(mp));
}
inline std::uint8_t null_byte(const Instance* instance, const Meta_Property* mp)
{
    return slot<std::uint8_t>(instance, null_offset(mp));
}
inline std::uint8_t& null_byte(Instance* instance, const Meta_Reference* mr)
{
    return slot<std::uint8_t>(instance, mr->offset + static_cast<std::uint32_t>(sizeof(Array_Base)));
}
inline std::uint8_t null_byte(const Instance* instance, const Meta_Reference* mr)
{
    return slot<std::uint8_t>(instance, mr->offset + static_cast<std::uint32_t>(sizeof(Array_Base)));
}

/// A method counts as null.
inline bool is_null(const Instance* instance, const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
    case Slot_Kind::array:
        return null_byte(instance, static_cast<const Meta_Property*>(mf)) != 0;
    case Slot_Kind::reference:
        return reference_slot(instance, static_cast<const Meta_Reference*>(mf)) == nullptr;
    case Slot_Kind::reference_array:
        return null_byte(instance, static_cast<const Meta_Reference*>(mf)) != 0;
    case Slot_Kind::none:
        break;
    }
    return true;
}

} // namespace cimple
