// What a host consists of: the kinds of its elements, and the associations that lead from one kind to another. A kind
// that is to be shown is a row, and so is what leads to it.
#pragma once

#include "broker/health/Health.h"
#include "broker/values/Value.h"

#include <optional>
#include <span>
#include <string>
#include <vector>

namespace broker
{

/// Where a fact appears beside the list below its element.
enum Place : unsigned
{
    below = 0,
    inLine = 1,    ///< in the element's own line, not in the list
    labelled = 2,  ///< there with its label
    pictured = 4,  ///< in pictures too
    isProblem = 8, ///< says what is wrong
};

/// A property that an element shows, under a label for people.
struct FactRow
{
    /// An empty text leaves the fact out.
    using Text = std::string (*)(const Object& object, const FactRow& row);

    const char* label;
    const char* property;
    Text text;
    unsigned place = below;
    const char* detail = ""; ///< unit of a measure, or what tells the value from others
};

enum class Appears
{
    itself,
    through, ///< what hangs on it hangs on what it hangs on itself
    summed,  ///< with the number and capacity of the units behind it
    unit,    ///< one of those units
};

/// What is wrong with an element.
struct Problem
{
    std::string text;
    bool critical = false;
};
/// None for an element that is well.
using Problems = std::vector<Problem> (*)(const Object& object);

/// How the instances of a class appear.
struct KindRow
{
    const char* name;
    const char* plural;
    const char* className; ///< null for what no instance stands for
    const char* nameProperty;
    std::vector<FactRow> facts = {};
    Appears appears = Appears::itself;
    Problems problems = nullptr;
    std::optional<Software> classification = {}; ///< of the software that is of this kind; nothing for all
};

/// Containers before what they contain: this is also the order in which kinds are listed.
std::span<const KindRow> kinds();
/// Throws std::out_of_range for a name that is none.
const KindRow& kindNamed(const std::string& name);

inline constexpr const char* hostKind = "Computer system";
inline constexpr const char* portKind = "FC port";
inline constexpr const char* targetKind = "Target";

/// An association that leads to the parts of an element.
struct EdgeRow
{
    const char* whole;
    const char* association;
    const char* part;
    /// The reference to the target endpoint in between, by whose port the parts are grouped into targets.
    const char* target = nullptr;
};

/// In the order in which the parts of an element are listed.
std::span<const EdgeRow> edges();

} // namespace broker
