#include "broker/cimxml/Operations.h"

#include "broker/cimxml/Encode.h"
#include "broker/cimxml/Qualifiers.h"
#include "broker/cimxml/Request.h"
#include "broker/http/Journal.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <exception>
#include <new>
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

/// A response on its way: the frame of its request, and what the operation writes into it. Not more than a part of it
/// is kept, so that a failure behind the first part cannot be told any more but by ending early.
class ResponseText
{
public:
    ResponseText(const Request& request, const Output& output) : _request(request), _output(output) { begin(); }

    XmlText& xml() { return _xml; }
    /// Between two elements: gives away what was written when that is much. False when nobody takes it.
    bool passOn()
    {
        constexpr std::size_t much = 64 << 10;
        return _text.size() < much || give();
    }
    /// The end of a result.
    bool finish()
    {
        const char* const elements[] = {kind(), "SIMPLERSP", "MESSAGE", "CIM"};
        for (const char* element : elements)
            _xml.close(element);
        return give();
    }
    /// The error in the place of the result. False when a part of that is on its way already.
    bool fail(int status, std::string_view text)
    {
        if (_given)
            return false;
        begin();
        _xml.leaf("ERROR", "", {{"CODE", codeOf(status)}, {"DESCRIPTION", text}});
        return finish();
    }

private:
    /// Those above are CMPI's alone.
    static std::string codeOf(int status)
    {
        constexpr int lastCode = 28;
        return std::to_string(status >= CMPI_RC_ERR_FAILED && status <= lastCode ? status : CMPI_RC_ERR_FAILED);
    }
    const char* kind() const { return _request.extrinsic ? "METHODRESPONSE" : "IMETHODRESPONSE"; }
    void begin()
    {
        _text = R"(<?xml version="1.0" encoding="utf-8"?>)";
        _xml.open("CIM", {{"CIMVERSION", "2.0"}, {"DTDVERSION", "2.0"}});
        _xml.open("MESSAGE", {{"ID", _request.id}, {"PROTOCOLVERSION", "1.0"}});
        _xml.open("SIMPLERSP");
        _xml.open(kind(), {{"NAME", _request.name}});
    }
    bool give()
    {
        _given = true;
        const bool taken = _output(_text);
        _text.clear();
        return taken;
    }

    const Request& _request;
    const Output& _output;
    std::string _text;
    XmlText _xml{_text};
    bool _given = false;
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
    Operation(Broker& target, Pulls& kept, const Request& request, ResponseText& response, const http::Caller& caller)
        : broker(target), pulls(kept), xml(response.xml()), _request(request), _response(response), _caller(caller),
          _decoder(target.classes(), request.nameSpace)
    {}

    Broker& broker;
    Pulls& pulls;
    XmlText& xml;

    const Request& request() const { return _request; }
    const std::string& nameSpace() const { return _request.nameSpace; }
    const Decoder& decoder() const { return _decoder; }
    const ClassInfo* classOf(const Object& object) const { return broker.classes().find(object.path.className); }
    /// See ResponseText.
    bool passOn() { return _response.passOn(); }
    bool mayChange() const { return _caller.mayChange; }
    /// Tells the journal of a change, and expects that it went well.
    void expectChange(const std::string& verb, const Path& path, const Outcome& outcome) const
    {
        http::tellChange(_caller, verb, path, outcome.ok() ? "done" : statusName(outcome.status));
        expect(outcome);
    }
    void expectCall(const std::string& method, const Path& path, const MethodReply& reply) const
    {
        http::tellCall(_caller, method, path, reply);
        expect(reply);
    }

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
    /// The instance that the operation is about. Those of associations have another name for it, unless they are
    /// pulled.
    Path source() const
    {
        const xml_node node = required(_request.parameter("InstanceName") ? "InstanceName" : "ObjectName");
        if (std::string_view(node.name()) == "CLASSNAME")
            throw CimFailure{CMPI_RC_ERR_NOT_SUPPORTED, "associations of classes are not supported"};
        return _decoder.path(node);
    }
    /// Fails unless the namespace has the class of an INSTANCE.
    void expectClassOf(const xml_node& instance) const
    {
        if (std::string_view(instance.name()) == "INSTANCE")
            expect(broker.findClass(nameSpace(), instance.attribute("CLASSNAME").value()));
    }
    AssociationFilter filter() const
    {
        const bool ofAssociations = _request.name.find("Reference") != std::string::npos;
        return {className(ofAssociations ? "ResultClass" : "AssocClass"),
                ofAssociations ? std::string() : className("ResultClass"), text("Role"), text("ResultRole")};
    }

private:
    const Request& _request;
    ResponseText& _response;
    const http::Caller& _caller;
    Decoder _decoder;
};

