// Queries of the RM library: versions, features, logical units and virtual ports.
#include "device/TVR_MethodWrapper.h"

#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "device/ForeignText.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstring>
#include <memory>
#include <new>
#include <utility>

namespace cimple
{

namespace
{

/// Entries that a list has room for at first, and the most that a library may ask for.
constexpr std::uint32_t firstListRoom = 64;
constexpr std::uint32_t maxListRoom = 65536;
constexpr int maxListTries = 3;

constexpr std::size_t versionSize = 256;
constexpr std::size_t operatingSystemSize = 40;

/// Reads a list record by `call(list)`, with a buffer that grows when the library has more. `noMemory` is logged at
/// `level` when there is no memory for the buffer.
template <class List, class Entry, class Call>
RM_STATUS fetchList(std::vector<Entry>& out, const char* noMemory, const Call& call, int tries = maxListTries,
                    int level = TVR_DBG)
{
    static_assert(sizeof(Entry) == sizeof(List::entry));
    RM_STATUS status = RM_ERROR_MORE_DATA;
    std::uint32_t room = firstListRoom;
    for (int i = 0; i < tries && status == RM_ERROR_MORE_DATA; ++i)
    {
        const std::size_t size = std::max(sizeof(List), offsetof(List, entry) + std::size_t(room) * sizeof(Entry));
        const std::unique_ptr<std::byte[]> buffer(new (std::nothrow) std::byte[size]{});
        if (!buffer)
        {
            ++left_out_for_memory;
            TVR_LOG(level, "%s", noMemory);
            return RM_ERROR_NO_MEMORY;
        }
        std::uint32_t count = room;
        std::memcpy(buffer.get(), &count, sizeof count);
        status = call(reinterpret_cast<List*>(buffer.get()));
        std::memcpy(&count, buffer.get(), sizeof count);
        if (status == RM_OK)
        {
            out.resize(std::min(count, room));
            if (!out.empty())
                std::memcpy(static_cast<void*>(out.data()), buffer.get() + offsetof(List, entry),
                            out.size() * sizeof(Entry));
        }
        room = std::min(count, maxListRoom);
    }
    return status;
}

/// For the end of a query: logs what the library says of a failure.
RM_STATUS logged(RM_STATUS status)
{
    if (status != RM_OK)
        TVR_MethodWrapper::logStatus(status);
    return status;
}

/// For the handler of a query: the status of what was thrown.
RM_STATUS thrownStatus() noexcept
{
    try
    {
        throw;
    }
    catch (const std::bad_alloc&)
    {
        ++left_out_for_memory;
        TVR_LOG(TVR_DBG, "Unable to allocate the memory");
        return RM_ERROR_NO_MEMORY;
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "An exception came out of the RM library");
        return RM_ERROR;
    }
}

/// A virtual port behind a physical one, and a target behind that.
struct VPortPath
{
    HBA_WWN wwpn{};
    HBA_WWN vport{};
    HBA_WWN target{};

    int convert(const char* deviceId, const char* vportId)
    {
        const int failed = TVR_MethodWrapper::idToWwn(&wwpn, deviceId);
        return failed ? failed : TVR_MethodWrapper::idToWwn(&vport, vportId);
    }
    int convert(const char* deviceId, const char* vportId, const char* targetId)
    {
        const int failed = convert(deviceId, vportId);
        return failed ? failed : TVR_MethodWrapper::idToWwn(&target, targetId);
    }
};

template <class Function> RM_STATUS readVersion(std::string& version, const Function& function)
{
    char text[versionSize] = {};
    const RM_STATUS status = function(text, versionSize);
    if (status == RM_OK)
        version = foreignText(text);
    return status;
}

} // namespace

