#include "device/Target.h"

#include "device/ForeignText.h"
#include "device/HbaAdapter.h"
#include "device/ScsiCommand.h"
#include "foundation/Log.h"

#include <utility>

namespace cimple
{

namespace
{

constexpr std::size_t loggedSense = 24;

template <std::uint32_t Size> bool succeeded(const ScsiAnswer<Size>& answer)
{
    if (answer.status != RM_OK)
        TVR_LOG(TVR_DBG, "HBA_SendScsiInquiry_t(0x80) returns %d.", answer.status);
    return answer.status == RM_OK;
}

ScsiAnswer<inquirySize> sendInquiry(const HbaAdapter& adapter, const HBA_FCPID& unit, std::uint8_t evpd,
                                    std::uint32_t page)
{
    return sendScsi<inquirySize>(
        [&](auto& answer)
        {
            return HBA_SendScsiInquiry(adapter.handle(), unit.PortWWN, unit.FcpLun, evpd, page, answer.response.data(),
                                       inquirySize, answer.sense.data(), senseSize);
        });
}

ScsiAnswer<capacitySize> sendReadCapacity(const HbaAdapter& adapter, const HBA_FCPID& unit)
{
    return sendScsi<capacitySize>(
        [&](auto& answer)
        {
            return HBA_SendReadCapacity(adapter.handle(), unit.PortWWN, unit.FcpLun, answer.response.data(),
                                        capacitySize, answer.sense.data(), senseSize);
        });
}

} // namespace

Target::Target(const std::string& adapterName, const HBA_FCPSCSIENTRY& entry)
{
    TVR_LOG(TVR_DBG, "Creating Target...");
    copyFields(entry);
    const HbaAdapter adapter(adapterName);
    readStandardInquiry(adapter, entry.FcpId);
    readSerialNumber(adapter, entry.FcpId);
    readDesignator(adapter, entry.FcpId);
    readCapacity(adapter, entry.FcpId);
    TVR_LOG(TVR_DBG, "End Creating Target...");
}

void Target::copyFields(const HBA_FCPSCSIENTRY& entry)
{
    fcId = entry.FcpId.FcId;
    nodeWWN = wwnText(entry.FcpId.NodeWWN);
    portWWN = wwnText(entry.FcpId.PortWWN);
    fcpLun = static_cast<std::uint64_t>(entry.FcpId.FcpLun);
    osDeviceName = foreignText(entry.ScsiId.OSDeviceName);
    scsiBusNumber = entry.ScsiId.ScsiBusNumber;
    scsiTargetNumber = entry.ScsiId.ScsiTargetNumber;
    scsiOSLun = entry.ScsiId.ScsiOSLun;
}

void Target::readStandardInquiry(const HbaAdapter& adapter, const HBA_FCPID& unit)
{
    TVR_LOG(TVR_DBG, "SCSI Inquiry with 0, 0");
    const auto answer = sendInquiry(adapter, unit, 0, 0);
    const bool answered = succeeded(answer);
    StandardInquiry inquiry = answered ? decodeInquiry(answer.response) : StandardInquiry{};
    deviceType = inquiry.deviceType;
    vendor = std::move(inquiry.vendor);
    product = std::move(inquiry.product);
    revision = std::move(inquiry.revision);
    if (answered)
        TVR_LOG(TVR_DBG, "DeviceType......%d", deviceType);
}

void Target::readSerialNumber(const HbaAdapter& adapter, const HBA_FCPID& unit)
{
    TVR_LOG(TVR_DBG, "SCSI Inquiry with 1, 0x80");
    const auto answer = sendInquiry(adapter, unit, 1, serialNumberPage);
    serialNumber = succeeded(answer) ? foreignText(answer.response.data() + 4, inquirySize - 4) : "Unknown";
}

void Target::readDesignator(const HbaAdapter& adapter, const HBA_FCPID& unit)
{
    TVR_LOG(TVR_DBG, "SCSI Inquiry with 1, 0x83");
    const auto answer = sendInquiry(adapter, unit, 1, identificationPage);
    if (succeeded(answer))
        designatorToRecord(&designator, answer.response);
    else if (answer.status == RM_ERROR_CHECK_CONDITION)
        for (std::size_t i = 0; i < loggedSense; ++i)
            TVR_LOG(TVR_DBG, "%02x ", answer.sense[i]);
}

void Target::readCapacity(const HbaAdapter& adapter, const HBA_FCPID& unit)
{
    TVR_LOG(TVR_DBG, "Send Read Capacity");
    const auto answer = sendReadCapacity(adapter, unit);
    if (!succeeded(answer))
        return;
    const ReadCapacity capacity = decodeCapacity(answer.response);
    lastLba = capacity.lastLba;
    blockLength = capacity.blockLength;
}

} // namespace cimple
