// What the C library tells the module of the host's names in this process.
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

namespace module_test
{

struct HostAddress
{
    std::string canonicalName;
    std::array<std::uint8_t, 4> address; ///< in network order
};

struct HostNames
{
    /// Answer of gethostname(); it fails with EPERM without one.
    std::optional<std::string> shortName = "tavrin-host";
    /// Answer for any name; nothing resolves without one.
    std::optional<HostAddress> address = HostAddress{"tavrin-host.example.net", {192, 0, 2, 17}};
    /// Bytes that the answer takes, for hosts with many aliases.
    std::size_t room = 0;
    /// Runs inside the resolver, such as the loading of one of its modules; may throw.
    std::function<void()> resolving = {};
};

/// Until the first call the answers are those of a HostNames{}: no test depends on the machine's resolver.
void setHostNames(const HostNames& names);

} // namespace module_test
