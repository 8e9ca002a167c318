// What is made while memory runs out leaves nothing behind, and what is changed stays whole.
#include "runtime/meta/Instance.h"
#include "runtime/meta/InstanceSlots.h"
#include "runtime/meta/MetaDynamic.h"
#include "runtime/meta/Value.h"
#include "tests/support/NoMemory.h"
#include "tests/unit/runtime/Records.h"

#include <functional>

namespace cimple
{
namespace
{

using test_support::NoMemory;
using test_support::withEachAllocationFailing;

/// A disk in which every slot that can take memory has some.
Ref<T_Disk> full_disk()
{
    Ref<T_Disk> disk(create<T_Disk>(true));
    disk->__name_space = "root/a";
    disk->System.set("h");
    disk->Name.set("a name that its copies share");
    disk->Twin = make_named<T_Base>("h", "twin");
    disk->Parts.value.append(create<T_Disk>(true));
    disk->Parts.value.append(nullptr);
    for (int i = 0; i < 9; ++i)
        disk->Parts.value.append(make_named<T_Base>("h", "part"));
    return disk;
}

TEST(Memory, IsGivenBackByWhatCannotBeMade)
{
    const Ref<T_Disk> disk = full_disk();
    EXPECT_GE(withEachAllocationFailing([] { Ref<>(create(&T_Disk::static_meta_class, true)); }), 5u)
        << "the record, two texts or times, two arrays";
    EXPECT_GE(withEachAllocationFailing([&] { Ref<>(clone(disk.get())); }), 16u);
    EXPECT_GE(withEachAllocationFailing([&] { Ref<>(clone_sharing_referents(disk.get())); }), 3u)
        << "the record and its arrays";
    const auto copy_keys = [&]
    {
        Ref<> blank;
        Ref<>(clone_keys(disk.get(), blank));
    };
    EXPECT_EQ(withEachAllocationFailing(copy_keys), 2u) << "the record and what it has in common with others";
    withEachAllocationFailing(
        []
        {
            Ref<>(model_path(&T_Link::static_meta_class, "T_Link.Antecedent=\"T_Base.System=\\\"h\\\",Name=\\\"a\\\"\","
                                                         "Dependent=\"T_Base.System=\\\"h\\\",Name=\\\"b\\\"\""));
        });
    const auto clone_class = [] { unref_meta(clone_meta(&T_Disk::static_meta_class)); };
    EXPECT_GE(withEachAllocationFailing(clone_class), 30u);
}

TEST(Memory, MissingForAChangeKeepsTheInstanceWhole)
{
    const Ref<T_Disk> source = full_disk();
    const Ref<T_Disk> target(create<T_Disk>(true));
    target->Parts.value.append(make_named<T_Base>("h", "former"));
    Value references;
    const Meta_Feature* parts = find_feature(&T_Disk::static_meta_class, "Parts");
    ASSERT_EQ(read_feature(source.get(), parts, references), 0);

    withEachAllocationFailing(
        [&]
        {
            const Ref<T_Disk> changed(clone_of(target.get()));
            try
            {
                copy(changed.get(), source.get());
                set_name_space(changed.get(), "root/b", true);
                assign(changed.get(), parts, references); // shares the parts
            }
            catch (const std::bad_alloc&)
            {
                EXPECT_GE(changed->Parts.value.size(), 1u) << "the former elements or all of the new ones";
                throw;
            }
        });
}

TEST(Memory, MissingForTextsAndArraysKeepsTheirContent)
{
    const std::string text(100, 'x');
    String string("kept");
    const String shared(string);
    Array<String> array{"a", "b", "c", "d", "e", "f", "g", "h"};
    Datetime time = Datetime::interval(1);
    const Datetime before = time;

    for (const auto& change :
         std::initializer_list<std::function<void()>>{
             [&] { string.append("more"); },
             [&] { string.assign(text.data(), text.size()); },
             [&] { string.reserve(1000); },
             [&] { string.remove(0, 1); },
             [&] { array.append(String("i")); },
             [&] { array.insert(1, String("i")); },
             [&] { array = Array<String>{"x"}; },
             [&] { time.set(2, 0, false); },
             [&] { time.parse("20240115120000.000007-060"); },
         })
    {
        const NoMemory none;
        EXPECT_THROW(change(), std::bad_alloc);
        EXPECT_NE(none.refused(), 0u);
    }
    EXPECT_EQ(string, "kept");
    EXPECT_EQ(array, (Array<String>{"a", "b", "c", "d", "e", "f", "g", "h"}));
    EXPECT_EQ(time, before);
}

} // namespace
} // namespace cimple
