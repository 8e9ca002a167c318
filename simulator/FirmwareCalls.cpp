// Firmware, resets and the state of ports of the simulated host.
#include "simulator/FirmwareFile.h"
#include "simulator/SimulatedHost.h"

#include <algorithm>
#include <charconv>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace tvrsim
{

namespace
{

/// Takes a line off the text; nothing if it does not begin with `name`.
std::optional<std::string> takeLine(std::string_view& text, std::string_view name)
{
    const std::size_t end = text.find('\n');
    if (end == text.npos || !text.starts_with(name))
        return std::nullopt;
    const std::string value(text.substr(name.size(), end - name.size()));
    text.remove_prefix(end + 1);
    return value;
}

/// Of a regular file: a pipe would block.
std::optional<std::string> readFile(const char* path)
{
    std::error_code none;
    if (!std::filesystem::is_regular_file(path, none))
        return std::nullopt;
    std::ifstream file(path, std::ios::binary);
    if (!file)
        return std::nullopt;
    std::ostringstream text;
    text << file.rdbuf();
    return text.str();
}

Attribute* find(AttributeList& list, std::uint32_t id)
{
    const auto place = std::ranges::find(list, id, &Attribute::id);
    return place == list.end() ? nullptr : &*place;
}

void writeFirmware(Adapter& adapter, const std::string& version)
{
    setAttribute(adapter.attributes, textAttribute(RM_HA_FIRMWARE_ON_FLASH, version));
    for (Port& port : adapter.ports)
        for (RM_FlashRegion& region : port.flash)
            if (region.isWakeup)
                setText(region.version, version);
}

void disable(Port& port)
{
    if (port.beforeDisabling)
        return;
    LinkState& before = port.beforeDisabling.emplace();
    before.state = port.state;
    if (const Attribute* link = find(port.attributes, RM_PA_LINK_STATE))
        before.link = *link;
    port.state = HBA_PORTSTATE_OFFLINE;
    setAttribute(port.attributes, numberAttribute(RM_PA_LINK_STATE, RM_LINK_DISABLED));
}

void enable(Port& port)
{
    if (!port.beforeDisabling)
        return;
    port.state = port.beforeDisabling->state;
    std::erase_if(port.attributes, [](const Attribute& attribute) { return attribute.id == RM_PA_LINK_STATE; });
    if (port.beforeDisabling->link)
        setAttribute(port.attributes, *port.beforeDisabling->link);
    port.beforeDisabling.reset();
}

} // namespace

std::optional<FirmwareFile> readFirmware(std::string_view text)
{
    if (takeLine(text, "TVRSIM-FIRMWARE 1") != "")
        return std::nullopt;
    const auto family = takeLine(text, "family: ");
    const auto version = takeLine(text, "version: ");
    const auto checksum = takeLine(text, "checksum: ");
    if (!family || !version || version->size() > 31 || !checksum || takeLine(text, "") != "")
        return std::nullopt;
    std::uint32_t expected = 0;
    const auto [end, error] = std::from_chars(checksum->data(), checksum->data() + checksum->size(), expected, 16);
    return FirmwareFile{*family, *version,
                        error == std::errc() && end == checksum->data() + checksum->size() && crc32(text) == expected};
}

RM_STATUS SimulatedHost::importFile(const char* path)
{
    const std::optional<std::string> text = path ? readFile(path) : std::nullopt;
    if (!text)
        return RM_ERROR;
    const std::optional<FirmwareFile> file = readFirmware(*text);
    if (!file)
        return notFirmware;
    std::lock_guard lock(_mutex);
    _imported[path] = *file;
    return RM_OK;
}

template <class Use> RM_STATUS SimulatedHost::withImported(Wwn wwpn, const char* path, Use use)
{
    return changePort(wwpn,
                      [&](Adapter& adapter, Port&) -> RM_STATUS
                      {
                          const auto file = path ? _imported.find(path) : _imported.end();
                          return file == _imported.end() ? RM_ERROR : use(adapter, file->second);
                      });
}

RM_STATUS SimulatedHost::verifyFirmware(Wwn wwpn, const char* path)
{
    return withImported(wwpn, path,
                        [](const Adapter& adapter, const FirmwareFile& file) -> RM_STATUS
                        {
                            const std::string& own =
                                adapter.firmwareFamily.empty() ? adapter.model : adapter.firmwareFamily;
                            if (file.family != own)
                                return firmwareOfAnother;
                            return file.isWhole ? RM_STATUS{RM_OK} : RM_STATUS{firmwareDamaged};
                        });
}

RM_STATUS SimulatedHost::downloadFirmware(Wwn wwpn, const char* path)
{
    return withImported(wwpn, path,
                        [](Adapter& adapter, const FirmwareFile& file) -> RM_STATUS
                        {
                            writeFirmware(adapter, file.version);
                            return RM_OK;
                        });
}

void SimulatedHost::activateFirmware(Adapter& adapter)
{
    const Attribute* onFlash = find(adapter.attributes, RM_HA_FIRMWARE_ON_FLASH);
    if (!onFlash)
        return;
    adapter.firmwareVersion = onFlash->value;
    setAttribute(adapter.attributes, textAttribute(RM_HA_OPERATIONAL_FIRMWARE, adapter.firmwareVersion));
}

RM_STATUS SimulatedHost::resetAdapter(Wwn wwpn)
{
    return changePort(wwpn,
                      [&](Adapter& adapter, Port&)
                      {
                          cancelTests(adapter);
                          activateFirmware(adapter);
                          activateNames(adapter, false);
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::setPortEnabled(Wwn wwpn, std::uint32_t enabled, std::uint32_t& dynamic)
{
    return changePort(wwpn,
                      [&](Adapter&, Port& port)
                      {
                          if (enabled > 1)
                              return RM_ERROR;
                          enabled ? enable(port) : disable(port);
                          dynamic = 1;
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::setPortAttribute(Wwn wwpn, std::uint32_t id, const void* value, std::uint32_t length)
{
    return changePort(wwpn,
                      [&](Adapter&, Port& port)
                      {
                          constexpr std::uint32_t on = 1, withoutCorrection = 2;
                          std::uint32_t number = 0;
                          const Attribute* now = find(port.attributes, id);
                          if (id != RM_PA_FEC_STATE || !now ||
                              now->value == numberAttribute(id, withoutCorrection).value)
                              return RM_ERROR_NOT_SUPPORTED;
                          if (!value || length != sizeof number)
                              return RM_ERROR;
                          std::memcpy(&number, value, length);
                          if (number > on)
                              return RM_ERROR;
                          setAttribute(port.attributes, numberAttribute(id, number));
                          return RM_OK;
                      });
}

} // namespace tvrsim