RM_STATUS TVR_MethodWrapper::GetMILILibVersion(std::string* version)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::GetMILILibVersion");
    if (!version)
    {
        TVR_LOG(TVR_DBG, "Invalid Output pointer");
        return RM_ERROR;
    }
    const RM_STATUS status = readVersion(*version, RM_MiliVersion);
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "ERROR: Failed to get MILILibVersion, returned with code %d", status);
        return status;
    }
    TVR_LOG(TVR_DBG, "MILILibVersion: %s", version->c_str());
    return status;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::GetLibraryVersion(std::string* version)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::GetLibraryVersion");
    if (!version)
    {
        TVR_LOG(TVR_DBG, "Invalid Output pointer");
        return RM_ERROR;
    }
    const RM_STATUS status = readVersion(*version, RM_GetVersion);
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "ERROR: Failed to get LIBVersion, returned with code %d", status);
        return status;
    }
    TVR_LOG(TVR_DBG, "LIBVersion: %s", version->c_str());
    return status;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::SetMILITraceLevel(std::uint32_t level)
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::SetMILITraceLevel");
    return logged(LRM_SetDebugTraces(level));
}

RM_STATUS TVR_MethodWrapper::GetHBAFeatureList(const HBA_WWN& wwpn, std::vector<RM_Feature>* features)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::GetHBAFeatureList");
    if (!features)
    {
        TVR_LOG(TVR_DBG, "Invalid Output pointer");
        return RM_ERROR;
    }
    const RM_STATUS status =
        fetchList<RM_FeatureList>(*features, "Unable to allocate the memory for retrieving features. ",
                                  [&](RM_FeatureList* list) { return LRM_GetHBAFeatureList(wwpn, list); });
    if (status != RM_OK)
        return logged(status);
    for (const RM_Feature& feature : *features)
        TVR_LOG(TVR_DBG, "TVR_MethodWrapper::Features: %d->%u", feature.tag, feature.value);
    return status;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::GetQosInfo(const HBA_WWN& wwpn, RM_QosInfo* info)
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::GetQosInfo");
    if (!info)
    {
        TVR_LOG(TVR_DBG, "Invalid Output pointer");
        return RM_ERROR;
    }
    RM_QosInfo record{};
    const RM_STATUS status = LRM_GetQoS(wwpn, &record);
    if (status == RM_OK)
        *info = record;
    return logged(status);
}

RM_STATUS TVR_MethodWrapper::GetVPD(const char* deviceId, std::vector<VpdField>* fields)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::GetVPD");
    if (!fields)
    {
        TVR_LOG(TVR_DBG, "Invalid Output pointer");
        return RM_ERROR;
    }
    HBA_WWN wwpn{};
    if (const int failed = idToWwn(&wwpn, deviceId))
        return failed;
    RM_VpdArea area{};
    const RM_STATUS status = LRM_GetVPD(wwpn, &area);
    if (status != RM_OK)
        return logged(status);
    *fields = walkVpd({area.data, std::min<std::size_t>(area.length, sizeof area.data)});
    return status;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::getTargetOS_info(const char* deviceId, char* out)
