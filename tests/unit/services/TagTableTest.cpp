// Tables of frame tags as documents: what was written is read back, and what comes from elsewhere cannot do harm.
#include "services/TagTable.h"

#include "agent/MethodOutcome.h"
#include "tests/support/LogCollector.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <cstring>
#include <optional>

using namespace cimple;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace
{

HBA_WWN wwn(std::uint64_t value)
{
    HBA_WWN name;
    for (int i = 7; i >= 0; --i, value >>= 8)
        name.wwn[i] = static_cast<std::uint8_t>(value);
    return name;
}

CPQFC_QosEntry entry(std::uint64_t source, std::uint64_t target, std::uint8_t tag)
{
    CPQFC_QosEntry made{};
    made.src_wwpn = wwn(source);
    made.tgt_wwpn = wwn(target);
    made.tag = tag;
    return made;
}

bool areEqual(const std::vector<CPQFC_QosEntry>& a, const std::vector<CPQFC_QosEntry>& b)
{
    return a.size() == b.size() && (a.empty() || std::memcmp(a.data(), b.data(), a.size() * sizeof a[0]) == 0);
}

/// The lines of a reading that gives no table; "exception" where it ended by one.
std::vector<std::string> refusal(const std::string& text)
{
    test_support::LogCollector log(TVR_DBG);
    std::vector<std::string> lines;
    try
    {
        readTagTable(text);
        lines.push_back("a table");
    }
    catch (const MethodEnd& end)
    {
        EXPECT_EQ(end.value, 5u);
    }
    catch (const std::exception&)
    {
        lines.push_back("exception");
    }
    log.stopCollecting();
    for (const std::string& line : log.messages())
        lines.push_back(line);
    return lines;
}

const std::string row = "<Row><src_wwpn>1000027A51160210</src_wwpn><tgt_wwpn>50063d200110000A</tgt_wwpn>"
                        "<tag>7</tag></Row>";

/// A document with this inside its configuration.
std::string document(const std::string& configuration)
{
    return "<?xml version=\"1.0\" encoding=\"utf-8\"?><CruxConfig><theSystem><CruxVersion>1.0</CruxVersion>"
           "<CreationDate/><HostName>h</HostName><Adapter>a<Configuration>" +
           configuration + "</Configuration></Adapter></theSystem></CruxConfig>";
}

std::string counted(const std::string& count, const std::string& rows)
{
    return document("<numberOfEntries>" + count + "</numberOfEntries>" + rows);
}

std::string without(std::string text, const std::string& part)
{
    return text.erase(text.find(part), part.size());
}

std::string replaced(std::string text, const std::string& part, const std::string& by)
{
    return text.replace(text.find(part), part.size(), by);
}

std::string repeated(const std::string& part, std::size_t times)
{
    std::string text;
    for (std::size_t i = 0; i < times; ++i)
        text += part;
    return text;
}

RC_GTEST_PROP(TagTable, IsReadAsItWasWritten, ())
{
    const auto entries = *rc::gen::container<std::vector<CPQFC_QosEntry>>(
        rc::gen::map(rc::gen::tuple(rc::gen::arbitrary<std::uint64_t>(), rc::gen::arbitrary<std::uint64_t>(),
                                    rc::gen::arbitrary<std::uint8_t>()),
                     [](const auto& parts) { return std::apply(entry, parts); }));
    const auto name = *rc::gen::string<std::string>(); // must not break the document, whatever it is
    RC_ASSERT(areEqual(readTagTable(writeTagTable(name, name, entries)), entries));
}

TEST(TagTable, IsWrittenInThisForm)
{
    const std::string text = writeTagTable("host<&>", "Tavrin\xFF-1", {entry(0x1000027A51160210, 0x0102, 255)});
    const std::size_t date = text.find("<CreationDate>") + 14;
    EXPECT_EQ(text.find("</CreationDate>"), date + 25);
    EXPECT_EQ(std::string(text).replace(date, 25, "now"), R"(<?xml version="1.0" encoding="utf-8"?>
<CruxConfig>
	<theSystem>
		<CruxVersion>1.0</CruxVersion>
		<CreationDate>now</CreationDate>
		<HostName>host&lt;&amp;&gt;</HostName>
		<Adapter>
			Tavrin?-1
			<Configuration>
				<numberOfEntries>1</numberOfEntries>
				<Row>
					<src_wwpn>1000027A51160210</src_wwpn>
					<tgt_wwpn>0000000000000102</tgt_wwpn>
					<reserved1>00000000000000000000000000000000</reserved1>
					<tag>255</tag>
					<reserved2>000000</reserved2>
				</Row>
			</Configuration>
		</Adapter>
	</theSystem>
</CruxConfig>

)");
}

TEST(TagTable, OfTheMostEntriesIsReadAsItWasWritten)
{
    const std::vector<CPQFC_QosEntry> most(maximumTagEntries, entry(~0ull, ~0ull, 255));
    EXPECT_TRUE(areEqual(readTagTable(writeTagTable("h", "a", most)), most));
    EXPECT_THAT(refusal(counted("65537", repeated(row, 65'537))), testing::Not(testing::Contains("a table")));
}

TEST(TagTable, OthersWritingIsTaken)
{
    const std::vector<CPQFC_QosEntry> one = {entry(0x1000027A51160210, 0x50063D200110000A, 7)};
    EXPECT_TRUE(areEqual(readTagTable(counted("1", row)), one));
    EXPECT_TRUE(areEqual(readTagTable("\xEF\xBB\xBF" + counted(" 1\n", replaced(row, ">7<", ">\t+07\n<"))), one));
    EXPECT_TRUE(areEqual(readTagTable("<!-- </a> \" -->" + counted("1", "<other a='<'>&amp;</other>" + row)), one));
    EXPECT_TRUE(areEqual(readTagTable(replaced(counted("1", row), "<HostName>h", "<HostName>\xFF\xC0")), one));
    EXPECT_TRUE(areEqual(readTagTable(counted("2", row + row)), {one[0], one[0]}));
    EXPECT_THAT(readTagTable(counted("0", "")), IsEmpty());
}

TEST(TagTable, WhatIsMissingOrWrongHasItsLine)
{
    const auto corrupted = [](const std::string& node)
    { return node + "Node is not found or corrupted in the Crux config table"; };
    const std::string noNumber = "SetConfigTable::numberOfEntries is not the number of the rows";
    const std::string noName = "SetConfigTable::unable to convert string to hbaname ";
    const std::string badTag = "SetConfigTable:: malformed tag field ";
    const std::string good = counted("1", row);

    const std::pair<std::string, std::string> rows[] = {
        {"", corrupted("crux")},
        {replaced(good, "<CruxConfig>", "<cruxConfig>"), corrupted("crux")},
        {"<CruxConfig/>", corrupted("theSystem")},
        {without(good, "<CruxVersion>1.0</CruxVersion>"), corrupted("cruxVersion")},
        {without(good, "<CreationDate/>"), corrupted("creationTime")},
        {without(good, "<HostName>h</HostName>"), corrupted("hostName")},
        {"<CruxConfig><theSystem><CruxVersion/><CreationDate/><HostName/></theSystem></CruxConfig>",
         corrupted("adapter")},
        {"<CruxConfig><theSystem><CruxVersion/><CreationDate/><HostName/><Adapter/></theSystem></CruxConfig>",
         corrupted("configuration")},
        {document(row), corrupted("numberOfEntries")},
        {counted("", row), corrupted("numberOfEntries")},
        {counted("one", row), corrupted("numberOfEntries")},
        {counted("1 2", row), corrupted("numberOfEntries")},
        {counted("99999999999999999999", row), corrupted("numberOfEntries")},
        {counted("1", ""), corrupted("row")},
        {counted("-1", ""), corrupted("row")},
        {counted("-1", row), noNumber},
        {counted("0", row), noNumber},
        {counted("2", row), noNumber},
        {counted("1", row + row), noNumber},
        {counted("4294967297", row), noNumber}, // 1 in 32 bits
        {without(good, "<src_wwpn>1000027A51160210</src_wwpn>"), "SetConfigTable::malformed src_wwpn field "},
        {without(good, "<tgt_wwpn>50063d200110000A</tgt_wwpn>"), "SetConfigTable::malformed tgt_wwpn field "},
        {without(good, "<tag>7</tag>"), badTag},
        {replaced(good, ">7<", "><"), badTag},
        {replaced(good, ">7<", ">-1<"), badTag},
        {replaced(good, ">7<", ">256<"), badTag},
        {replaced(good, ">7<", ">7 up<"), badTag},
        {replaced(good, ">7<", ">7&#0;<"), badTag},
    };
    for (const auto& [text, line] : rows)
        EXPECT_THAT(refusal(text), ElementsAre(line)) << text;
    for (const char* name : {"", "100027A51160210", "1000027A511602100", "1000027A5116021G", "1000027A5116021&#0;"})
        EXPECT_THAT(refusal(replaced(good, "1000027A51160210", name)), ElementsAre("INVALID WWN", noName)) << name;
}

TEST(TagTable, OtherTextsAreRefusedBeforeTheyCost)
{
    const std::string good = counted("1", row);
    const std::string texts[] = {
        "<!DOCTYPE a [<!ENTITY b \"c\">]>" + good,
        "<!ENTITY b 'c'>" + good,
        "no document",
        good.substr(0, good.size() / 2),
        good.substr(0, good.size() - 1),
        good + '\0' + good,
        std::string("\0", 1),
        "<CruxConfig",
        "<CruxConfig a",
        "<CruxConfig a=",
        "<CruxConfig a='",
        "<",
        "</",
        "<!--",
        "<?",
        "<![CDATA[",
        "</a>",
        "<a></a></a>",
        repeated("<a>", 1'000'000),                           // the stack
        repeated("<a>", 100'000) + repeated("</a>", 100'000), //
        repeated("<a><!--</a>-->", 100'000),                  // ends of elements that are none
        repeated("<a b='</a>'>", 900),                        //
        repeated("<a>/>", 100'000),                           //
        repeated("<a\">", 100'000) + '"',                     // a quote that is none
        "<a" + repeated(" b=''", 100'000) + "/>",             // the memory
        repeated("<a/>", 500'000),                            //
        "<a>" +
            repeated("x<?"
                     "?>",
                     2'000'000) +
            "</a>",                                           //
        "<a>" + repeated("<![CDATA[]]>", 1'300'000) + "</a>", //
        std::string(maximumTagFile + 1, ' '),
        "<CruxConfig>&#xFFFFFFFFFF;</CruxConfig>",
    };
    for (const std::string& text : texts)
        EXPECT_THAT(refusal(text), ElementsAre("exception")) << text.substr(0, 100);
}

/// Documents with random faults: whatever becomes of them, nothing is read or written beside the text.
RC_GTEST_PROP(TagTable, SurvivesWhatIsDoneToADocument, ())
{
    std::string text = counted("2", row + row);
    const auto faults = *rc::gen::container<std::vector<std::tuple<std::size_t, char>>>(rc::gen::tuple(
        rc::gen::inRange<std::size_t>(0, text.size()),
        rc::gen::element('<', '>', '/', '&', '"', '\'', '!', '?', '-', '=', ' ', '\0', '\xFF', 'a', '9')));
    for (const auto& [place, fault] : faults)
        text[place] = fault;
    refusal(text);
}

} // namespace
