// The schema's declarations of qualifiers as elements of CIM-XML (DSP0201).
#pragma once

#include "broker/cimxml/XmlText.h"
#include "schema/SchemaTexts.h"

#include <span>
#include <string_view>

namespace cimxml
{

std::span<const cimple::Qualifier_Text> qualifierDeclarations();
/// Any case; null if the schema declares none of that name.
const cimple::Qualifier_Text* findQualifierDeclaration(std::string_view name);
/// QUALIFIER.DECLARATION
void writeQualifierDeclaration(XmlText& xml, const cimple::Qualifier_Text& declaration);

} // namespace cimxml
