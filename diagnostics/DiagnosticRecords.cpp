#include "diagnostics/DiagnosticRecords.h"

#include "agent/Build.h"
#include "diagnostics/DPortTexts.h"
#include "schema/TVRHBA_CorrespondingSettingDataRecord.h"
#include "schema/TVRHBA_DiagnosticCompletionRecord.h"
#include "schema/TVRHBA_DiagnosticServiceRecord.h"
#include "schema/TVRHBA_DiagnosticSettingDataRecord.h"
#include "schema/TVRHBA_DiagnosticsLog.h"
#include "schema/TVRHBA_LogManagesRecord.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_RecordAppliesToElement.h"

#include <algorithm>
#include <iterator>
#include <type_traits>
#include <utility>

namespace cimple
{

namespace
{

// --- what differs by test

/// Which figures the records of a test have.
enum class Figures
{
    Loops,   ///< of its results; none without
    NoLoops, ///< it does not count any
    Link,    ///< of its phases
};

constexpr char replaceCard[] =
    "Suggested Actions a) Try latest released software and firmware b) Try putting this card "
    "in a different host c) Replace Card";
constexpr char replaceCable[] =
    "Suggested Actions a) Verify and replace cable(s) if faulty b) Verify and replace transceiver(s) if faulty c) "
    "Replace external PHY if card has an external PHY component d) Replace Card";
constexpr char verifyFabric[] =
    "Suggested Actions a) Verify end devices b) Verify switch configuration c) Verify and replace cable(s) if faultyd) "
    "Verify and replace transceiver(s) if faulty e) Replace Card f) Replace Switch";

struct RecordRow
{
    DiagnosticTestId test;
    Figures figures;
    const char* actions; ///< what is suggested when it has failed
};

constexpr RecordRow rows[] = {
    {DiagnosticTestId::Beacon, Figures::NoLoops, replaceCard},
    {DiagnosticTestId::Status, Figures::NoLoops, replaceCard},
    {DiagnosticTestId::Reset, Figures::NoLoops, replaceCard},
    {DiagnosticTestId::HostLoopback, Figures::Loops, replaceCard},
    {DiagnosticTestId::InternalLoopback, Figures::Loops, replaceCard},
    {DiagnosticTestId::Self, Figures::Loops, replaceCard},
    {DiagnosticTestId::ExternalLoopback, Figures::Loops, replaceCable},
    {DiagnosticTestId::Echo, Figures::Loops, verifyFabric},
    {DiagnosticTestId::Ping, Figures::Loops, verifyFabric},
    {DiagnosticTestId::DPort, Figures::Link, verifyFabric},
};

consteval bool hasAllTests()
{
    for (auto id = DiagnosticTestId::Beacon; id <= DiagnosticTestId::DPort;
         id = static_cast<DiagnosticTestId>(static_cast<std::uint32_t>(id) + 1))
        if (std::ranges::find(rows, id, &RecordRow::test) == std::end(rows))
            return false;
    return true;
}
static_assert(hasAllTests());

const RecordRow& rowOf(const DiagnosticTest& test)
{
    return *std::ranges::find(rows, test.id, &RecordRow::test);
}

// --- the figures, which both kinds of records have

template <class Record> void setLoops(Record& record, const RM_DiagResults& results)
{
    record.LoopsFailed.set(results.cyclesFailed);
    record.LoopsPassed.set(results.cyclesCompleted - results.cyclesFailed);
    record.CompletedCycles.set(results.cyclesCompleted);
    record.TimeToExecute.set(results.executionTime);
}

template <class Record> void setNoLoops(Record& record)
{
    record.LoopsFailed.set(0);
    record.LoopsPassed.set(0);
}

/// A phase as a record shows it: its latency or its errors.
struct PhaseFigures
{
    std::uint32_t latency = 0;
    std::uint32_t localErrors = 0;
    std::uint32_t remoteErrors = 0;
    String localNames = {};
    String remoteNames = {};
};

PhaseFigures figuresOf(const RM_DPortPhase& phase)
{
    if ((phase.flags & RM_DPORT_HAS_ERRORS) == 0)
        return {.latency = phase.latencyOrLocalErrors};
    PhaseFigures errors{.localErrors = phase.latencyOrLocalErrors, .remoteErrors = phase.remoteErrors};
    errors.localNames = DPortErrorsToString(errors.localErrors);
    errors.remoteNames = DPortErrorsToString(errors.remoteErrors);
    TVR_LOG(TVR_DBG, "LocalErrors: %s, RemoteErrors: %s", errors.localNames.c_str(), errors.remoteNames.c_str());
    return errors;
}

template <class Element> void append(Property<Array<Element>>& property, const Element& element)
{
    property.value.append(element);
    property.null = 0;
}

template <class Record> void addPhase(Record& record, const RM_DPortPhase& phase)
{
    const String name = DPortPhaseToString(phase.id);
    const String result = DPortResultToString(phase.result);
    TVR_LOG(TVR_DBG, "Test phase: %s, Result: %s", name.c_str(), result.c_str());
    const PhaseFigures figures = figuresOf(phase);
    append(record.TestPhases, name);
    append(record.TestPhaseResults, result);
    append(record.PhaseLatency, figures.latency);
    append(record.LocalErrors, figures.localErrors);
    append(record.RemoteErrors, figures.remoteErrors);
    append(record.LocalErrorDesc, figures.localNames);
    append(record.RemoteErrorDesc, figures.remoteNames);
}

template <class Record> void setLink(Record& record, const RM_DPortResults& link, const LogText& creating)
{
    const std::span<const RM_DPortPhase> phases = phasesOf(link);
    creating.log();
    TVR_LOG(TVR_DBG, "CableLength: %d NoOfPhase: %d", static_cast<int>(link.cableLength),
            static_cast<int>(phases.size()));
    record.OverallTestResult.set(link.testResult);
    record.NoOfPhases.set(static_cast<std::uint8_t>(phases.size()));
    record.FrameSize.set(link.frameSize);
    record.BuffersRequired.set(link.buffersRequired);
    record.LinkDistance.set(link.cableLength);
    record.TimeToExecute.set(link.roundTripLatency);
    for (const RM_DPortPhase& phase : phases)
        addPhase(record, phase);
}

template <class Record> void setFigures(Record& record, const TestOutcome& outcome, const LogText& creating)
{
    const Figures figures = rowOf(outcome.test).figures;
    if (figures != Figures::Loops)
        setNoLoops(record);
    else if (outcome.results)
        setLoops(record, *outcome.results);
    if (figures == Figures::Link && outcome.link)
        setLink(record, *outcome.link, creating);
}

// --- the records

/// What all three kinds have.
void setOrigin(CIM_DiagnosticRecord& record, const TestOutcome& outcome)
{
    record.ServiceName.set(outcome.test.name);
    record.ManagedElementName.set(outcome.portController ? outcome.portController->ElementName.value
                                                         : String("TVRHBA_Adapter"));
    record.CreationTimeStamp.set(Datetime::now());
}

Ref<TVRHBA_DiagnosticServiceRecord> makeServiceRecord(const TestOutcome& outcome)
{
    Ref<TVRHBA_DiagnosticServiceRecord> record = empty<TVRHBA_DiagnosticServiceRecord>();
    setOrigin(*record, outcome);
    record->InstanceID.set(formatText("%s:Service Record", outcome.jobId.c_str()));
    record->Description.set("This class holds the results(service) of the test");
    record->ElementName.set(formatText("%s Service Record", outcome.test.name));
    record->RecordType.set(2);
    record->RecordFormat.set("");
    record->RecordData.set(outcome.message);
    setFigures(*record, outcome, {TVR_DBG, "Creating diagnostic service record."});
    return record;
}

/// The message, and for a test that has failed what to do about it.
String verdict(const TestOutcome& outcome)
{
    if (outcome.passed)
        return outcome.message;
    const String text = formatText("%s : %s", outcome.message.c_str(), rowOf(outcome.test).actions);
    TVR_LOG(TVR_DBG, "Message buffer: %s", text.c_str());
    return text;
}

Ref<TVRHBA_DiagnosticCompletionRecord> makeCompletionRecord(const TestOutcome& outcome)
{
    constexpr std::uint16_t ok = 2;
    constexpr std::uint16_t failed = 5;
    Ref<TVRHBA_DiagnosticCompletionRecord> record = empty<TVRHBA_DiagnosticCompletionRecord>();
    setOrigin(*record, outcome);
    record->InstanceID.set(outcome.jobId);
    record->Description.set("This class holds the result of the test");
    record->ElementName.set(formatText("%s Completion Record", outcome.test.name));
    record->RecordType.set(2);
    record->RecordFormat.set("");
    record->CompletionState.set(outcome.passed ? ok : failed);
    setFigures(*record, outcome, {TVR_DBG, "Creating diagnostic completion record."});
    record->RecordData.set(verdict(outcome));
    return record;
}

Ref<TVRHBA_DiagnosticSettingDataRecord> makeSettingsRecord(const TestOutcome& outcome)
{
    Ref<TVRHBA_DiagnosticSettingDataRecord> record = empty<TVRHBA_DiagnosticSettingDataRecord>();
    setOrigin(*record, outcome);
    record->InstanceID.set(formatText("%s:SettingData Record", outcome.jobId.c_str()));
    record->Caption.set(outcome.jobId); // by which its completion record finds it
    record->Description.set("This class holds the overrided setting data of the test");
    record->ElementName.set(formatText("%s SettingData Record", outcome.test.name));
    return record;
}

// --- into the cache

/// The records of one test on their way into the cache. Each step is false where memory ran out, which ends the
/// records of the test; what a map refuses is missing alone.
class RecordsOfTest
{
public:
    RecordsOfTest(InstanceCache& cache, const TestOutcome& outcome) : _cache(cache), _outcome(outcome)
    {
        if (!outcome.portController)
            TVR_LOG(TVR_DBG, "Invalid managed element");
    }

