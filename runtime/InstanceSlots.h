// Where the features of an instance lie: the one place that turns a meta record into memory of the instance.
//
//   scalar property    the value, then its null byte
//   array property     an array handle, then its null byte
//   single reference   a pointer; null is null, there is no byte
//   reference array    an array of Instance pointers, then its null byte
#pragma once

#include "runtime/Array.h"
#include "runtime/Instance.h"
#include "runtime/Meta.h"

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

} // namespace cimple
