#include "bench/FloorModule.h"

#include <stdexcept>

namespace bench
{

namespace
{

CMPIStatus ok()
{
    return {CMPI_RC_OK, nullptr};
}

/// Of the one module.
std::vector<Recipe> recipes;
const CMPIBroker* floorBroker = nullptr;

CMPIStatus refuse()
{
    return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr};
}

CMPIStatus sendInstances(const CMPIResult* result)
{
    for (const Recipe& recipe : recipes)
        CMReturnInstance(result, recipe.makeInstance(floorBroker));
    CMReturnDone(result);
    return ok();
}

CMPIStatus sendPaths(const CMPIResult* result)
{
    for (const Recipe& recipe : recipes)
        CMReturnObjectPath(result, recipe.makePath(floorBroker));
    CMReturnDone(result);
    return ok();
}

CMPIInstanceMIFT instanceFunctions = {
    .ftVersion = CMPIVersion100,
    .miVersion = CMPIVersion100,
    .miName = "floor",
    .cleanup = [](CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { return ok(); },
    .enumerateInstanceNames = [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*)
    { return sendPaths(result); },
    .enumerateInstances = [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                             const char**) { return sendInstances(result); },
    .getInstance =
        [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*, const char**)
    {
        CMReturnInstance(result, recipes.front().makeInstance(floorBroker));
        CMReturnDone(result);
        return ok();
    },
    .createInstance = [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                         const CMPIInstance*) { return refuse(); },
    .modifyInstance = [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                         const CMPIInstance*, const char**) { return refuse(); },
    .deleteInstance = [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*)
    { return refuse(); },
    .execQuery = [](CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                    const char*) { return refuse(); },
};

CMPIAssociationMIFT associationFunctions = {
    .ftVersion = CMPIVersion100,
    .miVersion = CMPIVersion100,
    .miName = "floor",
    .cleanup = [](CMPIAssociationMI*, const CMPIContext*, CMPIBoolean) { return ok(); },
    .associators = [](CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                      const char*, const char*, const char*, const char*, const char**)
    { return sendInstances(result); },
    .associatorNames = [](CMPIAssociationMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath*,
                          const char*, const char*, const char*, const char*) { return sendPaths(result); },
    .references = [](CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                     const char*, const char**) { return refuse(); },
    .referenceNames = [](CMPIAssociationMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                         const char*) { return refuse(); },
};

CMPIInstanceMI instanceMI = {.hdl = nullptr, .ft = &instanceFunctions};
CMPIAssociationMI associationMI = {.hdl = nullptr, .ft = &associationFunctions};

CMPIInstanceMI* makeInstanceMI(const CMPIBroker* broker, const CMPIContext*, CMPIStatus*)
{
    floorBroker = broker;
    return &instanceMI;
}

CMPIAssociationMI* makeAssociationMI(const CMPIBroker* broker, const CMPIContext*, CMPIStatus*)
{
    floorBroker = broker;
    return &associationMI;
}

} // namespace

// --- recipes --------------------------------------------------------------------------------------------

Recipe::Constant::Constant(const broker::Value& value) : type(value.type())
{
    if (value.isNull())
        return;
    if (value.isArray())
    {
        for (const broker::Value& element : value.asList())
            elements.emplace_back(element);
        return;
    }
    switch (type)
    {
    case CMPI_string:
        text = value.asString();
        break;
    case CMPI_dateTime:
        text = value.asDateTime().text();
        break;
    case CMPI_ref:
        object.push_back(Recipe(value.asPath()));
        break;
    case CMPI_boolean:
        plain.boolean = value.asBoolean();
        break;
    default:
        if (!broker::isInteger(type))
            throw std::invalid_argument("the floor has no values of CMPI type " + std::to_string(type));
        plain.uint64 = value.asUnsigned(); // little-endian: the narrower members read their part of it
    }
}

CMPIValue Recipe::Constant::make(const CMPIBroker* broker) const
{
    CMPIValue value = plain;
    if (type & CMPI_ARRAY)
    {
        const CMPIType elementType = type & ~CMPI_ARRAY;
        value.array = CMNewArray(broker, static_cast<CMPICount>(elements.size()), elementType, nullptr);
        for (std::size_t i = 0; i < elements.size(); i++)
        {
            const CMPIValue element = elements[i].make(broker);
            CMSetArrayElementAt(value.array, static_cast<CMPICount>(i), &element, elementType);
        }
    }
    else if (type == CMPI_string)
        value.string = CMNewString(broker, text.c_str(), nullptr);
    else if (type == CMPI_dateTime)
        value.dateTime = CMNewDateTimeFromChars(broker, text.c_str(), nullptr);
    else if (type == CMPI_ref)
        value.ref = object.front().makePath(broker);
    return value;
}

Recipe::Recipe(const broker::Path& path) : _nameSpace(path.nameSpace), _className(path.className)
{
    for (const broker::Property& key : path.keys)
        _keys.push_back({key.name, Constant(key.value)});
}

Recipe::Recipe(const broker::Object& object) : Recipe(object.path)
{
    for (const broker::Property& property : object.properties)
        if (!property.value.isNull())
            _properties.push_back({property.name, Constant(property.value)});
}

CMPIObjectPath* Recipe::makePath(const CMPIBroker* broker) const
{
    CMPIObjectPath* path = CMNewObjectPath(broker, _nameSpace.c_str(), _className.c_str(), nullptr);
    for (const Named& key : _keys)
    {
        const CMPIValue value = key.value.make(broker);
        CMAddKey(path, key.name.c_str(), &value, key.value.type);
    }
    return path;
}

CMPIInstance* Recipe::makeInstance(const CMPIBroker* broker) const
{
    CMPIInstance* instance = CMNewInstance(broker, makePath(broker), nullptr);
    for (const Named& property : _properties)
    {
        const CMPIValue value = property.value.make(broker);
        CMSetProperty(instance, property.name.c_str(), &value, property.value.type);
    }
    return instance;
}

// --- module ---------------------------------------------------------------------------------------------

FloorModule::FloorModule(const cimple::Meta_Class& servedClass, const std::vector<broker::Object>& objects,
                         const std::vector<std::string>& registered)
{
    recipes.clear();
    for (const broker::Object& object : objects)
        recipes.emplace_back(object);

    _registrations.reserve(1 + registered.size()); // the records point to each other
    _registrations.push_back({"floor", "floor", nullptr, &servedClass, nullptr});
    for (const std::string& name : registered)
    {
        const cimple::Meta_Class* other = cimple::find_class(servedClass.meta_repository, name.c_str());
        if (other != &servedClass)
            _registrations.push_back({"floor", "floor", nullptr, other, &_registrations.back()});
    }
}

void* FloorModule::symbol(const std::string& name) const
{
    const std::string className = _registrations.front().meta_class->name;
    if (name == className + "_Create_InstanceMI")
        return reinterpret_cast<void*>(&makeInstanceMI);
    if (name == className + "_Create_AssociationMI")
        return reinterpret_cast<void*>(&makeAssociationMI);
    return nullptr;
}

} // namespace bench
