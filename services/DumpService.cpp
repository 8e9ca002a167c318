#include "services/DumpService.h"

#include "agent/Build.h"
#include "agent/MethodCall.h"
#include "foundation/ClientText.h"
#include "runtime/adapter/Provider.h"
#include "schema/TVRHBA_PortController.h"
#include "services/DumpCalls.h"
#include "services/DumpClasses.h"

#include <algorithm>
#include <string>
#include <string_view>

namespace cimple
{

namespace
{

using Service = TVRHBA_DumpService;

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of TVRHBA_DumpService"},
    .noTarget = {TVR_ERR, "TVRHBA_DumpService invald port ...return"},
    .unknownTarget = {TVR_DBG, "TVRHBA_DumpService::Id2HBAName failed"},
    .noPlainName = {TVR_ERR, "TVRHBA_DumpService::Id2HBAName failed"},
    .noWwn = {TVR_ERR, "TVRHBA_DumpService::str2HBAName failed"},
    .anyServiceWithoutOne = true,
};

std::uint32_t refusedByLibrary(RM_STATUS status, const LogText& failure)
{
    constexpr std::uint32_t ofLibrary = 40000;
    failure.log();
    return static_cast<std::uint32_t>(status) + ofLibrary;
}

std::uint32_t generateDump(const Instance* reference, TVRHBA_DumpService_GenerateDump_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering GenerateDump"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    if (const RM_STATUS status = tvrcimDumpDiagnostic(wwpn, wholeDump); status != RM_OK)
        return refusedByLibrary(status, {TVR_ERR, "TVRHBA_DumpService::tvrcimDumpDiagnostic failed"});
    TVR_LOG(TVR_DBG, "TVRHBA_DumpService::tvrcimDumpDiagnostic Succesful");
    TVR_LOG(TVR_DBG, "returning from TVRHBA_DumpService::GenerateDump");
    return 0;
}

std::uint32_t deleteDump(const Instance* reference, TVRHBA_DumpService_DeleteDump_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering DeleteDump"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    if (const RM_STATUS status = tvrcimDeleteDumpFiles(wwpn); status != RM_OK)
        return refusedByLibrary(status, {TVR_ERR, "TVRHBA_DumpService::tvrcimDeleteDumpFiles failed"});
    TVR_LOG(TVR_DBG, "TVRHBA_DumpService::tvrcimDeleteDumpFiles Succesful");
    TVR_LOG(TVR_DBG, "returning from TVRHBA_DumpService::DeleteDump");
    return 0;
}

bool isDump(std::string_view name)
{
    constexpr std::string_view endings[] = {".fat", "core", ".efd", ".txt", ".dmp", ".cee", ".bin"};
    return std::ranges::any_of(endings, [&](std::string_view ending) { return name.ends_with(ending); });
}

/// Those of the names that dumps have, with the log's lines.
Array<String> dumpsAmong(const std::vector<std::string>& names)
{
    Array<String> dumps;
    for (std::size_t i = 0; i < names.size(); i++)
    {
        const char* name = names[i].c_str();
        TVR_LOG(TVR_DBG, "Filenames = %s", name);
        if (!isDump(names[i]))
            continue;
        TVR_LOG(TVR_DBG, "Filename[%d] = %s", static_cast<int>(i), name);
        dumps.append(clientText(names[i]));
    }
    return dumps;
}

std::uint32_t getDumpFileNames(const Instance* reference, TVRHBA_DumpService_GetDumpFileNames_method& parameters)
{
    MethodCall call({TVR_DBG, "Entering GetDumpFileNames method"});
    const HBA_WWN wwpn = call.portOf<Service>(reference, parameters.Target, texts);
    const std::optional<DumpFileList> files = readDumpFileNames(wwpn);
    if (!files)
        MethodCall::end({}, {32968});
    if (files->status != RM_OK)
        return refusedByLibrary(files->status, {TVR_ERR, "TVRHBA_DumpService::tvrcimGetDumpFileNames failed"});
    TVR_LOG(TVR_DBG, "GetDumpFileNames Succesful, NumberOfFileEntries : %d", static_cast<int>(files->names.size()));
    if (const Array<String> dumps = dumpsAmong(files->names); dumps.size() > 0)
        parameters.DumpFiles.set(dumps);
    return 0;
}

// --- how many are kept

constexpr MethodEnd unsupported = {0, MODIFY_INSTANCE_UNSUPPORTED};
constexpr MethodEnd invalid = {0, MODIFY_INSTANCE_INVALID_PARAMETER};
constexpr MethodEnd notDone = {0, MODIFY_INSTANCE_FAILED};

constexpr ServiceTexts dataTexts = {
    .noPlainName = {TVR_ERR, "TVRHBA_DumpData_Provider::modify_instance::Id2HBAName failed"},
    .noWwn = {TVR_ERR, "TVRHBA_DumpData_Provider::modify_instance::str2HBAName failed"},
    .ofName = notDone,
};

/// The port that the instance names, which is that of the data: a client may leave the name out, but not give another.
HBA_WWN portOf(MethodCall& call, const TVRHBA_DumpData& known, const TVRHBA_DumpData& instance)
{
    if (instance.ElementName.null)
        return call.wwpn(known.ElementName.value, dataTexts);
    const HBA_WWN wwpn = call.wwpn(instance.ElementName.value, dataTexts);
    if (instance.ElementName.value != known.ElementName.value)
        MethodCall::end(dataTexts.noWwn, dataTexts.ofName);
    return wwpn;
}

void refuseOtherDirectory(const TVRHBA_DumpData& known, const TVRHBA_DumpData& instance, const TVRHBA_DumpData& model)
{
    if (model.DumpDirectory.null || model.DumpDirectory.value.empty())
        return;
    if (known.DumpDirectory.value != instance.DumpDirectory.value)
        MethodCall::end({TVR_DBG, "tvrcimSetDumpDirectory is not supported"}, unsupported);
    TVR_LOG(TVR_DBG, " For Non VMWARE");
}

/// Where the client names no properties, the model has a 0 for a count that it did not send.
void changeRetention(const TVRHBA_DumpData& known, const HBA_WWN& wwpn, const TVRHBA_DumpData& instance,
                     const Property<std::uint32_t>& wanted)
{
    if (instance.RetentionCount.null || wanted.null || wanted.value == known.RetentionCount.value)
        return;
    if (tvrcimSetRetentionCount(wwpn, wanted.value) != RM_OK)
        MethodCall::end({TVR_ERR, "TVR_MethodWrapper::tvrcimSetRetentionCount failed"}, notDone);
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::tvrcimSetRetentionCount succeded");
}

/// What is thrown stays here as well: the change that came before is made. What is missing then comes back with the
/// refresh that is due from now on.
void rebuild(MethodCall& call, std::uint32_t (*step)(InstanceCache&), const LogText& failure)
{
    const auto status = unlessThrown<std::uint32_t>(BUILD_FAILED, [&] { return step(call.agent()); });
    if (status == BUILD_DONE)
        return;
    call.agent().m_bAdapterMapsIncomplete = true;
    call.refreshAfterwards();
    failure.log();
    TVR_LOG(TVR_ERR, "tvrstatus = %d", static_cast<int>(status));
}

} // namespace