try
{
    TVR_LOG(TVR_DBG, "Entering getTargetOS_info");
    if (!deviceId)
    {
        TVR_LOG(TVR_DBG, "Invalid macAddr passed");
        return RM_ERROR;
    }
    if (!out)
    {
        TVR_LOG(TVR_DBG, "Invalid Output pointer");
        return RM_ERROR;
    }
    HBA_WWN wwpn{};
    if (const int failed = idToWwn(&wwpn, deviceId))
        return failed;
    AttributeBlock block(RM_SERVER_ATTRIBUTES_SIZE);
    if (!block.allocated())
    {
        TVR_LOG(TVR_DBG, "ERROR: TVR_MethodWrapper::getTargetOS_info: Unable to allocate buffer");
        return RM_ERROR_NO_MEMORY;
    }
    if (const RM_STATUS status = block.fetch(LRM_GetServerAttributes, wwpn); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "RM_GetServerAttributes failed with %d", status);
        return status;
    }
    std::string name;
    if (block.text(RM_SA_OPERATING_SYSTEM, name) != RM_OK)
    {
        TVR_LOG(TVR_DBG, "ERROR: TVR_MethodWrapper::getTargetOS_info:Unable to retrieve attribute value");
        return RM_ERROR;
    }
    out[name.copy(out, operatingSystemSize)] = 0;
    TVR_LOG(TVR_DBG, "Exiting getTargetOS_info");
    return RM_OK;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::tvrcimGetTargetMapping(const char* deviceId, const char* targetId,
                                                    std::vector<TargetLun>* luns)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::tvrcimGetTargetMapping");
    if (!luns)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    HBA_WWN wwpn{};
    HBA_WWN target{};
    if (idToWwn(&wwpn, deviceId) != 0 || idToWwn(&target, targetId) != 0)
        return RM_ERROR;
    std::vector<RM_Lun> list;
    const RM_STATUS status = fetchList<RM_LunList>(list, "tvrcimGetTargetMapping: Unable to allocate buffer",
                                                   [&](RM_LunList* out) { return LRM_GetLunList(wwpn, target, out); });
    if (status != RM_OK)
        return logged(status);
    std::vector<TargetLun> described;
    described.reserve(list.size());
    for (const RM_Lun& lun : list)
    {
        const auto answer = sendScsi<inquirySize>(
            [&](auto& to)
            {
                return LRM_ScsiInquiry(wwpn, target, lun.fcpLun, 0, 0, to.response.data(), inquirySize, to.sense.data(),
                                       senseSize);
            });
        logged(answer.status);
        described.push_back({lun, answer.status == RM_OK ? decodeInquiry(answer.response) : StandardInquiry{}});
    }
    *luns = std::move(described);
    return RM_OK;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::tvrcimGetDriverParam(const char* deviceId, std::vector<RM_DriverParam>* parameters)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::tvrcimGetDriverParam()");
    if (!parameters)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    HBA_WWN wwpn{};
    if (deviceId && idToWwn(&wwpn, deviceId) != 0)
        return RM_ERROR;
    int calls = 0;
    RM_STATUS status = RM_OK; // of the last call, in the library's words
    const auto call = [&](RM_DriverParamList* list)
    {
        calls++;
        status = deviceId ? LRM_GetDriverParams(wwpn, list) : LRM_GetDriverParamsGlobal(list);
        if (deviceId)
            TVR_LOG(TVR_DBG, "RM_GetDriverParams: status=%d", status);
        else
            TVR_LOG(TVR_DBG, "RM_GetDriverParamsGlobal: status=%d", status);
        return status == RM_ERROR_BUFFER_TOO_SMALL ? RM_STATUS{RM_ERROR_MORE_DATA} : status;
    };
    constexpr int callAndRepeat = 2;
    std::vector<RM_DriverParam> list;
    const RM_STATUS fetched = fetchList<RM_DriverParamList>(
        list, "ERROR: tvrcimGetDriverParamsGlobal: Unable to allocate buffer", call, callAndRepeat, TVR_CRIT);
    if (fetched == RM_ERROR_NO_MEMORY && status != RM_ERROR_NO_MEMORY)
        return fetched;
    if (status != RM_OK)
    {
        if (deviceId)
            TVR_LOG(TVR_DBG, "RM_GetDriverParams:failed");
        else
            TVR_LOG(TVR_DBG, "ERROR: tvrcimGetDriverParamsGlobal: RM_GetDriverParamsGlobal call failed (%s) (%d)",
                    calls == 1 ? "a" : "b", status);
        return status;
    }
    TVR_LOG(TVR_DBG, "number of driver parameters %d", static_cast<int>(list.size()));
    *parameters = std::move(list);
    return RM_OK;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::ListVPorts(const char* deviceId, std::vector<RM_VPortEntry>* vports)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::ListVPorts");
    if (!vports)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    HBA_WWN wwpn{};
    if (const int failed = idToWwn(&wwpn, deviceId))
        return failed;
    std::vector<RM_VPortEntry> list;
    const RM_STATUS status = fetchList<RM_VPortList>(list, "ListVPorts: Unable to allocate buffer",
                                                     [&](RM_VPortList* out) { return LRM_VPList(wwpn, out); });
    if (status != RM_OK)
        return logged(status);
    for (const RM_VPortEntry& vport : list)
        TVR_LOG(TVR_DBG, "VPort WWPN: %s, VPort WWNN: %s", hbaNameToString(vport.wwpn).c_str(),
                hbaNameToString(vport.wwnn).c_str());
    *vports = std::move(list);
    return status;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::ListVPortAttributes(const char* deviceId, const char* vportId,
                                                 RM_VPortAttributes* attributes)
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::ListVPortAttributes");
    if (!attributes)
    {
        TVR_LOG(TVR_DBG, "Invalid input vp attributes pointer");
        return RM_ERROR;
    }
    VPortPath path;
    if (const int failed = path.convert(deviceId, vportId))
        return failed;
    RM_VPortAttributes record{};
    const RM_STATUS status = LRM_VPGetAttributes(path.wwpn, path.vport, &record);
    if (status != RM_OK)
        return logged(status);
    *attributes = record;
    TVR_LOG(TVR_DBG, "VPort FC id: %x, state: %d, targets: %d", record.fcId, record.state, record.targetCount);
    return status;
}

