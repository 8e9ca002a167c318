// Paths and values as text and JSON, both ways.
#include "tests/unit/broker/FakeModule.h"

#include "broker/values/Json.h"
#include "broker/values/PathText.h"
#include "broker/values/QualifierText.h"
#include "broker/values/ValueText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>
#include <rapidcheck.h>

namespace
{

using namespace broker;
using broker_test::testClasses;
using testing::HasSubstr;

Path portPath(const std::string& name)
{
    return {"root/tavrin",
            "TST_Port",
            {{"Number", Value::uint16(7)}, {"Up", Value::boolean(true)}, {"Name", Value::string(name)}}};
}

Value parse(CMPIType type, std::string_view text)
{
    return parseValue(Target(testClasses(), "root/tavrin", type), text);
}

std::string refusalOf(std::string_view path)
{
    try
    {
        parsePath(path, testClasses(), "root/tavrin");
    }
    catch (const std::invalid_argument& error)
    {
        return error.what();
    }
    return "";
}

TEST(PathText, KeysHaveTheTypesOfTheClass)
{
    EXPECT_EQ(parsePath("TST_Port.Number=7,Up=true,Name=\"a\"", testClasses(), "root/tavrin"), portPath("a"));
    // A shell takes quotes away, and people write names in any case.
    EXPECT_EQ(parsePath("tst_port.number=7,up=TRUE,name=a", testClasses(), "root/tavrin"), portPath("a"));
    EXPECT_EQ(parsePath("TST_Port.Number=\"7\",Up=\"true\",Name=\"a\"", testClasses(), "root/tavrin"), portPath("a"));
}

TEST(PathText, AnyNameComesBack)
{
    rc::check("a path reads back from its text, as a key of another path too",
              [](const std::string& name, const std::string& other)
              {
                  const Path port = portPath(name);
                  RC_ASSERT(parsePath(pathText(port), testClasses(), "root/tavrin") == port);
                  const Path link{
                      "root/tavrin",
                      "TST_Link",
                      {{"Left", Value::reference(broker_test::basePath(other))}, {"Right", Value::reference(port)}}};
                  RC_ASSERT(parsePath(fullPathText(link), testClasses(), "elsewhere") == link);
              });
}

/// JSON holds UTF-8 only, and a line one path.
TEST(PathText, BytesOfAnyKindComeBackFromJson)
{
    for (const char* name : {"\xff", "caf\xe9 \xc3\xa9", "\xc3", "\xed\xa0\x80", "\xf4\x90\x80\x80", "\xe2\x82\xac",
                             "\xc0\x80", "line\nbreak\x7f", "\\xff", "\\", "x\\"})
    {
        SCOPED_TRACE(name);
        const Path link{"root/tavrin", "TST_Link", {{"Left", Value::reference(broker_test::basePath(name))}}};
        for (const Path& path : {portPath(name), link})
        {
            const std::string json = jsonText(pathText(path));
            EXPECT_EQ(json.find('\n'), std::string::npos);
            EXPECT_EQ(parsePath(parseJson(json).get<std::string>(), testClasses(), "root/tavrin"), path) << json;
        }
    }
    EXPECT_EQ(pathText(broker_test::basePath("caf\xe9 \xc3\xa9")), "TST_Base.Id=\"caf\\xe9 \xc3\xa9\"");
    EXPECT_EQ(parsePath("TST_Base.Id=\"a\\xg1\"", testClasses(), "n").key("Id")->asString(), "axg1");
}

TEST(PathText, NamespaceAndHostStandInFront)
{
    const Path path = parsePath("//box/root/ibmse:TST_Base.Id=\"x:y\"", testClasses(), "root/tavrin");
    EXPECT_EQ(path.host, "box");
    EXPECT_EQ(path.nameSpace, "root/ibmse");
    EXPECT_EQ(path.key("id")->asString(), "x:y");
    EXPECT_EQ(fullPathText(path), "//box/root/ibmse:TST_Base.Id=\"x:y\"");
    EXPECT_EQ(parsePath("TST_Base", testClasses(), "root/tavrin").keys.size(), 0U);
}

TEST(PathText, KeysOfUnknownClassesAreGuessed)
{
    const Path path = parsePath("ABC_X.a=-4,b=true,c=18446744073709551615,d=word,e=\"12\"", testClasses(), "n");
    EXPECT_EQ(*path.key("a"), Value::sint64(-4));
    EXPECT_EQ(*path.key("b"), Value::boolean(true));
    EXPECT_EQ(*path.key("c"), Value::uint64(UINT64_MAX));
    EXPECT_EQ(*path.key("d"), Value::string("word"));
    EXPECT_EQ(*path.key("e"), Value::string("12"));
}

TEST(PathText, RefusalsNameTheReason)
{
    EXPECT_THAT(refusalOf(""), HasSubstr("no class name"));
    EXPECT_THAT(refusalOf("TST_Base.Idx=1"), HasSubstr("no key 'Idx'"));
    EXPECT_THAT(refusalOf("TST_Base.Level=1"), HasSubstr("no key 'Level'"));
    EXPECT_THAT(refusalOf("TST_Base.Id"), HasSubstr("name=value"));
    std::string nested;
    for (int i = 0; i < 10000; i++)
        nested += "TST_Link.Left=";
    EXPECT_THAT(refusalOf(nested), HasSubstr("too deeply"));
    EXPECT_THAT(refusalOf("TST_Base.Id=\"open"), HasSubstr("not closed"));
    EXPECT_THAT(refusalOf("TST_Base.Id=\"a\"x"), HasSubstr("comma"));
    EXPECT_THAT(refusalOf("TST_Base.Id=a,Id=b"), HasSubstr("twice"));
    EXPECT_THAT(refusalOf("TST_Port.Number=70000"), HasSubstr("range"));
    EXPECT_THAT(refusalOf("TST_Port.Up=maybe"), HasSubstr("no boolean"));
    EXPECT_EQ(missingKey(parsePath("TST_Port.Number=1,Name=a", testClasses(), "n"), testClasses()), "Up");
}

TEST(SameObject, LooksAtMeaningNotAtForm)
{
    Path other{"ROOT/Tavrin",
               "tst_port",
               {{"name", Value::string("a")}, {"UP", Value::boolean(true)}, {"number", Value::sint64(7)}}};
    EXPECT_TRUE(sameObject(portPath("a"), other));
    other.nameSpace.clear();
    EXPECT_TRUE(sameObject(portPath("a"), other));
    other.setKey("Number", Value::sint64(-7));
    EXPECT_FALSE(sameObject(portPath("a"), other));
    EXPECT_FALSE(sameObject(portPath("a"), portPath("A")));
    // The bits of -1 and of the largest unsigned number are equal; the numbers are not.
    const Path minusOne{"n", "X", {{"k", Value::sint64(-1)}}};
    const Path largest{"n", "X", {{"k", Value::uint64(UINT64_MAX)}}};
    EXPECT_FALSE(sameObject(minusOne, largest));
}

TEST(ValueText, NumbersComeBack)
{
    rc::check("an integer reads back from its text",
              [](std::uint64_t bits)
              {
                  const CMPIType type = *rc::gen::element(CMPI_uint8, CMPI_uint16, CMPI_uint32, CMPI_uint64, CMPI_sint8,
                                                          CMPI_sint16, CMPI_sint32, CMPI_sint64, CMPI_char16);
                  const Value value = Value::integer(type, bits);
                  RC_ASSERT(parse(type, valueText(value)) == value);
              });
    rc::check("a real reads back from its text", [](double number)
              { RC_ASSERT(parse(CMPI_real64, valueText(Value::real64(number))) == Value::real64(number)); });
}

TEST(ValueText, ArraysArePlainOrJson)
{
    const Value words = Value::array(CMPI_string, {Value::string("a b"), Value::string("c")});
    EXPECT_EQ(parse(CMPI_stringA, "[a b, c]"), words);
    EXPECT_EQ(parse(CMPI_stringA, "[\"a b\",\"c\"]"), words);
    EXPECT_EQ(parse(CMPI_stringA, "[]"), Value::array(CMPI_string, {}));
    EXPECT_EQ(parse(CMPI_uint8A, "[1,255]"), Value::array(CMPI_uint8, {Value::uint8(1), Value::uint8(255)}));
    EXPECT_THROW(parse(CMPI_uint8A, "[1,256]"), std::invalid_argument);
    EXPECT_THROW(parse(CMPI_uint8A, "1"), std::invalid_argument);
    EXPECT_EQ(valueText(words), "[a b, c]");
    EXPECT_EQ(mofValue(words), "{\"a b\", \"c\"}");
}

TEST(ValueText, NullAndQuotesAreToldApart)
{
    EXPECT_TRUE(parse(CMPI_string, "null").isNull());
    EXPECT_EQ(parse(CMPI_string, "\"null\""), Value::string("null"));
    EXPECT_EQ(parse(CMPI_string, "\"a\\u0041\""), Value::string("aA"));
    EXPECT_EQ(parse(CMPI_uint16, "0x1F"), Value::uint16(31));
    for (const char* text : {"", "-1", "65536", "1x", "0x", "1.0"})
    {
        EXPECT_THROW(parse(CMPI_uint16, text), std::invalid_argument) << text;
    }
}

TEST(DateTimeText, OnlyWholeDatesAreRead)
{
    const auto stamp = DateTime::parse("20240229121314.000005+060");
    ASSERT_TRUE(stamp);
    EXPECT_FALSE(stamp->isInterval());
    EXPECT_EQ(stamp->microseconds(), 1709205194000005U);
    EXPECT_EQ(DateTime::fromMicroseconds(1709205194000005U, false).text(), "20240229111314.000005+000");
    EXPECT_EQ(DateTime::parse("00000002030405.000006:000")->microseconds(), 183845000006U);
    for (const char* text : {"", "20240229121314.000005+06", "20241329121314.000005+060", "20240229251314.000005+060",
                             "00000002030405.000006:001", "2024022912131x.000005+060"})
    {
        EXPECT_FALSE(DateTime::parse(text)) << text;
    }
    rc::check("an interval reads back from its text",
              []
              {
                  const auto usec = *rc::gen::inRange<std::uint64_t>(0, 99'999'999ULL * 86'400'000'000ULL);
                  RC_ASSERT(DateTime::fromMicroseconds(usec, true).microseconds() == usec);
              });
}

TEST(JsonText, InstancesComeBack)
{
    Object disk{broker_test::basePath("d1", "TST_Disk"), {}};
    disk.set("Id", Value::string("d1"));
    disk.set("Size", Value::uint64(UINT64_MAX));
    disk.set("Names", Value::array(CMPI_string, {Value::string("a"), Value::null(CMPI_string)}));
    disk.set("Next", Value::reference(portPath("\"p\"")));
    Object inner{broker_test::basePath("in"), {{"Id", Value::string("in")}}};
    disk.set("Inner", Value::instance(inner));
    const Json json = toJson(disk);
    EXPECT_EQ(json["path"], "TST_Disk.Id=\"d1\"");
    EXPECT_EQ(json["properties"]["Size"], UINT64_MAX);
    EXPECT_EQ(objectFromJson(testClasses(), "root/tavrin", json), disk);
}

TEST(JsonText, WrongInstancesAreRefused)
{
    const auto refuse = [](const char* text)
    {
        try
        {
            objectFromJson(testClasses(), "n", Json::parse(text));
        }
        catch (const std::invalid_argument& error)
        {
            return std::string(error.what());
        }
        return std::string();
    };
    EXPECT_THAT(refuse("[]"), HasSubstr("class"));
    EXPECT_THAT(refuse(R"({"class":"Nope"})"), HasSubstr("'Nope'"));
    EXPECT_THAT(refuse(R"({"class":"TST_Base","properties":{"X":1}})"), HasSubstr("no property 'X'"));
    EXPECT_THAT(refuse(R"({"class":"TST_Base","properties":{"Level":"3"}})"), HasSubstr("TST_Base.Level"));
    EXPECT_THAT(refuse(R"({"class":"TST_Base","properties":{"Level":3.5}})"), HasSubstr("uint16"));
    EXPECT_THAT(refuse(R"({"class":"TST_Base","properties":{"Names":"a"}})"), HasSubstr("string[]"));
}

TEST(ClassTable, TellsOriginsDefaultsAndDescent)
{
    const ClassInfo* disk = testClasses().find("tst_disk");
    ASSERT_TRUE(disk);
    EXPECT_EQ(disk->property("level")->origin->name, "TST_Base");
    EXPECT_EQ(disk->property("Size")->origin->name, "TST_Disk");
    EXPECT_EQ(disk->property("Level")->defaultValue, Value::uint16(3));
    EXPECT_EQ(disk->property("Inner")->type, CMPI_instance);
    EXPECT_EQ(disk->keys, std::vector<std::string>{"Id"});
    EXPECT_TRUE(disk->isA("tst_base"));
    EXPECT_FALSE(testClasses().isA("TST_Base", "TST_Disk"));
    EXPECT_EQ(testClasses().withSubclasses(*testClasses().find("TST_Base")).size(), 2U);
    EXPECT_EQ(disk->method("add")->parameters.size(), 3U);
}

TEST(ClassMof, ShowsWhatTheClassAdds)
{
    const std::string disk = mofText(*testClasses().find("TST_Disk"));
    EXPECT_THAT(disk, HasSubstr("class TST_Disk : TST_Base\n"));
    EXPECT_THAT(disk, HasSubstr("    uint64 Size;\n"));
    EXPECT_THAT(disk, testing::Not(HasSubstr("Level")));
    const std::string base = mofText(*testClasses().find("TST_Base"));
    EXPECT_THAT(base, HasSubstr("    [Key, Read]\n    string Id;\n"));
    EXPECT_THAT(base, HasSubstr("    uint16 Level = 3;\n"));
    EXPECT_THAT(base, HasSubstr("[Out] string Notes[]"));
    EXPECT_THAT(mofText(*testClasses().find("TST_Link")), HasSubstr("    TST_Port REF Right;\n"));
    EXPECT_EQ(qualifierMask("KEY"), std::uint32_t{cimple::META_KEY});
    EXPECT_EQ(qualifierMask("Property"), 0U); // a kind, no qualifier
}

} // namespace
