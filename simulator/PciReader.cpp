#include "simulator/ScenarioParts.h"

namespace tvrsim
{

namespace
{

struct PciField
{
    const char* key;
    std::uint8_t offset;
    std::uint8_t width; ///< bytes
};

constexpr PciField pciFields[] = {
    {"vendorId", 0, 2},
    {"deviceId", 2, 2},
    {"command", 4, 2},
    {"status", 6, 2},
    {"revision", 8, 1},
    {"progIf", 9, 1},
    {"subClass", 10, 1},
    {"baseClass", 11, 1},
    {"cacheLineSize", 12, 1},
    {"latencyTimer", 13, 1},
    {"headerType", 14, 1},
    {"builtInSelfTest", 15, 1},
    {"baseAddress0", 16, 4},
    {"baseAddress1", 20, 4},
    {"baseAddress2", 24, 4},
    {"baseAddress3", 28, 4},
    {"baseAddress4", 32, 4},
    {"baseAddress5", 36, 4},
    {"cis", 40, 4},
    {"subVendorId", 44, 2},
    {"subsystemId", 46, 2},
    {"expansionRomBaseAddress", 48, 4},
    {"capabilitiesPointer", 52, 1},
    {"interruptLine", 60, 1},
    {"interruptPin", 61, 1},
    {"minimumGrant", 62, 1},
    {"maximumLatency", 63, 1},
};

} // namespace

RM_PciRegisters readPci(JsonNode node)
{
    RM_PciRegisters registers{};
    node.read("type", registers.pciType);
    for (const PciField& field : pciFields)
        if (node.has(field.key))
        {
            const std::uint64_t value = node.at(field.key).asNumber((std::uint64_t{1} << 8 * field.width) - 1);
            for (std::uint8_t byte = 0; byte < field.width; ++byte)
                registers.header[field.offset + byte] = static_cast<std::uint8_t>(value >> 8 * byte);
        }
    std::size_t word = 0;
    node.forEach("area",
                 [&](const JsonNode& item)
                 {
                     if (word == std::size(registers.area))
                         item.failWith("expected at most " + std::to_string(std::size(registers.area)) + " words");
                     registers.area[word++] = static_cast<std::uint32_t>(item.asNumber(UINT32_MAX));
                 });
    node.finish();
    return registers;
}

} // namespace tvrsim
