// The software installation service: firmware from a client's bytes or from a URI, and small commands to a port.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_SoftwareInstallationService.h"

namespace cimple
{

// The return values of all: 0, 4 where the byte stream cannot be saved, 5 for what is wrong in the parameters, and
// otherwise the status of the step that failed. A target is a port, or anything with the DeviceID of one.

std::uint32_t installFromByteStream(const Instance* reference,
                                    CIM_SoftwareInstallationService_InstallFromByteStream_method& parameters);
std::uint32_t installFromURI(const Instance* reference,
                             CIM_SoftwareInstallationService_InstallFromURI_method& parameters);
std::uint32_t resetHBA(const Instance* reference, TVRHBA_SoftwareInstallationService_ResetHBA_method& parameters);
std::uint32_t setPortEnabled(const Instance* reference,
                             TVRHBA_SoftwareInstallationService_SetPortEnabled_method& parameters);
/// `Features` gets a text "NUMBER->VALUE" for each feature.
std::uint32_t getHBAFeatures(const Instance* reference,
                             TVRHBA_SoftwareInstallationService_GetHBAFeatures_method& parameters);
std::uint32_t setFECState(const Instance* reference, TVRHBA_SoftwareInstallationService_SetFECState_method& parameters);

template <class Form> struct Extended<TVRHBA_SoftwareInstallationService, Form> : Form
{
    static std::span<const MethodRow> methods()
    {
        return methodTable<TVRHBA_SoftwareInstallationService, &installFromByteStream, &installFromURI, &resetHBA,
                           &setPortEnabled, &getHBAFeatures, &setFECState>;
    }
};

} // namespace cimple
