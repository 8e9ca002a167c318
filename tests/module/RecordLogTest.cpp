// The record logs: what clients do to them, and the records that they show.
#include "tests/module/Host.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <sys/stat.h>
#include <thread>

using namespace module_test;
using broker::Object;
using broker::Path;
using broker::Property;
using broker::Value;
using testing::Contains;
using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace
{

const std::string driverLogPrefix = "TVR: FC Driver Record Log:";
const std::string providerLogPrefix = "TVRHBA:ProviderLog:";
constexpr std::uint16_t enable = 2;
constexpr std::uint16_t disable = 3;

struct Answer
{
    std::string result;             ///< "CIM_ERR_OK 0": status and return value
    std::vector<std::string> lines; ///< of levels 1 to 3
};

class LogHost : public Host
{
public:
    explicit LogHost(const std::string& scenario = "default") : Host(scenario) { setHostNames({}); }

    /// The log whose InstanceID begins so; without keys if there is none.
    Object log(const std::string& prefix)
    {
        for (const Object& object : instancesOf("TVRHBA_RecordLog"))
            if (text(object, "InstanceID").starts_with(prefix))
                return object;
        return {{"root/tavrin", "TVRHBA_RecordLog", {{"InstanceID", Value::string(prefix)}}}, {}};
    }
    Object provider() { return log(providerLogPrefix); }
    Object driver() { return log(driverLogPrefix); }

    /// Waits for the refresh that the first request began, which logs as well.
    void settle()
    {
        instancesOf("TVRHBA_RecordLog");
        EXPECT_TRUE(awaitRefresh());
    }
    Answer call(const Path& path, const std::string& method, const std::vector<Property>& in = {})
    {
        const std::size_t before = Host::log().size();
        const broker::MethodReply reply = broker().invokeMethod(path, method, in);
        Answer answer{broker::statusName(reply.status), {}};
        if (reply.ok())
            answer.result += " " + std::to_string(reply.returnValue.asUnsigned());
        const std::vector<std::string> lines = Host::log();
        for (std::size_t i = before; i < lines.size(); i++)
            if (lines[i].starts_with("[TVR_CRIT]") || lines[i].starts_with("[TVR_WARN]") ||
                lines[i].starts_with("[TVR_ERR]"))
                answer.lines.push_back(lines[i]);
        return answer;
    }
    Answer request(const Path& path, std::uint16_t state)
    {
        return call(path, "RequestStateChange", {{"RequestedState", Value::uint16(state)}});
    }
    Answer setParameters(const Path& path, std::uint16_t level, std::uint16_t mode, const std::string& trace = "")
    {
        return call(path, "SetLogParams",
                    {{"LogLevel", Value::uint16(level)},
                     {"LogMode", Value::uint16(mode)},
                     {"TracePath", Value::string(trace)}});
    }
    std::string at(const std::string& name) const { return (root() / name).string(); }
    std::string dataFile() const { return read("/etc/tavrin_fc_provider.dmp"); }
    /// An error with this text in it.
    void logError(const std::string& named)
    {
        broker().createInstance({{"root/tavrin", "TVRHBA_DriverParams", {{"InstanceID", Value::string(named)}}},
                                 {{"InstanceID", Value::string(named)}}});
    }
};

/// Property by property, as one text.
std::string shown(const Object& object, const std::vector<std::string>& names)
{
    std::string all;
    for (const std::string& name : names)
    {
        const Value value = object.get(name);
        if (!all.empty())
            all += ", ";
        if (value.isNull())
            all += "null";
        else if (value.type() & CMPI_ARRAY)
            for (const Value& element : value.asList())
                all += (all.ends_with(", ") ? "" : "+") + std::to_string(element.asUnsigned());
        else
            all += value.type() == CMPI_string    ? value.asString()
                   : value.type() == CMPI_boolean ? std::to_string(value.asBoolean())
                                                  : std::to_string(value.asUnsigned());
    }
    return all;
}

const std::vector<std::string> stateNames = {"RequestedState", "EnabledState", "OperationalStatus",
                                             "CurrentNumberOfRecords"};
const std::vector<std::string> parameterNames = {"LogLevel", "LogMode", "TracePath"};

// --- methods -------------------------------------------------------------------------------------------

TEST(RecordLog, WrongCallsChangeNothing)
{
    LogHost host;
    host.settle();
    const Path provider = host.provider().path, driver = host.driver().path;
    Path unknown = provider;
    unknown.setKey("InstanceID", Value::string("another"));
    host.write("/other", "root:x:0:0\n");
    std::filesystem::create_directory(host.at("folder"));
    ASSERT_EQ(mkfifo(host.at("pipe").c_str(), 0600), 0);
    std::filesystem::create_symlink(host.at("provider.log"), host.at("link"));
    std::filesystem::create_directory_symlink(host.at("etc"), host.at("settings"));
    std::filesystem::create_directories(host.at("var/log"));
    std::filesystem::remove(host.at("var/log/messages"));

    const auto params = [](const Value& level, const Value& mode, const Value& path) {
        return std::vector<Property>{{"LogLevel", level}, {"LogMode", mode}, {"TracePath", path}};
    };
    const auto number = [](std::uint16_t value) { return Value::uint16(value); };
    const Value none = Value::null(CMPI_uint16);
    const auto traced = [&](const std::string& path) { return params(number(5), number(4), Value::string(path)); };
    const std::string noLog = "[TVR_ERR] Invalid instance of Record Log";
    const std::string noLevel = "[TVR_ERR] Log level provided is out of range";
    const std::string noMode = "[TVR_ERR] Log mode provided is out of range";
    const std::string noPath = "[TVR_ERR] Setting the trace path failed";
    const std::string noState = "[TVR_ERR] Invalid input";
    const Value log = Value::string(host.at("provider.log"));
    const struct
    {
        const Path& path;
        const char* method;
        std::vector<Property> in;
        const char* result;
        std::string line;
    } rows[] = {
        {driver, "SetLogParams", params(number(5), number(1), log), "CIM_ERR_NOT_SUPPORTED",
         "[TVR_CRIT] SetLogParams is not supported for Driver Record Log Instance"},
        {unknown, "SetLogParams", params(number(5), number(1), log), "CIM_ERR_OK 33068", noLog},
        {provider, "SetLogParams", params(number(0), number(1), log), "CIM_ERR_OK 32968", noLevel},
        {provider, "SetLogParams", params(number(6), number(1), log), "CIM_ERR_OK 32968", noLevel},
        {provider, "SetLogParams", params(none, number(1), log), "CIM_ERR_OK 32968", noLevel},
        {provider, "SetLogParams", params(number(5), number(0), log), "CIM_ERR_OK 32968", noMode},
        {provider, "SetLogParams", params(number(5), number(5), log), "CIM_ERR_OK 32968", noMode},
        {provider, "SetLogParams", params(number(5), none, log), "CIM_ERR_OK 32968", noMode},
        {provider, "SetLogParams", params(number(5), number(2), Value::null(CMPI_string)), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(""), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced("relative.log"), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("other")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("folder")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("none/x.log")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("pipe")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("link")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced("/dev/null"), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("two\nlines")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("a\x1b[2J")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("etc/tvr_smis.conf")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("var/../etc//tavrin_fc_provider.conf")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("settings/tavrin_fc_provider.dmp")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("var/log/tavrin_fc_provider.dmp")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at("var/log/messages")), "CIM_ERR_OK 32968", noPath},
        {provider, "SetLogParams", traced(host.at(std::string(255, 'n'))), "CIM_ERR_OK 32968", noPath},
        {unknown, "ClearLog", {}, "CIM_ERR_OK 33068", noLog},
        {unknown, "RequestStateChange", {{"RequestedState", number(enable)}}, "CIM_ERR_OK 33068", noLog},
        {provider, "RequestStateChange", {}, "CIM_ERR_OK 32968", noState},
        {provider, "RequestStateChange", {{"RequestedState", number(11)}}, "CIM_ERR_OK 32968", noState},
        {driver, "RequestStateChange", {{"RequestedState", number(11)}}, "CIM_ERR_OK 32968", noState},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.line);
        const Answer answer = host.call(row.path, row.method, row.in);
        EXPECT_EQ(answer.result, row.result);
        EXPECT_THAT(answer.lines, ElementsAre(row.line));
    }
    EXPECT_EQ(shown(host.provider(), parameterNames), "5, 2, " + host.at("provider.log"));
    EXPECT_EQ(shown(host.provider(), stateNames), "2, 2, 2, 0");
    EXPECT_EQ(shown(host.driver(), stateNames), "2, 3, 2, 0");
    EXPECT_EQ(host.dataFile(), "2,5,1\n" + host.at("provider.log"));
    EXPECT_EQ(host.read("/other"), "root:x:0:0\n");
    host.unload();
}

