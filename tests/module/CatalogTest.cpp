// Every class of the catalog, from its factories to its last cleanup, without and with a platform beside the module.
#include "broker/values/PathText.h"
#include "tests/module/Clock.h"
#include "tests/module/Walk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <set>

using namespace module_test;
using broker::Object;
using broker::Path;

namespace
{

/// Records of the log: each call adds some.
const std::set<std::string> growing = {"TVRHBA_LogEntry", "TVRHBA_RecordLogManagesRecord"};

/// The ends of associations that the module makes for hosts whose platform serves no instance of them.
const std::set<std::string> ownPlatformClasses = {"CIM_ComputerSystem", "CIM_Chassis"};

bool isListedException(const std::string& association, const broker::Property& reference, bool platform)
{
    // Entries of the provider's log have other names in its associations than among its instances.
    if (association == "TVRHBA_RecordLogManagesRecord" && reference.name == "Record")
        return true;
    // The system of a virtual machine is the hypervisor's to serve.
    if (association == "TVRHBA_VMSystemDevice" && reference.name == "GroupComponent")
        return true;
    return !platform && ownPlatformClasses.count(reference.value.asPath().className);
}

/// With or without a platform that serves the computer system, the chassis and the base server profile.
class Catalog : public testing::TestWithParam<bool>
{
protected:
    Catalog()
    {
        stopClock(); // what is read twice has the same time
        if (GetParam())
            addPlatform(host.broker());
    }

    broker::Broker& broker() { return host.broker(); }

    std::vector<Path> exactNames(const std::string& className)
    {
        broker::NamesReply reply = broker().enumerateInstanceNames("root/tavrin", className);
        EXPECT_TRUE(reply.ok()) << broker::statusName(reply.status);
        std::erase_if(reply.paths, [&](const Path& path) { return path.className != className; });
        return std::move(reply.paths);
    }

    /// Whether the path leads to an instance; asked once for each path.
    bool leadsSomewhere(const Path& path)
    {
        const auto [known, isNew] = _reached.try_emplace(identity(path), false);
        if (isNew)
            known->second = broker().getInstance(path).ok();
        return known->second;
    }

    Host host;

private:
    std::map<std::string, bool> _reached;
};

INSTANTIATE_TEST_SUITE_P(Hosts, Catalog, testing::Bool(),
                         [](const auto& info) { return info.param ? "Platform" : "Lone"; });

TEST_P(Catalog, ClassesLoadEnumerateAndUnload)
{
    ASSERT_EQ(broker().servedClasses().size(), 159u);
    for (const std::string& className : broker().servedClasses())
    {
        SCOPED_TRACE(className);
        const broker::ClassInfo* info = broker().classes().find(className);
        ASSERT_NE(info, nullptr);
        for (const broker::Kind kind : broker::allKinds)
        {
            const bool wanted = kind != broker::Kind::association || info->isAssociation();
            EXPECT_EQ(broker().serves(className, kind), wanted);
            EXPECT_EQ(broker().loadProvider(className, {kind}).ok(), wanted);
        }
        const std::vector<Path> names = exactNames(className);
        const std::vector<Object> objects = exactInstancesOf(broker(), className);
        if (!growing.count(className))
        {
            EXPECT_EQ(identities(pathsOf(objects)), identities(names));
        }
        const std::vector<std::string> texts = identities(names);
        EXPECT_EQ(std::adjacent_find(texts.begin(), texts.end()), texts.end()) << "one path twice";
    }
    host.unload();
}

TEST_P(Catalog, InstancesAreFoundByTheirPaths)
{
    for (const std::string& className : broker().servedClasses())
    {
        SCOPED_TRACE(className);
        for (const Object& object : exactInstancesOf(broker(), className))
        {
            const broker::Reply reply = broker().getInstance(object.path);
            ASSERT_TRUE(reply.ok()) << broker::fullPathText(object.path) << " " << reply.message;
            EXPECT_EQ(identity(reply.objects.at(0).path), identity(object.path));
            if (!growing.count(className))
            {
                EXPECT_EQ(reply.objects.at(0).properties, object.properties) << broker::pathText(object.path);
            }
        }
    }
    host.unload();
}

TEST_P(Catalog, AssociationsLeadToServedInstances)
{
    std::size_t associations = 0;
    for (const std::string& className : broker().servedClasses())
    {
        const broker::ClassInfo* info = broker().classes().find(className);
        const auto ends = std::count_if(info->properties.begin(), info->properties.end(),
                                        [](const broker::FeatureInfo& p) { return p.isReference(); });
        for (const Object& object :
             info->isAssociation() ? exactInstancesOf(broker(), className) : std::vector<Object>())
        {
            SCOPED_TRACE(broker::pathText(object.path));
            associations++;
            const std::vector<broker::Property> references = referencesOf(object);
            EXPECT_EQ(static_cast<std::ptrdiff_t>(references.size()), ends);
            for (const broker::Property& reference : references)
                EXPECT_NE(leadsSomewhere(reference.value.asPath()), isListedException(className, reference, GetParam()))
                    << reference.name << " " << broker::fullPathText(reference.value.asPath());
        }
    }
    EXPECT_GT(associations, 20u);
    host.unload();
}

TEST_P(Catalog, SuperclassesEnumerateAllTheirClasses)
{
    for (const std::string className : {"CIM_PhysicalElement", "CIM_Dependency", "CIM_ManagedElement"})
    {
        SCOPED_TRACE(className);
        std::size_t expected = 0;
        for (const std::string& served : broker().servedClasses())
            if (broker().classes().isA(served, className) && !growing.count(served))
                expected += exactInstancesOf(broker(), served).size();
        std::vector<Object> objects = host.instancesOf(className);
        std::erase_if(objects, [](const Object& object) { return growing.count(object.path.className) > 0; });
        EXPECT_GT(expected, 0u);
        EXPECT_EQ(objects.size(), expected);
    }
    host.unload();
}

/// The instance with the listed properties only, as the list names them.
Object cut(Object object, const std::vector<std::string>& list)
{
    std::erase_if(object.properties,
                  [&](const broker::Property& p)
                  {
                      return std::none_of(list.begin(), list.end(),
                                          [&](const std::string& name) { return broker::sameName(name, p.name); });
                  });
    return object;
}

TEST_P(Catalog, PropertyListsAreObeyed)
{
    for (const std::string& className : broker().servedClasses())
    {
        const std::vector<Object> all = exactInstancesOf(broker(), className);
        if (all.empty() || growing.count(className))
            continue;
        SCOPED_TRACE(className);
        const std::vector<broker::Property>& properties = all[0].properties;
        const std::vector<std::string> lists[] = {
            {},
            {"NoSuchProperty"},
            {broker::lowerCase(properties.front().name), "NoSuchProperty", properties.back().name},
            {properties.at(properties.size() / 2).name},
        };
        for (const std::vector<std::string>& list : lists)
        {
            const broker::Reply some = broker().enumerateInstances("root/tavrin", className, list);
            ASSERT_TRUE(some.ok());
            for (const Object& object : some.objects)
            {
                const auto whole = std::find_if(all.begin(), all.end(),
                                                [&](const Object& candidate)
                                                { return identity(candidate.path) == identity(object.path); });
                if (object.path.className == className)
                {
                    ASSERT_NE(whole, all.end()) << broker::pathText(object.path);
                    EXPECT_EQ(object, cut(*whole, list));
                }
            }
            const broker::Reply one = broker().getInstance(all[0].path, list);
            ASSERT_TRUE(one.ok());
            EXPECT_EQ(one.objects.at(0), cut(all[0], list));
        }
    }
    host.unload();
}

} // namespace
