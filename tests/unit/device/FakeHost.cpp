#include "FakeHost.h"

#include <algorithm>
#include <cstring>

namespace
{

FakeHost* host = nullptr;

constexpr std::uint32_t recordHeader = 8; // number and length of an attribute

RM_STATUS writeAttributes(const std::map<std::uint32_t, std::string>& attributes, void* buffer, std::uint32_t* size)
{
    std::string bytes;
    for (const auto& [id, value] : attributes)
        bytes += number(id) + number(static_cast<std::uint32_t>(value.size())) + value;
    bytes += number(0);
    if (bytes.size() > *size)
        return RM_ERROR_MORE_DATA;
    std::memcpy(buffer, bytes.data(), bytes.size());
    *size = static_cast<std::uint32_t>(bytes.size());
    return RM_OK;
}

std::uint32_t wordAt(const char* bytes)
{
    std::uint32_t word;
    std::memcpy(&word, bytes, sizeof word);
    return word;
}

const void* RM_GetAttributeValue(const void* buffer, std::uint32_t id, std::uint32_t* length, RM_STATUS* status)
{
    if (host->attribute)
        return host->attribute(buffer, id, length, status);
    const auto* at = static_cast<const char*>(buffer);
    for (; wordAt(at) != 0; at += recordHeader + wordAt(at + 4))
        if (wordAt(at) == id)
        {
            *length = wordAt(at + 4);
            *status = RM_OK;
            return at + recordHeader;
        }
    *status = RM_ERROR_NOT_SUPPORTED;
    return nullptr;
}

bool isSame(const HBA_WWN& a, const HBA_WWN& b)
{
    return std::memcmp(&a, &b, sizeof a) == 0;
}

template <class Found> RM_STATUS withPort(const HBA_WWN& wwpn, const Found& found)
{
    for (FakeAdapter& adapter : host->adapters)
        for (FakePort& port : adapter.ports)
            if (isSame(port.hba.PortWWN, wwpn))
                return found(adapter, port);
    return RM_ERROR;
}

RM_STATUS LRM_GetHBAAttributes(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
{
    if (int status = host->enter("LRM_GetHBAAttributes"))
        return status;
    return withPort(wwpn,
                    [&](FakeAdapter& adapter, FakePort&) { return writeAttributes(adapter.attributes, buffer, size); });
}

RM_STATUS LRM_GetPortAttributes(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
{
    if (int status = host->enter("LRM_GetPortAttributes"))
        return status;
    return withPort(wwpn, [&](FakeAdapter&, FakePort& port) { return writeAttributes(port.attributes, buffer, size); });
}

RM_STATUS LRM_GetPortStatistics(HBA_WWN wwpn, void* buffer, std::uint32_t* size)
{
    if (int status = host->enter("LRM_GetPortStatistics"))
        return status;
    return withPort(wwpn, [&](FakeAdapter&, FakePort& port) { return writeAttributes(port.statistics, buffer, size); });
}

RM_STATUS LRM_GetServerAttributes(HBA_WWN, void* buffer, std::uint32_t* size)
{
    if (int status = host->enter("LRM_GetServerAttributes"))
        return status;
    return writeAttributes(host->serverAttributes, buffer, size);
}

RM_STATUS LRM_GetDriverType(HBA_WWN, std::uint32_t* type)
{
    *type = host->driverType;
    return host->enter("LRM_GetDriverType");
}

RM_STATUS LRM_InitLib()
{
    return host->enter("LRM_InitLib");
}

RM_STATUS LRM_SetDebugTraces(std::uint32_t)
{
    return host->enter("LRM_SetDebugTraces");
}

RM_STATUS RM_StatusString(RM_STATUS status, char* buffer, std::uint32_t size)
{
    if (status == RM_ERROR_BUSY)
        std::memset(buffer, 'B', size); // a full buffer without a terminator
    else if (status == RM_ERROR_NOT_SUPPORTED)
        std::strncpy(buffer, "not supported", size);
    return RM_OK;
}

RM_STATUS RM_IsLocalHBA(HBA_WWN, std::uint32_t* isLocal)
{
    *isLocal = host->isLocal;
    return host->enter("RM_IsLocalHBA");
}

RM_STATUS versionText(const char* function, char* buffer, std::uint32_t size)
{
    std::memcpy(buffer, host->version.data(), std::min<std::size_t>(size, host->version.size()));
    return host->enter(function);
}

RM_STATUS RM_GetVersion(char* buffer, std::uint32_t size)
{
    return versionText("RM_GetVersion", buffer, size);
}

RM_STATUS RM_MiliVersion(char* buffer, std::uint32_t size)
{
    return versionText("RM_MiliVersion", buffer, size);
}

RM_STATUS LRM_GetHBAFeature(HBA_WWN, std::uint32_t tag, std::uint32_t* value)
{
    *value = host->features[tag];
    return host->enter("LRM_GetHBAFeature");
}

/// What fits of a list, and how many there are.
template <class List, class Entry> RM_STATUS writeList(const char* function, List* list, const std::vector<Entry>& all)
{
    if (int status = host->enter(function))
        return status;
    const std::uint32_t room = list->count;
    auto* entries = reinterpret_cast<char*>(list) + offsetof(List, entry);
    if (!all.empty())
        std::memcpy(entries, all.data(), std::min<std::size_t>(room, all.size()) * sizeof(Entry));
    list->count = static_cast<std::uint32_t>(all.size());
    return all.size() > room ? RM_ERROR_MORE_DATA : RM_OK;
}

RM_STATUS LRM_GetHBAFeatureList(HBA_WWN, RM_FeatureList* list)
{
    std::vector<RM_Feature> all;
    for (const auto& [tag, value] : host->features)
        all.push_back({tag, value});
    return writeList("LRM_GetHBAFeatureList", list, all);
}

RM_STATUS LRM_VPList(HBA_WWN, RM_VPortList* list)
{
    return writeList("LRM_VPList", list, host->vports);
}

RM_STATUS LRM_GetDriverParams(HBA_WWN, RM_DriverParamList* list)
{
    return writeList("LRM_GetDriverParams", list, host->driverParameters);
}

RM_STATUS LRM_GetDriverParamsGlobal(RM_DriverParamList* list)
{
    return writeList("LRM_GetDriverParamsGlobal", list, host->driverParameters);
}

RM_STATUS LRM_VPListTargets(HBA_WWN, HBA_WWN, RM_VPortTargetList* list)
{
    return writeList("LRM_VPListTargets", list, host->vportTargets);
}

RM_STATUS LRM_GetLunList(HBA_WWN, HBA_WWN, RM_LunList* list)
{
    return writeList("LRM_GetLunList", list, host->luns);
}

RM_STATUS LRM_GetOASLunList(HBA_WWN wwpn, HBA_WWN vport, HBA_WWN target, std::uint32_t option, RM_OASLunList* list)
{
    if (host->laneList)
        return host->laneList(wwpn, vport, target, option, list);
    return writeList("LRM_GetOASLunList", list, host->lanes);
}

RM_STATUS LRM_VPGetAttributes(HBA_WWN, HBA_WWN vport, RM_VPortAttributes* attributes)
{
    attributes->wwpn = vport;
    return host->enter("LRM_VPGetAttributes");
}

RM_STATUS LRM_GetVMFromVPort(HBA_WWN, HBA_WWN, RM_VirtualMachine* machine)
{
    std::memset(machine, 'm', sizeof *machine); // no terminators
    return host->enter("LRM_GetVMFromVPort");
}

RM_STATUS LRM_GetQoS(HBA_WWN, RM_QosInfo* info)
{
    *info = {1, 1, 2, 40};
    return host->enter("LRM_GetQoS");
}

RM_STATUS LRM_DiagBeaconState(HBA_WWN, std::uint32_t* state)
{
    *state = host->beacon;
    return host->enter("LRM_DiagBeaconState");
}

RM_STATUS LRM_DiagBeacon(HBA_WWN, std::uint32_t state)
{
    host->beacon = state;
    return host->enter("LRM_DiagBeacon");
}

RM_STATUS LRM_ChangeWWN(HBA_WWN, HBA_WWN, HBA_WWN, std::uint32_t, std::uint32_t*)
{
    return host->enter("LRM_ChangeWWN");
}

RM_STATUS LRM_RestoreWWN(HBA_WWN, std::uint32_t, std::uint32_t*)
{
    return host->enter("LRM_RestoreWWN");
}

RM_STATUS LRM_SetBootBiosState(HBA_WWN, std::uint32_t)
{
    return host->enter("LRM_SetBootBiosState");
}

RM_STATUS LRM_GetSffData(HBA_WWN, RM_SffData* data)
{
    *data = host->transceiver;
    return host->enter("LRM_GetSffData");
}

RM_STATUS LRM_DiagGetLoadListParams(HBA_WWN, RM_FlashList* list)
{
    *list = host->flash;
    return host->enter("LRM_DiagGetLoadListParams");
}

RM_STATUS LRM_GetVPD(HBA_WWN, RM_VpdArea* area)
{
    *area = host->vpd;
    return host->enter("LRM_GetVPD");
}

HBA_STATUS writeScsi(const std::string& function, const std::string& answer, void* response, std::uint32_t size,
                     void* sense, std::uint32_t senseSize)
{
    const int status = host->enter(function);
    if (status == 0)
        std::memcpy(response, answer.data(), std::min<std::size_t>(size, answer.size()));
    else if (status == 9)
        std::memcpy(sense, host->sense.data(), std::min<std::size_t>(senseSize, host->sense.size()));
    return static_cast<HBA_STATUS>(status);
}

RM_STATUS LRM_VpScsiReportLUNs(HBA_WWN, HBA_WWN, HBA_WWN, void* response, std::uint32_t size, void* sense,
                               std::uint32_t senseSize)
{
    return static_cast<RM_STATUS>(
        writeScsi("LRM_VpScsiReportLUNs", host->reportLuns, response, size, sense, senseSize));
}

RM_STATUS LRM_VpScsiInquiry(HBA_WWN, HBA_WWN, HBA_WWN, HBA_UINT64, std::uint8_t, std::uint32_t page, void* response,
                            std::uint32_t size, void* sense, std::uint32_t senseSize)
{
    return static_cast<RM_STATUS>(
        writeScsi("LRM_VpScsiInquiry", host->inquiry[page], response, size, sense, senseSize));
}

RM_STATUS LRM_VpScsiReadCapacity(HBA_WWN, HBA_WWN, HBA_WWN, HBA_UINT64, void* response, std::uint32_t size, void* sense,
                                 std::uint32_t senseSize)
{
    return static_cast<RM_STATUS>(
        writeScsi("LRM_VpScsiReadCapacity", host->capacity, response, size, sense, senseSize));
}

RM_STATUS LRM_ScsiInquiry(HBA_WWN, HBA_WWN, HBA_UINT64, std::uint8_t, std::uint32_t page, void* response,
                          std::uint32_t size, void* sense, std::uint32_t senseSize)
{
    return static_cast<RM_STATUS>(writeScsi("LRM_ScsiInquiry", host->inquiry[page], response, size, sense, senseSize));
}

// The HBA API. A handle is the adapter's index and 1.

FakeAdapter& adapterOf(HBA_HANDLE handle)
{
    return host->adapters.at(handle - 1);
}

HBA_STATUS HBA_LoadLibrary()
{
    return static_cast<HBA_STATUS>(host->enter("HBA_LoadLibrary"));
}

HBA_UINT32 HBA_GetNumberOfAdapters()
{
    const int count = host->enter("HBA_GetNumberOfAdapters");
    return count ? static_cast<HBA_UINT32>(count) : static_cast<HBA_UINT32>(host->adapters.size());
}

HBA_STATUS HBA_GetAdapterName(HBA_UINT32 index, char* name)
{
    if (int status = host->enter("HBA_GetAdapterName"))
        return static_cast<HBA_STATUS>(status);
    if (index >= host->adapters.size())
        return HBA_STATUS_ERROR_ILLEGAL_INDEX;
    std::strcpy(name, host->adapters[index].name.c_str());
    return HBA_STATUS_OK;
}

HBA_HANDLE HBA_OpenAdapter(char* name)
{
    if (host->enter("HBA_OpenAdapter"))
        return 0;
    for (std::size_t i = 0; i < host->adapters.size(); ++i)
        if (host->adapters[i].name == std::string(name))
        {
            ++host->openHandles;
            return static_cast<HBA_HANDLE>(i + 1);
        }
    return 0;
}

void HBA_CloseAdapter(HBA_HANDLE)
{
    --host->openHandles;
    host->enter("HBA_CloseAdapter");
}

void HBA_RefreshInformation(HBA_HANDLE)
{
    host->enter("HBA_RefreshInformation");
}

HBA_STATUS HBA_GetAdapterAttributes(HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES* out)
{
    if (int status = host->enter("HBA_GetAdapterAttributes"))
        return static_cast<HBA_STATUS>(status);
    *out = adapterOf(handle).hba;
    return HBA_STATUS_OK;
}

HBA_STATUS HBA_GetAdapterPortAttributes(HBA_HANDLE handle, HBA_UINT32 port, HBA_PORTATTRIBUTES* out)
{
    if (int status = host->enter("HBA_GetAdapterPortAttributes"))
        return static_cast<HBA_STATUS>(status);
    if (port >= adapterOf(handle).ports.size())
        return HBA_STATUS_ERROR_ILLEGAL_INDEX;
    *out = adapterOf(handle).ports[port].hba;
    return HBA_STATUS_OK;
}

HBA_STATUS HBA_GetFcpTargetMapping(HBA_HANDLE handle, HBA_FCPTARGETMAPPING* out)
{
    if (int status = host->enter("HBA_GetFcpTargetMapping"))
        return static_cast<HBA_STATUS>(status);
    if (host->mapping)
        return host->mapping(out);
    const auto& all = adapterOf(handle).mapping;
    const std::uint32_t room = out->NumberOfEntries;
    std::copy_n(all.begin(), std::min<std::size_t>(room, all.size()), out->entry);
    out->NumberOfEntries = static_cast<HBA_UINT32>(all.size());
    return all.size() > room ? HBA_STATUS_ERROR_MORE_DATA : HBA_STATUS_OK;
}

HBA_STATUS HBA_SendScsiInquiry(HBA_HANDLE, HBA_WWN, HBA_UINT64, HBA_UINT8, HBA_UINT32 page, void* response,
                               HBA_UINT32 size, void* sense, HBA_UINT32 senseSize)
{
    const std::string function = "HBA_SendScsiInquiry " + std::to_string(page);
    return writeScsi(function, host->inquiry[page], response, size, sense, senseSize);
}

HBA_STATUS HBA_SendReadCapacity(HBA_HANDLE, HBA_WWN, HBA_UINT64, void* response, HBA_UINT32 size, void* sense,
                                HBA_UINT32 senseSize)
{
    return writeScsi("HBA_SendReadCapacity", host->capacity, response, size, sense, senseSize);
}

// --- dumps, and the trace of the firmware

/// A text as the argument of a template.
template <std::size_t Size> struct Literal
{
    consteval Literal(const char (&from)[Size]) { std::copy_n(from, Size, text); }
    char text[Size];
};

/// A function without output.
template <Literal name, class... Arguments> RM_STATUS statusOnly(Arguments...)
{
    return host->enter(name.text);
}

RM_STATUS LRM_GetDumpDirectoryA(HBA_WWN, char* buffer, std::uint32_t size)
{
    std::memset(buffer, 'd', size); // without a terminator
    return host->enter(__func__);
}

RM_STATUS LRM_GetDumpRetentionCount(HBA_WWN, std::uint32_t* count)
{
    *count = 5;
    return host->enter(__func__);
}

RM_STATUS LRM_GetDumpFileNames(HBA_WWN, RM_DumpFileNames* names)
{
    const int status = host->enter(__func__);
    return host->dumpList ? host->dumpList(names) : status;
}

RM_STATUS LRM_Set_BE_EventLogTraceLevel(HBA_WWN, std::uint32_t level, std::uint8_t a, std::uint8_t b, std::uint8_t c,
                                        std::uint8_t d)
{
    host->dumpArguments += std::to_string(level) + ",";
    for (const std::uint8_t byte : {a, b, c, d})
        host->dumpArguments += " " + std::to_string(byte);
    host->dumpArguments += "; ";
    return host->enter(__func__);
}

RM_STATUS LRM_Get_BE_EventLogConfigDataAll(HBA_WWN, RM_EventLogConfig* config)
{
    *config = host->eventLog;
    return host->enter(__func__);
}

RM_STATUS LRM_Set_BE_EventLogConfigDataModule(HBA_WWN, const RM_EventLogModule* module)
{
    host->dumpArguments += std::string(module->module) + " " + module->level;
    for (const std::uint32_t number : {module->portMask, module->functionMask, module->value})
        host->dumpArguments += " " + std::to_string(number);
    host->dumpArguments += "; ";
    return host->enter(__func__);
}

template <class Function> void* address(Function* function)
{
    return reinterpret_cast<void*>(function);
}

/// All functions of the fake by the name that the program looks up first.
const std::map<std::string, void*>& symbols()
{
    // Never destroyed: what the C library needs to destroy it at the end is an allocation that may fail unseen.
    static const auto& all = *new std::map<std::string, void*>{
        {"LRM_GetHBAAttributes", address(LRM_GetHBAAttributes)},
        {"LRM_GetPortAttributes", address(LRM_GetPortAttributes)},
        {"LRM_GetPortStatistics", address(LRM_GetPortStatistics)},
        {"LRM_GetServerAttributes", address(LRM_GetServerAttributes)},
        {"LRM_GetDriverType", address(LRM_GetDriverType)},
        {"LRM_InitLib", address(LRM_InitLib)},
        {"LRM_SetDebugTraces", address(LRM_SetDebugTraces)},
        {"LRM_GetDriverParams", address(LRM_GetDriverParams)},
        {"LRM_GetDriverParamsGlobal", address(LRM_GetDriverParamsGlobal)},
        {"LRM_GetHBAFeature", address(LRM_GetHBAFeature)},
        {"LRM_GetHBAFeatureList", address(LRM_GetHBAFeatureList)},
        {"LRM_VPList", address(LRM_VPList)},
        {"LRM_VPListTargets", address(LRM_VPListTargets)},
        {"LRM_VPGetAttributes", address(LRM_VPGetAttributes)},
        {"LRM_GetLunList", address(LRM_GetLunList)},
        {"LRM_GetOASLunList", address(LRM_GetOASLunList)},
        {"LRM_GetVMFromVPort", address(LRM_GetVMFromVPort)},
        {"LRM_GetQoS", address(LRM_GetQoS)},
        {"LRM_DiagBeacon", address(LRM_DiagBeacon)},
        {"LRM_DiagBeaconState", address(LRM_DiagBeaconState)},
        {"LRM_DiagGetLoadListParams", address(LRM_DiagGetLoadListParams)},
        {"LRM_ChangeWWN", address(LRM_ChangeWWN)},
        {"LRM_RestoreWWN", address(LRM_RestoreWWN)},
        {"LRM_SetBootBiosState", address(LRM_SetBootBiosState)},
        {"LRM_GetSffData", address(LRM_GetSffData)},
        {"LRM_GetVPD", address(LRM_GetVPD)},
        {"LRM_VpScsiReportLUNs", address(LRM_VpScsiReportLUNs)},
        {"LRM_VpScsiInquiry", address(LRM_VpScsiInquiry)},
        {"LRM_VpScsiReadCapacity", address(LRM_VpScsiReadCapacity)},
        {"LRM_ScsiInquiry", address(LRM_ScsiInquiry)},
        {"LRM_GenerateDump", address(statusOnly<"LRM_GenerateDump", std::uint32_t, std::uint32_t, HBA_WWN>)},
        {"LRM_GenerateEfdDump", address(statusOnly<"LRM_GenerateEfdDump", HBA_WWN, std::int32_t, std::uint32_t>)},
        {"LRM_GenerateCoreDump", address(statusOnly<"LRM_GenerateCoreDump", HBA_WWN, const char*>)},
        {"LRM_RetrieveFATDump", address(statusOnly<"LRM_RetrieveFATDump">)},
        {"LRM_RetrieveFATDump2", address(statusOnly<"LRM_RetrieveFATDump2", HBA_WWN>)},
        {"LRM_GetDumpDirectoryA", address(LRM_GetDumpDirectoryA)},
        {"LRM_SetDumpDirectory", address(statusOnly<"LRM_SetDumpDirectory", HBA_WWN, const char*>)},
        {"LRM_GetDumpRetentionCount", address(LRM_GetDumpRetentionCount)},
        {"LRM_SetDumpRetentionCount", address(statusOnly<"LRM_SetDumpRetentionCount", HBA_WWN, std::uint32_t>)},
        {"LRM_DeleteDumpFiles", address(statusOnly<"LRM_DeleteDumpFiles", HBA_WWN>)},
        {"LRM_GetDumpFileNames", address(LRM_GetDumpFileNames)},
        {"LRM_Set_BE_EventLogTraceLevel", address(LRM_Set_BE_EventLogTraceLevel)},
        {"LRM_Get_BE_EventLogConfigDataAll", address(LRM_Get_BE_EventLogConfigDataAll)},
        {"LRM_Set_BE_EventLogConfigDataModule", address(LRM_Set_BE_EventLogConfigDataModule)},
        {"RM_GetAttributeValue", address(RM_GetAttributeValue)},
        {"RM_StatusString", address(RM_StatusString)},
        {"RM_IsLocalHBA", address(RM_IsLocalHBA)},
        {"RM_GetVersion", address(RM_GetVersion)},
        {"RM_MiliVersion", address(RM_MiliVersion)},
        {"HBA_LoadLibrary", address(HBA_LoadLibrary)},
        {"HBA_GetNumberOfAdapters", address(HBA_GetNumberOfAdapters)},
        {"HBA_GetAdapterName", address(HBA_GetAdapterName)},
        {"HBA_OpenAdapter", address(HBA_OpenAdapter)},
        {"HBA_CloseAdapter", address(HBA_CloseAdapter)},
        {"HBA_RefreshInformation", address(HBA_RefreshInformation)},
        {"HBA_GetAdapterAttributes", address(HBA_GetAdapterAttributes)},
        {"HBA_GetAdapterPortAttributes", address(HBA_GetAdapterPortAttributes)},
        {"HBA_GetFcpTargetMapping", address(HBA_GetFcpTargetMapping)},
        {"HBA_SendScsiInquiry", address(HBA_SendScsiInquiry)},
        {"HBA_SendReadCapacity", address(HBA_SendReadCapacity)},
    };
    return all;
}

/// A handle is the file's name in the set of files; null is the global scope, which has no functions here.
std::string fileOf(void* library)
{
    return library ? *static_cast<const std::string*>(library) : "global";
}

void* openFile(const char* file, int)
{
    host->loaderCalls.push_back(std::string("open ") + file);
    const auto found = host->files.find(file);
    return found == host->files.end() ? nullptr : const_cast<std::string*>(&*found);
}

void* findSymbol(void* library, const char* name)
{
    host->loaderCalls.push_back("symbol " + fileOf(library) + " " + name);
    if (host->absentSymbols.count(name) || (!library && !host->globalSymbols.count(name)))
        return nullptr;
    const std::string key = name;
    // The fallback library has its functions under their RM_ names only.
    const bool isFallback = fileOf(library) == "librmapi.so";
    if (isFallback && key.starts_with("LRM_"))
        return nullptr;
    auto found = symbols().find(key);
    if (found == symbols().end() && isFallback)
        found = symbols().find("L" + key);
    return found == symbols().end() ? nullptr : found->second;
}

int closeFile(void* library)
{
    host->loaderCalls.push_back("close " + fileOf(library));
    return host->closeFails ? -1 : 0;
}

} // namespace

FakeHost::FakeHost()
    : _previous(cimple::setDynamicLoader({openFile, findSymbol, closeFile, [] { return "fake error"; }}))
{
    // Made now, and not where a test has memory run out: the C library may need some to note a static object's end.
    symbols();
    cimple::TVR_Logger::instance();
    host = this;
}

FakeHost::~FakeHost()
{
    closeFails = false;
    cimple::unloadAllLibraries();
    cimple::setDynamicLoader(_previous);
    host = nullptr;
}

int FakeHost::enter(const std::string& function)
{
    ++calls[function];
    if (const auto hook = onCall.find(function); hook != onCall.end())
        hook->second();
    auto& next = statuses[function];
    if (next.empty())
        return 0;
    const int status = next.front();
    next.pop_front();
    return status;
}

FakeAdapter& FakeHost::addAdapter(unsigned portCount)
{
    const std::size_t index = adapters.size();
    FakeAdapter& adapter = adapters.emplace_back();
    adapter.name = "Tavrin-F" + std::to_string(index);
    adapter.hba.NodeWWN = wwn(0x2000000000000000 + index);
    adapter.hba.NumberOfPorts = portCount;
    std::strcpy(adapter.hba.SerialNumber, ("SN" + std::to_string(index)).c_str());
    for (unsigned i = 0; i < portCount; ++i)
    {
        FakePort& port = adapter.ports.emplace_back();
        port.hba.NodeWWN = adapter.hba.NodeWWN;
        port.hba.PortWWN = wwn(0x10000000ABCDEF00 + index * 16 + i);
        port.hba.PortState = 2;
    }
    return adapter;
}

long LogCapture::count(const std::string& line) const
{
    return std::count(lines.begin(), lines.end(), line);
}

std::vector<std::string> LogCapture::notable() const
{
    std::vector<std::string> out;
    std::copy_if(lines.begin(), lines.end(), std::back_inserter(out), [](const auto& line) { return line[0] != '5'; });
    return out;
}

HBA_WWN wwn(std::uint64_t value)
{
    HBA_WWN out;
    for (int i = 7; i >= 0; --i, value >>= 8)
        out.wwn[i] = static_cast<HBA_UINT8>(value);
    return out;
}

std::string number(std::uint32_t value)
{
    return std::string(reinterpret_cast<const char*>(&value), sizeof value);
}

std::string counter(std::uint64_t value)
{
    return std::string(reinterpret_cast<const char*>(&value), sizeof value);
}

std::vector<HBA_FCPSCSIENTRY> mappingOf(std::size_t count)
{
    std::vector<HBA_FCPSCSIENTRY> out(count);
    for (std::size_t i = 0; i < count; ++i)
    {
        out[i].FcpId.PortWWN = wwn(0x5000000000000001);
        out[i].FcpId.NodeWWN = wwn(0x5000000000000000);
        out[i].FcpId.FcpLun = static_cast<HBA_UINT64>(i);
    }
    return out;
}
