// Instances as rows: their order by a column, what is found in them, and what hostile values become.
#include "broker/web/InstanceTable.h"
#include "broker/web/Failure.h"
#include "tests/unit/broker/FakeModule.h"

#include <gtest/gtest.h>

#include <limits>

using namespace broker;
using namespace web;

namespace
{

class Rows : public testing::Test
{
protected:
    Object disk(const std::string& id, std::vector<Property> properties = {})
    {
        properties.insert(properties.begin(), {"Id", Value::string(id)});
        return {{"root/a", "TST_Disk", {{"Id", Value::string(id)}}}, std::move(properties)};
    }
    /// The Ids of the selected rows.
    static std::string ids(const InstanceTable& table, const Selection& selection)
    {
        std::string text;
        for (const std::size_t row : table.select(selection))
            text += (text.empty() ? "" : " ") + std::string(*table.text(row, columnOf(table, "Id")));
        return text;
    }
    static std::size_t columnOf(const InstanceTable& table, const std::string& name)
    {
        return static_cast<std::size_t>(std::ranges::find(table.columns(), name) - table.columns().begin());
    }
    InstanceTable empty(const char* className) const
    {
        return {fixture.broker->classes(), *fixture.broker->classes().find(className)};
    }

    broker_test::Fixture fixture;
};

TEST_F(Rows, AreSortedByNumbersAsNumbersAndNullsComeLast)
{
    InstanceTable table = empty("TST_Disk");
    table.add(disk("nine", {{"Size", Value::uint64(9)}, {"Level", Value::uint16(2)}}));
    table.add(disk("none", {{"Size", Value::null(CMPI_uint64)}}));
    table.add(disk("ten", {{"Size", Value::uint64(10)}, {"Level", Value::uint16(2)}}));
    table.add(disk("most", {{"Size", Value::uint64(UINT64_MAX)}}));
    table.add(disk("less", {{"Size", Value::uint64(UINT64_MAX - 1)}, {"Level", Value::uint16(1)}}));
    table.add(disk("missing"));
    const struct
    {
        Selection selection;
        const char* ids;
    } rows[] = {
        {{}, "nine none ten most less missing"},
        {{"Size"}, "nine ten less most none missing"},
        {{"Size", true}, "most less ten nine none missing"},
        {{"size"}, "nine ten less most none missing"},
        {{"Level"}, "less nine ten none most missing"}, // equal ones as they came
        {{"Level", true}, "nine ten less none most missing"},
        {{"Id"}, "less missing most nine none ten"},
        {{"Size", false, "N"}, "nine ten none missing"}, // in any case
        {{"Size", false, "18446744073709551614"}, "less"},
        {{"", false, "nothing of it"}, ""},
        {{"", false, "TST_Disk.Id=\"ten\""}, "ten"}, // in the path too
    };
    for (const auto& row : rows)
        EXPECT_EQ(ids(table, row.selection), row.ids) << row.selection.sort << row.selection.find;
    EXPECT_THROW(table.select({"Colour"}), ArgumentFailure);
    EXPECT_TRUE(empty("TST_Disk").select({"Size"}).empty());
}

TEST_F(Rows, OfRealsAreSortedThroughAllTheirSigns)
{
    InstanceTable table = empty("TST_Port");
    const double infinity = std::numeric_limits<double>::infinity();
    const double values[] = {1.5, -infinity, -0.25, 0, infinity, -2, 1e-300};
    for (std::size_t i = 0; i < std::size(values); i++)
        table.add({{"root/a", "TST_Port", {}},
                   {{"Number", Value::uint16(static_cast<std::uint16_t>(i))}, {"Ratio", Value::real64(values[i])}}});
    EXPECT_EQ(table.select({"Ratio"}), (std::vector<std::size_t>{1, 5, 2, 3, 6, 0, 4}));
}

TEST_F(Rows, HoldHostileTextsOnOneLineAndNotTooMuchOfThem)
{
    InstanceTable table = empty("TST_Disk");
    std::string wide;
    while (wide.size() < 5000)
        wide += "\xc3\xa9";
    table.add(disk("a\nb\x1b[0m\xff", {{"Names", Value::array(CMPI_string, {Value::string(wide)})}}));
    table.add(disk("", {{"Size", Value::string("no number")}, {"Unknown", Value::uint8(1)}}));
    EXPECT_EQ(table.text(0, columnOf(table, "Id")), "a\\nb\\x1b[0m\\xff");
    const std::string names(table.text(0, columnOf(table, "Names")).value());
    EXPECT_TRUE(names.starts_with("[\xc3\xa9") && names.ends_with("\xc3\xa9…")) << names;
    EXPECT_LT(names.size(), 1010U);
    EXPECT_EQ(table.text(1, columnOf(table, "Id")), "") << "an empty text is no null";
    EXPECT_EQ(table.text(1, columnOf(table, "Names")), std::nullopt);
    EXPECT_EQ(table.select({"", false, "\n"}), std::vector<std::size_t>{0}) << "as an escape, and not between values";
    EXPECT_GT(table.bytes(), 1000U);
}

} // namespace
