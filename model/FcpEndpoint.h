// What the endpoints of the SCSI protocol over Fibre Channel have in common.
#pragma once

#include "agent/Build.h"

namespace cimple
{

/// CIM_SCSIProtocolEndpoint.Role.
enum class EndpointRole : std::uint16_t
{
    Initiator = 2,
    Target = 3,
};

/// Makes an endpoint, without a name, that is weak to the system.
template <class Endpoint> Ref<Endpoint> makeFcpEndpoint(const CIM_ComputerSystem& system, EndpointRole role)
{
    Ref<Endpoint> made = fresh<Endpoint>();
    setSystem(*made, system);
    made->CreationClassName.set(className<Endpoint>());
    made->ProtocolType.set(18);   // Fibre Channel
    made->ProtocolIFType.set(56); // the same, as IANA's ifType has it
    made->ConnectionType.set(2);
    made->Role.set(static_cast<std::uint16_t>(role));
    made->EnabledDefault.set(5);
    made->EnabledState.set(0);
    made->RequestedState.set(0);
    made->OperationalStatus.set({0});
    return made;
}

} // namespace cimple
