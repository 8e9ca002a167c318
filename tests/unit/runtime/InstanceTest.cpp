// Life and content of instances.
#include "runtime/meta/Print.h"
#include "runtime/meta/Prototype.h"
#include "schema/TVRHBA_TapeDrive.h"
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>

#include <limits>
#include <string>
#include <thread>
#include <vector>

using namespace cimple;

namespace
{

/// A disk whose every slot holds something.
Ref<T_Disk> make_full_disk()
{
    Ref<T_Disk> disk(make_named<T_Disk>("host", "sda"));
    disk->__name_space = "root/x";
    disk->Caption.set("A disk");
    disk->Online.set(true);
    disk->Size.set(1ull << 40);
    disk->Ratio.set(0.5);
    disk->Since.set(Datetime::timestamp(5, 60));
    disk->Vendor.set("maker");
    disk->Status.set({1, 2, 3});
    disk->Notes.set({"x", "y"});
    disk->Twin = make_named<T_Base>("host", "sdb");
    disk->Parts.value.append(make_named<T_Base>("host", "sda1"));
    disk->Parts.value.append(nullptr);
    return disk;
}

TEST(InstanceLife, WithoutDefaultsAllIsEmptyAndNotNull)
{
    Ref<T_Disk> disk(create<T_Disk>(false));
    EXPECT_EQ(disk->__magic, 0xF00DFACEu);
    EXPECT_EQ(disk->__refs, 1u);
    EXPECT_EQ(disk->__meta_class, &T_Disk::static_meta_class);
    EXPECT_EQ(disk->__name_space, "");
    EXPECT_TRUE(!disk->Caption.null && disk->Caption.value.empty());
    EXPECT_TRUE(!disk->Online.null && !disk->Online.value);
    EXPECT_TRUE(!disk->Size.null && disk->Size.value == 0);
    EXPECT_TRUE(!disk->Since.null && disk->Since.value == Datetime());
    EXPECT_TRUE(!disk->Status.null && disk->Status.value.size() == 0);
    EXPECT_EQ(disk->Notes.value.traits(), array_traits(STRING));
    EXPECT_EQ(disk->Twin, nullptr);
    EXPECT_EQ(disk->Parts.value.size(), 0u);
}

TEST(InstanceLife, WithDefaultsTheOthersAreNull)
{
    Ref<T_Disk> disk(create<T_Disk>(true));
    EXPECT_TRUE(disk->Caption.null && disk->Name.null && disk->Online.null && disk->Ratio.null);
    EXPECT_TRUE(!disk->Size.null && disk->Size.value == 512);
    EXPECT_TRUE(!disk->Vendor.null && disk->Vendor.value == "none");
    EXPECT_TRUE(!disk->Since.null && disk->Since.value == Datetime::interval(Datetime::day));
    EXPECT_TRUE(!disk->Status.null && disk->Status.value == (Array<std::uint16_t>{2, 3}));
    EXPECT_TRUE(!disk->Notes.null && disk->Notes.value == (Array<String>{"a", "b"}));
}

TEST(InstanceLife, AMethodRecordIsAnInstance)
{
    Ref<> record(create(&T_Disk_Reset::static_meta_method, true));
    auto* reset = static_cast<T_Disk_Reset*>(record.get());
    EXPECT_TRUE(reset->Force.null && reset->return_value.null);
    reset->Target = make_named<T_Base>("host", "sda");
    Ref<> copy(clone(record.get()));
    EXPECT_TRUE(identical(record.get(), copy.get()));
    EXPECT_STREQ(copy->__meta_class->name, "Reset");
}

TEST(InstanceLife, ACloneIsIdenticalAndItsOwn)
{
    const Ref<T_Disk> disk = make_full_disk();
    const Ref<T_Disk> copy(clone_of(disk.get()));
    EXPECT_EQ(copy->__refs, 1u);
    EXPECT_TRUE(identical(disk.get(), copy.get()));
    EXPECT_TRUE(copy->Name.value.shares(disk->Name.value));
    EXPECT_TRUE(copy->__name_space.shares(disk->__name_space));
    EXPECT_NE(copy->Twin, disk->Twin);
    EXPECT_NE(copy->Parts.value[0], disk->Parts.value[0]);
    EXPECT_EQ(copy->Parts.value[1], nullptr);
    EXPECT_EQ(clone(nullptr), nullptr);

    copy->Name.value.append('1');
    copy->Notes.value[0] = "z";
    copy->Twin->Name.set("other");
    EXPECT_EQ(disk->Name.value, "sda");
    EXPECT_EQ(disk->Notes.value[0], "x");
    EXPECT_EQ(disk->Twin->Name.value, "sdb");
}

TEST(InstanceLife, CopiesOfAPrototypeAreClonesOfTheirOwn)
{
    Ref<TVRHBA_TapeDrive> model(create<TVRHBA_TapeDrive>(true));
    model->__name_space = "root/x";
    model->Name.set("name");
    model->InstallDate.set(Datetime::timestamp(5, 60));
    model->OperationalStatus.set({1, 2});
    model->OtherIdentifyingInfo.set({"a", "b"});
    model->IdentifyingDescriptions.set({"c"});
    model->IdentifyingDescriptions.value.clear(); // with memory of its own
    model->Caption.value.reserve(100);            // the same
    const Prototype<TVRHBA_TapeDrive> prototype(model);
    const Ref<TVRHBA_TapeDrive> first = prototype.copy();
    const Ref<TVRHBA_TapeDrive> second = prototype.copy();
    EXPECT_TRUE(identical(first.get(), model.get()));
    first->OtherIdentifyingInfo.value[0] = "changed";
    first->OperationalStatus.value.append(3);
    first->IdentifyingDescriptions.value.append("d");
    first->Name.set("another");
    first->Caption.value.append("e", 1);
    EXPECT_TRUE(identical(second.get(), model.get()));
    EXPECT_EQ(second->Name.value.shares_count(), 2u) << "the model's and the copy's";
}

TEST(InstanceLife, ACopyForReadersSharesWhatItRefersTo)
{
    Ref<T_Disk> disk = make_full_disk();
    const Ref<T_Disk> copy(static_cast<T_Disk*>(clone_sharing_referents(disk.get())));
    EXPECT_TRUE(identical(disk.get(), copy.get()));
    EXPECT_EQ(copy->Twin, disk->Twin);
    EXPECT_EQ(copy->Parts.value[0], disk->Parts.value[0]);
    EXPECT_EQ(copy->Parts.value[1], nullptr);

    // None of what readers do to a copy reaches its referents.
    const Ref<T_Disk> untouched(clone_of(disk.get()));
    const char* wanted[] = {"Size", nullptr};
    filter_properties(copy.get(), wanted, false);
    create_ref_children(copy.get());
    const Ref<T_Disk> other(create<T_Disk>());
    other->Twin = make_named<T_Base>("host", "sdc");
    cimple::copy(copy.get(), other.get());
    EXPECT_EQ(copy->Twin->Name.value, "sdc");
    EXPECT_TRUE(identical(disk.get(), untouched.get()));

    const Ref<T_Disk> last(static_cast<T_Disk*>(clone_sharing_referents(disk.get())));
    disk.reset();
    EXPECT_TRUE(identical(last.get(), untouched.get())) << "outlives what it was made of";
    EXPECT_EQ(clone_sharing_referents(nullptr), nullptr);
}

TEST(InstanceLife, ACopyOfTheKeysHasNoneOfTheRest)
{
    const Ref<T_Disk> disk = make_full_disk();
    Ref<> blank;
    const Ref<T_Disk> names(static_cast<T_Disk*>(clone_keys(disk.get(), blank)));
    EXPECT_TRUE(key_eq(names.get(), disk.get()));
    EXPECT_EQ(names->__name_space, "root/x");
    EXPECT_EQ(names->Twin, nullptr);
    EXPECT_TRUE(names->Notes.null && names->Notes.value.size() == 0);
    EXPECT_TRUE(names->Parts.null && names->Parts.value.size() == 0);
    EXPECT_TRUE(names->Caption.null && names->Caption.value.empty());
    EXPECT_TRUE(names->Size.null && names->Since.null);

    const Ref<T_Link> link(make_link<T_Link>(clone_of<T_Base>(disk.get()), nullptr));
    const Ref<T_Link> ends(static_cast<T_Link*>(clone_keys(link.get(), blank)));
    EXPECT_EQ(ends->Antecedent, link->Antecedent) << "keys share what they refer to";
    EXPECT_EQ(ends->Dependent, nullptr);
    EXPECT_EQ(clone_keys(nullptr, blank), nullptr);

    const Ref<T_Odd> odd(create<T_Odd>());
    odd->When.set(Datetime::timestamp(5, 60));
    odd->List.set({1, 2});
    odd->Others.value.append(make_named<T_Base>("h", "a"));
    const Ref<> all(clone_keys(odd.get(), blank));
    EXPECT_TRUE(identical(all.get(), odd.get())) << "has nothing but keys";
}

TEST(InstanceLife, IdenticalSeesEachSlotAndNullByte)
{
    const Ref<T_Disk> disk = make_full_disk();
    void (*const changes[])(T_Disk*) = {
        [](T_Disk* d) { d->__name_space = "ROOT/x"; },
        [](T_Disk* d) { d->Caption.set("a disk"); },
        [](T_Disk* d) { d->Caption.set_null(); },
        [](T_Disk* d) { d->Online.set(false); },
        [](T_Disk* d) { d->Size.value ^= 1ull << 40; },
        [](T_Disk* d) { d->Ratio.value = std::numeric_limits<double>::quiet_NaN(); },
        [](T_Disk* d) { d->Since.set(Datetime::timestamp(5, 61)); },
        [](T_Disk* d) { d->Status.value[2] = 4; },
        [](T_Disk* d) { d->Status.null = 1; },
        [](T_Disk* d) { d->Notes.value.append("z"); },
        [](T_Disk* d) { d->Twin->Name.set("x"); },
        [](T_Disk* d) { unref(std::exchange(d->Twin, nullptr)); },
        [](T_Disk* d) { d->Parts.value.remove(1); },
        [](T_Disk* d) { d->Parts.null = 1; },
        [](T_Disk* d) { static_cast<T_Base*>(d->Parts.value[0])->Name.set("x"); },
    };
    for (std::size_t i = 0; i < std::size(changes); ++i)
    {
        const Ref<T_Disk> copy(clone_of(disk.get()));
        changes[i](copy.get());
        EXPECT_FALSE(identical(disk.get(), copy.get())) << i;
    }
    const Ref<T_Base> base(make_named<T_Base>("host", "sda"));
    EXPECT_FALSE(identical(base.get(), disk.get()));
}

TEST(InstanceLife, ClearLeavesNullsAndReleasesReferences)
{
    const Ref<T_Disk> disk = make_full_disk();
    const Ref<T_Base> twin(disk->Twin);
    ref(twin.get());
    clear(disk.get());
    EXPECT_EQ(twin->__refs, 1u);
    EXPECT_EQ(disk->Twin, nullptr);
    EXPECT_EQ(disk->__name_space, "");
    EXPECT_TRUE(disk->Name.null && disk->Name.value.empty());
    EXPECT_TRUE(disk->Size.null && disk->Size.value == 0);
    EXPECT_TRUE(disk->Since.null && disk->Since.value == Datetime());
    EXPECT_TRUE(disk->Status.null && disk->Status.value.size() == 0);
    EXPECT_TRUE(disk->Parts.null && disk->Parts.value.size() == 0);
}

TEST(InstanceLife, CountsAreSharedByThreads)
{
    const Ref<T_Disk> disk = make_full_disk();
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
    {
        threads.emplace_back(
            [&disk]
            {
                for (int j = 0; j < 500; ++j)
                {
                    const Ref<T_Disk> shared(disk);
                    const Ref<T_Disk> copy(clone_of(shared.get()));
                    EXPECT_TRUE(key_eq(copy.get(), shared.get()));
                }
            });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(disk->__refs, 1u);
    unref(nullptr);
    EXPECT_EQ(ref(nullptr), nullptr);
}

TEST(InstanceContent, NullifyPicksKeysAndNonKeys)
{
    const Ref<T_Disk> disk = make_full_disk();
    nullify(disk.get(), true, false, 1);
    EXPECT_TRUE(disk->System.null && disk->Name.null && !disk->Caption.null && !disk->Status.null);
    nullify(disk.get(), false, true, 1);
    EXPECT_TRUE(disk->Caption.null && disk->Status.null && disk->Size.null);
    EXPECT_FALSE(disk->Parts.null); // references stay
    EXPECT_NE(disk->Twin, nullptr);
    nullify(disk.get(), true, true, 0);
    EXPECT_TRUE(!disk->Name.null && !disk->Caption.null);
    EXPECT_EQ(disk->Name.value, "sda");
}

TEST(InstanceContent, KeysNonNull)
{
    const Ref<T_Base> base(make_named<T_Base>("host", "sda"));
    base->Caption.set_null();
    EXPECT_TRUE(keys_non_null(base.get()));
    base->Name.set_null();
    EXPECT_FALSE(keys_non_null(base.get()));

    const Ref<T_Link> link(make_link<T_Link>(make_named<T_Base>("h", "1"), nullptr));
    EXPECT_FALSE(keys_non_null(link.get()));
    const Ref<T_Odd> odd(create<T_Odd>());
    odd->Others.set_null(); // a reference array is no key
    EXPECT_TRUE(keys_non_null(odd.get()));
}

/// Names of the properties that are not null, "Twin" if that reference is set.
std::string readable(const T_Disk* disk)
{
    std::string names;
    const auto add = [&names](bool null, const char* name) { names += null ? "" : std::string(name) + " "; };
    add(disk->Caption.null, "Caption");
    add(disk->System.null, "System");
    add(disk->Name.null, "Name");
    add(disk->Size.null, "Size");
    add(disk->Status.null, "Status");
    add(disk->Twin == nullptr, "Twin");
    add(disk->Parts.null, "Parts");
    return names;
}

TEST(InstanceContent, FilterLeavesWhatIsNamed)
{
    struct
    {
        std::vector<const char*> names;
        bool keep_keys;
        int result;
        const char* readable;
    } const cases[] = {
        {{nullptr}, true, 0, "System Name Parts "},
        {{nullptr}, false, 0, "Parts "},
        {{"size", "STATUS", "nothing", nullptr}, true, 0, "System Name Size Status Parts "},
        {{"Name", "Size", nullptr}, false, 0, "Size Parts "}, // keys are skipped in the list
        {{"Twin", "Parts", nullptr}, false, 0, "Twin Parts "},
        {{"Size", "Reset", "Status", nullptr}, false, -1, "Size Parts "},
    };
    for (const auto& c : cases)
    {
        const Ref<T_Disk> disk(create<T_Disk>());
        EXPECT_EQ(filter_properties(disk.get(), c.names.data(), c.keep_keys), c.result);
        EXPECT_EQ(readable(disk.get()), c.readable);
    }
    const Ref<T_Disk> disk(create<T_Disk>(true));
    EXPECT_EQ(filter_properties(disk.get(), nullptr, false), 0);
    EXPECT_EQ(readable(disk.get()), "Caption System Name Size Status Parts ");

    const Ref<T_Disk> with_parts(create<T_Disk>());
    with_parts->Parts.set_null();
    const char* const parts[] = {"Parts", nullptr};
    filter_properties(with_parts.get(), parts, true);
    EXPECT_FALSE(with_parts->Parts.null);
}

TEST(InstanceContent, CopyFollowsTheModel)
{
    const Ref<T_Disk> src = make_full_disk();
    const Ref<T_Disk> all(create<T_Disk>(true));
    all->Twin = make_named<T_Base>("old", "old");
    copy(all.get(), src.get());
    all->__name_space = src->__name_space; // no feature
    EXPECT_TRUE(identical(all.get(), src.get()));
    copy(all.get(), all.get());
    EXPECT_TRUE(identical(all.get(), src.get()));

    const Ref<T_Disk> model(create<T_Disk>());
    nullify(model.get(), true, true, 1);
    model->Parts.set_null();
    model->Size.null = 0;
    const Ref<T_Disk> some(create<T_Disk>(true));
    copy(some.get(), src.get(), model.get());
    EXPECT_EQ(some->Size.value, src->Size.value);
    EXPECT_EQ(some->Vendor.value, "none");
    EXPECT_EQ(some->Twin, nullptr);
    EXPECT_EQ(some->Parts.value.size(), 0u);

    const Ref<T_Disk> keys(create<T_Disk>(true));
    copy(keys.get(), src.get(), nullptr, true);
    EXPECT_TRUE(key_eq(keys.get(), src.get()));
    EXPECT_TRUE(keys->Caption.null);

    const Ref<T_Base> base(make_named<T_Base>("b", "b"));
    copy(base.get(), src.get()); // another class
    EXPECT_EQ(base->Name.value, "b");
}

TEST(InstanceContent, TheWalkGoesDepthFirst)
{
    const Ref<T_Disk> disk = make_full_disk();
    std::string names;
    visit(
        disk.get(),
        [](Instance* i, void* out)
        { *static_cast<std::string*>(out) += static_cast<T_Base*>(i)->Name.value.c_str() + std::string(" "); },
        &names);
    EXPECT_EQ(names, "sda sdb sda1 ");

    disk->__name_space = "";
    disk->Twin->__name_space = "own";
    set_name_space(disk.get(), "root/a", false);
    EXPECT_EQ(disk->__name_space, "root/a");
    EXPECT_EQ(disk->Twin->__name_space, "own");
    EXPECT_EQ(disk->Parts.value[0]->__name_space, "root/a");
    set_name_space(disk.get(), "root/b", true);
    EXPECT_EQ(disk->Twin->__name_space, "root/b");
}

TEST(InstanceContent, ReferenceChildrenAreFilledOnce)
{
    T_Base* antecedent = make_named<T_Base>("h", "1");
    const Ref<T_Link> link(make_link<T_Link>(antecedent, nullptr));
    create_ref_children(link.get());
    EXPECT_EQ(link->Antecedent, antecedent);
    ASSERT_NE(link->Dependent, nullptr);
    EXPECT_EQ(link->Dependent->__meta_class, &T_Base::static_meta_class);
}

TEST(InstanceContent, CastFollowsTheClass)
{
    const Ref<T_Disk> disk(create<T_Disk>());
    Instance* instance = disk.get();
    EXPECT_EQ(cast<T_Base>(instance), instance);
    EXPECT_EQ(cast<T_Link>(instance), nullptr);
    EXPECT_EQ(cast<Instance>(instance), instance);
    EXPECT_EQ(cast<T_Base>(static_cast<Instance*>(nullptr)), nullptr);
}

TEST(Print, ShowsInstancesAndClasses)
{
    Ref<T_Disk> disk = make_full_disk();
    disk->Caption.set_null();
    Buffer out;
    print(out, static_cast<const Instance*>(disk.get()));
    const std::string text = out.c_str();
    EXPECT_NE(text.find("T_Disk\n{\n    string Caption = NULL;\n    string System = \"host\";\n"), std::string::npos)
        << text;
    EXPECT_NE(text.find("    boolean Online = true;\n    uint64 Size = 1099511627776;\n    real64 Ratio = 0.5;\n"),
              std::string::npos);
    EXPECT_NE(text.find("    uint16 Status[] = {1, 2, 3};\n    string Notes[] = {\"x\", \"y\"};\n    T_Base Twin =\n   "
                        " T_Base\n    {\n"),
              std::string::npos);

    out.clear();
    print(out, &T_Disk::static_meta_class);
    const std::string declaration = out.c_str();
    EXPECT_EQ(declaration.find("class T_Disk : T_Base\n{\n    string Caption;\n"), 0u) << declaration;
    EXPECT_NE(declaration.find("    T_Base ref Parts[];\n    uint32 Reset(\n        boolean Force;\n        T_Base ref "
                               "Target;\n    );\n}\n"),
              std::string::npos)
        << declaration;
}

TEST(PrintDeathTest, AMethodHasAtLeastItsReturnValue)
{
    Meta_Method empty = T_Disk_Reset::static_meta_method;
    empty.num_meta_features = 0;
    Buffer out;
    EXPECT_DEATH(print(out, &empty), "assert: mm->num_meta_features > 0");
}

} // namespace
