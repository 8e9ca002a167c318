#include "tests/system/Serving.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>
#include <fstream>
#include <unistd.h>

namespace system_test
{

namespace fs = std::filesystem;

namespace
{

std::vector<const char*> wordsOf(const std::vector<std::string>& toolOptions, const std::vector<std::string>& options)
{
    std::vector<const char*> words;
    for (const std::string& option : toolOptions)
        words.push_back(option.c_str());
    words.push_back("serve");
    if (std::ranges::find(options, "--listen") == options.end())
        words.insert(words.end(), {"--listen", "127.0.0.1:0"});
    for (const std::string& option : options)
        words.push_back(option.c_str());
    return words;
}

} // namespace

Folder::Folder() : _path(testing::TempDir() + "serve-" + std::to_string(getpid()))
{
    fs::create_directories(_path);
}

Folder::~Folder()
{
    fs::remove_all(_path);
}

void Folder::makeCertificate(const std::string& name) const
{
    const Answer made = runCommand("openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -nodes -days 2 "
                                   "-subj /CN=localhost -addext subjectAltName=IP:127.0.0.1 -keyout " +
                                   file(name + ".key") + " -out " + file(name + ".pem"));
    EXPECT_EQ(made.exitCode, 0) << made.err;
}

std::string Folder::makeUsers(const std::string& user, const std::string& password) const
{
    const std::string users = file("users");
    std::string hash = runCommand("openssl passwd -6 " + password).out;
    hash.resize(hash.find_last_not_of('\n') + 1);
    std::ofstream(users) << "# people\n" << user << ':' << hash << "\r\nreader:" << hash << ":reader\n";
    fs::permissions(users, fs::perms::owner_read | fs::perms::owner_write);
    return users;
}

Serving::Serving(const std::vector<std::string>& options, const std::vector<std::string>& toolOptions)
    : _tool(wordsOf(toolOptions, options))
{
    const std::string line = _tool.readLine();
    EXPECT_THAT(line, testing::StartsWith("listening on http"));
    _url = line.substr(line.rfind(' ') + 1);
}

void Serving::introduce(const std::string& user, const std::string& options)
{
    _user = user;
    _clientOptions = options;
}

Answer Serving::wbemcli(const std::string& operation, const std::string& path, const std::string& arguments) const
{
    return wbemcliAs(_user, operation + " " + _clientOptions, path, arguments);
}

Answer Serving::wbemcliAs(const std::string& user, const std::string& operation, const std::string& path,
                          const std::string& arguments) const
{
    const std::size_t host = _url.find("//") + 2;
    return runCommand("no_proxy=127.0.0.1 timeout 60 wbemcli " + operation + " '" + _url.substr(0, host) + user +
                      _url.substr(host) + path + "' " + arguments);
}

int Serving::end()
{
    return _tool.endBy(SIGINT);
}

} // namespace system_test
