// Who is let in where, by the head of a request alone.
#include "broker/http/Admission.h"
#include "broker/http/Journal.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <set>

#include <crypt.h>
#include <unistd.h>

using namespace http;
using testing::HasSubstr;

namespace
{

namespace fs = std::filesystem;

constexpr const char* token = "0123456789abcdef0123456789abcdef";
const std::pair<std::string, std::string> joe{"Authorization", "Basic am9lOnNlY3JldA=="};
const std::pair<std::string, std::string> reader{"Authorization", "Basic cmVhOnNlY3JldA=="};
const std::pair<std::string, std::string> wrong{"Authorization", "Basic am9lOlNlY3JldA=="};
const std::pair<std::string, std::string> own{"Host", "localhost:5988"};
const std::pair<std::string, std::string> withToken{"X-Tavrin-Token", token};
const std::pair<std::string, std::string> json{"Content-Type", "application/json"};
const std::pair<std::string, std::string> length{"Content-Length", "2"};
const std::pair<std::string, std::string> cim{"CIMOperation", "MethodCall"};

Users usersOf(const std::string& lines)
{
    const std::string file = testing::TempDir() + "admission-users-" + std::to_string(getpid());
    std::ofstream(file) << lines;
    fs::permissions(file, fs::perms::owner_read | fs::perms::owner_write);
    const Users users(file);
    fs::remove(file);
    return users;
}

Users someUsers()
{
    return usersOf(
        "joe:$6$salt$egUxKNxDs8kPfh8iPMNcosMhb2eWah6d3R44JDm5Rj/j/XWR5E33QPd0YmHXoDHOIDR6kL5D3JcQcz0O8FHE00\n"
        "rea:$6$salt$egUxKNxDs8kPfh8iPMNcosMhb2eWah6d3R44JDm5Rj/j/"
        "XWR5E33QPd0YmHXoDHOIDR6kL5D3JcQcz0O8FHE00:reader\n");
}

const Site site = {
    {"GET", "/", Entrance::open, {}},
    {"GET", "/api/host", Entrance::reader, {}},
    {"GET", "/api/logs/*", Entrance::reader, {}},
    {"POST", "/api/call", Entrance::changer, {}},
    {"POST", "*", Entrance::program, {}},
};

struct Row
{
    const char* method;
    const char* path;
    httplib::Headers headers;
    int status;
    const char* reason = "";
    bool challenges = false;
};

void expectRows(const House& house, const std::vector<Row>& rows)
{
    for (const Row& row : rows)
    {
        httplib::Request request;
        request.method = row.method;
        request.path = row.path;
        request.headers = row.headers;
        const Admitted admitted = admit(house, site, request);
        const auto place = &row - rows.data();
        EXPECT_EQ(admitted.status, row.status) << place << " " << row.path << ": " << admitted.reason;
        EXPECT_THAT(admitted.reason, HasSubstr(row.reason)) << place;
        EXPECT_EQ(admitted.challenges, row.challenges) << place;
    }
}

TEST(Admission, OfAPortWithUsersOnThisHost)
{
    const House house{.users = someUsers(), .token = token};
    expectRows(
        house,
        {
            // the way, before anything else
            {"GET", "/api/logs/driver", {own}, 200},
            {"HEAD", "/api/host", {own}, 200},
            {"GET", "/api/hosts", {own}, 404},
            {"PUT", "/api/host", {own}, 405},
            {"DELETE", "/nowhere", {own}, 405},
            // reading: anybody on this host, but no wrong password
            {"GET", "/api/host", {}, 200},
            {"GET", "/api/host", {own, reader}, 200},
            {"GET", "/api/host", {own, wrong}, 401, "wrong", true},
            {"GET",
             "/api/host",
             {own, wrong, {"Sec-Fetch-Mode", "cors"}, {"Sec-Fetch-Site", "same-origin"}},
             401,
             "wrong"},
            {"GET", "/api/host", {own, {"Authorization", "Basic \xff"}}, 401, "wrong", true},
            {"GET", "/api/host", {own, {"Authorization", "Bearer x"}}, 401, "wrong", true},
            {"GET", "/api/host", {own, length}, 400, "no body"},
            {"GET", "/api/host", {own, {"Content-Length", "0x0"}}, 400, "no number"},
            {"GET", "/api/host", {own, {"Content-Length", ""}}, 400, "no number"},
            // names that lead here
            {"GET", "/api/host", {{"Host", "127.0.0.1:1"}}, 200},
            {"GET", "/api/host", {{"Host", "[::1]:5988"}}, 200},
            {"GET", "/api/host", {{"Host", "LocalHost:5988"}}, 200},
            {"GET", "/api/host", {own, {"Host", "evil.example"}}, 400, "one name"},
            {"GET", "/api/host", {{"Host", "evil.example"}}, 403, "not called evil.example"},
            {"GET", "/api/host", {{"Host", "127.0.0.1.evil.example"}}, 403},
            {"GET", "/api/host", {{"Host", "localhost.evil.example:5988"}}, 403},
            {"GET", "/api/host", {{"Host", "[::1"}}, 200},
            {"GET", "/", {{"Host", "evil.example"}}, 403},
            // pages of other sites
            {"GET", "/api/host", {own, {"Origin", "http://localhost:5988"}}, 200},
            {"GET", "/api/host", {own, {"Origin", "https://localhost:5988"}}, 403, "another site"},
            {"GET", "/api/host", {own, {"Origin", "http://localhost:80"}}, 403, "another site"},
            {"GET", "/api/host", {own, {"Origin", "null"}}, 403, "another site"},
            {"GET", "/api/host", {own, {"Sec-Fetch-Site", "cross-site"}}, 403, "another site"},
            {"GET", "/api/host", {own, {"Sec-Fetch-Site", "same-site"}}, 403, "another site"},
            {"GET", "/api/host", {own, {"Sec-Fetch-Site", "none"}}, 200},
            {"GET", "/", {own, {"Sec-Fetch-Site", "cross-site"}, {"Sec-Fetch-Mode", "navigate"}}, 200},
            {"GET", "/", {own, {"Sec-Fetch-Site", "cross-site"}, {"Sec-Fetch-Mode", "no-cors"}}, 403},
            // changing
            {"POST", "/api/call", {own, joe, withToken, json, length}, 200},
            {"POST", "/api/call", {own, withToken, json, length}, 401, "a user is needed", true},
            {"POST", "/api/call", {own, wrong, withToken, json, length}, 401, "wrong", true},
            {"POST", "/api/call", {own, reader, withToken, json, length}, 403, "rea may only read"},
            {"POST", "/api/call", {own, joe, json, length}, 403, "token"},
            {"POST", "/api/call", {own, joe, {"X-Tavrin-Token", "0"}, json, length}, 403, "token"},
            {"POST",
             "/api/call",
             {own, joe, {"X-Tavrin-Token", "0123456789abcdef0123456789abcdeF"}, json, length},
             403,
             "token"},
            {"POST", "/api/call", {own, joe, withToken, length}, 415, "application/json"},
            {"POST", "/api/call", {own, joe, withToken, {"Content-Type", "text/plain"}, length}, 415},
            {"POST", "/api/call", {own, joe, withToken, json}, 411},
            {"POST", "/api/call", {own, joe, withToken, json, {"Content-Length", "16777217"}}, 413},
            {"POST", "/api/call", {own, joe, withToken, json, length, {"Transfer-Encoding", "chunked"}}, 400, "twice"},
            {"POST", "/api/call", {own, joe, withToken, json, length, {"Content-Length", "3"}}, 400, "twice"},
            {"POST", "/api/call", {own, joe, withToken, json, {"Content-Length", "2, 2"}}, 400, "no number"},
            {"POST", "/api/call", {own, joe, withToken, json, {"Transfer-Encoding", "chunked"}}, 200},
            {"POST", "/api/call", {own, joe, withToken, json, {"Transfer-Encoding", "gzip, chunked"}}, 400, "chunks"},
            {"POST", "/api/call", {own, joe, withToken, json, length, {"Content-Encoding", "gzip"}}, 415, "compressed"},
            {"POST", "/api/call", {own, joe, withToken, json, length, {"Origin", "http://evil.example"}}, 403},
            // programs
            {"POST", "/cimom", {own, joe, cim, length}, 200},
            {"POST", "/cimom", {{"Host", "any.example"}, joe, cim, length}, 200},
            {"POST", "/cimom", {own, reader, cim, length}, 200},
            {"POST", "/cimom", {own, cim, length}, 401, "a user is needed", true},
            {"POST", "/cimom", {own, joe, length}, 400, "CIMOperation"},
            {"POST", "/cimom", {own, joe, cim, {"Origin", "http://localhost:5988"}, length}, 403},
        });
}

TEST(Admission, OfAPortWithoutUsers)
{
    House house{.changesWithoutUsers = true, .token = token};
    expectRows(house, {
                          {"GET", "/api/host", {own}, 200},
                          {"GET", "/api/host", {own, joe}, 200},
                          {"POST", "/api/call", {own, withToken, json, length}, 403, "has no users"},
                          {"POST", "/api/call", {own, joe, withToken, json, length}, 403, "has no users"},
                          {"POST", "/cimom", {own, cim, length}, 200},
                      });
}

TEST(Admission, OfAPortForOtherHosts)
{
    const House house{.users = someUsers(), .scheme = "https", .ofThisHost = false, .token = token};
    const std::pair<std::string, std::string> named{"Host", "fabric.example:5989"};
    expectRows(house, {
                          {"GET", "/", {named}, 200},
                          {"GET", "/api/host", {named}, 401, "a user is needed", true},
                          {"GET", "/api/host", {named, reader}, 200},
                          {"GET", "/api/host", {named, reader, {"Origin", "https://fabric.example:5989"}}, 200},
                          {"GET", "/api/host", {named, reader, {"Origin", "http://fabric.example:5989"}}, 403},
                          {"POST", "/api/call", {named, joe, withToken, json, length}, 200},
                      });
}

TEST(Admission, TellsTheCallerWhatHeMayDo)
{
    House house{.users = someUsers(), .changesWithoutUsers = true, .token = token};
    const auto callerOf = [&](const char* method, const char* path, const httplib::Headers& headers)
    {
        httplib::Request request;
        request.method = method;
        request.path = path;
        request.headers = headers;
        return admit(house, site, request).caller;
    };
    EXPECT_EQ(callerOf("GET", "/api/host", {own, joe}).token, token);
    EXPECT_EQ(callerOf("GET", "/api/host", {own, joe}).user, "joe");
    EXPECT_EQ(callerOf("GET", "/api/host", {own, reader}).token, "");
    EXPECT_FALSE(callerOf("GET", "/api/host", {own, reader}).mayChange);
    EXPECT_EQ(callerOf("GET", "/api/host", {own}).token, "");
    EXPECT_FALSE(callerOf("POST", "/cimom", {own, reader, cim, length}).mayChange);
    EXPECT_TRUE(callerOf("POST", "/cimom", {own, joe, cim, length}).mayChange);
    house.users = {};
    EXPECT_TRUE(callerOf("POST", "/cimom", {own, cim, length}).mayChange);
    EXPECT_FALSE(callerOf("GET", "/api/host", {own}).mayChange);
    house.changesWithoutUsers = false;
    EXPECT_FALSE(callerOf("POST", "/cimom", {own, cim, length}).mayChange);
}

TEST(Admission, TokensAreLongAndNeverTheSame)
{
    std::set<std::string> tokens;
    for (int i = 0; i < 100; i++)
        tokens.insert(makeToken());
    EXPECT_EQ(tokens.size(), 100U);
    EXPECT_THAT(*tokens.begin(), testing::MatchesRegex("[0-9a-f]{32}"));
}

TEST(Admission, KnowsTheAddressesOfThisHost)
{
    for (const char* address : {"localhost", "127.0.0.1", "127.255.0.9", "::1"})
        EXPECT_TRUE(isOfThisHost(address)) << address;
    for (const char* address :
         {"", "0.0.0.0", "128.0.0.1", "::", "127.0.0.1.", "127.1", "LOCALHOST.evil", "10.0.0.127"})
        EXPECT_FALSE(isOfThisHost(address)) << address;
}

/// Whoever measures how long a refusal takes learns no names, whatever the passwords' hashes cost.
TEST(Admission, ANameThatNobodyHasTakesAsLong)
{
    crypt_data room{};
    const std::string costly = crypt_r("secret", "$6$rounds=200000$salt$", &room);
    const Users users = usersOf("a:!locked\njoe:" + costly + "\n");
    const auto timeOf = [&](const std::string& header)
    {
        const std::clock_t begin = std::clock(); // of the processor
        EXPECT_FALSE(users.admit(header));
        return std::clock() - begin;
    };
    const std::clock_t known = timeOf(wrong.second);
    EXPECT_GT(timeOf("Basic amltOnNlY3JldA=="), known / 2);
}

TEST(Admission, WhoTriesManyPasswordsDoesNotFillTheJournal)
{
    RefusedLogins logins;
    const RefusedLogins::Clock::time_point begin = RefusedLogins::Clock::now();
    const auto linesOfTen = [&](int seconds)
    {
        testing::internal::CaptureStderr();
        for (int i = 0; i < 10; i++)
            logins.tell("192.0.2.1", std::string(100000, 'x'), begin + std::chrono::seconds(seconds));
        const std::string lines = testing::internal::GetCapturedStderr();
        EXPECT_LT(lines.size(), 2000U);
        return std::ranges::count(lines, '\n');
    };
    EXPECT_EQ(linesOfTen(0), 10);
    EXPECT_EQ(linesOfTen(59), 0);
    EXPECT_EQ(linesOfTen(61), 1 + 10) << "with how many there were";
    EXPECT_EQ(linesOfTen(200), 10);
}

/// Whatever clients call things: a reference in a reference would double its text with each level.
TEST(Journal, ALineIsShortAndReadsAsNoOther)
{
    broker::Path path{"root/x", "TST_End", {{"Tag", broker::Value::string(std::string(1000, '\\'))}}};
    for (int depth = 0; depth < 64; depth++)
        path = {"root/x", "TST_Joined", {{"End", broker::Value::reference(path)}}};
    const broker::Path other{"", "X: done\njoe deleted Y", {{"a=1,b", broker::Value::uint8(1)}}};
    testing::internal::CaptureStderr();
    tellChange({.user = "joe"}, "deleted", path, "done");
    tellChange({}, "deleted", other, "CIM_ERR_NOT_FOUND");
    RefusedLogins().tell("192.0.2.1", "\" from 192.0.2.9");
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "joe deleted root/x:TST_Joined.End=\"TST_Joined\": done\n"
              "somebody deleted X??done?joe?deleted?Y.a?1?b=1: CIM_ERR_NOT_FOUND\n"
              "login refused from 192.0.2.1 of \"\\\" from 192.0.2.9\"\n");
}

} // namespace