TEST(RecordLog, ParametersHoldAndOutliveTheModule)
{
    LogHost host;
    const std::string old = host.at("provider.log"), other = host.at("other.log");
    const struct
    {
        std::uint16_t level, mode;
        std::string path;
        std::string used;
        bool writesFile;
    } rows[] = {
        {1, 4, other, other, true}, {5, 3, "", other, false}, {2, 1, "not looked at", "", false},
        {4, 2, other, other, true}, // what it wrote before is a log
        {5, 4, old, old, true},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.mode);
        EXPECT_EQ(host.setParameters(host.provider().path, row.level, row.mode, row.path).result, "CIM_ERR_OK 0");
        const std::string numbers = std::to_string(row.level) + ", " + std::to_string(row.mode);
        EXPECT_EQ(shown(host.provider(), parameterNames), numbers + ", " + row.used);
        EXPECT_EQ(host.dataFile(), std::to_string(row.mode) + "," + std::to_string(row.level) + ",1\n" + row.used);
        const std::string marker = "marker " + std::to_string(row.mode) + row.path;
        host.logError(marker);
        EXPECT_EQ(host.read("/" + std::filesystem::path(row.used).filename().string()).find(marker) !=
                      std::string::npos,
                  row.writesFile);
        host.unload();
        const std::string pathAfterwards = row.writesFile ? row.used : "";
        EXPECT_EQ(shown(host.provider(), parameterNames), numbers + ", " + pathAfterwards);
    }
    EXPECT_THAT(host.Host::log(), Contains("[TVR_CRIT] Changing the record log parameters 5-4-" + old));
    EXPECT_THAT(host.Host::log(), Contains("[TVR_DBG] Setting path as " + old));
    host.unload();
}

