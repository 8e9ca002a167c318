#include "runtime/meta/Meta.h"
#include "runtime/base/Assert.h"
#include "runtime/meta/MetaDynamic.h"
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>

#include <cstring>
#include <string>

using namespace cimple;

namespace
{

TEST(Meta, TypeNamesAreFoundInAnyCase)
{
    for (std::uint32_t type = 0; type < num_types; ++type)
    {
        std::string name = type_name(type);
        EXPECT_EQ(type_code(name.c_str()), static_cast<int>(type)) << name;
        name[1] = static_cast<char>(std::toupper(name[1]));
        name.back() = static_cast<char>(std::toupper(name.back()));
        EXPECT_EQ(type_code(name.c_str()), static_cast<int>(type)) << name;
    }
    // The third has the hash of "uint32", the fourth hashes below the table.
    for (const char* name : {"", "strin", "usnt32", "a", "uint128", "\xff\xff"})
        EXPECT_EQ(type_code(name), -1) << name;
    EXPECT_EQ(type_code(nullptr), -1);
    EXPECT_EQ(type_name(num_types), nullptr);
    EXPECT_EQ(type_width(num_types), 0u);
}

TEST(Meta, FlagNamesStandAtTheirBits)
{
    EXPECT_EQ(flag_bit("key"), std::countr_zero(static_cast<std::uint32_t>(META_KEY)));
    EXPECT_EQ(flag_bit("EMBEDDEDINSTANCE"), 31);
    EXPECT_EQ(flag_bit("Required"), std::countr_zero(static_cast<std::uint32_t>(META_REQUIRED)));
    EXPECT_EQ(flag_bit("Keys"), -1);
    EXPECT_EQ(flag_bit(nullptr), -1);
    for (unsigned bit = 0; bit < 32; ++bit)
        EXPECT_EQ(flag_bit(flag_name(bit)), static_cast<int>(bit));
    EXPECT_EQ(flag_name(32), nullptr);
}

TEST(Meta, FeaturesAreFoundByNameAndKind)
{
    const Meta_Class* disk = &T_Disk::static_meta_class;
    EXPECT_STREQ(find_feature(disk, "sIZE")->name, "Size");
    EXPECT_EQ(find_feature(disk, "Twin", META_PROPERTY), nullptr);
    EXPECT_NE(as_reference(find_feature(disk, "twin", META_REFERENCE)), nullptr);
    EXPECT_NE(as_method(find_feature(disk, "reset", META_METHOD)), nullptr);
    EXPECT_EQ(find_feature(disk, "Reset", property_or_reference), nullptr);
    EXPECT_EQ(find_feature(disk, "Siz"), nullptr);
    EXPECT_TRUE(has_flag(disk, META_EMBEDDED_INSTANCE));
    EXPECT_FALSE(has_flag(disk, META_OUT)); // parameters are no features of the class
    EXPECT_TRUE(has_flag(&T_Disk_Reset::static_meta_method, META_OUT));
}

TEST(Meta, ClassesAreFoundInChainAndRepository)
{
    EXPECT_EQ(find_class(&test_repository, "t_disk"), &T_Disk::static_meta_class);
    EXPECT_EQ(find_class(&test_repository, "T_None"), nullptr);
    EXPECT_EQ(find_class(nullptr, "T_Disk"), nullptr);

    Meta_Class lonely = T_Disk::static_meta_class;
    lonely.meta_repository = nullptr;
    EXPECT_EQ(find_class_in_chain(&lonely, "T_DISK"), &lonely);
    EXPECT_EQ(find_class_in_chain(&lonely, "T_Base"), &T_Base::static_meta_class);
    EXPECT_EQ(find_class_in_chain(&lonely, "T_Link"), nullptr);
    EXPECT_EQ(find_class_in_chain(&T_Disk::static_meta_class, "t_link"), &T_Link::static_meta_class);
}

TEST(Meta, SubclassesAreKnownByPointerOrName)
{
    const Meta_Class* base = &T_Base::static_meta_class;
    const Meta_Class* disk = &T_Disk::static_meta_class;
    EXPECT_TRUE(is_subclass(base, disk));
    EXPECT_TRUE(is_subclass(disk, disk));
    EXPECT_FALSE(is_subclass(disk, base));
    EXPECT_FALSE(is_subclass(&T_OtherDisk::static_meta_class, disk));
    EXPECT_TRUE(is_subclass(&Instance::static_meta_class, disk));

    Meta_Class twin = *base; // another record of the same class, as after a reload
    twin.name = "t_BASE";
    EXPECT_TRUE(is_subclass(&twin, disk));
    twin.name = "instance";
    EXPECT_TRUE(is_subclass(&twin, disk));
    EXPECT_FALSE(is_subclass(nullptr, disk));
    EXPECT_FALSE(is_subclass(base, nullptr));

    EXPECT_EQ(is_subclass_by_name(&test_repository, "T_Base", "t_disk"), 0);
    EXPECT_EQ(is_subclass_by_name(&test_repository, "T_Disk", "T_Base"), 1);
    EXPECT_EQ(is_subclass_by_name(&test_repository, "T_Base", "T_None"), -1);
    EXPECT_EQ(is_subclass_by_name(&test_repository, nullptr, "T_Base"), -1);
    EXPECT_EQ(is_subclass_by_name(nullptr, "T_Base", "T_Base"), -1);

    EXPECT_TRUE(is_or_derives_from(disk, "t_base"));
    EXPECT_FALSE(is_or_derives_from(base, "T_Disk"));
}

TEST(MetaDynamic, StaticRecordsAreNeverCounted)
{
    // The tables lie in read-only memory: a write would end the test.
    for (int i = 0; i < 3; ++i)
        unref_meta(&T_Disk::static_meta_class);
    ref_meta(&T_Disk::static_meta_class);
    unref_meta(static_cast<const Meta_Feature*>(&T_Disk_Reset::static_meta_method));
    EXPECT_EQ(T_Disk::static_meta_class.refs, 0u);
}

/// T_Disk with one qualifier on the class and one on its first feature, all dynamic.
Meta_Class* make_qualified_disk()
{
    static constexpr const char* words[] = {"one", "two"};
    static constexpr Array_Default word_list{words, 2};
    static constexpr std::uint32_t number = 7;
    static constexpr Meta_Qualifier list{0, "Values", STRING, 1, &word_list};
    static constexpr Meta_Qualifier scalar{0, "MaxLen", UINT32, 0, &number};
    static constexpr const Meta_Qualifier* on_class[] = {&list, &scalar};
    static constexpr const Meta_Qualifier* on_feature[] = {&scalar};

    Meta_Property first = *as_property(T_Disk::static_meta_class.meta_features[0]);
    first.meta_qualifiers = on_feature;
    first.num_meta_qualifiers = 1;
    const Meta_Feature* features[16];
    std::copy_n(T_Disk::static_meta_class.meta_features, T_Disk::static_meta_class.num_meta_features, features);
    features[0] = &first;
    Meta_Class qualified = T_Disk::static_meta_class;
    qualified.meta_qualifiers = on_class;
    qualified.num_meta_qualifiers = 2;
    qualified.meta_features = features;
    return clone_meta(&qualified);
}

TEST(MetaDynamic, ACopyIsDeepAndOwnsItself)
{
    Meta_Class* disk = make_qualified_disk();
    EXPECT_EQ(disk->refs, 1u);
    EXPECT_STREQ(disk->name, "T_Disk");
    EXPECT_NE(disk->name, T_Disk::static_meta_class.name);
    EXPECT_EQ(disk->super_meta_class, &T_Base::static_meta_class);
    EXPECT_EQ(std::memcmp(disk->locals, T_Disk::static_meta_class.locals, disk->num_meta_features), 0);
    EXPECT_EQ(disk->num_meta_qualifiers, 2u);

    const Meta_Property* notes = as_property(find_feature(disk, "Notes"));
    const auto* defaults = static_cast<const Array_Default*>(notes->value);
    EXPECT_STREQ(static_cast<const char* const*>(defaults->data)[1], "b");
    const Meta_Method* reset = as_method(find_feature(disk, "Reset"));
    EXPECT_NE(reset, &T_Disk_Reset::static_meta_method);
    EXPECT_STREQ(reset->meta_features[reset->num_meta_features - 1]->name, "return_value");

    drop_qualifiers(disk);
    EXPECT_EQ(disk->num_meta_qualifiers, 0u);
    EXPECT_EQ(disk->meta_features[0]->num_meta_qualifiers, 0u);
    unref_meta(disk); // the address sanitizer sees what is left behind or freed twice
}

TEST(MetaDynamic, InstancesAndSubclassesKeepTheirClassAlive)
{
    Meta_Class* base = clone_meta(&T_Base::static_meta_class);
    Meta_Class derived = T_Disk::static_meta_class;
    derived.super_meta_class = base;
    std::uint16_t keys[] = {1, 2};
    derived.keys = keys;
    Meta_Class* disk = clone_meta(&derived);
    EXPECT_EQ(base->refs, 2u);
    keys[0] = keys[1] = 99; // the copy has its own

    Instance* instance = create(disk, true);
    Instance* copy = clone(instance);
    EXPECT_EQ(disk->refs, 3u);
    EXPECT_TRUE(key_eq(instance, copy));
    unref_meta(base);
    unref_meta(disk);
    EXPECT_TRUE(is_subclass(&T_Base::static_meta_class, copy->__meta_class));
    unref(instance);
    EXPECT_EQ(disk->refs, 1u);
    unref(copy); // the last one takes both classes with it
}

TEST(MetaDynamic, SingleRecordsAreCopiedAndReleased)
{
    Meta_Property* size = clone_meta(as_property(find_feature(&T_Disk::static_meta_class, "Size")));
    EXPECT_EQ(*static_cast<const std::uint64_t*>(size->value), 512u);
    unref_meta(static_cast<const Meta_Feature*>(size));
    Meta_Reference* twin = clone_meta(as_reference(find_feature(&T_Disk::static_meta_class, "Twin")));
    EXPECT_EQ(twin->meta_class, &T_Base::static_meta_class);
    unref_meta(static_cast<const Meta_Feature*>(twin));
    EXPECT_EQ(clone_meta(static_cast<const Meta_Class*>(nullptr)), nullptr);
    unref_meta(static_cast<const Meta_Class*>(nullptr));
}

TEST(AssertDeathTest, NamesThePlaceAndTheExpression)
{
    EXPECT_DEATH(CIMPLE_ASSERT(1 + 1 == 3),
                 "^MetaTest.cpp\\([0-9]+\\): .*TestBody\\(\\)\\(\\): assert: 1 \\+ 1 == 3\n\n");
    CIMPLE_ASSERT(true);
    testing::internal::CaptureStderr();
    CIMPLE_TRACE("here");
    const int line = __LINE__ - 1;
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "TRACE: MetaTest.cpp(" + std::to_string(line) + "): here\n");
}

} // namespace
