// The JSON interface as scripts use it: who may, what they get, and how it holds under hostile names and many units.
#include "tests/support/Eventually.h"
#include "tests/system/Serving.h"

#include <nlohmann/json.hpp>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <optional>

using namespace system_test;
using Json = nlohmann::ordered_json;
using test_support::eventually;
using testing::HasSubstr;
using testing::StartsWith;

namespace
{

/// A script that asks with curl.
class Script
{
public:
    struct Told
    {
        int status;
        Json json;
    };

    Script(const Serving& server, const Folder& folder, std::string user = {})
        : _url(server.url()), _folder(folder), _user(std::move(user))
    {}

    /// `options` as a shell would read them.
    Told ask(const std::string& path, const std::string& options = "") const
    {
        const std::string user = _user.empty() ? "" : "-u " + _user + " ";
        const Answer answer = runCommand("curl --noproxy '*' -s -w '%{http_code}' " + user + options + " '" + _url +
                                         "/api/" + path + "'");
        EXPECT_GT(answer.out.size(), 3U) << path << answer.err;
        const std::size_t end = answer.out.size() - std::min<std::size_t>(answer.out.size(), 3);
        return {std::atoi(answer.out.c_str() + end), Json::parse(answer.out.substr(0, end))};
    }
    /// Of an instance, by its path.
    Told askOf(const std::string& question, const std::string& path, const std::string& options = "") const
    {
        const std::string file = _folder.file("path");
        std::ofstream(file) << path;
        return ask(question, "-G --data-urlencode path@" + file + " " + options);
    }
    Told call(const Json& body, const std::string& options = "") const
    {
        const std::string file = _folder.file("body");
        std::ofstream(file) << body.dump();
        return ask("call", "-H 'X-Tavrin-Token: " + token() + "' -H 'Content-Type: application/json' --data @" + file +
                               " " + options);
    }
    std::string token() const
    {
        const Json session = ask("session").json;
        return session["token"].is_string() ? session["token"].get<std::string>() : "none";
    }
    /// The path of the instance that has this among its values.
    std::string pathOf(const std::string& className, const std::string& value) const
    {
        const Json rows = ask("classes/" + className + "/instances?find=" + value).json["rows"];
        EXPECT_EQ(rows.size(), 1U) << className << " " << value;
        return rows.empty() ? "" : rows[0]["path"].get<std::string>();
    }

private:
    std::string _url;
    const Folder& _folder;
    std::string _user;
};

std::size_t columnOf(const Json& table, const char* name)
{
    return static_cast<std::size_t>(std::ranges::find(table["columns"], name) - table["columns"].begin());
}

std::string providerLog(const Script& script)
{
    for (const Json& log : script.ask("logs").json)
        if (log["id"] == "provider")
            return log["path"];
    return {};
}

TEST(ServeJson, WhoMayReadAndWhoMayCall)
{
    const Folder folder;
    const Serving server({"--users", folder.makeUsers("joe", "secret")});
    const Script anybody(server, folder), reader(server, folder, "reader:secret"), joe(server, folder, "joe:secret");
    const Json none = anybody.ask("session").json;
    EXPECT_TRUE(none["user"].is_null() && none["token"].is_null() && none["whyNot"].is_string()) << none;
    const Json session = joe.ask("session").json;
    EXPECT_EQ(session["user"], "joe");
    EXPECT_EQ(session["mayChange"], true);
    EXPECT_EQ(session["simulated"], true);
    EXPECT_EQ(reader.ask("session").json["mayChange"], false);
    EXPECT_EQ(Script(server, folder, "joe:wrong").ask("session").status, 401);

    const Json clear{{"path", providerLog(joe)}, {"method", "ClearLog"}};
    const std::string other = "-H 'Origin: http://evil.example'";
    EXPECT_EQ(anybody.ask("host", other).status, 403);
    EXPECT_EQ(anybody.ask("host", "-H 'Host: evil.example'").status, 403);
    EXPECT_EQ(anybody.call(clear).status, 401);
    EXPECT_EQ(reader.call(clear).status, 403);
    EXPECT_EQ(joe.call(clear, other).status, 403);
    EXPECT_EQ(joe.ask("call", "-H 'Content-Type: application/json' --data '{}'").status, 403) << "without the token";
    const Script::Told done = joe.call(clear);
    EXPECT_EQ(done.status, 200) << done.json;
    EXPECT_EQ(done.json["returnValue"], 0);
    EXPECT_EQ(done.json["returnText"], "Completed with no error");
}

TEST(ServeJson, APortWithoutUsersIsOnlyRead)
{
    const Folder folder;
    const Serving server;
    const Script script(server, folder, "joe:secret");
    const Json session = script.ask("session").json;
    EXPECT_TRUE(session["token"].is_null());
    EXPECT_THAT(session["whyNot"].get<std::string>(), HasSubstr("no users"));
    EXPECT_EQ(script.call({{"path", providerLog(script)}, {"method", "ClearLog"}}).status, 403);
}

TEST(ServeJson, ShowsTheHostWithWhatIsWrongFirst)
{
    const Folder folder;
    const Serving server;
    const Script script(server, folder);
    const Json host = script.ask("host").json;
    ASSERT_EQ(host["problems"].size(), 1U) << host["problems"];
    const Json& problem = host["problems"][0];
    EXPECT_EQ(problem["severity"], "critical");
    EXPECT_EQ(problem["text"], "LINK DOWN");
    EXPECT_EQ(problem["name"], "1000027A51160211");
    EXPECT_TRUE(host["failures"].empty());
    const Script::Told port = script.askOf("instance", problem["path"]);
    EXPECT_EQ(port.status, 200);
    EXPECT_EQ(port.json["class"], "TVRHBA_FCPort");
    const Json answer = script.ask("ports").json;
    EXPECT_TRUE(answer["failures"].empty());
    const Json& ports = answer["ports"];
    ASSERT_EQ(ports.size(), 4U);
    EXPECT_EQ(ports[0]["card"], "TVR FCHBA:TV1602:TV16A02417");
    EXPECT_EQ(ports[0]["speed"], 8'000'000'000);
    EXPECT_EQ(ports[0]["speedText"], "8 Gbit/s");
    EXPECT_EQ(ports[0]["severity"], "ok");
    EXPECT_EQ(ports[1]["up"], false);
    EXPECT_EQ(ports[1]["severity"], "critical");
    EXPECT_TRUE(ports[1]["speedText"].is_null());
    const Json& voltage = ports[0]["measures"][1];
    EXPECT_EQ(voltage["value"].dump() + " " + voltage["lowAlarm"].dump(), "3.295 2.9") << "as few digits as it has";
    const Json& temperature = ports[0]["measures"][0];
    EXPECT_EQ(temperature["value"], 38.5);
    EXPECT_EQ(temperature["unit"], "°C");
    EXPECT_EQ(temperature["highAlarm"], 90.0);
}

/// From a unit to what it hangs on and back, and into another namespace.
TEST(ServeJson, FollowsAssociations)
{
    const Folder folder;
    const Serving server;
    const Script script(server, folder);
    const std::string port = script.pathOf("TVRHBA_FCPort", "1000027A51160211");
    const Json joined = script.askOf("associations", port).json;
    EXPECT_GT(joined["total"], 10);
    std::optional<std::string> profile, connector;
    for (const Json& item : joined["items"])
    {
        if (item["class"] == "TVRHBA_RegisteredProfile")
            profile = item["path"];
        if (item["association"] == "TVRHBA_FCRealizes")
            connector = item["path"];
    }
    ASSERT_TRUE(profile && connector) << joined;
    EXPECT_THAT(*profile, StartsWith("root/pg_interop:"));
    EXPECT_EQ(script.askOf("instance", *profile).json["namespace"], "root/pg_interop");
    const Json back = script.askOf("associations", *connector).json["items"];
    EXPECT_TRUE(std::ranges::any_of(back, [&](const Json& item) { return item["path"] == port; })) << back;
    const Json part = script.askOf("associations", port, "-d from=1 -d count=2").json;
    EXPECT_EQ(part["total"], joined["total"]);
    EXPECT_EQ(part["items"], Json::array({joined["items"][1], joined["items"][2]}));
}

TEST(ServeJson, PagesSortsAndFindsAmongThousands)
{
    const Folder folder;
    const Serving server({}, {"--scenario", TVR_SCENARIOS "/large.json"});
    const Script script(server, folder);
    const std::string volumes = "classes/TVRHBA_StorageVolume/instances";
    const Json table = script.ask(volumes + "?count=1").json;
    const std::size_t total = table["total"];
    ASSERT_GT(total, 2000U);

    std::vector<std::string> paths, ids;
    for (std::size_t from = 0; from < total; from += 500)
    {
        const std::string part = "?count=500&sort=DeviceID&descending=1&from=" + std::to_string(from);
        const Json rows = script.ask(volumes + part).json["rows"];
        for (const Json& row : rows)
        {
            paths.push_back(row["path"]);
            ids.push_back(row["values"][columnOf(table, "DeviceID")]);
        }
    }
    ASSERT_EQ(ids.size(), total);
    EXPECT_TRUE(std::ranges::is_sorted(ids, std::greater()));
    EXPECT_EQ(std::ranges::adjacent_find(ids), ids.end()) << "no row stands on two pages";
    EXPECT_EQ(script.ask(volumes + "?from=" + std::to_string(total)).json["rows"].size(), 0U);

    const Json found = script.ask(volumes + "?find=" + ids[total / 2]).json;
    EXPECT_EQ(found["matching"], 1);
    EXPECT_EQ(found["total"], total);
    EXPECT_EQ(found["rows"][0]["path"], paths[total / 2]);

    const Json host = script.ask("host").json;
    EXPECT_GE(host["root"]["units"], total);
    EXPECT_EQ(host.dump().find("\"kind\":\"Volume\""), std::string::npos) << "units beyond eight are counted";
}

/// Names with markup, quotes, control characters and bytes that are no UTF-8 arrive as texts, and lead back.
TEST(ServeJson, HostileNamesAreTexts)
{
    const Folder folder;
    const Serving server({}, {"--scenario", TVR_SCENARIOS "/hostile.json"});
    const Script script(server, folder);
    EXPECT_EQ(script.ask("host").status, 200);
    EXPECT_EQ(script.ask("ports").status, 200);
    EXPECT_EQ(script.ask("diagnostics").status, 200);
    EXPECT_EQ(script.ask("methods").status, 200);
    std::size_t read = 0;
    for (const Json& served : script.ask("classes").json)
    {
        if (served["association"] == true)
            continue;
        const Script::Told table = script.ask("classes/" + served["name"].get<std::string>() + "/instances?count=3");
        ASSERT_EQ(table.status, 200) << served["name"] << table.json;
        for (const Json& row : table.json["rows"])
        {
            const Script::Told one = script.askOf("instance", row["path"]);
            EXPECT_EQ(one.status, 200) << row["path"] << one.json;
            EXPECT_EQ(script.askOf("associations", row["path"]).status, 200) << row["path"];
            read++;
        }
    }
    EXPECT_GT(read, 30U);
}

TEST(ServeJson, ErrorsThatGrowAreTold)
{
    const Folder folder;
    const Serving server({}, {"--scenario", TVR_SCENARIOS "/growing.json"});
    const Script script(server, folder);
    const auto errors = [&]
    {
        std::vector<std::string> texts;
        const Json answer = script.ask("ports").json;
        for (const Json& port : answer["ports"])
            for (const Json& counter : port["counters"])
                if (counter["grows"] == true)
                    texts.push_back(port["name"].get<std::string>() + " " + counter["label"].get<std::string>());
        return texts;
    };
    EXPECT_THAT(errors(), testing::IsEmpty());
    EXPECT_TRUE(eventually([&] { return !errors().empty(); }));
    EXPECT_THAT(errors(),
                testing::ElementsAre("1000027A51320D01 CRC errors", "1000027A51320D01 invalid transmission words"));
    const Json problems = script.ask("host").json["problems"];
    EXPECT_TRUE(
        std::ranges::any_of(problems, [](const Json& problem)
                            { return problem["text"] == "CRC ERRORS GROW" && problem["severity"] == "warning"; }))
        << problems;
}

/// Behind a method that has the provider read everything anew, the next answer is of what was read then.
TEST(ServeJson, FirmwareThatWaitsIsAProblemAtOnce)
{
    const Folder folder;
    const Serving server({"--users", folder.makeUsers("joe", "secret")});
    const Script joe(server, folder, "joe:secret");
    EXPECT_EQ(joe.ask("host").json["problems"].size(), 1U);
    const std::string image = "TVRSIM-FIRMWARE 1\nfamily: TV3202\nversion: 12.8.1.0\nchecksum: CBF43926\n\n123456789";
    const Json installed = joe.call({{"path", joe.pathOf("TVRHBA_SoftwareInstallationService", "FCSoftware")},
                                     {"method", "InstallFromByteStream"},
                                     {"in",
                                      {{"Target", joe.pathOf("TVRHBA_FCPort", "1000027A51320240")},
                                       {"Image", std::vector<int>(image.begin(), image.end())},
                                       {"InstallOptions", {32768}},
                                       {"InstallOptionsValues", {"new.grp"}}}}})
                               .json;
    EXPECT_EQ(installed["returnValue"], 0) << installed;
    const Json problems = joe.ask("host").json["problems"];
    ASSERT_EQ(problems.size(), 2U) << problems;
    EXPECT_EQ(problems[1]["text"], "FIRMWARE 12.8.1.0 WAITS FOR A RESET");
    EXPECT_EQ(problems[1]["name"], "1000027A51320240");
    EXPECT_EQ(problems[1]["severity"], "warning");
}

TEST(ServeJson, ATestOfAPortRunsToItsRecord)
{
    const Folder folder;
    const Serving server({"--users", folder.makeUsers("joe", "secret")});
    const Script joe(server, folder, "joe:secret");
    const Json tests = joe.ask("diagnostics").json["tests"];
    const auto test = std::ranges::find(tests, "TVR:FCHBA Status Test", [](const Json& each) { return each["name"]; });
    ASSERT_NE(test, tests.end());
    const Json run = joe.call({{"path", (*test)["path"]},
                               {"method", "RunDiagnosticService"},
                               {"in", {{"ManagedElement", (*test)["ports"][0]["path"]}}}})
                         .json;
    EXPECT_EQ(run["returnValue"], 0) << run;
    Json now;
    ASSERT_TRUE(eventually(
        [&]
        {
            now = joe.ask("diagnostics").json;
            return !now["records"].empty();
        }));
    EXPECT_EQ(now["records"][0]["id"], now["jobs"][0]["id"]);
    EXPECT_EQ(now["records"][0]["port"], (*test)["ports"][0]["port"]);
    EXPECT_THAT(now["records"][0]["text"].get<std::string>(), HasSubstr("Resulted with Success"));
    EXPECT_EQ(now["jobs"][0]["percent"], 100);
}

TEST(ServeJson, AChangeIsSeenAtOnceAndARefusalIsTold)
{
    const Folder folder;
    const Serving server({"--users", folder.makeUsers("joe", "secret")});
    const Script joe(server, folder, "joe:secret");
    const std::string log = providerLog(joe);
    const auto change = [&](const Json& in) {
        return joe.call({{"path", log}, {"method", "SetLogParams"}, {"in", in}});
    };
    const auto level = [&]
    {
        const Json table = joe.ask("classes/TVRHBA_RecordLog/instances?find=ProviderLog").json;
        return table["rows"][0]["values"][columnOf(table, "LogLevel")].get<std::string>();
    };
    EXPECT_EQ(level(), "0");
    EXPECT_EQ(change({{"LogLevel", 5}, {"LogMode", 1}, {"TracePath", ""}}).json["returnValue"], 0);
    EXPECT_EQ(level(), "Debug (5)");
    const Json refused = change({{"LogLevel", 99}, {"LogMode", 1}, {"TracePath", ""}}).json;
    EXPECT_EQ(refused["returnValue"], 32968);
    EXPECT_THAT(refused["returnText"].get<std::string>(), StartsWith("A value is out of range"));
    EXPECT_EQ(change({{"LogLevel", "5"}}).status, 400);
    EXPECT_EQ(change({{"Level", 5}}).status, 400);
    EXPECT_EQ(joe.ask("nothing").status, 404);
    EXPECT_EQ(joe.askOf("instance", "TVRHBA_FCPort.DeviceID=\"x\"").status, 400);
}

} // namespace