// --- results of any size

Outcome askInstances(const Operation& operation, const ObjectSink& sink)
{
    return operation.broker.enumerateInstances(operation.nameSpace(), operation.requiredClass("ClassName").name,
                                               operation.properties(), sink);
}

Outcome askInstanceNames(const Operation& operation, const PathSink& sink)
{
    return operation.broker.enumerateInstanceNames(operation.nameSpace(), operation.requiredClass("ClassName").name,
                                                   sink);
}

Outcome askAssociators(const Operation& operation, const ObjectSink& sink)
{
    return operation.broker.associators(operation.source(), operation.filter(), operation.properties(), sink);
}

Outcome askAssociatorNames(const Operation& operation, const PathSink& sink)
{
    return operation.broker.associatorNames(operation.source(), operation.filter(), sink);
}

Outcome askReferences(const Operation& operation, const ObjectSink& sink)
{
    return operation.broker.references(operation.source(), operation.filter(), operation.properties(), sink);
}

Outcome askReferenceNames(const Operation& operation, const PathSink& sink)
{
    return operation.broker.referenceNames(operation.source(), operation.filter(), sink);
}

/// Carries out what gives its results to a sink. `take(result)` says whether it wants more. Nothing is thrown through
/// the provider.
template <class Result, class Take>
void forEach(const Operation& operation, Outcome (*ask)(const Operation&, const Sink<Result>&), Take take)
{
    std::exception_ptr thrown;
    const auto guarded = [&](Result&& result)
    {
        try
        {
            return take(std::as_const(result));
        }
        catch (...)
        {
            thrown = std::current_exception();
            return false;
        }
    };
    const Outcome outcome = ask(operation, {.take = guarded, .forgets = true});
    if (thrown)
        std::rethrow_exception(thrown);
    expect(outcome);
}

/// Writes each result as it comes.
template <auto ask, auto write> void writeEach(Operation& operation)
{
    forEach(operation, ask,
            [&](const auto& result)
            {
                write(operation, operation.xml, result);
                return operation.passOn();
            });
}

void writeNamed(const Operation& operation, XmlText& xml, const Object& object)
{
    const XmlElement named(xml, "VALUE.NAMEDINSTANCE");
    writeInstanceName(xml, object.path);
    writeInstance(xml, object, operation.classOf(object));
}

template <const auto& element> void writeWithPath(const Operation& operation, XmlText& xml, const Object& object)
{
    const XmlElement whole(xml, element);
    writeInstancePath(xml, object.path);
    writeInstance(xml, object, operation.classOf(object));
}

void writeName(const Operation&, XmlText& xml, const Path& path)
{
    writeInstanceName(xml, path);
}

void writePath(const Operation&, XmlText& xml, const Path& path)
{
    writeInstancePath(xml, path);
}

void writeObjectPath(const Operation& operation, XmlText& xml, const Path& path)
{
    const XmlElement whole(xml, "OBJECTPATH");
    writePath(operation, xml, path);
}

constexpr char objectWithPath[] = "VALUE.OBJECTWITHPATH";
constexpr char instanceWithPath[] = "VALUE.INSTANCEWITHPATH";

