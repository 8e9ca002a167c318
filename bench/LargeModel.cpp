// The model of the module for measurements of large maps: one product with as many cards as an environment variable
// says, in place of what the hardware has.
#include "agent/RefreshSteps.h"
#include "bench/Workloads.h"
#include "schema/TVRHBA_Product.h"
#include "schema/TVRHBA_ProductPhysicalComponent.h"

#include <cstdlib>

namespace cimple
{

namespace
{

std::uint32_t buildCards(HostContext& host)
{
    const char* wanted = std::getenv("TVR_BENCH_CARDS");
    const std::size_t count = wanted ? std::strtoul(wanted, nullptr, 10) : 0;
    Ref<TVRHBA_Product> made = fresh<TVRHBA_Product>();
    made->Name.set("product");
    made->IdentifyingNumber.set("1");
    made->Vendor.set("vendor");
    made->Version.set("1");
    const TVRHBA_Product* product = mapOf<TVRHBA_Product>(host.agent).insert(made, "the product was refused");
    using Component = TVRHBA_ProductPhysicalComponent;
    for (std::size_t i = 0; i < count; i++)
        join<Component>(host.agent, &Component::GroupComponent, product, &Component::PartComponent,
                        mapOf<TVRHBA_Card>(host.agent).insert(bench::makeCard(i), "a card was refused"),
                        "an association was refused");
    return BUILD_DONE;
}

constexpr HostStep hostSteps[] = {
    {buildCards, OnFailure::Stop, {}},
};

} // namespace

const RefreshSteps refreshSteps = {.host = hostSteps};

} // namespace cimple
