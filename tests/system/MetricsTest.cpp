// Prometheus itself as the client of the port, by the configuration of docs/fleet.
#include "tests/support/Eventually.h"
#include "tests/system/Serving.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <arpa/inet.h>
#include <csignal>
#include <fstream>
#include <optional>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

using namespace system_test;
using test_support::eventually;
using testing::HasSubstr;
using testing::StartsWith;

namespace
{

using Json = nlohmann::json;

int freePort()
{
    const int socket = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in address{};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t size = sizeof address;
    EXPECT_EQ(bind(socket, reinterpret_cast<sockaddr*>(&address), size), 0);
    EXPECT_EQ(getsockname(socket, reinterpret_cast<sockaddr*>(&address), &size), 0);
    close(socket);
    return ntohs(address.sin_port);
}

class Prometheus
{
public:
    /// Its files stay in the folder.
    Prometheus(const Folder& folder, const std::string& configuration) : _port(freePort())
    {
        const std::string config = "--config.file=" + configuration;
        const std::string storage = "--storage.tsdb.path=" + folder.file("storage");
        const std::string listen = "--web.listen-address=127.0.0.1:" + std::to_string(_port);
        _process = fork();
        if (_process == 0)
        {
            execlp("prometheus", "prometheus", config.c_str(), storage.c_str(), listen.c_str(), "--log.level=error",
                   nullptr);
            _exit(127);
        }
    }
    ~Prometheus()
    {
        kill(_process, SIGKILL);
        waitpid(_process, nullptr, 0);
    }
    Prometheus(const Prometheus&) = delete;
    Prometheus& operator=(const Prometheus&) = delete;

