#include "broker/tables/Marshal.h"

#include "broker/core/Core.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <cstring>

namespace broker
{

namespace
{

/// A value that the provider described wrongly.
Value refuse(const Core& core, CMPIStatus& status, CMPIrc code, const std::string& text)
{
    core.violation(text);
    status.rc = code;
    return {};
}

template <class H> const H* openValue(const typename H::Cmpi* object, const char* function, CMPIStatus& status)
{
    return open<H>(object, function, &status);
}

/// An encapsulated object as a value.
Value fromHandle(const CMPIValue& value, CMPIType type, const char* function, CMPIStatus& status)
{
    if (type == CMPI_string)
    {
        const auto* handle = openValue<StringHandle>(value.string, function, status);
        return handle ? Value::string(handle->content.text) : Value();
    }
    if (type == CMPI_dateTime)
    {
        const auto* handle = openValue<DateTimeHandle>(value.dateTime, function, status);
        return handle ? Value::dateTime(handle->content) : Value();
    }
    if (type == CMPI_ref)
    {
        const auto* handle = openValue<PathHandle>(value.ref, function, status);
        return handle ? Value::reference(handle->content.path) : Value();
    }
    const auto* handle = openValue<InstanceHandle>(value.inst, function, status);
    if (!handle)
        return {};
    Object object = handle->content.object;
    object.path = handle->content.pathFromKeys();
    return Value::instance(std::move(object));
}

Value fromArray(const Core& core, const CMPIValue& value, CMPIType type, const char* function, CMPIStatus& status)
{
    const auto* handle = openValue<ArrayHandle>(value.array, function, status);
    if (!handle)
        return {};
    const ArrayContent& content = handle->content;
    if (content.elementType != (type & ~CMPI_ARRAY))
    {
        return refuse(core, status, CMPI_RC_ERR_TYPE_MISMATCH,
                      std::string(function) + ": an array of " + typeText(content.elementType) + " passed as " +
                          typeText(type));
    }
    return Value::array(content.elementType, content.elements);
}

bool isHandleType(CMPIType type)
{
    return type == CMPI_string || type == CMPI_dateTime || type == CMPI_ref || type == CMPI_instance;
}

CMPIType elementOf(CMPIType type)
{
    return static_cast<CMPIType>(type & ~CMPI_ARRAY);
}

/// Class name of a reference or an instance.
const std::string& classOf(const Value& value)
{
    return value.type() == CMPI_ref ? value.asPath().className : value.asObject().path.className;
}

std::string classMisfit(const Core& core, const FeatureInfo& feature, const Value& value)
{
    if (value.isNull() || feature.referenceClass.empty() || !core.classes.find(feature.referenceClass) ||
        core.classes.isA(classOf(value), feature.referenceClass))
        return {};
    return "'" + feature.name + "' holds a " + feature.referenceClass + ", not a " + classOf(value);
}

} // namespace

Value fromCmpi(const Core& core, const CMPIValue* value, CMPIType type, const char* function, CMPIStatus& status)
{
    status = makeStatus(CMPI_RC_OK);
    const CMPIType readAs = type == CMPI_chars || type == CMPI_charsptr ? CMPI_string : type;
    if (!value)
        return Value::null(readAs);
    if (type & CMPI_ARRAY)
        return fromArray(core, *value, type, function, status);
    if (isHandleType(type))
        return fromHandle(*value, type, function, status);
    if (integerBits(type))
        return Value::integerAt(type, value);
    switch (type)
    {
    case CMPI_chars:
        return Value::string(reinterpret_cast<const char*>(value));
    case CMPI_charsptr:
        return value->chars ? Value::string(value->chars) : Value::null(CMPI_string);
    case CMPI_boolean:
        return Value::boolean(value->boolean != 0);
    case CMPI_real32:
        return Value::real32(value->real32);
    case CMPI_real64:
        return Value::real64(value->real64);
    default:
        return refuse(core, status, CMPI_RC_ERR_INVALID_DATA_TYPE,
                      std::string(function) + " with the type code " + std::to_string(type));
    }
}

PathHandle* makePath(Frame& frame, Path path)
{
    const ClassInfo* info = frame.core.classes.find(path.className);
    return frame.make<PathHandle>({std::move(path), info});
}

InstanceHandle* makeInstance(Frame& frame, Object object)
{
    InstanceContent content;
    content.info = frame.core.classes.find(object.path.className);
    content.object = std::move(object);
    // Keys of the path are properties of the instance, as brokers give them to a provider.
    for (const Property& key : content.object.path.keys)
    {
        if (!content.object.has(key.name))
        {
            const FeatureInfo* feature = content.info ? content.info->property(key.name) : nullptr;
            content.object.set(key.name, feature ? narrowed(key.value, feature->type) : key.value);
        }
    }
    return frame.make<InstanceHandle>(std::move(content));
}

CMPIData toCmpi(Frame& frame, const Value& value, CMPIValueState state)
{
    if (value.isNull())
        return nullData(value.type(), state);
    CMPIData data{};
    data.type = value.type();
    data.state = state;
    if (value.isArray())
    {
        data.value.array = frame.make<ArrayHandle>({elementOf(value.type()), value.asList()});
        return data;
    }
    switch (value.type())
    {
    case CMPI_boolean:
        data.value.boolean = value.asBoolean();
        break;
    case CMPI_real32:
        data.value.real32 = static_cast<float>(value.asReal());
        break;
    case CMPI_real64:
        data.value.real64 = value.asReal();
        break;
    case CMPI_string:
        data.value.string = frame.make<StringHandle>({value.asString(), false});
        break;
    case CMPI_dateTime:
        data.value.dateTime = frame.make<DateTimeHandle>(value.asDateTime());
        break;
    case CMPI_ref:
        data.value.ref = makePath(frame, value.asPath());
        break;
    case CMPI_instance:
        data.value.inst = makeInstance(frame, value.asObject());
        break;
    default:
    {
        const std::uint64_t bits = value.asUnsigned();
        std::memcpy(&data.value, &bits, integerBits(value.type()) / 8); // all members start at offset 0
    }
    }
    return data;
}

CMPIData keyToCmpi(Frame& frame, const Value& value)
{
    if (!isInteger(value.type()) || value.isNull())
        return toCmpi(frame, value, CMPI_keyValue);
    const bool asUnsigned = frame.core.options.personality.integerKeys == IntegerKeys::unsigned64 &&
                            !(isSignedInteger(value.type()) && value.asSigned() < 0);
    return toCmpi(frame, Value::integer(asUnsigned ? CMPI_uint64 : CMPI_sint64, value.asUnsigned()), CMPI_keyValue);
}

CMPIData answer(const Core& core, const Value& value, const char* function, CMPIStatus* rc)
{
    Frame* frame = openFrame(core, function, rc);
    return frame ? toCmpi(*frame, value) : nullData(value.type(), CMPI_badValue);
}

const Property* entryAt(const Core& core, const std::vector<Property>& list, CMPICount index, CMPIString** name,
                        const char* function, CMPIStatus* rc)
{
    if (index >= list.size())
    {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return nullptr;
    }
    if (name)
        *name = newString(core, function, rc, list[index].name);
    return &list[index];
}

Value narrowed(const Value& value, CMPIType type)
{
    if (value.isNull() || !isInteger(value.type()) || !isInteger(type))
        return value;
    const Value result = Value::integer(type, value.asUnsigned());
    const bool sameSign = isSignedInteger(type) == isSignedInteger(value.type()) || value.asSigned() >= 0;
    return sameSign && result.asUnsigned() == value.asUnsigned() ? result : value;
}

std::string misfit(const Core& core, const FeatureInfo& feature, const Value& value)
{
    if (value.type() != feature.type)
        return "'" + feature.name + "' is " + typeText(feature.type) + ", not " + typeText(value.type());
    if (elementOf(value.type()) != CMPI_ref && elementOf(value.type()) != CMPI_instance)
        return {};
    if (!value.isArray() || value.isNull())
        return classMisfit(core, feature, value);
    for (const Value& element : value.asList())
        if (std::string reason = classMisfit(core, feature, element); !reason.empty())
            return reason;
    return {};
}

std::string pathFault(const Core& core, const Path& path)
{
    const ClassInfo* info = core.classes.find(path.className);
    if (!info)
        return "a path of the unknown class '" + path.className + "'";
    if (path.nameSpace.empty())
        return "a path of " + info->name + " without a namespace";
    for (const std::string& name : info->keys)
    {
        const Value* key = path.key(name);
        if (!key || key->isNull())
            return "a path of " + info->name + " without its key '" + name + "'";
        if (key->type() == CMPI_ref)
        {
            if (std::string fault = pathFault(core, key->asPath()); !fault.empty())
                return info->name + "." + name + " is " + fault;
        }
    }
    return {};
}

NameList::NameList(const std::vector<std::string>* names) : _all(!names)
{
    if (names)
    {
        for (const std::string& name : *names)
            _pointers.push_back(name.c_str());
        _pointers.push_back(nullptr);
    }
}

std::vector<std::string> readNames(const char* const* names)
{
    std::vector<std::string> result;
    for (; names && *names; ++names)
        result.emplace_back(*names);
    return result;
}

} // namespace broker
