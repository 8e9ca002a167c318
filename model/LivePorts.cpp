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

/// Brings the instance of each port up to date by `update(instance, port)`; `instanceOf(wwpn)` finds it, or not.
template <class InstanceOf, class Update> void updatePorts(ProviderAgent& agent, InstanceOf instanceOf, Update update)
{
    if (!agent.m_pData)
        return;
    for (Port* port : agent.m_pData->ports)
        if (auto* fcPort = dynamic_cast<FCPort*>(port))
            if (auto* instance = instanceOf(String(port->name)))
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

template <> void liveRefresh<TVRHBA_FCPort>(ProviderAgent& agent)
{
    const auto map = mapOf<TVRHBA_FCPort>(agent);
    updatePorts(
        agent,
        [&](const String& wwpn)
        { return map.findFirst([&](const auto& known) { return known.DeviceID.value == wwpn; }); },
        [](TVRHBA_FCPort& instance, const FCPort& port)
        {
            if (const auto facts = askPort(port))
                setPortFacts(instance, *facts);
            setBeacon(instance);
        });
}

template <> void liveRefresh<TVRHBA_FCPortStatistics>(ProviderAgent& agent)
{
    const auto map = mapOf<TVRHBA_FCPortStatistics>(agent);
    updatePorts(
        agent,
        [&](const String& wwpn)
        { return map.findFirst([&](const auto& known) { return known.ElementName.value == wwpn; }); },
        [](TVRHBA_FCPortStatistics& instance, FCPort& port)
        {
            if (port.updateStatistics())
                setCounters(instance, *port.getStatistics());
        });
}

} // namespace cimple
