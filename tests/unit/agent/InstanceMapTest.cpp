// The map against a naive vector of the same rules, over instances of related classes, null keys and references.
#include "agent/Instance_Map.h"

#include "schema/CIM_Card.h"
#include "schema/CIM_ComputerSystem.h"
#include "schema/IBMSD_ComputerSystem.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_FCPortStatistics.h"
#include "schema/TVRHBA_SystemDevice.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

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

/// A device association whose system is of one of two related classes, or absent.
Ref<> anyAssociation()
{
    Ref<TVRHBA_SystemDevice> association(create<TVRHBA_SystemDevice>());
    const int kind = *rc::gen::inRange(0, 4);
    if (kind == 0)
        return Ref<>(association.release());
    CIM_ComputerSystem* system = kind == 1 ? create<IBMSD_ComputerSystem>() : create<CIM_ComputerSystem>();
    system->Name.set(std::to_string(*rc::gen::inRange(0, 3)));
    system->CreationClassName.set("CIM_ComputerSystem");
    association->GroupComponent = system;
    return Ref<>(association.release());
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