    /// `record` is null afterwards if the map refused it.
    template <class Record>
    bool enter(Ref<Record> (*make)(const TestOutcome&), const LogText& notMade, const LogText& refused,
               const Record*& record)
    {
        return insert<Record>([&] { return make(_outcome); }, notMade, refused, record);
    }

    /// In the log of the test, or in none if it has none.
    bool addToLog(const CIM_DiagnosticRecord* record)
    {
        using Manages = TVRHBA_LogManagesRecord;
        const auto* log = mapOf<TVRHBA_DiagnosticsLog>(_cache).findFirst(
            [&](const auto& known) { return known.InstanceID.value == _outcome.test.name; });
        return associate<Manages>(&Manages::Log, log, &Manages::Record, record,
                                  {TVR_DBG, "Failed to create TVRHBA_LogManagesRecord"},
                                  {TVR_DBG, "Insert Failed : TVRHBA_LogManagesRecord"});
    }

    bool addSettings(const CIM_DiagnosticServiceRecord* record, const TVRHBA_DiagnosticSettingDataRecord* settings,
                     const LogText& refused)
    {
        using Corresponds = TVRHBA_CorrespondingSettingDataRecord;
        return associate<Corresponds>(&Corresponds::DataRecord, record, &Corresponds::SettingsRecord, settings,
                                      {TVR_DBG, "Failed to create TVRHBA_CorrespondingSettingDataRecord"}, refused);
    }

