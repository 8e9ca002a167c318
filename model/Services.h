// The services of the module, what they are hosted by and what they affect, and the remote management page.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

// --- steps of the host; each returns a BuildStatus and says itself what a failure was

/// With the service's capabilities and its profile.
std::uint32_t createSoftwareInstallationService(HostContext& host);
std::uint32_t createWWNService(HostContext& host);
std::uint32_t createFCTagService(HostContext& host);
std::uint32_t createBootBIOSService(HostContext& host);
std::uint32_t createDriverParameterService(HostContext& host);

/// The page of which the administrator has configured the URL; without one, nothing.
std::uint32_t createRemoteAccessPoint(HostContext& host);

// --- step of a port

/// What the services affect of a port.
std::uint32_t createPortServiceAssociations(PortContext& port);

} // namespace cimple
