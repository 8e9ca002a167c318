// The host and its hardware as a client sees them.
#include "tests/module/Host.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;

namespace
{

TEST(PhysicalModel, ServesTheHardwareOfTheDefaultHost)
{
    Host host;
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 4u);
    EXPECT_EQ(host.instancesOf("TVRHBA_PhysicalConnector").size(), 4u);
    host.unload();
}

} // namespace
