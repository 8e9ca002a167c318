#include "services/TagService.h"

#include "agent/MethodCall.h"
#include "device/CurlTransfer.h"
#include "foundation/File.h"
#include "schema/TVRHBA_FCPort.h"
#include "services/TagCalls.h"
#include "services/TagFile.h"
#include "services/TagTable.h"

#include <cerrno>
#include <climits>
#include <cxxabi.h>
#include <memory>
#include <new>
#include <unistd.h>

namespace cimple
{

namespace
{

constexpr MethodEnd noUri = {0x1001}, wrongArgument = {0x80C8};
constexpr std::uint32_t refusedByLibrary = 1;
constexpr std::uint32_t noTable = 5;
constexpr std::uint32_t noMemory = 0x8000;

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of FC Tagging Service"},
    .noTarget = {TVR_ERR, "Target has a null pointer"},
    .unknownTarget = {TVR_ERR, "TVRHBA_FCTagService_Provider::Wrong DeviceID passed"},
    .ofService = {0x812C},
    .ofTarget = {0x80C8},
    .ofNoTarget = {0x1001},
    .anyServiceWithoutOne = true,
};

/// The head of all methods: the target, as the cache has it.
const TVRHBA_FCPort& targetOf(MethodCall& call, const Instance* reference, const TVRHBA_FCPort* target)
{
    call.self<TVRHBA_FCTagService>(reference, texts);
    return call.target(target, texts);
}

/// The name of the adapter that a port is of.
std::string adapterName(MethodCall& call, const TVRHBA_FCPort& port)
{
    if (const auto& data = call.agent().m_pData) // none once the process ends
        for (const Port* known : data->ports)
            if (port.DeviceID.value.view() == known->name)
                return known->getAdapter()->getName();
    MethodCall::end(texts.unknownTarget, texts.ofTarget);
}

std::string uriOf(const Property<String>& uri, const LogText& empty, const MethodEnd& with)
{
    if (uri.null || uri.value.empty())
        MethodCall::end(empty, with);
    return uri.value.c_str();
}

std::string hostName()
{
    char name[HOST_NAME_MAX + 2] = {};
    if (gethostname(name, sizeof name - 1) == 0)
        return name;
    TVR_LOG(TVR_DBG,
            "TVRHBA_FCTagService_Provider::gethostname() failed err : %d , using 'unknown' for hostname and IP address",
            errno);
    return "unknown";
}

} // namespace

std::uint32_t setConfigTable(const Instance* reference, TVRHBA_FCTagService_SetConfigTable_method& parameters)
{
    MethodCall call(LogText{});
    const TVRHBA_FCPort& port = targetOf(call, reference, parameters.Target);
    const std::string uri = uriOf(parameters.URI, {TVR_DBG, "TVRHBA_FCTagService_Provider::Null sized URI"}, noUri);
    const std::string name = adapterName(call, port);
    const auto source = call.withoutLock([&] { return std::make_unique<TagSource>(uri); });
    const TagAdapter adapter(name);
    try
    {
        return adapter.setTable(readTagTable(source->text())) == RM_OK ? 0 : refusedByLibrary;
    }
    catch (const std::bad_alloc&)
    {
        TVR_LOG(TVR_DBG, "SetConfigTable: Memory allocation failed");
        return noMemory;
    }
    catch (const MethodEnd&)
    {
        throw;
    }
    catch (const abi::__forced_unwind&) // the end of the thread
    {
        throw;
    }
    catch (...) // the parser's, and whatever the library throws
    {
        TVR_LOG(TVR_DBG, "unknown exectiion is caught");
        return noTable;
    }
}

std::uint32_t getConfigTable(const Instance* reference, TVRHBA_FCTagService_GetConfigTable_method& parameters)
{
    constexpr LogText noFile = {TVR_DBG, "TVRHBA_FCTagService_Provider::file.fail()"};

    MethodCall call(LogText{});
    const TVRHBA_FCPort& port = targetOf(call, reference, parameters.Target);
    const std::string uri = uriOf(parameters.URI, {TVR_DBG, "Null sized URI..returning"}, wrongArgument);
    const std::optional<TagTarget> target = tagTargetOf(uri);
    if (!target)
        MethodCall::end(noFile, wrongArgument);

    const std::string adapter = adapterName(call, port);
    const std::vector<CPQFC_QosEntry> entries = TagAdapter(adapter).table();
    TVR_LOG(TVR_DBG, "GetConfigTable: filename :%s", target->file.c_str());
    TVR_LOG(TVR_DBG, "TVRHBA_FCTagService_Provider::WriteConfigTablesToFile");
    if (!createTextFile(target->file.c_str(), writeTagTable(hostName(), adapter, entries)))
        MethodCall::end(noFile, {methodFailed});
    if (!target->isElsewhere)
        return 0;
    const int status = call.withoutLock(
        [&]
        {
            const int sent = uploadFileUsingCurl(uri, target->file);
            unlink(target->file.c_str()); // also unsent: the next request makes it anew
            return sent;
        });
    return status == 0 ? 0 : methodFailed;
}

std::uint32_t setGlobalFlag(const Instance* reference, TVRHBA_FCTagService_SetGlobalFlag_method& parameters)
{
    MethodCall call(LogText{});
    const TVRHBA_FCPort& port = targetOf(call, reference, parameters.Target);
    if (parameters.State.null)
        MethodCall::end({TVR_DBG, "TVRHBA_FCTagService_Provider::SetGlobalFlag without a State"}, wrongArgument);
    const TagAdapter adapter(adapterName(call, port));
    return adapter.setGlobalFlag(parameters.State.value) == RM_OK ? 0 : refusedByLibrary;
}

std::uint32_t getGlobalFlag(const Instance* reference, TVRHBA_FCTagService_GetGlobalFlag_method& parameters)
{
    MethodCall call(LogText{});
    const TagAdapter adapter(adapterName(call, targetOf(call, reference, parameters.Target)));
    std::uint32_t state = 0;
    if (adapter.getGlobalFlag(state) != RM_OK)
        return refusedByLibrary;
    parameters.State.set(state);
    return 0;
}

} // namespace cimple