/// Whoever may write to the folder of a log puts a link to another file under its name while no provider runs.
TEST(RecordLog, AFileThatTookTheLogsPlaceIsLeftAlone)
{
    LogHost host;
    std::filesystem::create_directory(host.at("logs"));
    std::filesystem::permissions(host.at("logs"), std::filesystem::perms(0775));
    const std::string path = host.at("logs/x.log");
    EXPECT_EQ(host.setParameters(host.provider().path, 5, 2, path).result, "CIM_ERR_OK 0");
    host.unload();
    std::filesystem::remove(path);
    host.write("/secret", "precious\n");
    std::filesystem::create_symlink(host.at("secret"), path);
    host.logError("once more");
    EXPECT_EQ(host.call(host.provider().path, "ClearLog").result, "CIM_ERR_OK 0");
    EXPECT_EQ(host.read("/secret"), "precious\n");
    host.unload();
}

TEST(RecordLog, ADataFileThatCannotBeWrittenUndoesNoChange)
{
    LogHost host;
    const std::string other = host.at("other.log"), dataFile = host.at("etc/tavrin_fc_provider.dmp");
    host.settle();
    std::filesystem::rename(dataFile, host.at("data"));
    std::filesystem::permissions(host.at("etc"), std::filesystem::perms(0777)); // no place for links
    std::filesystem::create_symlink(host.at("data"), dataFile);
    EXPECT_EQ(host.setParameters(host.provider().path, 3, 4, other).result, "CIM_ERR_OK 0");
    EXPECT_EQ(shown(host.provider(), parameterNames), "3, 4, " + other);
    host.logError("one");
    EXPECT_THAT(host.read("/other.log"), HasSubstr("one"));
    EXPECT_EQ(host.request(host.provider().path, disable).result, "CIM_ERR_OK 0");
    host.logError("while disabled");
    EXPECT_EQ(shown(host.provider(), stateNames), "3, 3, 10, 0");
    EXPECT_THAT(host.read("/other.log"), Not(HasSubstr("while disabled")));
    EXPECT_EQ(host.read("/data"), "2,5,1\n" + host.at("provider.log"));
    host.unload();
}

