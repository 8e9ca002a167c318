// The walk over the steps of a refresh, and the associations that steps make.
#include "agent/RefreshSteps.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_CardContainsChip.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_ProviderUseOfLog.h"
#include "schema/TVRHBA_RecordLog.h"
#include "schema/TVRHBA_SoftwareIdentity.h"
#include "tests/support/LogCollector.h"
#include "tests/support/NoMemory.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>

using namespace cimple;
using testing::ElementsAre;

namespace
{

// What does not belong into a map does not compile.
template <class Record, class Other>
concept MapTakes = requires(const TypedMap<Record>& map, const Ref<Other>& instance)
{
    map.insert(instance, "refused");
};
static_assert(MapTakes<TVRHBA_Chip, TVRHBA_Chip>);
static_assert(!MapTakes<TVRHBA_Chip, TVRHBA_Card>);

std::vector<std::string> run; // names of the steps

template <int number, std::uint32_t status> std::uint32_t step(HostContext&)
{
    run.push_back(std::to_string(number));
    return status;
}

std::uint32_t throws(HostContext& host)
{
    run.push_back("throws");
    mapOf<TVRHBA_Card>(host.agent).insert(fresh<TVRHBA_Card>(), "refused");
    throw std::runtime_error("broken");
}

std::uint32_t seesTheSystem(HostContext& host)
{
    run.push_back(host.system ? "system" : "no system");
    return BUILD_DONE;
}

class Steps : public testing::Test
{
protected:
    Steps() : agent(*ProviderAgent::instance())
    {
        ProviderAgent::addRef();
        agent.m_pData = std::make_unique<Data>();
        run.clear();
        log.emplace(TVR_DBG);
    }
    ~Steps() override
    {
        log->stopCollecting();
        ProviderAgent::releaseRef();
    }

    ProviderAgent& agent;
    std::optional<test_support::LogCollector> log;
};

TEST_F(Steps, EndGoOnOrAreContainedAsTheirRowsSay)
{
    constexpr HostStep host[] = {
        {step<1, BUILD_DONE>, OnFailure::Stop, "not logged"},
        {step<2, BUILD_NO_INSTANCE>, OnFailure::GoOn, {TVR_ERR, "step failed with status %d"}},
        {throws, OnFailure::Stop, {}, {TVR_DBG, "an exception"}, MapGroup::Adapter},
        mark({TVR_DBG, "behind the exception"}),
        {step<3, BUILD_FAILED>, OnFailure::Stop, "the last"},
        {step<4, BUILD_DONE>, OnFailure::Stop, {}},
    };
    EXPECT_EQ(buildAdapterMaps(agent, {.host = host}), BUILD_FAILED);
    EXPECT_THAT(run, ElementsAre("1", "2", "throws", "3"));
    EXPECT_EQ(mapOf<TVRHBA_Card>(agent).size(), 0u) << "what the step that threw had made";
    std::vector<std::string> lines = log->messages();
    lines.erase(lines.begin(), lines.end() - 4);
    EXPECT_THAT(lines,
                ElementsAre("step failed with status 32768", "an exception", "behind the exception", "the last"));
}

TEST_F(Steps, ClearingMarksItsGroups)
{
    EXPECT_EQ(buildAdapterMaps(agent, {}), BUILD_DONE);
    EXPECT_THAT(log->messages(),
                ElementsAre(" updateAdapterMaps: Entry", "PERF: Entered clearAdapterMaps()", "Clearing Record Log maps",
                            "Clearing SoftwareUpdate maps", "Clearing Software Update maps", "Clearing TVR CDM maps",
                            "Done with Clearing CDM maps", "Exiting clearAdapterMaps()", "No FC card found",
                            "PERF: updateAdapterMaps: cleanExit"));
}

TEST_F(Steps, OfTheFabricHaveTheSystemOfTheMaps)
{
    constexpr HostStep san[] = {{seesTheSystem, OnFailure::Stop, {}}};
    const RefreshSteps steps = {.san = san};
    EXPECT_EQ(buildSANMaps(agent, steps), BUILD_DONE);
    mapOf<CIM_ComputerSystem>(agent).insert(fresh<CIM_ComputerSystem>(), "refused");
    EXPECT_EQ(buildSANMaps(agent, steps), BUILD_DONE);
    EXPECT_THAT(run, ElementsAre("no system", "system"));
}

TEST_F(Steps, AssociationsAreMadeRefusedOrLackAnEnd)
{
    using Contains = TVRHBA_CardContainsChip;
    const Ref<TVRHBA_Card> card = fresh<TVRHBA_Card>();
    const Ref<TVRHBA_Chip> chip = fresh<TVRHBA_Chip>();
    const auto joined = [&](const TVRHBA_Chip* end)
    {
        return join<Contains>(agent, &Contains::GroupComponent, card.get(), &Contains::PartComponent, end,
                              "an association was refused");
    };
    EXPECT_EQ(joined(nullptr), Joined::NoEnd);
    {
        const test_support::NoMemory none(0, 1);
        EXPECT_EQ(joined(chip.get()), Joined::NoInstance);
    }
    EXPECT_EQ(mapOf<Contains>(agent).size(), 0u);
    EXPECT_EQ(joined(chip.get()), Joined::Made);
    EXPECT_EQ(joined(chip.get()), Joined::Refused);
    EXPECT_EQ(mapOf<Contains>(agent).size(), 1u);
    EXPECT_THAT(log->messages(),
                ElementsAre("Could not create the instance of the Association class", "an association was refused"));
}

TEST_F(Steps, AssociationsGoIntoTheSecondMapOfTheirClass)
{
    using Use = TVRHBA_ProviderUseOfLog;
    const Ref<TVRHBA_RecordLog> log = fresh<TVRHBA_RecordLog>();
    const Ref<TVRHBA_SoftwareIdentity> identity = fresh<TVRHBA_SoftwareIdentity>();
    EXPECT_EQ(join(secondMapOf<Use>(agent), &Use::Antecedent, log.get(), &Use::Dependent, identity.get(), "refused",
                   [](Use&) {}),
              Joined::Made);
    EXPECT_EQ(secondMapOf<Use>(agent).size(), 1u);
    EXPECT_EQ(mapOf<Use>(agent).size(), 0u);
}

} // namespace
