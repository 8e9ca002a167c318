// The driver of the simulated host through the RM library: its parameters, and the units that it serves with priority.
#include "simulator/SimulatedHost.h"

#include <algorithm>
#include <charconv>

namespace tvrsim
{

namespace
{

/// RM_DriverParam::dynamic of what changes with a load of the driver alone.
constexpr std::uint16_t withTheDriver = 4;

DriverParameter* find(std::vector<DriverParameter>& parameters, std::string_view name)
{
    const auto place =
        std::ranges::find_if(parameters, [&](const DriverParameter& known) { return known.running.name == name; });
    return place == parameters.end() ? nullptr : &*place;
}

void running(const std::vector<DriverParameter>& parameters, std::vector<RM_DriverParam>& out)
{
    for (const DriverParameter& parameter : parameters)
        out.push_back(parameter.running);
}

/// Decimal, or hexadecimal behind "0x".
std::optional<std::uint32_t> numberOf(std::string_view text)
{
    const bool isHexadecimal = text.starts_with("0x");
    text.remove_prefix(isHexadecimal ? 2 : 0);
    std::uint32_t number = 0;
    const auto read = std::from_chars(text.data(), text.data() + text.size(), number, isHexadecimal ? 16 : 10);
    if (read.ec != std::errc() || read.ptr != text.data() + text.size())
        return std::nullopt;
    return number;
}

bool isInRange(const DriverParameter& parameter, std::uint32_t value)
{
    return value >= parameter.running.lowRange && value <= parameter.running.highRange;
}

/// `fields` are those of the record that get the value.
void change(DriverParameter& parameter, std::uint32_t value, bool permanent,
            std::initializer_list<std::uint32_t RM_DriverParam::*> fields)
{
    for (const auto field : fields)
    {
        if (parameter.running.dynamic != withTheDriver)
            parameter.running.*field = value;
        if (permanent)
            parameter.stored.*field = value;
    }
}

} // namespace

// --- parameters ----------------------------------------------------------------------------------------------

RM_STATUS SimulatedHost::driverParameters(Wwn wwpn, std::vector<RM_DriverParam>& out) const
{
    std::lock_guard lock(_mutex);
    const Adapter* adapter = findAdapter(wwpn);
    if (!adapter)
        return RM_ERROR_INVALID_WWN;
    running(adapter->driverParameters, out);
    return RM_OK;
}

RM_STATUS SimulatedHost::globalDriverParameters(std::vector<RM_DriverParam>& out) const
{
    std::lock_guard lock(_mutex);
    running(_scenario.driverParameters, out);
    return RM_OK;
}

RM_STATUS SimulatedHost::setDriverParameter(Wwn wwpn, std::string_view text, std::uint32_t control)
{
    std::lock_guard lock(_mutex);
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return RM_ERROR_INVALID_WWN;
    const std::size_t equals = text.find('=');
    const std::string_view name = text.substr(0, equals);
    const auto value = equals == text.npos ? std::nullopt : numberOf(text.substr(equals + 1));
    DriverParameter* parameter = find(_scenario.adapters[place->second.adapter].driverParameters, name);
    if (!value || !parameter || !isInRange(*parameter, *value) || control > (RM_PARAM_PERMANENT | RM_PARAM_GLOBAL))
        return RM_ERROR;
    const bool permanent = control & RM_PARAM_PERMANENT;
    change(*parameter, *value, permanent, {&RM_DriverParam::current});
    if (!(control & RM_PARAM_GLOBAL))
        return RM_OK;
    for (Adapter& adapter : _scenario.adapters)
        if (DriverParameter* same = find(adapter.driverParameters, name))
            change(*same, *value, permanent, {&RM_DriverParam::current});
    if (DriverParameter* global = find(_scenario.driverParameters, name))
        change(*global, *value, permanent, {&RM_DriverParam::def, &RM_DriverParam::current});
    return RM_OK;
}

bool SimulatedHost::setDriverParameter(std::optional<Wwn> wwpn, const std::string& name, std::uint32_t current)
{
    std::lock_guard lock(_mutex);
    const auto place = wwpn ? _portByName.find(*wwpn) : _portByName.end();
    if (wwpn && place == _portByName.end())
        return false;
    DriverParameter* parameter =
        find(wwpn ? _scenario.adapters[place->second.adapter].driverParameters : _scenario.driverParameters, name);
    if (parameter)
        parameter->running.current = current;
    return parameter != nullptr;
}

// --- priority lanes --------------------------------------------------------------------------------------------

struct SimulatedHost::LaneTable
{
    RM_STATUS status = RM_OK;
    std::vector<PriorityLane>* lanes = nullptr;
    std::size_t target = 0;
};

SimulatedHost::LaneTable SimulatedHost::lanesTo(Wwn wwpn, Wwn vport, Wwn target)
{
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return {RM_ERROR_INVALID_WWN};
    Port& port = _scenario.adapters[place->second.adapter].ports[place->second.port];
    if (!port.priorityLanes)
        return {RM_ERROR_NOT_SUPPORTED};
    const auto from = [&](auto& owner, std::vector<PriorityLane>& lanes) -> LaneTable
    {
        const std::optional<std::size_t> reached = reach(owner.state, owner.targets, target);
        return reached ? LaneTable{RM_OK, &lanes, *reached} : LaneTable{RM_ERROR_INVALID_WWN};
    };
    if (vport == 0)
        return from(port, *port.priorityLanes);
    const auto own = std::ranges::find(port.virtualPorts, vport, &VirtualPort::wwpn);
    return own == port.virtualPorts.end() ? LaneTable{RM_ERROR_INVALID_WWN} : from(*own, own->priorityLanes);
}

RM_STATUS SimulatedHost::priorityLanes(Wwn wwpn, Wwn vport, Wwn target, std::uint32_t option,
                                       std::vector<RM_OASLun>& out)
{
    std::lock_guard lock(_mutex);
    const LaneTable table = lanesTo(wwpn, vport, target);
    if (table.status != RM_OK || option > RM_LANE_CONFIG)
        return table.status != RM_OK ? table.status : RM_ERROR;
    for (const PriorityLane& lane : *table.lanes)
        if (lane.target == table.target)
            out.push_back({encodeLun(lane.lun), lane.lun, lane.states[option]});
    return RM_OK;
}

RM_STATUS SimulatedHost::setPriorityLane(Wwn wwpn, Wwn vport, Wwn target, std::int32_t lun, std::uint32_t state,
                                         std::uint32_t option)
{
    constexpr std::int32_t allUnits = -1;
    std::lock_guard lock(_mutex);
    const LaneTable table = lanesTo(wwpn, vport, target);
    if (table.status != RM_OK)
        return table.status;
    if (state > 1 || option > RM_LANE_CONFIG)
        return RM_ERROR;
    bool found = lun == allUnits;
    for (const LogicalUnit& unit : _scenario.targets[table.target].units)
    {
        if (lun != allUnits && unit.number != static_cast<std::uint32_t>(lun))
            continue;
        found = true;
        auto lane = std::ranges::find_if(*table.lanes, [&](const PriorityLane& known)
                                         { return known.target == table.target && known.lun == unit.number; });
        if (lane == table.lanes->end())
            lane = table.lanes->insert(lane, PriorityLane{table.target, unit.number, {0, 0}});
        lane->states[option] = state;
    }
    return found ? RM_OK : RM_ERROR;
}

// --- the driver --------------------------------------------------------------------------------------------------

void SimulatedHost::loadDriver()
{
    const auto loadLanes = [](std::vector<PriorityLane>& lanes)
    {
        for (PriorityLane& lane : lanes)
            lane.states[RM_LANE_DRIVER] = lane.states[RM_LANE_CONFIG];
    };
    const auto loadParameters = [](std::vector<DriverParameter>& parameters)
    {
        for (DriverParameter& parameter : parameters)
            parameter.running = parameter.stored;
    };
    loadParameters(_scenario.driverParameters);
    for (Adapter& adapter : _scenario.adapters)
    {
        loadParameters(adapter.driverParameters);
        for (Port& port : adapter.ports)
        {
            if (port.priorityLanes)
                loadLanes(*port.priorityLanes);
            for (VirtualPort& vport : port.virtualPorts)
                loadLanes(vport.priorityLanes);
        }
    }
}

} // namespace tvrsim
