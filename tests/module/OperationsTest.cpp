// Association operations against a naive filter over all association instances.
#include "tests/module/Describe.h"
#include "tests/module/RefreshLines.h"
#include "tests/module/Walk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <set>

using namespace module_test;
using broker::AssociationFilter;
using broker::Object;
using broker::Path;

namespace
{

class Associations : public testing::Test
{
protected:
    Associations()
    {
        addPlatform(broker());
        for (const std::string& className : broker().servedClasses())
            if (broker().classes().find(className)->isAssociation())
                for (Object& object : exactInstancesOf(broker(), className))
                    all.push_back(std::move(object));
        for (const Object& association : all)
            for (const broker::Property& reference : referencesOf(association))
                _atEnd[identity(reference.value.asPath())].insert(&association);
    }

    broker::Broker& broker() { return host.broker(); }

    bool fits(const std::string& className, const std::string& filter)
    {
        return filter.empty() || broker().classes().isA(className, filter);
    }
    static bool fitsRole(const broker::Property& reference, const std::string& role)
    {
        return role.empty() || broker::sameName(reference.name, role);
    }

    /// Calls `found(association, other ends)` for each association with the source at an end of that role.
    template <class Found>
    void follow(const Path& source, const std::string& assocClass, const std::string& role, Found found)
    {
        for (const Object* candidate : _atEnd[identity(source)])
        {
            const Object& association = *candidate;
            std::vector<broker::Property> others = referencesOf(association);
            const std::size_t ends = others.size();
            std::erase_if(
                others, [&](const broker::Property& reference)
                { return fitsRole(reference, role) && identity(reference.value.asPath()) == identity(source); });
            if (others.size() < ends && fits(association.path.className, assocClass))
                found(association, others);
        }
    }

    std::vector<Path> associated(const Path& source, const AssociationFilter& filter)
    {
        std::vector<Path> paths;
        follow(source, filter.assocClass, filter.role,
               [&](const Object&, const std::vector<broker::Property>& others)
               {
                   for (const broker::Property& other : others)
                       if (fitsRole(other, filter.resultRole) &&
                           fits(other.value.asPath().className, filter.resultClass))
                           paths.push_back(other.value.asPath());
               });
        return paths;
    }

    std::vector<Object> referringTo(const Path& source, const AssociationFilter& filter)
    {
        std::vector<Object> objects;
        follow(source, filter.assocClass, filter.role,
               [&](const Object& association, const auto&) { objects.push_back(association); });
        return objects;
    }

    /// What the broker gives, in the order of texts.
    static std::vector<std::string> got(const broker::NamesReply& reply)
    {
        EXPECT_TRUE(reply.ok()) << broker::statusName(reply.status) << " " << reply.message;
        return identities(reply.paths);
    }

