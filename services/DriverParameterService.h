// The service that changes driver parameters and takes priority lanes away.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_FCHBADriverParamService.h"

namespace cimple
{

/// The library's status, 1 for an argument that it cannot get, 32968 for an unknown port.
std::uint32_t setDriverParameter(const Instance* reference,
                                 TVRHBA_FCHBADriverParamService_SetDriverParameter_method& parameters);
/// The library's status, or 32968 for ports or an option that are not known.
std::uint32_t disableAllPrioLaneLuns(const Instance* reference,
                                     TVRHBA_FCHBADriverParamService_DisableAllPrioLaneLuns_method& parameters);

template <class Form> struct Extended<TVRHBA_FCHBADriverParamService, Form> : Form
{
    static std::span<const MethodRow> methods()
    {
        return methodTable<TVRHBA_FCHBADriverParamService, &setDriverParameter, &disableAllPrioLaneLuns>;
    }
};

} // namespace cimple
