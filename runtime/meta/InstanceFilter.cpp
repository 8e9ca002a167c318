// Which features of an instance are null, and copying by that.
#include "runtime/meta/Instance.h"
#include "runtime/meta/InstanceSlots.h"

#include <cstring>
#include <utility>

namespace cimple
{
namespace
{

void copy_scalar(Instance* dest, const Instance* src, const Meta_Property* mp)
{
    if (mp->type == STRING)
        slot<String>(dest, mp->offset) = slot<String>(src, mp->offset);
    else if (mp->type == DATETIME)
        slot<Datetime>(dest, mp->offset) = slot<Datetime>(src, mp->offset);
    else
        std::memcpy(&slot<char>(dest, mp->offset), &slot<char>(src, mp->offset), type_width(mp->type));
    null_byte(dest, mp) = null_byte(src, mp);
}

template <Copy_Referent copy_referent>
void copy_references(Instance* dest, const Instance* src, const Meta_Reference* mr)
{
    Reference_List elements;
    elements.append_copies(references_in(src, mr), copy_referent);
    elements.swap(array_slot(dest, mr->offset));
    null_byte(dest, mr) = null_byte(src, mr);
}

template <Copy_Referent copy_referent> void copy_feature(Instance* dest, const Instance* src, const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
        copy_scalar(dest, src, static_cast<const Meta_Property*>(mf));
        break;
    case Slot_Kind::array:
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        array_slot(dest, mp->offset) = array_slot(src, mp->offset);
        null_byte(dest, mp) = null_byte(src, mp);
        break;
    }
    case Slot_Kind::reference:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        unref(std::exchange(reference_slot(dest, mr), copy_referent(reference_slot(src, mr))));
        break;
    }
    case Slot_Kind::reference_array:
        copy_references<copy_referent>(dest, src, static_cast<const Meta_Reference*>(mf));
        break;
    case Slot_Kind::none:
        break;
    }
}

/// Gives a null single reference an empty instance of its class.
void fill_reference(Instance* instance, const Meta_Reference* mr)
{
    Instance*& referent = reference_slot(instance, mr);
    if (!referent)
        referent = create(mr->meta_class, false);
}

/// Makes a property or reference readable again.
void make_non_null(Instance* instance, const Meta_Feature* mf)
{
    if (const Meta_Property* mp = as_property(mf))
        null_byte(instance, mp) = 0;
    else if (const Meta_Reference* mr = as_single_reference(mf))
        fill_reference(instance, mr);
    else
        null_byte(instance, as_reference(mf)) = 0;
}

} // namespace

void nullify(Instance* instance, bool keys, bool non_keys, std::uint8_t value)
{
    for (const Meta_Feature* mf : features_of(instance))
    {
        const Meta_Property* mp = as_property(mf);
        if (mp && (mp->flags & META_KEY ? keys : non_keys))
            null_byte(instance, mp) = value;
    }
}

bool keys_non_null(const Instance* instance)
{
    const auto features = features_of(instance);
    return all_keys(instance->__meta_class,
                    [&](std::size_t index)
                    {
                        const Meta_Feature* mf = features[index];
                        return slot_kind(mf) == Slot_Kind::reference_array || !is_null(instance, mf);
                    });
}

int filter_properties(Instance* instance, const char* const* names, bool keep_keys)
{
    if (!names)
    {
        nullify(instance, true, true, 0);
        return 0;
    }
    nullify(instance, !keep_keys, true, 1);
    for (; *names; ++names)
    {
        const Meta_Feature* mf = find_feature(instance->__meta_class, *names, any_feature);
        if (!mf || (mf->flags & META_KEY))
            continue;
        if (mf->flags & META_METHOD)
            return -1;
        make_non_null(instance, mf);
    }
    return 0;
}

void copy(Instance* dest, const Instance* src, const Instance* model, bool keys_only)
{
    if (dest == src || dest->__meta_class != src->__meta_class || (model && model->__meta_class != dest->__meta_class))
        return;
    for (const Meta_Feature* mf : features_of(dest))
        if ((!keys_only || (mf->flags & META_KEY)) && (!model || !is_null(model, mf)))
            copy_feature<clone>(dest, src, mf);
}

Instance* clone_keys(const Instance* instance, Ref<>& blank)
{
    if (!instance)
        return nullptr;
    const Meta_Class* mc = instance->__meta_class;
    if (!blank || blank->__meta_class != mc)
    {
        blank.reset(create(mc));
        clear(blank.get());
    }
    Ref<> copied(clone_empty(blank.get()));
    copied->__name_space = instance->__name_space;
    for_each_key(mc, [&](const Meta_Feature* key) { copy_feature<share_referent>(copied.get(), instance, key); });
    return copied.release();
}

void create_ref_children(Instance* instance)
{
    for (const Meta_Feature* mf : features_of(instance))
        if (const Meta_Reference* mr = as_single_reference(mf))
            fill_reference(instance, mr);
}

} // namespace cimple
