#include "simulator/Generator.h"

#include <gtest/gtest.h>

#include <set>

namespace tvrsim
{
namespace
{

Scenario generated(const GeneratorSettings& settings)
{
    Scenario scenario;
    generate(settings, scenario);
    return scenario;
}

/// What identifies a host to a client.
std::string identity(const Scenario& scenario)
{
    std::string text;
    for (const Adapter& adapter : scenario.adapters)
    {
        text += adapter.name + ' ' + adapter.serialNumber + '\n';
        for (const Port& port : adapter.ports)
            for (std::size_t target : port.targets)
            {
                text += wwnText(port.wwpn) + ' ' + wwnText(scenario.targets[target].wwpn) + '\n';
                for (const LogicalUnit& unit : scenario.targets[target].units)
                    text += std::to_string(unit.blocks) + *unit.serialNumber + '\n';
            }
    }
    return text;
}

TEST(Generator, SizesFollowTheSettings)
{
    const Scenario scenario = generated({.seed = 3,
                                         .adapters = 3,
                                         .portsPerAdapter = 2,
                                         .targetsPerPort = 4,
                                         .unitsPerTarget = 5,
                                         .deviceTypes = {0, 13}});
    std::set<Wwn> names;
    std::size_t units = 0, enclosures = 0;
    EXPECT_EQ(scenario.adapters.size(), 3u);
    for (const Adapter& adapter : scenario.adapters)
    {
        EXPECT_EQ(adapter.ports.size(), 2u);
        for (const Port& port : adapter.ports)
        {
            EXPECT_TRUE(names.insert(port.wwpn).second);
            EXPECT_EQ(port.targets.size(), 4u);
        }
    }
    for (const Target& target : scenario.targets)
    {
        EXPECT_TRUE(names.insert(target.wwpn).second);
        for (const LogicalUnit& unit : target.units)
        {
            ++units;
            enclosures += unit.deviceType == 13;
            EXPECT_EQ(unit.blocks == 0, unit.deviceType == 13);
        }
    }
    EXPECT_EQ(units, 3u * 2 * 4 * 5);
    EXPECT_EQ(enclosures, units / 2);
}

TEST(Generator, SeedDecidesTheHost)
{
    GeneratorSettings settings{.seed = 42, .adapters = 2, .targetsPerPort = 3, .unitsPerTarget = 2};
    const std::string first = identity(generated(settings));
    EXPECT_EQ(first, identity(generated(settings)));
    settings.seed = 43;
    EXPECT_NE(first, identity(generated(settings)));
}

} // namespace
} // namespace tvrsim
