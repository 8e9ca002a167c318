// Paths and values as a person writes them on the command line. A wrong one is a UsageError that names it.
#pragma once

#include "broker/tvrcim/Commands.h"

#include <string>
#include <string_view>
#include <vector>

namespace tvrcim
{

/// As parsePath() reads it; `argument` names it in errors.
broker::Path pathOf(const Session& session, const std::string& text, const std::string& argument = "PATH");

/// A path that names an instance. Where it leaves keys out, they are those of the only instance that has the others;
/// throws CimError when there is none.
broker::Path instancePathOf(const Session& session, const std::string& text, const std::string& argument = "PATH");

/// 16 capital digits, where a person may have put colons between them.
std::string plainWwn(std::string text);
/// The controller of a port that a person named by its WWPN.
broker::Path portControllerOf(const Session& session, const std::string& wwpn);

/// What name=value texts may name.
struct Assignable
{
    std::string_view nameSpace; ///< of references that name none
    const std::vector<broker::FeatureInfo>& features;
    const std::string& owner; ///< the class or method that has them
};

/// Properties or parameters. The value of an array of bytes may be @FILE: what the file holds. References to instances
/// may leave keys out as instancePathOf() has it.
std::vector<broker::Property> parseAssignments(const Session& session, const Assignable& assignable,
                                               const std::vector<std::string>& texts);

} // namespace tvrcim
