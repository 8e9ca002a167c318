// Equality of instances: by key over related classes, and in full.
#include "runtime/Instance.h"
#include "runtime/InstanceSlots.h"

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

} // namespace

bool key_eq(const Instance* a, const Instance* b)
{
    const Meta_Class* mc = a->__meta_class;
    if (!(mc->flags & META_METHOD) && mc->keys) // parameter records stand on their method, which lists no keys
        return std::all_of(mc->keys, mc->keys + mc->num_keys,
                           [a, b](std::uint16_t index) { return keys_equal_at(a, b, index); });
    const auto features = features_of(a);
    for (std::size_t i = 0; i < features.size(); ++i)
        if ((features[i]->flags & META_KEY) && !keys_equal_at(a, b, i))
            return false;
    return true;
}

bool identical(const Instance* a, const Instance* b)
{
    if (a->__meta_class != b->__meta_class || a->__name_space != b->__name_space)
        return false;
    const auto features = features_of(a);
    return std::all_of(features.begin(), features.end(),
                       [a, b](const Meta_Feature* mf) { return features_identical(a, b, mf); });
}

} // namespace cimple
