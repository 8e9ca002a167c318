// The map against a naive vector of the same rules, over instances of related classes, null keys and references.
#include "agent/Instance_Map.h"

#include "schema/CIM_Card.h"
#include "schema/CIM_Chassis.h"
#include "schema/CIM_ComputerSystem.h"
#include "schema/CIM_ElementSoftwareIdentity.h"
#include "schema/IBMSD_ComputerSystem.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_ChassisContainsCard.h"
#include "schema/TVRHBA_FCPortStatistics.h"
#include "schema/TVRHBA_SystemDevice.h"
#include "tests/support/NoMemory.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <algorithm>
#include <optional>
#include <string>
#include <vector>

using namespace cimple;

namespace
{

template <class Card> Ref<Card> makeCard(const std::string& tag, bool nullClass)
{
    Ref<Card> card(create<Card>());
    card->Tag.set(tag);
    card->CreationClassName.set("TVRHBA_Card");
    if (nullClass)
        card->CreationClassName.set_null();
    return card;
}

/// What the map promises, without its fingerprints.
class NaiveMap
{
public:
    std::ptrdiff_t insert(const Ref<>& instance)
    {
        if (find(instance.get()) != -1)
            return -1;
        _entries.push_back(instance);
        return static_cast<std::ptrdiff_t>(_entries.size()) - 1;
    }
    std::ptrdiff_t find(const Instance* keys) const
    {
        for (std::size_t i = 0; i < _entries.size(); i++)
            if (key_eq(keys, _entries[i].get()))
                return static_cast<std::ptrdiff_t>(i);
        return -1;
    }
    /// Those that refer to an instance with the keys of `end`.
    std::vector<const Instance*> with_end(const Instance* end) const
    {
        std::vector<const Instance*> found;
        for (const Ref<>& entry : _entries)
            if (references_match(end, entry.get(), nullptr))
                found.push_back(entry.get());
        return found;
    }
    const Instance* at(std::ptrdiff_t index) const { return _entries[static_cast<std::size_t>(index)].get(); }
    bool remove(const Instance* keys)
    {
        const std::ptrdiff_t index = find(keys);
        if (index != -1)
            _entries.erase(_entries.begin() + index);
        return index != -1;
    }
    std::size_t size() const { return _entries.size(); }

private:
    std::vector<Ref<>> _entries;
};

/// A card of one of two related classes; few tags, so that keys meet.
Ref<> anyCard()
{
    const std::string tag = "card" + std::to_string(*rc::gen::inRange(0, 12));
    const bool nullClass = *rc::gen::weightedElement<bool>({{5, false}, {1, true}});
    if (*rc::gen::weightedElement<bool>({{4, true}, {1, false}}))
        return Ref<>(makeCard<TVRHBA_Card>(tag, nullClass).release());
    return Ref<>(makeCard<CIM_Card>(tag, nullClass).release());
}

/// A system of one of two related classes, or none.
CIM_ComputerSystem* anySystem()
{
    const int kind = *rc::gen::inRange(0, 4);
    if (kind == 0)
        return nullptr;
    CIM_ComputerSystem* system = kind == 1 ? create<IBMSD_ComputerSystem>() : create<CIM_ComputerSystem>();
    system->Name.set(std::to_string(*rc::gen::inRange(0, 3)));
    system->CreationClassName.set("CIM_ComputerSystem");
    return system;
}

/// A device association whose system is of one of two related classes, or absent.
Ref<> anyAssociation()
{
    Ref<TVRHBA_SystemDevice> association(create<TVRHBA_SystemDevice>());
    association->GroupComponent = anySystem();
    return Ref<>(association.release());
}

/// An association of a class whose ends are declared without keys: systems and cards at either of them, in most maps of
/// one class at each. A few are of a superclass.
Ref<> anyDependency()
{
    const bool strange = *rc::gen::weightedElement<bool>({{60, false}, {1, true}});
    Ref<CIM_Dependency> association(strange ? create<CIM_Dependency>() : create<CIM_ElementSoftwareIdentity>());
    const auto end = []() -> CIM_ManagedElement*
    {
        if (*rc::gen::inRange(0, 12) == 0)
            return static_cast<CIM_ManagedElement*>(anyCard().release());
        return anySystem();
    };
    association->Antecedent = end();
    association->Dependent = end();
    return Ref<>(association.release());
}

/// A system or a card to look for at the ends.
Ref<> anyEnd()
{
    Ref<> system(anySystem());
    return system ? system : anyCard();
}

std::vector<const Instance*> entriesOf(const Instance_Map& map)
{
    std::vector<const Instance*> entries;
    for (std::size_t i = 0; const Instance* entry = map.at(i); i++)
        entries.push_back(entry);
    return entries;
}

bool haveSameKeys(const std::vector<const Instance*>& a, const std::vector<const Instance*>& b)
{
    return std::equal(a.begin(), a.end(), b.begin(), b.end(), key_eq);
}

/// Selections give what a look at every entry gives, in its order.
void selectsAsNaive(const Instance_Map& map, const NaiveMap& naive, const Instance* sought)
{
    const bool names = *rc::gen::arbitrary<bool>();
    Instance_Map one(map.meta_class);
    RC_ASSERT(!map.copy_to(one, {.keys = sought, .names = names}));
    const std::ptrdiff_t index = naive.find(sought);
    RC_ASSERT(one.size() == (index == -1 ? 0u : 1u));
    if (index != -1)
        RC_ASSERT(key_eq(one.at(0), naive.at(index)));

    const Ref<> end = anyEnd();
    Instance_Map referring(map.meta_class);
    RC_ASSERT(!map.copy_to(referring, {.end = end.get(), .names = names}));
    RC_ASSERT(haveSameKeys(entriesOf(referring), naive.with_end(end.get())));
}

template <class Make> void behavesAsNaive(Make make)
{
    Instance_Map map(&CIM_Card::static_meta_class);
    NaiveMap naive;
    const int steps = *rc::gen::inRange(1, 60);
    for (int step = 0; step < steps; step++)
    {
        const Ref<> instance = make();
        if (*rc::gen::inRange(0, 5) == 0)
        {
            RC_ASSERT((map.remove(instance.get()) == 0) == naive.remove(instance.get()));
        }
        else
        {
            Ref<> owned(clone(instance.get()));
            const std::ptrdiff_t index = map.insert(owned.get());
            if (index != -1)
                owned.release();
            RC_ASSERT(index == naive.insert(instance));
        }
        const Ref<> sought = make();
        RC_ASSERT(map.find(sought.get()) == naive.find(sought.get()));
        RC_ASSERT(map.size() == naive.size());
        selectsAsNaive(map, naive, sought.get());
    }
}

TEST(InstanceMap, BehavesAsANaiveVectorOfCards)
{
    EXPECT_TRUE(rc::check([] { behavesAsNaive(anyCard); }));
}

TEST(InstanceMap, BehavesAsANaiveVectorOfAssociations)
{
    EXPECT_TRUE(rc::check([] { behavesAsNaive(anyAssociation); }));
}

TEST(InstanceMap, BehavesAsANaiveVectorOfAssociationsOfAnything)
{
    EXPECT_TRUE(rc::check([] { behavesAsNaive(anyDependency); }));
}

TEST(InstanceMap, ModifyCopiesWhatTheModelHasAndKeepsTheKeys)
{
    Instance_Map map(&TVRHBA_Card::static_meta_class);
    Ref<TVRHBA_Card> card = makeCard<TVRHBA_Card>("a", false);
    card->Model.set("old");
    ASSERT_EQ(map.create(card.get()), 0);
    EXPECT_EQ(map.create(card.get()), CREATE_INSTANCE_DUPLICATE);

    Ref<TVRHBA_Card> change = makeCard<TVRHBA_Card>("a", false);
    change->Model.set("new");
    change->Name.set("not wanted");
    Ref<TVRHBA_Card> model(clone_of(change.get()));
    nullify(model.get(), false, true, 1);
    model->Model.null = 0;
    ASSERT_EQ(map.modify(change.get(), model.get()), 0);
    Instance* got = nullptr;
    ASSERT_EQ(map.get(card.get(), got), 0);
    const Ref<TVRHBA_Card> result(static_cast<TVRHBA_Card*>(got));
    EXPECT_EQ(result->Model.value, "new");
    EXPECT_EQ(result->Name.value, "");

    Ref<TVRHBA_Card> other = makeCard<TVRHBA_Card>("b", false);
    EXPECT_EQ(map.modify(other.get(), other.get()), MODIFY_INSTANCE_NOT_FOUND);
    EXPECT_EQ(map.get(other.get(), got), GET_INSTANCE_NOT_FOUND);
    EXPECT_EQ(map.remove(other.get()), DELETE_INSTANCE_NOT_FOUND);
}

TEST(InstanceMap, RemoveAtKeepsTheOthersFindable)
{
    Instance_Map map(&TVRHBA_Card::static_meta_class);
    for (int i = 0; i < 100; i++)
        ASSERT_EQ(map.insert(makeCard<TVRHBA_Card>(std::to_string(i), false).release()), i);
    Ref<> taken(map.remove_at(40));
    ASSERT_TRUE(taken);
    EXPECT_EQ(map.remove_at(99), nullptr);
    EXPECT_EQ(map.find(taken.get()), -1);
    EXPECT_EQ(map.find(makeCard<TVRHBA_Card>("41", false).get()), 40);
    EXPECT_EQ(map.find(makeCard<TVRHBA_Card>("99", false).get()), 98);

    map.clear();
    EXPECT_EQ(map.size(), 0u);
    EXPECT_EQ(map.insert(taken.release()), 0);
}

/// Where a large map keeps its fingerprints, entries come, go and move up like those of a vector.
TEST(InstanceMap, LargeMapBehavesAsANaiveVector)
{
    Instance_Map map(&TVRHBA_Card::static_meta_class);
    NaiveMap naive;
    std::uint32_t random = 1;
    const auto below = [&](std::uint32_t limit) { return ((random = random * 1664525 + 1013904223) >> 8) % limit; };
    for (int step = 0; step < 1500; step++)
    {
        const Ref<> card(makeCard<TVRHBA_Card>(std::to_string(below(400)), false).release());
        const bool removes = below(8) == 0 || (step > 1000 && below(2) == 0);
        if (removes)
        {
            ASSERT_EQ(map.remove(card.get()) == 0, naive.remove(card.get())) << step;
        }
        else
        {
            Ref<> owned(clone(card.get()));
            const std::ptrdiff_t index = map.insert(owned.get());
            if (index != -1)
                static_cast<void>(owned.release());
            ASSERT_EQ(index, naive.insert(card)) << step;
        }
        const Ref<TVRHBA_Card> sought = makeCard<TVRHBA_Card>(std::to_string(below(400)), false);
        ASSERT_EQ(map.find(sought.get()), naive.find(sought.get())) << step;
        ASSERT_EQ(map.size(), naive.size());
    }
    EXPECT_GT(map.size(), 100u);
    while (map.size() != 0) // from the front, until it is small again
    {
        Ref<> first(map.remove_at(0));
        ASSERT_EQ(map.find(first.get()), -1);
        if (map.size() != 0)
        {
            ASSERT_EQ(map.find(map.at(map.size() - 1)), static_cast<std::ptrdiff_t>(map.size()) - 1);
        }
    }
    EXPECT_EQ(map.insert(makeCard<TVRHBA_Card>("1", false).release()), 0);
}

TEST(InstanceMap, CopiesForReadersKnowNothingOfLaterChanges)
{
    Instance_Map map(&TVRHBA_SystemDevice::static_meta_class);
    Ref<TVRHBA_SystemDevice> association(create<TVRHBA_SystemDevice>());
    association->GroupComponent = create<CIM_ComputerSystem>();
    association->GroupComponent->ElementName.set("a");
    map.insert(clone(association.get()));
    Instance_Map local(map.meta_class);
    ASSERT_EQ(map.copy_to(local, {}), std::nullopt);
    auto* entry = static_cast<TVRHBA_SystemDevice*>(map.at(0));
    auto* copied = static_cast<TVRHBA_SystemDevice*>(local.at(0));
    EXPECT_EQ(copied->GroupComponent, entry->GroupComponent);

    association->GroupComponent->Caption.set("new");
    ASSERT_EQ(map.modify(association.get(), nullptr), 0);
    EXPECT_EQ(entry->GroupComponent->Caption.value, "new");
    EXPECT_EQ(copied->GroupComponent->Caption.value, "");

    std::vector<Ref<>> given;
    const auto keep = [](Instance* instance, int status, void* client)
    {
        EXPECT_EQ(status, 0);
        static_cast<std::vector<Ref<>>*>(client)->emplace_back(instance);
        return false; // not looked at
    };
    local.insert(create<TVRHBA_SystemDevice>());
    map.clear();
    local.give_away(keep, &given);
    EXPECT_EQ(local.size(), 0u);
    ASSERT_EQ(given.size(), 2u);
    EXPECT_EQ(given[0].get(), copied);
    EXPECT_EQ(static_cast<TVRHBA_SystemDevice*>(given[0].get())->GroupComponent->ElementName.value, "a");
}

TEST(InstanceMap, FindsTheEndsOfAnotherClassOnceItWasEmpty)
{
    Instance_Map map(&CIM_ManagedElement::static_meta_class);
    const auto referringTo = [&](const Instance* end)
    {
        Instance_Map found(map.meta_class);
        EXPECT_EQ(map.copy_to(found, {.end = end}), std::nullopt);
        return found.size();
    };
    const Ref<TVRHBA_Card> card = makeCard<TVRHBA_Card>("a", false);
    const Ref<CIM_ComputerSystem> system(create<CIM_ComputerSystem>());
    auto* device = create<TVRHBA_SystemDevice>();
    device->GroupComponent = clone_of(system.get());
    map.insert(device);
    EXPECT_EQ(referringTo(system.get()), 1u);
    EXPECT_EQ(referringTo(card.get()), 0u);

    EXPECT_EQ(map.remove(device), 0);
    auto* identity = create<CIM_ElementSoftwareIdentity>();
    identity->Dependent = clone_of(card.get());
    map.insert(identity);
    EXPECT_EQ(referringTo(system.get()), 0u);
    EXPECT_EQ(referringTo(card.get()), 1u);
}

TEST(InstanceMap, ASearchWithoutMemoryHidesNothingFromTheNext)
{
    const Ref<TVRHBA_Card> card = makeCard<TVRHBA_Card>("a", false);
    const Ref<CIM_ComputerSystem> system(create<CIM_ComputerSystem>());
    const std::size_t failures = test_support::withEachAllocationFailing(
        [&]
        {
            Instance_Map map(&TVRHBA_ChassisContainsCard::static_meta_class);
            Ref<TVRHBA_ChassisContainsCard> contains(create<TVRHBA_ChassisContainsCard>());
            contains->GroupComponent = create<CIM_Chassis>();
            contains->PartComponent = clone_of(card.get());
            if (map.create(contains.get()) != 0)
                return;
            const auto referring = [&](const Instance* end)
            {
                Instance_Map found(map.meta_class);
                map.copy_to(found, {.end = end});
                return found.size();
            };
            try
            {
                EXPECT_EQ(referring(contains->GroupComponent), 1u);
            }
            catch (const std::bad_alloc&)
            {
                EXPECT_EQ(referring(card.get()), 1u);
                EXPECT_EQ(referring(contains->GroupComponent), 1u);
            }
        });
    EXPECT_GT(failures, 8u);
}

TEST(InstanceMap, CopiesEndAtADuplicate)
{
    Instance_Map map(&TVRHBA_Card::static_meta_class);
    for (const char* tag : {"a", "b", "c", "d"})
        map.insert(makeCard<TVRHBA_Card>(tag, false).release());
    static_cast<TVRHBA_Card*>(map.at(2))->Tag.set("b"); // which nobody may do
    Instance_Map local(map.meta_class);
    EXPECT_EQ(map.copy_to(local, {}), 2u);
    EXPECT_EQ(local.size(), 2u);
}

TEST(InstanceMap, WalksGiveClonesThatOutliveTheMap)
{
    std::vector<Ref<>> seen;
    {
        Instance_Map map(&TVRHBA_Card::static_meta_class);
        map.insert(makeCard<TVRHBA_Card>("a", false).release());
        map.insert(makeCard<TVRHBA_Card>("b", false).release());
        map.for_each(
            [](Instance* instance, int, void* client)
            {
                static_cast<std::vector<Ref<>>*>(client)->emplace_back(instance);
                return false; // not looked at
            },
            &seen);
    }
    ASSERT_EQ(seen.size(), 2u);
    EXPECT_EQ(static_cast<TVRHBA_Card*>(seen[1].get())->Tag.value, "b");
}

} // namespace
