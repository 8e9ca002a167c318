#include "diagnostics/DiagnosticFeature.h"

#include "agent/Build.h"
#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "diagnostics/PortName.h"
#include "diagnostics/TestCatalog.h"
#include "schema/TVRHBA_AvailableDiagnosticService.h"
#include "schema/TVRHBA_DiagElementCapabilities.h"
#include "schema/TVRHBA_DiagElementSettingData.h"
#include "schema/TVRHBA_DiagElementSoftwareIdentity.h"
#include "schema/TVRHBA_DiagHostedService.h"
#include "schema/TVRHBA_DiagServiceConformsToProfile.h"
#include "schema/TVRHBA_DiagnosticIdentity.h"
#include "schema/TVRHBA_DiagnosticsLog.h"
#include "schema/TVRHBA_FCHBADiagnosticServiceCapabilities.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"
#include "schema/TVRHBA_FCHBADiagnosticTest.h"
#include "schema/TVRHBA_HelpService.h"
#include "schema/TVRHBA_HostedService.h"
#include "schema/TVRHBA_JobElementSettingData.h"
#include "schema/TVRHBA_JobSettingData.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_ServiceAffectsElement.h"
#include "schema/TVRHBA_ServiceAvailableToElement.h"
#include "schema/TVRHBA_UseOfLog.h"

#include <optional>
#include <span>
#include <utility>
#include <vector>

namespace cimple
{

namespace
{

constexpr std::uint32_t attributesRoom = 2048;

/// The instances of one test: made first, then put in their maps one by one, or taken out again together.
class TestInstances
{
public:
    explicit TestInstances(InstanceCache& cache) : _cache(cache) {}

    /// `made` may be null, as an instance that no memory was left for: the text is logged for it as for one that the
    /// map refuses.
    template <class Record> Record* add(Ref<Record> made, const LogText& refused)
    {
        return put(std::move(made), refused, false);
    }
    /// One for all tests: the first of them puts it in its map, where it stays.
    template <class Record> Record* addCommon(Ref<Record> made, const LogText& refused)
    {
        return put(std::move(made), refused, true);
    }

    /// Puts what was added since the last time in the maps, up to the first that is refused.
    bool insert()
    {
        for (; _inserted < _instances.size(); _inserted++)
        {
            const Entry& entry = _instances[_inserted];
            Instance_Map& map = _cache.*entry.map;
            const bool stands = entry.common && map.size() != 0;
            if (!stands && !insertInstance(map, entry.instance, entry.refused))
                return false;
        }
        return true;
    }

    void remove()
    {
        for (const Entry& entry : std::span(_instances).first(_inserted))
            if (!entry.common)
                (_cache.*entry.map).remove(entry.instance.get());
        _inserted = 0;
    }

private:
    struct Entry
    {
        Instance_Map InstanceCache::*map;
        Ref<> instance;
        LogText refused;
        bool common;
    };

    template <class Record> Record* put(Ref<Record> made, const LogText& refused, bool common)
    {
        Record* record = made.get();
        _instances.push_back({MapPlace<Record>::map, Ref<>(made.release()), refused, common});
        return record;
    }

