// Values as text: for people, in MOF, and back from the command line.
#pragma once

#include "broker/values/ClassInfo.h"

#include <string>
#include <string_view>

namespace broker
{

/// "uint16", "string[]", "reference", "instance"; "type N" for a code that names no CIM type.
std::string typeText(CMPIType type);

/// Plain form for tables: strings as they are, arrays as "[a, b]", null as "null", references as paths.
std::string valueText(const Value& value);

/// The number that the text of a real says: of one of 32 bits without the digits that only its bits add.
double decimalOf(const Value& real);

/// As an initialiser in MOF.
std::string mofValue(const Value& value);

/// Quotes a text and escapes quotes and backslashes in it.
std::string quoteText(std::string_view text);

/// What a text is read into.
struct Target
{
    const ClassTable& classes;
    std::string_view nameSpace; ///< of references that name none
    CMPIType type;
    std::string_view referenceClass; ///< of references and embedded instances
    std::size_t depth = 0;           ///< how many references it is within

    Target(const ClassTable& table, std::string_view space, const FeatureInfo& feature)
        : classes(table), nameSpace(space), type(feature.type), referenceClass(feature.referenceClass)
    {}
    Target(const ClassTable& table, std::string_view space, CMPIType valueType, std::string_view refClass = {})
        : classes(table), nameSpace(space), type(valueType), referenceClass(refClass)
    {}
    Target element() const { return {classes, nameSpace, static_cast<CMPIType>(type & ~CMPI_ARRAY), referenceClass}; }
};

/// Reads a value of the target's type. "null" is a null; arrays are "[a,b]" or JSON; embedded instances are JSON; a
/// text in double quotes is a JSON string. Throws std::invalid_argument with the reason.
Value parseValue(const Target& target, std::string_view text);

/// Reads a text that is as it stands a value of the target's type, which is no array. Throws std::invalid_argument with
/// the reason.
Value parseScalar(const Target& target, std::string_view text);

} // namespace broker
