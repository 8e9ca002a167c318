// Instances of a class as rows of readable texts, in little room: tens of thousands of them are kept for a while,
// sorted and searched without asking for them again.
#pragma once

#include "broker/values/ClassInfo.h"

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace web
{

/// Which rows, and in which order.
struct Selection
{
    std::string sort = {}; ///< a column; empty for the order in which they came
    bool descending = false;
    std::string find = {}; ///< rows that have this somewhere, in any case of letters; empty for all
};

class InstanceTable
{
public:
    /// Has a column for each property of the class.
    InstanceTable(const broker::ClassTable& classes, const broker::ClassInfo& info);

    void add(const broker::Object& object);

    std::size_t size() const { return _rows.size(); }
    std::size_t bytes() const { return _bytes; }
    const std::vector<std::string>& columns() const { return _columns; }
    const std::string& path(std::size_t row) const { return _rows[row].path; }
    /// Nothing for a null.
    std::optional<std::string_view> text(std::size_t row, std::size_t column) const;
    /// The rows, of which those without a value stand last. Throws ArgumentFailure for a column that there is none of.
    std::vector<std::size_t> select(const Selection& selection) const;

private:
    struct Row
    {
        std::string path;
        std::string texts;               ///< of all columns, each ended by a line break
        std::vector<std::uint32_t> ends; ///< behind which the next begins; with a mark for nulls
    };

    std::size_t columnOf(const std::string& name) const;
    bool has(const Row& row, std::string_view wanted) const;
    bool isNull(std::size_t row, std::size_t column) const;

    const broker::ClassTable& _classes;
    std::vector<std::string> _columns;
    std::vector<Row> _rows;
    /// Of columns of numbers, by column: what orders the rows.
    std::map<std::size_t, std::vector<std::uint64_t>> _numbers;
    std::size_t _bytes = 0;
};

} // namespace web
