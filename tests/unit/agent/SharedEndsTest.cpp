// The copies that associations refer to: one for equal instances, and none that a later change shows in.
#include "agent/SharedEnds.h"

#include "schema/TVRHBA_Card.h"

#include <gtest/gtest.h>

using namespace cimple;

namespace
{

Ref<TVRHBA_Card> makeCard(const char* tag)
{
    Ref<TVRHBA_Card> card(create<TVRHBA_Card>());
    card->Tag.set(tag);
    return card;
}

TEST(SharedEnds, AreOneUntilTheInstanceChanges)
{
    const SharedEnds ends;
    const Ref<TVRHBA_Card> card = makeCard("a");
    const Ref<TVRHBA_Card> first = shared_end<TVRHBA_Card>(card.get());
    EXPECT_NE(first.get(), card.get());
    EXPECT_TRUE(identical(first.get(), card.get()));
    EXPECT_EQ(shared_end<TVRHBA_Card>(card.get()).get(), first.get());

    card->Model.set("new");
    const Ref<TVRHBA_Card> second = shared_end<TVRHBA_Card>(card.get());
    EXPECT_EQ(first->Model.value, "");
    EXPECT_EQ(second->Model.value, "new");
    EXPECT_EQ(shared_end<TVRHBA_Card>(card.get()).get(), second.get());
}

TEST(SharedEnds, AreNotThoseOfAnotherInstanceInTheSamePlace)
{
    const SharedEnds ends;
    Ref<TVRHBA_Card> card = makeCard("a");
    const void* place = card.get();
    shared_end<TVRHBA_Card>(card.get());
    card.reset();
    card = makeCard("b"); // mostly where the former was
    EXPECT_EQ(shared_end<TVRHBA_Card>(card.get())->Tag.value, "b") << (place == card.get());
}

TEST(SharedEnds, LiveAsLongAsTheRunAndWhatRefersToThem)
{
    const Ref<TVRHBA_Card> card = makeCard("a");
    Ref<TVRHBA_Card> kept;
    {
        const SharedEnds outer;
        kept = shared_end<TVRHBA_Card>(card.get());
        {
            const SharedEnds inner;
            EXPECT_NE(shared_end<TVRHBA_Card>(card.get()).get(), kept.get());
        }
        EXPECT_EQ(shared_end<TVRHBA_Card>(card.get()).get(), kept.get());
    }
    EXPECT_EQ(kept->__refs, 1u);
    EXPECT_NE(shared_end<TVRHBA_Card>(card.get()).get(), kept.get()) << "outside a run each is its own";
    EXPECT_EQ(shared_end<TVRHBA_Card>(nullptr).get(), nullptr);
}

} // namespace
