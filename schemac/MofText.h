// Declarations back as MOF text, in one plain form that all MOF compilers read.
#pragma once

#include "schemac/Model.h"

#include <string>

namespace schemac
{

std::string mof_of(const QualifierDeclaration& declaration);
std::string mof_of(const Class& c);

} // namespace schemac
