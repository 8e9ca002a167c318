#include "broker/tvrcim/DiagCommand.h"

#include "broker/host/ReadableText.h"
#include "broker/tvrcim/Arguments.h"
#include "broker/tvrcim/Progress.h"
#include "broker/tvrcim/Replies.h"
#include "broker/tvrcim/SignalEnd.h"
#include "broker/values/Json.h"
#include "broker/values/ValueMap.h"
#include "broker/values/ValueText.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
#include <cctype>
#include <chrono>
#include <map>
#include <optional>
#include <span>
#include <thread>
#include <utility>

namespace tvrcim
{

using namespace broker;

namespace
{

constexpr const char* settingsClass = "TVRHBA_FCHBADiagnosticSettingData";

std::vector<Object> instancesOf(Session& session, const char* className)
{
    return checked(session.broker.enumerateInstances(session.nameSpace, className)).objects;
}

bool isSet(const Object& object, const char* property)
{
    return !object.get(property).isNull();
}

// --- names of tests

/// "TVR:FCHBA D-Port Test" as a person says it: "d-port".
std::string spokenName(std::string name)
{
    constexpr std::string_view head = "TVR:FCHBA ";
    constexpr std::string_view tail = " Test";
    if (name.starts_with(head))
        name.erase(0, head.size());
    if (name.ends_with(tail))
        name.erase(name.size() - tail.size());
    std::ranges::transform(name, name.begin(), [](unsigned char c) { return c == ' ' ? '-' : std::tolower(c); });
    return name;
}

/// What of a name tells it from others.
std::string bareName(const std::string& name)
{
    std::string bare = spokenName(name);
    std::erase_if(bare, [](unsigned char c) { return !std::isalnum(c); });
    return bare;
}

std::string joined(const std::vector<std::string>& texts)
{
    std::string all;
    for (const std::string& text : texts)
        all += (all.empty() ? "" : ", ") + text;
    return all;
}

/// The test whose name is or begins with what a person wrote.
const Object& testNamed(const std::vector<Object>& tests, const std::string& name)
{
    const std::string bare = bareName(name);
    std::vector<const Object*> found;
    std::vector<std::string> names;
    for (const Object& test : tests)
    {
        const std::string known = bareName(textOf(test, "Name"));
        if (known == bare)
            return test;
        if (!bare.empty() && known.starts_with(bare))
            found.push_back(&test);
    }
    if (found.size() == 1)
        return *found.front();
    const bool isAmbiguous = found.size() > 1;
    for (const Object& test : tests)
        if (!isAmbiguous || std::ranges::find(found, &test) != found.end())
            names.push_back(spokenName(textOf(test, "Name")));
    if (isAmbiguous)
        throw UsageError("TEST: '" + name + "' may be " + joined(names));
    throw UsageError("TEST: there is no test '" + name + "'; " +
                     (names.empty() ? "the host has none" : "the host has " + joined(names)));
}

// --- settings

/// A value as it can be given as a setting; bytes are the characters that they stand for.
std::string settingText(const Value& value)
{
    if (value.isNull() || !value.isArray())
        return value.isNull() ? "" : valueText(value);
    std::string text;
    for (const Value& element : value.asList())
        if (value.type() == CMPI_uint8A)
            text += static_cast<char>(element.asUnsigned());
        else
            text += (text.empty() ? "" : ",") + settingText(element);
    return text;
}

/// As parseAssignments() reads it: an array may be written as its only element, bytes as characters, and a name of a
/// port with colons.
std::string plainSetting(const ClassInfo& info, const std::string& text)
{
    const std::size_t mark = text.find('=');
    if (mark == std::string::npos)
        return text;
    const std::string name = text.substr(0, mark);
    const std::string value = text.substr(mark + 1);
    const auto feature =
        std::ranges::find_if(info.properties, [&](const FeatureInfo& f) { return sameName(f.name, name); });
    if (feature == info.properties.end() || value == "null" || value.starts_with('[') || value.starts_with('@'))
        return text;
    if (feature->name == "TargetDevice")
        return name + "=" + plainWwn(value);
    if (!(feature->type & CMPI_ARRAY))
        return text;
    if (feature->type == CMPI_stringA)
        return name + "=" + Json(std::vector<std::string>{value}).dump(-1, ' ', false, Json::error_handler_t::replace);
    if (feature->type != CMPI_uint8A)
        return name + "=[" + value + "]";
    std::string bytes;
    for (const unsigned char c : value)
        bytes += (bytes.empty() ? "" : ",") + std::to_string(c);
    return name + "=[" + bytes + "]";
}

std::vector<Property> settingsOf(const Session& session, const Command& command)
{
    const ClassInfo& info = *session.broker.classes().find(settingsClass);
    std::vector<std::string> texts;
    for (const std::string& text : command.assignments)
        texts.push_back(plainSetting(info, text));
    std::vector<Property> settings = parseAssignments(session, {session.nameSpace, info.properties, info.name}, texts);
    if (findNamed(settings, "InstanceID"))
        throw UsageError("InstanceID: it is that of the test");
    return settings;
}

/// What a test starts from, where it has settings of that kind.
std::vector<std::string> defaultsOf(const Object& settings)
{
    static constexpr const char* names[] = {"LoopControlParameter", "HaltOnError", "BufferSizes",
                                            "BufferPattern",        "LUN",         "TargetDevice"};
    const bool sends = isSet(settings, "BufferSizes");
    std::vector<std::string> texts;
    for (const std::string name : names)
        if (isSet(settings, name.c_str()) && (name != "HaltOnError" || sends))
            texts.push_back(name + "=" + settingText(settings.get(name)));
    return texts;
}

std::string withoutQuotes(std::string text)
{
    std::erase(text, '"');
    return text;
}

// --- the list

Json listOf(Session& session)
{
    const Progress progress(session.progress, "diag");
    std::map<std::string, Object> settings;
    for (const Object& found : instancesOf(session, settingsClass))
        settings.emplace(textOf(found, "InstanceID"), found);
    std::map<std::string, std::string> helps;
    for (const Object& help : instancesOf(session, "TVRHBA_HelpService"))
        if (const Value& texts = help.get("DocumentDescriptions"); !texts.isNull() && !texts.asList().empty())
            helps[textOf(help, "Name")] = texts.asList().front().asString();

    Json tests = Json::array();
    for (const Object& test : instancesOf(session, "TVRHBA_FCHBADiagnosticTest"))
    {
        const std::string name = textOf(test, "Name");
        std::vector<std::string> defaults;
        if (const auto found = settings.find(name); found != settings.end())
            for (const std::string& text : defaultsOf(found->second))
                defaults.push_back(withoutQuotes(text));
        tests.push_back({{"test", spokenName(name)}, {"name", name}, {"defaults", defaults}, {"help", helps[name]}});
    }

    std::map<std::string, std::vector<std::string>> ports;
    for (const Path& port :
         checked(session.broker.enumerateInstanceNames(session.nameSpace, "TVRHBA_PortController")).paths)
        ports[port.key("DeviceID")->asString()];
    for (const Object& available : instancesOf(session, "TVRHBA_AvailableDiagnosticService"))
        ports[available.get("UserOfService").asPath().key("DeviceID")->asString()].push_back(
            spokenName(available.get("ServiceProvided").asPath().key("Name")->asString()));
    Json runs = Json::array();
    for (const auto& [port, names] : ports)
        runs.push_back({{"port", port}, {"tests", names}});
    return {{"tests", tests}, {"ports", runs}};
}

/// "all", "all but d-port", or the names of a few.
std::string runnableText(const Json& tests, const std::vector<std::string>& runnable)
{
    std::vector<std::string> missing;
    for (const Json& test : tests)
        if (std::ranges::find(runnable, test["test"].get<std::string>()) == runnable.end())
            missing.push_back(test["test"]);
    if (runnable.empty())
        return "none";
    if (missing.empty())
        return "all";
    return missing.size() < runnable.size() ? "all but " + joined(missing) : joined(runnable);
}

void listTests(Session& session)
{
    const Json list = listOf(session);
    if (session.format == Format::json)
        return printJson(session.out, list);
    Table tests({"test", "defaults", "what it does"});
    for (const Json& test : list["tests"])
    {
        std::string defaults;
        for (const std::string text : test["defaults"])
            defaults += (defaults.empty() ? "" : " ") + text;
        tests.add({test["test"], oneLine(defaults), oneLine(test["help"].get<std::string>())});
    }
    tests.print(session.out);
    session.out << '\n';
    Table ports({"port", "runs"});
    for (const Json& port : list["ports"])
        ports.add({port["port"], runnableText(list["tests"], port["tests"])});
    ports.print(session.out);
}

// --- the end of a test

constexpr std::uint16_t jobTerminated = 8;
constexpr std::uint16_t jobFailed = 32768;

struct NumberName
{
    std::uint64_t number;
    const char* name;
};

constexpr NumberName jobStates[] = {{2, "new"},           {3, "starting"},  {4, "running"},       {5, "suspended"},
                                    {6, "shutting down"}, {7, "completed"}, {8, "terminated"},    {9, "killed"},
                                    {10, "exception"},    {11, "service"},  {jobFailed, "failed"}};

constexpr NumberName completionStates[] = {{0, "unknown"},    {1, "other"},  {2, "OK"},      {3, "warning"},
                                           {4, "incomplete"}, {5, "failed"}, {6, "aborted"}, {7, "stopped"}};

std::string nameOf(std::span<const NumberName> names, std::uint64_t number)
{
    const auto found = std::ranges::find(names, number, &NumberName::number);
    return found == names.end() ? std::to_string(number) : found->name;
}

/// What a test has left.
struct TestEnd
{
    std::optional<Object> job = {};
    std::optional<Object> completion = {};
    std::optional<Object> service = {};
    bool cancelled = false; ///< by a person here

