#include "runtime/adapter/CMPI_AdapterFrame.h"
#include "tests/unit/cmpi/FakeProvider.h"

#include <gtest/gtest.h>

namespace cimple
{
namespace
{

using namespace fake;

/// Links a-b, a-c and x-a of class T_SubLink; b is a T_Disk in a namespace of its own.
struct Association : testing::Test
{
    Broker broker;
    Provider provider{T_SubLink::static_meta_class};
    CMPIAssociationMI* mi = nullptr;
    Results results;

    void SetUp() override
    {
        mi = provider.make<CMPIAssociationMI>(broker, 'A');
        T_Disk* b = make_named<T_Disk>("h", "b");
        set_name_space(b, "root/far", true);
        provider.instances = {link(base("a"), b), link(base("a"), base("c")), link(base("x"), base("a"))};
        for (const char* name : {"c", "x"})
            broker.stored.push_back(broker.instance(path(name), {}));
        broker.stored.push_back(broker.instance(path("b", "T_Disk", "root/far"), {}));
    }
    void TearDown() override { mi->ft->cleanup(mi, broker.context(), 1); }

    static T_Base* base(const char* name) { return make_named<T_Base>("h", name); }
    static Ref<> link(T_Base* antecedent, T_Base* dependent)
    {
        return Ref<>(make_link<T_SubLink>(antecedent, dependent));
    }
    CMPIObjectPath* path(const char* name, const char* class_name = "T_Base", const char* name_space = "root/a")
    {
        return broker.path(class_name,
                           {{"System", string_of(broker.string("h"))}, {"Name", string_of(broker.string(name))}},
                           name_space);
    }

    /// The names found, as "ab" for b of a's links; a status other than OK shows as its number.
    std::string outcome(CMPIStatus status)
    {
        if (status.rc != CMPI_RC_OK)
            return std::to_string(status.rc);
        std::string names;
        for (const CMPIObjectPath* found : results.paths)
            names += end_name(named(found));
        for (const CMPIInstance* found : results.instances)
            names += end_name(named(named(found).path));
        EXPECT_EQ(results.done, 1);
        return names;
    }
    static std::string end_name(const Named& found)
    {
        if (found.entries.empty())
            return end_name(named(found.path));
        if (const CMPIData* name = found.find("Name"))
            return text(name->value.string);
        return end_name(named(found.find("Antecedent")->value.ref)) +
               end_name(named(found.find("Dependent")->value.ref)) + " ";
    }

