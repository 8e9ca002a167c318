// SCSI commands as the HBA API and the RM library send them, and the answers to them (SPC-4, SBC-3).
#pragma once

#include "device/RmApi.h"

#include <array>
#include <cstdint>
#include <string>
#include <vector>

namespace cimple
{

constexpr std::uint32_t inquirySize = 255;
constexpr std::uint32_t capacitySize = 8;
constexpr std::uint32_t reportLunsSize = 8 + 512 * 8; ///< header and 512 units
constexpr std::uint32_t senseSize = 128;

// Pages of vital product data.
constexpr std::uint32_t serialNumberPage = 0x80;
constexpr std::uint32_t identificationPage = 0x83;

/// Response and sense data of one command, zero where the unit sent less.
template <std::uint32_t Size> struct ScsiAnswer
{
    std::int32_t status = RM_ERROR; ///< of the HBA API or the RM library; they agree on 0 and on 9, check condition
    std::array<std::uint8_t, Size> response{};
    std::array<std::uint8_t, senseSize> sense{};
};

/// Sends by `command(answer)`, which returns the status. A unit often has a condition to report once, which the
/// next try is free of: at most 3 tries.
template <std::uint32_t Size, class Command> ScsiAnswer<Size> sendScsi(const Command& command)
{
    ScsiAnswer<Size> answer;
    for (int i = 0; i < 3; ++i)
    {
        if (i != 0)
            answer = {};
        answer.status = static_cast<std::int32_t>(command(answer));
        if (answer.status != RM_ERROR_CHECK_CONDITION)
            break;
    }
    return answer;
}

/// What the program reads of standard Inquiry data.
struct StandardInquiry
{
    std::uint32_t deviceType = 0; ///< peripheral device type
    std::string vendor = "Unknown";
    std::string product = "Unknown";
    std::string revision = "Unknown";
};

StandardInquiry decodeInquiry(const std::array<std::uint8_t, inquirySize>& response);

struct ReadCapacity
{
    std::uint64_t lastLba = 0;
    std::uint64_t blockLength = 0; ///< bytes
};

ReadCapacity decodeCapacity(const std::array<std::uint8_t, capacitySize>& response);

/// LUN fields of a REPORT LUNS answer, as many as it holds and says, in the order of bytes that HBA_FCPID has.
std::vector<HBA_UINT64> decodeReportLuns(const std::array<std::uint8_t, reportLunsSize>& response);

} // namespace cimple