    Host host;
    std::vector<Object> all; ///< association instances of all classes

private:
    std::map<std::string, std::set<const Object*>> _atEnd; ///< by the identities of their ends
};

/// Path and content of instances, sorted.
std::vector<std::string> whole(const std::vector<Object>& objects)
{
    std::vector<std::string> texts;
    for (const Object& object : objects)
        texts.push_back(identity(object.path) + describe(object));
    std::sort(texts.begin(), texts.end());
    return texts;
}

/// Nothing, as the type has it: an empty text or list, zero, false.
bool isBlank(const broker::Value& value)
{
    if (value.isArray())
        return value.asList().empty();
    switch (value.type())
    {
    case CMPI_string:
        return value.asString().empty();
    case CMPI_boolean:
        return !value.asBoolean();
    case CMPI_dateTime:
        return value.asDateTime() == broker::DateTime();
    default:
        return broker::isInteger(value.type()) && value.asUnsigned() == 0;
    }
}

/// References come without nulls: what has no value is blank in them. Takes that out again.
std::vector<Object> withNulls(std::vector<Object> references, const std::vector<Object>& enumerated)
{
    for (Object& reference : references)
        for (const Object& object : enumerated)
            if (identity(object.path) == identity(reference.path))
                std::erase_if(reference.properties, [&](const broker::Property& property)
                              { return !object.has(property.name) && isBlank(property.value); });
    return references;
}

/// A filter's values: none, the class's own, that of another association, and one that nothing has.
struct Values
{
    std::vector<std::string> assocClasses, resultClasses, roles;
};

const Values values = {
    {"", "TVRHBA_CardContainsChip", "CIM_Container", "CIM_Dependency"},
    {"", "tvrhba_chip", "CIM_PhysicalElement", "TVRHBA_Product"},
    {"", "GroupComponent", "partcomponent", "Antecedent", "NoSuchRole"},
};

TEST_F(Associations, NamesAreThoseOfTheNaiveFilter)
{
    std::size_t found = 0;
    for (const std::string className : {"TVRHBA_Card", "TVRHBA_Chip", "TVRHBA_PhysicalConnector"})
    {
        const Path source = host.instancesOf(className).at(0).path;
        for (const std::string& assocClass : values.assocClasses)
            for (const std::string& role : values.roles)
            {
                SCOPED_TRACE(className + " assocClass=" + assocClass + " role=" + role);
                EXPECT_EQ(got(broker().referenceNames(source, {assocClass, "", role, ""})),
                          identities(pathsOf(referringTo(source, {assocClass, "", role, ""}))));
                for (const std::string& resultClass : values.resultClasses)
                    for (const std::string& resultRole : values.roles)
                    {
                        const AssociationFilter filter{assocClass, resultClass, role, resultRole};
                        const std::vector<std::string> names = got(broker().associatorNames(source, filter));
                        EXPECT_EQ(names, identities(associated(source, filter)))
                            << "resultClass=" << resultClass << " resultRole=" << resultRole;
                        found += names.size();
                    }
            }
    }
    EXPECT_GT(found, 100u);
    host.unload();
}

TEST_F(Associations, InstancesAreThoseThatTheBrokerServes)
{
    const std::vector<std::string> list = {"CreationClassName", "Tag"};
    for (const std::string className : {"TVRHBA_Card", "TVRHBA_Chip", "TVRHBA_PhysicalConnector", "TVRHBA_Product"})
    {
        for (const Object& source : host.instancesOf(className))
        {
            for (const AssociationFilter& filter :
                 {AssociationFilter{}, AssociationFilter{"", "CIM_PhysicalElement", "", ""},
                  AssociationFilter{"CIM_Container", "", "PartComponent", "GroupComponent"}})
            {
                SCOPED_TRACE(identity(source.path) + " assocClass=" + filter.assocClass);
                const broker::Reply ends = broker().associators(source.path, filter);
                ASSERT_TRUE(ends.ok()) << ends.message;
                EXPECT_EQ(identities(pathsOf(ends.objects)), identities(associated(source.path, filter)));
                for (const Object& object : ends.objects)
                    EXPECT_EQ(whole({object}), whole(broker().getInstance(object.path).objects));
                for (const Object& object : broker().associators(source.path, filter, list).objects)
                    EXPECT_EQ(whole({object}), whole(broker().getInstance(object.path, list).objects));

                const broker::Reply references = broker().references(source.path, filter);
                ASSERT_TRUE(references.ok()) << references.message;
                const std::vector<Object> referring = referringTo(source.path, filter);
                EXPECT_EQ(whole(withNulls(references.objects, referring)), whole(referring));
            }
            for (const Object& object :
                 broker().references(source.path, {}, std::vector<std::string>{"Antecedent"}).objects)
                for (const broker::Property& property : object.properties)
                    EXPECT_EQ(property.name, "Antecedent");
        }
    }
    host.unload();
}

/// Profiles live in the interop namespace, whatever namespace an association was asked in.
TEST_F(Associations, EndsKeepTheirNamespace)
{
    std::size_t profiles = 0;
    for (const Object& object : all)
        for (const broker::Property& reference : referencesOf(object))
        {
            const Path& profile = reference.value.asPath();
            if (profile.className != "TVRHBA_RegisteredProfile" || reference.name != "ConformantStandard")
                continue;
            profiles++;
            SCOPED_TRACE(identity(object.path));
            EXPECT_EQ(profile.nameSpace, "root/pg_interop");
            const Path element = object.get("ManagedElement").asPath();
            const broker::NamesReply names =
                broker().associatorNames(element, {object.path.className, "TVRHBA_RegisteredProfile", "", ""});
            EXPECT_THAT(got(names), testing::Contains(identity(profile)));
            for (const Object& served :
                 broker().associators(element, {object.path.className, "TVRHBA_RegisteredProfile", "", ""}).objects)
                EXPECT_EQ(served.path.nameSpace, "root/pg_interop");
            for (const Path& path : broker().referenceNames(element, {object.path.className}).paths)
                EXPECT_EQ(path.nameSpace, element.nameSpace);
        }
    EXPECT_GT(profiles, 0u);
    host.unload();
}

/// A host without a platform: the module makes chassis and computer system, but no provider serves them.
TEST(Operations, AnEndThatNobodyServesComesFromTheAssociation)
{
    Host host;
    const Path card = host.instancesOf("TVRHBA_Card").at(0).path;
    const AssociationFilter filter{"TVRHBA_ChassisContainsCard", "", "", ""};
    const broker::NamesReply names = host.broker().associatorNames(card, filter);
    ASSERT_TRUE(names.ok());
    ASSERT_EQ(names.paths.size(), 1u);
    EXPECT_EQ(names.paths[0].className, "CIM_Chassis");
    EXPECT_EQ(host.broker().getInstance(names.paths[0]).status, CMPI_RC_ERR_NOT_FOUND);

    const broker::Reply whole = host.broker().associators(card, filter);
    ASSERT_TRUE(whole.ok());
    ASSERT_EQ(whole.objects.size(), 1u);
    EXPECT_EQ(identity(whole.objects[0].path), identity(names.paths[0]));
    EXPECT_GT(whole.objects[0].properties.size(), 2u) << "the instance, and not only its keys";
    const broker::Reply cut = host.broker().associators(card, filter, std::vector<std::string>{"Tag"});
    ASSERT_TRUE(cut.ok());
    EXPECT_EQ(cut.objects.at(0).properties.size(), 1u);
    host.unload();
}

/// What a search logs is what the enumeration logs that it stands for: locks, waits and refreshes are the same.
TEST(Operations, SearchesAreEnumerationsToTheLog)
{
    Host host;
    const Path card = host.instancesOf("TVRHBA_Card").at(0).path;
    const auto logOf = [&](auto operation)
    {
        const std::size_t before = host.log().size();
        operation();
        std::vector<std::string> lines = host.log();
        lines.erase(lines.begin(), lines.begin() + static_cast<std::ptrdiff_t>(before));
        std::erase_if(lines, [](const std::string& line) { return line.find("currenttime") != line.npos; });
        return lines;
    };
    const AssociationFilter filter{"TVRHBA_CardContainsChip", "", "", ""};
    host.enumerate("TVRHBA_CardContainsChip"); // loads its provider
    ASSERT_TRUE(host.awaitRefresh());
    const auto cards = logOf([&] { host.enumerate("TVRHBA_Card"); });
    const auto chips = logOf([&] { host.enumerate("TVRHBA_CardContainsChip"); });
    EXPECT_THAT(cards, testing::Contains("[TVR_DBG] TVRHBA_Card_Provider::enum_instances()"));
    EXPECT_EQ(logOf([&] { EXPECT_TRUE(host.broker().getInstance(card).ok()); }), cards);
    EXPECT_EQ(logOf([&] { host.broker().enumerateInstanceNames("root/tavrin", "TVRHBA_Card"); }), cards);
    EXPECT_EQ(logOf([&] { EXPECT_EQ(host.broker().associatorNames(card, filter).paths.size(), 1u); }), chips);
    EXPECT_EQ(logOf([&] { EXPECT_EQ(host.broker().references(card, filter).objects.size(), 1u); }), chips);

    // of the fabric, and refreshed live: of what the ports say as they are asked, a search of none shows nothing
    for (const char* className : {"TVRHBA_LogicalDisk", "TVRHBA_FCPort"})
    {
        host.enumerate(className); // loads its provider, and brings about the refresh that it needs
        ASSERT_TRUE(host.awaitRefresh(host.logged(created)));
        auto all = logOf([&] { host.enumerate(className); });
        const auto ofPorts = [](const std::string& line)
        {
            return line.find("PERF") == line.npos && line.find("TimeOut") == line.npos &&
                   line.find("BuildCimpleInfo") == line.npos && line.find("enum_instances") == line.npos;
        };
        std::erase_if(all, ofPorts);
        Path absent{"root/tavrin", className, {}};
        for (const char* key : {"SystemCreationClassName", "SystemName", "CreationClassName", "DeviceID"})
            absent.setKey(key, broker::Value::string("none"));
        EXPECT_EQ(logOf([&] { EXPECT_EQ(host.broker().getInstance(absent).status, CMPI_RC_ERR_NOT_FOUND); }), all);
    }
    host.unload();
}

TEST(Operations, UnknownPathsHaveNoAssociations)
{
    Host host;
    Path card = host.instancesOf("TVRHBA_Card").at(0).path;
    card.setKey("Tag", broker::Value::string("no such card"));
    const broker::NamesReply names = host.broker().associatorNames(card);
    const broker::Reply references = host.broker().references(card);
    EXPECT_TRUE(names.ok() && names.paths.empty());
    EXPECT_TRUE(references.ok() && references.objects.empty());
    host.unload();
}

} // namespace
