#include "simulator/SimulatedHost.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

/// Numbers the devices of the host as an operating system does: disks by letters, tapes and the rest by digits.
class DeviceNames
{
public:
    std::string next(std::uint8_t deviceType)
    {
        constexpr std::uint8_t disk = 0, tape = 1, opticalDisc = 5;
        switch (deviceType)
        {
        case disk:
            return "/dev/sd" + letters(_disks++);
        case tape:
            return "/dev/st" + std::to_string(_tapes++);
        case opticalDisc:
            return "/dev/sr" + std::to_string(_discs++);
        default:
            return "/dev/sg" + std::to_string(_others++);
        }
    }

private:
    /// a to z, aa to zz, and so on.
    static std::string letters(std::size_t number)
    {
        std::string text;
        for (std::size_t rest = number + 1; rest > 0; rest = (rest - 1) / 26)
            text.insert(text.begin(), static_cast<char>('a' + (rest - 1) % 26));
        return text;
    }

    std::size_t _disks = 0, _tapes = 0, _discs = 0, _others = 0;
};

} // namespace

void SimulatedHost::load(Scenario scenario)
{
    std::lock_guard lock(_mutex);
    _scenario = std::move(scenario);
    _imported.clear();
    _tests.clear();
    _lastTest = 0;
    index();

    _osDeviceNames.clear();
    DeviceNames names;
    for (const Adapter& adapter : _scenario.adapters)
        for (const Port& port : adapter.ports)
            for (std::size_t target : port.targets)
            {
                std::vector<std::string>& units = _osDeviceNames[port.wwpn].emplace_back();
                for (const LogicalUnit& unit : _scenario.targets[target].units)
                    units.push_back(names.next(unit.deviceType));
            }
    completeNames();
    for (Adapter& adapter : _scenario.adapters)
        for (Port& port : adapter.ports)
            usePlug(port);
}

void SimulatedHost::index()
{
    _adapterByName.clear();
    _portByName.clear();
    _targetByName.clear();
    for (std::size_t a = 0; a < _scenario.adapters.size(); ++a)
    {
        const Adapter& adapter = _scenario.adapters[a];
        _adapterByName.emplace(adapter.name, a);
        for (std::size_t p = 0; p < adapter.ports.size(); ++p)
            _portByName.emplace(adapter.ports[p].wwpn, PortPlace{a, p});
    }
    for (std::size_t t = 0; t < _scenario.targets.size(); ++t)
        _targetByName.emplace(_scenario.targets[t].wwpn, t);
}

const Adapter* SimulatedHost::adapterAt(HBA_HANDLE handle) const
{
    const auto open = _handles.find(handle);
    if (open == _handles.end())
        return nullptr;
    const auto place = _adapterByName.find(open->second);
    return place == _adapterByName.end() ? nullptr : &_scenario.adapters[place->second];
}

const Adapter* SimulatedHost::findAdapter(Wwn wwpn) const
{
    const auto place = _portByName.find(wwpn);
    return place == _portByName.end() ? nullptr : &_scenario.adapters[place->second.adapter];
}

const Port* SimulatedHost::findPort(Wwn wwpn) const
{
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return nullptr;
    return &_scenario.adapters[place->second.adapter].ports[place->second.port];
}

std::optional<std::size_t> SimulatedHost::reach(std::uint32_t state, const std::vector<std::size_t>& targets,
                                                Wwn wwpn) const
{
    const auto place = _targetByName.find(wwpn);
    if (state != HBA_PORTSTATE_ONLINE || place == _targetByName.end() ||
        std::ranges::find(targets, place->second) == targets.end())
        return std::nullopt;
    return place->second;
}

std::size_t SimulatedHost::openHandles() const
{
    std::lock_guard lock(_mutex);
    return _handles.size() + _tagHandles.size();
}

std::string SimulatedHost::adapterOf(HBA_HANDLE handle) const
{
    std::lock_guard lock(_mutex);
    const auto open = _handles.find(handle);
    return open == _handles.end() ? std::string() : open->second;
}

bool SimulatedHost::removeAdapter(const std::string& name)
{
    std::lock_guard lock(_mutex);
    const auto place = _adapterByName.find(name);
    if (place == _adapterByName.end())
        return false;
    _scenario.adapters.erase(_scenario.adapters.begin() + static_cast<std::ptrdiff_t>(place->second));
    index();
    return true;
}

bool SimulatedHost::makeStale(const std::string& name)
{
    std::lock_guard lock(_mutex);
    const auto place = _adapterByName.find(name);
    if (place == _adapterByName.end())
        return false;
    _scenario.adapters[place->second].stale = true;
    return true;
}

void SimulatedHost::remember()
{
    std::lock_guard lock(_mutex);
    _remembered = _scenario;
}

std::string SimulatedHost::difference() const
{
    std::lock_guard lock(_mutex);
    if (_scenario == _remembered)
        return {};
    if (_scenario.adapters.size() != _remembered.adapters.size())
        return "number of adapters";
    for (std::size_t i = 0; i < _scenario.adapters.size(); i++)
    {
        const Adapter& adapter = _scenario.adapters[i];
        const Adapter& former = _remembered.adapters[i];
        for (std::size_t j = 0; j < std::min(adapter.ports.size(), former.ports.size()); j++)
            if (adapter.ports[j] != former.ports[j])
                return "port " + wwnText(former.ports[j].wwpn);
        if (adapter != former)
            return "adapter " + former.name;
    }
    return "host";
}

bool SimulatedHost::setPortState(Wwn wwpn, std::uint32_t state)
{
    std::lock_guard lock(_mutex);
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return false;
    _scenario.adapters[place->second.adapter].ports[place->second.port].state = state;
    return true;
}

bool SimulatedHost::setAttributeOf(Wwn wwpn, const Attribute& attribute)
{
    // The numbers of a kind share their digits above the lowest eight bits.
    constexpr std::uint32_t adapterKind = 0x200, portKind = 0x300, statisticsKind = 0x400;

    std::lock_guard lock(_mutex);
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return false;
    Adapter& adapter = _scenario.adapters[place->second.adapter];
    Port& port = adapter.ports[place->second.port];
    switch (attribute.id & ~0xFFu)
    {
    case adapterKind:
        setAttribute(adapter.attributes, attribute);
        return true;
    case portKind:
        setAttribute(port.attributes, attribute);
        return true;
    case statisticsKind:
        setAttribute(port.statistics, attribute);
        return true;
    default:
        return false;
    }
}

} // namespace tvrsim
