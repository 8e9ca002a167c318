#include "FakeHost.h"

#include "device/TVR_MethodWrapper.h"
#include "device/Vpd.h"

#include <gmock/gmock.h>

#include <cstring>
#include <random>

using namespace cimple;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;
using testing::SizeIs;

namespace
{

using W = TVR_MethodWrapper;

constexpr const char* portId = "1000112233123456";

std::vector<std::pair<std::string, std::string>> walk(const std::string& area)
{
    // A block of its own size, so that a read past it is seen by the sanitizers.
    const std::vector<std::uint8_t> bytes(area.begin(), area.end());
    std::vector<std::pair<std::string, std::string>> pairs;
    for (const VpdField& field : walkVpd(bytes))
        pairs.emplace_back(field.keyword, field.value);
    return pairs;
}

template <std::size_t Size> std::string raw(const char (&bytes)[Size])
{
    return std::string(bytes, Size - 1);
}

TEST(Vpd, FieldsOfAllResources)
{
    const std::string area = raw("\x82\x05\x00"
                                 "Card "
                                 "\x0A\x01\x02" // a small resource
                                 "\x90\x16\x00"
                                 "PN\x04"
                                 "A-1\0"
                                 "CP\x04\x01\x08\x00\x10"
                                 "V0\x00"
                                 "RV\x02\x77\x00"
                                 "\x84\x01\x00?" // a large one of another kind
                                 "\x91\x0C\x00"
                                 "YX\x03"
                                 "abc"
                                 "RW\x03\0\0\0"
                                 "\x78"
                                 "\x82\x01\x00Z");
    const std::string head = area.substr(0, 8 + 3);
    EXPECT_THAT(walk(area), ElementsAre(Pair("\x82\x82", "Card"), Pair("PN", "A-1"), Pair("CP", "01080010"),
                                        Pair("V0", ""), Pair("YX", "abc")));
    EXPECT_THAT(walk(head), ElementsAre(Pair("\x82\x82", "Card")));
}

TEST(Vpd, WhatIsBrokenEndsTheWalk)
{
    struct Case
    {
        const char* why;
        std::string area;
        std::vector<std::string> values;
    };
    const std::string good = raw("\x90\x04\x00PN\x01P"), later = raw("\x91\x04\x00YX\x01Y");
    const Case cases[] = {
        {"nothing", "", {}},
        {"end in front", "\x78" + good, {}},
        {"end with a checksum byte", "\x79" + good, {}},
        {"small resource past the area", good + "\x03..", {"P"}},
        {"length cut off", good + raw("\x82\x01"), {"P"}},
        {"identifier past the area",
         good + raw("\x82\x05\x00"
                    "abcd"),
         {"P"}},
        {"resource past the area: what is whole in it counts", raw("\x90\xFF\xFFPN\x01PSN\x09S"), {"P"}},
        {"value past its resource", raw("\x90\x08\x00PN\x01PSN\x02S") + later, {"P"}},
        {"keyword without a length", raw("\x90\x06\x00PN\x01PSN") + later, {"P"}},
        {"keyword that is no text", raw("\x90\x08\x00PN\x01PS\x01\x01S") + later, {"P"}},
        {"resource without keywords", raw("\x90\x00\x00") + later, {"Y"}},
    };
    for (const Case& c : cases)
    {
        SCOPED_TRACE(c.why);
        std::vector<std::string> values;
        for (const auto& field : walk(c.area))
            values.push_back(field.second);
        EXPECT_EQ(values, c.values);
    }
}

TEST(Vpd, AnyAreaGivesTextsOnly)
{
    std::mt19937 random(7);
    const std::string likely[] = {raw("PN\x01P"), raw("YX\x03"), raw("\x90\x10\x00"), raw("\x82\x02\x00"), "\x78"};
    std::size_t found = 0;
    for (int round = 0; round < 20000; ++round)
    {
        std::string area = raw("\x91\x20\x00").substr(round % 4);
        for (auto parts = random() % 16; parts > 0; --parts)
            area += random() % 8 ? likely[random() % std::size(likely)] : std::string(1, static_cast<char>(random()));
        const auto fields = walk(area);
        ASSERT_LE(fields.size(), area.size() / 3);
        for (const auto& [keyword, value] : fields)
        {
            ++found;
            ASSERT_EQ(keyword.size(), 2u);
            for (const char c : value)
                ASSERT_TRUE(c >= 0x20 && c < 0x7F);
        }
    }
    EXPECT_GT(found, 1000u);
}

TEST(Vpd, PublishedNames)
{
    const std::pair<const char*, const char*> names[] = {
        {"CP", "VPD:EXT_CAPABILITY"},
        {"EC", "VPD:EC_LEVEL"},
        {"FG", "VPD:FABRIC_GEOGRAPHY"},
        {"LC", "VPD:LOCATION"},
        {"MN", "VPD:MANUFACTURER_ID"},
        {"PG", "VPD:PCI_GEOGRAPHY"},
        {"PN", "VPD:PART_NUMBER"},
        {"SN", "VPD:SERIAL_NUMBER"},
        {"YX", "VPD:YX (VPD-W)"},
        {"\x82\x82", "VPD:PRODUCT_NAME"},
        {"V0", "VPD:V0"},
        {"pn", "VPD:pn"},
    };
    for (const auto& [keyword, name] : names)
        EXPECT_EQ(vpdName(keyword), name);
}

TEST(Vpd, OfAPort)
{
    LoadedHost host;
    LogCapture log;
    const std::string bytes = raw("\x90\x0B\x00PN\x01P"
                                  "PN\x01QSN\x00");
    std::memcpy(host.vpd.data, bytes.data(), bytes.size());
    host.vpd.length = 7;
    std::vector<VpdField> fields;
    EXPECT_EQ(W::GetVPD(portId, &fields), 0);
    EXPECT_THAT(fields, SizeIs(1)) << "bytes in use";
    host.vpd.length = 0xFFFFFFFF; // the rest of the record is zero
    EXPECT_EQ(W::GetVPD(portId, &fields), 0);
    EXPECT_THAT(fields, SizeIs(3));
    EXPECT_EQ(fields[0].value, "P");

    host.statuses["LRM_GetVPD"] = {2};
    EXPECT_EQ(W::GetVPD(portId, &fields), 2);
    EXPECT_EQ(W::GetVPD("x", &fields), 1);
    EXPECT_EQ(W::GetVPD(portId, nullptr), 1);
    EXPECT_THAT(fields, SizeIs(3)) << "left alone";
    EXPECT_EQ(host.calls["LRM_GetVPD"], 3);
    host.vpd = {};
    EXPECT_EQ(W::GetVPD(portId, &fields), 0);
    EXPECT_THAT(fields, IsEmpty());
}

} // namespace