    /// To the port, if there is one.
    bool apply(const CIM_DiagnosticRecord* record, const LogText& notMade)
    {
        using Applies = TVRHBA_RecordAppliesToElement;
        const TVRHBA_PortController* port = _outcome.portController;
        if (!port)
            return true;
        TVR_LOG(TVR_DBG, "PortController : %s", port->ElementName.value.c_str());
        return associate<Applies>(&Applies::Antecedent, record, &Applies::Dependent, port, notMade,
                                  {TVR_DBG, "Insert Failed : RecordAppliesToElement"});
    }

private:
    template <class Record, class Make>
    bool insert(Make make, const LogText& notMade, const LogText& refused, const Record*& record)
    {
        const std::optional<Record*> inserted = insertMade(mapOf<Record>(_cache), make, notMade, refused);
        record = inserted.value_or(nullptr);
        return inserted.has_value();
    }

    /// Either end may be null.
    template <class Association, class First, class Second, class Holder1, class Holder2>
    bool associate(First* Holder1::*firstRole, const std::type_identity_t<First>* first, Second* Holder2::*secondRole,
                   const std::type_identity_t<Second>* second, const LogText& notMade, const LogText& refused)
    {
        const Association* associated = nullptr;
        return insert<Association>(
            [&]
            {
                Ref<Association> association = empty<Association>();
                (*association).*firstRole = shared_end(first).release();
                (*association).*secondRole = shared_end(second).release();
                return association;
            },
            notMade, refused, associated);
    }

