#include "simulator/ScsiResponses.h"

#include <algorithm>
#include <cstring>

namespace tvrsim
{

namespace
{

using Bytes = std::vector<std::uint8_t>;

constexpr std::uint8_t illegalRequest = 5;
constexpr std::uint8_t invalidOperationCode = 0x20;
constexpr std::uint8_t invalidFieldInCdb = 0x24;
constexpr std::uint8_t logicalUnitNotSupported = 0x25;

constexpr std::uint8_t deviceTypeTape = 1;
constexpr std::uint8_t noUnitHere = 0x7F; ///< peripheral qualifier 3, type 31

constexpr std::uint8_t pageSupported = 0x00;
constexpr std::uint8_t pageSerialNumber = 0x80;
constexpr std::uint8_t pageIdentification = 0x83;

void appendBigEndian32(Bytes& out, std::uint32_t value)
{
    for (int shift = 24; shift >= 0; shift -= 8)
        out.push_back(static_cast<std::uint8_t>(value >> shift));
}

/// `text` in exactly `width` bytes, filled up with blanks.
void appendPadded(Bytes& out, const std::string& text, std::size_t width)
{
    const std::size_t used = std::min(text.size(), width);
    out.insert(out.end(), text.begin(), text.begin() + static_cast<std::ptrdiff_t>(used));
    out.insert(out.end(), width - used, ' ');
}

/// Fixed format sense data, current error.
ScsiReply checkCondition(std::uint8_t key, std::uint8_t code, std::uint8_t qualifier)
{
    Bytes sense(18);
    sense[0] = 0x70;
    sense[2] = key;
    sense[7] = 10; // bytes that follow
    sense[12] = code;
    sense[13] = qualifier;
    return {HBA_STATUS_SCSI_CHECK_CONDITION, {}, std::move(sense)};
}

ScsiReply refuse(std::uint8_t code)
{
    return checkCondition(illegalRequest, code, 0);
}

std::uint8_t peripheral(const LogicalUnit& unit)
{
    return static_cast<std::uint8_t>(unit.deviceQualifier << 5 | (unit.deviceType & 0x1F));
}

ScsiReply inquiry(const LogicalUnit& unit)
{
    Bytes data{peripheral(unit), static_cast<std::uint8_t>(unit.deviceType == deviceTypeTape ? 0x80 : 0), 6, 0x12, 0};
    data.resize(8);
    appendPadded(data, unit.vendor, 8);
    appendPadded(data, unit.product, 16);
    appendPadded(data, unit.revision, 4);
    data.resize(96);
    data[4] = static_cast<std::uint8_t>(data.size() - 5);
    return {0, std::move(data), {}};
}

ScsiReply page(const LogicalUnit& unit, std::uint8_t code, const Bytes& body)
{
    Bytes data{peripheral(unit), code, static_cast<std::uint8_t>(body.size() >> 8),
               static_cast<std::uint8_t>(body.size())};
    data.insert(data.end(), body.begin(), body.end());
    return {0, std::move(data), {}};
}

Bytes supportedPages(const LogicalUnit& unit)
{
    Bytes pages{pageSupported};
    if (unit.serialNumber)
        pages.push_back(pageSerialNumber);
    if (!unit.designators.empty())
        pages.push_back(pageIdentification);
    return pages;
}

Bytes identification(const LogicalUnit& unit)
{
    constexpr std::uint8_t protocolFc = 0;
    Bytes body;
    for (const Designator& designator : unit.designators)
    {
        body.push_back(static_cast<std::uint8_t>(protocolFc << 4 | (designator.codeSet & 0xF)));
        body.push_back(static_cast<std::uint8_t>((designator.association & 3) << 4 | (designator.type & 0xF)));
        body.push_back(0);
        body.push_back(static_cast<std::uint8_t>(designator.value.size()));
        body.insert(body.end(), designator.value.begin(), designator.value.end());
    }
    return body;
}

ScsiReply vitalProductData(const LogicalUnit& unit, std::uint8_t code)
{
    if (code == pageSupported)
        return page(unit, code, supportedPages(unit));
    if (code == pageSerialNumber && unit.serialNumber)
        return page(unit, code, Bytes(unit.serialNumber->begin(), unit.serialNumber->end()));
    if (code == pageIdentification && !unit.designators.empty())
        return page(unit, code, identification(unit));
    return refuse(invalidFieldInCdb);
}

/// Read Capacity (10): a unit too large for it answers with a last address of all ones.
ScsiReply readCapacity(const LogicalUnit& unit)
{
    if (unit.blocks == 0)
        return refuse(invalidOperationCode);
    Bytes data;
    appendBigEndian32(data, static_cast<std::uint32_t>(std::min<std::uint64_t>(unit.blocks - 1, 0xFFFF'FFFF)));
    appendBigEndian32(data, unit.blockLength);
    return {0, std::move(data), {}};
}

ScsiReply reportLuns(const Target& target)
{
    Bytes data;
    appendBigEndian32(data, static_cast<std::uint32_t>(target.units.size() * 8));
    data.resize(8);
    for (const LogicalUnit& unit : target.units)
    {
        const HBA_UINT64 lun = encodeLun(unit.number);
        const auto* bytes = reinterpret_cast<const std::uint8_t*>(&lun);
        data.insert(data.end(), bytes, bytes + sizeof lun);
    }
    return {0, std::move(data), {}};
}

/// The check condition that waits for this command, used up by one.
const CheckCondition* takeCheckCondition(LogicalUnit& unit, const ScsiCommand& command)
{
    for (CheckCondition& condition : unit.checkConditions)
    {
        const bool operation = condition.operation == ScsiOperation::any || condition.operation == command.operation;
        if (!operation || condition.times == 0 || (condition.page && *condition.page != command.page))
            continue;
        if (condition.times != 0xFFFF'FFFF)
            --condition.times;
        return &condition;
    }
    return nullptr;
}

ScsiReply executeOnUnit(LogicalUnit& unit, const ScsiCommand& command)
{
    if (const CheckCondition* condition = takeCheckCondition(unit, command))
        return checkCondition(condition->key, condition->code, condition->qualifier);
    switch (command.operation)
    {
    case ScsiOperation::inquiry:
        return inquiry(unit);
    case ScsiOperation::vitalProductData:
        return vitalProductData(unit, command.page);
    case ScsiOperation::readCapacity:
        return readCapacity(unit);
    default:
        return refuse(invalidOperationCode);
    }
}

/// Every target answers an Inquiry, also for a unit that it does not have.
ScsiReply executeOnMissingUnit(const ScsiCommand& command)
{
    if (command.operation != ScsiOperation::inquiry)
        return refuse(logicalUnitNotSupported);
    ScsiReply reply = inquiry(LogicalUnit{});
    reply.data[0] = noUnitHere;
    return reply;
}

} // namespace

HBA_UINT64 encodeLun(std::uint32_t number)
{
    const std::uint8_t method = number < 256 ? 0x00 : 0x40;
    const std::uint8_t bytes[8] = {static_cast<std::uint8_t>(method | number >> 8), static_cast<std::uint8_t>(number)};
    HBA_UINT64 field;
    std::memcpy(&field, bytes, sizeof field);
    return field;
}

std::optional<std::uint32_t> decodeLun(HBA_UINT64 field)
{
    std::uint8_t bytes[8];
    std::memcpy(bytes, &field, sizeof bytes);
    const std::uint32_t number = static_cast<std::uint32_t>(bytes[0] & 0x3F) << 8 | bytes[1];
    if (encodeLun(number) != field)
        return std::nullopt;
    return number;
}

ScsiReply execute(Target& target, HBA_UINT64 lun, const ScsiCommand& command)
{
    if (command.operation == ScsiOperation::reportLuns)
        return reportLuns(target);
    const std::optional<std::uint32_t> number = decodeLun(lun);
    const auto unit = std::ranges::lower_bound(target.units, number.value_or(0), {}, &LogicalUnit::number);
    if (!number || unit == target.units.end() || unit->number != *number)
        return executeOnMissingUnit(command);
    return executeOnUnit(*unit, command);
}

} // namespace tvrsim