RM_STATUS TVR_MethodWrapper::ListVPortTargets(const char* deviceId, const char* vportId,
                                              std::vector<RM_VPortTarget>* targets)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::ListVPortTargets");
    if (!targets)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    VPortPath path;
    if (const int failed = path.convert(deviceId, vportId))
        return failed;
    std::vector<RM_VPortTarget> list;
    const RM_STATUS status = fetchList<RM_VPortTargetList>(list, "ListVPortTargets: Unable to allocate buffer",
                                                           [&](RM_VPortTargetList* out)
                                                           { return LRM_VPListTargets(path.wwpn, path.vport, out); });
    if (status != RM_OK)
        return logged(status);
    TVR_LOG(TVR_DBG, "%d Targets Found on Virtual Port ", static_cast<int>(list.size()));
    for (const RM_VPortTarget& target : list)
    {
        TVR_LOG(TVR_DBG, "SCSI Bus no: %d", target.scsiBusNumber);
        TVR_LOG(TVR_DBG, "SCSI Target no: %d", target.scsiTargetNumber);
        TVR_LOG(TVR_DBG, "Target WWPN: %s, Target WWNN: %s", hbaNameToString(target.wwpn).c_str(),
                hbaNameToString(target.wwnn).c_str());
    }
    *targets = std::move(list);
    return status;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::ListVPortLuns(const char* deviceId, const char* vportId, const char* targetId,
                                           std::vector<HBA_UINT64>* luns)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::ListVPortLuns");
    if (!luns)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    VPortPath path;
    if (const int failed = path.convert(deviceId, vportId, targetId))
        return failed;
    const auto answer = sendScsi<reportLunsSize>(
        [&](auto& to)
        {
            return LRM_VpScsiReportLUNs(path.wwpn, path.vport, path.target, to.response.data(), reportLunsSize,
                                        to.sense.data(), senseSize);
        });
    if (answer.status != RM_OK)
        return logged(answer.status);
    *luns = decodeReportLuns(answer.response);
    TVR_LOG(TVR_DBG, "%d LUNs Found on Virtual Port ", static_cast<int>(luns->size()));
    return RM_OK;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::VPortLunAttr(const char* deviceId, const char* vportId, const char* targetId,
                                          HBA_UINT64 lun, VPortLunAttributes* attributes)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::VPortLunAttr");
    if (!attributes)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    VPortPath path;
    if (const int failed = path.convert(deviceId, vportId, targetId))
        return failed;
    const auto inquire = [&](std::uint8_t evpd, std::uint32_t page)
    {
        return sendScsi<inquirySize>(
            [&](auto& to)
            {
                return LRM_VpScsiInquiry(path.wwpn, path.vport, path.target, lun, evpd, page, to.response.data(),
                                         inquirySize, to.sense.data(), senseSize);
            });
    };
    const auto inquiry = inquire(0, 0);
    if (inquiry.status != RM_OK)
        return logged(inquiry.status);
    VPortLunAttributes unit{.inquiry = decodeInquiry(inquiry.response)};
    // A unit need not have a capacity, nor the pages.
    const auto capacity = sendScsi<capacitySize>(
        [&](auto& to)
        {
            return LRM_VpScsiReadCapacity(path.wwpn, path.vport, path.target, lun, to.response.data(), capacitySize,
                                          to.sense.data(), senseSize);
        });
    if (logged(capacity.status) == RM_OK)
        unit.capacity = decodeCapacity(capacity.response);
    if (const auto page = inquire(1, serialNumberPage); page.status == RM_OK)
        unit.serialNumber = foreignText(page.response.data() + 4, inquirySize - 4);
    if (const auto page = inquire(1, identificationPage); page.status == RM_OK)
        designatorToRecord(&unit.designator, page.response);
    *attributes = std::move(unit);
    return RM_OK;
}
catch (...)
{
    return thrownStatus();
}

