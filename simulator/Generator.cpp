#include "simulator/Generator.h"

#include <cstdio>

namespace tvrsim
{

namespace
{

/// SplitMix64: the standard library's distributions differ from one implementation to the next.
class Random
{
public:
    explicit Random(std::uint64_t seed) : _state(seed) {}

    std::uint64_t next()
    {
        _state += 0x9E37'79B9'7F4A'7C15;
        std::uint64_t mixed = _state;
        mixed = (mixed ^ mixed >> 30) * 0xBF58'476D'1CE4'E5B9;
        mixed = (mixed ^ mixed >> 27) * 0x94D0'49BB'1331'11EB;
        return mixed ^ mixed >> 31;
    }

    std::uint32_t below(std::uint32_t limit) { return static_cast<std::uint32_t>(next() % limit); }

private:
    std::uint64_t _state;
};

template <class... Args> std::string format(const char* pattern, Args... args)
{
    char text[128];
    std::snprintf(text, sizeof text, pattern, args...);
    return text;
}

// World Wide Names: a format that tells hosts from storage, an invented company, and a number. The seed gives the
// byte above the number, so that hosts of different seeds can share a fabric.
constexpr Wwn portFormat = 0x1000'027A'5200'0000;
constexpr Wwn nodeFormat = 0x2000'027A'5200'0000;
constexpr Wwn targetPortFormat = 0x5063'D200'0000'0000;
constexpr Wwn targetNodeFormat = 0x5063'D210'0000'0000;
constexpr std::uint32_t firstPortId = 0x010000, firstTargetId = 0x020000;

class HostGenerator
{
public:
    HostGenerator(const GeneratorSettings& settings, Scenario& scenario)
        : _settings(settings), _scenario(scenario), _random(settings.seed), _family(_random.next() & 0xFF)
    {}

    void run()
    {
        for (std::uint32_t number = 0; number < _settings.adapters; ++number)
            _scenario.adapters.push_back(adapter(number));
    }

private:
    Wwn name(Wwn format, std::uint32_t number) const { return format | _family << 16 | number; }

    Adapter adapter(std::uint32_t number)
    {
        Adapter out;
        out.name = format("Tavrin-TV3200-G%u", number);
        out.model = "TV3200";
        out.modelDescription = "Tavrin TV3200 16Gb Fibre Channel Adapter";
        out.serialNumber = format("TG%08X", static_cast<std::uint32_t>(_random.next()));
        out.nodeSymbolicName = "Tavrin TV3200 FV12.0.100.0 DV12.0.0.1";
        out.hardwareVersion = "0000000C";
        out.driverVersion = "12.0.0.1";
        out.optionRomVersion = "12.0.90.0";
        out.firmwareVersion = "12.0.100.0";
        out.driverName = "tvrfc";
        out.nodeWwn = name(nodeFormat, number);
        out.vendorSpecificId = 0x7410'1D7A;
        const std::uint32_t temperature = 35 + _random.below(25);
        out.attributes = {
            numberAttribute(RM_HA_DEVICE_ID, 0x7410),
            numberAttribute(RM_HA_MODEL_ID, 3200),
            textAttribute(RM_HA_OPERATIONAL_FIRMWARE, out.firmwareVersion),
            numberAttribute(RM_HA_SLI_MODE, 4),
            numberAttribute(RM_HA_BOARD_TEMPERATURE, temperature | 85u << 8 | 95u << 16),
            numberAttribute(RM_HA_PORT_NUMBER, 0),
            numberAttribute(RM_HA_PCI_BUS_NUMBER, 16 + number),
            numberAttribute(RM_HA_FUNCTION_TYPE, 0),
            numberAttribute(RM_HA_PCI_FUNCTION_NUMBER, 0),
        };
        for (std::uint32_t p = 0; p < _settings.portsPerAdapter; ++p)
            out.ports.push_back(port(out));
        return out;
    }

    Port port(const Adapter& adapter)
    {
        const std::uint32_t number = _ports++;
        Port out;
        out.wwpn = name(portFormat, number);
        out.wwnn = adapter.nodeWwn;
        out.fabricName = name(nodeFormat, 0xFFFF);
        out.fcId = firstPortId + number;
        out.supportedFc4Types[2] = out.activeFc4Types[2] = 0x01; // FCP
        out.symbolicName = format("Tavrin TV3200 port %u", number);
        out.osDeviceName = format("/sys/class/fc_host/host%u", number);
        out.supportedSpeed = 8 | 16 | 32;
        out.speed = 32;
        out.discoveredPorts = _settings.targetsPerPort;
        out.scsiBus = number;
        out.attributes = {numberAttribute(RM_PA_FEC_STATE, 1)};
        out.statistics = {counterAttribute(RM_PS_TX_FRAMES, _random.below(1'000'000)),
                          counterAttribute(RM_PS_RX_FRAMES, _random.below(1'000'000)),
                          counterAttribute(RM_PS_LINK_FAILURES, _random.below(4))};
        out.pci = RM_PciRegisters{};
        out.pci->pciType = 5;
        for (std::uint32_t t = 0; t < _settings.targetsPerPort; ++t)
        {
            out.targets.push_back(_scenario.targets.size());
            _scenario.targets.push_back(target());
        }
        return out;
    }

    Target target()
    {
        const std::uint32_t number = _targets++;
        Target out;
        out.name = format("generated-%u", number);
        out.wwpn = name(targetPortFormat, number);
        out.wwnn = name(targetNodeFormat, number);
        out.fcId = firstTargetId + number;
        for (std::uint32_t u = 0; u < _settings.unitsPerTarget; ++u)
            out.units.push_back(unit(u));
        return out;
    }

    LogicalUnit unit(std::uint32_t number)
    {
        constexpr std::uint8_t disk = 0;
        LogicalUnit out;
        out.number = number;
        if (!_settings.deviceTypes.empty())
            out.deviceType = _settings.deviceTypes[_units++ % _settings.deviceTypes.size()];
        const std::uint64_t identity = _random.next();
        out.product = format("GENERATED %u", unsigned{out.deviceType});
        out.serialNumber = format("%016llX", static_cast<unsigned long long>(identity));
        if (out.deviceType == disk)
            out.blocks = (1 + _random.below(4096)) * std::uint64_t{2048};
        Designator naa; // an eight-byte name of format 5
        const HBA_WWN bytes = toHba((identity >> 4) | 0x5000'0000'0000'0000);
        naa.value.assign(std::begin(bytes.wwn), std::end(bytes.wwn));
        out.designators.push_back(naa);
        return out;
    }

    const GeneratorSettings& _settings;
    Scenario& _scenario;
    Random _random;
    std::uint64_t _family;
    std::uint32_t _ports = 0, _targets = 0, _units = 0;
};

} // namespace

void generate(const GeneratorSettings& settings, Scenario& scenario)
{
    HostGenerator(settings, scenario).run();
}

} // namespace tvrsim
