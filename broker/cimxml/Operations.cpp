#include "broker/cimxml/Operations.h"

#include "broker/cimxml/Encode.h"
#include "broker/cimxml/Qualifiers.h"
#include "broker/cimxml/Request.h"

#include <algorithm>
#include <optional>
#include <span>
#include <vector>

namespace cimxml
{

using namespace broker;
using pugi::xml_node;

namespace
{

/// Codes of pulled results, which CMPI does not know.
constexpr int wrongContext = 21;
constexpr int noFilters = 25;
constexpr int limitsExceeded = 27;

/// An operation that failed; the client gets its code and text.
struct CimFailure
{
    int status;
    std::string text;
};

void expect(const Outcome& outcome)
{
    if (!outcome.ok())
        throw CimFailure{outcome.status, outcome.message};
}

/// One request that is carried out: its parameters, and where the result is written.
class Operation
{
public:
    Operation(Broker& target, Pulls& kept, const Request& request, XmlText& result)
        : broker(target), pulls(kept), xml(result), _request(request), _decoder(target.classes(), request.nameSpace)
    {}

    Broker& broker;
    Pulls& pulls;
    XmlText& xml;

    const Request& request() const { return _request; }
    const std::string& nameSpace() const { return _request.nameSpace; }
    const Decoder& decoder() const { return _decoder; }
    const ClassInfo* classOf(const Object& object) const { return broker.classes().find(object.path.className); }

