// Who may talk to the port, over what, and what it refuses to start with.
#include "tests/system/Serving.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <tuple>

using namespace system_test;
using testing::EndsWith;
using testing::HasSubstr;
using testing::StartsWith;

namespace
{

namespace fs = std::filesystem;

const std::string cards = "/root/tavrin:TVRHBA_Card";

/// With the right password, and with all others.
void expectPasswords(const Serving& server, const std::string& operation)
{
    EXPECT_THAT(server.wbemcli(operation, cards).err, HasSubstr("Username/password required"));
    for (const char* wrong : {"joe:wrong@", "jim:secret@", "joe:@", "joe:secret%00@", "JOE:secret@"})
        EXPECT_THAT(server.wbemcliAs(wrong, operation, cards).err, HasSubstr("Invalid username/password")) << wrong;
    const Answer right = server.wbemcliAs("joe:secret@", operation, cards);
    EXPECT_EQ(right.exitCode, 0) << right.err;
    EXPECT_THAT(right.out, HasSubstr("TVRHBA_Card.Tag=\"TV16A02417\""));
}

TEST(ServeSecurity, UsersGiveTheirPasswords)
{
    const Folder folder;
    const Serving server({"--users", folder.makeUsers("joe", "secret")});
    expectPasswords(server, "ein");
    const std::string headers = runCommand("curl --noproxy '*' -si -d x " + server.url() + "/cimom").out;
    EXPECT_THAT(headers, StartsWith("HTTP/1.1 401"));
    EXPECT_THAT(headers, HasSubstr("WWW-Authenticate: Basic realm="));
}

/// On standard error, which a service's journal keeps: whatever a name has in it, on one line.
TEST(ServeSecurity, WhoChangesTheHostAndWhoIsNotLetInIsTold)
{
    const Folder folder;
    const std::string setting =
        "root/tavrin:TVRHBA_ProviderConfigSetting.InstanceID=\"Tavrin HBA Provider:sanrefresh\"";
    testing::internal::CaptureStderr();
    {
        Serving server({"--users", folder.makeUsers("joe", "secret")});
        server.introduce("joe:secret@", "");
        server.wbemcli("ein", cards);
        server.wbemcli("mi", "/" + setting, "current=1");
        server.wbemcli("sp", "/" + setting, "current=1");
        server.wbemcli("di", "/" + setting);
        server.wbemcli("cm", "/root/tavrin:TVRHBA_RecordLog.InstanceID=\"none\"", "ClearLog");
        runCommand("curl --noproxy '*' -s -u \"$(printf 'jim\\njoe'):x\" " + server.url() + "/api/host");
        EXPECT_EQ(server.end(), 0);
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "joe changed " + setting + ": done\n" + "joe changed current of " + setting + ": done\n" +
                  "joe deleted " + setting + ": CIM_ERR_NOT_SUPPORTED\n" +
                  "joe called TVRHBA_RecordLog.ClearLog on root/tavrin:TVRHBA_RecordLog.InstanceID=\"none\": 33068\n" +
                  "login refused from 127.0.0.1 of \"jim\\njoe\"\n");
}

TEST(ServeSecurity, WhoMayOnlyReadChangesNothing)
{
    const Folder folder;
    const std::string setting =
        "/root/tavrin:TVRHBA_ProviderConfigSetting.InstanceID=\"Tavrin HBA Provider:sanrefresh\"";
    const std::string log = "/root/tavrin:TVRHBA_RecordLog.InstanceID=\"TVRHBA:ProviderLog\"";
    const auto expectReader = [&](const Serving& server, const std::string& user)
    {
        EXPECT_EQ(server.wbemcliAs(user, "ein", cards).exitCode, 0);
        for (const auto& [operation, path, arguments] : {std::tuple{"mi", setting, "current=1"},
                                                         {"sp", setting, "current=1"},
                                                         {"di", setting, ""},
                                                         {"ci", setting, "current=1,InstanceID=new"},
                                                         {"cm", log, "ClearLog"}})
            EXPECT_THAT(server.wbemcliAs(user, operation, path, arguments).err, HasSubstr("CIM_ERR_ACCESS_DENIED"))
                << operation;
    };
    expectReader(Serving({"--users", folder.makeUsers("joe", "secret")}), "reader:secret@");
    // Anybody on the host reaches a port without users.
    setenv("LD_LIBRARY_PATH", TVR_SIMULATOR_FOLDER, 1);
    const Serving hardware({}, {"--hardware"});
    unsetenv("LD_LIBRARY_PATH");
    expectReader(hardware, "");
}

TEST(ServeSecurity, TheWholeTalkIsEncrypted)
{
    const Folder folder;
    folder.makeCertificate("own");
    folder.makeCertificate("other");
    const Serving server(
        {"--tls", folder.file("own.pem"), folder.file("own.key"), "--users", folder.makeUsers("joe", "secret")});
    EXPECT_THAT(server.url(), StartsWith("https://"));
    expectPasswords(server, "ein -cacert " + folder.file("own.pem"));
    EXPECT_EQ(server.wbemcliAs("joe:secret@", "ein -noverify", cards).exitCode, 0);
    EXPECT_EQ(server.wbemcliAs("joe:secret@", "ein -cacert " + folder.file("other.pem"), cards).exitCode, 16);
    const std::string tls = runCommand("openssl s_client -connect 127.0.0.1:" + server.port() + " -CAfile " +
                                       folder.file("own.pem") + " -verify_return_error </dev/null")
                                .out;
    EXPECT_THAT(tls, HasSubstr("TLSv1.3"));
    EXPECT_NE(runCommand("curl --noproxy '*' -sk --tls-max 1.1 --ciphers DEFAULT@SECLEVEL=0 " + server.url()).exitCode,
              0);
    EXPECT_NE(runCommand("curl --noproxy '*' -s -d x http://127.0.0.1:" + server.port()).exitCode, 0);
}

/// One line of standard error, and the exit code of files and arguments that cannot be used; of a place to listen at
/// another, by which a service is started again.
TEST(ServeSecurity, WhatIsNotSafeOrCannotBeUsedIsNotServed)
{
    const Folder folder;
    folder.makeCertificate("own");
    folder.makeCertificate("other");
    const std::string users = folder.makeUsers("joe", "secret");
    const auto file = [&](const char* name, const char* text, fs::perms permissions = fs::perms::owner_read)
    {
        std::ofstream(folder.file(name)) << text;
        fs::permissions(folder.file(name), permissions);
        return folder.file(name);
    };
    const std::string tls = " --tls " + folder.file("own.pem") + " " + folder.file("own.key");
    const Serving server;
    constexpr int mayBeThereLater = 8;
    const struct
    {
        std::string arguments, message;
        int exitCode = 2;
    } rows[] = {
        {"--listen 0.0.0.0:0", "other hosts are served with users and TLS alone"},
        {"--listen [::]:0" + tls, "other hosts are served with users and TLS alone"},
        {"--listen 0.0.0.0:0 --users " + users, "other hosts are served with users and TLS alone"},
        {"--listen 127.0.0.1:99999", "'99999' is no port"},
        {"--listen 127.0.0.1:http", "'http' is no port"},
        {"--listen 192.0.2.1:0 --users " + users + tls, "cannot listen on 192.0.2.1:0", mayBeThereLater},
        {"--listen 127.0.0.1:" + server.port(), "cannot listen on 127.0.0.1:" + server.port(), mayBeThereLater},
        {"--tls " + folder.file("own.pem") + " " + folder.file("other.key"),
         "cannot use the certificate '" + folder.file("own.pem") + "' with its key"},
        {"--tls " + users + " " + folder.file("own.key"), "cannot use the certificate '" + users + "' with its key"},
        {"--users " + file("open", "joe:$6$x$y\n", fs::perms::owner_read | fs::perms::others_write),
         "others may write the users' file '" + folder.file("open") + "'"},
        {"--users " + file("broken", "joe:$6$x$y\njim\n"),
         folder.file("broken") + ":2: a line is written name:hash or name:hash:reader"},
        {"--users " + file("empty", "# nobody\n"), "there is no user in '" + folder.file("empty") + "'"},
    };
    for (const auto& row : rows)
    {
        const std::string listen = row.arguments.starts_with("--listen") ? "" : "--listen 127.0.0.1:0 ";
        const Answer answer = tvrcim("serve " + listen + row.arguments + " </dev/null", "timeout 20 ");
        EXPECT_EQ(answer.exitCode, row.exitCode) << row.arguments;
        EXPECT_EQ(answer.out, "") << row.arguments;
        EXPECT_THAT(answer.err, StartsWith("tvrcim: "));
        EXPECT_THAT(answer.err, EndsWith(row.message + "\n"));
        EXPECT_EQ(std::count(answer.err.begin(), answer.err.end(), '\n'), 1) << answer.err;
    }
    for (const char* option : {"--users /nowhere", "--tls /nowhere /nowhere", "--tls /etc/passwd"})
        EXPECT_EQ(tvrcim(std::string("serve --listen 127.0.0.1:0 ") + option, "timeout 20 ").exitCode, 2) << option;
}

/// Whoever reads the hashes can look for passwords; that is the administrator's to mend.
TEST(ServeSecurity, AFileOfUsersThatOthersReadIsToldOf)
{
    const Folder folder;
    const std::string users = folder.makeUsers("joe", "secret");
    fs::permissions(users, fs::perms::others_read, fs::perm_options::add);
    const Serving server;
    const Answer answer = tvrcim("serve --users " + users + " --listen 127.0.0.1:" + server.port());
    EXPECT_EQ(answer.err, "tvrcim: warning: others may read the users' file '" + users +
                              "'\ntvrcim: cannot listen on " + "127.0.0.1:" + server.port() + "\n");
}

} // namespace
