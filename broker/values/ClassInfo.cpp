#include "broker/values/ClassInfo.h"

#include "runtime/cmpi/TypeCodes.h"

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace broker
{

namespace
{

CMPIType cmpiType(std::uint16_t type, std::int16_t subscript)
{
    const CMPIType scalar = type < cimple::num_types ? cimple::cmpi_type_codes[type] : CMPIType{CMPI_null};
    return static_cast<CMPIType>(subscript ? scalar | CMPI_ARRAY : scalar);
}

template <class T> T rawValue(const void* data)
{
    T value;
    std::memcpy(&value, data, sizeof(T));
    return value;
}

/// The value at `data`, laid out as the meta tables lay out defaults.
Value scalarDefault(CMPIType type, const void* data)
{
    switch (type)
    {
    case CMPI_boolean:
        return Value::boolean(rawValue<std::uint8_t>(data) != 0);
    case CMPI_real32:
        return Value::real32(rawValue<float>(data));
    case CMPI_real64:
        return Value::real64(rawValue<double>(data));
    case CMPI_string:
        return Value::string(rawValue<const char*>(data));
    case CMPI_dateTime:
    {
        const auto parsed = DateTime::parse(rawValue<const char*>(data));
        return parsed ? Value::dateTime(*parsed) : Value::null(type);
    }
    default:
        return Value::integerAt(type, data);
    }
}

Value defaultValue(const cimple::Meta_Property& property)
{
    const CMPIType type = cmpiType(property.type, property.subscript);
    if (!property.value || property.type >= cimple::num_types)
        return Value::null(type);
    if (!property.subscript)
        return scalarDefault(type, property.value);
    const auto elementType = static_cast<CMPIType>(type & ~CMPI_ARRAY);
    const auto list = rawValue<cimple::Array_Default>(property.value);
    Value::List elements;
    const std::size_t width = cimple::type_width(property.type);
    for (std::size_t i = 0; i < list.size; ++i)
        elements.push_back(scalarDefault(elementType, static_cast<const char*>(list.data) + i * width));
    return Value::array(elementType, std::move(elements));
}

FeatureInfo describe(const cimple::Meta_Feature& feature)
{
    FeatureInfo info;
    info.name = feature.name;
    info.flags = feature.flags;
    if (feature.flags & cimple::META_PROPERTY)
    {
        const auto& property = static_cast<const cimple::Meta_Property&>(feature);
        info.type = cmpiType(property.type, property.subscript);
        info.defaultValue = defaultValue(property);
        return info;
    }
    const auto& reference = static_cast<const cimple::Meta_Reference&>(feature);
    const bool embedded = feature.flags & (cimple::META_EMBEDDED_OBJECT | cimple::META_EMBEDDED_INSTANCE);
    const CMPIType type = embedded ? CMPI_instance : CMPI_ref;
    info.type = static_cast<CMPIType>(reference.subscript ? type | CMPI_ARRAY : type);
    info.referenceClass = reference.meta_class ? reference.meta_class->name : "";
    info.defaultValue = Value::null(info.type);
    return info;
}

MethodInfo describe(const cimple::Meta_Method& method)
{
    MethodInfo info;
    info.name = method.name;
    info.flags = method.flags;
    info.returnType = cmpiType(method.return_type, 0);
    for (std::size_t i = 0; i < method.num_meta_features; ++i)
    {
        const cimple::Meta_Feature& parameter = *method.meta_features[i];
        if (!sameName(parameter.name, "return_value"))
            info.parameters.push_back(describe(parameter));
    }
    return info;
}

/// For a class whose properties are complete.
void index(ClassInfo& info)
{
    for (std::size_t i = 0; i < info.properties.size(); ++i)
    {
        info.propertyIndex.emplace(info.properties[i].name, i);
        if (info.properties[i].isKey())
            info.keys.push_back(info.properties[i].name);
    }
}

void fill(ClassInfo& info, const cimple::Meta_Class& meta)
{
    for (std::size_t i = 0; i < meta.num_meta_features; ++i)
    {
        const cimple::Meta_Feature& feature = *meta.meta_features[i];
        if (feature.flags & cimple::META_METHOD)
        {
            info.methods.push_back(describe(static_cast<const cimple::Meta_Method&>(feature)));
            continue;
        }
        info.properties.push_back(describe(feature));
    }
    index(info);
}

/// The class nearest the root that shares the feature record: records are shared with the superclass until overridden.
const cimple::Meta_Class& declarer(const cimple::Meta_Class& meta, std::size_t index)
{
    const cimple::Meta_Class* owner = &meta;
    while (!owner->locals[index] && owner->super_meta_class && index < owner->super_meta_class->num_meta_features)
        owner = owner->super_meta_class;
    return *owner;
}

} // namespace

bool NameLess::operator()(std::string_view a, std::string_view b) const
{
    return std::lexicographical_compare(a.begin(), a.end(), b.begin(), b.end(),
                                        [](char x, char y) { return lowerLetter(x) < lowerLetter(y); });
}

const FeatureInfo* MethodInfo::parameter(std::string_view parameterName) const
{
    const auto it = std::find_if(parameters.begin(), parameters.end(),
                                 [&](const FeatureInfo& p) { return sameName(p.name, parameterName); });
    return it == parameters.end() ? nullptr : &*it;
}

const FeatureInfo* ClassInfo::property(std::string_view propertyName) const
{
    const auto it = propertyIndex.find(propertyName);
    return it == propertyIndex.end() ? nullptr : &properties[it->second];
}

const MethodInfo* ClassInfo::method(std::string_view methodName) const
{
    const auto it =
        std::find_if(methods.begin(), methods.end(), [&](const MethodInfo& m) { return sameName(m.name, methodName); });
    return it == methods.end() ? nullptr : &*it;
}

bool ClassInfo::isA(std::string_view ancestor) const
{
    for (const ClassInfo* info = this; info; info = info->superclass)
        if (sameName(info->name, ancestor))
            return true;
    return false;
}

ClassTable::ClassTable(const cimple::Meta_Repository* repository)
{
    const std::size_t count = repository ? repository->num_meta_classes : 0;
    std::vector<ClassInfo*> infos;
    for (std::size_t i = 0; i < count; ++i)
    {
        const cimple::Meta_Class& meta = *repository->meta_classes[i];
        infos.push_back(_classes.emplace_back(std::make_unique<ClassInfo>()).get());
        infos.back()->name = meta.name;
        infos.back()->flags = meta.flags;
        fill(*infos.back(), meta);
        _byName.emplace(meta.name, infos.back());
    }
    for (std::size_t i = 0; i < count; ++i)
    {
        const cimple::Meta_Class& meta = *repository->meta_classes[i];
        if (meta.super_meta_class && (infos[i]->superclass = find(meta.super_meta_class->name)))
            const_cast<ClassInfo*>(infos[i]->superclass)->subclasses.push_back(infos[i]);
        std::size_t property = 0;
        std::size_t method = 0;
        for (std::size_t f = 0; f < meta.num_meta_features; ++f)
        {
            const ClassInfo* origin = find(declarer(meta, f).name);
            const bool isMethod = meta.meta_features[f]->flags & cimple::META_METHOD;
            (isMethod ? infos[i]->methods[method++].origin : infos[i]->properties[property++].origin) = origin;
        }
    }
}

void ClassTable::add(const ClassDeclaration& declaration)
{
    const auto above = _byName.find(declaration.superclass);
    if (above == _byName.end() || find(declaration.name))
        throw std::invalid_argument("the class " + std::string(declaration.name) + " cannot be added below " +
                                    std::string(declaration.superclass));
    const ClassInfo& superclass = *above->second;
    ClassInfo& info = *_classes.emplace_back(std::make_unique<ClassInfo>());
    info.name = declaration.name;
    info.description = declaration.description;
    info.flags = cimple::META_CLASS;
    info.superclass = &superclass;
    info.properties = superclass.properties;
    info.methods = superclass.methods;
    for (const FeatureInfo& own : declaration.properties)
    {
        const auto inherited = std::find_if(info.properties.begin(), info.properties.end(),
                                            [&](const FeatureInfo& known) { return sameName(known.name, own.name); });
        FeatureInfo& property =
            inherited == info.properties.end() ? info.properties.emplace_back(own) : (*inherited = own);
        property.origin = &info;
    }
    index(info);
    _byName.emplace(info.name, &info);
    const_cast<ClassInfo&>(superclass).subclasses.push_back(&info);
}

const ClassInfo* ClassTable::find(std::string_view name) const
{
    const auto it = _byName.find(name);
    return it == _byName.end() ? nullptr : it->second;
}

bool ClassTable::isA(std::string_view name, std::string_view ancestor) const
{
    const ClassInfo* info = find(name);
    return info && info->isA(ancestor);
}

std::vector<const ClassInfo*> ClassTable::withSubclasses(const ClassInfo& root) const
{
    std::vector<const ClassInfo*> result{&root};
    for (std::size_t i = 0; i < result.size(); ++i)
    {
        const std::vector<const ClassInfo*>& next = result[i]->subclasses;
        result.insert(result.end(), next.begin(), next.end());
    }
    return result;
}

} // namespace broker
