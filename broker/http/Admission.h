// Which requests reach their route: decided by the head of a request, before its body is read.
#pragma once

#include "broker/http/Site.h"
#include "broker/http/Users.h"

#include <cstdint>
#include <string>

namespace http
{

inline constexpr std::size_t largestBody = 16 << 20; ///< bytes; firmware comes as an array of numbers
inline constexpr std::size_t smallBody = 64 << 10;   ///< as nearly all requests are

/// What a port is to those who come to it.
struct House
{
    Users users = {};
    std::string scheme = "http";
    bool ofThisHost = true;           ///< it listens on an address that other hosts do not reach
    bool changesWithoutUsers = false; ///< of CIM clients, where there are no users
    std::string token = {};
};

/// 200 for a request that is to be answered, or the status that refuses it, with the reason.
struct Admitted
{
    int status = 200;
    std::string reason = {};
    bool challenges = false; ///< the client is to be asked for name and password
    const Route* route = nullptr;
    Caller caller = {};
    std::uint64_t bodyBytes = 0; ///< at the most
};

Admitted admit(const House& house, const Site& site, const httplib::Request& request);

/// localhost and its addresses.
bool isOfThisHost(const std::string& address);
/// 128 random bits in hexadecimal. Throws std::runtime_error where there are none.
std::string makeToken();

} // namespace http