// --- instances

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
    const xml_node instance = operation.required("NewInstance");
    operation.expectClassOf(instance);
    const Object object = operation.decoder().instance(instance);
    const NamesReply reply = operation.broker.createInstance(object);
    operation.expectChange("created", reply.paths.empty() ? object.path : reply.paths.front(), reply);
    for (const Path& path : reply.paths)
        writeInstanceName(operation.xml, path);
}

void modifyInstance(Operation& operation)
{
    const xml_node named = operation.required("ModifiedInstance");
    operation.expectClassOf(childOf(named, "INSTANCE"));
    const Object object = operation.decoder().namedInstance(named);
    operation.expectChange("changed", object.path, operation.broker.modifyInstance(object, operation.properties()));
}

void deleteInstance(Operation& operation)
{
    const Path path = operation.decoder().path(operation.required("InstanceName"));
    operation.expectChange("deleted", path, operation.broker.deleteInstance(path));
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
    {
        writeClass(operation.xml, *info, viewOf(operation));
        if (!operation.passOn())
            return;
    }
}

void enumerateClassNames(Operation& operation)
{
    for (const ClassInfo* info : classesBelow(operation))
        operation.xml.leaf("CLASSNAME", "", {{"NAME", info->name}});
}

// --- single properties, and qualifiers

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
    const Path path = operation.source();
    const FeatureInfo& property = namedProperty(operation, path);
    const Reply reply = operation.broker.getInstance(path, std::vector{property.name});
    expect(reply);
    for (const Object& object : reply.objects)
        writeValue(operation.xml, object.get(property.name));
}

void setProperty(Operation& operation)
{
    const Path path = operation.source();
    const FeatureInfo& property = namedProperty(operation, path);
    const Target target(operation.broker.classes(), operation.nameSpace(), property);
    const Value value = operation.decoder().value(operation.request().parameter("NewValue"), target);
    operation.expectChange(
        "changed " + property.name + " of", path,
        operation.broker.modifyInstance({path, {{property.name, value}}}, std::vector{property.name}));
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
        {
            operation.xml.markup(element);
            if (!operation.passOn())
                break;
        }
    }
    const auto write = [&](const char* name, const char* type, std::string_view value)
    {
        const XmlElement out(operation.xml, "PARAMVALUE", {{"NAME", name}, {"PARAMTYPE", type}});
        operation.xml.leaf("VALUE", value);
    };
    write("EnumerationContext", "string", part.context);
    write("EndOfSequence", "boolean", part.context.empty() ? "TRUE" : "FALSE");
}

void expectNoFilter(const Operation& operation)
{
    if (!operation.text("FilterQueryLanguage").empty() || !operation.text("FilterQuery").empty())
        throw CimFailure{noFilters, "filters are not supported"};
}

template <PulledKind kind, auto ask, auto write> void open(Operation& operation)
{
    expectNoFilter(operation);
    Collected result(operation.pulls);
    forEach(operation, ask,
            [&](const auto& item)
            {
                std::string element;
                XmlText xml(element);
                write(operation, xml, item);
                if (!result.add(std::move(element)))
                    throw CimFailure{limitsExceeded, "too many results are being pulled"};
                return true;
            });
    const std::uint32_t time = operation.number("OperationTimeout").value_or(0);
    const std::optional<Part> part =
        operation.pulls.open(kind, result, operation.number("MaxObjectCount").value_or(0),
                             std::chrono::seconds(time == 0 ? longestTime : std::min(time, longestTime)));
    if (!part)
        throw CimFailure{limitsExceeded, "too many results are being pulled"};
    writePart(operation, *part);
}

template <auto ask> void openObjects(Operation& operation)
{
    open<PulledKind::instances, ask, writeWithPath<instanceWithPath>>(operation);
}

template <auto ask> void openPaths(Operation& operation)
{
    open<PulledKind::paths, ask, writePath>(operation);
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
    bool changes = false;
};

