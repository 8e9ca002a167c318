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

/// The feature of b's class that answers to feature `index` of a's. Related classes share records in the same
/// position, so that the search by name is left to classes that override or are strangers.
const Meta_Feature* counterpart(const Instance* b, const Meta_Feature* mf, std::size_t index, std::uint32_t mask)
{
    const auto features = features_of(b);
    return index < features.size() && features[index] == mf ? mf : find_feature(b->__meta_class, mf->name, mask);
}

bool key_properties_equal(const Instance* a, const Meta_Property* pa, const Instance* b, std::size_t index)
{
    const Meta_Feature* mf = counterpart(b, pa, index, META_PROPERTY);
    if (!mf || !(mf->flags & META_KEY))
        return false;
    const auto* pb = static_cast<const Meta_Property*>(mf);
    return pa->type == pb->type && pa->subscript == pb->subscript && properties_equal(a, pa, b, pb);
}

bool key_references_equal(const Instance* a, const Meta_Reference* ra, const Instance* b, std::size_t index)
{
    const Meta_Feature* mf = counterpart(b, ra, index, META_REFERENCE);
    if (!mf || !(mf->flags & META_KEY) || slot_kind(mf) != Slot_Kind::reference)
        return false;
    const auto* rb = static_cast<const Meta_Reference*>(mf);
    if (!is_subclass(ra->meta_class, rb->meta_class) && !is_subclass(rb->meta_class, ra->meta_class))
        return false;
    const Instance* to_a = reference_slot(a, ra);
    const Instance* to_b = reference_slot(b, rb);
    return to_a && to_b ? key_eq(to_a, to_b) : to_a == to_b;
}

bool key_features_equal(const Instance* a, const Meta_Feature* mf, const Instance* b, std::size_t index)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
    case Slot_Kind::array:
        return key_properties_equal(a, static_cast<const Meta_Property*>(mf), b, index);
    case Slot_Kind::reference:
        return key_references_equal(a, static_cast<const Meta_Reference*>(mf), b, index);
    case Slot_Kind::reference_array: // no part of the key
    case Slot_Kind::none:
        return true;
    }
    return true;
}

/// Number of keys after which a class has no more; parameter records do not count theirs.
std::size_t keys_to_expect(const Meta_Class* mc)
{
    return mc->flags & META_METHOD ? mc->num_meta_features : mc->num_keys;
}

bool both_null_or_identical(const Instance* a, const Instance* b)
{
    return a && b ? identical(a, b) : a == b;
}

bool features_identical(const Instance* a, const Instance* b, const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
    case Slot_Kind::array:
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        return properties_equal(a, mp, b, mp);
    }
    case Slot_Kind::reference:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        return both_null_or_identical(reference_slot(a, mr), reference_slot(b, mr));
    }
    case Slot_Kind::reference_array:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        const auto in_a = references_in(a, mr);
        const auto in_b = references_in(b, mr);
        return null_byte(a, mr) == null_byte(b, mr) &&
               std::equal(in_a.begin(), in_a.end(), in_b.begin(), in_b.end(), both_null_or_identical);
    }
    case Slot_Kind::none:
        return true;
    }
    return true;
}

} // namespace

bool key_eq(const Instance* a, const Instance* b)
{
    const auto features = features_of(a);
    std::size_t keys_left = keys_to_expect(a->__meta_class);
    for (std::size_t i = 0; i < features.size() && keys_left != 0; ++i)
    {
        if (!(features[i]->flags & META_KEY))
            continue;
        if (!key_features_equal(a, features[i], b, i))
            return false;
        --keys_left;
    }
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
