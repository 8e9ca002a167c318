#include "tests/module/Walk.h"

#include "broker/values/PathText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>

namespace module_test
{

std::vector<broker::Property> referencesOf(const broker::Object& association)
{
    std::vector<broker::Property> references;
    std::copy_if(association.properties.begin(), association.properties.end(), std::back_inserter(references),
                 [](const broker::Property& p) { return p.value.type() == CMPI_ref && !p.value.isNull(); });
    return references;
}

std::string identity(const broker::Path& path)
{
    broker::Path sorted = path;
    sorted.nameSpace = broker::canonicalNameSpace(path.nameSpace);
    std::sort(sorted.keys.begin(), sorted.keys.end(),
              [](const broker::Property& a, const broker::Property& b) { return a.name < b.name; });
    return broker::fullPathText(sorted);
}

std::vector<std::string> identities(const std::vector<broker::Path>& paths)
{
    std::vector<std::string> texts;
    std::transform(paths.begin(), paths.end(), std::back_inserter(texts), identity);
    std::sort(texts.begin(), texts.end());
    return texts;
}

std::vector<broker::Path> pathsOf(const std::vector<broker::Object>& objects)
{
    std::vector<broker::Path> paths;
    std::transform(objects.begin(), objects.end(), std::back_inserter(paths),
                   [](const broker::Object& object) { return object.path; });
    return paths;
}

std::vector<broker::Object> exactInstancesOf(broker::Broker& broker, const std::string& className)
{
    broker::Reply reply = broker.enumerateInstances("root/tavrin", className);
    EXPECT_TRUE(reply.ok()) << className << ": " << broker::statusName(reply.status);
    std::erase_if(reply.objects, [&](const broker::Object& object) { return object.path.className != className; });
    return std::move(reply.objects);
}

void addPlatform(broker::Broker& broker)
{
    using broker::Value;
    const std::vector<broker::Object> platform = {
        {{"root/ibmse", "IBMSD_ComputerSystem", {}},
         {{"CreationClassName", Value::string("IBMSD_ComputerSystem")}, {"Name", Value::string("host-1")}}},
        {{"root/ibmse", "IBMSD_Chassis", {}},
         {{"CreationClassName", Value::string("IBMSD_Chassis")}, {"Tag", Value::string("chassis-1")}}},
        {{"root/pg_interop", "PG_RegisteredProfile", {}},
         {{"InstanceID", Value::string("base-server")}, {"RegisteredName", Value::string("Base Server")}}},
    };
    for (const broker::Object& object : platform)
    {
        const broker::NamesReply reply = broker.store().create(object);
        ASSERT_TRUE(reply.ok()) << reply.message;
    }
}

} // namespace module_test
