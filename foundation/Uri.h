// URIs that a client names: what of them may be shown, and their parts.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace cimple
{

/// For the log: with "***" in the place of a user and a password. All before the last "@" is taken for these, so that
/// a password with separators in it does not show either; a path from the root has none, unless it has a URI in it.
std::string uriForLog(std::string_view uri);

/// What stands behind the last "/"; nothing if there is none.
std::optional<std::string> lastPartOf(std::string_view uri);

/// The path that a file URI has in it, wherever it stands; any other text is one itself.
std::string localPathOf(std::string_view uri);

struct UriAndLogin
{
    std::string uri;                  ///< without the login
    std::optional<std::string> login; ///< "user:password" with its %-escapes resolved; none if the URI has none
};

UriAndLogin takeLogin(std::string_view uri);

} // namespace cimple
