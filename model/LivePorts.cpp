// State and counters of the ports as they are now. Where a port cannot be asked, its instance stays as it was; the log
// says why.
#include "agent/Build.h"
#include "device/Data.h"
#include "device/FCPort.h"
#include "model/LiveRefresh.h"
#include "model/PortFacts.h"

namespace cimple
{

namespace
{

/// Brings the selected instances of ports up to date by `update(instance, port)`; `instanceOf(wwpn)` finds that of a
/// port, or none. A get asks the one port, and names change with a refresh alone.
template <class InstanceOf, class Update>
void updatePorts(ProviderAgent& agent, const Selection& selection, InstanceOf instanceOf, Update update)
{
    if (!agent.m_pData || selection.names)
        return;
    for (Port* port : agent.m_pData->ports)
        if (auto* fcPort = dynamic_cast<FCPort*>(port))
            if (auto* instance = instanceOf(String(port->name)))
                if (!selection.keys || key_eq(selection.keys, instance))
                    update(*instance, *fcPort);
}

std::unique_ptr<FCPortAttributes> askPort(const FCPort& port)
{
    try
    {
        return std::make_unique<FCPortAttributes>(port.getAdapter()->getName(), port.portIndex);
    }
    catch (const std::exception&)
    {
        note_missing_memory();
        return nullptr;
    }
}

} // namespace

template <> void liveRefresh<TVRHBA_FCPort>(ProviderAgent& agent, const Selection& selection)
{
    const auto map = mapOf<TVRHBA_FCPort>(agent);
    updatePorts(
        agent, selection,
        [&](const String& wwpn)
        { return map.findFirst([&](const auto& known) { return known.DeviceID.value == wwpn; }); },
        [](TVRHBA_FCPort& instance, const FCPort& port)
        {
            // An adapter that was replaced since the refresh answers for another port.
            if (const auto facts = askPort(port); facts && facts->portWWN == port.name)
                setPortFacts(instance, *facts);
            setBeacon(instance);
        });
}

template <> void liveRefresh<TVRHBA_FCPortStatistics>(ProviderAgent& agent, const Selection& selection)
{
    const auto map = mapOf<TVRHBA_FCPortStatistics>(agent);
    updatePorts(
        agent, selection,
        [&](const String& wwpn)
        { return map.findFirst([&](const auto& known) { return known.ElementName.value == wwpn; }); },
        [](TVRHBA_FCPortStatistics& instance, FCPort& port)
        {
            if (port.updateStatistics())
                setCounters(instance, *port.getStatistics());
        });
}

} // namespace cimple
