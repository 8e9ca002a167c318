// What the module's services do to its other elements.
#pragma once

#include "agent/Build.h"

namespace cimple
{

/// Says that a service manages an element. An absent end leaves nothing to say.
template <class Affects, class Service, class Element>
Joined affect(ProviderAgent& agent, const Service* service, const Element* element, const LogText& refused)
{
    constexpr std::uint16_t manages = 5; // CIM_ServiceAffectsElement.ElementEffects
    return join<Affects>(agent, &Affects::AffectingElement, service, &Affects::AffectedElement, element, refused,
                         [](Affects& affects) { affects.ElementEffects.set({manages}); });
}

} // namespace cimple