    std::string associator_names(const char* assoc_class = nullptr, const char* result_class = nullptr,
                                 const char* role = nullptr, const char* result_role = nullptr)
    {
        results = Results();
        return outcome(mi->ft->associatorNames(mi, broker.context(), broker.result(results), path("a"), assoc_class,
                                               result_class, role, result_role));
    }
    std::string associators(const char** properties = nullptr)
    {
        results = Results();
        return outcome(mi->ft->associators(mi, broker.context(), broker.result(results), path("a"), nullptr, nullptr,
                                           "Antecedent", nullptr, properties));
    }
    std::string reference_names(const char* result_class = nullptr, const char* role = nullptr,
                                const char* source_class = "T_Base")
    {
        results = Results();
        return outcome(mi->ft->referenceNames(mi, broker.context(), broker.result(results), path("a", source_class),
                                              result_class, role));
    }
};

TEST_F(Association, references_are_filtered_by_role_and_class)
{
    EXPECT_EQ(reference_names(), "ab ac xa ");
    EXPECT_EQ(named(results.paths[0]).name_space, "root/a");
    EXPECT_EQ(reference_names(nullptr, "dependent"), "xa ");
    EXPECT_EQ(reference_names("", ""), "ab ac xa ");
    EXPECT_EQ(reference_names("t_link"), "ab ac xa ") << "a superclass of the association";
    EXPECT_EQ(reference_names("T_SubLink"), "ab ac xa ");
    EXPECT_EQ(reference_names("T_Base"), "");
    EXPECT_EQ(reference_names(nullptr, nullptr, "T_Nothing"), "") << "an unknown class is an empty answer";
}

TEST_F(Association, references_return_whole_associations)
{
    const CMPIStatus status =
        mi->ft->references(mi, broker.context(), broker.result(results), path("a"), nullptr, "Dependent", nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_OK);
    ASSERT_EQ(results.instances.size(), 1u);
    EXPECT_EQ(end_name(named(results.instances[0])), "xa ");
}

TEST_F(Association, references_keep_null_what_is_null)
{
    auto& association = static_cast<T_SubLink&>(*provider.instances[0]);
    association.Note.set_null();
    const auto note = [&](const char** properties) -> const CMPIData*
    {
        results = Results();
        mi->ft->references(mi, broker.context(), broker.result(results), path("b", "T_Disk"), nullptr, nullptr,
                           properties);
        EXPECT_EQ(results.instances.size(), 1u);
        return named(results.instances.at(0)).find("Note");
    };
    EXPECT_EQ(note(nullptr), nullptr) << "all properties, and none made up";
    association.Note.set("text");
    EXPECT_NE(note(nullptr), nullptr);
    const char* others[] = {"Antecedent", nullptr};
    EXPECT_EQ(note(others), nullptr);
}

TEST_F(Association, associator_names_pass_every_filter)
{
    EXPECT_EQ(associator_names(), "bcx");
    EXPECT_EQ(named(results.paths[0]).name_space, "root/far") << "the end's own namespace";
    EXPECT_EQ(named(results.paths[1]).name_space, "root/a");
    EXPECT_EQ(associator_names(nullptr, nullptr, "Antecedent"), "bc");
    EXPECT_EQ(associator_names(nullptr, nullptr, nullptr, "Antecedent"), "x");
    EXPECT_EQ(associator_names("T_SubLink"), "bcx") << "one server names the provider's own class on each call";
    EXPECT_EQ(associator_names("T_Link"), "bcx");
    EXPECT_EQ(associator_names("T_Disk"), "b") << "the class of the end";
    EXPECT_EQ(associator_names("T_Odd"), "");
    EXPECT_EQ(associator_names("T_Link", "T_Disk"), "b");
    EXPECT_EQ(associator_names(nullptr, "T_OtherDisk"), "");
}

TEST_F(Association, associators_are_served_by_their_own_providers)
{
    EXPECT_EQ(associators(), "bc");
    EXPECT_EQ(results.instances[0], broker.stored[2]) << "what the broker has, not what the association holds";

    broker.upcall_answer = CMPI_RC_ERR_ACCESS_DENIED;
    broker.events.clear();
    EXPECT_EQ(associators(), std::to_string(CMPI_RC_ERR_ACCESS_DENIED));
    EXPECT_EQ(broker.events.size(), 1u) << "the first failure ends the up-calls";
}

/// Ends of classes that the module does not serve, like those of a platform that has gone or was never there.
TEST_F(Association, associators_hold_the_ends_that_nobody_serves)
{
    Provider disks(T_Disk::static_meta_class), bases(T_Base::static_meta_class);
    bases.registration.next = &disks.registration;
    const Lasting_End lasting[] = {{"T_Odd", nullptr}, {"t_link", "t_base"}};
    const Module_Info only_disks = {&disks.registration, {}};
    const Module_Info both = {&bases.registration, {}};
    const Module_Info both_lasting = {&bases.registration, lasting};
    const auto in_module = [&](const Module_Info& module, const char** properties = nullptr)
    {
        mi->ft->cleanup(mi, broker.context(), 1);
        provider.module = &module;
        mi = provider.make<CMPIAssociationMI>(broker, 'A');
        return associators(properties);
    };
    const std::string not_found = std::to_string(CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(in_module(only_disks), "bc");
    EXPECT_EQ(results.instances[1], broker.stored[0]) << "the broker has it";

    broker.stored.erase(broker.stored.begin()); // c
    const char* wanted[] = {"Caption", nullptr};
    EXPECT_EQ(in_module(only_disks, wanted), "bc");
    EXPECT_EQ(named(results.instances[1]).filter, std::vector<std::string>{"Caption"});
    EXPECT_EQ(named(named(results.instances[1]).path).name_space, "root/a");
    EXPECT_EQ(in_module(both), not_found) << "served, and gone";
    EXPECT_EQ(in_module(both_lasting), "bc") << "served, and kept";

    broker.stored.clear(); // b, which is a disk as well as a base
    EXPECT_EQ(in_module(only_disks), not_found);
    broker.upcall_answer = CMPI_RC_ERR_ACCESS_DENIED;
    EXPECT_EQ(in_module(both_lasting), std::to_string(CMPI_RC_ERR_ACCESS_DENIED)) << "only what is gone is kept";
    provider.instances.erase(provider.instances.begin());
    EXPECT_EQ(in_module(only_disks), "c") << "whatever the failure";
}

TEST_F(Association, statuses_of_the_broker_alone_fail_the_request)
{
    for (CMPIrc foreign : {CMPI_RC_ERROR_SYSTEM, CMPI_RC_ERROR})
    {
        broker.upcall_answer = foreign;
        EXPECT_EQ(associators(), std::to_string(CMPI_RC_ERR_FAILED));
    }
    EXPECT_EQ(Outcome(CMPI_RC_ERROR_SYSTEM).logged, CMPI_RC_ERROR_SYSTEM);
    EXPECT_EQ(Outcome(CMPI_RC_ERR_INVALID_DATA_TYPE).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
}

TEST_F(Association, associators_with_properties_go_first)
{
    provider.on_associators = [](Instance_Handler handler, void* client)
    {
        handler(base("direct"), PROVIDER_OK, client);
        return handler(nullptr, PROVIDER_OK, client);
    };
    provider.answers[OP_ASSOCIATORS_WITH_PROPERTIES] = PROVIDER_OK;
    EXPECT_EQ(associators(), "direct");
    EXPECT_EQ(provider.seen_role, "Antecedent");
    EXPECT_EQ(provider.count(OP_ENUM_INSTANCES), 0);
    provider.answers[OP_ASSOCIATORS_WITH_PROPERTIES] = ASSOCIATORS_PROPERTIES_ACCESS_DENIED;
    EXPECT_EQ(associators(), std::to_string(CMPI_RC_ERR_ACCESS_DENIED));
}

TEST_F(Association, failures_are_those_of_the_operation_or_of_the_enumeration)
{
    provider.answers[OP_ENUM_INSTANCES] = ENUM_INSTANCES_ACCESS_DENIED;
    EXPECT_EQ(associator_names(), std::to_string(CMPI_RC_ERR_ACCESS_DENIED));
    EXPECT_EQ(reference_names(), std::to_string(CMPI_RC_ERR_ACCESS_DENIED));
    provider.answers[OP_REFERENCES] = REFERENCES_FAILED;
    EXPECT_EQ(reference_names(), std::to_string(CMPI_RC_ERR_FAILED));
    provider.answers[OP_ASSOCIATORS] = PROVIDER_OK; // final, with nothing sent
    EXPECT_EQ(associator_names(), "");

    Provider no_association(T_Disk::static_meta_class);
    auto* other = no_association.make<CMPIAssociationMI>(broker, 'A');
    EXPECT_EQ(other->ft
                  ->associatorNames(other, broker.context(), broker.result(results), path("a"), nullptr, nullptr,
                                    nullptr, nullptr)
                  .rc,
              CMPI_RC_ERR_FAILED);
    EXPECT_EQ(
        other->ft->referenceNames(other, broker.context(), broker.result(results), path("a"), nullptr, nullptr).rc,
        CMPI_RC_ERR_FAILED);
    other->ft->cleanup(other, broker.context(), 1);
}

} // namespace
} // namespace cimple
