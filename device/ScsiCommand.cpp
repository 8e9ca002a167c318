#include "device/ScsiCommand.h"

#include "device/ForeignText.h"

#include <algorithm>
#include <cstring>

namespace cimple
{

namespace
{

std::uint32_t bigEndian(const std::uint8_t* bytes)
{
    return std::uint32_t(bytes[0]) << 24 | std::uint32_t(bytes[1]) << 16 | std::uint32_t(bytes[2]) << 8 | bytes[3];
}

} // namespace

StandardInquiry decodeInquiry(const std::array<std::uint8_t, inquirySize>& response)
{
    const std::uint8_t* bytes = response.data();
    return {.deviceType = bytes[0] & 0x1Fu,
            .vendor = foreignText(bytes + 8, 8),
            .product = foreignText(bytes + 16, 16),
            .revision = foreignText(bytes + 32, 4)};
}

ReadCapacity decodeCapacity(const std::array<std::uint8_t, capacitySize>& response)
{
    return {.lastLba = bigEndian(response.data()), .blockLength = bigEndian(response.data() + 4)};
}

std::vector<HBA_UINT64> decodeReportLuns(const std::array<std::uint8_t, reportLunsSize>& response)
{
    constexpr std::size_t header = 8;
    const std::size_t bytes = std::min<std::size_t>(bigEndian(response.data()), reportLunsSize - header);
    std::vector<HBA_UINT64> luns(bytes / sizeof(HBA_UINT64));
    if (!luns.empty())
        std::memcpy(luns.data(), response.data() + header, luns.size() * sizeof(HBA_UINT64));
    return luns;
}

} // namespace cimple
