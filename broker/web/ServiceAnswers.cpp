// Logs, diagnostic tests, and methods that are called.
#include "broker/host/LogEntries.h"
#include "broker/host/ReadableText.h"
#include "broker/http/Journal.h"
#include "broker/values/PathText.h"
#include "broker/values/SchemaText.h"
#include "broker/values/ValueMap.h"
#include "broker/values/ValueText.h"
#include "broker/web/Asking.h"
#include "broker/web/Body.h"

#include <algorithm>
#include <map>

namespace web
{

using namespace broker;

namespace
{

using Failures = std::vector<std::string>;

/// The name that the schema gives to a property's value, or the value where it has none.
std::string nameOfValue(const State& state, const Object& object, const char* property)
{
    const ClassInfo* info = state.broker.classes().find(object.path.className);
    const Value& value = object.get(property);
    const std::string_view name = info ? valueName(valueNames(*info, property), value) : std::string_view();
    return name.empty() ? oneLine(valueText(value)) : std::string(name);
}

Json numberOrNull(const Object& object, const char* property)
{
    const Value& value = object.get(property);
    return value.isNull() || value.isArray() || integerBits(value.type()) == 0 ? Json() : Json(value.asUnsigned());
}

// --- logs

constexpr std::size_t usualEntries = 200;
constexpr std::size_t largestEntries = 1000;

Json logJson(const LogKind& kind, const Object& log)
{
    return {{"id", kind.id},
            {"name", kind.name},
            {"path", fullPathText(log.path)},
            {"enabled", !log.get("EnabledState").isNull() && log.get("EnabledState") == Value::uint16(2)},
            {"entries", numberOrNull(log, "CurrentNumberOfRecords")}};
}

const LogKind& logNamed(const std::string& id)
{
    for (const LogKind* kind : {&providerLogKind, &driverLogKind})
        if (id == kind->id)
            return *kind;
    throw NothingThere("there is no log '" + id + "'");
}

// --- diagnostic tests

/// What an association's end refers to; nothing for a null or another value.
const Path* endOf(const Object& association, const char* role)
{
    const Value& value = association.get(role);
    return value.type() == CMPI_ref && !value.isNull() ? &value.asPath() : nullptr;
}

std::string keyText(const Path& path, const char* key)
{
    const Value* value = path.key(key);
    return value && !value->isNull() ? valueText(*value) : std::string();
}

Json portJson(const Path& port)
{
    return {{"port", oneLine(keyText(port, "DeviceID"))}, {"path", fullPathText(port)}};
}

/// The text of the help service of the test's name.
std::map<std::string, std::string> helpTexts(const State& state, Failures& failures)
{
    std::map<std::string, std::string> helps;
    for (const Object& help : instancesOf(state, "TVRHBA_HelpService", failures))
    {
        const Value& texts = help.get("DocumentDescriptions");
        if (texts.type() == CMPI_stringA && !texts.isNull() && !texts.asList().empty())
            helps[textOf(help, "Name")] = oneLine(valueText(texts.asList().front()));
    }
    return helps;
}

Json testsJson(const State& state, Failures& failures)
{
    std::map<std::string, Json> ports; // by test
    for (const Object& available : instancesOf(state, "TVRHBA_AvailableDiagnosticService", failures))
    {
        const Path* test = endOf(available, "ServiceProvided");
        const Path* port = endOf(available, "UserOfService");
        if (test && port)
            ports[keyText(*test, "Name")].push_back(portJson(*port));
    }
    const std::map<std::string, std::string> helps = helpTexts(state, failures);
    Json tests = Json::array();
    for (const Object& test : instancesOf(state, "TVRHBA_FCHBADiagnosticTest", failures))
    {
        const std::string name = textOf(test, "Name");
        const auto help = helps.find(name);
        const auto runs = ports.find(name);
        tests.push_back({{"name", oneLine(name)},
                         {"path", fullPathText(test.path)},
                         {"help", help == helps.end() ? "" : help->second},
                         {"ports", runs == ports.end() ? Json::array() : runs->second}});
    }
    return tests;
}

/// The ports on which tests run or ran, by the name of the job.
using PortsByJob = std::map<std::string, std::string>;

PortsByJob portsOfJobs(const State& state, Failures& failures)
{
    PortsByJob ports;
    for (const Object& affected : instancesOf(state, "TVRHBA_AffectedJobElement", failures))
    {
        const Path* job = endOf(affected, "AffectingElement");
        const Path* port = endOf(affected, "AffectedElement");
        if (job && port)
            ports[keyText(*job, "InstanceID")] = oneLine(keyText(*port, "DeviceID"));
    }
    return ports;
}

Json portOf(const PortsByJob& ports, const Object& jobOrRecord)
{
    const auto port = ports.find(textOf(jobOrRecord, "InstanceID"));
    return port == ports.end() ? Json() : Json(port->second);
}

Json jobsJson(const State& state, const PortsByJob& ports, Failures& failures)
{
    Json jobs = Json::array();
    for (const Object& job : instancesOf(state, "TVRHBA_ConcreteJob", failures))
        jobs.push_back({{"path", fullPathText(job.path)},
                        {"id", oneLine(textOf(job, "InstanceID"))},
                        {"name", oneLine(textOf(job, "Name"))},
                        {"state", nameOfValue(state, job, "JobState")},
                        {"percent", numberOrNull(job, "PercentComplete")},
                        {"error", numberOrNull(job, "ErrorCode")},
                        {"port", portOf(ports, job)}});
    return jobs;
}

/// The verdicts: a run has ended when there is one with the name of its job.
Json recordsJson(const State& state, const PortsByJob& ports, Failures& failures)
{
    Json records = Json::array();
    for (const Object& record : instancesOf(state, "TVRHBA_DiagnosticCompletionRecord", failures))
        records.push_back({{"path", fullPathText(record.path)},
                           {"id", oneLine(textOf(record, "InstanceID"))},
                           {"time", orNull(creationTime(record))},
                           {"test", oneLine(textOf(record, "ServiceName"))},
                           {"port", portOf(ports, record)},
                           {"state", nameOfValue(state, record, "CompletionState")},
                           {"text", oneLine(withSingleBlanks(textOf(record, "RecordData")))}});
    return records;
}

// --- methods

constexpr const char* anyElement = "CIM_EnabledLogicalElement";

/// Inherited by nearly all classes, and carried out by few.
bool isOfAnyElement(const MethodInfo& method)
{
    return method.origin && sameName(method.origin->name, anyElement);
}

/// The schema describes what the provider carries out.
bool isDescribed(const ClassInfo& info, const MethodInfo& method)
{
    return !descriptionOf(info, method.name).empty();
}

bool hasMethods(const ClassInfo& info)
{
    return std::ranges::any_of(info.methods, [&](const MethodInfo& method)
                               { return isDescribed(info, method) && !isOfAnyElement(method); });
}

/// An element that cannot be asked for a state says so in the state that was asked for last.
bool takesStates(const Object& object)
{
    constexpr std::uint64_t notApplicable = 12;
    const Json state = numberOrNull(object, "RequestedState");
    return !state.is_null() && state != notApplicable;
}

void addMethods(Json& list, const ClassInfo& info, const std::vector<Object>& objects)
{
    for (const MethodInfo& method : info.methods)
    {
        Json instances = Json::array();
        if (isDescribed(info, method))
            for (const Object& object : objects)
                if (!isOfAnyElement(method) || takesStates(object))
                    instances.push_back({{"path", fullPathText(object.path)}, {"name", shortName(object.path)}});
        if (!instances.empty())
            list.push_back({{"class", info.name},
                            {"method", method.name},
                            {"description", descriptionOf(info, method.name)},
                            {"instances", std::move(instances)}});
    }
}

std::string readMethods(const State& state)
{
    Json list = Json::array();
    Failures failures;
    for (const std::string& name : state.broker.servedClasses())
        if (const ClassInfo& info = classNamed(state, name);
            state.broker.serves(name, Kind::method) && hasMethods(info))
            addMethods(list, info, instancesOf(state, name, failures));
    return jsonText({{"methods", std::move(list)}, {"failures", std::move(failures)}});
}

/// A call as it was asked for.
struct Call
{
    Path path;
    const ClassInfo& info;
    const MethodInfo& method;
    std::vector<Property> in = {};
};

const std::string& memberText(const Json& body, const char* name)
{
    const auto found = body.find(name);
    if (found == body.end() || !found->is_string())
        throw ArgumentFailure(std::string(name) + ": a text is wanted");
    return found->get_ref<const std::string&>();
}

Value argumentOf(const State& state, const Call& call, const std::string& name, const Json& json)
{
    const FeatureInfo* parameter = call.method.parameter(name);
    if (!parameter || !(parameter->flags & cimple::META_IN))
        throw ArgumentFailure(name + ": " + call.method.name + " takes no such parameter");
    try
    {
        return valueFromJson(Target(state.broker.classes(), call.path.nameSpace, *parameter), json);
    }
    catch (const std::invalid_argument& error)
    {
        throw ArgumentFailure(name + ": " + error.what());
    }
    catch (const Json::exception&)
    {
        throw ArgumentFailure(name + ": a member has a value of the wrong type");
    }
}

Call callOf(const State& state, const Json& body)
{
    if (!body.is_object())
        throw ArgumentFailure("the body is an object with path and method");
    for (const auto& [name, value] : body.items())
        if (name != "path" && name != "method" && name != "in")
            throw ArgumentFailure(name + ": there is no such member");
    const Path path = pathNamed(state, "path", memberText(body, "path"));
    const ClassInfo& info = classNamed(state, path.className);
    const std::string& name = memberText(body, "method");
    const MethodInfo* method = info.method(name);
    if (!method)
        throw NothingThere(info.name + " has no method '" + name + "'");
    Call call{path, info, *method};
    const Json in = body.value("in", Json::object());
    if (!in.is_object())
        throw ArgumentFailure("in: an object is wanted");
    for (const auto& [parameter, value] : in.items())
        call.in.push_back({call.method.parameter(parameter) ? call.method.parameter(parameter)->name : parameter,
                           argumentOf(state, call, parameter, value)});
    return call;
}

/// As people read them.
Json outTexts(const Call& call, const std::vector<Property>& out)
{
    Json texts = Json::object();
    for (const Property& each : out)
        texts[each.name] =
            each.value.isNull() ? Json() : Json(shownText(&call.info, each.value, call.method.name, each.name));
    return texts;
}

} // namespace

std::string logs(const Question& question)
{
    Query(question.request.params, {});
    Json list = Json::array();
    for (const Object& log : instancesOf(question.state, "TVRHBA_RecordLog"))
        for (const LogKind* kind : {&providerLogKind, &driverLogKind})
            if (isLogOf(*kind, log))
                list.push_back(logJson(*kind, log));
    return jsonText(list);
}

std::string logEntries(const Question& question)
{
    const Query query(question.request.params, {"from", "count"});
    Page page = Page::of(query, usualEntries, largestEntries);
    const LogKind& kind = logNamed(question.rest);
    std::vector<Object> entries = instancesOf(question.state, kind.entryClass);
    sortEntries(kind, entries);
    std::ranges::reverse(entries);
    Json list = Json::array();
    for (const std::size_t end = page.cutTo(entries.size()); page.from < end; page.from++)
    {
        const LogLine line = kind.line(entries[page.from]);
        list.push_back({{"time", orNull(line.time)}, {"severity", orNull(line.severity)}, {"text", line.text}});
    }
    return jsonText({{"total", entries.size()}, {"entries", std::move(list)}});
}

std::string diagnostics(const Question& question)
{
    Query(question.request.params, {});
    const State& state = question.state;
    Failures failures;
    const PortsByJob ports = portsOfJobs(state, failures);
    Json tests = testsJson(state, failures);
    Json jobs = jobsJson(state, ports, failures);
    Json records = recordsJson(state, ports, failures);
    return jsonText({{"tests", std::move(tests)},
                     {"jobs", std::move(jobs)},
                     {"records", std::move(records)},
                     {"failures", std::move(failures)}});
}

std::string methods(const Question& question)
{
    Query(question.request.params, {});
    State& state = question.state;
    return state.texts.get("methods", keptFor, [&] { return std::make_shared<Text>(Text{readMethods(state)}); })->text;
}

std::string call(const Question& question)
{
    Query(question.request.params, {});
    State& state = question.state;
    const Call call = callOf(state, parseBody(question.request.body));
    const MethodReply reply = state.broker.invokeMethod(call.path, call.method.name, call.in);
    state.dropKept();
    http::tellCall(question.caller, call.info.name + "." + call.method.name, call.path, reply);
    checked(static_cast<const Outcome&>(reply));
    const std::string_view meaning = valueName(valueNames(call.info, call.method.name), reply.returnValue);
    return jsonText({{"returnValue", toJson(reply.returnValue)},
                     {"returnText", meaning.empty() ? Json() : Json(meaning)},
                     {"out", propertiesToJson(reply.out)},
                     {"outText", outTexts(call, reply.out)}});
}

} // namespace web