    InstanceCache& _cache;
    std::vector<Entry> _instances;
    std::size_t _inserted = 0;
};

/// An association of two instances, which nothing else is named of yet.
template <class Association, class First, class Second, class Holder1, class Holder2>
Ref<Association> associate(First* Holder1::*firstRole, const std::type_identity_t<First>* first,
                           Second* Holder2::*secondRole, const std::type_identity_t<Second>* second)
{
    Ref<Association> association = empty<Association>();
    (*association).*firstRole = shared_end(first).release();
    (*association).*secondRole = shared_end(second).release();
    return association;
}

/// The same of settings that a test has by default.
template <class Association>
Ref<Association> associateDefault(const TVRHBA_FCHBADiagnosticTest* test, const CIM_SettingData* settings)
{
    Ref<Association> association =
        associate<Association>(&Association::ManagedElement, test, &Association::SettingData, settings);
    association->IsDefault.set(1);
    return association;
}

/// What the tests have in common.
struct Feature
{
    InstanceCache& cache;
    const CIM_ComputerSystem& system;
    std::uint16_t version;
    Ref<TVRHBA_JobSettingData> jobSettings = {}; ///< made with the first test
};

// --- the instances of a test

Ref<TVRHBA_FCHBADiagnosticTest> makeTest(const DiagnosticTest& row, const CIM_ComputerSystem& system)
{
    Ref<TVRHBA_FCHBADiagnosticTest> test = empty<TVRHBA_FCHBADiagnosticTest>();
    setSystem(*test, system);
    test->CreationClassName.set(className<TVRHBA_FCHBADiagnosticTest>());
    test->Name.set(row.name);
    test->ElementName.set(row.name);
    test->FCHBATestType.set(row.type);
    test->TestTypes.set(row.testTypes);
    test->Characteristics.set(row.characteristics);
    return test;
}

Ref<TVRHBA_FCHBADiagnosticSettingData> makeSettings(const DiagnosticTest& row)
{
    Ref<TVRHBA_FCHBADiagnosticSettingData> settings = empty<TVRHBA_FCHBADiagnosticSettingData>();
    settings->InstanceID.set(row.name);
    settings->ElementName.set(formatText("%s SettingData", row.name));
    settings->OverridedSettingData.set(0);
    settings->HaltOnError.set(false);
    settings->ResultPersistence.set(0xFFFFFFFF);
    settings->LogOptions.set({2, 6});
    settings->LogStorage.set({2});
    if (row.loop.parameter)
    {
        settings->LoopControl.set({row.loop.control});
        settings->LoopControlParameter.set({row.loop.parameter});
    }
    if (row.hasBuffer())
    {
        settings->BufferSizes.set({8});
        settings->BufferPattern.set({'1', 'a', '2', 'b', '3', 'c', '4', 'd'});
    }
    if (row.settings == TestSettings::Targeted)
    {
        settings->LUN.set(0);
        settings->TargetDevice.set("");
        settings->TargetDeviceFormat.set("2");
        if (row.id == DiagnosticTestId::Echo)
            settings->EchoMechanism.set(2);
        else
            settings->PingMechanism.set(2);
    }
    return settings;
}

Ref<TVRHBA_FCHBADiagnosticServiceCapabilities> makeCapabilities(const DiagnosticTest& row)
{
    Ref<TVRHBA_FCHBADiagnosticServiceCapabilities> capabilities = empty<TVRHBA_FCHBADiagnosticServiceCapabilities>();
    capabilities->InstanceID.set(row.name);
    capabilities->ElementName.set(formatText("%s Capabilites", row.name));
    capabilities->SupportedServiceModes.set({static_cast<std::uint16_t>(row.hasBuffer() ? 4 : 0x8000)});
    capabilities->SupportedLogStorage.set({2});
    capabilities->SupportedLogOptions.set({2, 6});
    capabilities->SupportedLoopControl.set(row.supportedLoopControl);
    capabilities->SupportedExecutionControls.set({row.supportedExecutionControls});
    if (row.overrides.size() != 0)
    {
        Array<String> overrides;
        for (const char* override : row.overrides)
            overrides.append(override);
        capabilities->OtherSupportedExecutionControlsDescriptions.set(overrides);
    }
    return capabilities;
}

Ref<TVRHBA_HelpService> makeHelp(const DiagnosticTest& row, const CIM_ComputerSystem& system)
{
    Ref<TVRHBA_HelpService> help = empty<TVRHBA_HelpService>();
    setSystem(*help, system);
    help->CreationClassName.set(className<TVRHBA_HelpService>());
    help->Name.set(row.name);
    help->ElementName.set(formatText("%s HelpService", row.name));
    help->DeliveryOptions.set({1});
    help->OtherDeliveryOptionDescription.set("String");
    help->DocumentFormat.set({1});
    help->OtherDocumentFormatDescription.set("String");
    help->DocumentsAvailable.set({row.name});
    help->DocumentDescriptions.set({row.description});
    return help;
}

Ref<TVRHBA_DiagnosticIdentity> makeIdentity(const DiagnosticTest& row, std::uint16_t version)
{
    constexpr std::uint16_t major = 1;
    constexpr std::uint16_t revision = 1;
    Ref<TVRHBA_DiagnosticIdentity> identity = empty<TVRHBA_DiagnosticIdentity>();
    identity->InstanceID.set(row.name);
    identity->Name.set(row.name);
    identity->ElementName.set(formatText("%s DiagnosticIdentity", row.name));
    identity->MajorVersion.set(major);
    identity->MinorVersion.set(version);
    identity->RevisionNumber.set(revision);
    identity->VersionString.set(formatText("%d.%d.%d", major, version, revision));
    identity->Manufacturer.set("Tavrin Corporation");
    identity->Classifications.set({7});
    identity->ClassificationDescriptions.set({"TVR: FCHBA Diagnostics"});
    identity->Description.set("TVR FCHBA Diagnostics");
    identity->IsEntity.set(true);
    identity->IdentityInfoValue.set({row.name});
    identity->IdentityInfoType.set({"TAVRIN:DIAGNOSTICS_NAME"});
    identity->ReleaseDate.set(Datetime::now());
    return identity;
}

Ref<TVRHBA_JobSettingData> makeJobSettings()
{
    Ref<TVRHBA_JobSettingData> settings = empty<TVRHBA_JobSettingData>();
    settings->InstanceID.set("TVR:FCHBA JobSettingData");
    settings->ElementName.set("TVR:FCHBA JobSettingData");
    settings->DeleteOnCompletion.set(false);
    return settings;
}

Ref<TVRHBA_DiagnosticsLog> makeLog(const DiagnosticTest& row)
{
    Ref<TVRHBA_DiagnosticsLog> log = empty<TVRHBA_DiagnosticsLog>();
    log->InstanceID.set(row.name);
    log->ElementName.set(formatText("%s DiagnosticLog", row.name));
    log->Description.set("TVRHBA_DiagnosticsLog represents the logs for FCHBA CDM tests");
    log->MaxNumberOfRecords.set(200);
    log->CurrentNumberOfRecords.set(0);
    log->OperationalStatus.set({2});
    log->HealthState.set(5);
    return log;
}

/// A test and all that hangs on it but the ports. Null if memory ran out with the association of its capabilities,
/// which goes without a word.
const TVRHBA_FCHBADiagnosticTest* makeInstances(Feature& feature, const DiagnosticTest& row, TestInstances& instances)
{
    using Available = TVRHBA_ServiceAvailableToElement;
    using Software = TVRHBA_DiagElementSoftwareIdentity;
    using Capabilities = TVRHBA_DiagElementCapabilities;
    using Use = TVRHBA_UseOfLog;

    const auto* test = instances.add(makeTest(row, feature.system), "Insert Failed : TVRHBA_FCHBADiagnosticTest_map");
    const auto* help = instances.add(makeHelp(row, feature.system), "Insert Failed : TVRHBA_HelpService_map");
    instances.add(associate<Available>(&Available::ServiceProvided, help, &Available::UserOfService, test),
                  "Insert Failed : TVRHBA_ServiceAvailableToElement_map");

    const auto* identity =
        instances.add(makeIdentity(row, feature.version), "Insert Failed : TVRHBA_DiagnosticIdentity_map");
    auto* software = instances.add(associate<Software>(&Software::Antecedent, identity, &Software::Dependent, test),
                                   "Insert Failed : TVRHBA_DiagElementSoftwareIdentity_map");
    software->ElementSoftwareStatus.set({2, 6});

    const auto* settings = instances.add(makeSettings(row), "Insert Failed : TVRHBA_FCHBADiagnosticSettingData_map");
    instances.add(associateDefault<TVRHBA_DiagElementSettingData>(test, settings),
                  "Insert Failed : TVRHBA_DiagElementSettingData");

    const auto* capabilities =
        instances.add(makeCapabilities(row), "Insert Failed : TVRHBA_FCHBADiagnosticServiceCapabilities_map");
    const auto* ofTest =
        instances.add(unlessOutOfMemory(
                          [&] {
                              return associate<Capabilities>(&Capabilities::ManagedElement, test,
                                                             &Capabilities::Capabilities, capabilities);
                          }),
                      "Insert Failed : TVRHBA_FCHBAElementCapabilities_map");

    if (!feature.jobSettings)
        feature.jobSettings = makeJobSettings();
    instances.addCommon(feature.jobSettings, "Insert Failed : TVRHBA_JobSettingData_map");
    instances.add(associateDefault<TVRHBA_JobElementSettingData>(test, feature.jobSettings.get()),
                  "Insert Failed : TVRHBA_JobElementSettingData");

    const auto* log = instances.add(makeLog(row), "Insert Failed : DiagnosticsLog_map");
    instances.add(associate<Use>(&Use::Antecedent, log, &Use::Dependent, test), "Insert Failed : UseOfLog_map");
    return ofTest ? test : nullptr;
}

// --- the ports that a test runs on

bool runsOn(const DiagnosticTest& row, const TVRHBA_PortController& controller)
{
    const char* deviceId = controller.DeviceID.value.c_str();
    if (row.id != DiagnosticTestId::DPort || IsFeatureTagSupported(deviceId, RM_FEATURE_DPORT) == 0)
        return true;
    TVR_LOG(TVR_WARN, "DPort not supported on this port: %s", deviceId);
    return false;
}

Ref<TVRHBA_AvailableDiagnosticService> makeAvailable(const TVRHBA_FCHBADiagnosticTest* test,
                                                     const TVRHBA_PortController* controller)
{
    using Available = TVRHBA_AvailableDiagnosticService;
    Ref<Available> available =
        associate<Available>(&Available::ServiceProvided, test, &Available::UserOfService, controller);
    available->EstimatedDurationOfService.set(0);
    return available;
}

Ref<TVRHBA_ServiceAffectsElement> makeAffects(const TVRHBA_FCHBADiagnosticTest* test,
                                              const TVRHBA_PortController* controller)
{
    using Affects = TVRHBA_ServiceAffectsElement;
    Ref<Affects> affects = associate<Affects>(&Affects::AffectedElement, controller, &Affects::AffectingElement, test);
    affects->ElementEffects.set({5});
    return affects;
}

bool insertOnPorts(InstanceCache& cache, const DiagnosticTest& row, const TVRHBA_FCHBADiagnosticTest* test,
                   TestInstances& instances)
{
    const auto controllers = mapOf<TVRHBA_PortController>(cache);
    for (std::size_t i = 0; const TVRHBA_PortController* controller = controllers.at(i); i++)
    {
        if (!runsOn(row, *controller))
            continue;
        instances.add(unlessOutOfMemory([&] { return makeAvailable(test, controller); }),
                      "Insert Failed : TVRHBA_AvailableDiagnosticService_map");
        instances.add(unlessOutOfMemory([&] { return makeAffects(test, controller); }),
                      "Insert Failed : TVRHBA_ServiceAffectsElement_map");
        if (!instances.insert())
            return false;
    }
    return true;
}

/// A test that fails leaves nothing behind, and is in no other's way.
void createTest(Feature& feature, const DiagnosticTest& row)
{
    TestInstances instances(feature.cache);
    const TVRHBA_FCHBADiagnosticTest* test = nullptr;
    try
    {
        test = makeInstances(feature, row, instances);
    }
    catch (const std::bad_alloc&)
    {
        note_missing_memory();
        TVR_LOG(TVR_ERR, "Failed to create the maps for %s ,Check the memory availablity", row.name);
    }
    if (!test || (instances.insert() && insertOnPorts(feature.cache, row, test, instances)))
        return;
    TVR_LOG(TVR_ERR, "Failed to insert the Diag Instances into map for DiagTest %s", row.name);
    instances.remove();
}

// --- what all tests, and all their helps, belong to

/// Makes an association of each instance of a class.
template <class Association, class Record, class End, class Holder1, class Part, class Holder2>
void joinAll(InstanceCache& cache, End* Holder1::*role, const std::type_identity_t<End>* end, Part* Holder2::*partRole,
             const LogText& refused)
{
    const auto parts = mapOf<Record>(cache);
    for (std::size_t i = 0; const Record* part = parts.at(i); i++)
        mapOf<Association>(cache).insert(
            unlessOutOfMemory([&] { return associate<Association>(role, end, partRole, part); }), refused);
}

void joinProfile(InstanceCache& cache)
{
    using Conforms = TVRHBA_DiagServiceConformsToProfile;
    const auto* profile = mapOf<TVRHBA_RegisteredProfile>(cache).findFirst(
        [](const auto& known) { return known.InstanceID.value == "TVR:FCHBA Diagnostics"; });
    if (!profile)
    {
        TVR_LOG(TVR_DBG, "FCHBA Registration Profile instance missing");
        return;
    }
    joinAll<Conforms, TVRHBA_FCHBADiagnosticTest>(cache, &Conforms::ConformantStandard, profile,
                                                  &Conforms::ManagedElement,
                                                  "Insert failed : TVRHBA_ServiceConformsToProfile_map");
}

void joinSystem(InstanceCache& cache, const CIM_ComputerSystem& system)
{
    using HostedTest = TVRHBA_DiagHostedService;
    using HostedHelp = TVRHBA_HostedService;
    TVR_LOG(TVR_DBG, "Updating the CDM DiagHostService profile ");
    joinAll<HostedTest, TVRHBA_FCHBADiagnosticTest>(cache, &HostedTest::Antecedent, &system, &HostedTest::Dependent,
                                                    "Insert failed : TVRHBA_DiagHostedService_map");
    joinAll<HostedHelp, TVRHBA_HelpService>(cache, &HostedHelp::Antecedent, &system, &HostedHelp::Dependent,
                                            "Insert failed : TVRHBA_HostedService_map");
}

// --- what the hardware says

/// That of the first port that can be asked; none if there is no such port.
std::optional<std::uint32_t> diagnosticVersion(InstanceCache& cache)
{
    std::uint32_t version = 0;
    const auto* asked = mapOf<TVRHBA_PortController>(cache).findFirst(
        [&](const auto& known) { return GetDiagnosticVersion(known.DeviceID.value.c_str(), &version) == 0; });
    return asked ? std::optional(version) : std::nullopt;
}

} // namespace

std::uint32_t GetDiagnosticVersion(const char* deviceId, std::uint32_t* version)
{
    if (!version)
    {
        TVR_LOG(TVR_DBG, "Invalid Argument");
        return queryFailed;
    }
    HBA_WWN wwpn;
    if (!toWwn(wwpn, deviceId, {TVR_DBG, "TVRHBA_DiagTestFunc::Id2HBAName failed"},
               {TVR_DBG, "TVRHBA_DiagTestFunc::str2HBAName failed"}))
        return queryFailed;
    AttributeBlock block(attributesRoom);
    if (const RM_STATUS status = block.fetch(LRM_GetHBAAttributes, wwpn); status != RM_OK)
        TVR_LOG(TVR_ERR, "GetDiagnosticVersion:RM_GetHBAAttributes call failed (%d)", status);
    else
        readAdapterNumber(block, RM_HA_DIAG_VERSION, "DiagVersion", *version);
    return 0;
}

std::uint32_t IsFeatureTagSupported(const char* deviceId, std::uint32_t tag)
{
    HBA_WWN wwpn;
    if (!toWwn(wwpn, deviceId, {TVR_DBG, "Id2HBAName failed"}, {TVR_DBG, "str2HBAName failed"}))
        return queryFailed;
    std::uint32_t value = 0;
    if (LRM_GetHBAFeature(wwpn, tag, &value) == RM_OK && value == 1)
        return 0;
    TVR_LOG(TVR_ERR, "Tag:%d not supported for Port %s", tag, deviceId);
    return queryFailed;
}

std::uint32_t ClearDiagnosticClassMaps(InstanceCache& cache, std::uint32_t kind)
{
    constexpr MapGroup groups[] = {MapGroup::Diagnostics, MapGroup::DiagnosticRecords, MapGroup::DiagnosticJobs};
    if (kind < std::size(groups))
        clearGroup(cache, groups[kind]);
    return 0;
}

std::uint32_t CreateFCHBADiagnosticClassFeature(InstanceCache& cache)
{
    const std::size_t controllers = mapOf<TVRHBA_PortController>(cache).size();
    if (controllers == 0)
    {
        TVR_LOG(TVR_DBG, "Unable to create the FCHBA Diagnostic feature, No managed element exist");
        return noManagedElement;
    }
    TVR_LOG(TVR_DBG, "Number of FCHBA ManagedElement : %d", static_cast<int>(controllers));
    const std::optional<std::uint32_t> version = diagnosticVersion(cache);
    const CIM_ComputerSystem* system = mapOf<CIM_ComputerSystem>(cache).first();
    if (!version || !system)
    {
        TVR_LOG(TVR_DBG, "FCHBA Diagnostics are not supported in any of the managed element");
        return notSupported;
    }
    Feature feature{cache, *system, static_cast<std::uint16_t>(*version)};
    for (const DiagnosticTest& row : diagnosticTests())
        createTest(feature, row);
    joinProfile(cache);
    joinSystem(cache, *system);
    return 0;
}

std::uint32_t createDiagnostics(HostContext& host)
{
    ClearDiagnosticClassMaps(host.agent, 0);
    return CreateFCHBADiagnosticClassFeature(host.agent);
}

} // namespace cimple
