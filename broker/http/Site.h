// What a port serves: sites beside one another, each a list of routes.
#pragma once

#include <httplib.h>

#include <functional>
#include <string>
#include <vector>

namespace http
{

/// What must be true of a request before its route is asked.
enum class Entrance
{
    program, ///< a CIM client's: a user where there are users, and a header that no page of another site can send
    open,    ///< anybody's: files that say nothing of the host
    reader,  ///< who reads: anybody on a port of this host's own address, else a user
    changer, ///< who changes something: a user who may, with the token that only a page of this port gets to know
};

/// Who asks.
struct Caller
{
    std::string user = {}; ///< empty for nobody
    bool mayChange = false;
    std::string token = {};  ///< that changes are asked for with; empty for who may not change
    std::string whyNot = {}; ///< he may not change anything, for people
};

struct Route
{
    using Answer = std::function<void(const httplib::Request&, httplib::Response&, const Caller&)>;

    std::string method; ///< "GET", of which HEAD is a part, or "POST"
    std::string path;   ///< the whole path; one that ends in * has all that begin with what is before it
    Entrance entrance;
    Answer answer;
};
using Site = std::vector<Route>;

/// The header that carries the token.
inline constexpr const char* tokenHeader = "X-Tavrin-Token";

} // namespace http
