#include "broker/http/Admission.h"

#include "broker/values/PathText.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>
#include <optional>
#include <stdexcept>

#include <openssl/crypto.h>
#include <openssl/rand.h>

namespace http
{

namespace
{

/// What refuses a request.
struct Refusal
{
    int status;
    std::string reason;
    bool challenges = false;
};

bool leadsTo(const Route& route, const std::string& path)
{
    if (route.path.ends_with('*'))
        return path.starts_with(std::string_view(route.path).substr(0, route.path.size() - 1));
    return route.path == path;
}

const Route& routeOf(const Site& site, const httplib::Request& request)
{
    const std::string method = request.method == "HEAD" ? "GET" : request.method;
    bool known = false;
    for (const Route& route : site)
        if (leadsTo(route, request.path))
        {
            if (route.method == method)
                return route;
            known = known || !route.path.ends_with('*');
        }
    if (known || (method != "GET" && method != "POST"))
        throw Refusal{405, request.method + " is not for " + request.path};
    throw Refusal{404, "there is nothing at " + request.path};
}

/// The name before the port; that of an address of IPv6 without its brackets.
std::string nameOf(const std::string& host)
{
    if (host.starts_with('['))
        return host.substr(1, host.find(']') - 1);
    return host.substr(0, host.rfind(':'));
}

/// The script of a browser's page asks, so the page can show who is wanted. A challenge would make the browser ask.
bool isOfScript(const httplib::Request& request)
{
    return request.has_header("Sec-Fetch-Mode") && request.get_header_value("Sec-Fetch-Mode") != "navigate";
}

void expectNoForeignPage(const House& house, const httplib::Request& request)
{
    const std::string host = request.get_header_value("Host");
    if (request.get_header_value_count("Host") > 1)
        throw Refusal{400, "this port has one name"};
    // A foreign name that leads to this host's own address makes this port one with a site of that name.
    if (house.ofThisHost && !host.empty() && !isOfThisHost(nameOf(host)))
        throw Refusal{403, "this port is not called " + host};
    if (request.has_header("Origin") && request.get_header_value("Origin") != house.scheme + "://" + host)
        throw Refusal{403, "this is another site's page"};
    const std::string from = request.get_header_value("Sec-Fetch-Site");
    const bool follows = request.path == "/" && request.get_header_value("Sec-Fetch-Mode") == "navigate";
    if (!from.empty() && from != "same-origin" && from != "none" && !follows)
        throw Refusal{403, "this is another site's page"};
}

Caller callerOf(const House& house, const httplib::Request& request)
{
    if (house.users.empty())
        return {.whyNot = "this port has no users, and lets nobody change anything"};
    if (!request.has_header("Authorization"))
        return {.whyNot = "log in to change anything"};
    const std::optional<User> user = house.users.admit(request.get_header_value("Authorization"));
    if (!user)
        throw Refusal{401, "name or password is wrong", true};
    if (!user->mayChange)
        return {.user = user->name, .whyNot = user->name + " may only read"};
    return {user->name, true, house.token, {}};
}

Caller letIn(const House& house, Entrance entrance, const httplib::Request& request)
{
    if (entrance == Entrance::program)
    {
        Caller caller = callerOf(house, request);
        if (!house.users.empty() && caller.user.empty())
            throw Refusal{401, "a user is needed", true};
        // A page of another site can have a browser send what needs no header of its own; and browsers name the site.
        if (request.has_header("Origin"))
            throw Refusal{403, "browsers have pages of their own here"};
        if (!request.has_header("CIMOperation"))
            throw Refusal{400, "the header CIMOperation is missing"};
        caller.mayChange = caller.mayChange || (house.users.empty() && house.changesWithoutUsers);
        return caller;
    }
    expectNoForeignPage(house, request);
    if (entrance == Entrance::open)
        return {};
    Caller caller = callerOf(house, request);
    if (caller.user.empty() && (entrance == Entrance::changer || !house.ofThisHost) && !house.users.empty())
        throw Refusal{401, "a user is needed", true};
    if (entrance == Entrance::changer)
    {
        if (!caller.mayChange)
            throw Refusal{403, caller.whyNot};
        const std::string token = request.get_header_value(tokenHeader);
        if (token.size() != house.token.size() || CRYPTO_memcmp(token.data(), house.token.data(), token.size()) != 0)
            throw Refusal{403, "the token of the page is missing or old"};
    }
    return caller;
}

/// Compressed bodies are refused: nobody knows how large they become.
std::uint64_t expectBody(const Route& route, const httplib::Request& request)
{
    if (request.has_header("Content-Encoding"))
        throw Refusal{415, "compressed bodies are not read"};
    const std::string coding = request.get_header_value("Transfer-Encoding");
    const bool chunked = !coding.empty(); // then it may become as large as any
    const bool measured = request.has_header("Content-Length");
    if (request.get_header_value_count("Content-Length") > 1 || (chunked && measured))
        throw Refusal{400, "the length is told twice"};
    if (chunked && !broker::sameName(coding, "chunked"))
        throw Refusal{400, "bodies come whole or in chunks"};
    const std::string digits = request.get_header_value("Content-Length");
    if (measured && (digits.empty() || digits.find_first_not_of("0123456789") != digits.npos))
        throw Refusal{400, "the length is no number"};
    const auto length = chunked ? largestBody : request.get_header_value<std::uint64_t>("Content-Length");
    if (route.method == "GET")
        return length == 0 ? 0 : throw Refusal{400, "a question has no body"};
    if (!chunked && !measured)
        throw Refusal{411, "the length is missing"};
    if (length > largestBody)
        throw Refusal{413, "the body is too large"};
    // A form of another site's page is of another type.
    if (route.entrance == Entrance::changer &&
        !request.get_header_value("Content-Type").starts_with("application/json"))
        throw Refusal{415, "the body must be application/json"};
    return length;
}

} // namespace

Admitted admit(const House& house, const Site& site, const httplib::Request& request)
{
    Admitted admitted;
    try
    {
        admitted.route = &routeOf(site, request);
        admitted.caller = letIn(house, admitted.route->entrance, request);
        admitted.bodyBytes = expectBody(*admitted.route, request);
    }
    catch (const Refusal& refusal)
    {
        admitted.status = refusal.status;
        admitted.reason = refusal.reason;
        admitted.challenges = refusal.challenges && !isOfScript(request);
    }
    return admitted;
}

bool isOfThisHost(const std::string& address)
{
    in_addr number{};
    constexpr std::uint32_t loopback = 127; // the first of four bytes
    return broker::sameName(address, "localhost") || address == "::1" ||
           (inet_pton(AF_INET, address.c_str(), &number) == 1 && ntohl(number.s_addr) >> 24 == loopback);
}

std::string makeToken()
{
    std::array<unsigned char, 16> bytes{};
    if (RAND_bytes(bytes.data(), bytes.size()) != 1)
        throw std::runtime_error("there are no random numbers for a token");
    std::string token;
    for (const unsigned char byte : bytes)
    {
        constexpr char digits[] = "0123456789abcdef";
        token += {digits[byte >> 4], digits[byte & 15]};
    }
    return token;
}

} // namespace http
