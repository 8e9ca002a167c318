// The model as a whole: every class that a client can enumerate has something to show, and what an association refers
// to is there.
#include "tests/module/Host.h"
#include "tests/module/Walk.h"

#include "broker/values/PathText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <map>
#include <set>

using namespace module_test;
using broker::Object;
using broker::Path;

namespace
{

void addBaseServerProfile(broker::Broker& broker)
{
    using broker::Value;
    const broker::NamesReply reply = broker.store().create(
        {{"root/pg_interop", "PG_RegisteredProfile", {}},
         {{"InstanceID", Value::string("base-server")}, {"RegisteredName", Value::string("Base Server")}}});
    ASSERT_TRUE(reply.ok()) << reply.message;
}

/// Of what has not been built, or has nothing to show before a client asks for it.
const std::set<std::string> empty = {
    "TVRHBA_LogEntry",
    "TVRHBA_RecordLogManagesRecord",
    "TVRHBA_FCDriverLogEntry",
    "TVRHBA_DriverRecordLogManagesRecord",
    "TVRHBA_ConcreteJob",
    "TVRHBA_DiagnosticServiceRecord",
    "TVRHBA_DiagnosticCompletionRecord",
    "TVRHBA_DiagnosticSettingDataRecord",
    "TVRHBA_OwningJobElement",
    "TVRHBA_AffectedJobElement",
    "TVRHBA_LogManagesRecord",
    "TVRHBA_RecordAppliesToElement",
    "TVRHBA_CorrespondingSettingDataRecord",
};

/// Nobody serves what the module makes up where the platform has none.
const std::set<std::string> servedByNobody = {"CIM_ComputerSystem", "CIM_Chassis"};

class Ends
{
public:
    explicit Ends(Host& host) : _host(host) {}

    bool exists(const Path& path)
    {
        const auto [place, isNew] = _known.try_emplace(broker::fullPathText(path));
        if (isNew)
            place->second = _host.broker().getInstance(path).ok();
        return place->second;
    }

private:
    Host& _host;
    std::map<std::string, bool> _known;
};

TEST(ClosedModel, EveryClassHasInstancesAndEveryEndIsOne)
{
    Host host;
    addBaseServerProfile(host.broker());
    Ends ends(host);
    std::set<std::string> classesOfEnds;
    for (const std::string& className : host.broker().servedClasses())
    {
        SCOPED_TRACE(className);
        const std::vector<Object> instances = exactInstancesOf(host.broker(), className);
        EXPECT_EQ(instances.empty(), empty.contains(className));
        for (const Object& instance : instances)
        {
            EXPECT_TRUE(ends.exists(instance.path)) << broker::fullPathText(instance.path);
            for (const broker::Property& reference : referencesOf(instance))
            {
                const Path& end = reference.value.asPath();
                classesOfEnds.insert(end.className);
                if (!servedByNobody.contains(end.className))
                {
                    EXPECT_TRUE(ends.exists(end)) << broker::fullPathText(end);
                }
            }
        }
    }
    for (const std::string& unserved : servedByNobody)
        EXPECT_THAT(classesOfEnds, testing::Contains(unserved)) << "no longer an exception";
    host.unload();
}

} // namespace
