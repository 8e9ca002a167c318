// Following references: the depth-first walk, and the ends of associations.
#include "runtime/meta/Instance.h"
#include "runtime/meta/InstanceSlots.h"

namespace cimple
{
namespace
{

struct Name_Space_Setter
{
    String name_space; // one text for all
    bool force;
};

void set_one_name_space(Instance* instance, void* client)
{
    const auto* setter = static_cast<const Name_Space_Setter*>(client);
    if (setter->force || instance->__name_space.empty())
        instance->__name_space = setter->name_space;
}

bool fits_role(const Meta_Reference* mr, const char* role)
{
    return !role || !*role || eqi(mr->name, role);
}

/// True if the reference may hold `instance` and holds one with its keys.
bool points_at(const Meta_Reference* mr, const Instance* referent, const Instance* instance)
{
    return referent && is_subclass(mr->meta_class, instance->__meta_class) && key_eq(instance, referent);
}

void visit_referent(Instance* referent, void (*proc)(Instance*, void* client), void* client)
{
    if (referent)
        visit(referent, proc, client);
}

} // namespace

void visit(Instance* instance, void (*proc)(Instance*, void* client), void* client)
{
    proc(instance, client);
    for (const Meta_Feature* mf : features_of(instance))
    {
        if (const Meta_Reference* mr = as_single_reference(mf))
            visit_referent(reference_slot(instance, mr), proc, client);
        else if (const Meta_Reference* array = as_reference(mf))
            for (Instance* referent : references_in(instance, array))
                visit_referent(referent, proc, client);
    }
}

void set_name_space(Instance* instance, const char* name_space, bool force)
{
    Name_Space_Setter setter{String(name_space), force};
    visit(instance, set_one_name_space, &setter);
}

bool references_match(const Instance* instance, const Instance* assoc, const char* role)
{
    for (const Meta_Feature* mf : features_of(assoc))
    {
        const Meta_Reference* mr = as_single_reference(mf);
        if (mr && fits_role(mr, role) && points_at(mr, reference_slot(assoc, mr), instance))
            return true;
    }
    return false;
}

std::ptrdiff_t get_associators(const Instance* instance, const Instance* assoc, const char* assoc_class,
                               const char* result_class, const char* role, const char* result_role,
                               const Instance** out, std::size_t room)
{
    const bool fits_association = fits_class(assoc->__meta_class, assoc_class);
    bool relevant = false;
    std::size_t count = 0;
    for (const Meta_Feature* mf : features_of(assoc))
    {
        const Meta_Reference* mr = as_single_reference(mf);
        if (!mr)
            continue;
        const Instance* referent = reference_slot(assoc, mr);
        if (fits_role(mr, role) && points_at(mr, referent, instance))
        {
            relevant = true;
            continue;
        }
        const bool wanted = referent && (fits_association || fits_class(referent->__meta_class, assoc_class)) &&
                            fits_class(referent->__meta_class, result_class) && fits_role(mr, result_role);
        if (wanted && count < room)
            out[count++] = referent;
    }
    if (!relevant)
        return -1;
    for (std::size_t i = 0; i < count; ++i)
        ref(out[i]);
    return static_cast<std::ptrdiff_t>(count);
}

} // namespace cimple
