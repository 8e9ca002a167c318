#include "broker/tvrcim/Commands.h"

#include "broker/host/HostReport.h"
#include "broker/tvrcim/Arguments.h"
#include "broker/tvrcim/DiagCommand.h"
#include "broker/tvrcim/Graphviz.h"
#include "broker/tvrcim/LogCommand.h"
#include "broker/tvrcim/Progress.h"
#include "broker/tvrcim/Replies.h"
#include "broker/tvrcim/ServeCommand.h"
#include "broker/tvrcim/Topology.h"
#include "broker/values/PathText.h"
#include "broker/values/ValueMap.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
#include <filesystem>
#include <fstream>

namespace tvrcim
{

using namespace broker;

namespace
{

const ClassInfo& classOf(const Session& session, const std::string& name)
{
    const ClassInfo* info = session.broker.classes().find(name);
    if (!info)
        throw CimError({CMPI_RC_ERR_INVALID_CLASS, "there is no class '" + name + "'"});
    return *info;
}

std::vector<std::string> namesOf(const std::vector<Property>& properties)
{
    std::vector<std::string> names;
    std::transform(properties.begin(), properties.end(), std::back_inserter(names),
                   [](const Property& property) { return property.name; });
    return names;
}

void done(Session& session, const Json& json, const std::string& text)
{
    if (session.format == Format::json)
        printJson(session.out, json);
    else
        session.out << text << '\n';
}

/// Runs an operation that may take long.
template <class Operation> auto changing(Session& session, const std::string& what, Operation operation)
{
    const Progress progress(session.progress, what);
    return checked(operation());
}

// --- one function a command ----------------------------------------------------------------------------

void listClasses(Session& session, const Command& command)
{
    std::vector<const ClassInfo*> classes;
    for (const auto& info : session.broker.classes().all())
    {
        const std::vector<std::string>& served = session.broker.servedClasses();
        if (command.all || std::find(served.begin(), served.end(), info->name) != served.end())
            classes.push_back(info.get());
    }
    std::sort(classes.begin(), classes.end(),
              [](const ClassInfo* a, const ClassInfo* b) { return NameLess{}(a->name, b->name); });
    printClasses(session.out, session.format, classes);
}

void showClass(Session& session, const Command& command)
{
    printClass(session.out, session.format, classOf(session, command.target));
}

void enumerate(Session& session, const Command& command)
{
    if (command.names)
    {
        printPaths(session.out, session.format,
                   checked(session.broker.enumerateInstanceNames(session.nameSpace, command.target)).paths);
        return;
    }
    const Reply reply =
        checked(session.broker.enumerateInstances(session.nameSpace, command.target, command.properties));
    printObjects(session.out, session.format, session.broker.classes(), reply.objects, command.properties);
}

void get(Session& session, const Command& command)
{
    const Reply reply =
        checked(session.broker.getInstance(instancePathOf(session, command.target), command.properties));
    if (session.format == Format::json)
    {
        printJson(session.out, toJson(reply.objects.front()));
        return;
    }
    printObjects(session.out, session.format, session.broker.classes(), reply.objects, std::nullopt);
}

/// The two forms of an association operation.
struct Traversal
{
    NamesReply (Broker::*names)(const Path& path, const AssociationFilter& filter);
    Reply (Broker::*objects)(const Path& path, const AssociationFilter& filter, const PropertyList& properties);
};

void follow(Session& session, const Command& command, const Traversal& traversal)
{
    const Path path = instancePathOf(session, command.target);
    if (command.names)
    {
        printPaths(session.out, session.format, checked((session.broker.*traversal.names)(path, command.filter)).paths);
        return;
    }
    const Reply reply = checked((session.broker.*traversal.objects)(path, command.filter, command.properties));
    printObjects(session.out, session.format, session.broker.classes(), reply.objects, command.properties);
}

void followAssociations(Session& session, const Command& command)
{
    follow(session, command, {&Broker::associatorNames, &Broker::associators});
}

void followReferences(Session& session, const Command& command)
{
    follow(session, command, {&Broker::referenceNames, &Broker::references});
}

void set(Session& session, const Command& command)
{
    const Path path = instancePathOf(session, command.target);
    const ClassInfo& info = classOf(session, path.className);
    const Object object{path,
                        parseAssignments(session, {path.nameSpace, info.properties, info.name}, command.assignments)};
    const std::vector<std::string> names = namesOf(object.properties);
    changing(session, command.name, [&] { return session.broker.modifyInstance(object, names); });
    done(session, {{"path", pathText(path)}, {"changed", names}}, "changed " + pathText(path));
}

void create(Session& session, const Command& command)
{
    const ClassInfo& info = classOf(session, command.target);
    Object object{{session.nameSpace, info.name, {}},
                  parseAssignments(session, {session.nameSpace, info.properties, info.name}, command.assignments)};
    for (const std::string& key : info.keys)
        if (object.has(key))
            object.path.setKey(key, object.get(key));
    const NamesReply made = changing(session, command.name, [&] { return session.broker.createInstance(object); });
    printPaths(session.out, session.format, made.paths);
}

void remove(Session& session, const Command& command)
{
    const Path path = instancePathOf(session, command.target);
    changing(session, command.name, [&] { return session.broker.deleteInstance(path); });
    done(session, {{"path", pathText(path)}, {"deleted", true}}, "deleted " + pathText(path));
}

const MethodInfo& methodOf(const ClassInfo& info, const std::string& name)
{
    const MethodInfo* method = info.method(name);
    if (!method)
        throw CimError({CMPI_RC_ERR_METHOD_NOT_FOUND, info.name + " has no method '" + name + "'"});
    return *method;
}

void showMethods(Session& session, const Command& command)
{
    const ClassInfo& info = classOf(session, command.target);
    std::vector<const MethodInfo*> methods;
    if (command.method.empty())
        for (const MethodInfo& method : info.methods)
            methods.push_back(&method);
    else
        methods.push_back(&methodOf(info, command.method));
    printMethods(session.out, session.format, info, methods);
}

void refuseUnlessZero(const ClassInfo& info, const MethodInfo& method, const MethodReply& reply)
{
    const Value& returned = reply.returnValue;
    if (!returned.isNull() && isInteger(returned.type()) && returned.asUnsigned() != 0)
        throw MethodRefusal(method.name + " returned " + valueWithName(valueNames(info, method.name), returned));
}

void call(Session& session, const Command& command)
{
    const Path named = pathOf(session, command.target);
    const ClassInfo& info = classOf(session, named.className);
    const MethodInfo& method = methodOf(info, command.method);
    const Path path = method.flags & cimple::META_STATIC ? named : instancePathOf(session, command.target);
    const std::vector<Property> in =
        parseAssignments(session, {path.nameSpace, method.parameters, method.name}, command.assignments);
    const MethodReply reply =
        changing(session, method.name, [&] { return session.broker.invokeMethod(path, method.name, in); });
    printMethodReply(session.out, session.format, info, method, reply);
    refuseUnlessZero(info, method, reply);
}

void showHost(Session& session, const Command& command)
{
    const HostReport report(session.broker, session.nameSpace);
    if (session.format == Format::json)
        printJson(session.out, report.json());
    else
        report.print(session.out, {.colour = session.colour, .all = command.all});
}

// --- the dumps of a port

/// Calls a method of the dump service on a port.
MethodReply callOnDumps(Session& session, const std::string& name, const Path& port)
{
    const ClassInfo& info = classOf(session, "TVRHBA_DumpService");
    const Path service = instancePathOf(session, info.name);
    MethodReply reply =
        changing(session, name,
                 [&] {
                     return session.broker.invokeMethod(service, name, {{"Target", Value::reference(port)}});
                 });
    refuseUnlessZero(info, methodOf(info, name), reply);
    return reply;
}

void listDumps(Session& session, const Path& port)
{
    const MethodReply reply = callOnDumps(session, "GetDumpFileNames", port);
    const Property* files = findNamed(reply.out, "DumpFiles");
    Json names = Json::array();
    if (files && !files->value.isNull())
        for (const Value& name : files->value.asList())
            names.push_back(name.asString());
    if (session.format == Format::json)
        return printJson(session.out, names);
    for (const Json& name : names)
        session.out << oneLine(name.get<std::string>()) << '\n';
}

void keepDumps(Session& session, const Path& port, std::uint32_t count)
{
    const std::string& id = port.key("DeviceID")->asString();
    const Path path = instancePathOf(session, "TVRHBA_DumpData.InstanceID=TVRHBA_DumpData::" + id);
    const Object data{path, {{"RetentionCount", Value::uint32(count)}}};
    changing(session, "dump", [&] { return session.broker.modifyInstance(data, {{"RetentionCount"}}); });
    done(session, {{"port", id}, {"kept", count}}, "keeping " + std::to_string(count) + " dump files of " + id);
}

void dump(Session& session, const Command& command)
{
    const Path port = portControllerOf(session, command.target);
    if (command.keep)
        return keepDumps(session, port, *command.keep);
    if (command.deletes)
    {
        callOnDumps(session, "DeleteDump", port);
        const std::string& id = port.key("DeviceID")->asString();
        return done(session, {{"port", id}, {"deleted", true}}, "deleted the dump files of " + id);
    }
    if (!command.list)
        callOnDumps(session, "GenerateDump", port);
    listDumps(session, port);
}

// --- pictures

/// Graphviz's name of the format that a file name ends in.
std::string pictureFormat(const std::string& file)
{
    static constexpr std::array<std::array<const char*, 2>, 5> formats{
        {{".dot", "dot"}, {".gv", "dot"}, {".svg", "svg"}, {".png", "png"}, {".pdf", "pdf"}}};
    const std::string ending = std::filesystem::path(file).extension();
    const auto* row = std::ranges::find_if(formats, [&](const auto& format) { return ending == format[0]; });
    if (row == formats.end())
        throw UsageError("--output: '" + file + "' does not end in .dot, .gv, .svg, .png or .pdf");
    return (*row)[1];
}

void writeFile(const std::string& name, const std::string& content)
{
    std::ofstream file(name, std::ios::binary);
    file << content;
    file.close();
    if (!file)
        throw UsageError("--output: cannot write '" + name + "'");
}

void drawTopology(Session& session, const Command& command)
{
    if (session.format != Format::table)
        throw UsageError("--format: a picture is none of table, json or mof; --output says its format");
    const std::string format = command.output.empty() ? "dot" : pictureFormat(command.output);
    const std::string dot = topologyDot(HostReport(session.broker, session.nameSpace).root(), command.all);
    if (command.output.empty())
        session.out << dot;
    else
        writeFile(command.output, format == "dot" ? dot : drawnByGraphviz(dot, format));
}

struct CommandRow
{
    const char* name;
    void (*run)(Session& session, const Command& command);
};

constexpr std::array<CommandRow, 17> commands{{
    {"classes", listClasses},
    {"class", showClass},
    {"methods", showMethods},
    {"enum", enumerate},
    {"get", get},
    {"assoc", followAssociations},
    {"refs", followReferences},
    {"set", set},
    {"create", create},
    {"delete", remove},
    {"call", call},
    {"host", showHost},
    {"dump", dump},
    {"topology", drawTopology},
    {"log", showLog},
    {"diag", diagnose},
    {"serve", serve},
}};

} // namespace

void runCommand(Session& session, const Command& command)
{
    const auto* row =
        std::find_if(commands.begin(), commands.end(), [&](const CommandRow& r) { return command.name == r.name; });
    if (row == commands.end())
        throw UsageError("there is no command '" + command.name + "'");
    row->run(session, command);
}

} // namespace tvrcim
