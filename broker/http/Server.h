// A port over HTTP or HTTPS, for CIM clients, browsers and programs.
#pragma once

#include "broker/http/Site.h"
#include "broker/http/Users.h"

#include <chrono>
#include <memory>
#include <stdexcept>
#include <string>

namespace http
{

struct ServerOptions
{
    std::string address = "127.0.0.1";
    int port = 5988;              ///< 0 takes a free one
    std::string certificate = {}; ///< file in PEM; empty for HTTP
    std::string key = {};
    Users users = {};
    bool changesWithoutUsers = false;                              ///< of CIM clients, where there are no users
    std::chrono::milliseconds patience = std::chrono::seconds(10); ///< with a client who stands still
    std::chrono::milliseconds silence = std::chrono::seconds(5);   ///< between two requests of a connection
};

/// The address is not one of this host now, or somebody else listens there.
class CannotListen : public std::runtime_error
{
public:
    using std::runtime_error::runtime_error;
};

/// Answers from the time it is made, on threads of its own, until it is destroyed.
class Server
{
public:
    /// Throws CannotListen, and std::runtime_error for what it cannot use, or where it would listen for other hosts
    /// without users and TLS.
    Server(Site site, const ServerOptions& options);
    ~Server();
    Server(const Server&) = delete;
    Server& operator=(const Server&) = delete;

    int port() const;

private:
    struct Listener;
    std::unique_ptr<Listener> _listener;
};

} // namespace http
