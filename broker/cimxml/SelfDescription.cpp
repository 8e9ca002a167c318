#include "broker/cimxml/SelfDescription.h"

#include "broker/core/Personality.h"
#include "broker/core/Store.h"
#include "runtime/meta/Meta.h"

#include <array>
#include <span>
#include <stdexcept>

#include <unistd.h>

namespace cimxml
{

using namespace broker;

namespace
{

constexpr std::uint32_t key = cimple::META_PROPERTY | cimple::META_READ | cimple::META_KEY;
constexpr std::uint32_t plain = cimple::META_PROPERTY | cimple::META_READ;
constexpr std::uint32_t required = plain | cimple::META_REQUIRED;

struct DeclaredProperty
{
    const char* name;
    CMPIType type;
    std::uint32_t flags;
    const char* description;
};

struct DeclaredClass
{
    const char* name;
    const char* superclass;
    const char* description;
    std::span<const DeclaredProperty> properties;
};

constexpr std::array managerProperties{
    DeclaredProperty{"Name", CMPI_string, key, "Tells this object manager from others of the host."},
    DeclaredProperty{"GatherStatisticalData", CMPI_boolean, plain,
                     "Whether the object manager counts the operations that it carries out."},
};

constexpr std::array nameSpaceProperties{
    DeclaredProperty{"SystemCreationClassName", CMPI_string, key, "Class of the system that has the object manager."},
    DeclaredProperty{"SystemName", CMPI_string, key, "Name of the system that has the object manager."},
    DeclaredProperty{"ObjectManagerCreationClassName", CMPI_string, key, "Class of the object manager."},
    DeclaredProperty{"ObjectManagerName", CMPI_string, key, "Name of the object manager."},
    DeclaredProperty{"CreationClassName", CMPI_string, key, "Class of this instance."},
    DeclaredProperty{"Name", CMPI_string, key, "The namespace as requests name it."},
    DeclaredProperty{"ClassInfo", CMPI_uint16, required,
                     "Where the classes of the namespace come from; 0 for unknown."},
};

/// In the order of their superclasses.
constexpr std::array classes{
    DeclaredClass{"CIM_WBEMService", "CIM_Service", "A part of a CIM server, as a service.", {}},
    DeclaredClass{"CIM_ObjectManager", "CIM_WBEMService", "The CIM server that answers the request.",
                  managerProperties},
    DeclaredClass{"CIM_Namespace", "CIM_ManagedElement",
                  "A name by which clients reach objects of an object manager. One namespace can have several.",
                  nameSpaceProperties},
};

void declare(Broker& broker, const DeclaredClass& declared)
{
    ClassDeclaration declaration{declared.name, declared.superclass, declared.description, {}};
    for (const DeclaredProperty& property : declared.properties)
    {
        FeatureInfo& feature = declaration.properties.emplace_back();
        feature.name = property.name;
        feature.type = property.type;
        feature.flags = property.flags;
        feature.defaultValue = Value::null(property.type);
        feature.description = property.description;
    }
    broker.declare(declaration);
}

std::string systemName()
{
    std::array<char, 256> name{};
    return gethostname(name.data(), name.size() - 1) == 0 ? name.data() : "localhost";
}

void create(Broker& broker, const char* className, std::vector<Property> properties)
{
    const NamesReply reply =
        broker.store().create({{std::string(interopNames.front()), className, {}, {}}, std::move(properties)});
    if (!reply.ok())
        throw std::runtime_error(reply.message);
}

constexpr const char* managerClass = "CIM_ObjectManager";
constexpr const char* nameSpaceClass = "CIM_Namespace";
constexpr const char* systemClass = "CIM_ComputerSystem";
constexpr const char* managerName = "tvrcim";

void createManager(Broker& broker)
{
    constexpr std::uint16_t enabled = 2, ok = 2;
    create(broker, managerClass,
           {{"SystemCreationClassName", Value::string(systemClass)},
            {"SystemName", Value::string(systemName())},
            {"CreationClassName", Value::string(managerClass)},
            {"Name", Value::string(managerName)},
            {"ElementName", Value::string(managerName)},
            {"Description", Value::string("CIM server for one machine, version " TVRCIM_VERSION)},
            {"GatherStatisticalData", Value::boolean(false)},
            {"Started", Value::boolean(true)},
            {"EnabledState", Value::uint16(enabled)},
            {"OperationalStatus", Value::array(CMPI_uint16, {Value::uint16(ok)})}});
}

void createNameSpace(Broker& broker, const std::string& name)
{
    create(broker, nameSpaceClass,
           {{"SystemCreationClassName", Value::string(systemClass)},
            {"SystemName", Value::string(systemName())},
            {"ObjectManagerCreationClassName", Value::string(managerClass)},
            {"ObjectManagerName", Value::string(managerName)},
            {"CreationClassName", Value::string(nameSpaceClass)},
            {"Name", Value::string(name)},
            {"ClassInfo", Value::uint16(0)}});
}

} // namespace

void describePort(Broker& broker)
{
    for (const DeclaredClass& declared : classes)
        declare(broker, declared);
    createManager(broker);
    for (const std::string& name : broker.nameSpaces())
        createNameSpace(broker, name);
    for (const DeclaredClass& declared : classes)
        broker.store().close(declared.name);
}

} // namespace cimxml
