#include "agent/ClassCatalog.h"

#include "schema/AllClasses.h"
#include "schema/CIM_Chassis.h"
#include "schema/CIM_ComputerSystem.h"

#include <iterator>

namespace cimple
{

namespace
{

#define TVR_ROW(name, form, association)                                                                               \
    {"TVRHBA_" #name, &TVRHBA_##name::static_meta_class, EnumerationForm::form, association,                           \
     &InstanceCache::m_TVRHBA_##name##_map},
const ClassRow rows[] = {
#define TVR_CLASS(name, form, group, does) TVR_ROW(name, form, false)
#define TVR_ASSOCIATION(name, form, group, does) TVR_ROW(name, form, true)
#include "agent/ClassCatalog.def"
};
static_assert(std::size(rows) == 159);

const MapRow maps[] = {
#define TVR_CLASS(name, form, group, does)                                                                             \
    {&InstanceCache::m_TVRHBA_##name##_map, &TVRHBA_##name::static_meta_class, MapGroup::group},
#define TVR_HOST_MAP(class, group) {&InstanceCache::m_##class##_map, &class ::static_meta_class, MapGroup::group},
#define TVR_SECOND_MAP(map, name, group)                                                                               \
    {&InstanceCache::m_TVRHBA_##map##_map, &TVRHBA_##name::static_meta_class, MapGroup::group},
#include "agent/ClassCatalog.def"
};

} // namespace

std::span<const ClassRow> classCatalog()
{
    return rows;
}

std::span<const MapRow> allMaps()
{
    return maps;
}

void clearGroup(InstanceCache& cache, MapGroup group)
{
    for (const MapRow& row : maps)
        if (row.group == group)
            (cache.*row.map).clear();
}

InstanceCache::InstanceCache()
{
    for (const MapRow& row : maps)
        (this->*row.map).meta_class = row.meta_class;
}

} // namespace cimple
