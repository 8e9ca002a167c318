// The instance cache: one map for each class of the catalog, and those that stand beside them.
#pragma once

#include "agent/Instance_Map.h"

namespace cimple
{

class InstanceCache
{
public:
    InstanceCache();

#define TVR_CLASS(name, form, group, does) Instance_Map m_TVRHBA_##name##_map;
#define TVR_HOST_MAP(class, group) Instance_Map m_##class##_map;
#define TVR_SECOND_MAP(map, name, group) Instance_Map m_TVRHBA_##map##_map;
#include "agent/ClassCatalog.def"
};

} // namespace cimple
