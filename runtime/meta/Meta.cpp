#include "runtime/meta/Meta.h"

#include "runtime/meta/Instance.h"

#include <algorithm>
#include <iterator>

namespace cimple
{
namespace
{

bool is_root(const Meta_Class* mc)
{
    return mc == &Instance::static_meta_class || eqi(mc->name, Instance::static_meta_class.name);
}

/// The first of `mc` and its superclasses that is named `name`; null if none is.
const Meta_Class* find_in_chain(const Meta_Class* mc, const char* name)
{
    while (mc && !eqi(mc->name, name))
        mc = mc->super_meta_class;
    return mc;
}

} // namespace

const char* flag_name(unsigned bit)
{
    return bit < std::size(flag_names) ? flag_names[bit] : nullptr;
}

int flag_bit(const char* name)
{
    const auto found = std::find_if(std::begin(flag_names), std::end(flag_names),
                                    [name](const char* flag) { return eqi(flag, name); });
    return found == std::end(flag_names) ? -1 : static_cast<int>(found - std::begin(flag_names));
}

const Meta_Feature* find_feature(const Meta_Record* mc, const char* name, std::uint32_t mask)
{
    for (std::size_t i = 0; i < mc->num_meta_features; ++i)
    {
        const Meta_Feature* mf = mc->meta_features[i];
        if ((mf->flags & mask) && eqi(mf->name, name))
            return mf;
    }
    return nullptr;
}

const Meta_Class* find_class(const Meta_Repository* repository, const char* name)
{
    if (!repository)
        return nullptr;
    for (std::size_t i = 0; i < repository->num_meta_classes; ++i)
        if (eqi(repository->meta_classes[i]->name, name))
            return repository->meta_classes[i];
    return nullptr;
}

const Meta_Class* find_class_in_chain(const Meta_Class* mc, const char* name)
{
    if (!mc)
        return nullptr;
    const Meta_Class* found = find_in_chain(mc, name);
    return found ? found : find_class(mc->meta_repository, name);
}

bool is_subclass(const Meta_Class* ancestor, const Meta_Class* descendant)
{
    if (!ancestor || !descendant)
        return false;
    if (is_root(ancestor))
        return true;
    for (const Meta_Class* mc = descendant; mc; mc = mc->super_meta_class)
        if (mc == ancestor || eqi(mc->name, ancestor->name))
            return true;
    return false;
}

int is_subclass_by_name(const Meta_Repository* repository, const char* ancestor, const char* descendant)
{
    if (!repository || !ancestor || !descendant)
        return -1;
    const Meta_Class* above = find_class(repository, ancestor);
    const Meta_Class* below = find_class(repository, descendant);
    if (!above || !below)
        return -1;
    return is_subclass(above, below) ? 0 : 1;
}

bool is_or_derives_from(const Meta_Class* mc, const char* name)
{
    return find_in_chain(mc, name) != nullptr;
}

bool fits_class(const Meta_Class* mc, const char* filter)
{
    return !filter || !*filter || is_or_derives_from(mc, filter);
}

bool has_flag(const Meta_Record* mc, std::uint32_t mask)
{
    return std::any_of(mc->meta_features, mc->meta_features + mc->num_meta_features,
                       [mask](const Meta_Feature* mf) { return (mf->flags & mask) != 0; });
}

} // namespace cimple
