// The words of the test of a link.
#include "diagnostics/DPortTexts.h"

#include <gtest/gtest.h>

#include <map>
#include <string>

using namespace cimple;

namespace
{

TEST(DPortTexts, PhasesAndTheirResults)
{
    const std::map<unsigned, std::string> phases = {{210, "Electrical Loopback"},
                                                    {211, "Optical Loopback"},
                                                    {212, "Reverse Optical Loopback"},
                                                    {213, "Link Traffic"},
                                                    {214, "Reverse Link Traffic"}};
    const std::map<unsigned, std::string> results = {{0, "Passed"}, {1, "Skipped"}, {2, "Failed"}, {3, "Stopped"}};
    const auto wordsOf = [](const auto& table, unsigned value)
    { return table.contains(value) ? table.at(value) : std::string(); };
    for (unsigned value = 0; value < 256; value++)
    {
        EXPECT_EQ(DPortPhaseToString(static_cast<std::uint8_t>(value)), wordsOf(phases, value)) << value;
        EXPECT_EQ(DPortResultToString(static_cast<std::uint8_t>(value)), wordsOf(results, value)) << value;
    }
}

TEST(DPortTexts, ErrorsAreNamedFromTheLowestBit)
{
    const struct
    {
        std::uint32_t mask;
        const char* names;
    } rows[] = {
        {0, ""},
        {0x80, ""},
        {0x00008001, "GENERIC,SYNC_LOSS,"},
        {0x80000000, "RESERVED_0"},
        {0xFFFFFFFF,
         "GENERIC,ENC_IN,CRC,TRUNC,TOOLONG,BAD_EOF,ENC_OUT,C3_DISCARD,RX_C3_TIMEOUT,TX_C3_TIMEOUT,UNROUTABLE,"
         "UNREACHABLE,OTHER_DISCARD,LINK_FAILURE,SYNC_LOSS,SIGNAL_LOSS,PRIM_SEQ_PROTO,INV_TX_WORD,INVALID_CRC,"
         "DELIMITER_ERR,ADDR_ID_ERR,LINK_RESET_IN,LINK_RESET_OUT,PORT_OLS_IN,PORT_OLS_OUT,INV_ARB,"
         "SINGLE_CREDIT_LOSS,MULTI_CREDIT_LOSS,RESERVED_2,RESERVED_1,RESERVED_0"},
        {0x01010100, "C3_DISCARD,SIGNAL_LOSS,PORT_OLS_IN,"}, // each half has its place
    };
    for (const auto& row : rows)
        EXPECT_STREQ(DPortErrorsToString(row.mask).c_str(), row.names);
}

} // namespace
