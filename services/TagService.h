// The FC tag service: frames between two ports get a tag for quality of service.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_FCTagService.h"

namespace cimple
{

/// The adapter behind the target gets the table of the file that the URI names.
std::uint32_t setConfigTable(const Instance* reference, TVRHBA_FCTagService_SetConfigTable_method& parameters);
/// Its table goes to a new file of the folder for tables, and from there to the URI if that is another host's.
std::uint32_t getConfigTable(const Instance* reference, TVRHBA_FCTagService_GetConfigTable_method& parameters);
std::uint32_t setGlobalFlag(const Instance* reference, TVRHBA_FCTagService_SetGlobalFlag_method& parameters);
std::uint32_t getGlobalFlag(const Instance* reference, TVRHBA_FCTagService_GetGlobalFlag_method& parameters);

template <class Form> struct Extended<TVRHBA_FCTagService, Form> : Form
{
    static std::span<const MethodRow> methods()
    {
        return methodTable<TVRHBA_FCTagService, &setConfigTable, &getConfigTable, &setGlobalFlag, &getGlobalFlag>;
    }
};

} // namespace cimple
