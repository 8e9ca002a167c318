// One run of a test: what its executor is given, and what it gives back.
#pragma once

#include "agent/ProviderAgent.h"
#include "device/RmApi.h"
#include "diagnostics/TestCatalog.h"
#include "schema/TVRHBA_ConcreteJob.h"

#include <array>

namespace cimple
{

class TVRHBA_FCHBADiagnosticSettingData;
class TVRHBA_JobSettingData;
class TVRHBA_PortController;

/// What it refers to is of the cache: the run holds the data lock from its beginning to its end.
struct TestRun
{
    ProviderAgent& agent;
    const DiagnosticTest& test;
    HBA_WWN wwpn; ///< zero where the port's DeviceID is no name
    const TVRHBA_FCHBADiagnosticSettingData& settings;
    const TVRHBA_JobSettingData& jobSettings;
    const TVRHBA_PortController& portController;
    Ref<TVRHBA_ConcreteJob> job = {}; ///< out: a copy of the job, if there is one for the client
    /// What of the above an executor keeps alive to the end of the run, while it lets go of the data lock.
    std::array<Ref<const Instance>, 3> kept = {};
};

/// What a client gets for a status of the library.
constexpr std::uint32_t ofLibrary(RM_STATUS status)
{
    return static_cast<std::uint32_t>(status) + 40000;
}

} // namespace cimple
