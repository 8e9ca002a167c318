// What CIM types and qualifiers become in the generated code.
#pragma once

#include "schemac/Model.h"

#include <string>
#include <string_view>

namespace schemac
{

/// The subscript stands in 16 signed bits of the meta record.
inline constexpr int max_subscript = 32767;

enum class TypeClass
{
    Boolean,
    Unsigned,
    Signed,
    Real,
    Text,
    Datetime,
};

struct TypeRow
{
    const char* name; ///< in MOF
    const char* code; ///< enumerator in runtime/meta/Meta.h
    const char* cpp;  ///< type of the value in a slot
    TypeClass type_class;
    unsigned bits; ///< of a number
};

/// The row of a CIM type; null if the name is none.
const TypeRow* find_type(std::string_view name);

/// Bytes of a scalar slot without its null byte, as an expression.
std::string width_of(const TypeRow& type);

/// A literal as C++ source of this type; empty if it is no value of the type. Texts and datetimes give a
/// string literal.
std::string cpp_value(const TypeRow& type, const Literal& literal);

/// Text as a C++ (and MOF) string literal.
std::string as_string_literal(std::string_view text);

/// Flags of a record as an expression of the enumerators in runtime/meta/Meta.h.
std::string class_flags(const Class& c);
std::string feature_flags(const Feature& feature);
std::string parameter_flags(const Feature& parameter);

} // namespace schemac