    xml_node required(const char* name) const
    {
        const xml_node node = firstElement(_request.parameter(name));
        if (!node)
            throw CimFailure{CMPI_RC_ERR_INVALID_PARAMETER, std::string("there is no ") + name};
        return node;
    }
    /// The name of a class; empty where the client gave none.
    std::string className(const char* name) const
    {
        return firstElement(_request.parameter(name)).attribute("NAME").value();
    }
    const ClassInfo& requiredClass(const char* name) const
    {
        const std::string text = required(name).attribute("NAME").value();
        expect(broker.findClass(nameSpace(), text));
        return *broker.classes().find(text);
    }
    std::string text(const char* name) const { return childOf(_request.parameter(name), "VALUE").text().get(); }
    bool flag(const char* name, bool otherwise) const
    {
        const std::string value = text(name);
        return value.empty() ? otherwise : sameName(value, "true");
    }
    std::optional<std::uint32_t> number(const char* name) const
    {
        const std::string value = text(name);
        if (value.empty())
            return std::nullopt;
        const Target target(broker.classes(), nameSpace(), CMPI_uint32);
        return static_cast<std::uint32_t>(parseScalar(target, value).asUnsigned());
    }
    PropertyList properties() const
    {
        const xml_node list = childOf(_request.parameter("PropertyList"), "VALUE.ARRAY");
        if (!list)
            return std::nullopt;
        std::vector<std::string> names;
        for (const xml_node& name : list.children("VALUE"))
            names.emplace_back(name.text().get());
        return names;
    }
    AssociationFilter filter() const
    {
        const bool ofAssociations = _request.name.find("Reference") != std::string::npos;
        return {className(ofAssociations ? "ResultClass" : "AssocClass"),
                ofAssociations ? std::string() : className("ResultClass"), text("Role"), text("ResultRole")};
    }

private:
    const Request& _request;
    Decoder _decoder;
};

// --- instances

void writeNamed(const Operation& operation, const Object& object)
{
    const XmlElement named(operation.xml, "VALUE.NAMEDINSTANCE");
    writeInstanceName(operation.xml, object.path);
    writeInstance(operation.xml, object, operation.classOf(object));
}

void writeWithPath(const Operation& operation, const Object& object)
{
    const XmlElement whole(operation.xml, "VALUE.OBJECTWITHPATH");
    writeInstancePath(operation.xml, object.path);
    writeInstance(operation.xml, object, operation.classOf(object));
}

void enumerateInstances(Operation& operation)
{
    const Reply reply = operation.broker.enumerateInstances(
        operation.nameSpace(), operation.requiredClass("ClassName").name, operation.properties());
    expect(reply);
    for (const Object& object : reply.objects)
        writeNamed(operation, object);
}

void enumerateInstanceNames(Operation& operation)
{
    const NamesReply reply =
        operation.broker.enumerateInstanceNames(operation.nameSpace(), operation.requiredClass("ClassName").name);
    expect(reply);
    for (const Path& path : reply.paths)
        writeInstanceName(operation.xml, path);
}

void getInstance(Operation& operation)
{
    const Reply reply = operation.broker.getInstance(operation.decoder().path(operation.required("InstanceName")),
                                                     operation.properties());
    expect(reply);
    for (const Object& object : reply.objects)
        writeInstance(operation.xml, object, operation.classOf(object));
}

void createInstance(Operation& operation)
{
    const NamesReply reply =
        operation.broker.createInstance(operation.decoder().instance(operation.required("NewInstance")));
    expect(reply);
    for (const Path& path : reply.paths)
        writeInstanceName(operation.xml, path);
}

void modifyInstance(Operation& operation)
{
    expect(operation.broker.modifyInstance(operation.decoder().namedInstance(operation.required("ModifiedInstance")),
                                           operation.properties()));
}

void deleteInstance(Operation& operation)
{
    expect(operation.broker.deleteInstance(operation.decoder().path(operation.required("InstanceName"))));
}

// --- associations

Path objectName(const Operation& operation)
{
    return operation.decoder().path(operation.required("ObjectName"));
}

void writeObjects(const Operation& operation, const Reply& reply)
{
    expect(reply);
    for (const Object& object : reply.objects)
        writeWithPath(operation, object);
}

void writePaths(const Operation& operation, const NamesReply& reply)
{
    expect(reply);
    for (const Path& path : reply.paths)
    {
        const XmlElement whole(operation.xml, "OBJECTPATH");
        writeInstancePath(operation.xml, path);
    }
}

void associators(Operation& operation)
{
    writeObjects(operation,
                 operation.broker.associators(objectName(operation), operation.filter(), operation.properties()));
}

void associatorNames(Operation& operation)
{
    writePaths(operation, operation.broker.associatorNames(objectName(operation), operation.filter()));
}

void references(Operation& operation)
{
    writeObjects(operation,
                 operation.broker.references(objectName(operation), operation.filter(), operation.properties()));
}

void referenceNames(Operation& operation)
{
    writePaths(operation, operation.broker.referenceNames(objectName(operation), operation.filter()));
}

// --- classes

ClassView viewOf(const Operation& operation)
{
    ClassView view{.localOnly = operation.flag("LocalOnly", true),
                   .qualifiers = operation.flag("IncludeQualifiers", true),
                   .origin = operation.flag("IncludeClassOrigin", false)};
    if (const PropertyList list = operation.properties())
        view.shows = [list](std::string_view name)
        { return std::ranges::any_of(*list, [&](const std::string& known) { return sameName(known, name); }); };
    return view;
}

/// Below the class that the client names, or the top; all of them, or one generation.
std::vector<const ClassInfo*> classesBelow(const Operation& operation)
{
    const bool deep = operation.flag("DeepInheritance", false);
    const bool named = !operation.className("ClassName").empty();
    const ClassInfo* root = named ? &operation.requiredClass("ClassName") : nullptr;
    const auto isBelow = [&](const ClassInfo& info)
    { return deep ? !root || (&info != root && info.isA(root->name)) : info.superclass == root; };
    std::vector<const ClassInfo*> below;
    for (const auto& info : operation.broker.classes().all())
        if (isBelow(*info) && operation.broker.findClass(operation.nameSpace(), info->name).ok())
            below.push_back(info.get());
    return below;
}

void getClass(Operation& operation)
{
    writeClass(operation.xml, operation.requiredClass("ClassName"), viewOf(operation));
}

void enumerateClasses(Operation& operation)
{
    for (const ClassInfo* info : classesBelow(operation))
        writeClass(operation.xml, *info, viewOf(operation));
}

void enumerateClassNames(Operation& operation)
{
    for (const ClassInfo* info : classesBelow(operation))
        operation.xml.leaf("CLASSNAME", "", {{"NAME", info->name}});
}

// --- single properties, and qualifiers

Path instanceName(const Operation& operation)
{
    return operation.decoder().path(operation.required("InstanceName"));
}

const FeatureInfo& namedProperty(const Operation& operation, const Path& path)
{
    expect(operation.broker.findClass(path.nameSpace, path.className));
    const ClassInfo* info = operation.broker.classes().find(path.className);
    const std::string name = operation.text("PropertyName");
    const FeatureInfo* property = info->property(name);
    if (!property)
        throw CimFailure{CMPI_RC_ERR_NO_SUCH_PROPERTY, info->name + " has no property '" + name + "'"};
    return *property;
}

void getProperty(Operation& operation)
{
    const Path path = instanceName(operation);
    const FeatureInfo& property = namedProperty(operation, path);
    const Reply reply = operation.broker.getInstance(path, std::vector{property.name});
    expect(reply);
    for (const Object& object : reply.objects)
        writeValue(operation.xml, object.get(property.name));
}

void setProperty(Operation& operation)
{
    const Path path = instanceName(operation);
    const FeatureInfo& property = namedProperty(operation, path);
    const Target target(operation.broker.classes(), operation.nameSpace(), property);
    const Value value = operation.decoder().value(operation.request().parameter("NewValue"), target);
    expect(operation.broker.modifyInstance({path, {{property.name, value}}}, std::vector{property.name}));
}

void getQualifier(Operation& operation)
{
    const std::string name = operation.text("QualifierName");
    const cimple::Qualifier_Text* declaration = findQualifierDeclaration(name);
    if (!declaration)
        throw CimFailure{CMPI_RC_ERR_NOT_FOUND, "there is no qualifier '" + name + "'"};
    writeQualifierDeclaration(operation.xml, *declaration);
}

void enumerateQualifiers(Operation& operation)
{
    for (const cimple::Qualifier_Text& declaration : qualifierDeclarations())
        writeQualifierDeclaration(operation.xml, declaration);
}

// --- results in parts

constexpr std::uint32_t longestTime = 300; ///< seconds between two requests

void writePart(Operation& operation, const Part& part)
{
    {
        const XmlElement result(operation.xml, "IRETURNVALUE");
        for (const std::string& element : part.elements)
            operation.xml.markup(element);
    }
    const auto write = [&](const char* name, const char* type, std::string_view value)
    {
        const XmlElement out(operation.xml, "PARAMVALUE", {{"NAME", name}, {"PARAMTYPE", type}});
        operation.xml.leaf("VALUE", value);
    };
    write("EnumerationContext", "string", part.context);
    write("EndOfSequence", "boolean", part.context.empty() ? "TRUE" : "FALSE");
}

/// `write(xml, item)` makes an element of an item of the result.
template <class Items, class Write>
void openResult(Operation& operation, PulledKind kind, const Items& items, Write write)
{
    std::vector<std::string> elements;
    for (const auto& item : items)
    {
        XmlText xml(elements.emplace_back());
        write(xml, item);
    }
    const std::uint32_t time = operation.number("OperationTimeout").value_or(0);
    const std::optional<Part> part =
        operation.pulls.open(kind, std::move(elements), operation.number("MaxObjectCount").value_or(0),
                             std::chrono::seconds(time == 0 ? longestTime : std::min(time, longestTime)));
    if (!part)
        throw CimFailure{limitsExceeded, "too many results are being pulled"};
    writePart(operation, *part);
}

void expectNoFilter(const Operation& operation)
{
    if (!operation.text("FilterQueryLanguage").empty() || !operation.text("FilterQuery").empty())
        throw CimFailure{noFilters, "filters are not supported"};
}

void openObjects(Operation& operation, const Reply& reply)
{
    expectNoFilter(operation);
    expect(reply);
    openResult(operation, PulledKind::instances, reply.objects,
               [&](XmlText& xml, const Object& object)
               {
                   const XmlElement whole(xml, "VALUE.INSTANCEWITHPATH");
                   writeInstancePath(xml, object.path);
                   writeInstance(xml, object, operation.classOf(object));
               });
}

void openPaths(Operation& operation, const NamesReply& reply)
{
    expectNoFilter(operation);
    expect(reply);
    openResult(operation, PulledKind::paths, reply.paths, writeInstancePath);
}

void openInstances(Operation& operation)
{
    openObjects(operation,
                operation.broker.enumerateInstances(operation.nameSpace(), operation.requiredClass("ClassName").name,
                                                    operation.properties()));
}

void openInstancePaths(Operation& operation)
{
    openPaths(operation, operation.broker.enumerateInstanceNames(operation.nameSpace(),
                                                                 operation.requiredClass("ClassName").name));
}

void openAssociators(Operation& operation)
{
    openObjects(operation,
                operation.broker.associators(instanceName(operation), operation.filter(), operation.properties()));
}

void openAssociatorPaths(Operation& operation)
{
    openPaths(operation, operation.broker.associatorNames(instanceName(operation), operation.filter()));
}

void openReferences(Operation& operation)
{
    openObjects(operation,
                operation.broker.references(instanceName(operation), operation.filter(), operation.properties()));
}

void openReferencePaths(Operation& operation)
{
    openPaths(operation, operation.broker.referenceNames(instanceName(operation), operation.filter()));
}

template <PulledKind kind> void pull(Operation& operation)
{
    const std::optional<std::uint32_t> most = operation.number("MaxObjectCount");
    if (!most)
        throw CimFailure{CMPI_RC_ERR_INVALID_PARAMETER, "there is no MaxObjectCount"};
    const std::optional<Part> part = operation.pulls.pull(kind, operation.text("EnumerationContext"), *most);
    if (!part)
        throw CimFailure{wrongContext, "there is no such result any more"};
    writePart(operation, *part);
}

void closeEnumeration(Operation& operation)
{
    if (!operation.pulls.close(operation.text("EnumerationContext")))
        throw CimFailure{wrongContext, "there is no such result any more"};
}

struct Row
{
    std::string_view name;
    void (*carryOut)(Operation&);
    bool hasResult = true; ///< an IRETURNVALUE, be it empty, around what it writes
};

constexpr Row rows[] = {
    {"EnumerateInstances", enumerateInstances},
    {"EnumerateInstanceNames", enumerateInstanceNames},
    {"GetInstance", getInstance},
    {"CreateInstance", createInstance},
    {"ModifyInstance", modifyInstance, false},
    {"DeleteInstance", deleteInstance, false},
    {"Associators", associators},
    {"AssociatorNames", associatorNames},
    {"References", references},
    {"ReferenceNames", referenceNames},
    {"GetClass", getClass},
    {"EnumerateClasses", enumerateClasses},
    {"EnumerateClassNames", enumerateClassNames},
    {"GetProperty", getProperty},
    {"SetProperty", setProperty, false},
    {"GetQualifier", getQualifier},
    {"EnumerateQualifiers", enumerateQualifiers},
    {"OpenEnumerateInstances", openInstances, false},
    {"OpenEnumerateInstancePaths", openInstancePaths, false},
    {"OpenAssociatorInstances", openAssociators, false},
    {"OpenAssociatorInstancePaths", openAssociatorPaths, false},
    {"OpenReferenceInstances", openReferences, false},
    {"OpenReferenceInstancePaths", openReferencePaths, false},
    {"PullInstancesWithPath", pull<PulledKind::instances>, false},
    {"PullInstancePaths", pull<PulledKind::paths>, false},
    {"CloseEnumeration", closeEnumeration, false},
};

void carryOutIntrinsic(Operation& operation)
{
    const auto* row =
        std::ranges::find_if(rows, [&](const Row& known) { return sameName(known.name, operation.request().name); });
    if (row == std::end(rows))
        throw CimFailure{CMPI_RC_ERR_NOT_SUPPORTED,
                         "the operation '" + operation.request().name + "' is not supported"};
    std::optional<XmlElement> result;
    if (row->hasResult)
        result.emplace(operation.xml, "IRETURNVALUE");
    row->carryOut(operation);
}

// --- methods of classes

std::vector<Property> argumentsOf(const Operation& operation, const MethodInfo& method)
{
    std::vector<Property> arguments;
    for (const xml_node& node : operation.request().call.children("PARAMVALUE"))
    {
        const std::string name = node.attribute("NAME").value();
        const FeatureInfo* known = method.parameter(name);
        if (!known)
            throw CimFailure{CMPI_RC_ERR_INVALID_PARAMETER, method.name + " has no parameter '" + name + "'"};
        const Target target(operation.broker.classes(), operation.nameSpace(), *known);
        setNamed(arguments, known->name, operation.decoder().value(node, target));
    }
    return arguments;
}

/// Null output parameters are left out: a client crashes on them.
void writeReply(XmlText& xml, const MethodReply& reply)
{
    if (!reply.returnValue.isNull())
    {
        const XmlElement result(xml, "RETURNVALUE", {{"PARAMTYPE", xmlType(reply.returnValue.type())}});
        writeValue(xml, reply.returnValue);
    }
    for (const Property& parameter : reply.out)
        if (!parameter.value.isNull())
        {
            const XmlElement out(xml, "PARAMVALUE",
                                 {{"NAME", parameter.name}, {"PARAMTYPE", xmlType(parameter.value.type())}});
            writeValue(xml, parameter.value);
        }
}

void carryOutExtrinsic(Operation& operation)
{
    const Request& request = operation.request();
    const Path path = operation.decoder().path(firstElement(request.call));
    expect(operation.broker.findClass(path.nameSpace, path.className));
    const ClassInfo* info = operation.broker.classes().find(path.className);
    const MethodInfo* method = info->method(request.name);
    if (!method)
        throw CimFailure{CMPI_RC_ERR_METHOD_NOT_FOUND, info->name + " has no method '" + request.name + "'"};
    const MethodReply reply = operation.broker.invokeMethod(path, method->name, argumentsOf(operation, *method));
    expect(reply);
    writeReply(operation.xml, reply);
}

/// Those above are CMPI's alone.
std::string codeOf(int status)
{
    constexpr int lastCode = 28;
    return std::to_string(status >= CMPI_RC_ERR_FAILED && status <= lastCode ? status : CMPI_RC_ERR_FAILED);
}

/// What stands between the tags of the response: the result, or the error in its place.
std::string contentOf(Broker& broker, Pulls& pulls, const Request& request)
{
    const auto failure = [](int status, std::string_view text)
    {
        std::string content;
        XmlText(content).leaf("ERROR", "", {{"CODE", codeOf(status)}, {"DESCRIPTION", text}});
        return content;
    };
    try
    {
        std::string content;
        XmlText xml(content);
        Operation operation(broker, pulls, request, xml);
        expect(broker.findClass(request.nameSpace, {}));
        request.extrinsic ? carryOutExtrinsic(operation) : carryOutIntrinsic(operation);
        return content;
    }
    catch (const CimFailure& error)
    {
        return failure(error.status, error.text.empty() ? statusName(static_cast<CMPIrc>(error.status)) : error.text);
    }
    catch (const std::invalid_argument& error)
    {
        return failure(CMPI_RC_ERR_INVALID_PARAMETER, error.what());
    }
}

} // namespace

std::string answer(Broker& broker, Pulls& pulls, std::string_view text)
{
    pugi::xml_document document;
    parseXml(document, text);
    const Request request = readRequest(document);
    const std::string content = contentOf(broker, pulls, request);
    std::string response = R"(<?xml version="1.0" encoding="utf-8"?>)";
    {
        XmlText xml(response);
        const XmlElement cim(xml, "CIM", {{"CIMVERSION", "2.0"}, {"DTDVERSION", "2.0"}});
        const XmlElement message(xml, "MESSAGE", {{"ID", request.id}, {"PROTOCOLVERSION", "1.0"}});
        const XmlElement simple(xml, "SIMPLERSP");
        const XmlElement result(xml, request.extrinsic ? "METHODRESPONSE" : "IMETHODRESPONSE",
                                {{"NAME", request.name}});
        response += content;
    }
    return response;
}

} // namespace cimxml