RM_STATUS TVR_MethodWrapper::ListVMfromVPort(const char* deviceId, const char* vportId, RM_VirtualMachine* machine)
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::ListVMfromVPort");
    if (!machine)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    VPortPath path;
    if (const int failed = path.convert(deviceId, vportId))
        return failed;
    RM_VirtualMachine record{};
    const RM_STATUS status = LRM_GetVMFromVPort(path.wwpn, path.vport, &record);
    if (status != RM_OK)
        return logged(status);
    record.name[sizeof record.name - 1] = 0;
    record.uuid[sizeof record.uuid - 1] = 0;
    *machine = record;
    TVR_LOG(TVR_DBG, "Virtual machine: %s", machine->name);
    return status;
}

RM_STATUS TVR_MethodWrapper::GetOASLunList(const char* deviceId, const char* targetId, const char* vportId,
                                           std::uint32_t option, std::vector<RM_OASLun>* luns)
try
{
    TVR_LOG(TVR_DBG, "TVR_MethodWrapper::GetOASLunList");
    if (!luns)
    {
        TVR_LOG(TVR_DBG, "Invalid input pointer");
        return RM_ERROR;
    }
    HBA_WWN wwpn{};
    HBA_WWN target{};
    HBA_WWN vport{};
    if (idToWwn(&wwpn, deviceId) != 0 || idToWwn(&target, targetId) != 0 || (vportId && idToWwn(&vport, vportId) != 0))
        return RM_ERROR;
    std::vector<RM_OASLun> list;
    const RM_STATUS status = fetchList<RM_OASLunList>(list, "Memory allocation failed.",
                                                      [&](RM_OASLunList* out)
                                                      { return LRM_GetOASLunList(wwpn, vport, target, option, out); });
    if (status != RM_OK)
        TVR_LOG(TVR_DBG, "RM_GetOASLunList error.");
    for (const RM_OASLun& lun : list)
    {
        TVR_LOG(TVR_DBG, "FCP Lun: %s", lunText(static_cast<std::uint64_t>(lun.fcpLun)).c_str());
        TVR_LOG(TVR_DBG, "PrioLane Lun: %d", static_cast<int>(lun.osLun));
        TVR_LOG(TVR_DBG, "PrioLane State: %d", static_cast<int>(lun.laneState));
    }
    if (status == RM_OK)
        *luns = std::move(list);
    TVR_LOG(TVR_DBG, "Exit GetOASLunList");
    return logged(status);
}
catch (...)
{
    return thrownStatus();
}

} // namespace cimple
