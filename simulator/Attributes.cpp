#include "simulator/Attributes.h"

#include <algorithm>
#include <cstring>

namespace tvrsim
{

namespace
{

// A buffer is a header and then one record after the other, each on a boundary of four bytes.
struct Header
{
    std::uint32_t magic;
    std::uint32_t used; ///< bytes of the buffer in use, the header included
};

struct RecordHead
{
    std::uint32_t id;
    std::uint32_t length; ///< bytes of the value, which follows
};

constexpr std::uint32_t magicNumber = 0x4154'5652;
constexpr std::size_t maximumBuffer = 65536;

/// Shortest text without an end: long enough to run through any field that is too small for it.
constexpr std::size_t unterminatedLength = 96;

template <class Value> std::string bytesOf(const Value& value)
{
    return std::string(reinterpret_cast<const char*>(&value), sizeof value);
}

std::uint64_t counterOf(const Attribute& attribute)
{
    std::uint64_t value = 0;
    attribute.value.copy(reinterpret_cast<char*>(&value), sizeof value);
    return value;
}

constexpr std::size_t padded(std::size_t length)
{
    return (length + 3) & ~std::size_t{3};
}

void append(std::vector<std::byte>& out, const void* data, std::size_t length)
{
    const auto* bytes = static_cast<const std::byte*>(data);
    out.insert(out.end(), bytes, bytes + length);
    out.resize(padded(out.size()));
}

using enum AttributeForm;

constexpr AttributeRow adapterRows[] = {
    {"nodeSymbolicName", RM_HA_NODE_SYMBOLIC_NAME, text},
    {"optionRomVersion", RM_HA_OPTION_ROM_VERSION, text},
    {"deviceId", RM_HA_DEVICE_ID, number},
    {"modelId", RM_HA_MODEL_ID, number},
    {"operationalFirmware", RM_HA_OPERATIONAL_FIRMWARE, text},
    {"sli1FirmwareName", RM_HA_SLI1_FIRMWARE_NAME, text},
    {"sli2FirmwareName", RM_HA_SLI2_FIRMWARE_NAME, text},
    {"ieeeAddress", RM_HA_IEEE_ADDRESS, bytes},
    {"bootCodeEnabled", RM_HA_BOOT_CODE_ENABLED, number},
    {"bootBiosVersion", RM_HA_BOOT_BIOS_VERSION, text},
    {"diagVersion", RM_HA_DIAG_VERSION, number},
    {"initialFirmware", RM_HA_INITIAL_FIRMWARE, text},
    {"kernelVersion", RM_HA_KERNEL_VERSION, text},
    {"sli3FirmwareName", RM_HA_SLI3_FIRMWARE_NAME, text},
    {"sliMode", RM_HA_SLI_MODE, number},
    {"boardTemperature", RM_HA_BOARD_TEMPERATURE, number},
    {"portNumber", RM_HA_PORT_NUMBER, number},
    {"pciBusNumber", RM_HA_PCI_BUS_NUMBER, number},
    {"functionType", RM_HA_FUNCTION_TYPE, number},
    {"pciFunctionNumber", RM_HA_PCI_FUNCTION_NUMBER, number},
    {"spFirmwareVersion", RM_HA_SP_FIRMWARE_VERSION, text},
    {"spFirmwareName", RM_HA_SP_FIRMWARE_NAME, text},
    {"ulpFirmwareVersion", RM_HA_ULP_FIRMWARE_VERSION, text},
    {"ulpFirmwareName", RM_HA_ULP_FIRMWARE_NAME, text},
    {"subadapterId", RM_HA_SUBADAPTER_ID, text},
    {"fcUniversalVersion", RM_HA_FC_UNIVERSAL_VERSION, text},
    {"fcX86BiosVersion", RM_HA_FC_X86_BIOS_VERSION, text},
    {"fcEfiVersion", RM_HA_FC_EFI_VERSION, text},
    {"fcFcodeVersion", RM_HA_FC_FCODE_VERSION, text},
    {"firmwareOnFlash", RM_HA_FIRMWARE_ON_FLASH, text},
};

constexpr AttributeRow portRows[] = {
    {"portType", RM_PA_PORT_TYPE, number},    {"linkState", RM_PA_LINK_STATE, number},
    {"fabricName", RM_PA_FABRIC_NAME, bytes}, {"portState", RM_PA_PORT_STATE, number},
    {"fecState", RM_PA_FEC_STATE, number},
};

constexpr AttributeRow counterRows[] = {
    {"secondsSinceLastReset", RM_PS_SECONDS_SINCE_LAST_RESET, counter},
    {"txBytes", RM_PS_TX_BYTES, counter},
    {"rxBytes", RM_PS_RX_BYTES, counter},
    {"txSequences", RM_PS_TX_SEQUENCES, counter},
    {"rxSequences", RM_PS_RX_SEQUENCES, counter},
    {"txFrames", RM_PS_TX_FRAMES, counter},
    {"rxFrames", RM_PS_RX_FRAMES, counter},
    {"txWords", RM_PS_TX_WORDS, counter},
    {"rxWords", RM_PS_RX_WORDS, counter},
    {"lipCount", RM_PS_LIP_COUNT, counter},
    {"nosCount", RM_PS_NOS_COUNT, counter},
    {"errorFrames", RM_PS_ERROR_FRAMES, counter},
    {"dumpedFrames", RM_PS_DUMPED_FRAMES, counter},
    {"linkFailures", RM_PS_LINK_FAILURES, counter},
    {"lossOfSync", RM_PS_LOSS_OF_SYNC, counter},
    {"lossOfSignal", RM_PS_LOSS_OF_SIGNAL, counter},
    {"primitiveSequenceErrors", RM_PS_PRIMITIVE_SEQUENCE_ERRORS, counter},
    {"invalidTxWords", RM_PS_INVALID_TX_WORDS, counter},
    {"invalidCrcs", RM_PS_INVALID_CRCS, counter},
    {"addressErrors", RM_PS_ADDRESS_ERRORS, counter},
    {"portBusyFrames", RM_PS_PORT_BUSY_FRAMES, counter},
    {"fabricBusyFrames", RM_PS_FABRIC_BUSY_FRAMES, counter},
    {"linkResetsReceived", RM_PS_LINK_RESETS_RECEIVED, counter},
    {"linkResetsTransmitted", RM_PS_LINK_RESETS_TRANSMITTED, counter},
    {"delimiterErrors", RM_PS_DELIMITER_ERRORS, counter},
};

constexpr AttributeRow serverRows[] = {
    {"operatingSystem", RM_SA_OPERATING_SYSTEM, text},
};

} // namespace

const std::span<const AttributeRow> adapterAttributeRows = adapterRows;
const std::span<const AttributeRow> portAttributeRows = portRows;
const std::span<const AttributeRow> statisticsRows = counterRows;
const std::span<const AttributeRow> serverAttributeRows = serverRows;

Attribute numberAttribute(std::uint32_t id, std::uint32_t value)
{
    return {id, number, bytesOf(value)};
}

Attribute counterAttribute(std::uint32_t id, std::uint64_t value)
{
    return {id, counter, bytesOf(value)};
}

Attribute textAttribute(std::uint32_t id, std::string_view value)
{
    return {id, text, std::string(value)};
}

void setAttribute(AttributeList& list, Attribute attribute)
{
    const auto place = std::ranges::find(list, attribute.id, &Attribute::id);
    if (place != list.end())
        *place = std::move(attribute);
    else
        list.push_back(std::move(attribute));
}

void growCounters(AttributeList& list, const AttributeList& growth)
{
    constexpr std::uint64_t notCounted = ~0ULL;
    for (const Attribute& more : growth)
    {
        const auto place = std::ranges::find(list, more.id, &Attribute::id);
        if (place == list.end() || place->form != counter || more.form != counter)
            continue;
        if (const std::uint64_t value = counterOf(*place); value != notCounted)
            *place = counterAttribute(more.id, value + counterOf(more));
    }
}

std::vector<std::byte> encodeAttributes(const AttributeList& list, bool terminated)
{
    std::vector<std::byte> out(sizeof(Header));
    for (const Attribute& attribute : list)
    {
        if (attribute.form == absent)
            continue;
        std::string value = attribute.value;
        if (attribute.form == text && terminated)
            value += '\0';
        else if (attribute.form == text)
            value.resize(padded(std::max(value.size(), unterminatedLength)), 'X');
        const RecordHead head{attribute.id, static_cast<std::uint32_t>(value.size())};
        append(out, &head, sizeof head);
        append(out, value.data(), value.size());
    }
    const Header header{magicNumber, static_cast<std::uint32_t>(out.size())};
    std::memcpy(out.data(), &header, sizeof header);
    return out;
}

std::span<const std::byte> findAttribute(std::span<const std::byte> buffer, std::uint32_t id)
{
    std::size_t place = sizeof(Header);
    while (place + sizeof(RecordHead) <= buffer.size())
    {
        RecordHead head;
        std::memcpy(&head, buffer.data() + place, sizeof head);
        place += sizeof head;
        if (head.length > buffer.size() - place)
            return {};
        if (head.id == id)
            return buffer.subspan(place, head.length);
        place += padded(head.length);
    }
    return {};
}

void markCut(std::span<std::byte> buffer)
{
    const auto used = static_cast<std::uint32_t>(buffer.size());
    if (used >= sizeof(Header))
        std::memcpy(buffer.data() + offsetof(Header, used), &used, sizeof used);
}

std::size_t usedBytes(const void* buffer)
{
    Header header;
    std::memcpy(&header, buffer, sizeof header);
    if (header.magic != magicNumber || header.used > maximumBuffer)
        return 0;
    return header.used;
}

} // namespace tvrsim