constexpr Row rows[] = {
    {"EnumerateInstances", writeEach<askInstances, writeNamed>},
    {"EnumerateInstanceNames", writeEach<askInstanceNames, writeName>},
    {"GetInstance", getInstance},
    {"CreateInstance", createInstance, true, true},
    {"ModifyInstance", modifyInstance, false, true},
    {"DeleteInstance", deleteInstance, false, true},
    {"Associators", writeEach<askAssociators, writeWithPath<objectWithPath>>},
    {"AssociatorNames", writeEach<askAssociatorNames, writeObjectPath>},
    {"References", writeEach<askReferences, writeWithPath<objectWithPath>>},
    {"ReferenceNames", writeEach<askReferenceNames, writeObjectPath>},
    {"GetClass", getClass},
    {"EnumerateClasses", enumerateClasses},
    {"EnumerateClassNames", enumerateClassNames},
    {"GetProperty", getProperty},
    {"SetProperty", setProperty, false, true},
    {"GetQualifier", getQualifier},
    {"EnumerateQualifiers", enumerateQualifiers},
    {"OpenEnumerateInstances", openObjects<askInstances>, false},
    {"OpenEnumerateInstancePaths", openPaths<askInstanceNames>, false},
    {"OpenAssociatorInstances", openObjects<askAssociators>, false},
    {"OpenAssociatorInstancePaths", openPaths<askAssociatorNames>, false},
    {"OpenReferenceInstances", openObjects<askReferences>, false},
    {"OpenReferenceInstancePaths", openPaths<askReferenceNames>, false},
    {"PullInstancesWithPath", pull<PulledKind::instances>, false},
    {"PullInstancePaths", pull<PulledKind::paths>, false},
    {"CloseEnumeration", closeEnumeration, false},
};

void expectRight(const Operation& operation)
{
    if (!operation.mayChange())
        throw CimFailure{CMPI_RC_ERR_ACCESS_DENIED, "who asks may only read"};
}

void carryOutIntrinsic(Operation& operation)
{
    const auto* row =
        std::ranges::find_if(rows, [&](const Row& known) { return sameName(known.name, operation.request().name); });
    if (row == std::end(rows))
        throw CimFailure{CMPI_RC_ERR_NOT_SUPPORTED,
                         "the operation '" + operation.request().name + "' is not supported"};
    if (row->changes)
        expectRight(operation);
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
    expectRight(operation);
    const Request& request = operation.request();
    const Path path = operation.decoder().path(firstElement(request.call));
    expect(operation.broker.findClass(path.nameSpace, path.className));
    const ClassInfo* info = operation.broker.classes().find(path.className);
    const MethodInfo* method = info->method(request.name);
    if (!method)
        throw CimFailure{CMPI_RC_ERR_METHOD_NOT_FOUND, info->name + " has no method '" + request.name + "'"};
    const MethodReply reply = operation.broker.invokeMethod(path, method->name, argumentsOf(operation, *method));
    operation.expectCall(info->name + "." + method->name, path, reply);
    writeReply(operation.xml, reply);
}

} // namespace

bool answer(Broker& broker, Pulls& pulls, const Message& message, const Output& output, const http::Caller& caller)
{
    const Request& request = message.request;
    ResponseText response(request, output);
    try
    {
        Operation operation(broker, pulls, request, response, caller);
        expect(broker.findNameSpace(request.nameSpace));
        request.extrinsic ? carryOutExtrinsic(operation) : carryOutIntrinsic(operation);
        return response.finish();
    }
    catch (const CimFailure& error)
    {
        return response.fail(error.status,
                             error.text.empty() ? statusName(static_cast<CMPIrc>(error.status)) : error.text);
    }
    catch (const std::invalid_argument& error)
    {
        return response.fail(CMPI_RC_ERR_INVALID_PARAMETER, error.what());
    }
    catch (const std::bad_alloc&)
    {
        return response.fail(CMPI_RC_ERR_FAILED, "there is not enough memory");
    }
}

std::string answer(Broker& broker, Pulls& pulls, std::string_view request)
{
    std::string response;
    const auto collect = [&](std::string_view part)
    {
        response += part;
        return true;
    };
    answer(broker, pulls, Message(request), collect);
    return response;
}

} // namespace cimxml
