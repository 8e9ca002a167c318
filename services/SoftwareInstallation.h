// The software installation service: firmware from a client's bytes or from a URI, and small commands to a port.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_SoftwareInstallationService.h"

namespace cimple
{

/// All return 0, 4 where a byte stream cannot be saved, 5 for what is wrong in the parameters, and otherwise the status
/// of the step that failed. A target is a port, or any device with the DeviceID of one. The features of an HBA are
/// texts "NUMBER->VALUE".
std::span<const MethodRow> softwareInstallationMethods();

template <class Form> struct Extended<TVRHBA_SoftwareInstallationService, Form> : Form
{
    static std::span<const MethodRow> methods() { return softwareInstallationMethods(); }
};

} // namespace cimple