TEST(RecordLog, ThePathInUseIsKeptWhoeverNamedIt)
{
    LogHost host;
    host.write("/named", "a file of the administrator's\n");
    const std::string path = host.at("named");
    host.write("/etc/tavrin_fc_provider.dmp", "2,5,1\n" + path);
    EXPECT_EQ(host.setParameters(host.provider().path, 3, 4, path).result, "CIM_ERR_OK 0");
    EXPECT_EQ(shown(host.provider(), parameterNames), "3, 4, " + path);
    EXPECT_EQ(host.call(host.provider().path, "ClearLog").result, "CIM_ERR_OK 0");
    EXPECT_THAT(host.read("/named"), testing::AllOf(testing::StartsWith("a file of the"), HasSubstr("Cleared all")));
    host.unload();
}

TEST(RecordLog, EitherLogSwitchesTheLoggingOfTheModule)
{
    for (const std::string& prefix : {providerLogPrefix, driverLogPrefix})
    {
        SCOPED_TRACE(prefix);
        LogHost host;
        host.settle();
        const bool isDriver = prefix == driverLogPrefix;
        const Path log = host.log(prefix).path;
        EXPECT_THAT(host.request(log, disable).lines, ElementsAre("[TVR_WARN] Logs disabled"));
        host.logError("while disabled");
        EXPECT_EQ(shown(host.log(prefix), stateNames), "3, 3, 10, 0");
        EXPECT_EQ(shown(host.log(isDriver ? providerLogPrefix : driverLogPrefix), stateNames),
                  isDriver ? "2, 2, 2, 0" : "2, 3, 2, 0")
            << "the other one shows it after the next refresh";
        EXPECT_EQ(host.dataFile().substr(0, 5), isDriver ? "2,5,1" : "2,5,0");

        EXPECT_EQ(host.request(log, enable).result, "CIM_ERR_OK 0");
        EXPECT_EQ(host.logged("[TVR_WARN] FC Record Logs enabled"), isDriver ? 0u : 1u);
        EXPECT_EQ(host.logged("[TVR_DBG] Instance of FC Driver Record Log"), isDriver ? 1u : 0u);
        EXPECT_EQ(shown(host.log(prefix), stateNames), "2, 2, 2, 0");
        EXPECT_EQ(host.dataFile().substr(0, 5), "2,5,1");
        host.logError("once enabled");
        EXPECT_THAT(host.read("/provider.log"), testing::AllOf(HasSubstr("once enabled"), Not(HasSubstr("while"))));

        host.request(log, disable);
        host.unload(); // only the module's log keeps its state
        EXPECT_EQ(shown(host.provider(), stateNames), isDriver ? "2, 2, 2, 0" : "5, 3, 2, 0");
        EXPECT_EQ(shown(host.driver(), stateNames), isDriver ? "2, 3, 2, 0" : "2, 3, 10+2, 0");
        host.unload();
    }
}

TEST(RecordLog, FirstFailuresAreLoggedUntilAPathIsSet)
{
    LogHost host;
    std::filesystem::remove(host.at("etc/tavrin_fc_provider.dmp"));
    const std::string ffdc = "/opt/ibm/platform/log/tavrin_fc_provider_ffdc.log";
    host.write(ffdc, "");
    EXPECT_EQ(shown(host.provider(), parameterNames), "0, 2, " + host.root().string() + ffdc);
    EXPECT_EQ(host.request(host.provider().path, enable).result, "CIM_ERR_OK 0");
    EXPECT_EQ(shown(host.provider(), stateNames), "2, 2, 2, 0");
    EXPECT_THAT(host.read(ffdc), HasSubstr("[TVR_ERR] The tracepath has not been set yet. Until the tracepath is set, "
                                           "FFDC will be used to log messages.\n"));
    EXPECT_THAT(host.read(ffdc), Not(HasSubstr("[TVR_WARN]"))) << "errors alone";
    const std::string path = host.at("provider.log");
    EXPECT_EQ(host.setParameters(host.provider().path, 5, 2, path).result, "CIM_ERR_OK 0");
    EXPECT_EQ(host.request(host.provider().path, enable).result, "CIM_ERR_OK 0");
    EXPECT_EQ(host.logged("[TVR_WARN] FC Record Logs enabled"), 1u);
    EXPECT_EQ(host.dataFile(), "2,5,1\n" + path);
    host.unload();
}

