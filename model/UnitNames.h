// What a logical unit is called, by the identifier that it has of itself.
#pragma once

#include "foundation/CommonHelpers.h"

namespace cimple
{

class CIM_StorageVolume;

/// The identifier, which is the designator as text, as the name of the unit. That of an NAA name leaves out its head.
String refinedName(const Descriptor& designator, const char* identifier);

/// What a volume says of its name.
void setNameFormat(CIM_StorageVolume& volume, const Descriptor& designator);

} // namespace cimple
