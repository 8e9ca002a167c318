#include "agent/SoftwareVersion.h"

#include "schema/TVRHBA_SoftwareIdentity.h"

#include <charconv>
#include <cstdint>
#include <vector>

namespace cimple
{

namespace
{

using Identity = TVRHBA_SoftwareIdentity;

constexpr Property<std::uint16_t> Identity::*versionNumbers[] = {&Identity::MajorVersion, &Identity::MinorVersion,
                                                                 &Identity::RevisionNumber, &Identity::BuildNumber};

/// Two to four numbers with dots between, each within what its property holds; none of a text of another form.
std::vector<std::uint16_t> dottedNumbers(const std::string& version)
{
    std::vector<std::uint16_t> numbers;
    const char* const end = version.data() + version.size();
    for (const char* at = version.data(); numbers.size() < std::size(versionNumbers);)
    {
        const auto [behind, error] = std::from_chars(at, end, numbers.emplace_back());
        if (error != std::errc() || (behind != end && *behind != '.'))
            return {};
        if (behind == end)
            return numbers.size() > 1 ? numbers : std::vector<std::uint16_t>();
        at = behind + 1;
    }
    return {};
}

} // namespace

void setVersion(Identity& identity, const std::string& version)
{
    for (const auto number : versionNumbers)
        (identity.*number).set_null();
    identity.ReleaseType.set_null();
    identity.TestReleaseVersion.set_null();
    if (setFirmwareVersion(identity, String(version)))
        return;
    const std::vector<std::uint16_t> numbers = dottedNumbers(version);
    for (std::size_t i = 0; i < numbers.size(); i++)
        (identity.*versionNumbers[i]).set(numbers[i]);
}

} // namespace cimple
