// What the parser and the checks make of sources that are right.
#include "Sources.h"
#include "schemac/MofText.h"
#include "schemac/Types.h"

#include <gmock/gmock.h>
#include <rapidcheck/gtest.h>

namespace schemac
{

namespace
{

std::vector<std::string> member_names(const Class& c)
{
    std::vector<std::string> names;
    for (const Member& member : c.members)
    {
        names.push_back(member.declared_by->name + "." + member.feature->name);
    }
    return names;
}

const Feature& only_feature(const Schema& schema)
{
    return schema.classes.back().features.front();
}

TEST(Model, OverridesStandInTheInheritedPlaceAndKeysCountTheChain)
{
    const Schema schema = checked("class T_A : T_Disk { [Override ( \"State\" )] uint16 State = 2; string Own; };\n"
                                  "class T_B : T_A { [Override ( \"Start\" )] uint32 Start(); };");
    const Class& b = *schema.find_class("t_b");
    EXPECT_THAT(member_names(b),
                testing::ElementsAre("T_Device.InstanceID", "T_Element.Caption", "T_A.State", "T_B.Start", "T_A.Own"));
    EXPECT_EQ(b.keys.size(), 1u);
    EXPECT_EQ(schema.find_class("T_Element")->keys.size(), 0u);
    EXPECT_EQ(schema.find_class("T_Link")->keys.size(), 2u);
    EXPECT_TRUE(is_or_derives_from(&b, schema.find_class("T_Device")));
    EXPECT_FALSE(is_or_derives_from(schema.find_class("T_Device"), &b));
}

/// An override with nothing but texts is for people: the tables have what it overrides. Any other is a record.
TEST(Model, OverridesThatOnlyExplainHaveNoRecord)
{
    const struct
    {
        const char* declaration;
        bool recorded;
    } overrides[] = {
        {"[Override ( \"State\" ), ValueMap { \"5\" }, Values { \"Five\" }] uint16 State = 5;", false},
        {"[Override ( \"Start\" ), Description ( \"Go.\" )] uint32 Start([In] uint16 Level);", false},
        {"[Override ( \"State\" )] uint16 State = 5;", true},
        {"[Override ( \"State\" ), Description ( \"S.\" )] uint16 State = 6;", true},
        {"[Override ( \"State\" ), Description ( \"S.\" ), Write] uint16 State = 5;", true},
        {"[Override ( \"Start\" ), Description ( \"Go.\" )] uint32 Start([Out] uint16 Level);", true},
        {"[Override ( \"Start\" ), Description ( \"Go.\" )] uint32 Start();", true},
    };
    for (const auto& row : overrides)
    {
        SCOPED_TRACE(row.declaration);
        for (const std::string name : {"TVRHBA_A", "T_A"})
        {
            const Schema schema = checked("class " + name + " : T_Element { " + row.declaration + " };");
            const Class& c = schema.classes.back();
            const bool recorded = row.recorded || name == "T_A"; // published classes stay as they are
            EXPECT_EQ(recorded_features(c).size(), recorded ? 1u : 0u) << name;
            EXPECT_EQ(c.members[c.features.front().kind == FeatureKind::Method ? 3 : 2].declared_by->name,
                      recorded ? name : "T_Element");
        }
    }
    EXPECT_THAT(refusals_of(std::string("class TVRHBA_A : T_Element {\n") + overrides[0].declaration + "\n" +
                            overrides[0].declaration + " };"),
                testing::ElementsAre("t.mof:3: feature \"State\" is declared twice"));
}

TEST(Model, AReferenceMayNarrowToAClassThatStandsBehind)
{
    EXPECT_THAT(
        refusals_of("[Association] class T_A : T_Link { [Key, Override ( \"Dependent\" )] T_Z REF Dependent; };\n"
                    "class T_Z : T_Disk { };"),
        testing::IsEmpty());
}

TEST(Parser, ReadsCommentsJoinedStringsAndWordsInAnyCase)
{
    const Schema schema = checked("/* two\n lines */ CLASS T_A { // end\n STRING A = \"one \"\n\"\\\"two\\\"\\n\"; };");
    EXPECT_EQ(only_feature(schema).default_value->items.front().text, "one \"two\"\n");
    EXPECT_EQ(only_feature(schema).place.line, 3);
}

TEST(Parser, AnEmbeddedStringIsAReference)
{
    const Schema schema = checked("class T_A { [EmbeddedInstance ( \"T_Disk\" )] string A[];\n"
                                  "[EmbeddedObject] string B; [EmbeddedObject ( false )] string C; };");
    const std::vector<Feature>& features = schema.classes.back().features;
    EXPECT_EQ(features[0].kind, FeatureKind::Reference);
    EXPECT_EQ(features[0].class_name, "T_Disk");
    EXPECT_EQ(features[0].subscript, -1);
    EXPECT_EQ(features[1].embedded, Embedded::Object);
    EXPECT_EQ(features[1].class_name, "");
    EXPECT_EQ(features[2].kind, FeatureKind::Property);
}

TEST(Values, BecomeCppOfTheirType)
{
    const auto cpp = [](const char* type, Literal::Kind kind, const char* text) {
        return cpp_value(*find_type(type), {kind, text});
    };
    EXPECT_EQ(cpp("uint8", Literal::Kind::Integer, "0xfF"), "255u");
    EXPECT_EQ(cpp("sint8", Literal::Kind::Integer, "-128"), "-127 - 1");
    EXPECT_EQ(cpp("sint8", Literal::Kind::Integer, "-0"), "0");
    EXPECT_EQ(cpp("sint64", Literal::Kind::Integer, "-9223372036854775808"), "-9223372036854775807 - 1");
    EXPECT_EQ(cpp("uint64", Literal::Kind::Integer, "18446744073709551615"), "18446744073709551615u");
    EXPECT_EQ(cpp("real32", Literal::Kind::Real, "+1.5e-3"), "1.5e-3f");
    EXPECT_EQ(cpp("boolean", Literal::Kind::Boolean, "true"), "true");
    EXPECT_EQ(cpp("string", Literal::Kind::String, "a\"b\\"), "\"a\\\"b\\\\\"");
    EXPECT_EQ(cpp("datetime", Literal::Kind::String, "20200229120000.000000-060"), "\"20200229120000.000000-060\"");
}

TEST(Flags, FollowFromTheQualifiers)
{
    const Schema schema = checked(
        "class T_A { string A; [Write] string B; [Read ( false )] string C; [Key] string D; [Octetstring] string E;\n"
        "[EmbeddedInstance ( \"T_Disk\" )] string F; [Experimental] uint32 G(); [Counter, Required] uint64 H;\n"
        "uint32 M([In] string A, [In ( false ), Out] string B, [In, Out, Required] string C, [Out] T_Disk REF D); };");
    std::vector<std::string> flags;
    for (const Feature& feature : schema.classes.back().features)
    {
        flags.push_back(feature_flags(feature));
    }
    EXPECT_THAT(flags, testing::ElementsAre(
                           "META_PROPERTY | META_READ", "META_PROPERTY | META_READ | META_WRITE", "META_PROPERTY",
                           "META_PROPERTY | META_READ | META_KEY", "META_PROPERTY | META_READ | META_OCTET_STRING",
                           "META_REFERENCE | META_EMBEDDED_INSTANCE", "META_METHOD | META_EXPERIMENTAL",
                           "META_PROPERTY | META_READ | META_COUNTER | META_REQUIRED", "META_METHOD"));
    flags.clear();
    for (const Feature& parameter : schema.classes.back().features.back().parameters)
    {
        flags.push_back(parameter_flags(parameter));
    }
    EXPECT_THAT(flags, testing::ElementsAre("META_PROPERTY | META_IN", "META_PROPERTY | META_OUT",
                                            "META_PROPERTY | META_IN | META_OUT | META_REQUIRED",
                                            "META_REFERENCE | META_IN | META_OUT"));
}

TEST(Flags, TellTheKindOfAClass)
{
    const Schema schema = checked("[Association, Aggregation, Composition] class T_A : T_Link { };\n"
                                  "[Association, Aggregation] class T_B : T_A { };\n"
                                  "[Indication, Version ( \"1\" )] class T_C { };");
    EXPECT_EQ(class_flags(*schema.find_class("T_Element")), "META_CLASS | META_ABSTRACT");
    EXPECT_EQ(class_flags(*schema.find_class("T_Disk")), "META_CLASS");
    EXPECT_EQ(class_flags(*schema.find_class("T_A")), "META_AGGREGATION | META_ASSOCIATION | META_COMPOSITION");
    EXPECT_EQ(class_flags(*schema.find_class("T_B")), "META_AGGREGATION | META_ASSOCIATION");
    EXPECT_EQ(class_flags(*schema.find_class("T_C")), "META_CLASS | META_INDICATION");
}

TEST(MofText, ReadsBackAsWritten)
{
    const Schema schema = checked(
        "[Association, Version ( \"1.0\" )] class T_A : T_Link { [Key, Override ( \"Dependent\" )] T_Disk REF "
        "Dependent;\n"
        "[ValueMap { \"0\", \"1\" }, Write] uint16 A[] = { 1, 0x10 }; [EmbeddedObject] string B[3]; sint8 C = -5;\n"
        "boolean D = false; uint32 M(); uint32 N([In] T_Disk REF X[], [In ( false ), Out] string Y); };");
    for (const Class& c : schema.classes)
    {
        Schema again;
        parse(mof_of(c), "again", again);
        EXPECT_EQ(mof_of(again.classes.front()), mof_of(c));
    }
    EXPECT_EQ(mof_of(schema.classes.back()), R"([Association, Version ( "1.0" )]
class T_A : T_Link {
   [Key, Override ( "Dependent" )]
   T_Disk REF Dependent;
   [ValueMap { "0", "1" }, Write]
   uint16 A[] = { 1, 0x10 };
   [EmbeddedObject]
   string B[3];
   sint8 C = -5;
   boolean D = false;
   uint32 M();
   uint32 N(
      [In]
      T_Disk REF X[],
      [In ( false ), Out]
      string Y);
};
)");
    EXPECT_EQ(mof_of(*schema.find_qualifier("abstract")),
              "Qualifier Abstract : boolean = false,\n    Scope(class, association, indication),\n"
              "    Flavor(EnableOverride, Restricted);\n");
}

/// Any text without control characters survives writing and reading, whatever lists it stands in.
RC_GTEST_PROP(MofText, KeepsEveryText, ())
{
    const auto texts = *rc::gen::nonEmpty(rc::gen::container<std::vector<std::string>>(
        rc::gen::container<std::string>(rc::gen::inRange<char>(' ', '\x7f'))));
    Class c;
    c.name = "T_A";
    Value list{true, {}};
    for (const std::string& text : texts)
    {
        list.items.push_back({Literal::Kind::String, text});
    }
    c.qualifiers = {{"ValueMap", list, {}}};
    Schema schema;
    parse(mof_of(c), "again", schema);
    std::vector<std::string> read;
    for (const Literal& item : schema.classes.front().qualifiers.front().value->items)
    {
        read.push_back(item.text);
    }
    RC_ASSERT(read == texts);
}

} // namespace

} // namespace schemac
