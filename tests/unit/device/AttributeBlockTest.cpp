#include "FakeHost.h"

#include "device/AttributeBlock.h"
#include "device/Bindings.h"

#include <gmock/gmock.h>

using namespace cimple;

namespace
{

constexpr std::uint32_t room = 512;

class AttributeBlockTest : public testing::Test
{
protected:
    void fill(std::map<std::uint32_t, std::string> attributes)
    {
        host.addAdapter(1).attributes = std::move(attributes);
        ASSERT_EQ(block.fetch(LRM_GetHBAAttributes, host.adapters.back().ports[0].hba.PortWWN), RM_OK);
    }

    LoadedHost host;
    LogCapture log;
    AttributeBlock block{room};
};

TEST_F(AttributeBlockTest, ReadsEachForm)
{
    fill({{1, number(0xFFFFFFFE)}, {2, counter(1ull << 40)}, {3, "abc"}, {4, std::string("de\0f", 4)}, {5, ""}});
    std::uint32_t word = 0;
    EXPECT_EQ(block.number(1, word), RM_OK);
    EXPECT_EQ(word, 0xFFFFFFFE);
    std::uint64_t count = 0;
    EXPECT_EQ(block.counter(2, count), RM_OK);
    EXPECT_EQ(count, 1ull << 40);
    std::string text;
    EXPECT_EQ(block.text(3, text), RM_OK);
    EXPECT_EQ(text, "abc"); // no terminator: ends with its length
    EXPECT_EQ(block.text(4, text), RM_OK);
    EXPECT_EQ(text, "de");
    EXPECT_EQ(block.text(5, text), RM_OK);
    EXPECT_EQ(text, "");
}

TEST_F(AttributeBlockTest, TextIsCutAt255Bytes)
{
    fill({{1, std::string(300, 'x')}});
    std::string text;
    EXPECT_EQ(block.text(1, text), RM_OK);
    EXPECT_EQ(text, std::string(255, 'x'));
}

TEST_F(AttributeBlockTest, LengthsMayBeRoundedUp)
{
    fill({{1, number(42) + "...."},
          {2, counter(1ull << 40) + "..."},
          {3, std::string("\x00\x90\xfa\x01\x02\xff..", 8)}});
    std::uint32_t word = 0;
    EXPECT_EQ(block.number(1, word), RM_OK);
    EXPECT_EQ(word, 42u);
    std::uint64_t count = 0;
    EXPECT_EQ(block.counter(2, count), RM_OK);
    EXPECT_EQ(count, 1ull << 40);
    std::string text;
    EXPECT_EQ(readMacAddress(block, 3, "mac", text), RM_OK);
    EXPECT_EQ(text, "00:90:fa:01:02:ff");
}

TEST_F(AttributeBlockTest, AShortLengthOrAMissingValueLeavesTheField)
{
    fill({{1, "abc"}, {3, number(1)}});
    std::uint32_t word = 77;
    EXPECT_EQ(block.number(1, word), RM_ERROR);
    EXPECT_EQ(block.number(9, word), RM_ERROR_NOT_SUPPORTED);
    EXPECT_EQ(word, 77u);
    std::uint64_t count = 77;
    EXPECT_EQ(block.counter(3, count), RM_ERROR);
    EXPECT_EQ(count, 77u);
    std::string text = "old";
    EXPECT_EQ(block.text(9, text), RM_ERROR_NOT_SUPPORTED);
    EXPECT_EQ(readMacAddress(block, 1, "mac", text), RM_ERROR);
    EXPECT_EQ(text, "old");
}

TEST_F(AttributeBlockTest, HostileAnswersAreFailures)
{
    fill({});
    struct Case
    {
        std::ptrdiff_t offset;
        std::uint32_t length;
        RM_STATUS expected;
    };
    const Case cases[] = {
        {0, 4, RM_OK},     {room - 4, 4, RM_OK},      {room - 3, 4, RM_ERROR},    {room, 4, RM_ERROR},
        {-1, 4, RM_ERROR}, {0, 0xFFFFFFFF, RM_ERROR}, {room + 4096, 4, RM_ERROR},
    };
    for (const Case& c : cases)
    {
        host.attribute = [&](const void* buffer, std::uint32_t, std::uint32_t* length, RM_STATUS* status)
        {
            *length = c.length;
            *status = RM_OK;
            return reinterpret_cast<const void*>(reinterpret_cast<std::uintptr_t>(buffer) + c.offset);
        };
        std::span<const std::byte> value;
        EXPECT_EQ(block.bytes(1, value), c.expected) << c.offset << " " << c.length;
        std::string text;
        EXPECT_EQ(block.text(1, text), c.expected);
    }
    host.attribute = [](const void*, std::uint32_t, std::uint32_t* length, RM_STATUS* status)
    {
        *length = 4;
        *status = RM_OK;
        return nullptr;
    };
    std::uint32_t word = 77;
    EXPECT_EQ(block.number(1, word), RM_ERROR);
    EXPECT_EQ(word, 77u);
}

TEST_F(AttributeBlockTest, ReadersLogTheValueOrTheFailure)
{
    fill({{1, number(42)}, {2, "text"}, {3, std::string("\x00\x90\xfa\x01\x02\xff", 6)}});
    log.lines.clear();
    std::uint32_t word = 0;
    std::string text;
    readAdapterNumber(block, 1, "_DeviceID", word);
    readAdapterNumber(block, 9, "_DeviceID", word);
    readPortNumber(block, 1, "_PortState", word);
    readPortNumber(block, 9, "_PortState", word);
    readText(block, 2, "_ULPFirmwareName", text);
    readText(block, 9, "_ULPFirmwareName", text);
    readMacAddress(block, 3, "_IEEE_ADDRESS", text);
    EXPECT_THAT(log.lines,
                testing::ElementsAre(
                    "5 _DeviceID: [ 42 ]", "5 ERROR: RM_GetHBAAttributeValue HA__DeviceID call failed (2)",
                    "5 _PortState: [ 42 ]", "5 ERROR: RM_GetPortAttributes HA__PortState call failed (2)",
                    "5 _ULPFirmwareName : [ text ]", "5 ERROR: _ULPFirmwareName: RM_GetHBAAttributes call failed (2)",
                    "5 _IEEE_ADDRESS : [ 00:90:fa:01:02:ff ]"));
}

TEST_F(AttributeBlockTest, ABlockThatCannotHoldTheAnswerReportsTheLibrary)
{
    host.addAdapter(1).attributes = {{1, std::string(600, 'x')}};
    EXPECT_EQ(block.fetch(LRM_GetHBAAttributes, host.adapters[0].ports[0].hba.PortWWN), RM_ERROR_MORE_DATA);
}

} // namespace
