// Keys: equality, model paths, and the ends of associations that are found by them.
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <limits>
#include <string>
#include <vector>

using namespace cimple;

namespace
{

// --- key_eq -----------------------------------------------------------------------------------------------

/// A random instance of one of three related classes, from few values so that equal keys are frequent.
Ref<T_Base> random_named()
{
    const auto pick = [] { return std::string(1, *rc::gen::element('a', 'A', 'b')); };
    const std::string system = pick();
    const std::string name = pick();
    T_Base* record = nullptr;
    switch (*rc::gen::inRange(0, 3))
    {
    case 0:
        record = make_named<T_Base>(system.c_str(), name.c_str());
        break;
    case 1:
        record = make_named<T_Disk>(system.c_str(), name.c_str());
        break;
    default:
        record = make_named<T_OtherDisk>(system.c_str(), name.c_str());
    }
    record->Name.null = *rc::gen::inRange<std::uint8_t>(0, 2);
    record->Caption.set(pick().c_str());
    return Ref<T_Base>(record);
}

/// What key equality means, written out.
bool same_keys(const T_Base* a, const T_Base* b)
{
    return a->System.value.view() == b->System.value.view() && a->Name.null == b->Name.null &&
           (a->Name.null || a->Name.value.view() == b->Name.value.view());
}

RC_GTEST_PROP(KeyProperty, EqualityIsAnEquivalence, ())
{
    const Ref<T_Base> a = random_named();
    const Ref<T_Base> b = random_named();
    const Ref<T_Base> c = random_named();
    RC_ASSERT(key_eq(a.get(), a.get()));
    RC_ASSERT(key_eq(a.get(), b.get()) == same_keys(a.get(), b.get()));
    RC_ASSERT(key_eq(a.get(), b.get()) == key_eq(b.get(), a.get()));
    if (key_eq(a.get(), b.get()) && key_eq(b.get(), c.get()))
        RC_ASSERT(key_eq(a.get(), c.get()));

    const Ref<T_Link> link(make_link<T_Link>(clone_of(a.get()), clone_of(b.get())));
    const Ref<T_SubLink> other(make_link<T_SubLink>(clone_of(b.get()), clone_of(b.get())));
    RC_ASSERT(key_eq(link.get(), other.get()) == same_keys(a.get(), b.get()));
    RC_ASSERT(key_eq(other.get(), link.get()) == same_keys(a.get(), b.get()));
}

TEST(KeyEq, NullReferencesEqualOnlyEachOther)
{
    const Ref<T_Link> none(make_link<T_Link>(nullptr, nullptr));
    const Ref<T_Link> one(make_link<T_Link>(make_named<T_Base>("h", "1"), nullptr));
    EXPECT_TRUE(key_eq(none.get(), none.get()));
    EXPECT_FALSE(key_eq(none.get(), one.get()));
    EXPECT_FALSE(key_eq(one.get(), none.get()));
}

TEST(KeyEq, AKeyOfAnotherTypeOrKindIsUnequal)
{
    const Ref<T_Base> base(make_named<T_Base>("h", ""));
    const Ref<T_Stranger> stranger(create<T_Stranger>());
    stranger->System.set("h");
    EXPECT_FALSE(key_eq(base.get(), stranger.get())); // Name is a number there
    EXPECT_FALSE(key_eq(stranger.get(), base.get()));
    const Ref<T_Link> link(make_link<T_Link>(nullptr, nullptr));
    EXPECT_FALSE(key_eq(base.get(), link.get())); // System is missing there
}

TEST(KeyEq, RealsDatetimesAndArraysCompareByValue)
{
    const Ref<T_Odd> a(create<T_Odd>());
    a->Real.set(0.0f);
    a->When.set(Datetime::timestamp(5, 0));
    a->List.set({1, 2});
    const Ref<T_Odd> b(clone_of(a.get()));
    b->Real.set(-0.0f);
    b->Others.value.append(create<T_Base>()); // a reference array is no key
    EXPECT_TRUE(key_eq(a.get(), b.get()));

    b->When.set(Datetime::timestamp(5, 60));
    EXPECT_FALSE(key_eq(a.get(), b.get()));
    b->When.value = a->When.value;
    b->List.value.append(3);
    EXPECT_FALSE(key_eq(a.get(), b.get()));

    a->Real.set(std::numeric_limits<float>::quiet_NaN());
    EXPECT_FALSE(key_eq(a.get(), a.get()));
    a->Real.set_null();
    EXPECT_TRUE(key_eq(a.get(), a.get()));
}

// --- model_path -------------------------------------------------------------------------------------------

TEST(ModelPath, ReadsKeysOfEveryKind)
{
    const Ref<> instance(model_path(
        &T_Typed::static_meta_class,
        R"(t_typed.flag=TRUE,U8=0xff,S64=-9,U64=18446744073709551615,Text="a,\"b\" \x",Owner="T_Disk.System=\"h\",Name=\"n\"")"));
    const auto* typed = cast<T_Typed>(instance.get());
    ASSERT_NE(typed, nullptr);
    EXPECT_TRUE(typed->Flag.value);
    EXPECT_EQ(typed->U8.value, 255);
    EXPECT_EQ(typed->S64.value, -9);
    EXPECT_EQ(typed->U64.value, UINT64_MAX);
    EXPECT_EQ(typed->Text.value, R"(a,"b" \x)");
    ASSERT_NE(cast<T_Disk>(typed->Owner), nullptr);
    EXPECT_EQ(typed->Owner->Name.value, "n");
    EXPECT_TRUE(typed->Owner->Caption.null);
    EXPECT_TRUE(typed->Comment.null);
    EXPECT_TRUE(keys_non_null(typed));
}

TEST(ModelPath, FindsTheClassInChainAndRepository)
{
    const Ref<> base(model_path(&T_Disk::static_meta_class, R"(T_Base.Name="n",System="s")"));
    ASSERT_TRUE(base);
    EXPECT_EQ(base->__meta_class, &T_Base::static_meta_class);
    const Ref<> stranger(model_path(&T_Disk::static_meta_class, R"(T_Stranger.System="s",Name=1F)"));
    ASSERT_TRUE(stranger);
    EXPECT_EQ(cast<T_Stranger>(stranger.get())->Name.value, 31u);
}

TEST(ModelPath, AnythingElseIsNull)
{
    const char* const bad[] = {
        "",
        "T_Base",
        "T_Base.",
        ".Name=\"n\"",
        "9T.Name=\"n\"",
        "T_None.Name=\"n\"",
        "T_Base.Name=\"n\"",                         // a key is missing
        "T_Base.Name=\"n\",Name=\"m\"",              // one twice, the other missing
        "T_Base.Name=\"n\",System=\"s\",Name=\"m\"", // one too many
        "T_Base.Name=\"n\",System=\"s",              // no closing quote
        "T_Base.Name=\"n\",System=\"s\\",            // ends in an escape
        "T_Base.Name=n,System=\"s\"",                // no quotes
        "T_Base.Name=\"n\"System=\"s\"",             // no comma
        "T_Base.Name=\"n\",System",
        "T_Base.Name=\"n\",System:\"s\"",
        "T_Base.Name=\"n\",Caption=\"c\"", // no key
        "T_Base.Name=\"n\",Nothing=\"s\"",
        "T_Base.Name=\"n\", System=\"s\"",
        "T_Stranger.System=\"s\",Name=",
        "T_Stranger.System=\"s\",Name=1G",
        "T_Stranger.System=\"s\",Name=-1",
        "T_Stranger.System=\"s\",Name=4294967296",
        "T_Stranger.System=\"s\",Name=99999999999999999999",
        "T_Link.Antecedent=\"T_Base.Name=n\",Dependent=\"\"",
        "T_Link.Antecedent=\"T_Stranger.System=\\\"s\\\",Name=1\",Dependent=\"T_Stranger.System=\\\"s\\\",Name=1\"",
        "T_Odd.Real=1.0,When=\"00000000000000.000000:000\",List=1,Others=1",
    };
    for (const char* text : bad)
        EXPECT_FALSE(Ref<>(model_path(&T_Base::static_meta_class, text))) << text;
}

// --- ends of associations ---------------------------------------------------------------------------------

TEST(Associations, ReferencesMatchByKeyClassAndRole)
{
    const Ref<T_Disk> disk(make_named<T_Disk>("h", "1"));
    const Ref<T_Base> other(make_named<T_Base>("h", "3"));
    const Ref<T_Link> link(make_link<T_Link>(make_named<T_Base>("h", "1"), make_named<T_Base>("h", "2")));
    EXPECT_TRUE(references_match(disk.get(), link.get(), nullptr));
    EXPECT_TRUE(references_match(disk.get(), link.get(), ""));
    EXPECT_TRUE(references_match(disk.get(), link.get(), "ANTECEDENT"));
    EXPECT_FALSE(references_match(disk.get(), link.get(), "Dependent"));
    EXPECT_FALSE(references_match(other.get(), link.get(), ""));
    const Ref<T_Link> empty(make_link<T_Link>(nullptr, nullptr));
    EXPECT_FALSE(references_match(disk.get(), empty.get(), ""));

    Meta_Class alien_class = T_Base::static_meta_class; // the same keys in a class that no reference accepts
    alien_class.name = "T_Alien";
    const Ref<> alien(create(&alien_class));
    static_cast<T_Base*>(alien.get())->System = disk->System;
    static_cast<T_Base*>(alien.get())->Name = disk->Name;
    EXPECT_TRUE(key_eq(alien.get(), link->Antecedent));
    EXPECT_FALSE(references_match(alien.get(), link.get(), ""));
}

/// Names of the ends that get_associators() collects, or "-" when the association does not concern the instance.
std::string ends(const Instance* instance, const Instance* assoc, const char* assoc_class, const char* result_class,
                 const char* role, const char* result_role)
{
    const Instance* out[2];
    const auto count =
        get_associators(instance, assoc, assoc_class, result_class, role, result_role, out, std::size(out));
    if (count < 0)
        return "-";
    std::string names;
    for (std::ptrdiff_t i = 0; i < count; ++i)
    {
        names += static_cast<const T_Base*>(out[i])->Name.value.c_str();
        unref(out[i]);
    }
    return names;
}

TEST(Associations, EndsPassTheFilters)
{
    const Ref<T_Disk> one(make_named<T_Disk>("h", "1"));
    const Ref<T_Base> two(make_named<T_Base>("h", "2"));
    const Ref<T_Base> none(make_named<T_Base>("h", "3"));
    const Ref<T_SubLink> link(make_link<T_SubLink>(make_named<T_Disk>("h", "1"), make_named<T_Base>("h", "2")));
    struct
    {
        const Instance* from;
        const char* assoc_class;
        const char* result_class;
        const char* role;
        const char* result_role;
        const char* expected;
    } const cases[] = {
        {one.get(), nullptr, nullptr, nullptr, nullptr, "2"},
        {two.get(), "", "", "", "", "1"},
        {none.get(), "", "", "", "", "-"},
        {one.get(), "t_sublink", "", "", "", "2"}, // the association's own class,
        {one.get(), "T_Link", "", "", "", "2"},    // its superclass,
        {one.get(), "T_Base", "", "", "", "2"},    // or the class of the end
        {one.get(), "T_Disk", "", "", "", ""},     // which is a mere T_Base
        {two.get(), "T_Base", "", "", "", "1"},    // superclass of the end
        {one.get(), "T_None", "", "", "", ""},
        {one.get(), "", "t_base", "", "", "2"},
        {one.get(), "", "T_Disk", "", "", ""},
        {two.get(), "T_Link", "T_Disk", "", "", "1"},
        {one.get(), "", "T_Link", "", "", ""}, // the result class is never that of the association
        {one.get(), "", "", "Antecedent", "", "2"},
        {one.get(), "", "", "Dependent", "", "-"},
        {one.get(), "", "", "", "dependent", "2"},
        {one.get(), "", "", "", "Antecedent", ""},
    };
    for (std::size_t i = 0; i < std::size(cases); ++i)
    {
        const auto& c = cases[i];
        EXPECT_EQ(ends(c.from, link.get(), c.assoc_class, c.result_class, c.role, c.result_role), c.expected) << i;
    }
    EXPECT_EQ(link->Antecedent->__refs, 1u);
    EXPECT_EQ(link->Dependent->__refs, 1u);
}

TEST(Associations, AnInstanceAssociatedWithItself)
{
    const Ref<T_Base> base(make_named<T_Base>("h", "1"));
    const Ref<T_Link> link(make_link<T_Link>(clone_of(base.get()), clone_of(base.get())));
    EXPECT_EQ(ends(base.get(), link.get(), "", "", "", ""), "");            // both ends are the instance
    EXPECT_EQ(ends(base.get(), link.get(), "", "", "Antecedent", ""), "1"); // only one of them in that role
    const Ref<T_Link> half(make_link<T_Link>(clone_of(base.get()), nullptr));
    EXPECT_EQ(ends(base.get(), half.get(), "", "", "", ""), "");
}

TEST(Associations, NoMoreEndsThanRoom)
{
    const Ref<T_Base> base(make_named<T_Base>("h", "1"));
    const Ref<T_Link> link(make_link<T_Link>(clone_of(base.get()), make_named<T_Base>("h", "2")));
    EXPECT_EQ(get_associators(base.get(), link.get(), "", "", "", "", nullptr, 0), 0);
    EXPECT_EQ(link->Dependent->__refs, 1u);
}

} // namespace
