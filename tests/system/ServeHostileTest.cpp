// The port and clients that mean it no good: each is answered or closed, the others are served, and memory has an end.
#include "tests/support/Eventually.h"
#include "tests/support/RawClient.h"
#include "tests/support/Sanitized.h"
#include "tests/system/Tool.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <thread>
#include <vector>

#include <unistd.h>

using namespace system_test;
using namespace std::chrono_literals;
using testing::AllOf;
using testing::AnyOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace
{

using Clock = std::chrono::steady_clock;

constexpr char volumes[] = "TVRHBA_StorageVolume";
constexpr long memoryFactor = TVR_SANITIZED ? 20 : 1; ///< a sanitizer keeps what is freed
constexpr char lastChunk[] = "</CIM>\r\n0\r\n\r\n";

/// A server that loses its patience after a second, on a host of 4,096 units.
class Port
{
public:
    explicit Port(const std::string& scenario = TVR_SCENARIOS "/large.json")
        : _tool({"--scenario", scenario.c_str(), "serve", "--listen", "127.0.0.1:0", "--patience", "1"})
    {
        const std::string line = _tool.readLine();
        _port = std::atoi(line.substr(line.rfind(':') + 1).c_str());
    }
    int number() const { return _port; }
    std::string answer(const std::string& bytes) const
    {
        const RawClient client(_port);
        client.send(bytes);
        return client.readAll();
    }
    std::string ask(const std::string& operation, const std::string& className) const
    {
        return answer(httpRequest(cimMessage(operation, className)));
    }
    void expectService() const
    {
        EXPECT_THAT(ask("EnumerateInstanceNames", "TVRHBA_Card"), HasSubstr("<INSTANCENAME"));
    }
    long megabytes() const { return _tool.memory() / 1024; }

    /// Sockets that it has open.
    std::size_t sockets() const
    {
        std::size_t count = 0;
        for (const auto& entry :
             std::filesystem::directory_iterator("/proc/" + std::to_string(_tool.process()) + "/fd"))
        {
            std::error_code gone;
            count += std::filesystem::read_symlink(entry, gone).native().starts_with("socket:") ? 1 : 0;
        }
        return count;
    }

private:
    Running _tool;
    int _port = 0;
};

std::string times(std::size_t count, const std::string& text)
{
    std::string all;
    for (std::size_t i = 0; i < count; i++)
        all += text;
    return all;
}

TEST(ServeHostile, WhatIsNoRequestIsAnsweredOrClosed)
{
    const Port port;
    const std::string good = cimMessage("EnumerateInstanceNames", "TVRHBA_Card");
    const auto with = [&](const std::string& from, const std::string& to)
    {
        std::string text = good;
        return httpRequest(text.replace(text.find(from), from.size(), to));
    };
    const std::string bomb = R"(<!DOCTYPE lolz [<!ENTITY a "aaaaaaaaaa"><!ENTITY b "&a;&a;&a;&a;&a;&a;&a;&a;&a;">)"
                             R"(<!ENTITY c SYSTEM "file:///etc/passwd">]>)";
    const auto chunked = [](const std::string& chunks) { return httpHead("Transfer-Encoding: chunked\r\n") + chunks; };
    const struct
    {
        std::string request;
        std::vector<std::string> answer; ///< all of it is there; nothing for a connection that is closed
    } rows[] = {
        {httpRequest(""), {"HTTP/1.1 400", "CIMError: request-not-well-formed"}},
        {httpRequest("<CIM><MESSAGE></CIM>"), {"HTTP/1.1 400", "CIMError: request-not-well-formed"}},
        {httpRequest(good.substr(0, good.size() / 2)), {"HTTP/1.1 400", "CIMError: request-not-well-formed"}},
        {httpRequest("<A/>"), {"HTTP/1.1 400", "CIMError: request-not-valid"}},
        {httpRequest(std::string(100000, '\0')), {"HTTP/1.1 400"}},
        {httpRequest(times(1000000, "<A>")), {"HTTP/1.1 400"}},
        {httpRequest(times(100000, "<A>") + times(100000, "</A>")), {"HTTP/1.1 400"}},
        {httpRequest("<CIM>" + times(1000000, "<A/>") + "</CIM>"), {"HTTP/1.1 501"}},
        {with("EnumerateInstanceNames", "Explode"), {"HTTP/1.1 200", "<ERROR CODE=\"7\""}},
        {with("<CIM", bomb + "<CIM"), {"HTTP/1.1 200", "<INSTANCENAME"}},
        {with("TVRHBA_Card", "&b;&c;"), {"<ERROR CODE=\"5\""}},
        {with("TVRHBA_Card", "\xFF\xC0\x80\xED\xA0\x80"), {"<ERROR CODE=\"5\"", "'??"}},
        {with("TVRHBA_Card", std::string(1 << 20, 'x')), {"<ERROR CODE=\"5\""}},
        {httpHead("", "GET /nothing HTTP/1.1"), {"HTTP/1.1 404"}},
        {httpHead("Content-Length: 17000000\r\n"), {"HTTP/1.1 413"}},
        {httpHead("Content-Length: 99999999999999999999\r\n"), {"HTTP/1.1 413"}},
        {httpHead("Content-Length: 20\r\nContent-Encoding: gzip\r\n") + std::string(20, 'x'), {"HTTP/1.1 415"}},
        {httpHead("Origin: http://other.example\r\nContent-Length: 0\r\n"), {"HTTP/1.1 403"}},
        {"POST / HTTP/1.1\r\nContent-Length: " + std::to_string(good.size()) + "\r\n\r\n" + good, {"HTTP/1.1 400"}},
        {httpHead(""), {"HTTP/1.1 411"}},
        {chunked("FFFFFFFFFFFFFFFF\r\nx"), {}},
        {chunked("x\r\nx"), {}},
        {"POST /" + std::string(1 << 20, 'x'), {}},
        {"POST / HTTP/1.1\r\n" + times(100000, "A: b\r\n"), {}},
        {std::string(100000, '\xFF'), {}},
    };
    for (const auto& row : rows)
    {
        const std::string answer = port.answer(row.request);
        const std::string shown = row.request.substr(0, 300);
        for (const std::string& part : row.answer)
            EXPECT_THAT(answer, HasSubstr(part)) << shown;
        if (row.answer.empty())
        {
            EXPECT_THAT(answer, AnyOf(IsEmpty(), StartsWith("HTTP/1.1 4"))) << shown;
        }
        EXPECT_THAT(answer, Not(HasSubstr("root:"))) << shown;
    }
    port.expectService();
    EXPECT_LT(port.megabytes(), 300 * memoryFactor);
}

/// What is refused by its head leaves its body unread, which is no request of its own.
TEST(ServeHostile, BodiesOfRefusedRequestsAreNotObeyed)
{
    const Port port;
    std::string inner = httpRequest(cimMessage("EnumerateInstanceNames", "TVRHBA_Card"));
    const std::string length = "Content-Length: " + std::to_string(inner.size()) + "\r\n\r\n" + inner;
    const std::string heads[] = {"POST /" + std::string(20000, 'a') + " HTTP/1.1\r\n", "NONE / HTTP/1.1\r\n",
                                 "GET / HTTP/1.1\r\n", "OPTIONS / HTTP/1.1\r\n",
                                 "POST / HTTP/1.1\r\nRange: bytes=x\r\n"};
    for (const std::string& head : heads)
    {
        const std::string answer = port.answer(head + "Host: localhost\r\n" + length);
        EXPECT_THAT(answer, StartsWith("HTTP/1.1 4")) << head.substr(0, 40);
        EXPECT_THAT(answer, Not(HasSubstr("<INSTANCENAME"))) << head.substr(0, 40);
    }
    port.expectService();
}

/// A body that the library gives up on half way is followed by no other request.
TEST(ServeHostile, BehindABodyThatCannotBeReadNothingIsObeyed)
{
    const Port port;
    const std::string next = "GET /metrics HTTP/1.1\r\nHost: localhost\r\n\r\n";
    const std::string answer = port.answer("POST /cimom HTTP/1.1\r\nHost: localhost\r\nCIMOperation: MethodCall\r\n"
                                           "Transfer-Encoding: chunked\r\n\r\n2\r\n{}\r\n0\r\n" +
                                           next + next);
    EXPECT_THAT(answer, StartsWith("HTTP/1.1 400"));
    EXPECT_THAT(answer, HasSubstr("no request that is understood"));
    EXPECT_THAT(answer, Not(HasSubstr("tavrin_fc_up")));
}

/// Many ranges of one answer would be many times the answer.
TEST(ServeHostile, AnswersAreGivenOnceAndWhole)
{
    const Port port;
    std::string ranges = "bytes=0-";
    for (int i = 0; i < 1000; i++)
        ranges += ",0-";
    const std::string answer = port.answer(httpHead("Range: " + ranges + "\r\n", "GET /metrics HTTP/1.1"));
    EXPECT_THAT(answer, StartsWith("HTTP/1.1 200"));
    EXPECT_LT(answer.size(), 200'000U);
}

TEST(ServeHostile, BodiesAreAsLongAsTheySay)
{
    const Port port;
    const std::string good = cimMessage("EnumerateInstanceNames", "TVRHBA_Card");
    const auto saying = [&](std::size_t length)
    { return httpHead("Content-Length: " + std::to_string(length) + "\r\n") + good; };
    EXPECT_THAT(port.answer(saying(good.size() / 2)), StartsWith("HTTP/1.1 400"));
    const Clock::time_point start = Clock::now();
    EXPECT_THAT(port.answer(saying(good.size() + 1)), AnyOf(IsEmpty(), StartsWith("HTTP/1.1 4")));
    EXPECT_LT(Clock::now() - start, 15s);
    port.expectService();
}

/// Large bodies are read a few at a time; whoever comes meanwhile with another is told so.
TEST(ServeHostile, LargeBodiesWaitNowhere)
{
    const Port port;
    const auto refusesOneOfFive = [&]
    {
        std::vector<RawClient> clients;
        for (int i = 0; i < 5; i++)
        {
            clients.emplace_back(port.number());
            clients.back().send(httpHead("Content-Length: 1000000\r\n") + "<");
        }
        port.expectService();
        return std::ranges::count_if(clients, [](const RawClient& client)
                                     { return client.readAll().starts_with("HTTP/1.1 503"); }) == 1;
    };
    EXPECT_TRUE(test_support::eventually(refusesOneOfFive)); // all five came before one was given up
    EXPECT_THAT(port.answer(httpRequest(std::string(1000000, ' '))), StartsWith("HTTP/1.1 400"));
}

TEST(ServeHostile, WhoTricklesIsClosedWhileOthersAreServed)
{
    const Port port;
    const std::string request = httpRequest(cimMessage("EnumerateInstanceNames", "TVRHBA_Card"));
    std::vector<RawClient> clients;
    for (int i = 0; i < 20; i++)
        clients.emplace_back(port.number());
    const Clock::time_point start = Clock::now();
    std::size_t open = clients.size();
    for (std::size_t at = 0; at < request.size() && open > 0 && Clock::now() - start < 10s; at++)
    {
        open = static_cast<std::size_t>(std::ranges::count_if(clients, [&](const RawClient& client)
                                                              { return client.send(request.substr(at, 1)); }));
        port.expectService();
        std::this_thread::sleep_for(100ms); // the client's own pace
    }
    EXPECT_EQ(open, 0u);
    EXPECT_LT(Clock::now() - start, 8s);
}

TEST(ServeHostile, TwoHundredAtOnceAreAnswered)
{
    const Port port;
    port.expectService();
    std::vector<RawClient> clients;
    for (int i = 0; i < 200; i++)
        clients.emplace_back(port.number());
    for (const RawClient& client : clients)
        EXPECT_TRUE(client.send(httpRequest(cimMessage("EnumerateInstanceNames", "TVRHBA_FCPort"))));
    for (const RawClient& client : clients)
        EXPECT_THAT(client.readAll(), EndsWith(lastChunk));
}

/// Requests that nobody answers do not take the whole port: the page is there, and who asks is told.
TEST(ServeHostile, AHungLibraryLeavesThePortAlive)
{
    const std::string scenario = testing::TempDir() + "hung-" + std::to_string(getpid()) + ".json";
    std::ofstream(scenario) << R"({"targets": [{"name": "t", "wwpn": "5006000000000001"}], "adapters": [{"name": "a",
        "ports": [{"wwpn": "1000000000000001", "targets": ["t"]}]}],
        "faults": [{"function": "HBA_GetFcpTargetMapping", "delayMs": 600000}]})";
    const Port port(scenario);
    std::filesystem::remove(scenario);
    std::vector<RawClient> stuck;
    for (int i = 0; i < 300; i++)
    {
        stuck.emplace_back(port.number());
        stuck.back().send(httpHead("", "GET /api/classes/TVRHBA_StorageVolume/instances HTTP/1.1"));
    }
    EXPECT_THAT(port.answer(httpHead("", "GET / HTTP/1.1")), StartsWith("HTTP/1.1 200"));
    EXPECT_THAT(port.answer(httpHead("", "GET /api/session HTTP/1.1")),
                AllOf(StartsWith("HTTP/1.1 503"), HasSubstr("too many others")));
}

