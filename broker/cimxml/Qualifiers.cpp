#include "broker/cimxml/Qualifiers.h"

#include "broker/values/Value.h"

#include <algorithm>
#include <cctype>
#include <string>

namespace cimxml
{

namespace
{

const char* flagText(bool flag)
{
    return flag ? "true" : "false";
}

/// Whether an element of that kind may have the qualifier.
const char* inScope(const cimple::Qualifier_Text& declaration, std::string_view kind)
{
    const std::string scopes = broker::lowerCase(declaration.scopes);
    return flagText(scopes.find(" any ") != scopes.npos || scopes.find(kind) != scopes.npos);
}

/// Booleans are written as in instances.
std::string defaultText(const cimple::Qualifier_Text& declaration)
{
    std::string text = declaration.default_value;
    if (declaration.type == std::string_view("boolean"))
        std::ranges::transform(text, text.begin(), [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
    return text;
}

} // namespace

std::span<const cimple::Qualifier_Text> qualifierDeclarations()
{
    return {cimple::qualifier_texts, cimple::num_qualifier_texts};
}

const cimple::Qualifier_Text* findQualifierDeclaration(std::string_view name)
{
    const auto all = qualifierDeclarations();
    const auto it = std::ranges::find_if(all, [&](const cimple::Qualifier_Text& known)
                                         { return broker::sameName(known.name, name); });
    return it == all.end() ? nullptr : &*it;
}

void writeQualifierDeclaration(XmlText& xml, const cimple::Qualifier_Text& declaration)
{
    const XmlElement whole(xml, "QUALIFIER.DECLARATION",
                           {{"NAME", declaration.name},
                            {"TYPE", declaration.type},
                            {"ISARRAY", flagText(declaration.is_array)},
                            {"OVERRIDABLE", flagText(declaration.overridable)},
                            {"TOSUBCLASS", flagText(declaration.to_subclass)},
                            {"TRANSLATABLE", flagText(declaration.translatable)}});
    xml.leaf("SCOPE", "",
             {{"CLASS", inScope(declaration, " class ")},
              {"ASSOCIATION", inScope(declaration, " association ")},
              {"REFERENCE", inScope(declaration, " reference ")},
              {"PROPERTY", inScope(declaration, " property ")},
              {"METHOD", inScope(declaration, " method ")},
              {"PARAMETER", inScope(declaration, " parameter ")},
              {"INDICATION", inScope(declaration, " indication ")}});
    if (declaration.default_value)
        xml.leaf("VALUE", defaultText(declaration));
}

} // namespace cimxml
