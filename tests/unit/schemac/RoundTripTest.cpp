// What CIM servers get says what the sources say: read back, it gives the same classes.
#include "Sources.h"
#include "schemac/MofText.h"
#include "schemac/Output.h"

#include <gmock/gmock.h>
#include <rapidcheck/gtest.h>

#include <fstream>
#include <iterator>

namespace schemac
{

namespace
{

std::string facts_of(const std::optional<Value>& value)
{
    std::string text = !value ? "-" : value->is_array ? "list" : "";
    for (const Literal& item : value ? value->items : std::vector<Literal>())
        text += "|" + std::to_string(static_cast<int>(item.kind)) + item.text;
    return text;
}

std::string facts_of(const Qualifiers& qualifiers)
{
    std::string text;
    for (const Qualifier& qualifier : qualifiers)
        text += " " + qualifier.name + "=" + facts_of(qualifier.value);
    return text;
}

std::string facts_of(const Feature& feature)
{
    std::string text = feature.name + ": " + feature.type + " " + feature.class_name + " kind " +
                       std::to_string(static_cast<int>(feature.kind)) + " embedded " +
                       std::to_string(static_cast<int>(feature.embedded)) + " [" + std::to_string(feature.subscript) +
                       "] = " + facts_of(feature.default_value) + facts_of(feature.qualifiers);
    for (const Feature& parameter : feature.parameters)
        text += "\n    " + facts_of(parameter);
    return text;
}

std::vector<std::string> facts_of(const Class& c)
{
    std::vector<std::string> facts{c.superclass_name + facts_of(c.qualifiers)};
    for (const Feature& feature : c.features)
        facts.push_back(facts_of(feature));
    for (const std::size_t key : c.keys)
        facts.push_back("key " + c.members[key].feature->name);
    return facts;
}

std::string content_of(const std::string& name)
{
    std::ifstream in(SCHEMA_SOURCES + ("/" + name), std::ios::binary);
    EXPECT_TRUE(in) << name;
    return std::string(std::istreambuf_iterator<char>(in), {});
}

TEST(RoundTrip, ServersGetTheSchemaOfTheSources)
{
    Schema sources;
    for (const char* name : {"qualifiers.mof", "cim.mof", "platform.mof", "tavrin.mof"})
        parse(content_of(name), name, sources);
    ASSERT_THAT(check(sources), testing::IsEmpty());

    Schema read;
    const OutputFiles files = write_server_files(sources, "1");
    for (const OutputFile& file : files)
        if (file.name == "qualifiers.mof" || file.name.ends_with("_classes.mof"))
            parse(file.text, file.name, read);
    ASSERT_THAT(check(read), testing::IsEmpty());

    ASSERT_EQ(read.qualifiers.size(), sources.qualifiers.size());
    for (std::size_t i = 0; i < sources.qualifiers.size(); i++)
    {
        const QualifierDeclaration& source = sources.qualifiers[i];
        EXPECT_EQ(read.qualifiers[i].name + read.qualifiers[i].type, source.name + source.type);
        EXPECT_EQ(facts_of(read.qualifiers[i].default_value), facts_of(source.default_value)) << source.name;
        EXPECT_EQ(read.qualifiers[i].scopes, source.scopes) << source.name;
        EXPECT_EQ(read.qualifiers[i].flavors, source.flavors) << source.name;
    }
    std::size_t served = 0;
    for (const Class& c : sources.classes)
    {
        const Class* again = read.find_class(c.name);
        served += is_served(c);
        if (again)
            EXPECT_THAT(facts_of(*again), testing::ElementsAreArray(facts_of(c))) << c.name;
        else
            EXPECT_FALSE(is_served(c)) << c.name;
    }
    EXPECT_EQ(served, 159u);
}

/// A class, or a feature that it declares first, without a text is one that clients show without explanation.
TEST(Sources, ExplainAllThatTheyAdd)
{
    Schema sources;
    for (const char* name : {"qualifiers.mof", "cim.mof", "platform.mof", "tavrin.mof"})
        parse(content_of(name), name, sources);
    const auto explained = [](const Qualifiers& qualifiers)
    { return text_of(qualifiers, "Description") || find(qualifiers, "Override"); };
    for (const Class& c : sources.classes)
    {
        if (!is_served(c))
            continue;
        EXPECT_TRUE(explained(c.qualifiers)) << c.name;
        for (const Feature& feature : c.features)
        {
            EXPECT_TRUE(explained(feature.qualifiers)) << c.name << "." << feature.name;
            for (const Feature& parameter : feature.parameters)
                EXPECT_TRUE(explained(parameter.qualifiers)) << c.name << "." << feature.name << "." << parameter.name;
        }
    }
}

RC_GTEST_PROP(MofText, LongTextsComeBackWhole, ())
{
    const auto text = *rc::gen::scale(4.0, rc::gen::container<std::string>(rc::gen::elementOf(
                                               std::string("    aaaaaaaabbbbbbbbcccccccc.,\"\\\n\t"))));
    Schema schema;
    parse("class T_A { };", "t.mof", schema);
    schema.classes.front().qualifiers.push_back({"Description", Value{false, {{Literal::Kind::String, text}}}, {}});
    Schema again;
    parse(mof_of(schema.classes.front()), "again", again);
    RC_ASSERT(*text_of(again.classes.front().qualifiers, "Description") == text);
}

} // namespace

} // namespace schemac