/// The class's provider works for one client at a time, so it must not wait for any.
TEST(ServeHostile, WhoDoesNotReadHoldsNobodyUp)
{
    const Port port;
    constexpr int clients = TVR_SANITIZED ? 1 : 4; // of each kind
    EXPECT_TRUE(port.ask("EnumerateInstances", volumes).ends_with(lastChunk));
    const long before = port.megabytes();
    EXPECT_TRUE(test_support::eventually([&] { return port.sockets() <= 1; }));
    const std::size_t listening = port.sockets();
    const std::string request = httpRequest(cimMessage("EnumerateInstances", volumes));
    std::vector<RawClient> idle;
    for (int i = 0; i < clients; i++)
    {
        idle.emplace_back(port.number(), 4096);
        idle.back().send(request);
    }
    for (int i = 0; i < clients; i++)
    {
        const RawClient leaving(port.number(), 4096);
        leaving.send(request);
    }
    const Clock::time_point start = Clock::now();
    EXPECT_TRUE(port.ask("EnumerateInstances", volumes).ends_with(lastChunk));
    EXPECT_LT(Clock::now() - start, TVR_SANITIZED ? 60s : 15s);
    EXPECT_LT(port.megabytes() - before, 100 * memoryFactor);
    EXPECT_TRUE(test_support::eventually([&] { return port.sockets() == listening; }));
    for (const RawClient& client : idle)
        EXPECT_FALSE(client.readAll().ends_with(lastChunk)); // given up, and he can tell
    port.expectService();
}

/// One that reads slowly, but does read, gets it all.
TEST(ServeHostile, WhoReadsLateGetsTheWhole)
{
    const Port port;
    const std::string whole = port.ask("EnumerateInstances", volumes);
    const RawClient client(port.number(), 4096);
    client.send(httpRequest(cimMessage("EnumerateInstances", volumes)));
    std::this_thread::sleep_for(500ms); // the client's own pace
    const auto body = [](std::string text)
    {
        std::string joined;
        for (std::size_t at = text.find("\r\n\r\n") + 4, size = 0;
             at < text.size() && (size = std::stoul(text.substr(at, 16), nullptr, 16)) != 0;)
        {
            const std::size_t data = text.find("\r\n", at) + 2;
            joined += text.substr(data, size);
            at = data + size + 2;
        }
        return joined;
    };
    EXPECT_TRUE(body(client.readAll()) == body(whole));
    const std::string message = cimMessage("EnumerateInstances", volumes);
    const std::string length = std::to_string(message.size());
    EXPECT_TRUE(
        port.answer("POST / HTTP/1.0\r\nCIMOperation: MethodCall\r\nContent-Length: " + length + "\r\n\r\n" + message)
            .ends_with("</CIM>"));
}

} // namespace
