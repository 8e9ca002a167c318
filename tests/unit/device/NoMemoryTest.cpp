// Every allocation of the device model and of the queries fails once, those inside the fake libraries included: these
// then throw, as no library should.
#include "FakeHost.h"

#include "device/Data.h"
#include "device/TVR_MethodWrapper.h"
#include "tests/support/NoMemory.h"

#include <functional>
#include <gmock/gmock.h>
#include <new>

using namespace cimple;
using test_support::withEachAllocationFailing;

namespace
{

TEST(NoMemory, TheDeviceModelLosesAnEntryAtMost)
{
    LoadedHost host;
    for (unsigned ports : {2, 1})
        host.addAdapter(ports).mapping = mappingOf(2);
    Data data;
    const auto build = [&]
    {
        data.buildAdapterData();
        data.buildSANData();
        for (Port* port : data.ports)
            port->updateStatistics();
    };
    const auto targets = [&]
    {
        std::size_t count = 0;
        for (const Port* port : data.ports)
            count += port->targets.size();
        return count;
    };
    withEachAllocationFailing([&] { EXPECT_NO_THROW(build()); },
                              [&](bool)
                              {
                                  EXPECT_EQ(host.openHandles, 0);
                                  EXPECT_EQ(data.adapterCount, data.adapters.size());
                              });
    EXPECT_EQ(data.adapters.size(), 2u);
    EXPECT_EQ(data.ports.size(), 3u);
    EXPECT_EQ(targets(), 6u);
}

TEST(NoMemory, AnInitialisationThatFailsLeavesTheNextOneFree)
{
    LoadedHost host;
    bool initialised = false;
    const auto initialise = [&]
    {
        initialised = false;
        try
        {
            const TVR_MethodWrapper wrapper;
            initialised = true;
        }
        catch (const std::bad_alloc&)
        {}
    };
    int thrown = 0;
    withEachAllocationFailing(initialise,
                              [&](bool failed)
                              {
                                  EXPECT_TRUE(initialised || failed);
                                  thrown += !initialised;
                              });
    EXPECT_GE(thrown, 6) << "two names, two semaphores and theirs; sem_open's own memory it does without";
}

struct Answer
{
    RM_STATUS status;
    bool changed; ///< the output
};

template <class Out, class Query> Answer ask(const Query& query)
{
    Out out;
    const RM_STATUS status = query(&out);
    return {status, !out.empty()};
}

TEST(NoMemory, QueriesAnswerByTheirStatus)
{
    using W = TVR_MethodWrapper;
    constexpr const char* id = "1000112233123456";
    LoadedHost host;
    host.version = std::string(100, 'v');
    host.features[201] = 1;
    host.serverAttributes[264] = "Debian GNU/Linux 12 (bookworm)";
    host.driverParameters.resize(1);
    host.vports.resize(1);
    host.vportTargets.resize(1);
    host.luns.resize(1);
    host.reportLuns = std::string("\0\0\0\x08", 4) + std::string(12, '\0');
    host.inquiry[0] = std::string(36, 'i');

    const std::function<Answer()> queries[] = {
        [] { return ask<std::string>([](auto* out) { return W::GetMILILibVersion(out); }); },
        [] { return ask<std::string>([](auto* out) { return W::GetLibraryVersion(out); }); },
        [] { return ask<std::vector<RM_Feature>>([](auto* out) { return W::GetHBAFeatureList(wwn(1), out); }); },
        [] { return ask<std::vector<TargetLun>>([](auto* out) { return W::tvrcimGetTargetMapping(id, id, out); }); },
        [] { return ask<std::vector<RM_DriverParam>>([](auto* out) { return W::tvrcimGetDriverParam(id, out); }); },
        [] { return ask<std::vector<RM_VPortEntry>>([](auto* out) { return W::ListVPorts(id, out); }); },
        [] { return ask<std::vector<RM_VPortTarget>>([](auto* out) { return W::ListVPortTargets(id, id, out); }); },
        [] { return ask<std::vector<HBA_UINT64>>([](auto* out) { return W::ListVPortLuns(id, id, id, out); }); },
        []
        {
            char out[41] = {};
            const RM_STATUS status = W::getTargetOS_info(id, out);
            return Answer{status, *out != 0};
        },
        []
        {
            VPortLunAttributes out;
            const RM_STATUS status = W::VPortLunAttr(id, id, id, 0, &out);
            return Answer{status, out.inquiry.vendor == "iiiiiiii"};
        },
    };
    for (const auto& query : queries)
    {
        SCOPED_TRACE(&query - queries);
        Answer answer{};
        withEachAllocationFailing(
            [&]
            {
                answer = {}; // should it throw
                answer = query();
            },
            [&](bool failed)
            {
                EXPECT_EQ(answer.status, failed ? RM_ERROR_NO_MEMORY : RM_OK);
                EXPECT_EQ(answer.changed, !failed);
            });
    }
}

} // namespace
