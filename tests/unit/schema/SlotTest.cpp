// Typed slots and the tables speak of the same bytes, and defaults arrive in new instances.
#include "schema/AllClasses.h"
#include "schema/Repository.h"

#include <gtest/gtest.h>

#include <cstring>

namespace cimple
{

namespace
{

/// The bytes of a feature as generic code finds them.
template <class T> T raw(const Instance* instance, const char* name, std::size_t behind = 0)
{
    const Meta_Feature* feature = find_feature(instance->__meta_class, name);
    const Meta_Property* mp = as_property(feature);
    const std::uint32_t offset = mp ? mp->offset : as_reference(feature)->offset;
    T value;
    std::memcpy(&value, reinterpret_cast<const char*>(instance) + offset + behind, sizeof value);
    return value;
}

TEST(Slots, OwnAndInheritedOnesAreWhereTheTablesSay)
{
    const Ref<TVRHBA_Card> card(create<TVRHBA_Card>(true));
    card->SLIMode.set(3);
    card->HostingBoard.set(true);
    card->Height.set(1.5f);
    EXPECT_EQ(raw<std::uint32_t>(card.get(), "SLIMode"), 3u);
    EXPECT_EQ(raw<std::uint8_t>(card.get(), "SLIMode", 4), 0);
    EXPECT_EQ(raw<bool>(card.get(), "HostingBoard"), true);
    EXPECT_EQ(raw<std::uint8_t>(card.get(), "HostingBoard", 1), 0);
    EXPECT_EQ(raw<float>(card.get(), "Height"), 1.5f);
    EXPECT_EQ(raw<std::uint8_t>(card.get(), "VendorSpecID", 4), 1);
    EXPECT_EQ(raw<std::uint8_t>(card.get(), "TVRSerialNumber", sizeof(void*)), 1);
}

TEST(Slots, OfANarrowedReferenceIsTheInheritedOne)
{
    const Ref<TVRHBA_CardContainsChip> link(create<TVRHBA_CardContainsChip>());
    TVRHBA_Card* card = create<TVRHBA_Card>();
    link->GroupComponent = card;
    EXPECT_EQ(raw<Instance*>(link.get(), "GroupComponent"), card);
    EXPECT_EQ(raw<Instance*>(link.get(), "PartComponent"), nullptr);
}

TEST(Slots, OfMethodRecordsAreWhereTheTablesSay)
{
    const Ref<Instance> record(create(&TVRHBA_FCHBAWWNService_ReadWWN_method::static_meta_method));
    auto* read = static_cast<TVRHBA_FCHBAWWNService_ReadWWN_method*>(record.get());
    read->Type.set(7);
    read->WWNN.set("1000000000000001");
    read->return_value.set(42);
    const Meta_Method& mm = TVRHBA_FCHBAWWNService_ReadWWN_method::static_meta_method;
    const auto value_at = [&](const char* name)
    { return reinterpret_cast<const char*>(read) + as_property(find_feature(&mm, name))->offset; };
    EXPECT_EQ(*reinterpret_cast<const std::uint16_t*>(value_at("Type")), 7);
    EXPECT_STREQ(reinterpret_cast<const String*>(value_at("WWNN"))->c_str(), "1000000000000001");
    EXPECT_EQ(*reinterpret_cast<const std::uint32_t*>(value_at("return_value")), 42u);
}

TEST(Defaults, OfTheSchemaStandInANewInstance)
{
    const Ref<TVRHBA_FCPort> port(create<TVRHBA_FCPort>(true));
    EXPECT_EQ(port->EnabledState.value, 5);
    EXPECT_EQ(port->RequestedState.value, 12);
    EXPECT_EQ(port->EnabledDefault.value, 2);
    EXPECT_EQ(port->TransitioningToState.value, 12);
    EXPECT_FALSE(port->EnabledState.is_null());
    EXPECT_TRUE(port->PortType.is_null());

    const Ref<TVRHBA_FCHBADiagnosticSettingData> settings(create<TVRHBA_FCHBADiagnosticSettingData>(true));
    EXPECT_EQ(settings->EchoMechanism.value, 2u);
    EXPECT_EQ(settings->PingMechanism.value, 2);
    EXPECT_EQ(settings->LUN.value, 0u);
    EXPECT_FALSE(settings->LUN.is_null());
    EXPECT_FALSE(settings->NonDestructive.value);
    EXPECT_FALSE(settings->NonDestructive.is_null());
    EXPECT_TRUE(settings->BufferPattern.is_null());
}

TEST(Defaults, OfTextsAndDatesAreRead)
{
    const Ref<TVRHBA_ConcreteJob> job(create<TVRHBA_ConcreteJob>(true));
    EXPECT_EQ(job->TimeBeforeRemoval.value.usec(), 300'000'000u);
    EXPECT_FALSE(job->TimeBeforeRemoval.is_null());

    const Ref<TVRHBA_ResourcePool> pool(create<TVRHBA_ResourcePool>(true));
    EXPECT_STREQ(pool->ConsumedResourceUnits.value.c_str(), "count");
}

} // namespace

} // namespace cimple
