// Values, paths, instances and classes as XML and back; and documents that clients should not send.
#include "broker/cimxml/Decode.h"
#include "broker/cimxml/Encode.h"
#include "tests/unit/broker/FakeModule.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

using namespace broker;
using namespace cimxml;
using broker_test::ns;
using broker_test::testClasses;

namespace
{

template <class Write> std::string xmlOf(Write write)
{
    std::string text;
    XmlText xml(text);
    write(xml);
    return text;
}

/// What `read` makes of the only element of a text.
template <class Read> auto parsed(const std::string& text, Read read)
{
    pugi::xml_document document;
    parseXml(document, text);
    return read(firstElement(document));
}

Path pathIn(const std::string& text)
{
    return parsed(text, [](const pugi::xml_node& node) { return Decoder(testClasses(), ns).path(node); });
}

Object instanceIn(const std::string& text)
{
    return parsed(text, [](const pugi::xml_node& node) { return Decoder(testClasses(), ns).instance(node); });
}

Value sameAgain(const Value& value, CMPIType type)
{
    const Target target(testClasses(), ns, type);
    const std::string text = xmlOf(
        [&](XmlText& xml)
        {
            const XmlElement around(xml, "PARAMVALUE");
            writeValue(xml, value);
        });
    return parsed(text, [&](const pugi::xml_node& node) { return Decoder(testClasses(), ns).value(node, target); });
}

/// A port below two levels of paths: keys of each kind.
Path portPath()
{
    return {
        ns, "TST_Port", {{"Number", Value::uint16(7)}, {"Up", Value::boolean(true)}, {"Name", Value::string("a<&\"")}}};
}

Object disk()
{
    Object inner{broker_test::basePath("in"), {{"Id", Value::string("in")}, {"Level", Value::uint16(9)}}};
    return {broker_test::basePath("d", "TST_Disk"),
            {{"Id", Value::string("d")},
             {"Names", Value::array(CMPI_string, {Value::string(" a "), Value::string("")})},
             {"Seen", Value::dateTime(*DateTime::parse("20260228123456.000000+060"))},
             {"Next", Value::reference(portPath())},
             {"Size", Value::uint64(~0ULL)},
             {"Inner", Value::instance(inner)}}};
}

// --- what is written

TEST(CimXml, PathsAreWrittenAsClientsReadThem)
{
    EXPECT_EQ(xmlOf([](XmlText& xml) { writeInstancePath(xml, portPath()); }),
              R"(<INSTANCEPATH><NAMESPACEPATH><HOST>localhost</HOST><LOCALNAMESPACEPATH><NAMESPACE NAME="root">)"
              R"(</NAMESPACE><NAMESPACE NAME="tavrin"></NAMESPACE></LOCALNAMESPACEPATH></NAMESPACEPATH>)"
              R"(<INSTANCENAME CLASSNAME="TST_Port"><KEYBINDING NAME="Number"><KEYVALUE VALUETYPE="numeric">7)"
              R"(</KEYVALUE></KEYBINDING><KEYBINDING NAME="Up"><KEYVALUE VALUETYPE="boolean">TRUE</KEYVALUE>)"
              R"(</KEYBINDING><KEYBINDING NAME="Name"><KEYVALUE VALUETYPE="string">a&lt;&amp;&quot;</KEYVALUE>)"
              R"(</KEYBINDING></INSTANCENAME></INSTANCEPATH>)");
}

TEST(CimXml, PropertiesHaveBothTagsWithoutAValueToo)
{
    const ClassInfo& info = *testClasses().find("TST_Disk");
    const auto written = [&](const char* name, const Value& value) {
        return xmlOf([&](XmlText& xml) { writeProperty(xml, {name, value}, info.property(name)); });
    };
    EXPECT_EQ(written("Level", Value::null(CMPI_uint16)), R"(<PROPERTY NAME="Level" TYPE="uint16"></PROPERTY>)");
    EXPECT_EQ(written("Names", Value::array(CMPI_string, {Value::string("a"), Value::null(CMPI_string)})),
              R"(<PROPERTY.ARRAY NAME="Names" TYPE="string"><VALUE.ARRAY><VALUE>a</VALUE><VALUE></VALUE>)"
              R"(</VALUE.ARRAY></PROPERTY.ARRAY>)");
    EXPECT_EQ(written("Next", Value::null(CMPI_ref)), R"(<PROPERTY.REFERENCE NAME="Next"></PROPERTY.REFERENCE>)");
    EXPECT_EQ(written("Inner", Value::instance({broker_test::basePath("i"), {{"Id", Value::string("<")}}})),
              R"(<PROPERTY NAME="Inner" TYPE="string" EmbeddedObject="instance"><VALUE>&lt;INSTANCE )"
              R"(CLASSNAME=&quot;TST_Base&quot;&gt;&lt;PROPERTY NAME=&quot;Id&quot; TYPE=&quot;string&quot;&gt;)"
              R"(&lt;VALUE&gt;&amp;lt;&lt;/VALUE&gt;&lt;/PROPERTY&gt;&lt;/INSTANCE&gt;</VALUE></PROPERTY>)");
}

TEST(CimXml, RealsHaveAFraction)
{
    for (const auto& [number, text] : {std::pair(30.0, "3.0e+01"), std::pair(-0.125, "-1.25e-01"),
                                       std::pair(0.0, "0.0e+00"), std::pair(-1 / 0.0, "-INF")})
        EXPECT_EQ(xmlOf([&, real = number](XmlText& xml) { writeValue(xml, Value::real64(real)); }),
                  std::string("<VALUE>") + text + "</VALUE>");
}

TEST(CimXml, WhatXmlCannotHoldIsAQuestionMark)
{
    const auto text = [](std::string_view raw) { return xmlOf([&](XmlText& xml) { xml.characters(raw); }); };
    EXPECT_EQ(text(std::string_view("a\0b\x1B\t\n", 6)), "a?b?\t\n");
    EXPECT_EQ(text("\xC3\xA4 \xE2\x82\xAC \xF0\x9F\x90\xA7"), "\xC3\xA4 \xE2\x82\xAC \xF0\x9F\x90\xA7");
    EXPECT_EQ(text("\xFF \xC3 \xED\xA0\x80 \xEF\xBF\xBF"), "? ? ??? ?");
    EXPECT_EQ(text("]]>\r"), "]]&gt;&#13;");
}

TEST(CimXml, AClassTellsItsFeatures)
{
    const std::string text = xmlOf(
        [](XmlText& xml) { writeClass(xml, *testClasses().find("TST_Disk"), {.localOnly = true, .origin = true}); });
    EXPECT_TRUE(text.starts_with(R"(<CLASS NAME="TST_Disk" SUPERCLASS="TST_Base">)")) << text;
    EXPECT_NE(text.find(R"(<PROPERTY NAME="Size" TYPE="uint64" CLASSORIGIN="TST_Disk" PROPAGATED="false">)"),
              text.npos);
    EXPECT_NE(text.find(R"(<QUALIFIER NAME="EmbeddedInstance" TYPE="string"><VALUE>TST_Base</VALUE></QUALIFIER>)"),
              text.npos);
    EXPECT_EQ(text.find("Level"), text.npos);
    const std::string base = xmlOf([](XmlText& xml) { writeClass(xml, *testClasses().find("TST_Base"), {}); });
    for (const char* part :
         {R"(<PROPERTY NAME="Id" TYPE="string"><QUALIFIER NAME="Key" TYPE="boolean"><VALUE>TRUE</VALUE></QUALIFIER>)",
          R"(</QUALIFIER><VALUE>3</VALUE></PROPERTY>)", R"(<PROPERTY.REFERENCE NAME="Next" REFERENCECLASS="TST_Port">)",
          R"(<METHOD NAME="Add" TYPE="uint32">)", R"(<PARAMETER.ARRAY NAME="Notes" TYPE="string">)"})
        EXPECT_NE(base.find(part), base.npos) << part << "\n" << base;
}

// --- what comes back

TEST(CimXml, InstancesComeBack)
{
    const Object object = disk();
    const std::string text = xmlOf([&](XmlText& xml) { writeInstance(xml, object, testClasses().find("TST_Disk")); });
    const Object back = instanceIn(text);
    EXPECT_EQ(back.path, object.path);
    ASSERT_EQ(back.properties.size(), object.properties.size());
    for (const Property& property : object.properties)
        EXPECT_EQ(back.get(property.name), property.value) << property.name;
}

RC_GTEST_PROP(CimXml, NumbersAndTextsComeBack, ())
{
    const auto type = *rc::gen::elementOf(std::vector<CMPIType>{CMPI_uint8, CMPI_uint16, CMPI_uint32, CMPI_uint64,
                                                                CMPI_sint8, CMPI_sint16, CMPI_sint32, CMPI_sint64});
    const Value number = Value::integer(type, *rc::gen::arbitrary<std::uint64_t>());
    RC_ASSERT(sameAgain(number, type) == number);
    const Value real = Value::real64(*rc::gen::arbitrary<double>());
    RC_ASSERT(sameAgain(real, CMPI_real64) == real);
    const std::string plain = *rc::gen::container<std::string>(rc::gen::inRange<char>(0x20, 0x7F));
    const Value list = Value::array(CMPI_string, {Value::string(plain), Value::string("\n" + plain + " ")});
    RC_ASSERT(sameAgain(list, CMPI_stringA) == list);
}

TEST(CimXml, PathsInAllTheirWrappersAreTheSame)
{
    const std::string name = xmlOf([](XmlText& xml) { writeInstanceName(xml, portPath()); });
    const std::string local = xmlOf([](XmlText& xml) { writeNameSpace(xml, ns); });
    for (const std::string& text :
         {name, "<LOCALINSTANCEPATH>" + local + name + "</LOCALINSTANCEPATH>",
          xmlOf([](XmlText& xml) { writeInstancePath(xml, portPath()); }),
          "<OBJECTPATH>" + xmlOf([](XmlText& xml) { writeInstancePath(xml, portPath()); }) + "</OBJECTPATH>"})
        EXPECT_EQ(pathIn(text), portPath()) << text;
    EXPECT_EQ(pathIn(R"(<LOCALCLASSPATH><LOCALNAMESPACEPATH><NAMESPACE NAME="a"/><NAMESPACE NAME="b"/>)"
                     R"(</LOCALNAMESPACEPATH><CLASSNAME NAME="C"/></LOCALCLASSPATH>)"),
              (Path{"a/b", "C", {}}));
    // A key in another case, one without a name, and those of a class that nobody knows.
    EXPECT_EQ(pathIn(R"(<INSTANCENAME CLASSNAME="TST_Base"><KEYBINDING NAME="ID"><KEYVALUE>1</KEYVALUE></KEYBINDING>)"
                     "</INSTANCENAME>"),
              broker_test::basePath("1"));
    EXPECT_EQ(pathIn(R"(<INSTANCENAME CLASSNAME="TST_Base"><KEYVALUE>1</KEYVALUE></INSTANCENAME>)"),
              broker_test::basePath("1"));
    EXPECT_EQ(pathIn(R"(<INSTANCENAME CLASSNAME="X"><KEYBINDING NAME="A"><KEYVALUE VALUETYPE="numeric">-5</KEYVALUE>)"
                     R"(</KEYBINDING><KEYBINDING NAME="B"><KEYVALUE VALUETYPE="boolean">true</KEYVALUE></KEYBINDING>)"
                     "</INSTANCENAME>"),
              (Path{ns, "X", {{"A", Value::sint64(-5)}, {"B", Value::boolean(true)}}}));
}

// --- what clients should not send

std::string nested(const std::string& element, int depth)
{
    std::string open, close;
    for (int i = 0; i < depth; i++)
    {
        open += "<" + element + ">";
        close += "</" + element + ">";
    }
    return open + close;
}

std::string embedded(int depth)
{
    std::string inner;
    for (int i = 0; i < depth; i++)
    {
        const std::string before = std::exchange(inner, "");
        inner = xmlOf(
            [&](XmlText& xml)
            {
                const XmlElement instance(xml, "INSTANCE", {{"CLASSNAME", "TST_Disk"}});
                const XmlElement property(xml, "PROPERTY", {{"NAME", "Inner"}});
                xml.leaf("VALUE", before.empty() ? R"(<INSTANCE CLASSNAME="TST_Base"></INSTANCE>)" : before);
            });
    }
    return inner;
}

TEST(CimXml, DocumentsThatAreNoneAreRefused)
{
    for (const std::string& text : {std::string(), std::string("<A>"), std::string("<A></B>"), std::string("\0\0", 2),
                                    nested("A", maxDepth + 1), nested("A", 100'000)})
    {
        pugi::xml_document document;
        EXPECT_THROW(parseXml(document, text), HttpRefusal) << text.substr(0, 100);
    }
    pugi::xml_document document;
    parseXml(document, nested("A", maxDepth));
    parseXml(document, R"(<!DOCTYPE a [<!ENTITY e "x">]><a>&e;</a>)");
    EXPECT_STREQ(document.child("a").text().get(), "&e;") << "which nobody replaces";
}

TEST(CimXml, WhatDoesNotFitTheClassIsRefused)
{
    for (
        const char* text : {
            R"(<INSTANCE CLASSNAME="None"></INSTANCE>)",
            R"(<INSTANCE></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="None"><VALUE>1</VALUE></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY><VALUE>1</VALUE></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="Level"><VALUE>65536</VALUE></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="Level"><VALUE.ARRAY></VALUE.ARRAY></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="Names"><VALUE>1</VALUE></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="Seen"><VALUE>now</VALUE></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Base"><PROPERTY NAME="Next"><VALUE>x</VALUE></PROPERTY></INSTANCE>)",
            R"(<INSTANCE CLASSNAME="TST_Disk"><PROPERTY NAME="Inner"><VALUE>&lt;A/&gt;</VALUE></PROPERTY></INSTANCE>)",
        })
        EXPECT_THROW(instanceIn(text), std::invalid_argument) << text;
    for (
        const char* text :
        {R"(<INSTANCENAME></INSTANCENAME>)", R"(<VALUE>1</VALUE>)", R"(<INSTANCEPATH></INSTANCEPATH>)",
         R"(<INSTANCENAME CLASSNAME="TST_Port"><KEYBINDING NAME="Number"></KEYBINDING></INSTANCENAME>)",
         R"(<INSTANCENAME CLASSNAME="TST_Port"><KEYBINDING NAME="Number"><KEYVALUE>x</KEYVALUE></KEYBINDING></INSTANCENAME>)"})
        EXPECT_THROW(pathIn(text), std::invalid_argument) << text;
    EXPECT_NO_THROW(instanceIn(embedded(8)));
    EXPECT_THROW(instanceIn(embedded(9)), std::invalid_argument);
    EXPECT_THROW(instanceIn(R"(<INSTANCE CLASSNAME="TST_Disk"><PROPERTY NAME="Inner"><VALUE>&lt;A</VALUE></PROPERTY>)"
                            "</INSTANCE>"),
                 HttpRefusal);
}

} // namespace
