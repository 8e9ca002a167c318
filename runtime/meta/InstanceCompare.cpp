// Equality of instances: by key over related classes, and in full.
#include "runtime/meta/Instance.h"
#include "runtime/meta/InstanceSlots.h"

#include <algorithm>
#include <cstring>

namespace cimple
{
namespace
{

bool scalars_equal(const Instance* a, const Meta_Property* pa, const Instance* b, const Meta_Property* pb)
{
    switch (pa->type)
    {
    case STRING:
        return slot<String>(a, pa->offset) == slot<String>(b, pb->offset);
    case DATETIME:
        return slot<Datetime>(a, pa->offset) == slot<Datetime>(b, pb->offset);
    case REAL32:
        return slot<float>(a, pa->offset) == slot<float>(b, pb->offset);
    case REAL64:
        return slot<double>(a, pa->offset) == slot<double>(b, pb->offset);
    default:
        return std::memcmp(&slot<char>(a, pa->offset), &slot<char>(b, pb->offset), type_width(pa->type)) == 0;
    }
}

/// Both null, or both not null and of equal value. The properties have one type and subscript.
bool properties_equal(const Instance* a, const Meta_Property* pa, const Instance* b, const Meta_Property* pb)
{
    const bool is_null = null_byte(a, pa) != 0;
    if (is_null != (null_byte(b, pb) != 0))
        return false;
    if (is_null)
        return true;
    return pa->subscript == 0 ? scalars_equal(a, pa, b, pb)
                              : array_slot(a, pa->offset).equal(array_slot(b, pb->offset));
}

bool referents_equal(const Instance* a, const Meta_Reference* ra, const Instance* b, const Meta_Reference* rb)
{
    const Instance* to_a = reference_slot(a, ra);
    const Instance* to_b = reference_slot(b, rb);
    return to_a && to_b ? key_eq(to_a, to_b) : to_a == to_b;
}

/// properties_equal() for the usual key: searches of long lists spend their time here.
bool string_keys_equal(const Instance* a, const Instance* b, std::uint32_t offset)
{
    const auto& x = slot<Property<String>>(a, offset);
    const auto& y = slot<Property<String>>(b, offset);
    return x.is_null() == y.is_null() && (x.is_null() || x.value.shares(y.value) || x.value == y.value);
}

/// Compares a key that both classes describe by one record. A reference array is no part of the key.
bool shared_keys_equal(const Instance* a, const Instance* b, const Meta_Feature* mf)
{
    if (const Meta_Property* mp = as_property(mf))
        return mp->type == STRING && mp->subscript == 0 ? string_keys_equal(a, b, mp->offset)
                                                        : properties_equal(a, mp, b, mp);
    const Meta_Reference* mr = as_single_reference(mf);
    return !mr || referents_equal(a, mr, b, mr);
}

bool key_properties_equal(const Instance* a, const Meta_Property* pa, const Instance* b)
{
    const Meta_Property* pb = as_property(find_feature(b->__meta_class, pa->name, META_PROPERTY));
    return pb && (pb->flags & META_KEY) && pa->type == pb->type && pa->subscript == pb->subscript &&
           properties_equal(a, pa, b, pb);
}

bool key_references_equal(const Instance* a, const Meta_Reference* ra, const Instance* b)
{
    const Meta_Feature* mf = find_feature(b->__meta_class, ra->name, META_REFERENCE);
    const Meta_Reference* rb = mf && (mf->flags & META_KEY) ? as_single_reference(mf) : nullptr;
    return rb && (is_subclass(ra->meta_class, rb->meta_class) || is_subclass(rb->meta_class, ra->meta_class)) &&
           referents_equal(a, ra, b, rb);
}

/// Compares a key of a's class with the key of its name in b's, which may be of another kind or missing.
bool named_keys_equal(const Instance* a, const Instance* b, const Meta_Feature* mf)
{
    if (const Meta_Property* mp = as_property(mf))
        return key_properties_equal(a, mp, b);
    const Meta_Reference* mr = as_single_reference(mf);
    return !mr || key_references_equal(a, mr, b);
}

/// Compares the key at one place of a's features with the key of the same name in b. Related classes have their common
/// features at one position: only overrides and strangers need a search.
bool keys_equal_at(const Instance* a, const Instance* b, std::size_t index)
{
    const Meta_Feature* mf = features_of(a)[index];
    const auto others = features_of(b);
    const bool shared = index < others.size() && others[index] == mf;
    return shared ? shared_keys_equal(a, b, mf) : named_keys_equal(a, b, mf);
}

bool both_null_or_identical(const Instance* a, const Instance* b)
{
    return a && b ? identical(a, b) : a == b;
}

bool features_identical(const Instance* a, const Instance* b, const Meta_Feature* mf)
{
    if (const Meta_Property* mp = as_property(mf))
        return properties_equal(a, mp, b, mp);
    if (const Meta_Reference* mr = as_single_reference(mf))
        return both_null_or_identical(reference_slot(a, mr), reference_slot(b, mr));
    const Meta_Reference* mr = as_reference(mf);
    if (!mr)
        return true; // methods take no room
    const auto in_a = references_in(a, mr);
    const auto in_b = references_in(b, mr);
    return null_byte(a, mr) == null_byte(b, mr) &&
           std::equal(in_a.begin(), in_a.end(), in_b.begin(), in_b.end(), both_null_or_identical);
}

/// Whether the bytes of a slot tell equality. Elements lie elsewhere, and a NaN does not equal itself.
bool is_told_by_bytes(const Meta_Feature* mf)
{
    return slot_kind(mf) == Slot_Kind::scalar && as_property(mf)->type != REAL32 && as_property(mf)->type != REAL64;
}

/// Quick answer for copies, which share texts and times: true only for equal instances of one class.
bool same_bytes(const Instance* a, const Instance* b)
{
    const auto equal = [&](std::uint32_t from, std::uint32_t to)
    { return from >= to || std::memcmp(&slot<char>(a, from), &slot<char>(b, from), to - from) == 0; };
    std::uint32_t from = sizeof(Instance); // of what is not compared yet
    for (const Meta_Feature* mf : features_of(a))
    {
        if ((mf->flags & META_METHOD) || is_told_by_bytes(mf))
            continue;
        const Meta_Property* mp = as_property(mf);
        const std::uint32_t at = mp ? mp->offset : as_reference(mf)->offset;
        if (at < from || !equal(from, at) || !features_identical(a, b, mf))
            return false;
        from = at + sizeof(void*);
    }
    return equal(from, static_cast<std::uint32_t>(a->__meta_class->size));
}

} // namespace

bool key_eq(const Instance* a, const Instance* b)
{
    return all_keys(a->__meta_class, [a, b](std::size_t index) { return keys_equal_at(a, b, index); });
}

bool identical(const Instance* a, const Instance* b)
{
    if (a->__meta_class != b->__meta_class || a->__name_space != b->__name_space)
        return false;
    if (same_bytes(a, b))
        return true;
    const auto features = features_of(a);
    return std::all_of(features.begin(), features.end(),
                       [a, b](const Meta_Feature* mf) { return features_identical(a, b, mf); });
}

} // namespace cimple