// --- the module's own log --------------------------------------------------------------------------------

TEST(RecordLog, EntriesAreTheNewestErrorsOfTheRing)
{
    LogHost host;
    host.settle();
    const Object log = host.provider();
    EXPECT_THAT(host.instancesOf("TVRHBA_LogEntry"), IsEmpty()) << "the ring is not in use";
    host.setParameters(log.path, 5, 4, host.at("provider.log"));
    host.call(log.path, "ClearLog");
    EXPECT_THAT(host.Host::log(), ElementsAre("[TVR_WARN] Cleared all the logs"));
    std::vector<Object> entries = host.instancesOf("TVRHBA_LogEntry");
    ASSERT_EQ(entries.size(), 1u);
    const std::string id = text(log, "InstanceID");
    EXPECT_EQ(shown(entries[0], {"InstanceID", "RecordID", "RecordData", "LogLevel", "LogInstanceID", "LogName",
                                 "ElementName", "RecordFormat"}),
              "TVRHBA:ProviderLog:0, 0, [Cleared all the logs], 2, " + id + ", " + id + ", " + id +
                  ", [string fileName][uint32 lineNumber]:[string record]");
    EXPECT_FALSE(entries[0].get("CreationTimeStamp").isNull());
    EXPECT_TRUE(host.broker().getInstance(entries[0].path).ok());

    for (unsigned i = 1; i <= 1024; i++)
        host.logError("\x01n\xff" + std::to_string(i)); // 1,025 with the one that is there
    entries = host.instancesOf("TVRHBA_LogEntry");
    ASSERT_EQ(entries.size(), 1024u);
    EXPECT_THAT(text(entries[0], "RecordData"), EndsWith("in InstanceID: ?n?1024]")) << "in the place of the oldest";
    EXPECT_THAT(text(entries[1], "RecordData"), EndsWith("in InstanceID: ?n?1]"));
    EXPECT_EQ(text(entries[1], "LogLevel"), "3");
    EXPECT_EQ(shown(host.provider(), stateNames), "2, 2, 2, 0");

    // The records of the associations have names of their own, which no entry answers to.
    const broker::AssociationFilter filter{.assocClass = "TVRHBA_RecordLogManagesRecord"};
    const broker::Reply records = host.broker().associators(log.path, filter);
    ASSERT_EQ(records.objects.size(), 1024u) << broker::statusName(records.status);
    EXPECT_EQ(text(records.objects[7], "InstanceID"), "TVRHBA: FC Driver Record:7");
    EXPECT_EQ(text(records.objects[7], "RecordData"), text(entries[7], "RecordData"));
    EXPECT_EQ(host.broker().getInstance(records.objects[7].path).status, CMPI_RC_ERR_NOT_FOUND);
    const broker::Reply ends = host.broker().associators(records.objects[7].path, filter);
    ASSERT_EQ(ends.objects.size(), 1u);
    EXPECT_EQ(text(ends.objects[0], "InstanceID"), id);
    host.unload();
}

TEST(RecordLog, EntriesAreReadWhileOthersLog)
{
    LogHost host;
    host.setParameters(host.provider().path, 5, 1);
    std::atomic<bool> done{false};
    std::vector<std::thread> writers;
    for (int i = 0; i < 3; i++)
        writers.emplace_back(
            [&, i]
            {
                for (unsigned n = 0; !done; n++)
                    host.logError("writer " + std::to_string(i) + " " + std::to_string(n));
            });
    std::string first;
    bool wrapped = false; // the ring, while it is read
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (!wrapped && std::chrono::steady_clock::now() < end)
        for (const Object& entry : host.instancesOf("TVRHBA_LogEntry"))
        {
            const std::string data = text(entry, "RecordData");
            EXPECT_THAT(data, testing::AllOf(testing::StartsWith("["), EndsWith("]")));
            if (text(entry, "RecordID") != "0")
                continue;
            wrapped = !first.empty() && data != first;
            first = data;
        }
    EXPECT_TRUE(wrapped);
    done = true;
    for (std::thread& writer : writers)
        writer.join();
    EXPECT_EQ(host.call(host.provider().path, "ClearLog").result, "CIM_ERR_OK 0");
    EXPECT_EQ(host.instancesOf("TVRHBA_LogEntry").size(), 1u);
    host.unload();
}

