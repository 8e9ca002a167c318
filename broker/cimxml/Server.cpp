#include "broker/cimxml/Server.h"

#include "broker/cimxml/Decode.h"
#include "broker/cimxml/Operations.h"

#include <httplib.h>

#include <atomic>
#include <stdexcept>
#include <thread>

namespace cimxml
{

namespace
{

constexpr std::size_t largestRequest = 16 << 20; ///< bytes; firmware comes as an array of numbers
constexpr std::size_t mostConnections = 256;     ///< each has a thread while it is open
constexpr int secondsForARequest = 10;           ///< between two parts of it
constexpr int secondsOfSilence = 5;              ///< between two requests

bool isOfThisHost(const std::string& address)
{
    return address == "localhost" || address == "::1" || address.starts_with("127.");
}

void expectSafe(const ServerOptions& options)
{
    if (isOfThisHost(options.address))
        return;
    if (options.users.empty() || options.certificate.empty())
        throw std::runtime_error("other hosts are served with users and TLS alone");
}

std::unique_ptr<httplib::Server> makeServer(const ServerOptions& options)
{
    if (options.certificate.empty())
        return std::make_unique<httplib::Server>();
    auto server = std::make_unique<httplib::SSLServer>(options.certificate.c_str(), options.key.c_str());
    if (!server->is_valid())
        throw std::runtime_error("cannot use the certificate '" + options.certificate + "' with its key");
    return server;
}

/// A port that another process listens on is in use, however it listens; one that a process left can be taken at once.
void takeNoSharedPort(socket_t socket)
{
    const int yes = 1;
    setsockopt(socket, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
}

void limit(httplib::Server& server)
{
    server.new_task_queue = [] { return new httplib::ThreadPool(mostConnections); };
    server.set_payload_max_length(largestRequest);
    server.set_read_timeout(secondsForARequest);
    server.set_write_timeout(secondsForARequest);
    server.set_keep_alive_timeout(secondsOfSilence);
    server.set_socket_options(takeNoSharedPort);
}

void answerTo(broker::Broker& broker, Pulls& pulls, const httplib::Request& request, httplib::Response& response)
{
    try
    {
        response.set_header("CIMOperation", "MethodResponse");
        response.set_content(answer(broker, pulls, request.body), "application/xml; charset=\"utf-8\"");
    }
    catch (const HttpRefusal& refusal)
    {
        response.status = refusal.status;
        response.headers.erase("CIMOperation");
        response.set_header("CIMError", refusal.header);
    }
}

} // namespace

struct Server::Listener
{
    Listener(broker::Broker& broker, const ServerOptions& options) : server(makeServer(options))
    {
        limit(*server);
        server->set_pre_routing_handler(
            [users = options.users](const httplib::Request& request, httplib::Response& response)
            {
                if (users.empty() || users.admit(request.get_header_value("Authorization")))
                    return httplib::Server::HandlerResponse::Unhandled;
                response.status = 401;
                response.set_header("WWW-Authenticate", "Basic realm=\"tvrcim\"");
                return httplib::Server::HandlerResponse::Handled;
            });
        server->Post(".*", [this, &broker](const httplib::Request& request, httplib::Response& response)
                     { answerTo(broker, pulls, request, response); });
        port = options.port == 0                                     ? server->bind_to_any_port(options.address)
               : server->bind_to_port(options.address, options.port) ? options.port
                                                                     : -1;
        if (port < 0)
            throw std::runtime_error("cannot listen on " + options.address + ":" + std::to_string(options.port));
        thread = std::thread(
            [this]
            {
                server->listen_after_bind();
                ended = true;
            });
        while (!server->is_running() && !ended) // before that it cannot be stopped
            std::this_thread::yield();
    }

    ~Listener()
    {
        server->stop();
        thread.join();
    }

    Pulls pulls;
    std::unique_ptr<httplib::Server> server;
    int port = -1;
    std::atomic<bool> ended = false;
    std::thread thread;
};

Server::Server(broker::Broker& broker, const ServerOptions& options)
{
    expectSafe(options);
    _listener = std::make_unique<Listener>(broker, options);
}

Server::~Server() = default;

int Server::port() const
{
    return _listener->port;
}

} // namespace cimxml