int modifyDumpData(const TVRHBA_DumpData* instance, const TVRHBA_DumpData* model)
{
    MethodCall call({TVR_DBG, "TVRHBA_DumpData_Provider::modify_instance()"});
    if (!model || !instance)
        MethodCall::end({TVR_ERR, "TVRHBA_DumpData_Provider::modify_instance invalid parameter"}, invalid);
    const TVRHBA_DumpData* known = mapOf<TVRHBA_DumpData>(call.agent()).withKeysOf(instance);
    if (!known)
        MethodCall::end({TVR_ERR, "Invalid instance of TVRHBA_DumpData_Provider Data"}, notDone);
    const HBA_WWN wwpn = portOf(call, *known, *instance);
    TVR_LOG(TVR_DBG, "found the key match for instance.");
    refuseOtherDirectory(*known, *instance, *model);
    changeRetention(*known, wwpn, *instance, model->RetentionCount);
    const SharedEnds ends;
    rebuild(call, FC_ClearDumpClasses, {TVR_DBG, "FC_ClearDumpClasses failed"});
    rebuild(call, FC_CreateDumpClasses, {TVR_DBG, "FC_CreateDumpClasses failed"});
    return 0;
}

std::span<const MethodRow> dumpServiceMethods()
{
    return methodTable<Service, &generateDump, &getDumpFileNames, &deleteDump>;
}

} // namespace cimple
