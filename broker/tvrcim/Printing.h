// Output of the tool: aligned tables for people, JSON and MOF for programs.
#pragma once

#include "broker/core/Reply.h"
#include "broker/host/ReadableText.h"
#include "broker/values/Json.h"

#include <ostream>
#include <string>
#include <vector>

namespace tvrcim
{

enum class Format
{
    table,
    json,
    mof,
};

/// Rows of cells under a heading, each column as wide as its widest cell.
class Table
{
public:
    explicit Table(std::vector<std::string> heading) : _rows{std::move(heading)} {}
    void add(std::vector<std::string> row) { _rows.push_back(std::move(row)); }
    void print(std::ostream& out) const;

private:
    std::vector<std::vector<std::string>> _rows; ///< the heading first
};

/// Instances: with `columns` a table of these properties, otherwise a block for each. People read the names of values
/// and numbers in their units.
void printObjects(std::ostream& out, Format format, const broker::ClassTable& classes,
                  const std::vector<broker::Object>& objects, const broker::PropertyList& columns);
/// One path a line, or a JSON list of them.
void printPaths(std::ostream& out, Format format, const std::vector<broker::Path>& paths);
void printClass(std::ostream& out, Format format, const broker::ClassInfo& info);
void printClasses(std::ostream& out, Format format, const std::vector<const broker::ClassInfo*>& classes);
/// What methods of a class take and return, with the names of their values.
void printMethods(std::ostream& out, Format format, const broker::ClassInfo& info,
                  const std::vector<const broker::MethodInfo*>& methods);
void printMethodReply(std::ostream& out, Format format, const broker::ClassInfo& info, const broker::MethodInfo& method,
                      const broker::MethodReply& reply);
/// JSON with indentation; bytes that are no UTF-8 are replaced.
void printJson(std::ostream& out, const broker::Json& json);

} // namespace tvrcim
