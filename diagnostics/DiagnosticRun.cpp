#include "diagnostics/DiagnosticRun.h"

#include "agent/Build.h"
#include "agent/MethodCall.h"
#include "diagnostics/DiagnosticSettings.h"
#include "diagnostics/PortName.h"
#include "diagnostics/TestRun.h"
#include "runtime/base/Time.h"
#include "runtime/log/Shielded.h"
#include "schema/TVRHBA_DiagnosticSettingDataRecord.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"
#include "schema/TVRHBA_JobSettingData.h"
#include "schema/TVRHBA_PortController.h"

#include <string_view>
#include <utility>

namespace cimple
{

namespace
{

using JobSettings = TVRHBA_JobSettingData;
using Settings = TVRHBA_FCHBADiagnosticSettingData;
using Parameters = CIM_DiagnosticService_RunDiagnosticService_method;

constexpr std::uint32_t noSuchTest = 1;
constexpr std::uint32_t invalidParameter = 5;

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance: TVRHBA_FCHBADiagnosticTest"},
    .ofService = {invalidParameter},
};

/// While it lives no refresh is started. Its life is that of a run, which holds the data lock at both ends of it.
class DiagnosticsRunning
{
public:
    explicit DiagnosticsRunning(ProviderAgent& agent) : _agent(agent) { ++agent.m_diagnosticsRunning; }
    ~DiagnosticsRunning() { --_agent.m_diagnosticsRunning; }
    DiagnosticsRunning(const DiagnosticsRunning&) = delete;
    DiagnosticsRunning& operator=(const DiagnosticsRunning&) = delete;

private:
    ProviderAgent& _agent;
};

/// Begins the refresh that a reader asked for during a run, and waits for. To be made before the data lock is taken.
class WakesReaders
{
public:
    WakesReaders() = default;
    ~WakesReaders()
    {
        ProviderAgent& agent = *ProviderAgent::instance();
        if (agent.isFabricAwaited())
            shielded(0, [&] { return agent.BuildCimpleInfo(); });
    }
    WakesReaders(const WakesReaders&) = delete;
    WakesReaders& operator=(const WakesReaders&) = delete;
};

const TVRHBA_PortController& controllerOf(InstanceCache& cache, const CIM_ManagedElement* element)
{
    const auto* named = cast<TVRHBA_PortController>(element);
    const auto* known = named ? mapOf<TVRHBA_PortController>(cache).withKeysOf(named) : nullptr;
    if (!known)
        MethodCall::end({TVR_ERR, "Either ManagedElement is NULL or Invalid instance: TVRHBA_PortController"},
                        {invalidParameter});
    return *known;
}

/// Zero if the DeviceID is no name: then the library refuses the test.
HBA_WWN nameOf(const TVRHBA_PortController& controller)
{
    const char* deviceId = controller.DeviceID.value.c_str();
    TVR_LOG(TVR_DBG, "Device ID %s", deviceId);
    HBA_WWN wwpn{};
    toWwn(wwpn, deviceId, {TVR_ERR, "TVRHBA_FCHBADiagnosticTest_Provider::Id2HBAName failed"},
          {TVR_DBG, "TVRHBA_FCHBADiagnosticTest_Provider::str2HBAName failed"});
    return wwpn;
}

/// Those in the cache, changed by what the client sent; null if there are none or the client sent something else.
const JobSettings* jobSettingsOf(InstanceCache& cache, const Parameters& parameters)
{
    if (!parameters.JobSettings)
    {
        TVR_LOG(TVR_DBG, "Using the default TVRHBA_JobSettingData Instance");
        return getDefaultTVRHBA_JobSettingDataInstance(cache);
    }
    const JobSettings* settings = getTVRHBA_JobSettingDataInstance(cache, parameters.JobSettings);
    if (!settings)
        TVR_LOG(TVR_DBG, "Invalid input instance: TVRHBA_JobSettingData");
    return settings;
}

/// The same of the settings of the test.
const Settings* settingsOf(InstanceCache& cache, const Parameters& parameters, std::string_view testName)
{
    if (!parameters.DiagnosticSettings)
    {
        TVR_LOG(TVR_DBG, "Using default TVRHBA_FCHBADiagnosticSettingData Instance");
        return getDefaultTVRHBA_FCHBADiagnosticSettingDataInstance(cache, testName);
    }
    TVR_LOG(TVR_DBG, "Entered embedded instance");
    const Settings* settings =
        getTVRHBA_FCHBADiagnosticSettingDataInstance(cache, parameters.DiagnosticSettings, testName);
    if (!settings)
        TVR_LOG(TVR_DBG, "Invalid input instance: TVRHBA_FCHBADiagnosticSettingData");
    return settings;
}

RM_STATUS execute(TestRun& run)
{
    constexpr std::size_t digitsOfName = 16;
    if (run.test.settings == TestSettings::Targeted && run.settings.TargetDevice.value.size() != digitsOfName)
        MethodCall::end({TVR_DBG, "Invalid TargetDevice, Enter Target WWPN"}, {invalidParameter});
    const RM_STATUS status = run.test.execution.executor(run);
    Time::sleep(run.test.execution.secondsAfter * Time::second);
    return status;
}

/// What the method returns for the status of an executor.
std::uint32_t answerOf(const DiagnosticTest& test, RM_STATUS status)
{
    const char* text = status == RM_OK                   ? "%s Launched/Completed Succesful"
                       : status == RM_ERROR_TEST_RUNNING ? "%s is running "
                                                         : "%s Failed to Run";
    TVR_LOG(TVR_DBG, text, test.name);
    return status == RM_OK ? 0 : ofLibrary(status);
}

/// Where the records of the run have one of its settings, it gets these as the run had them: they may change in the
/// cache. Those of a link test come after its run, and have none even if they came fast.
void recordSettings(const TestRun& run)
{
    if (!run.job || run.settings.OverridedSettingData.value != 1 || run.test.id == DiagnosticTestId::DPort)
        return;
    auto* record = mapOf<TVRHBA_DiagnosticSettingDataRecord>(run.agent).findFirst(
        [&](const auto& known) { return known.Caption.value == run.job->InstanceID.value; });
    if (!record)
        return;
    TVR_LOG(TVR_DBG, "Adding the embedded instance for Settingdatarecord : %s", record->InstanceID.value.c_str());
    if (Ref<Settings> copy = unlessOutOfMemory([&] { return Ref<Settings>(clone_of(&run.settings)); }))
        const Ref<CIM_DiagnosticSettingData> former(std::exchange(record->Settings, copy.release()));
}

std::uint32_t runDiagnosticService(const Instance* reference, Parameters& parameters)
{
    const WakesReaders wakes;
    MethodCall call({TVR_DBG, "TVRHBA_FCHBADiagnosticTest_Provider::RunDiagnosticService"});
    ProviderAgent& agent = call.agent();
    const DiagnosticsRunning running(agent);
    const String name = call.self<TVRHBA_FCHBADiagnosticTest>(reference, texts)->Name.value;
    const TVRHBA_PortController& controller = controllerOf(agent, parameters.ManagedElement);
    const HBA_WWN wwpn = nameOf(controller);
    const JobSettings* jobSettings = jobSettingsOf(agent, parameters);
    const Settings* settings = settingsOf(agent, parameters, name.view());
    if (!jobSettings || !settings)
        call.end({TVR_DBG, "Unable to get the Job/Diagnostic SettingData, Not able to continue"}, {invalidParameter});
    TVR_LOG(TVR_DBG, "Started Diagnostic : %s", name.c_str());
    const DiagnosticTest* test = findDiagnosticTest(name.view());
    if (!test)
        call.end({TVR_DBG, "Invalid Test Name"}, {noSuchTest});
    TestRun run{agent, *test, wwpn, *settings, *jobSettings, controller};
    const std::uint32_t answer = answerOf(*test, execute(run));
    recordSettings(run);
    parameters.Job = run.job.release();
    return answer;
}

} // namespace

std::span<const MethodRow> diagnosticTestMethods()
{
    return methodTable<TVRHBA_FCHBADiagnosticTest, &runDiagnosticService>;
}

} // namespace cimple
