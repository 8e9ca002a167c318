// The port as wbemcli sees it, beside what the tool prints of the same host in its own process.
#include "tests/support/Eventually.h"
#include "tests/support/Semaphores.h"
#include "tests/system/Serving.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <algorithm>
#include <fstream>
#include <future>
#include <map>
#include <regex>
#include <sstream>
#include <tuple>

using namespace system_test;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace
{

using Json = nlohmann::json;
using Lines = std::vector<std::string>;

Lines linesOf(const std::string& text)
{
    Lines lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

// --- one form for what both print

/// Without hosts, times, the tool's folder and what the two do not write alike: quotes, line breaks, and the colon that
/// wbemcli drops from references.
std::string plain(std::string text)
{
    if (const std::size_t space = text.find("/root/"); text.starts_with("127.0.0.1:") && space != text.npos)
        text.erase(0, space + 1);
    for (std::size_t host = 0; (host = text.find("localhost/root/", host)) != text.npos;)
        text.erase(host, std::string("localhost/").size());
    std::erase_if(text, [](char c) { return c == '"' || c == '\\' || c == ':' || c == '\n'; });
    static const std::regex passing(R"(\d{14}\.\d{6}[+-]\d{3}|/tvrcim-\w{6}/)"), real(R"(-?\d\.\d+e[+-]\d+)");
    return std::regex_match(text, real) ? std::to_string(std::stod(text)) : std::regex_replace(text, passing, "*");
}

std::string plain(const Json& value)
{
    if (value.is_boolean())
        return value.get<bool>() ? "TRUE" : "FALSE";
    if (value.is_string())
        return plain(value.get<std::string>());
    if (value.is_number_float())
        return std::to_string(value.get<double>());
    if (!value.is_array())
        return value.dump();
    std::string list;
    for (const Json& element : value)
        list += "," + plain(element);
    return list.substr(list.empty() ? 0 : 1);
}

/// The path and the properties that have a value, as one text.
struct Instance
{
    std::string path;
    std::map<std::string, std::string> properties;

    std::string text() const
    {
        std::string all = path;
        for (const auto& [name, value] : properties)
            if (!value.empty())
                all += "\n  " + name + "=" + value;
        return all;
    }
};

std::vector<std::string> textsOf(const std::vector<Instance>& instances)
{
    std::vector<std::string> texts;
    for (const Instance& instance : instances)
        texts.push_back(instance.text());
    return texts;
}

/// What wbemcli prints with -nl: a line for the path, then "-Name=value" each, of which a value can have more lines.
std::vector<std::string> instancesOfClient(const std::string& output)
{
    std::vector<Instance> instances;
    std::string* last = nullptr;
    for (const std::string& line : linesOf(output))
    {
        const std::size_t mark = line.find('=');
        if (line.starts_with("127.0.0.1:") || line.starts_with("localhost/root/"))
            instances.push_back({plain(line), {}});
        else if (line.starts_with('-') && mark != line.npos && !instances.empty())
            *(last = &instances.back().properties[line.substr(1, mark - 1)]) = plain(line.substr(mark + 1));
        else if (!line.empty() && last)
            *last += plain(line);
    }
    return textsOf(instances);
}

std::vector<std::string> instancesOfTool(const std::string& output)
{
    Json document = Json::parse(output);
    if (!document.is_array())
        document = Json::array({document});
    std::vector<Instance> instances;
    for (const Json& object : document)
    {
        Instance& instance = instances.emplace_back();
        instance.path = plain(object["namespace"].get<std::string>() + ":" + object["path"].get<std::string>());
        for (const auto& [name, value] : object["properties"].items())
            instance.properties[name] = value.is_null() ? "" : plain(value);
    }
    return textsOf(instances);
}

std::vector<std::string> names(const std::string& output)
{
    std::vector<std::string> paths;
    for (const std::string& line : linesOf(output))
        paths.push_back(plain(line));
    return paths;
}

/// Whatever the order.
void expectSame(Lines ofClient, Lines ofTool)
{
    std::ranges::sort(ofClient);
    std::ranges::sort(ofTool);
    Lines missing, added;
    std::ranges::set_difference(ofTool, ofClient, std::back_inserter(missing));
    std::ranges::set_difference(ofClient, ofTool, std::back_inserter(added));
    EXPECT_THAT(missing, IsEmpty());
    EXPECT_THAT(added, IsEmpty());
}

/// The tool's answer to the arguments, which is expected to be good.
std::string ofTool(const std::string& arguments)
{
    const Answer answer = tvrcim(arguments);
    EXPECT_EQ(answer.exitCode, 0) << arguments << ": " << answer.err;
    return answer.out;
}

constexpr bool overTls = true;

/// In the open to whoever asks, and over TLS to a user. What is asked is the same, and so are the answers.
class Serve : public testing::TestWithParam<bool>
{
protected:
    Serve()
    {
        if (GetParam() == overTls)
            _server.introduce("joe:secret@", "-cacert " + _folder.file("own.pem"));
    }
    const Serving& server() const { return _server; }
    std::string ofClient(const std::string& operation, const std::string& path, const std::string& arguments = "") const
    {
        const Answer answer = _server.wbemcli(operation, path, arguments);
        EXPECT_EQ(answer.exitCode, 0) << operation << " " << path << ": " << answer.err;
        return answer.out;
    }

    /// The path, without its namespace, of the only instance of the class whose path has the text.
    std::string pathOf(const std::string& className, const std::string& part) const
    {
        for (const std::string& line : linesOf(ofClient("ein", "/root/tavrin:" + className)))
            if (line.find(part) != line.npos)
                return line.substr(line.find(className + "."));
        ADD_FAILURE() << "no " << className << " with " << part;
        return {};
    }
    std::string pathOfPort() const { return pathOf("TVRHBA_FCPort", "1000027A51320E00"); }

private:
    std::vector<std::string> options() const
    {
        std::vector<std::string> options{"--scenario", TVR_SCENARIOS "/lanes.json"};
        if (GetParam() == overTls)
        {
            _folder.makeCertificate("own");
            options.insert(options.end(), {"--tls", _folder.file("own.pem"), _folder.file("own.key"), "--users",
                                           _folder.makeUsers("joe", "secret")});
        }
        return options;
    }

    const Folder _folder;
    Serving _server{options()};
};

const std::string host = "--scenario " TVR_SCENARIOS "/lanes.json ";
const std::string space = "/root/tavrin:";
const std::string setting = R"(TVRHBA_ProviderConfigSetting.InstanceID="Tavrin HBA Provider:sanrefresh")";
const std::string lane = R"(TVRHBA_DriverParams.InstanceID="Driver:1000027A51320E00:50063D200110000A:2:PrioLane")";

/// For the shell that runs the tool.
std::string quoted(const std::string& path)
{
    return "'" + path + "'";
}

TEST_P(Serve, InstancesAreThoseOfTheTool)
{
    const std::string port = pathOfPort();
    for (const std::string root : {"CIM_ManagedElement", "CIM_Dependency", "CIM_Component"})
    {
        const Lines instances = instancesOfTool(ofTool(host + "enum " + root + " --format json"));
        EXPECT_GT(instances.size(), 20u);
        expectSame(instancesOfClient(ofClient("ei -nl", space + root)), instances);
        expectSame(names(ofClient("ein", space + root)), names(ofTool(host + "enum " + root + " --names")));
    }
    for (const std::string list : {"", "Speed", "Speed,portType,WWN"})
    {
        const std::string tool =
            host + "get " + quoted(port) + (list.empty() ? "" : " --properties " + list) + " --format json";
        expectSame(instancesOfClient(ofClient("gi -nl", space + port, list)), instancesOfTool(ofTool(tool)));
    }
    const std::string speed =
        Json::parse(ofTool(host + "get " + quoted(port) + " --format json"))["properties"]["Speed"].dump();
    EXPECT_EQ(ofClient("gp", space + port, "Speed"), speed + "\n");
}

TEST_P(Serve, AssociationsAreThoseOfTheTool)
{
    const std::string port = pathOfPort();
    const struct
    {
        const char *client, *tool;
    } rows[] = {
        {"", ""},
        {"-ac TVRHBA_DeviceSAPImplementation", "--class TVRHBA_DeviceSAPImplementation"},
        {"-arc CIM_PhysicalElement", "--result-class CIM_PhysicalElement"},
        {"-ar Antecedent", "--role Antecedent"},
        {"-arr GroupComponent", "--result-role GroupComponent"},
        {"-ac CIM_Dependency -arc CIM_LogicalElement -ar Antecedent -arr Dependent",
         "--class CIM_Dependency --result-class CIM_LogicalElement --role Antecedent --result-role Dependent"},
    };
    const auto compare = [&](const std::string& operation, const std::string& tool, const char* ofClientToo,
                             const std::string& ofToolToo)
    {
        const std::string command = host + tool + " " + quoted(port) + " " + ofToolToo;
        const Lines all = instancesOfTool(ofTool(command + " --format json"));
        EXPECT_FALSE(all.empty()) << command;
        expectSame(instancesOfClient(ofClient(operation + " -nl " + ofClientToo, space + port)), all);
        expectSame(names(ofClient(operation + "n " + ofClientToo, space + port)), names(ofTool(command + " --names")));
    };
    for (const auto& row : rows)
        compare("ai", "assoc", row.client, row.tool);
    compare("ri", "refs", "", "");
    compare("ri", "refs", "-arc CIM_Dependency -ar Dependent", "--class CIM_Dependency --role Dependent");
}

TEST_P(Serve, ClassesAreThoseOfTheToolAndOfThePortItself)
{
    Lines all;
    for (const Json& name : Json::parse(ofTool("classes --all --format json")))
        all.push_back("root/tavrin" + (name.is_object() ? name["name"] : name).get<std::string>());
    for (const char* own : {"CIM_WBEMService", "CIM_ObjectManager", "CIM_Namespace"})
        all.push_back(std::string("root/tavrin") + own);
    expectSame(names(ofClient("ecn", "/root/tavrin")), all);

    Lines features;
    const Json shownByTool = Json::parse(ofTool("class TVRHBA_FCPort --format json"));
    for (const Json& property : shownByTool["properties"])
        features.push_back(property["name"]);
    const std::string shown = ofClient("gc", space + "TVRHBA_FCPort");
    Lines properties;
    std::istringstream list(shown.substr(shown.find(' ') + 1));
    for (std::string word; std::getline(list, word, ',');)
        properties.push_back(word.substr(0, word.find('=')));
    expectSame(properties, features);
    EXPECT_THAT(ofClient("ec", space + "CIM_Log"), HasSubstr("TVRHBA_RecordLog InstanceID="));
    for (const char* part : {R"(<METHOD NAME="ChangeWWN" TYPE="uint32")", R"(<PARAMETER.REFERENCE NAME="Target")"})
        EXPECT_THAT(ofClient("gcd", space + "TVRHBA_FCHBAWWNService"), HasSubstr(part));
}

TEST_P(Serve, TheHostIsChangedAsByTheTool)
{
    const std::string port = pathOfPort();
    const std::string id = lane.substr(lane.find('.') + 1);
    EXPECT_EQ(names(ofClient("ci", space + lane, quoted(id))),
              names(ofTool(host + "create TVRHBA_DriverParams " + quoted(id))));
    EXPECT_THAT(ofClient("ein", space + "TVRHBA_DriverParams"), HasSubstr(id));
    EXPECT_EQ(ofClient("di", space + lane), "");
    EXPECT_THAT(ofClient("ein", space + "TVRHBA_DriverParams"), Not(HasSubstr(id)));

    EXPECT_EQ(ofClient("gp", space + setting, "current"), "1\n");
    EXPECT_EQ(ofClient("mi", space + setting, "current=0"), "");
    EXPECT_EQ(ofClient("gp", space + setting, "current"), "0\n");
    EXPECT_EQ(ofClient("sp", space + setting, "current=1"), "");
    EXPECT_EQ(ofClient("gp", space + setting, "current"), "1\n");

    const std::string service = space + pathOf("TVRHBA_FCHBAWWNService", "");
    const std::string target = "'GetWWNCapability.Target=localhost/root/tavrin:" + port + "'";
    const Json answer = Json::parse(
        ofTool(host + "call TVRHBA_FCHBAWWNService GetWWNCapability " + quoted("Target=" + port) + " --format json"));
    const std::string out = answer["out"]["WWNCapability"].dump();
    EXPECT_THAT(ofClient("cm", service, target), EndsWith(" GetWWNCapability: " + answer["returnValue"].dump() +
                                                          ", WWNCapability (uint32): " + out + "\n"));
    EXPECT_THAT(ofClient("cmx", service, target),
                HasSubstr(R"(<PARAMVALUE NAME="WWNCapability" PARAMTYPE="uint32"><VALUE>)" + out + "</VALUE>"));
}

TEST_P(Serve, FailuresAreThoseOfTheTool)
{
    const std::string port = pathOfPort();
    const std::string other = R"(TVRHBA_Card.CreationClassName="TVRHBA_Card",Tag="none")";
    const std::string dump = R"(TVRHBA_DumpData.InstanceID="TVRHBA_DumpData::1000027A51320E00")";
    const std::string wrongLane = R"(InstanceID="Driver:1000027A51320E01:50063D200110000A:2:PrioLane")";
    const struct
    {
        int code;
        std::string operation, path, arguments, tool;
    } rows[] = {
        {3, "ei", "/root/none:TVRHBA_FCPort", "", "enum TVRHBA_FCPort --namespace root/none"},
        {5, "ei", space + "None", "", "enum None"},
        {5, "ein", "/root/ibmse:TVRHBA_FCPort", "", "enum TVRHBA_FCPort --namespace root/ibmse"},
        {6, "gi", space + other, "", "get " + quoted(other)},
        {6, "di", space + lane, "", "delete " + quoted(lane)},
        {7, "di", space + port, "", "delete " + quoted(port)},
        {1, "mi", space + dump, "RetentionCount=21", "set " + quoted(dump) + " RetentionCount=21"},
        {7, "sp", space + dump, "'DumpDirectory=\"/tmp\"'", "set " + quoted(dump) + " DumpDirectory=/tmp"},
        {1, "ci", space + "TVRHBA_DriverParams." + wrongLane, quoted(wrongLane),
         "create TVRHBA_DriverParams " + quoted(wrongLane)},
    };
    for (const auto& row : rows)
    {
        const Answer answer = server().wbemcli(row.operation, row.path, row.arguments);
        const std::string ofTool = tvrcim(host + row.tool).err;
        EXPECT_EQ(answer.exitCode, 16) << row.operation << " " << row.path;
        EXPECT_THAT(answer.err,
                    HasSubstr("Cim: (" + std::to_string(row.code) + ") " + ofTool.substr(ofTool.find(' ') + 1)));
    }
    for (const auto& [operation, path, arguments, failure] :
         {std::tuple("gp", port, "None", "(12) CIM_ERR_NO_SUCH_PROPERTY"),
          std::tuple("dc", std::string("TVRHBA_Card"), "", "(7) CIM_ERR_NOT_SUPPORTED")})
        EXPECT_THAT(server().wbemcli(operation, space + path, arguments).err, HasSubstr(failure));
}

// --- what the port says of itself

/// By the names of the interop namespace that clients try, on to a unit that a profile is about.
TEST_P(Serve, AClientThatKnowsNothingFindsTheUnits)
{
    for (const std::string interop : {"/interop:", "/root/interop:", "/root/PG_InterOp:"})
    {
        const std::string spaces = ofClient("ei", interop + "CIM_Namespace", "Name");
        for (const char* name : {"interop", "root/interop", "root/pg_interop", "root/tavrin", "root/ibmse"})
            EXPECT_THAT(spaces, HasSubstr(std::string("Name=\"") + name + "\""));
        EXPECT_EQ(linesOf(spaces).size(), 5u);
        const std::string manager = ofClient("ei", interop + "CIM_ObjectManager", "ElementName,Description");
        EXPECT_EQ(linesOf(manager).size(), 1u);
        EXPECT_THAT(manager, HasSubstr("Description=\"CIM server for one machine, version "));
        EXPECT_EQ(linesOf(ofClient("ein", interop + "CIM_RegisteredProfile")).size(), 14u);
    }
    const auto first = [&](const std::string& from, const std::string& association, const std::string& end)
    {
        const Lines found = linesOf(ofClient("ain -ac " + association + " -arc " + end, from));
        EXPECT_FALSE(found.empty()) << from;
        return found.empty() ? from : Serving::withoutHost(found.front());
    };
    std::string here;
    for (const std::string& profile : linesOf(ofClient("ein", "/interop:TVRHBA_RegisteredProfile")))
        if (profile.find("FC Initiator Ports") != profile.npos)
            here = Serving::withoutHost(profile);
    here = first(here, "CIM_ElementConformsToProfile -arr ManagedElement", "TVRHBA_FCPort");
    here = first(here, "TVRHBA_DeviceSAPImplementation", "TVRHBA_SCSIProtocolInitiatorEndpoint");
    here = first(here, "TVRHBA_SCSIInitiatorTargetStorageVolumePath", "TVRHBA_StorageVolume");
    EXPECT_THAT(ofClient("gi", here, "DeviceID"), HasSubstr("TVRHBA_StorageVolume"));
}

/// No client makes a namespace by an instance of it, or takes one away.
TEST_P(Serve, NamespacesAreWhatTheyAre)
{
    const std::string one = Serving::withoutHost(linesOf(ofClient("ein", "/interop:CIM_Namespace")).at(0));
    const std::string key = one.substr(one.find('.') + 1);
    std::string other = one;
    other.insert(other.size() - 1, "2");
    for (const auto& [operation, path, arguments] :
         {std::tuple("di", one, std::string()), std::tuple("mi", one, std::string("ClassInfo=1")),
          std::tuple("ci", other, quoted(other.substr(other.find('.') + 1)))})
        EXPECT_THAT(server().wbemcli(operation, path, arguments).err, HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"))
            << operation;
    EXPECT_EQ(linesOf(ofClient("ein", "/interop:CIM_Namespace")).size(), 5u);
}

INSTANTIATE_TEST_SUITE_P(Over, Serve, testing::Values(!overTls, overTls),
                         [](const auto& tested) { return tested.param == overTls ? "Tls" : "Http"; });

/// A library that works on an adapter is not left in the midst of it, and whoever asked for that is told how it went.
TEST(ServeEnd, TheCallThatRunsIsAnsweredFirst)
{
    const Folder folder;
    Json slow = Json::parse(textOf(TVR_SCENARIOS "/lanes.json"));
    slow["faults"] = {{{"function", "LRM_ResetHBA"}, {"delayMs", 3000}}}; // longer than any other end takes
    std::ofstream(folder.file("slow.json")) << slow;
    Serving server({"--scenario", folder.file("slow.json")});
    const std::string names = ofTool(host + "enum TVRHBA_SoftwareInstallationService --names");
    const std::string service = "/" + names.substr(0, names.find('\n'));
    auto reset = std::async(
        std::launch::async,
        [&]
        {
            return server.wbemcli(
                "cm", service, "'ResetHBA.Target=localhost/root/tavrin:TVRHBA_FCPort.DeviceID=\"1000027A51320E00\"'");
        });
    // Nobody else has the module asked for anything.
    ASSERT_TRUE(test_support::eventually([&] { return test_support::semaphoresOf(server.process()) > 0; }));
    EXPECT_EQ(server.end(), 0);
    EXPECT_THAT(reset.get().out, EndsWith(" ResetHBA: 0\n"));
}

} // namespace
