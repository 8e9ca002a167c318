// The generated tables as a whole: what generic code relies on holds for every record.
#include "schema/Repository.h"
#include "runtime/meta/Instance.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <cstring>
#include <set>
#include <string>
#include <vector>

namespace cimple
{

namespace
{

std::vector<const Meta_Class*> all_classes()
{
    return {the_repository.meta_classes, the_repository.meta_classes + the_repository.num_meta_classes};
}

std::vector<const Meta_Feature*> features_of(const Meta_Record& record)
{
    return {record.meta_features, record.meta_features + record.num_meta_features};
}

std::vector<std::string> feature_names(const char* class_name)
{
    std::vector<std::string> names;
    for (const Meta_Feature* feature : features_of(*find_class(&the_repository, class_name)))
    {
        names.push_back(feature->name);
    }
    return names;
}

bool is_served(const Meta_Class* mc)
{
    return std::string(mc->name).starts_with("TVRHBA_");
}

TEST(Repository, HoldsTheKnownNumbersOfClasses)
{
    const std::vector<const Meta_Class*> classes = all_classes();
    const auto count = [&](auto&& is) { return std::count_if(classes.begin(), classes.end(), is); };
    EXPECT_EQ(classes.size(), 278u);
    EXPECT_EQ(count(is_served), 159);
    EXPECT_EQ(count([](const Meta_Class* mc) { return is_served(mc) && (mc->flags & META_ASSOCIATION); }), 105);
    EXPECT_EQ(count([](const Meta_Class* mc) { return is_served(mc) && (mc->flags & META_AGGREGATION); }), 29);
    EXPECT_EQ(count([](const Meta_Class* mc) { return is_served(mc) && (mc->flags & META_COMPOSITION); }), 0);
}

TEST(Repository, ClassesAreFoundByTheirNamesAndStandAfterTheirSuperclasses)
{
    std::set<const Meta_Class*> before;
    for (const Meta_Class* mc : all_classes())
    {
        EXPECT_EQ(find_class(&the_repository, mc->name), mc);
        EXPECT_EQ(mc->meta_repository, &the_repository) << mc->name;
        EXPECT_TRUE(!mc->super_meta_class || before.count(mc->super_meta_class)) << mc->name;
        before.insert(mc);
    }
    for (const char* name : {"IBMSD_ComputerSystem", "IBMSD_Chassis", "PG_RegisteredProfile"})
    {
        EXPECT_NE(find_class(&the_repository, name), nullptr) << name;
    }
}

TEST(Repository, TheErrorClassIsTheOnlyIndication)
{
    for (const Meta_Class* mc : all_classes())
    {
        const bool is_error = std::strcmp(mc->name, "CIM_Error") == 0;
        EXPECT_EQ((mc->flags & META_INDICATION) != 0, is_error) << mc->name;
        EXPECT_TRUE(!is_error || !mc->super_meta_class);
    }
}

void expect_static(const Meta_Feature& record)
{
    EXPECT_EQ(record.refs, 0u) << record.name;
    EXPECT_EQ(record.num_meta_qualifiers, 0u) << record.name;
}

TEST(Records, AreStaticAndHoldNoQualifiers)
{
    for (const Meta_Class* mc : all_classes())
    {
        expect_static(*mc);
        for (const Meta_Feature* feature : features_of(*mc))
        {
            expect_static(*feature);
        }
    }
}

TEST(Records, SubclassesShareThemAndReplaceOverriddenOnesInPlace)
{
    for (const Meta_Class* mc : all_classes())
    {
        SCOPED_TRACE(mc->name);
        const std::vector<const Meta_Feature*> inherited =
            mc->super_meta_class ? features_of(*mc->super_meta_class) : std::vector<const Meta_Feature*>();
        ASSERT_GE(mc->num_meta_features, inherited.size());
        for (std::size_t i = 0; i < mc->num_meta_features; i++)
        {
            const Meta_Feature* feature = mc->meta_features[i];
            const bool shared = i < inherited.size() && feature == inherited[i];
            EXPECT_EQ(mc->locals[i], shared ? 0 : 1) << feature->name;
            if (i < inherited.size() && !shared)
            {
                EXPECT_STREQ(feature->name, inherited[i]->name);
                EXPECT_EQ(feature->flags & any_feature, inherited[i]->flags & any_feature) << feature->name;
            }
        }
    }
}

TEST(Records, AnOverrideKeepsTheSlot)
{
    const Meta_Class& mc = *find_class(&the_repository, "TVRHBA_SystemDevice");
    const Meta_Class& base = *find_class(&the_repository, "CIM_SystemDevice");
    const Meta_Reference* own = as_reference(find_feature(&mc, "PartComponent"));
    const Meta_Reference* inherited = as_reference(find_feature(&base, "PartComponent"));
    EXPECT_NE(own, inherited);
    EXPECT_EQ(own->offset, inherited->offset);
    EXPECT_EQ(own->meta_class, find_class(&the_repository, "TVRHBA_PCIDevice"));
    EXPECT_EQ(inherited->meta_class, find_class(&the_repository, "CIM_LogicalDevice"));
    EXPECT_EQ(own->flags, META_KEY | META_WEAK | META_REFERENCE);
    EXPECT_EQ(mc.size, base.size);
}

TEST(Records, KeysAreCountedOverTheChain)
{
    for (const Meta_Class* mc : all_classes())
    {
        const std::vector<const Meta_Feature*> features = features_of(*mc);
        const auto is_key = [](const Meta_Feature* feature) { return (feature->flags & META_KEY) != 0; };
        EXPECT_EQ(mc->num_keys, std::size_t(std::count_if(features.begin(), features.end(), is_key))) << mc->name;
        for (std::size_t i = 0; i < mc->num_keys; ++i)
            EXPECT_TRUE(is_key(features[mc->keys[i]]) && (i == 0 || mc->keys[i - 1] < mc->keys[i])) << mc->name;
        EXPECT_TRUE(!is_served(mc) || mc->num_keys > 0) << mc->name;
    }
}

TEST(Records, MethodsEndWithTheirReturnValue)
{
    std::size_t num_methods = 0;
    for (const Meta_Class* mc : all_classes())
    {
        for (const Meta_Feature* feature : features_of(*mc))
        {
            if (const Meta_Method* mm = as_method(feature))
            {
                ASSERT_GE(mm->num_meta_features, 1u) << mm->name;
                const Meta_Property* last = as_property(mm->meta_features[mm->num_meta_features - 1]);
                ASSERT_NE(last, nullptr) << mm->name;
                EXPECT_STREQ(last->name, "return_value");
                EXPECT_EQ(last->flags, META_PROPERTY | META_OUT);
                EXPECT_EQ(last->type, mm->return_type);
                num_methods++;
            }
        }
    }
    EXPECT_GT(num_methods, 159u);
}

/// First byte and the one behind the last of a feature's slot; empty for a method.
struct Extent
{
    std::size_t begin;
    std::size_t end;
};

Extent extent_of(const Meta_Feature& feature)
{
    if (const Meta_Property* mp = as_property(&feature))
    {
        const std::size_t width = mp->subscript == 0 ? type_width(mp->type) : sizeof(void*);
        return {mp->offset, mp->offset + width + 1};
    }
    if (const Meta_Reference* mr = as_reference(&feature))
    {
        return {mr->offset, mr->offset + sizeof(void*) + (mr->subscript != 0)};
    }
    return {0, 0};
}

/// Slots with their null bytes lie inside the record, behind its head, and do not overlap.
void expect_disjoint_slots(const Meta_Record& record)
{
    std::vector<Extent> extents;
    for (const Meta_Feature* feature : features_of(record))
    {
        if (!as_method(feature))
        {
            extents.push_back(extent_of(*feature));
        }
    }
    std::sort(extents.begin(), extents.end(), [](Extent a, Extent b) { return a.begin < b.begin; });
    std::size_t free = offsetof(Instance, __name_space) + sizeof(void*);
    for (const Extent& extent : extents)
    {
        EXPECT_GE(extent.begin, free) << record.name;
        free = extent.end;
    }
    EXPECT_LE(free, record.size) << record.name;
}

TEST(Layout, SlotsAreInsideTheRecordAndDisjoint)
{
    for (const Meta_Class* mc : all_classes())
    {
        expect_disjoint_slots(*mc);
        for (const Meta_Feature* feature : features_of(*mc))
        {
            if (const Meta_Method* mm = as_method(feature))
            {
                expect_disjoint_slots(*mm);
            }
        }
    }
}

TEST(Features, OfTheTagServiceAre33InheritedAnd4Own)
{
    const Meta_Class& mc = *find_class(&the_repository, "TVRHBA_FCTagService");
    std::vector<int> expected(33, 0);
    expected.resize(37, 1);
    EXPECT_EQ(std::vector<int>(mc.locals, mc.locals + mc.num_meta_features), expected);
    const std::vector<std::string> names = feature_names("TVRHBA_FCTagService");
    EXPECT_THAT(std::vector<std::string>(names.begin() + 33, names.end()),
                testing::ElementsAre("SetConfigTable", "GetConfigTable", "SetGlobalFlag", "GetGlobalFlag"));
}

TEST(Features, OfSettingDataStandInTheInheritedOrder)
{
    const std::vector<std::string> inherited = {"InstanceID", "Caption",           "Description",   "ElementName",
                                                "Generation", "ConfigurationName", "ChangeableType"};
    EXPECT_EQ(feature_names("CIM_SettingData"), inherited);
    const auto with = [&](std::vector<std::string> own)
    {
        own.insert(own.begin(), inherited.begin(), inherited.end());
        return own;
    };
    EXPECT_EQ(feature_names("TVRHBA_DriverParams"),
              with({"paramno", "deviceID", "paramname", "lowRange", "highRange", "def", "current", "exportFlag",
                    "dynamic", "help", "Option"}));
    EXPECT_EQ(feature_names("TVRHBA_ProviderConfigSetting"),
              with({"paramname", "lowRange", "highRange", "def", "current"}));
}

TEST(Features, OfAMethodStandInTheOrderOfItsDeclaration)
{
    const Meta_Class& mc = *find_class(&the_repository, "TVRHBA_ConcreteJob");
    const Meta_Method* mm = as_method(find_feature(&mc, "RequestStateChange"));
    ASSERT_EQ(mm->num_meta_features, 4u);
    const auto expect = [&](std::size_t i, const char* name, std::uint32_t flags)
    {
        EXPECT_STREQ(mm->meta_features[i]->name, name);
        EXPECT_EQ(mm->meta_features[i]->flags, flags) << name;
    };
    expect(0, "RequestedState", META_PROPERTY | META_IN);
    expect(1, "Job", META_REFERENCE | META_OUT);
    expect(2, "TimeoutPeriod", META_PROPERTY | META_IN);
    expect(3, "return_value", META_PROPERTY | META_OUT);
    EXPECT_EQ(mm->return_type, UINT32);
}

struct FlagRow
{
    const char* class_name;
    const char* feature;
    std::uint32_t flags;
};

constexpr FlagRow flag_rows[] = {
    {"TVRHBA_Card", "Model", META_READ | META_PROPERTY},
    {"TVRHBA_Card", "Tag", META_READ | META_KEY | META_PROPERTY},
    {"TVRHBA_ProviderConfigSetting", "current", META_READ | META_WRITE | META_PROPERTY},
    {"TVRHBA_DriverParams", "ElementName", META_READ | META_REQUIRED | META_PROPERTY},
    {"TVRHBA_FCPortStatistics", "BytesTransmitted", META_READ | META_COUNTER | META_PROPERTY},
    {"TVRHBA_FCPort", "Speed", META_READ | META_PROPERTY},
    {"TVRHBA_Card", "Generation", META_READ | META_EXPERIMENTAL | META_PROPERTY},
    {"TVRHBA_Realizes", "Antecedent", META_KEY | META_REFERENCE},
    {"TVRHBA_CardContainsChip", "GroupComponent", META_KEY | META_AGGREGATE | META_REFERENCE},
    {"TVRHBA_ConcreteJob", "JobInParameters", META_EMBEDDED_OBJECT | META_EXPERIMENTAL | META_REFERENCE},
    {"TVRHBA_DiagnosticSettingDataRecord", "Settings", META_EMBEDDED_INSTANCE | META_REFERENCE},
    {"TVRHBA_FCTagService", "StartService", META_METHOD},
    {"TVRHBA_FCTagService", "ChangeAffectedElementsAssignedSequence", META_EXPERIMENTAL | META_METHOD},
};

TEST(Features, HaveTheFlagsOfTheirQualifiers)
{
    for (const FlagRow& row : flag_rows)
    {
        const Meta_Feature* feature = find_feature(find_class(&the_repository, row.class_name), row.feature);
        ASSERT_NE(feature, nullptr) << row.feature;
        EXPECT_EQ(feature->flags, row.flags) << row.class_name << "." << row.feature;
    }
}

TEST(Features, EmbeddedInstancesNameTheirClass)
{
    const auto target = [](const char* class_name, const char* feature)
    { return as_reference(find_feature(find_class(&the_repository, class_name), feature))->meta_class; };
    EXPECT_EQ(target("TVRHBA_DiagnosticSettingDataRecord", "Settings"),
              find_class(&the_repository, "CIM_DiagnosticSettingData"));
    EXPECT_EQ(target("TVRHBA_ConcreteJob", "JobOutParameters"), &Instance::static_meta_class);
}

} // namespace

} // namespace cimple
