// Emptying the maps of the two groups that the refresh rebuilds.
#include "agent/ClassCatalog.h"
#include "agent/ModelStages.h"
#include "agent/ProviderAgent.h"
#include "foundation/Log.h"

#include <cstring>

namespace cimple
{

namespace
{

enum class Theme
{
    RecordLog,
    SoftwareUpdate,
    SoftwareUpdateAssociations,
    Other,
};

/// The log marks the clearing of three themes; which rows belong to them shows in their names.
Theme themeOf(const ClassRow& row)
{
    if (std::strstr(row.name, "RecordLog") || std::strstr(row.name, "UseOfLog"))
        return Theme::RecordLog;
    if (std::strstr(row.name, "Install"))
        return row.association ? Theme::SoftwareUpdateAssociations : Theme::SoftwareUpdate;
    return Theme::Other;
}

void clearTheme(ProviderAgent& agent, Theme theme)
{
    for (const ClassRow& row : classCatalog())
        if (row.group == MapGroup::Adapter && themeOf(row) == theme)
            (agent.*row.map).clear();
}

} // namespace

void ProviderAgent::clearAdapterMaps()
{
    TVR_LOG(TVR_DBG, "PERF: Entered clearAdapterMaps()");
    try
    {
        m_CIM_ComputerSystem_map.clear();
        m_CIM_Chassis_map.clear();
        clearTheme(*this, Theme::Other);
        TVR_LOG(TVR_DBG, "Clearing Record Log maps");
        clearTheme(*this, Theme::RecordLog);
        TVR_LOG(TVR_DBG, "Clearing SoftwareUpdate maps");
        clearTheme(*this, Theme::SoftwareUpdate);
        TVR_LOG(TVR_DBG, "Clearing Software Update maps");
        clearTheme(*this, Theme::SoftwareUpdateAssociations);
        modelStages.clearDriverLogMaps(*this);
        modelStages.clearPortVirtualizationMaps(*this);
        TVR_LOG(TVR_DBG, "Clearing TVR CDM maps");
        modelStages.clearDiagnosticMaps(*this);
        TVR_LOG(TVR_DBG, "Done with Clearing CDM maps");
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Error in clearAdapterMaps()");
    }
    TVR_LOG(TVR_DBG, "Exiting clearAdapterMaps()");
}

void ProviderAgent::clearSANMaps()
{
    TVR_LOG(TVR_DBG, "PERF: Entered clearSANMaps()");
    try
    {
        for (const ClassRow& row : classCatalog())
            if (row.group == MapGroup::San)
                (this->*row.map).clear();
    }
    catch (...)
    {
        TVR_LOG(TVR_ERR, "Error in clearSANMaps()");
    }
    TVR_LOG(TVR_DBG, "Exiting clearSANMaps()");
}

} // namespace cimple
