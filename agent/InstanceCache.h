// The instance cache: one map for each class of the catalog, and those that stand beside them.
#pragma once

#include "agent/Instance_Map.h"

namespace cimple
{

class InstanceCache
{
public:
    InstanceCache();

#define TVR_CLASS(name, form, group) Instance_Map m_TVRHBA_##name##_map;
#define TVR_ASSOCIATION(name, form, group) Instance_Map m_TVRHBA_##name##_map;
#include "agent/ClassCatalog.def"

    /// The host and its chassis, found by up-call or generated.
    Instance_Map m_CIM_ComputerSystem_map;
    Instance_Map m_CIM_Chassis_map;
    /// The driver log's own half of two classes that each of the two record logs has.
    Instance_Map m_TVRHBA_DriverEnabledRecordLogCapabilities_map;
    Instance_Map m_TVRHBA_DriverProviderUseOfLog_map;
};

} // namespace cimple
