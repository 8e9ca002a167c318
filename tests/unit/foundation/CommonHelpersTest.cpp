#include "tests/unit/foundation/LogFixture.h"

#include "foundation/CommonHelpers.h"
#include "foundation/HbaAttributes.h"

#include <array>
#include <cstring>

namespace cimple
{
namespace
{

using testing::Each;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

constexpr std::uint8_t bytes16[16] = {0x10, 0x00, 0x00, 0x90, 0xFA, 0x94, 0x27, 0x79,
                                      0xFF, 0xAB, 0xCD, 0xEF, 0x01, 0x23, 0x45, 0x67};

// --- text forms ------------------------------------------------------------------------------------------

TEST(TextForms, OfNamesAndAddresses)
{
    char wwn[17];
    wwnToUpperHex(bytes16, wwn);
    EXPECT_STREQ(wwn, "10000090FA942779");
    wwnToUpperHex(nullptr, wwn);
    EXPECT_STREQ(wwn, "");
    EXPECT_EQ(wwnToUpperHex(bytes16 + 8), "FFABCDEF01234567");

    char wide[33];
    bytes16ToUpperHex(bytes16, wide);
    EXPECT_STREQ(wide, "10000090FA942779FFABCDEF01234567");

    char mac[18] = "as it was";
    macToDashed(nullptr, mac);
    EXPECT_STREQ(mac, "as it was");
    macToDashed(bytes16 + 3, mac);
    EXPECT_STREQ(mac, "90-fa-94-27-79-ff");
    char pieces[18];
    EXPECT_EQ(bytesToHexDashed(bytes16 + 3, pieces), 0);
    EXPECT_STREQ(pieces, mac);
    EXPECT_EQ(bytesToHexDashed(nullptr, pieces), 1);
}

TEST(TextForms, OfARangeBehindTheHeader)
{
    const auto range = [](std::span<const std::uint8_t> record, std::size_t first, std::size_t last)
    {
        String out("=");
        bytesRangeToHex(record, first, last, out);
        return std::string(out.c_str());
    };
    EXPECT_EQ(range(bytes16, 0, 3), "=FFABCD");
    EXPECT_EQ(range(bytes16, 6, 8), "=4567");
    EXPECT_EQ(range(bytes16, 6, 1000), "=4567") << "no further than the record goes";
    EXPECT_EQ(range(bytes16, 3, 3), "=");
    EXPECT_EQ(range(bytes16, 9, 2), "=");
    EXPECT_EQ(range({bytes16, 8}, 0, 8), "=");
    EXPECT_EQ(range({}, 0, 8), "=");
}

TEST(TextForms, JoinedBytesStayBelowTheLimit)
{
    const std::uint8_t bytes[] = {1, 22, 255};
    struct Row
    {
        std::size_t limit;
        int status;
        const char* text;
    };
    for (const Row row : {Row{20, 0, "1.22.255"},
                          {9, 0, "1.22.255"},
                          {8, 1, "1.22"},
                          {5, 1, "1.22"},
                          {4, 1, "1"},
                          {2, 1, "1"},
                          {1, 1, ""},
                          {0, 1, ""}})
    {
        std::array<char, 32> out;
        out.fill('~');
        EXPECT_EQ(joinBytes(bytes, ".", {out.data(), row.limit + 1}), row.status) << row.limit;
        EXPECT_STREQ(out.data(), row.text);
        EXPECT_EQ(out[row.limit], '\0');
        EXPECT_EQ(out[row.limit + 1], '~');
    }
    char none[4];
    EXPECT_EQ(joinBytes({}, ".", none), 0);
    EXPECT_STREQ(none, "");
}

class Parsing : public LogTest
{
protected:
    CapturingSink sink;
};

TEST_F(Parsing, NamesTakeSixteenDigitsOfAnyCase)
{
    std::uint8_t wwn[8];
    EXPECT_EQ(stringToWwn(wwn, "10000090fA94277F"), 0);
    EXPECT_THAT(wwn, ElementsAre(0x10, 0, 0, 0x90, 0xFA, 0x94, 0x27, 0x7F));
    std::uint64_t number = 0;
    EXPECT_TRUE(stringToWwn64(number, "10000090fA94277F"));
    EXPECT_EQ(number, 0x10000090FA94277Fu);
    EXPECT_THAT(sink.lines, IsEmpty());
}

TEST_F(Parsing, NamesOfAnotherFormAreRefusedWhole)
{
    std::uint8_t wwn[8] = {9, 9, 9, 9, 9, 9, 9, 9};
    std::uint64_t number = 9;
    for (const char* text : {"", "1", "10000090fA94277", "10000090fA94277F0", "10000090fA94277G", "10:00:00:90:fa:9",
                             " 0000090fA94277F", "0x000090fA94277F"})
    {
        EXPECT_NE(stringToWwn(wwn, text), 0) << text;
        EXPECT_FALSE(stringToWwn64(number, text)) << text;
        EXPECT_THAT(sink.take(TVR_DBG), ElementsAre(LogLine{TVR_ERR, "INVALID WWN"}, LogLine{TVR_ERR, "INVALID WWN"}));
    }
    EXPECT_NE(stringToWwn(wwn, String("10000090fA94277\0", 16)), 0);
    EXPECT_THAT(wwn, Each(9));
    EXPECT_EQ(number, 9u);
}

TEST(TextForms, OfANameFromADashedAddress)
{
    char out[24] = "as it was";
    for (const char* mac : {static_cast<const char*>(nullptr), "", "00-11-22-33-44-5", "00-11-22-33-44-555",
                            "00:11:22:33:44:55", "00-11-22-33-44_55"})
    {
        EXPECT_NE(dashedMacToWwnText(out, mac), 0);
        EXPECT_STREQ(out, "as it was");
    }
    EXPECT_EQ(dashedMacToWwnText(out, "00-11-22-33-44-55"), 0);
    EXPECT_STREQ(out, "00:11:22:33:44:55:00:00");
}

// --- designators -----------------------------------------------------------------------------------------

TEST_F(Parsing, DesignatorsAreReadFromTheFirstOfThePage)
{
    std::vector<std::uint8_t> page = {0x65, 0x83, 0xAA, 0x1C, 0xF1, 0xA3, 0xFF, 16};
    page.insert(page.end(), bytes16, bytes16 + 16);
    page.insert(page.end(), {0x01, 0x03, 0x00, 0x08}); // the head of another, which is not looked at
    DesignatorRecord record;
    ASSERT_EQ(designatorToRecord(&record, page), 0);
    EXPECT_EQ(record.peripheralDeviceType, 5);
    EXPECT_EQ(record.pageCode, 0x83);
    EXPECT_EQ(record.pageLength, 0x1Cu);
    EXPECT_EQ(record.designatorType, 3u);
    EXPECT_EQ(record.designatorLength, 16u);
    EXPECT_THAT(std::vector(record.value, record.value + 16), ElementsAreArray(bytes16));
    EXPECT_EQ(record.value[16], 0);
    char text[33];
    descriptorToString(text, &record);
    EXPECT_STREQ(text, "10000090FA942779FFABCDEF01234567");
    EXPECT_NE(designatorToRecord(nullptr, page), 0);
}

TEST_F(Parsing, DesignatorsOfEveryTruncationStayWithinTheResponse)
{
    std::vector<std::uint8_t> page = {0x00, 0x83, 0x00, 0xFF, 0x01, 0x03, 0x00, 0xFF};
    for (std::size_t i = 0; i < 255; ++i)
        page.push_back(static_cast<std::uint8_t>(i + 1));
    for (std::size_t size = 0; size <= page.size(); ++size)
    {
        const std::vector<std::uint8_t> response(page.begin(), page.begin() + size); // its end is the heap block's
        DesignatorRecord record;
        record.pageCode = 0x55;
        EXPECT_EQ(designatorToRecord(&record, response) == 0, size >= 8) << size;
        EXPECT_EQ(record.pageCode, size >= 8 ? 0x83 : 0);
        EXPECT_EQ(record.designatorLength, size >= 8 ? size - 8 : 0);
        EXPECT_EQ(record.value[255], 0);
        for (std::size_t i = 8; i < size; ++i)
            ASSERT_EQ(record.value[i - 8], i - 7);
    }
}

TEST_F(Parsing, DescriptorsAreShownByTheirLength)
{
    Descriptor descriptor;
    std::memcpy(descriptor.value, bytes16, sizeof bytes16);
    const auto shown = [&](std::uint32_t length)
    {
        descriptor.designatorLength = length;
        char text[33] = "rest";
        descriptorToString(text, &descriptor);
        return std::string(text);
    };
    EXPECT_EQ(shown(8), "10000090FA942779");
    EXPECT_EQ(shown(12), "10000090FA942779FFABCDEF");
    EXPECT_THAT(sink.lines, IsEmpty());
    for (const std::uint32_t length : {0u, 4u, 15u, 17u, 256u, 0xFFFFFFFFu})
    {
        EXPECT_EQ(shown(length), "");
        EXPECT_THAT(sink.take(TVR_DBG), ElementsAre(LogLine{TVR_ERR, "INVALID Descriptor"}));
    }
    char text[33] = "rest";
    descriptorToString(text, nullptr);
    EXPECT_STREQ(text, "");
}

// --- bytes, tokens, traces -------------------------------------------------------------------------------

TEST(Bytes, AreReversedUpToALengthOf255)
{
    std::array<std::uint8_t, 255> in;
    for (std::size_t i = 0; i < in.size(); ++i)
        in[i] = static_cast<std::uint8_t>(i);
    std::array<std::uint8_t, 256> out;
    out.fill(0xEE);
    reverseBytes(in.data(), out.data(), 255);
    EXPECT_TRUE(std::equal(in.rbegin(), in.rend(), out.begin()));
    EXPECT_EQ(out[255], 0xEE);
    reverseBytes(in.data(), out.data(), 0);
    EXPECT_EQ(out[0], 254);
}

TEST_F(Parsing, TracesShowLabelAndValue)
{
    logPair("count", -3);
    logStringPair("name", "value");
    logStringPair("name", "");
    const int values[] = {1, -2, 3};
    logArrayOfInt("list", values);
    logArrayOfInt("list", {});
    EXPECT_THAT(sink.take(TVR_DBG),
                ElementsAre(LogLine{TVR_DBG, "count: -3"}, LogLine{TVR_DBG, "name: value"}, LogLine{TVR_DBG, "name: "},
                            LogLine{TVR_DBG, "list: 1,-2,3"}, LogLine{TVR_DBG, "list: "}));
    const std::vector<int> many(1000, -1000000000);
    logArrayOfInt("list", many);
    logArrayOfInt(std::string(2000, 'l').c_str(), many);
    for (const LogLine& line : sink.lines)
        EXPECT_EQ(line.message.size(), 1023u);
}

// --- versions --------------------------------------------------------------------------------------------

TEST_F(Parsing, VersionsOfTheShapeAreTakenApart)
{
    for (const char* text : {"1.23a5", "1.23a5 ", "1.23a5r", "1.23a5r2", "1.23a5x2", "1.23a5rx", "1.23a5 more text"})
    {
        FirmwareVersion version;
        EXPECT_EQ(parseVersion(text, version), 0) << text;
        EXPECT_EQ(version.major, 1);
        EXPECT_EQ(version.minor, 2);
        EXPECT_EQ(version.revision, 3);
        EXPECT_EQ(version.build, 5);
        EXPECT_EQ(version.releaseType, "a");
        EXPECT_EQ(version.testRelease, "") << "islower() of this C library gives a bit mask";
        EXPECT_THAT(sink.take(TVR_DBG),
                    ElementsAre(LogLine{TVR_DBG, "Input Version String: [" + std::string(text) + "]"},
                                LogLine{TVR_DBG, "Parsed the major, minor, revision & build numbers"},
                                LogLine{TVR_DBG, "Parsed the revision for Test Firmwares"},
                                LogLine{TVR_DBG, "Filled Major, Minor, Revision & Build Numbers"},
                                LogLine{TVR_DBG, "Filled ReleaseType"},
                                LogLine{TVR_DBG, "parseVersion: Version parsing success"}));
    }
}

TEST_F(Parsing, VersionsOfAnotherShapeAreRefused)
{
    for (const char* text : {"", "1.11a", "a.11a5", "1-11a5", "1.a1a5", "1.1aa5", "1.1115", "1.11aa", "10.11a5",
                             "\xE9.11a5", "1.11\xE9\x35"})
    {
        FirmwareVersion version{1, 2, 3, 4, "x", "y"};
        EXPECT_EQ(parseVersion(text, version), 32769) << text;
        EXPECT_EQ(version.build, 4);
        EXPECT_EQ(sink.take(TVR_DBG).back(), (LogLine{TVR_DBG, "parseVersion Error: Invalid Firmware String"}));
    }
    FirmwareVersion version;
    EXPECT_EQ(parseVersion(nullptr, version), 0x8001);
    EXPECT_THAT(sink.lines, ElementsAre(LogLine{TVR_DBG, "parseVersion Error: Input FirmwareVersion is Null"}));
}

TEST_F(Parsing, DottedVersionsFillTheSlotsTheyHave)
{
    std::uint16_t slots[4] = {91, 92, 93, 94};
    parseDottedVersion("12.4.243", slots);
    EXPECT_THAT(slots, ElementsAre(12, 4, 243, 94));
    EXPECT_THAT(sink.take(TVR_DBG), ElementsAre(LogLine{TVR_DBG, "12.4.243"}, LogLine{TVR_DBG, "12, 4, 243, 94"}));
    parseDottedVersion("1..2.x.4.5", slots);
    EXPECT_THAT(slots, ElementsAre(1, 2, 0, 4));
    parseDottedVersion("", slots);
    parseDottedVersion(nullptr, slots);
    EXPECT_THAT(slots, ElementsAre(1, 2, 0, 4));
    sink.take(TVR_DBG);
    parseDottedVersion(("7." + std::string(100, '0')).c_str(), slots);
    EXPECT_EQ(sink.lines[0].message.size(), 63u);
    EXPECT_THAT(slots, ElementsAre(7, 0, 0, 4));
}

// --- HBA API records ---------------------------------------------------------------------------------------

TEST(HbaRecords, AreCopiedWithinTheirFields)
{
    HBA_ADAPTERATTRIBUTES in;
    std::memset(&in, 'x', sizeof in); // no text has a terminator
    HBA_ADAPTERATTRIBUTES out;
    std::memset(&out, 'o', sizeof out);
    copyAdapterAttributes(out, in);
    EXPECT_EQ(std::string(out.Manufacturer), std::string(sizeof in.Manufacturer - 1, 'x'));
    EXPECT_EQ(std::string(out.DriverName), std::string(sizeof in.DriverName - 1, 'x'));
    EXPECT_EQ(std::memcmp(&out.NodeWWN, &in.NodeWWN, sizeof in.NodeWWN), 0);
    EXPECT_EQ(out.NumberOfPorts, in.NumberOfPorts);
    std::strcpy(in.Model, "short");
    copyAdapterAttributes(out, in);
    EXPECT_STREQ(out.Model, "short");

    HBA_PORTATTRIBUTES port{};
    for (std::size_t i = 0; i < sizeof port.PortActiveFc4Types.bits; ++i)
        port.PortActiveFc4Types.bits[i] = static_cast<HBA_UINT8>(i + 1);
    std::strcpy(port.OSDeviceName, "/sys/class/scsi_host/host1");
    port.PortFcId = 0x010203;
    port.NumberofDiscoveredPorts = 5;
    HBA_PORTATTRIBUTES copy;
    std::memset(&copy, 'o', sizeof copy);
    copyPortAttributes(copy, port);
    EXPECT_STREQ(copy.OSDeviceName, port.OSDeviceName);
    EXPECT_STREQ(copy.PortSymbolicName, "");
    EXPECT_EQ(copy.PortFcId, 0x010203u);
    EXPECT_EQ(copy.NumberofDiscoveredPorts, 5u);
    EXPECT_EQ(std::memcmp(&copy.PortActiveFc4Types, &port.PortActiveFc4Types, 32), 0);
}

TEST(HbaRecords, AreDescribedLineByLine)
{
    HBA_ADAPTERATTRIBUTES in{};
    std::strcpy(in.Manufacturer, "Maker");
    std::strcpy(in.DriverName, "tvfc");
    std::memcpy(in.NodeWWN.wwn, bytes16, 8);
    char text[4096];
    formatNodeAttributes(&in, text);
    EXPECT_STREQ(text, "Manufacturer: Maker\nNodeWWN: 10000090FA942779\nModelDescription: \nNodeSymbolicName: \n"
                       "HardwareVersion: \nDriverVersion: \nFirmwareVersion: \nDriverName: tvfc\n");
    for (std::size_t size = 1; size < 40; ++size)
    {
        std::vector<char> small(size);
        formatNodeAttributes(&in, small);
        EXPECT_EQ(std::string(small.data()), std::string(text).substr(0, size - 1));
    }
    formatNodeAttributes(nullptr, text);
    EXPECT_STREQ(text, "");
}

} // namespace
} // namespace cimple
