// What the library says of tests, in words, and jobs that no run of a client leads to: states, ends that are missing,
// jobs that are gone.
#include "agent/Build.h"
#include "agent/Maps.h"
#include "agent/ProviderAgent.h"
#include "diagnostics/ConcreteJobs.h"
#include "diagnostics/DiagnosticTexts.h"
#include "schema/TVRHBA_AffectedJobElement.h"
#include "schema/TVRHBA_OwningJobElement.h"
#include "tests/support/LogCollector.h"
#include "tests/unit/device/FakeHost.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <string>
#include <vector>

using namespace cimple;

namespace
{

TEST(DiagnosticTexts, AStatusHasItsText)
{
    const std::map<int, std::string> texts = {
        {0, "Successful"},
        {1, "An unspecified error occurred"},
        {2, "Diagnostics not available/Port not supported"},
        {13, "No SFP is installed in the port"},
        {62, "There are too many pending/running requests in diag. results table"},
        {63, "Diagnostics not available/Port not supported"},
        {64, "Adapter Busy: Another critical application may be running"},
        {190, "Diagnostics not available/Port not supported"},
        {204, "D_Port Test is not supported on this switch."},
        {212, "No FC cable connecting the port to the switch."},
        {248, "Test not supported on this hardware."},
        {251, "Test not supported on this firmware."},
    };
    for (int status = -1; status < 300; status++)
    {
        const auto known = texts.find(status);
        EXPECT_EQ(MapDiagStatus(status), known == texts.end() ? "Unknown" : known->second) << status;
    }
}

TEST(DiagnosticTexts, AResultHasItsText)
{
    // clang-format off
    const char* const texts[] = {
        "Success", "General Error", "Link Down", "I/O Error", "Timeout", "Transmit Error", "Receive Error",
        "Mailbox Error", "Error: Echo test not supported", "Error: Echo Failed", "Error: Target Unreachable",
        "Error: HBA temperature exceeded operational range. Adapter stopped.\n\nPlease see the product documentation",
        "Error: Failed to allocate resource", "Error: Another diagnostic test is running. Please try again",
        "Error: Sequence Timeout", "Error: Bus reset received during test", "Error: Read-Write test is running",
        "Error: Driver busy. Please try again", "Error: Mailbox not ready", "Error: Port not ready", "Unknown",
        "Unknown", "Unknown", "Unknown", "Unknown", "Error: Connection Failed", "Error: Socket Connection Failed",
        "Unknown",
    };
    // clang-format on
    for (std::uint32_t result = 0; result < std::size(texts); result++)
        EXPECT_STREQ(MapDiagResultStatus(result), texts[result]) << result;
    EXPECT_STREQ(MapDiagResultStatus(0xFFFFFFFF), "Unknown");
}

TEST(ConcreteJobs, BeginInTheStateThatIsAskedFor)
{
    InstanceCache cache;
    const struct
    {
        std::uint32_t requested;
        unsigned state, percentage;
    } rows[] = {{7, 7, 100}, {4, 4, 0}, {8, 8, 0}, {6, 10, 0}, {32768, 10, 0}, {0, 10, 0}, {65543, 10, 0}};
    for (const auto& row : rows)
    {
        const auto* job =
            CreateConcreteJobInstantiateNonBlocking(cache, {.testName = "t", .requestedState = row.requested});
        ASSERT_NE(job, nullptr);
        EXPECT_EQ(job->JobState.value, row.state) << row.requested;
        EXPECT_EQ(job->PercentComplete.value, row.percentage) << row.requested;
        EXPECT_TRUE(job->diagHandle.null);
        EXPECT_TRUE(job->wwpn.null);
    }
    EXPECT_EQ(mapOf<TVRHBA_ConcreteJob>(cache).size(), std::size(rows)) << "each with a number of its own";
}

TEST(ConcreteJobs, OfUnknownTestsHaveNoOwner)
{
    InstanceCache cache;
    const auto* job = CreateConcreteJobInstantiateNonBlocking(
        cache, {.testName = "t", .wwpnText = "1000027A51160210", .diagHandle = 0xFFFFFFFF});
    ASSERT_NE(job, nullptr);
    EXPECT_STREQ(job->InstanceID.value.c_str() + job->InstanceID.value.size() - 11, ":4294967295");
    EXPECT_EQ(job->diagHandle.value, 0xFFFFFFFF);
    EXPECT_EQ(job->wwpn.value, "1000027A51160210");
    ASSERT_EQ(mapOf<TVRHBA_OwningJobElement>(cache).size(), 1u);
    EXPECT_EQ(mapOf<TVRHBA_OwningJobElement>(cache).first()->OwningElement, nullptr);
    ASSERT_EQ(mapOf<TVRHBA_AffectedJobElement>(cache).size(), 1u);
    EXPECT_EQ(mapOf<TVRHBA_AffectedJobElement>(cache).first()->AffectedElement, nullptr);

    const auto* other = CreateConcreteJobInstantiateNonBlocking(cache, {.testName = "t"});
    EXPECT_EQ(DeleteConcreteJob(cache, nullptr), 32969u);
    EXPECT_EQ(DeleteConcreteJob(cache, job), 0u);
    EXPECT_EQ(mapOf<TVRHBA_ConcreteJob>(cache).first(), other);
    EXPECT_EQ(mapOf<TVRHBA_OwningJobElement>(cache).size(), 1u);
    EXPECT_EQ(mapOf<TVRHBA_AffectedJobElement>(cache).size(), 1u);
    const Ref<TVRHBA_ConcreteJob> gone(clone_of(other));
    EXPECT_EQ(DeleteConcreteJob(cache, other), 0u);
    EXPECT_EQ(DeleteConcreteJob(cache, gone.get()), 0u) << "without a word";
    EXPECT_EQ(mapOf<TVRHBA_ConcreteJob>(cache).size(), 0u);
}

/// A job that is there already is not made; without one of its associations it stands.
TEST(ConcreteJobs, WhatAMapRefusesIsLeftOut)
{
    InstanceCache cache;
    test_support::LogCollector lines{TVR_DBG};
    const auto idAfter = [](const TVRHBA_ConcreteJob& job)
    {
        const std::string id = job.InstanceID.value.c_str();
        return "t:" + std::to_string(std::stoul(id.substr(2)) + 1) + id.substr(id.find(':', 2));
    };
    const auto make = [&] { return CreateConcreteJobInstantiateNonBlocking(cache, {.testName = "t"}); };
    const TVRHBA_ConcreteJob* first = make();
    ASSERT_NE(first, nullptr);
    Ref<TVRHBA_ConcreteJob> next(clone_of(first));
    next->InstanceID.set(idAfter(*first));
    mapOf<TVRHBA_ConcreteJob>(cache).insert(next, "refused");
    EXPECT_EQ(make(), nullptr);
    EXPECT_EQ(mapOf<TVRHBA_OwningJobElement>(cache).size(), 1u);

    Ref<TVRHBA_ConcreteJob> third(clone_of(next.get()));
    third->InstanceID.set(idAfter(*next));
    Ref<TVRHBA_OwningJobElement> owning = empty<TVRHBA_OwningJobElement>();
    owning->OwnedElement = clone_of(third.get());
    mapOf<TVRHBA_OwningJobElement>(cache).insert(owning, "refused");
    Ref<TVRHBA_AffectedJobElement> affected = empty<TVRHBA_AffectedJobElement>();
    affected->AffectingElement = clone_of(third.get());
    mapOf<TVRHBA_AffectedJobElement>(cache).insert(affected, "refused");
    EXPECT_NE(make(), nullptr);
    lines.stopCollecting();
    const std::vector<std::string> messages = lines.messages();
    for (const char* line : {"Insert Failed: TVRHBA_ConcreteJob", "Insert Failed: TVRHBA_OwningJobElement",
                             "Insert Failed: TVRHBA_AffectedJobElement"})
        EXPECT_EQ(std::count(messages.begin(), messages.end(), line), 1) << line;
}

TEST(ConcreteJobs, NothingIsCancelledWithoutAHandleOrAName)
{
    FakeHost host;
    test_support::LogCollector lines{TVR_DBG};
    ProviderAgent& agent = *ProviderAgent::instance();
    EXPECT_EQ(CancelTest(agent, {}, 0, "t"), 1);
    EXPECT_EQ(CancelTest(agent, {}, 7, nullptr), 1);
    EXPECT_EQ(CancelDportTest({}, 0, "t"), 1);
    EXPECT_EQ(CancelDportTest({}, 7, nullptr), 1);
    const std::vector<std::string> messages = lines.messages();
    EXPECT_EQ(std::count(messages.begin(), messages.end(), "Invalid Parameter"), 4);
    lines.stopCollecting();
}

} // namespace
