#include "foundation/ClientText.h"

#include <gtest/gtest.h>

#include <string>

namespace cimple
{
namespace
{

TEST(ClientText, HasCharactersOfXmlAlone)
{
    const std::pair<std::string, std::string> rows[] = {
        {"", ""},
        {"tvfc: link\tup\r\n", "tvfc: link\tup\r\n"},
        {"caf\u00e9 \u20ac \U0001F600 \uFFFD", "caf\u00e9 \u20ac \U0001F600 \uFFFD"},
        {std::string("a\0b\x01\x1b[2J", 8), "a?b??[2J"},
        {"\x80 \xff \xc3", "? ? ?"},
        {"\xc0\xaf \xe0\x80\xaf \xf0\x80\x80\xaf", "?? ??? ????"},      // longer than need be
        {"\xed\xa0\x80 \xf4\x90\x80\x80 \xef\xbf\xbf", "??? ???? ???"}, // no characters
        {"\xe2\x82", "??"},                                             // cut
    };
    for (const auto& [text, valid] : rows)
        EXPECT_EQ(clientText(text).view(), valid);
}

} // namespace
} // namespace cimple
