// The floor of the client's operations: a provider that answers with constants, through the same broker.
#pragma once

#include "broker/core/ModuleImage.h"
#include "broker/values/Value.h"
#include "runtime/cmpi/Cmpi.h"

#include <string>
#include <vector>

namespace bench
{

/// What makes a CMPI object anew at each call and does nothing else: names, types and values are ready for it.
class Recipe
{
public:
    explicit Recipe(const broker::Object& object);

    CMPIObjectPath* makePath(const CMPIBroker* broker) const;
    CMPIInstance* makeInstance(const CMPIBroker* broker) const;

private:
    struct Constant
    {
        explicit Constant(const broker::Value& value);
        CMPIValue make(const CMPIBroker* broker) const;

        CMPIType type;
        CMPIValue plain{};              ///< of numbers and booleans
        std::string text{};             ///< of strings and datetimes
        std::vector<Constant> elements; ///< of arrays
        std::vector<Recipe> object;     ///< of references: one
    };
    struct Named
    {
        std::string name;
        Constant value;
    };
    explicit Recipe(const broker::Path& path);

    std::string _nameSpace, _className;
    std::vector<Named> _keys, _properties;
};

/// A module that serves one class, as an instance provider and as an association provider. Every enumeration and every
/// associators operation makes all of the objects, get makes the first.
///
/// One exists at a time, for factories have no argument that would lead to it.
class FloorModule : public broker::ModuleImage
{
public:
    /// `registered` names the classes that the module also registers, without factories for them: the broker looks
    /// through them as it does for a module that serves them.
    FloorModule(const cimple::Meta_Class& servedClass, const std::vector<broker::Object>& objects,
                const std::vector<std::string>& registered = {});

    void* symbol(const std::string& name) const override;
    const cimple::Registration* registrations() const override { return &_registrations.back(); }

private:
    std::vector<cimple::Registration> _registrations; ///< that of the served class is the first
};

} // namespace bench
