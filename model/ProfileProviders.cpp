#include "model/ProfileProviders.h"

#include "agent/Build.h"
#include "model/Profiles.h"
#include "runtime/threads/cimom.h"
#include "schema/PG_RegisteredProfile.h"

#include <algorithm>
#include <span>

namespace cimple
{

namespace
{

constexpr const ProfileRow& registration = profileRow("Profile Registration");

/// The component profiles, which refer to the registration and which the base server's profile refers to.
std::span<const ProfileRow> components()
{
    const auto* last = std::ranges::find_if(profileRows, [](const ProfileRow& row)
                                            { return &row == &profileRow("FCHBA Diagnostics"); });
    return {std::begin(profileRows) + 1, last + 1};
}

template <class Association>
Ref<Association> makeReference(Ref<TVRHBA_RegisteredProfile> antecedent, Ref<CIM_RegisteredProfile> dependent)
{
    Ref<Association> made = fresh<Association>();
    made->__name_space = interopNamespace;
    made->Antecedent = antecedent.release();
    made->Dependent = static_cast<decltype(made->Dependent)>(dependent.release());
    return made;
}

/// The platform's profile of a base server; null where the broker has none.
Ref<CIM_RegisteredProfile> findBaseServerProfile()
{
    TVR_LOG(TVR_DBG, "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile started");
    const Ref<PG_RegisteredProfile> model(create<PG_RegisteredProfile>());
    Instance_Enumerator instances;
    if (cimom::enum_instances(interopNamespace, model.get(), instances) == 0)
        for (; instances.more(); instances.next())
        {
            const Ref<> candidate(instances.get());
            const auto* profile = cast<CIM_RegisteredProfile>(candidate.get());
            if (!profile || profile->RegisteredName.null || profile->RegisteredName.value != "Base Server")
                continue;
            TVR_LOG(TVR_DBG, "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile Passed");
            Ref<CIM_RegisteredProfile> found(clone_of(profile));
            set_name_space(found.get(), interopNamespace, false);
            return found;
        }
    TVR_LOG(TVR_DBG, "up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile failed");
    return {};
}

/// Hands over what `make` gives for each row. What cannot be made for want of memory ends the answer, which says so.
template <class Make> int deliver(std::span<const ProfileRow> rows, Make make, Instance_Handler handler, void* client)
{
    for (const ProfileRow& row : rows)
    {
        auto made = unlessOutOfMemory([&] { return make(row); });
        if (!made)
        {
            handler(nullptr, ENUM_INSTANCES_FAILED, client);
            break;
        }
        handler(made.release(), 0, client);
    }
    return 0;
}

} // namespace

int enumerateRegisteredProfiles(Instance_Handler handler, void* client)
{
    return deliver(profileRows, makeRegisteredProfile, handler, client);
}

int enumerateReferencedProfiles(Instance_Handler handler, void* client)
{
    return deliver(
        components(),
        [](const ProfileRow& row)
        {
            return makeReference<TVRHBA_ReferencedProfile>(
                makeRegisteredProfile(registration), Ref<CIM_RegisteredProfile>(makeRegisteredProfile(row).release()));
        },
        handler, client);
}

int enumerateBaseServerReferencedProfiles(Instance_Handler handler, void* client)
{
    const unsigned leftOutBefore = left_out_for_memory;
    const Ref<CIM_RegisteredProfile> server = unlessOutOfMemory(findBaseServerProfile);
    if (!server && left_out_for_memory != leftOutBefore)
        handler(nullptr, ENUM_INSTANCES_FAILED, client);
    if (!server)
        return 0;
    return deliver(
        components(),
        [&](const ProfileRow& row)
        {
            return makeReference<TVRHBA_BaseServerReferencedProfile>(
                makeRegisteredProfile(row), Ref<CIM_RegisteredProfile>(clone_of(server.get())));
        },
        handler, client);
}

} // namespace cimple
