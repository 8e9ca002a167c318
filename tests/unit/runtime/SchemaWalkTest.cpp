// Every class and method of the real schema through the generic operations.
#include "runtime/meta/Instance.h"
#include "runtime/meta/InstanceSlots.h"
#include "runtime/meta/Print.h"
#include "schema/Repository.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <span>

using namespace cimple;

namespace
{

/// Puts something into each slot: a text, a number, an element, a referenced instance.
void fill(Instance* instance)
{
    static constexpr char ones[8] = {1, 1, 1, 1, 1, 1, 1, 1};
    nullify(instance, true, true, 0);
    create_ref_children(instance);
    for (const Meta_Feature* mf : features_of(instance))
    {
        const Meta_Property* mp = as_property(mf);
        const Meta_Reference* mr = as_reference(mf);
        if (mp && mp->subscript != 0 && mp->type == STRING)
            slot<Array<String>>(instance, mp->offset).append(mp->name);
        else if (mp && mp->subscript != 0 && mp->type == DATETIME)
            slot<Array<Datetime>>(instance, mp->offset).append(Datetime::now());
        else if (mp && mp->subscript != 0)
            array_slot(instance, mp->offset).resize(3, ones);
        else if (mp && mp->type == STRING)
            slot<String>(instance, mp->offset) = mp->name;
        else if (mp && mp->type == DATETIME)
            slot<Datetime>(instance, mp->offset) = Datetime::timestamp(mp->offset, 60);
        else if (mp)
            std::copy_n(ones, type_width(mp->type), &slot<char>(instance, mp->offset));
        else if (mr && mr->subscript != 0)
            slot<Array<Instance*>>(instance, mr->offset).append(create(mr->meta_class, true));
    }
}

void expect_generic_operations_hold(Instance* instance)
{
    const Ref<> copy_of_it(clone(instance));
    EXPECT_TRUE(identical(instance, copy_of_it.get()));
    EXPECT_TRUE(key_eq(instance, copy_of_it.get()));
    Buffer text;
    print(text, static_cast<const Instance*>(instance));
    clear(instance);
    copy(instance, copy_of_it.get());
    EXPECT_TRUE(identical(instance, copy_of_it.get()));
}

TEST(SchemaWalk, EveryClassIsCreatedFilledClonedAndCleared)
{
    for (const Meta_Class* mc : std::span(the_repository.meta_classes, the_repository.num_meta_classes))
    {
        SCOPED_TRACE(mc->name);
        const Ref<> fresh(create(mc, true));
        const Ref<> instance(create(mc, false));
        expect_generic_operations_hold(fresh.get());
        fill(instance.get());
        EXPECT_TRUE(keys_non_null(instance.get()));
        expect_generic_operations_hold(instance.get());
    }
}

} // namespace
