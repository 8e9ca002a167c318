// The diagnostic tests that every host with ports offers.
#pragma once

#include "device/RmApi.h"

#include <cstdint>
#include <initializer_list>
#include <span>
#include <string_view>

namespace cimple
{

struct TestRun;

enum class DiagnosticTestId : std::uint32_t
{
    Beacon = 1,
    Echo = 2,
    ExternalLoopback = 3,
    HostLoopback = 4,
    InternalLoopback = 5,
    Ping = 6,
    Reset = 7,
    Self = 8,
    Status = 9,
    DPort = 10,
};

/// Which settings a test has, and what of them a client may give for a run.
enum class TestSettings
{
    Fixed,    ///< nothing
    Marked,   ///< nothing either, but that something was given is noted
    Buffer,   ///< loops and the pattern that is sent
    Targeted, ///< the same, and where it is sent to
};

/// Without a parameter, the test has no loops.
struct LoopDefault
{
    std::uint16_t control;
    const char* parameter;
};

/// Drives a test through the library. RM status, or another number that the client gets in the same way.
using Executor = RM_STATUS(TestRun& run);

/// How a test is run.
struct TestExecution
{
    Executor* executor;
    std::uint32_t secondsAfter = 0; ///< that the port is left alone before the next test
};

/// What is published about a test, and how it is run. The values are those of the CIM properties of these names.
struct DiagnosticTest
{
    DiagnosticTestId id;
    const char* name; ///< also the InstanceID of its settings, capabilities, identity and log
    std::uint16_t type;
    std::initializer_list<std::uint16_t> testTypes;
    std::initializer_list<std::uint16_t> characteristics;
    LoopDefault loop;
    std::initializer_list<std::uint16_t> supportedLoopControl;
    std::uint16_t supportedExecutionControls;
    TestSettings settings;
    std::initializer_list<const char*> overrides;
    const char* description;
    TestExecution execution;

    bool hasBuffer() const { return settings >= TestSettings::Buffer; }
};

/// All tests, in the order in which they are published.
std::span<const DiagnosticTest> diagnosticTests();

/// Null if there is none of this name.
const DiagnosticTest* findDiagnosticTest(std::string_view name);

} // namespace cimple
