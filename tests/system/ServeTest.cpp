// The port as wbemcli sees it, beside what the tool prints of the same host in its own process.
#include "tests/system/Tool.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

using namespace system_test;
using testing::HasSubstr;
using testing::StartsWith;

namespace
{

using Lines = std::vector<std::string>;

Lines sortedLines(const std::string& text)
{
    Lines lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    std::ranges::sort(lines);
    return lines;
}

/// A text in an instance may have lines of its own.
std::size_t objectsIn(const std::string& text)
{
    const Lines lines = sortedLines(text);
    return static_cast<std::size_t>(
        std::ranges::count_if(lines, [](const std::string& line) { return line.starts_with("localhost/root/"); }));
}

/// The tool as a server on a free port.
class Serving
{
public:
    explicit Serving(std::vector<const char*> options = {}) : _tool(words(std::move(options)))
    {
        const std::string line = _tool.readLine();
        EXPECT_THAT(line, StartsWith("listening on http"));
        _port = line.substr(line.rfind(':') + 1);
    }
    /// `path` is what stands behind the port of wbemcli's object path.
    Answer wbemcli(const std::string& operation, const std::string& path, const std::string& arguments = "",
                   const std::string& user = "") const
    {
        return runCommand("no_proxy=127.0.0.1 timeout 30 wbemcli " + operation + " 'http://" + user + "127.0.0.1:" + _port +
                     path + "' " + arguments);
    }
    /// A path that the server gave, without its host.
    static std::string withoutHost(const std::string& line) { return line.substr(line.find('/')); }
    int end() { return _tool.endBy(SIGINT); }

private:
    static std::vector<const char*> words(std::vector<const char*> options)
    {
        options.insert(options.begin(), {"serve", "--listen", "127.0.0.1:0"});
        return options;
    }

    Running _tool;
    std::string _port;
};

constexpr char port[] = R"(/root/tavrin:TVRHBA_FCPort.CreationClassName="TVRHBA_FCPort",DeviceID="1000027A51160210")";

TEST(Serve, WbemcliSeesTheInstancesOfTheTool)
{
    Serving server;
    Lines names = sortedLines(server.wbemcli("ein", "/root/tavrin:TVRHBA_FCPort").out);
    ASSERT_EQ(names.size(), 4u);
    for (const std::string& name : names)
    {
        const std::string path = Serving::withoutHost(name);
        const Answer instance = server.wbemcli("gi", path, "DeviceID,PortType,Speed");
        EXPECT_EQ(instance.exitCode, 0) << instance.err;
        const std::string id = path.substr(path.find("DeviceID"));
        EXPECT_THAT(instance.out, HasSubstr(id));
        for (const auto& [namesOnly, whole] : {std::pair("ain", "ai"), std::pair("rin", "ri")})
        {
            const std::size_t count = objectsIn(server.wbemcli(namesOnly, path).out);
            EXPECT_GT(count, 20u);
            EXPECT_EQ(objectsIn(server.wbemcli(whole, path).out), count) << whole;
        }
    }
    const std::string tool = tvrcim("enum TVRHBA_FCPort --names").out;
    for (std::string& name : names)
        name = name.substr(name.find("DeviceID="));
    for (const std::string& name : names)
        EXPECT_THAT(tool, HasSubstr(name));
    EXPECT_EQ(sortedLines(server.wbemcli("ei", "/root/tavrin:TVRHBA_FCPort", "DeviceID").out).size(), 4u);
    EXPECT_EQ(server.end(), 0);
}

TEST(Serve, WbemcliSeesTheClasses)
{
    Serving server;
    EXPECT_EQ(server.wbemcli("ecn", "/root/tavrin:TVRHBA_FCPort").exitCode, 0);
    EXPECT_THAT(server.wbemcli("gc", "/root/tavrin:TVRHBA_FCPort").out, HasSubstr("DeviceID="));
    EXPECT_THAT(server.wbemcli("gcd", "/root/tavrin:TVRHBA_FCHBAWWNService").out, HasSubstr("NAME=\"ChangeWWN\""));
    EXPECT_THAT(server.wbemcli("ec", "/root/tavrin:CIM_Log").out, HasSubstr("CIM_RecordLog"));
}

TEST(Serve, WbemcliChangesTheHost)
{
    Serving server;
    const std::string service =
        Serving::withoutHost(sortedLines(server.wbemcli("ein", "/root/tavrin:TVRHBA_HelpService").out).at(0));
    EXPECT_THAT(server.wbemcli("cm", service, "'GetHelp.Format=1'").out, HasSubstr("GetHelp: "));
    const std::string setting =
        R"(/root/tavrin:TVRHBA_ProviderConfigSetting.InstanceID="Tavrin HBA Provider:sanrefresh")";
    EXPECT_EQ(server.wbemcli("mi", setting, "'current=0'").exitCode, 0);
    EXPECT_THAT(server.wbemcli("gi", setting, "current").out, HasSubstr("current=0"));
    EXPECT_EQ(server.wbemcli("di", port).exitCode, 16);
}

TEST(Serve, FailuresReachTheClient)
{
    Serving server;
    const struct
    {
        const char *operation, *path, *message;
    } rows[] = {
        {"ei", "/root/none:TVRHBA_FCPort", "(3) CIM_ERR_INVALID_NAMESPACE"},
        {"ei", "/root/tavrin:None", "(5) CIM_ERR_INVALID_CLASS"},
        {"gi", R"(/root/tavrin:TVRHBA_Card.CreationClassName="TVRHBA_Card",Tag="none")", "(6) CIM_ERR_NOT_FOUND"},
    };
    for (const auto& row : rows)
    {
        const Answer answer = server.wbemcli(row.operation, row.path);
        EXPECT_EQ(answer.exitCode, 16);
        EXPECT_THAT(answer.err, HasSubstr(row.message));
    }
}

TEST(Serve, UsersGiveTheirPasswords)
{
    const std::string file = testing::TempDir() + "users-" + std::to_string(getpid());
    // "secret", by openssl passwd -6 -salt tavrin
    std::ofstream(file) << "# people\njoe:" << runCommand("openssl passwd -6 -salt tavrin secret").out;
    std::filesystem::permissions(file, std::filesystem::perms::owner_read | std::filesystem::perms::owner_write);
    Serving server({"--users", file.c_str()});
    const std::string cards = "/root/tavrin:TVRHBA_Card";
    EXPECT_THAT(server.wbemcli("ein", cards).err, HasSubstr("Username/password required"));
    for (const char* wrong : {"joe:wrong@", "jim:secret@", "joe:@"})
        EXPECT_THAT(server.wbemcli("ein", cards, "", wrong).err, HasSubstr("Invalid username/password")) << wrong;
    EXPECT_EQ(server.wbemcli("ein", cards, "", "joe:secret@").exitCode, 0);
    std::filesystem::remove(file);
}

TEST(Serve, OtherHostsAreNotServedInTheOpen)
{
    const Answer answer = tvrcim("serve --listen 0.0.0.0:0");
    EXPECT_EQ(answer.exitCode, 2);
    EXPECT_THAT(answer.err, HasSubstr("users and TLS"));
    EXPECT_THAT(tvrcim("serve --listen 127.0.0.1:99999").err, HasSubstr("'99999' is no port"));
}

} // namespace