    bool passed() const { return completion && numberOf(*completion, "CompletionState") == 2; }
    bool terminated() const { return !completion && job && numberOf(*job, "JobState") == jobTerminated; }
    const char* verdict() const { return passed() ? "passed" : terminated() ? "cancelled" : "failed"; }
};

std::optional<Object> recordOf(Session& session, const char* className, const std::string& id)
{
    for (Object& record : instancesOf(session, className))
        if (textOf(record, "InstanceID") == id)
            return std::move(record);
    return std::nullopt;
}

void readEnd(Session& session, const Path& job, TestEnd& end)
{
    const std::string id = job.key("InstanceID")->asString();
    Reply known = session.broker.getInstance(job);
    if (known.status == CMPI_RC_ERR_NOT_FOUND)
        end.job.reset();
    else
        end.job = checked(std::move(known)).objects.front();
    end.completion = recordOf(session, "TVRHBA_DiagnosticCompletionRecord", id); // in place before the job has ended
    end.service = recordOf(session, "TVRHBA_DiagnosticServiceRecord", id + ":Service Record");
}

/// A job may say at its beginning that it has ended, before anybody has looked at the test: its records, an error or a
/// state that only the end brings tell it.
bool hasEnded(const TestEnd& end)
{
    if (end.completion || !end.job)
        return true;
    const std::uint64_t state = numberOf(*end.job, "JobState");
    return state == jobTerminated || state == jobFailed || isSet(*end.job, "ErrorCode");
}

/// What the person is told of it.
std::string cancel(Session& session, const Path& job, TestEnd& end)
{
    const MethodReply reply =
        session.broker.invokeMethod(job, "RequestStateChange", {{"RequestedState", Value::uint16(4)}});
    end.cancelled = reply.ok() && reply.returnValue.asUnsigned() == 0;
    if (end.cancelled)
        return "being cancelled";
    return "cannot be cancelled (" +
           (reply.ok() ? "RequestStateChange returned " + valueText(reply.returnValue) : CimError(reply).what()) + ")";
}

bool awaitInterrupt(const Session& session, std::chrono::milliseconds limit)
{
    if (session.signals)
        return session.signals->awaitInterrupt(limit);
    std::this_thread::sleep_for(limit);
    return false;
}

/// Waits for the end of a job; SIGINT has it cancelled.
TestEnd endOf(Session& session, const Path& job, const std::string& what, Progress& progress)
{
    using namespace std::chrono_literals;
    TestEnd end;
    std::string answer; // to the wish to cancel it
    for (;;)
    {
        readEnd(session, job, end);
        if (hasEnded(end))
            return end;
        const bool isRunning = numberOf(*end.job, "JobState") == 4; // and otherwise it goes on all the same
        progress.change(what + ": " + (!answer.empty() ? answer : isRunning ? "running" : "no result yet"));
        if (!answer.empty())
            std::this_thread::sleep_for(1s);
        else if (awaitInterrupt(session, 1s))
            answer = cancel(session, job, end);
    }
}

// --- the report

struct Run
{
    std::string test; ///< as the provider names it
    std::string port;
    TestEnd end;
};

/// "-" for what there is none of.
std::string elementText(const Object& record, const char* property, std::size_t index)
{
    const Value& value = record.get(property);
    if (value.isNull() || index >= value.asList().size())
        return "-";
    std::string text = withoutQuotes(valueText(value.asList()[index]));
    if (text.ends_with(','))
        text.pop_back();
    return text.empty() || text == "0" ? "-" : oneLine(text);
}

/// Their names, or their bits where they have none.
std::string errorsText(const Object& record, const char* names, const char* bits, std::size_t index)
{
    const std::string text = elementText(record, names, index);
    return text == "-" ? elementText(record, bits, index) : text;
}

void printPhases(std::ostream& out, const Object& record)
{
    Table table({"phase", "result", "latency", "local errors", "remote errors"});
    const std::size_t count = record.get("TestPhases").asList().size();
    for (std::size_t i = 0; i < count; i++)
        table.add({elementText(record, "TestPhases", i), elementText(record, "TestPhaseResults", i),
                   elementText(record, "PhaseLatency", i), errorsText(record, "LocalErrorDesc", "LocalErrors", i),
                   errorsText(record, "RemoteErrorDesc", "RemoteErrors", i)});
    out << '\n';
    table.print(out);
}

void printFact(std::ostream& out, const char* name, const std::string& text)
{
    out << "  " << padded(name, 16) << "  " << oneLine(text) << '\n';
}

/// The message, and below it what is suggested.
void printVerdict(std::ostream& out, const std::string& text)
{
    constexpr std::size_t width = 90;
    constexpr std::string_view mark = " : Suggested Actions ";
    const std::size_t actions = text.find(mark);
    printFact(out, "completion", withSingleBlanks(text.substr(0, actions)));
    if (actions == std::string::npos)
        return;
    const char* name = "suggested";
    for (const std::string& line : lines(text.substr(actions + mark.size()), width))
        printFact(out, std::exchange(name, ""), line);
}

void printFigures(std::ostream& out, const Object& record)
{
    static constexpr std::array<std::array<const char*, 2>, 4> link{{{"FrameSize", "frame size"},
                                                                     {"BuffersRequired", "buffers required"},
                                                                     {"LinkDistance", "cable length"},
                                                                     {"TimeToExecute", "round trip"}}};
    if (isSet(record, "NoOfPhases"))
    {
        for (const auto& [property, name] : link)
            if (isSet(record, property))
                printFact(out, name, std::to_string(numberOf(record, property)));
    }
    else if (isSet(record, "LoopsPassed"))
        printFact(out, "loops",
                  std::to_string(numberOf(record, "LoopsPassed")) + " passed, " +
                      std::to_string(numberOf(record, "LoopsFailed")) + " failed");
    if (isSet(record, "TestPhases"))
        printPhases(out, record);
}

void printReport(const Session& session, const Run& run)
{
    std::ostream& out = session.out;
    const TestEnd& end = run.end;
    std::string verdict = end.verdict();
    if (!end.passed())
    {
        std::ranges::transform(verdict, verdict.begin(), [](unsigned char c) { return std::toupper(c); });
        if (session.colour)
            verdict = "\x1b[1;31m" + verdict + "\x1b[0m";
    }
    out << oneLine(run.test) << " of " << run.port << "  " << verdict << '\n';
    if (end.job)
        printFact(out, "job",
                  textOf(*end.job, "InstanceID") + ", " + nameOf(jobStates, numberOf(*end.job, "JobState")));
    if (end.job && numberOf(*end.job, "ErrorCode") != 0)
        printFact(out, "error", std::to_string(numberOf(*end.job, "ErrorCode")));
    if (end.completion)
        printFact(out, "state", nameOf(completionStates, numberOf(*end.completion, "CompletionState")));
    if (end.service)
        printFact(out, "service", withSingleBlanks(textOf(*end.service, "RecordData")));
    if (!end.completion)
        return;
    printVerdict(out, textOf(*end.completion, "RecordData"));
    printFigures(out, *end.completion);
}

void print(const Session& session, const Run& run)
{
    if (session.format == Format::table)
        return printReport(session, run);
    const std::optional<Object> TestEnd::*parts[] = {&TestEnd::job, &TestEnd::service, &TestEnd::completion};
    if (session.format == Format::json)
    {
        Json json{{"test", run.test}, {"port", run.port}, {"result", run.end.verdict()}};
        const char* names[] = {"job", "service", "completion"};
        for (std::size_t i = 0; i < std::size(parts); i++)
            json[names[i]] = run.end.*parts[i] ? propertiesToJson((run.end.*parts[i])->properties) : Json();
        return printJson(session.out, json);
    }
    std::vector<Object> objects;
    for (const auto part : parts)
        if (run.end.*part)
            objects.push_back(*(run.end.*part));
    printObjects(session.out, session.format, session.broker.classes(), objects, std::nullopt);
}

// --- a run

/// What was given and the provider did not take, as it does without a word.
void tellIgnored(const Session& session, const std::string& test, const std::vector<Property>& given)
{
    std::ostream* out = session.progress ? session.progress : session.steps;
    if (given.empty() || !out)
        return;
    const Path path{session.nameSpace, settingsClass, {{"InstanceID", Value::string(test)}}};
    const Reply known = session.broker.getInstance(path);
    if (!known.ok())
        return;
    for (const Property& setting : given)
    {
        const std::string text = settingText(known.objects.front().get(setting.name));
        if (text != settingText(setting.value))
            *out << "tvrcim: " << setting.name << ": the test does not take '"
                 << withoutQuotes(settingText(setting.value)) << "'"
                 << (text.empty() ? "" : " but has '" + withoutQuotes(text) + "'") << std::endl;
    }
}

MethodReply start(Session& session, const Object& test, const Path& port, const std::vector<Property>& given)
{
    std::vector<Property> in{{"ManagedElement", Value::reference(port)}};
    if (!given.empty())
    {
        Object settings{{session.nameSpace, settingsClass, {}}, given};
        settings.properties.push_back({"InstanceID", test.get("Name")});
        in.push_back({"DiagnosticSettings", Value::instance(std::move(settings))});
    }
    return checked(session.broker.invokeMethod(test.path, "RunDiagnosticService", in));
}

/// Throws MethodRefusal where there is no job, and so no test that ran.
Path jobOf(const Session& session, const MethodReply& reply, const Object& test)
{
    const Property* job = findNamed(reply.out, "Job");
    if (job && !job->value.isNull())
        return job->value.asPath();
    if (reply.returnValue.asUnsigned() == 0)
        throw MethodRefusal("RunDiagnosticService made no job: the test cannot run on the port as it is");
    const ClassInfo& info = *session.broker.classes().find(test.path.className);
    throw MethodRefusal("RunDiagnosticService returned " +
                        valueWithName(valueNames(info, "RunDiagnosticService"), reply.returnValue));
}

void runTest(Session& session, const Command& command)
{
    const Path port = portControllerOf(session, command.target);
    const std::vector<Object> tests = instancesOf(session, "TVRHBA_FCHBADiagnosticTest");
    const Object& test = testNamed(tests, command.test);
    const std::vector<Property> given = settingsOf(session, command);
    Run run{textOf(test, "Name"), port.key("DeviceID")->asString(), {}};
    const std::string what = spokenName(run.test) + " test of " + run.port;

    std::optional<Interruptible> interruptible; // the others cannot be cancelled
    if (bareName(run.test) == "dport")
        interruptible.emplace(session.signals);
    {
        Progress progress =
            session.progress ? Progress(session.progress, what) : Progress::inLines(session.steps, what);
        const MethodReply reply = start(session, test, port, given);
        run.end = endOf(session, jobOf(session, reply, test), what, progress);
    }
    tellIgnored(session, run.test, given);
    print(session, run);
    if (run.end.terminated() && run.end.cancelled)
        throw Interruption("the test was cancelled");
    if (!run.end.passed())
        throw TestFailure("the test did not pass");
}

} // namespace

void diagnose(Session& session, const Command& command)
{
    if (command.target.empty() && command.test.empty())
        listTests(session);
    else
        runTest(session, command);
}

} // namespace tvrcim
