#include "diagnostics/TestCatalog.h"

#include "diagnostics/DPortTest.h"
#include "diagnostics/Executors.h"

#include <algorithm>

namespace cimple
{

namespace
{

using Id = DiagnosticTestId;
using enum TestSettings;

constexpr std::uint16_t vendor = 0x8000;
constexpr LoopDefault noLoop = {};

template <std::uint32_t mode> RM_STATUS loopBack(TestRun& run)
{
    return LoopBackTest(run, mode);
}

// clang-format off
constexpr DiagnosticTest tests[] = {
    {Id::Beacon, "TVR:FCHBA Beacon Test", 2, {2}, {0}, {3, "5"}, {3, 4}, vendor, Marked, {},
     "Test causes a port's LEDs to flash on and off, allowing the port to be easily visually identified", {BeaconTest}},
    {Id::Echo, "TVR:FCHBA Echo Test", 3, {3, 5}, {4, 10}, {3, "100"}, {3}, 1, Targeted,
     {"TargetDevice", "EchoMechanism", "LUN", "BufferSize", "BufferPattern"},
     "Test verifies the data path from host to target", {EchoTest}},
    {Id::ExternalLoopback, "TVR:FCHBA External Loopback Test", 4, {2, 5}, {4, 10}, {3, "100"}, {2, 3}, 1, Buffer,
     {"BufferSize", "BufferPattern"},
     "Test verifies that the entire data path through an FCHBA is working properly", {&loopBack<externalLoopback>, 1}},
    {Id::HostLoopback, "TVR:FCHBA Host Loopback Test", 5, {2}, {4}, {3, "100"}, {2, 3}, 1, Buffer,
     {"BufferSize", "BufferPattern"},
     "Test verifies the FC HBA hostbus interface", {&loopBack<hostLoopback>}},
    {Id::InternalLoopback, "TVR:FCHBA Internal Loopback Test", 6, {2}, {4}, {3, "100"}, {2, 3}, 1, Buffer,
     {"BufferSize", "BufferPattern"},
     "Test verifies the integrity of internal data paths in the FCHBA", {&loopBack<internalLoopback>, 1}},
    {Id::Ping, "TVR:FCHBA Ping Test", 7, {5}, {4, 10}, {3, "100"}, {3}, 1, Targeted,
     {"TargetDevice", "PingMechanism", "LUN", "BufferSize", "BufferPattern"},
     "Test verifies the existence and accessibility of devices on the SAN", {EchoTest}},
    {Id::Status, "TVR:FCHBA Status Test", 10, {4}, {0}, noLoop, {vendor}, vendor, Fixed, {},
     "Test checks the health of the FCHBA, not including the FC optics", {StatusTest}},
    {Id::Reset, "TVR:FCHBA Reset Test", 8, {2}, {4}, noLoop, {vendor}, vendor, Fixed, {},
     "Test causes the FCHBA to re-initialize itself", {FCHBAResetTest}},
    {Id::Self, "TVR:FCHBA Self Test", 9, {2}, {4}, noLoop, {vendor}, vendor, Fixed, {},
     "Test allows all components of the FCHBA to be tested", {SelfTest}},
    {Id::DPort, "TVR:FCHBA D-Port Test", 0x8001, {2, vendor}, {4, 10}, noLoop, {vendor}, vendor, Marked, {},
     "Test allows to identify marginal link level failures", {DPortTest}},
};
// clang-format on

} // namespace

std::span<const DiagnosticTest> diagnosticTests()
{
    return tests;
}

const DiagnosticTest* findDiagnosticTest(std::string_view name)
{
    const auto* found = std::ranges::find(tests, name, &DiagnosticTest::name);
    return found == std::end(tests) ? nullptr : found;
}

} // namespace cimple