    /// The value of the only series of an expression; nothing where there is none.
    std::optional<double> value(const std::string& expression) const
    {
        const Answer answer = runCommand("curl -s --noproxy '*' --max-time 10 --data-urlencode 'query=" + expression +
                                         "' http://127.0.0.1:" + std::to_string(_port) + "/api/v1/query");
        const Json json = Json::parse(answer.out, nullptr, false);
        if (json.is_discarded() || json.value("status", "") != "success" || json["data"]["result"].size() != 1)
            return std::nullopt;
        return std::stod(json["data"]["result"][0]["value"][1].get<std::string>());
    }

private:
    int _port;
    pid_t _process;
};

/// Puts a value in the place of the rest of the line behind some text.
void replaceBehind(std::string& text, const std::string& before, const std::string& value)
{
    const std::size_t place = text.find(before);
    ASSERT_NE(place, std::string::npos) << before;
    const std::size_t begin = place + before.size();
    text.replace(begin, text.find('\n', begin) - begin, value);
}

/// The configuration of the documentation, with the places of this host.
std::string configurationOf(const Folder& folder, const Serving& server)
{
    std::string text = textOf(TVR_FLEET "/prometheus.yml");
    std::ofstream(folder.file("password")) << "secret";
    replaceBehind(text, "scrape_interval: ", "1s");
    replaceBehind(text, "scrape_timeout: ", "1s");
    replaceBehind(text, "password_file: ", folder.file("password"));
    replaceBehind(text, "ca_file: ", folder.file("own.pem"));
    replaceBehind(text, "targets: ", "[\"127.0.0.1:" + server.port() + "\"]");
    replaceBehind(text, "rule_files:\n  - ", TVR_FLEET "/alerts.yml");
    const std::string file = folder.file("prometheus.yml");
    std::ofstream(file) << text;
    return file;
}

TEST(Metrics, PrometheusScrapesALargeHostInUnderASecond)
{
    const Folder folder;
    const std::string scenario = folder.file("host.json");
    std::ofstream(scenario) << R"({"generate": {"adapters": 32, "targetsPerPort": 4, "unitsPerTarget": 128}})";
    folder.makeCertificate("own");
    const std::string users = folder.makeUsers("monitor", "secret");
    Serving server({"--tls", folder.file("own.pem"), folder.file("own.key"), "--users", users},
                   {"--scenario", scenario});
    const Prometheus prometheus(folder, configurationOf(folder, server));

    // A scrape that takes longer than the interval of a second is none; the first has the cache filled.
    ASSERT_TRUE(eventually([&] { return prometheus.value("sum_over_time(up[5m])").value_or(0) >= 3; }));
    const auto last = [](const std::string& name) { return "last_over_time(tavrin_fc_" + name + "[5m])"; };
    EXPECT_EQ(prometheus.value("count(" + last("port_up") + " == 1)"), 32);
    EXPECT_EQ(prometheus.value("sum(" + last("port_units") + ")"), 16384);
    EXPECT_EQ(prometheus.value("sum(" + last("port_targets") + ")"), 128);
    EXPECT_EQ(prometheus.value(last("refreshes_total")), 1);
    EXPECT_LT(prometheus.value("min_over_time(scrape_duration_seconds[5m])").value_or(1), 1);
    EXPECT_EQ(server.end(), 0);
}

TEST(Metrics, TheTextIsWhatTheToolsOfPrometheusTake)
{
    Serving server;
    const std::string get = "curl -s --noproxy '*' " + server.url() + "/metrics";
    const Answer checked = runCommand(get + " | promtool check metrics");
    EXPECT_EQ(checked.exitCode, 0);
    EXPECT_EQ(checked.out + checked.err, "");

    const Answer plain = runCommand(get + " -i");
    EXPECT_THAT(plain.out, HasSubstr("Content-Type: text/plain; version=0.0.4; charset=utf-8\r\n"));
    const Answer open = runCommand(get + " -i -H 'Accept: application/openmetrics-text; version=1.0.0'");
    EXPECT_THAT(open.out, HasSubstr("Content-Type: application/openmetrics-text; version=1.0.0; charset=utf-8\r\n"));
    EXPECT_THAT(open.out, testing::EndsWith("\n# EOF\n"));
    EXPECT_EQ(server.end(), 0);
}

TEST(Metrics, OfAnotherHostOnlyUsersReadThem)
{
    const Folder folder;
    folder.makeCertificate("own");
    const std::string certificate = folder.file("own.pem");
    const std::string key = folder.file("own.key");
    const std::string users = folder.makeUsers("monitor", "secret");
    Running server(
        {"serve", "--listen", "0.0.0.0:0", "--tls", certificate.c_str(), key.c_str(), "--users", users.c_str()});
    const std::string line = server.readLine();
    const std::string get = "curl -s -o /dev/null -w '%{http_code}' --noproxy '*' --cacert " + certificate +
                            " https://127.0.0.1:" + line.substr(line.rfind(':') + 1) + "/metrics";
    EXPECT_EQ(runCommand(get).out, "401");
    EXPECT_EQ(runCommand(get + " -u monitor:wrong").out, "401");
    EXPECT_EQ(runCommand(get + " -u monitor:secret").out, "200");
    EXPECT_EQ(server.endBy(SIGINT), 0);
}

/// The dashboard's expressions as rules, which are checked where expressions by themselves are not.
std::string rulesOfDashboard()
{
    std::string text = "groups:\n  - name: dashboard\n    rules:\n";
    const Json dashboard = Json::parse(textOf(TVR_FLEET "/dashboard.json"));
    for (const Json& panel : dashboard.at("panels"))
        for (const Json& target : panel.value("targets", Json::array()))
        {
            std::string expression = target.at("expr");
            for (const auto& [variable, value] :
                 {std::pair("$host", ".*"), std::pair("$port", ".*"), std::pair("$__rate_interval", "5m")})
                for (std::size_t place; (place = expression.find(variable)) != std::string::npos;)
                    expression.replace(place, std::string(variable).size(), value);
            text += "      - {record: a, expr: " + Json(expression).dump() + "}\n";
        }
    return text;
}

TEST(Metrics, TheFilesForAFleetAreValid)
{
    const Folder folder;
    const std::string dashboard = folder.file("dashboard.yml");
    std::ofstream(dashboard) << rulesOfDashboard();
    const std::vector<std::string> checks = {"check rules " TVR_FLEET "/alerts.yml", "test rules " TVR_ALERTS_TEST,
                                             "check rules --lint=none " + dashboard,
                                             "check config --syntax-only " TVR_FLEET "/prometheus.yml"};
    for (const std::string& check : checks)
    {
        const Answer checked = runCommand("promtool " + check);
        EXPECT_EQ(checked.exitCode, 0) << checked.out << checked.err;
    }
}

} // namespace
