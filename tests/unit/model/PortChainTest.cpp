// A port whose keys are there already: each insert of its steps, refused.
#include "agent/RefreshSteps.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"
#include "device/Loader.h"
#include "model/ComputerSystem.h"
#include "model/PhysicalModel.h"
#include "model/PortModel.h"
#include "model/Profiles.h"
#include "tests/module/HostNames.h"
#include "tests/unit/device/FakeHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <optional>

using namespace cimple;

namespace
{

class PortChain : public testing::Test
{
protected:
    PortChain() : agent(*ProviderAgent::instance())
    {
        ProviderAgent::addRef();
        module_test::setHostNames({});
        loadAllLibraries();
        FakeAdapter& adapter = fake.addAdapter(1);
        std::strcpy(adapter.hba.Model, "M1");
        fake.flash.count = 2;
        data.buildAdapterData();
        log.emplace();
    }
    ~PortChain() override
    {
        log.reset();
        ProviderAgent::releaseRef();
    }

    /// Runs the steps of the only port from empty maps.
    void build()
    {
        agent.clearAdapterMaps();
        host.emplace(agent, refreshSteps);
        createComputerSystem(*host);
        createProfiles(*host);
        on.emplace(*host, 0, static_cast<FCAdapter&>(*data.adapters.at(0)));
        for (const AdapterStep& step : refreshSteps.adapter)
            ASSERT_EQ(step.run(*on), BUILD_DONE);
        port.emplace(PortContext{*host, *on, 0, static_cast<FCPort&>(*on->adapter.getPort(0))});
        for (const PortStep& step : refreshSteps.port)
            if (step.run)
            {
                ASSERT_EQ(step.run(*port), BUILD_DONE);
            }
        log->lines.clear();
    }

    FakeHost fake;
    ProviderAgent& agent;
    Data data;
    std::optional<HostContext> host;
    std::optional<AdapterContext> on;
    std::optional<PortContext> port;
    std::optional<LogCapture> log;
};

using Map = Instance_Map InstanceCache::*;

struct Row
{
    std::uint32_t (*step)(PortContext&);
    std::vector<Map> emptied; ///< so that the step gets as far as the line
    const char* line;
    std::uint32_t status;
};

constexpr std::uint32_t ends = BUILD_NO_INSTANCE;

const Row rows[] = {
    {createFCPort, {}, "1 Insert Failed : m_TVRHBA_FCPort_map", ends},
    {createFCPort,
     {&InstanceCache::m_TVRHBA_FCPort_map, &InstanceCache::m_TVRHBA_FCPortSystemDevice_map,
      &InstanceCache::m_TVRHBA_MemberOfCollection_map, &InstanceCache::m_TVRHBA_FCRealizes_map},
     "1 Insert Failed : m_TVRHBA_FCPortConformsToProfile_map",
     BUILD_DONE},
    {createFCPort, {&InstanceCache::m_TVRHBA_FCPort_map}, "1 Insert Failed : m_TVRHBA_FCPortSystemDevice_map", ends},
    {createFCPort,
     {&InstanceCache::m_TVRHBA_FCPort_map, &InstanceCache::m_TVRHBA_FCPortSystemDevice_map},
     "1 Insert Failed : m_TVRHBA_MemberOfCollection_map",
     ends},
    {createFCPortStatistics, {}, "1 Insert Failed : m_TVRHBA_FCPortStatistics_map", ends},
    {createFCPortStatistics,
     {&InstanceCache::m_TVRHBA_FCPortStatistics_map},
     "1 Insert Failed : m_TVRHBA_ElementStatisticalData_map",
     ends},
    {createSCSIProtocolController, {}, "1 Insert Failed : m_TVRHBA_SCSIProtocolController_map", ends},
    {createSCSIProtocolController,
     {&InstanceCache::m_TVRHBA_SCSIProtocolController_map},
     "1 Insert Failed : m_TVRHBA_ProtocolControllerForPort_map",
     ends},
    {createSCSIProtocolController,
     {&InstanceCache::m_TVRHBA_SCSIProtocolController_map, &InstanceCache::m_TVRHBA_ProtocolControllerForPort_map},
     "1 Insert Failed : m_TVRHBA_SCSIProtocolControllerSystemDevice_map",
     ends},
    {createPortController, {}, "1 Insert Failed : m_TVRHBA_PortController_map", ends},
    {createPortController,
     {&InstanceCache::m_TVRHBA_PortController_map},
     "1 Insert Failed : m_TVRHBA_ProductElementComponent_map",
     ends},
    {createPortController,
     {&InstanceCache::m_TVRHBA_PortController_map, &InstanceCache::m_TVRHBA_ProductElementComponent_map},
     "1 Insert Failed (HBA): m_TVRHBA_PHYConnectorRealizesPortController_map",
     ends},
    {createPortController,
     {&InstanceCache::m_TVRHBA_PortController_map, &InstanceCache::m_TVRHBA_ProductElementComponent_map,
      &InstanceCache::m_TVRHBA_PHYConnectorRealizesPortController_map},
     "1 Insert Failed : m_TVRHBA_PortControllerConformsToProfile_map",
     BUILD_DONE},
    {createTransceiver, {}, "5 Failed Creating TVRHBA_Transceiver", BUILD_DONE},
    {createTransceiver, {&InstanceCache::m_TVRHBA_Transceiver_map}, "1 Insert Failed : m_Component_map", ends},
    {createFlashImages,
     {&InstanceCache::m_TVRHBA_FlashImageSoftwareIdentity_map},
     "1 Insert Failed : m_TVRHBA_ElementFlashImageSoftwareIdentityInst_map ",
     BUILD_FAILED},
    {createPortControllerAssociations, {}, "1 Insert Failed : m_TVRHBA_ControlledBy_map", ends},
    {createPortControllerAssociations,
     {&InstanceCache::m_TVRHBA_ControlledBy_map},
     "1 Insert Failed : m_TVRHBA_Realizes_map",
     ends},
    {createPortControllerAssociations,
     {&InstanceCache::m_TVRHBA_ControlledBy_map, &InstanceCache::m_TVRHBA_Realizes_map},
     "1 Insert Failed : m_TVRHBA_PortControllerSystemDevice_map",
     ends},
    {createInitiatorEndpoint, {}, "1 Insert Failed : m_TVRHBA_SCSIProtocolInitiatorEndpoint_map", ends},
    {createInitiatorEndpoint,
     {&InstanceCache::m_TVRHBA_SCSIProtocolInitiatorEndpoint_map},
     "1 Insert Failed : m_TVRHBA_DeviceSAPImplementation_map",
     ends},
    {createInitiatorEndpoint,
     {&InstanceCache::m_TVRHBA_SCSIProtocolInitiatorEndpoint_map, &InstanceCache::m_TVRHBA_DeviceSAPImplementation_map},
     "1 Insert Failed : m_TVRHBA_LocalHostedInitiatorAccessPoint_map",
     ends},
};

TEST_F(PortChain, RefusedInsertsEndThePortAlone)
{
    for (const Row& row : rows)
    {
        SCOPED_TRACE(row.line);
        ASSERT_NO_FATAL_FAILURE(build());
        for (const Map map : row.emptied)
            (agent.*map).clear();
        EXPECT_EQ(row.step(*port), row.status);
        EXPECT_THAT(log->lines, testing::Contains(row.line));
    }
}

} // namespace