    InstanceCache& _cache;
    const TestOutcome& _outcome;
};

constexpr LogText notApplied = {TVR_DBG, "Failed to create TVRHBA_RecordAppliesToElement"};

} // namespace

void CreateDiagnosticServiceRecord(InstanceCache& cache, const TestOutcome& outcome)
{
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::CreateDiagnosticServiceRecord");
    RecordsOfTest records(cache, outcome);
    const TVRHBA_DiagnosticServiceRecord* record = nullptr;
    const TVRHBA_DiagnosticSettingDataRecord* settings = nullptr;
    if (!records.enter(makeServiceRecord, {TVR_DBG, "Failed to create DiagnosticServiceRecord"},
                       {TVR_DBG, "Insert Failed, DiagnosticServiceRecord"}, record) ||
        !record || !records.addToLog(record))
        return;
    if (outcome.overridden &&
        !records.enter(makeSettingsRecord, {TVR_DBG, "Failed to create TVRHBA_DiagnosticSettingDataRecord"},
                       {TVR_DBG, "Insert in TVRHBA_DiagnosticSettingDataRecord Failed"}, settings))
        return;
    if (settings && !(records.addSettings(record, settings, {TVR_DBG, "Insert Failed : RecordAppliesToElement"}) &&
                      records.addToLog(settings)))
        return;
    if (records.apply(record, {TVR_DBG, "Failed to create TVRHBA_DiagnosticCompletionRecord"}) && settings)
        records.apply(settings, notApplied);
}

void CreateDiagnosticCompletionRecord(InstanceCache& cache, const TestOutcome& outcome)
{
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::CreateDiagnosticCompletionRecord");
    RecordsOfTest records(cache, outcome);
    const TVRHBA_DiagnosticCompletionRecord* record = nullptr; // and if it is refused, its associations lead nowhere
    if (!records.enter(makeCompletionRecord, {TVR_DBG, "Failed to create TVRHBA_DiagnosticCompletionRecord"},
                       {TVR_DBG, "Insert in DiagnosticCompletionRecord Failed"}, record) ||
        !records.addToLog(record))
        return;
    if (outcome.overridden)
    {
        const auto* settings = mapOf<TVRHBA_DiagnosticSettingDataRecord>(cache).findFirst(
            [&](const auto& known) { return known.Caption.value == outcome.jobId; });
        if (settings &&
            !records.addSettings(record, settings, {TVR_DBG, "Insert Failed : TVRHBA_CorrespondingSettingDataRecord"}))
            return;
    }
    records.apply(record, notApplied);
}

} // namespace cimple