// --- the driver's log --------------------------------------------------------------------------------------

std::vector<std::string> recordsOf(Host& host)
{
    std::vector<std::string> records;
    for (const Object& entry : host.instancesOf("TVRHBA_FCDriverLogEntry"))
        records.push_back(text(entry, "RecordData"));
    return records;
}

TEST(DriverLog, StandsBesideTheModulesOwn)
{
    LogHost host;
    const Object log = host.driver();
    const std::string id = text(log, "InstanceID");
    EXPECT_THAT(id, testing::StartsWith(driverLogPrefix));
    const std::vector<Object> logs = host.instancesOf("TVRHBA_RecordLog");
    ASSERT_EQ(logs.size(), 2u);
    EXPECT_EQ(text(logs[0], "InstanceID"), id) << "the driver's first";
    EXPECT_EQ(shown(log, {"ElementName", "Name", "MaxNumberOfRecords", "CurrentNumberOfRecords", "LogState",
                          "OverwritePolicy", "OperationalStatus", "RequestedState", "EnabledState", "HealthState"}),
              id + ", Driver logs for Tavrin FC Provider, 200, 0, 4, 2, 2, 2, 3, 5");
    std::vector<std::string> capabilities;
    for (const Object& object : host.instancesOf("TVRHBA_EnabledRecordLogCapabilities"))
        capabilities.push_back(shown(object, {"InstanceID", "RequestedStatesSupported", "LogParamsSupported",
                                              "ElementNameEditSupported", "MaxElementNameLen"}));
    EXPECT_THAT(capabilities, ElementsAre("TVRHBA provider log capabilities, 2+3, 2+3, 0, null",
                                          "TVR:FC Driver Record Log Capabilities, 2+3+11, null, 0, 0"));
    std::vector<std::string> uses;
    for (const Object& use : host.instancesOf("TVRHBA_ProviderUseOfLog"))
        uses.push_back(use.get("Dependent").asPath().keys.at(0).value.asString() + " of " +
                       use.get("Antecedent").asPath().keys.at(0).value.asString());
    EXPECT_THAT(uses, ElementsAre("Tavrin CMPI HBA Provider v10.2.261-13 of " + text(host.provider(), "InstanceID"),
                                  "TVR FC HBA: Driver tvrfc v12.0.0.1 of " + id));
    const std::vector<std::string> lines = host.Host::log();
    const auto line = std::ranges::find(lines, "[TVR_DBG] Calling FC_CreateDumpClasses");
    ASSERT_GE(lines.end() - line, 4);
    EXPECT_THAT(std::vector(line + 1, line + 4),
                ElementsAre("[TVR_DBG] Enter CreateFCDriverLogClasses",
                            "[TVR_DBG] TVR FC HBA: Driver tvrfc v12.0.0.1 uses log : " + id,
                            "[TVR_DBG] Exit CreateFCDriverLogClasses"));
    EXPECT_EQ(host.broker().getInstance(host.instancesOf("TVRHBA_ProviderUseOfLog").at(1).path).status, CMPI_RC_OK);
    host.unload();
}

