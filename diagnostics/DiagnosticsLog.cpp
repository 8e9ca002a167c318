#include "diagnostics/DiagnosticsLog.h"

#include "agent/MethodCall.h"
#include "schema/TVRHBA_DiagnosticCompletionRecord.h"
#include "schema/TVRHBA_DiagnosticServiceRecord.h"
#include "schema/TVRHBA_LogManagesRecord.h"
#include "schema/TVRHBA_RecordAppliesToElement.h"

namespace cimple
{

namespace
{

constexpr ServiceTexts texts = {
    .wrongService = {TVR_DBG, "Invalid instance of Diagnostic Log"},
    .ofService = {5},
};

/// Takes what a test left behind out of the cache, but for the records of its settings, which stand without their log
/// from then on.
void clearRecords(InstanceCache& cache, const String& testName)
{
    const auto isOfTest = [&](const CIM_DiagnosticRecord* record)
    { return record && !record->ServiceName.null && record->ServiceName.value == testName; };
    const auto isRecordOfTest = [&](const auto& record) { return isOfTest(&record); };

    mapOf<TVRHBA_LogManagesRecord>(cache).removeIf(
        [&](const auto& manages)
        {
            const auto* log = cast<CIM_Log>(manages.Log);
            return log && log->InstanceID.value == testName;
        });
    mapOf<TVRHBA_RecordAppliesToElement>(cache).removeIf(
        [&](const auto& applies) { return isOfTest(cast<CIM_DiagnosticRecord>(applies.Antecedent)); });
    mapOf<TVRHBA_DiagnosticCompletionRecord>(cache).removeIf(isRecordOfTest);
    mapOf<TVRHBA_DiagnosticServiceRecord>(cache).removeIf(isRecordOfTest);
}

std::uint32_t clearLog(const Instance* reference, CIM_Log_ClearLog_method&)
{
    MethodCall call({TVR_DBG, "TVRHBA_DiagnosticsLog_Provider::ClearLog"});
    const auto* log = call.self<TVRHBA_DiagnosticsLog>(reference, texts);
    clearRecords(call.agent(), log->InstanceID.value); // which is the name of the test
    TVR_LOG(TVR_DBG, "Exiting the TVRHBA CDM Clear log");
    TVR_LOG(TVR_DBG, "Exiting TVRHBA_DiagnosticsLog_Provider::ClearLog");
    return 0;
}

} // namespace

std::span<const MethodRow> diagnosticsLogMethods()
{
    return methodTable<TVRHBA_DiagnosticsLog, &clearLog>;
}

} // namespace cimple
