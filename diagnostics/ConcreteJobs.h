// The jobs of tests: what a client gets for a run.
#pragma once

#include "agent/InstanceCache.h"
#include "agent/ProviderExtension.h"
#include "device/RmApi.h"
#include "schema/TVRHBA_ConcreteJob.h"

#include <cstdint>

namespace cimple
{

class ProviderAgent;
class TVRHBA_PortController;

/// What is asked for as the state of a new job. It begins as Exception for whatever is not named here.
enum JobRequest : std::uint32_t
{
    JOB_RUNNING = 4,
    JOB_COMPLETED = 7,
    JOB_TERMINATED = 8,
    JOB_FAILED = 32768,
};

/// CIM_ConcreteJob.JobState.
inline constexpr std::uint16_t jobException = 10;

/// The handle of a test that the library has none for.
inline constexpr std::uint32_t noDiagHandle = 65535;

/// What a new job says.
struct JobOrder
{
    const char* testName;
    const char* wwpnText = nullptr; ///< 16 digits, of a test that can be cancelled later; null for any other
    bool deleteOnCompletion = false;
    std::uint32_t requestedState = JOB_FAILED; ///< a JobRequest
    std::uint32_t diagHandle = noDiagHandle;
    const TVRHBA_PortController* portController = nullptr;
};

/// The caller of all of these holds the data lock.

/// A new job in the cache, which owns it, with its associations to the test and to the port; null if there is none.
/// Associations that cannot be made have their lines in the log.
TVRHBA_ConcreteJob* CreateConcreteJobInstantiateNonBlocking(InstanceCache& cache, const JobOrder& order);

/// Takes a job and its associations out of the cache. 0, or 32969 for a null; a job that is not there goes without a
/// word. The job itself may be gone afterwards.
std::uint32_t DeleteConcreteJob(InstanceCache& cache, const TVRHBA_ConcreteJob* job);

/// Asks for the end of a test of the port until it has ended, or the agent has, once a second, for minutes if need be:
/// the library's last status, 0 if the test has ended.
RM_STATUS CancelTest(const ProviderAgent& agent, const HBA_WWN& wwpn, std::uint32_t diagHandle, const char* testName);

/// Asks once, for the end of a test of the link: RM status. The test ends some time later.
RM_STATUS CancelDportTest(const HBA_WWN& wwpn, std::uint32_t diagHandle, const char* testName);

std::span<const MethodRow> concreteJobMethods();

template <class Form> struct Extended<TVRHBA_ConcreteJob, Form> : Form
{
    static std::span<const MethodRow> methods() { return concreteJobMethods(); }
};

} // namespace cimple
