#include "agent/ClassCatalog.h"

#include "schema/AllClasses.h"
#include "schema/CIM_Chassis.h"
#include "schema/CIM_ComputerSystem.h"

#include <iterator>

namespace cimple
{

namespace
{

const ClassRow rows[] = {
#define TVR_CLASS(name, form, group)                                                                                   \
    {"TVRHBA_" #name, &TVRHBA_##name::static_meta_class,    EnumerationForm::form, MapGroup::group,                    \
     false,           &InstanceCache::m_TVRHBA_##name##_map},
#define TVR_ASSOCIATION(name, form, group)                                                                             \
    {"TVRHBA_" #name,                                                                                                  \
     &TVRHBA_##name::static_meta_class,                                                                                \
     EnumerationForm::form,                                                                                            \
     MapGroup::group,                                                                                                  \
     true,                                                                                                             \
     &InstanceCache::m_TVRHBA_##name##_map},
#include "agent/ClassCatalog.def"
};
static_assert(std::size(rows) == 159);

} // namespace

std::span<const ClassRow> classCatalog()
{
    return rows;
}

InstanceCache::InstanceCache()
    : m_CIM_ComputerSystem_map(&CIM_ComputerSystem::static_meta_class),
      m_CIM_Chassis_map(&CIM_Chassis::static_meta_class),
      m_TVRHBA_DriverEnabledRecordLogCapabilities_map(&TVRHBA_EnabledRecordLogCapabilities::static_meta_class),
      m_TVRHBA_DriverProviderUseOfLog_map(&TVRHBA_ProviderUseOfLog::static_meta_class)
{
    for (const ClassRow& row : rows)
        (this->*row.map).meta_class = row.meta_class;
}

} // namespace cimple
