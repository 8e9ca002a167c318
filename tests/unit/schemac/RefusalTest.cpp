// One row per refusal: the text, and the line and reason that a person sees.
#include "Sources.h"

#include <gmock/gmock.h>

namespace schemac
{

namespace
{

struct Row
{
    const char* name;
    const char* text;
    const char* refusal; ///< without the name of the file
};

std::ostream& operator<<(std::ostream& out, const Row& row)
{
    return out << row.name;
}

class Refusal : public testing::TestWithParam<Row>
{};

TEST_P(Refusal, NamesFileLineAndReason)
{
    EXPECT_THAT(refusals_of(GetParam().text), testing::ElementsAre(std::string("t.mof:") + GetParam().refusal));
}

std::string row_name(const testing::TestParamInfo<Row>& info)
{
    return info.param.name;
}

const Row syntax[] = {
    {"StringWithoutEnd", "\n[Version ( \"1", "2: string without end"},
    {"StringAcrossLines", "[Version ( \"1\n\" )]", "1: string without end"},
    {"UnknownEscape", "[Version ( \"\\q\" )]", "1: unknown escape in a string"},
    {"CommentWithoutEnd", "\n/* class", "2: comment without end"},
    {"Pragma", "#pragma namespace(\"root\")", "1: pragmas are not supported"},
    {"UnexpectedCharacter", "class T_A { string A; } @", "1: unexpected character '@'"},
    {"EndInAClass", "class T_A {\n string A;", "2: expected a type, found the end of the file"},
    {"MissingSemicolon", "class T_A { string A; }", "1: expected \";\", found the end of the file"},
    {"MissingName", "class T_A {\n string ;\n};", "2: expected a name, found \";\""},
    {"OpenQualifiers", "[Version ( \"1\" ) class T_A { };", "1: expected \"]\", found \"class\""},
    {"EmptySize", "class T_A { string A[0]; };", "1: expected the size of an array, found \"0\""},
    {"SizeAboveSixteenBits", "class T_A { string A[32768]; };", "1: expected the size of an array, found \"32768\""},
    {"ValueIsAName", "class T_A { uint8 A = many; };", "1: expected a value, found \"many\""},
    {"MethodReturnsReference", "class T_A { T_Disk REF M(); };", "1: method \"M\" returns a reference"},
};
INSTANTIATE_TEST_SUITE_P(Syntax, Refusal, testing::ValuesIn(syntax), row_name);

const Row qualifiers[] = {
    {"Unknown", "\n[Nonsense]\nclass T_A { };", "2: unknown qualifier \"Nonsense\""},
    {"TwiceOnOneThing", "class T_A { [Write, write] string A; };", "1: qualifier \"write\" stands there twice"},
    {"OutOfScope", "class T_A { [Version ( \"1\" )] string A; };",
     "1: qualifier \"Version\" is not allowed on a property"},
    {"PropertyFlagOnAReference", "[Association] class T_A : T_Link { [Write] T_Disk REF Other; };",
     "1: qualifier \"Write\" is not allowed on a reference"},
    {"KeyOnAMethod", "class T_A { [Key] uint32 M(); };", "1: qualifier \"Key\" is not allowed on a method"},
    {"NeedsAValue", "[Version] class T_A { };", "1: qualifier \"Version\" needs a value"},
    {"TextForABoolean", "class T_A { [Write ( \"true\" )] string A; };", "1: qualifier \"Write\" takes a boolean"},
    {"ScalarForAList", "class T_A { [ValueMap ( \"1\" )] string A; };",
     "1: qualifier \"ValueMap\" takes a string list"},
    {"DeclaredTwice", "Qualifier key : boolean = false, Scope(any);", "1: qualifier \"key\" is declared twice"},
    {"UnknownType", "Qualifier New : text, Scope(any);", "1: qualifier \"New\" has the unknown type \"text\""},
    {"DefaultOfAnotherType", "Qualifier New : boolean = 1, Scope(any);", "1: qualifier \"New\" takes a boolean"},
};
INSTANTIATE_TEST_SUITE_P(Qualifiers, Refusal, testing::ValuesIn(qualifiers), row_name);

const Row classes[] = {
    {"DeclaredTwice", "class t_disk { };", "1: class \"t_disk\" is declared twice"},
    {"UnknownSuperclass", "class T_A : T_None { };", "1: unknown superclass \"T_None\""},
    {"SuperclassBehind", "class T_A : T_B { };\nclass T_B { };",
     "1: superclass \"T_B\" does not stand before the class"},
    {"ItsOwnSuperclass", "class T_A : T_A { };", "1: superclass \"T_A\" does not stand before the class"},
    {"PlainClassBelowAnAssociation", "class T_A : T_Link { };",
     "1: \"T_A\" does not repeat Association of its superclass"},
    {"AssociationBelowAPlainClass",
     "[Association] class T_A : T_Disk { [Key, Override ( \"InstanceID\" )] string InstanceID;"
     " T_Disk REF X; T_Disk REF Y; };",
     "1: association \"T_A\" derives from a class that is none"},
    {"OneReference", "[Association] class T_A { [Key] T_Disk REF X; };",
     "1: association \"T_A\" has fewer than two references"},
    {"ReferenceInAPlainClass", "class T_A {\n T_Disk REF X; };", "2: reference \"X\" in a class without Association"},
    {"AggregateWithoutAggregation",
     "[Association] class T_A : T_Link {\n [Key, Aggregate, Override ( \"Dependent\" )] T_Disk REF Dependent; };",
     "2: aggregate \"Dependent\" in a class without Aggregation"},
    {"AddsAKey", "class T_A : T_Disk { [Key] string Name; };", "1: class \"T_A\" adds keys to those of its superclass"},
};
INSTANTIATE_TEST_SUITE_P(Classes, Refusal, testing::ValuesIn(classes), row_name);

const Row features[] = {
    {"DeclaredTwice", "class T_A { string A;\n uint8 a; };", "2: feature \"a\" is declared twice"},
    {"OverriddenTwice",
     "class T_A : T_Element { [Override ( \"Caption\" )] string Caption;\n"
     "[Override ( \"Caption\" )] string Caption; };",
     "2: feature \"Caption\" is declared twice"},
    {"InheritedNameWithoutOverride", "class T_A : T_Element { string Caption; };",
     "1: \"Caption\" stands in a superclass of \"T_A\" and has no Override"},
    {"OverridesNothing", "class T_A : T_Element { [Override ( \"Title\" )] string Title; };",
     "1: \"Title\" overrides nothing"},
    {"OverridesAnotherName", "class T_A : T_Element { [Override ( \"State\" )] string Caption; };",
     "1: \"Caption\" must override \"Caption\", in this spelling"},
    {"OverridesInAnotherSpelling", "class T_A : T_Element { [Override ( \"caption\" )] string caption; };",
     "1: \"caption\" must override \"Caption\", in this spelling"},
    {"OverridesAMethodWithAProperty", "class T_A : T_Element { [Override ( \"Start\" )] uint32 Start; };",
     "1: \"Start\" changes its kind from method to property"},
    {"OverridesAPropertyWithAnEmbeddedInstance",
     "class T_A : T_Element { [Override ( \"Caption\" ), EmbeddedObject] string Caption; };",
     "1: \"Caption\" changes its kind from property to embedded instance"},
    {"OverridesAnotherType", "class T_A : T_Element { [Override ( \"State\" )] uint32 State; };",
     "1: \"State\" overrides a feature of another type"},
    {"OverridesAScalarWithAnArray", "class T_A : T_Element { [Override ( \"Caption\" )] string Caption[]; };",
     "1: \"Caption\" overrides a feature of another type"},
    {"OverridesAnotherReturnType", "class T_A : T_Element { [Override ( \"Start\" )] uint16 Start(); };",
     "1: \"Start\" overrides a feature of another type"},
    {"ReferenceOverrideWidens",
     "[Association] class T_A : T_Link { [Key, Override ( \"Dependent\" )] T_Disk REF Dependent; };\n"
     "[Association] class T_B : T_A { [Key, Override ( \"Dependent\" )] T_Device REF Dependent; };",
     "2: \"Dependent\" overrides a reference to \"T_Disk\" with a class that does not derive from it"},
    {"OverrideDropsTheKey", "class T_A : T_Device { [Override ( \"InstanceID\" )] string InstanceID; };",
     "1: \"InstanceID\" overrides a key and does not repeat Key"},
    {"OverrideChangesAFixedQualifier",
     "class T_A : T_Element { [Octetstring] uint8 Bytes[]; };\n"
     "class T_B : T_A { [Override ( \"Bytes\" )] uint8 Bytes[]; };\n"
     "class T_C : T_B { [Override ( \"Bytes\" ), Octetstring ( false )] uint8 Bytes[]; };",
     "3: \"Bytes\" changes the qualifier \"Octetstring\""},
    {"OverrideChangesAParameter",
     "class T_A : T_Element { [Override ( \"Start\" )] uint32 Start([In] string Level); };",
     "1: parameter \"Level\" overrides one of another type"},
    {"WordOfCpp", "class T_A { string default; };", "1: \"default\" is a reserved name"},
    {"NameOfTheRecordHead", "class T_A { string __refs; };", "1: \"__refs\" is a reserved name"},
    {"UnknownType", "class T_A { text A; };", "1: property \"A\" has the unknown type \"text\""},
    {"UnknownReferenceClass", "[Association] class T_A : T_Link { T_None REF X; };",
     "1: reference \"X\" is of the unknown class \"T_None\""},
    {"ReferenceClassInAnotherSpelling", "[Association] class T_A : T_Link { t_disk REF X; };",
     "1: reference \"X\" is of the unknown class \"t_disk\""},
    {"UnknownEmbeddedClass", "class T_A { [EmbeddedInstance ( \"T_None\" )] string A; };",
     "1: embedded instance \"A\" is of the unknown class \"T_None\""},
    {"EmbeddedInANumber", "class T_A { [EmbeddedInstance ( \"T_Disk\" )] uint8 A; };",
     "1: embedded instance \"A\" is not declared as a string"},
    {"EmbeddedWithDefault", "class T_A { [EmbeddedObject] string A = \"x\"; };",
     "1: embedded instance \"A\" has a default"},
    {"ReferenceArray", "[Association] class T_A : T_Link { T_Disk REF X[]; };", "1: reference \"X\" is an array"},
    {"KeyArray", "class T_A { [Key] string A[]; };", "1: key \"A\" is of a type that cannot be a key"},
    {"KeyReal", "class T_A { [Key] real64 A; };", "1: key \"A\" is of a type that cannot be a key"},
    {"KeyEmbedded", "class T_A { [Key, EmbeddedObject] string A; };", "1: key \"A\" is of a type that cannot be a key"},
};
INSTANTIATE_TEST_SUITE_P(Features, Refusal, testing::ValuesIn(features), row_name);

const Row methods[] = {
    {"ReturnsNothing", "class T_A { void M(); };", "1: method \"M\" returns the unsupported type \"void\""},
    {"ReturnsAnEmbeddedInstance", "class T_A { [EmbeddedInstance ( \"T_Disk\" )] string M(); };",
     "1: method \"M\" returns an embedded instance"},
    {"ParameterTwice", "class T_A { uint32 M([In] uint8 A,\n [In] string a); };",
     "2: parameter \"a\" is declared twice"},
    {"ParameterReturnValue", "class T_A { uint32 M([In] uint8 Return_Value); };",
     "1: \"return_value\" is a reserved name"},
    {"ParameterWordOfCpp", "class T_A { uint32 M([In] uint8 register); };", "1: \"register\" is a reserved name"},
    {"NeitherInNorOut", "class T_A { uint32 M([In ( false )] uint8 A); };", "1: parameter \"A\" is neither In nor Out"},
    {"ParameterOfUnknownType", "class T_A { uint32 M([In] word A); };",
     "1: property \"A\" has the unknown type \"word\""},
    {"ParameterOfUnknownClass", "class T_A { uint32 M([In] T_None REF A); };",
     "1: reference \"A\" is of the unknown class \"T_None\""},
};
INSTANTIATE_TEST_SUITE_P(Methods, Refusal, testing::ValuesIn(methods), row_name);

const Row texts[] = {
    {"FewerNamesThanValues", "class T_A { [ValueMap { \"1\", \"2\" },\n Values { \"One\" }] uint8 A; };",
     "2: qualifier \"Values\" of \"A\" has not as many texts as \"ValueMap\""},
    {"MoreNamesThanBits", "class T_A { [BitMap { \"1\" }, BitValues { \"One\", \"Two\" }] uint8 A; };",
     "1: qualifier \"BitValues\" of \"A\" has not as many texts as \"BitMap\""},
    {"ValueOutsideOfTheType", "class T_A { uint32 M([In, ValueMap { \"255\", \"..\", \"256..\" }] uint8 A); };",
     "1: qualifier \"ValueMap\" of \"A\" has \"256..\", which is no value of its type"},
    {"ValueThatIsNoNumber", "class T_A { [ValueMap { \"0x10..0x1F\", \"One\" }] uint32 M(); };",
     "1: qualifier \"ValueMap\" of \"M\" has \"One\", which is no value of its type"},
    {"ValueTwice", "class T_A { [ValueMap { \"OK\", \"Error\", \"OK\" }] string A; };",
     "1: qualifier \"ValueMap\" of \"A\" has \"OK\" twice"},
    {"UnitOfAText", "class T_A { [PUnit ( \"byte\" )] string A; };", "1: qualifier \"PUnit\" of \"A\" is of no number"},
};
INSTANTIATE_TEST_SUITE_P(Texts, Refusal, testing::ValuesIn(texts), row_name);

/// Defaults that are no value of their type; all give the same refusal.
TEST(Defaults, ValuesOfAnotherTypeOrRangeAreRefused)
{
    for (const char* declaration : {"boolean A = 1",
                                    "boolean A = \"true\"",
                                    "uint8 A = 256",
                                    "uint8 A = -1",
                                    "uint8 A = 07",
                                    "sint8 A = 128",
                                    "sint8 A = -129",
                                    "uint64 A = 18446744073709551616",
                                    "sint64 A = 9223372036854775808",
                                    "uint16 A = \"5\"",
                                    "uint16 A = 1.0",
                                    "uint16 A = 0x",
                                    "uint32 A = NULL",
                                    "real32 A = 1",
                                    "real32 A = 1.5.",
                                    "string A = 5",
                                    "datetime A = \"today\"",
                                    "datetime A = \"20200101000000.000000+0\"",
                                    "datetime A = \"00000000000500.000000:001\"",
                                    "datetime A = \"0000000000050x.000000:000\"",
                                    "uint8 A = { 1 }",
                                    "uint8 A[] = 1",
                                    "uint8 A[2] = { 1, 2, 3 }",
                                    "uint8 A[] = { 1, 300 }"})
    {
        EXPECT_THAT(refusals_of(std::string("class T_A { ") + declaration + "; };"),
                    testing::ElementsAre("t.mof:1: the default of \"A\" is no value of its type"))
            << declaration;
    }
}

TEST(Refusals, AllOfASourceAreReportedInOrder)
{
    EXPECT_THAT(refusals_of("class T_A : T_None { uint8 A = 300;\n string A; };\nclass T_Disk { };"),
                testing::ElementsAre("t.mof:1: unknown superclass \"T_None\"",
                                     "t.mof:2: feature \"A\" is declared twice",
                                     "t.mof:1: the default of \"A\" is no value of its type",
                                     "t.mof:3: class \"T_Disk\" is declared twice"));
}

} // namespace

} // namespace schemac