TEST(DriverLog, ShowsTheNewestLinesOnceItIsEnabled)
{
    LogHost host;
    host.settle();
    std::string messages;
    for (int i = 1; i <= 500; i++)
        messages += "Nov 22 18:00:00 host kernel: xtvfcx 0000:08:00.0: line " + std::to_string(i) +
                    "\nNov 22 18:00:00 host kernel: usb: tvf c\n";
    host.write("/var/log/messages", messages);
    const Path log = host.driver().path;
    EXPECT_THAT(recordsOf(host), IsEmpty());
    EXPECT_THAT(host.request(log, enable).lines, IsEmpty());
    EXPECT_EQ(shown(host.driver(), stateNames), "2, 2, 2, 200");
    for (const char* line : {"[TVR_DBG] Reading Events for tvfc", "[TVR_DBG] Finished reading Events for tvfc",
                             "[TVR_DBG] Logging of FC Driver Log Ends"})
        EXPECT_EQ(host.logged(line), 1u) << line;

    const std::vector<Object> entries = host.instancesOf("TVRHBA_FCDriverLogEntry");
    ASSERT_EQ(entries.size(), 200u);
    const std::string id = driverLogPrefix + text(host.driver(), "InstanceID").substr(driverLogPrefix.size());
    EXPECT_EQ(shown(entries[0], {"InstanceID", "RecordID", "RecordData", "CreationTimeStamp", "LogInstanceID",
                                 "LogName", "ElementName", "RecordFormat"}),
              "TVR:HBA FC Driver Record:0, 0, Nov 22 18:00:00 host kernel: xtvfcx 0000:08:00.0: line 500, null, " + id +
                  ", " + id + ", " + id + ", [string record]");
    EXPECT_THAT(text(entries[199], "RecordData"), EndsWith(": line 301"));
    const broker::Reply got = host.broker().getInstance(entries[199].path);
    ASSERT_TRUE(got.ok());
    EXPECT_EQ(text(got.objects[0], "RecordData"), text(entries[199], "RecordData"));
    const broker::Reply records = host.broker().associators(log, {.assocClass = "TVRHBA_DriverRecordLogManagesRecord"});
    ASSERT_EQ(records.objects.size(), 200u) << broker::statusName(records.status);
    EXPECT_EQ(records.objects[1].path.keys.at(0).value.asString(), "TVR:HBA FC Driver Record:1");

    host.write("/var/log/messages", messages + "tvfc once more");
    host.request(log, enable);
    EXPECT_EQ(recordsOf(host).at(0), "tvfc once more");
    EXPECT_EQ(recordsOf(host).at(1), text(entries[0], "RecordData"));
    EXPECT_EQ(host.call(log, "ClearLog").result, "CIM_ERR_OK 0");
    EXPECT_EQ(shown(host.driver(), stateNames), "2, 2, 2, 0");
    EXPECT_THAT(recordsOf(host), IsEmpty());
    host.request(log, enable);
    host.request(log, disable);
    EXPECT_THAT(recordsOf(host), IsEmpty());
    host.unload();
}

TEST(DriverLog, TakesWhateverTheSystemLogIs)
{
    LogHost host;
    const Path log = host.driver().path;
    const std::string file = host.at("var/log/messages");
    host.write("/var/log/messages", "tvfc");
    const auto expect = [&](const char* what, const std::vector<std::string>& records)
    {
        EXPECT_EQ(host.request(log, enable).result, "CIM_ERR_OK 0") << what;
        EXPECT_EQ(recordsOf(host), records) << what;
        std::filesystem::remove(file);
    };
    expect("one line without an end", {"tvfc"});
    expect("missing", {});
    std::filesystem::create_directory(file);
    expect("a folder", {});
    mkfifo(file.c_str(), 0600);
    expect("a pipe", {});
    std::filesystem::create_symlink("/dev/zero", file);
    expect("a device", {});
    host.write("/var/log/messages", std::string("a\0tvfc\x1b\xff\n", 9) + std::string(1 << 20, 'x') + "tvfc\n\n");
    expect("bytes that are no text, and a line of a megabyte", {std::string(8192, 'x'), "a?tvfc??"});
    host.unload();
}

TEST(DriverLog, IsThereOnlyWithAnAdapter)
{
    LogHost host(R"({"adapters": []})");
    EXPECT_EQ(host.instancesOf("TVRHBA_RecordLog").size(), 1u);
    Path driver = host.provider().path;
    driver.setKey("InstanceID", Value::string(driverLogPrefix + text(host.provider(), "InstanceID").substr(19)));
    EXPECT_EQ(host.request(driver, enable).result, "CIM_ERR_OK 33068");
    EXPECT_EQ(host.setParameters(driver, 5, 1).result, "CIM_ERR_NOT_SUPPORTED");
    EXPECT_EQ(host.instancesOf("TVRHBA_EnabledRecordLogCapabilities").size(), 1u);
    host.unload();
}

} // namespace
