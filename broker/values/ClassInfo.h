// The class definitions that the broker works with, copied from the module's meta tables so that they outlive it.
#pragma once

#include "broker/values/Value.h"
#include "runtime/meta/Meta.h"

#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace broker
{

struct ClassInfo;

/// A property, reference or method parameter.
struct FeatureInfo
{
    std::string name;
    CMPIType type = CMPI_null;    ///< with the array bit; CMPI_ref or CMPI_instance for references
    std::string referenceClass;   ///< of a reference or embedded instance
    std::uint32_t flags = 0;      ///< cimple::Meta_Flag bits
    Value defaultValue;           ///< null if the schema has none
    const ClassInfo* origin = {}; ///< the class that declares it; null for a parameter
    std::string_view description; ///< where the class is none of the schema's

    bool isKey() const { return (flags & cimple::META_KEY) != 0; }
    /// A reference to another object (an embedded instance is none).
    bool isReference() const { return (type & ~CMPI_ARRAY) == CMPI_ref; }
};

struct MethodInfo
{
    std::string name;
    CMPIType returnType = CMPI_null;
    std::vector<FeatureInfo> parameters; ///< without the return value
    std::uint32_t flags = 0;
    const ClassInfo* origin = {};

    const FeatureInfo* parameter(std::string_view parameterName) const;
};

/// Orders names without regard to case; accepts string views.
struct NameLess
{
    using is_transparent = void;
    bool operator()(std::string_view a, std::string_view b) const;
};

/// A class with all features of its chain, inherited ones first.
struct ClassInfo
{
    std::string name;
    std::uint32_t flags = 0;
    const ClassInfo* superclass = {};
    std::vector<const ClassInfo*> subclasses; ///< direct ones
    std::vector<FeatureInfo> properties;      ///< references too
    std::vector<MethodInfo> methods;
    std::vector<std::string> keys;
    std::string_view description; ///< of a class that is none of the schema's

    const FeatureInfo* property(std::string_view propertyName) const;
    const MethodInfo* method(std::string_view methodName) const;
    bool isAssociation() const { return (flags & cimple::META_ASSOCIATION) != 0; }
    bool isAbstract() const { return (flags & cimple::META_ABSTRACT) != 0; }
    /// True for the class's own name and those of its superclasses.
    bool isA(std::string_view ancestor) const;

    std::map<std::string, std::size_t, NameLess> propertyIndex; ///< position in `properties` by name
};

/// A class that the module's tables do not have. Texts outlive the table.
struct ClassDeclaration
{
    std::string_view name;
    std::string_view superclass;
    std::string_view description;
    std::vector<FeatureInfo> properties; ///< its own; one of an inherited name overrides that
};

class ClassTable
{
public:
    ClassTable() = default;
    /// Copies all classes; null gives an empty table.
    explicit ClassTable(const cimple::Meta_Repository* repository);

    /// Nobody else uses the table meanwhile. Throws std::invalid_argument for a class that it has, or below one that it
    /// lacks.
    void add(const ClassDeclaration& declaration);

    /// Any case; null if there is no such class.
    const ClassInfo* find(std::string_view name) const;
    bool isA(std::string_view name, std::string_view ancestor) const;
    /// The class and everything that derives from it, superclasses first.
    std::vector<const ClassInfo*> withSubclasses(const ClassInfo& root) const;
    /// In the repository's order.
    const std::vector<std::unique_ptr<ClassInfo>>& all() const { return _classes; }

private:
    std::vector<std::unique_ptr<ClassInfo>> _classes;
    std::map<std::string, const ClassInfo*, NameLess> _byName;
};

} // namespace broker
