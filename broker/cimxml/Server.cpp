#include "broker/cimxml/Server.h"

#include "broker/cimxml/Connection.h"
#include "broker/cimxml/Decode.h"
#include "broker/cimxml/Operations.h"

#include <arpa/inet.h>
#include <atomic>
#include <malloc.h>
#include <semaphore>
#include <stdexcept>
#include <sys/socket.h>
#include <thread>
#include <type_traits>

namespace cimxml
{

namespace
{

constexpr std::size_t largestBody = 16 << 20; ///< bytes; firmware comes as an array of numbers
constexpr std::size_t smallBody = 64 << 10;   ///< as nearly all requests are
constexpr std::ptrdiff_t mostLarge = 4;       ///< larger bodies at once: read, they are many times as large
constexpr std::size_t mostConnections = 256;  ///< each has a thread while it is open
constexpr int mostRequests = 100;             ///< of one connection
constexpr int waitingConnections = 512;       ///< that are not accepted yet

bool isOfThisHost(const std::string& address)
{
    in_addr number{};
    constexpr std::uint32_t loopback = 127; // the first of four bytes
    return address == "localhost" || address == "::1" ||
           (inet_pton(AF_INET, address.c_str(), &number) == 1 && ntohl(number.s_addr) >> 24 == loopback);
}

void expectSafe(const ServerOptions& options)
{
    if (isOfThisHost(options.address))
        return;
    if (options.users.empty() || options.certificate.empty())
        throw std::runtime_error("other hosts are served with users and TLS alone");
}

/// The allocator keeps what a large request or result needed, for each of its arenas anew.
void giveBackMemory(std::size_t bytes)
{
    constexpr std::size_t large = 1 << 20;
    if (bytes > large)
        malloc_trim(0);
}

/// The library's server, of HTTP or HTTPS, on connections that are ours.
template <class Base> class Listening : public Base
{
public:
    template <class... Files>
    explicit Listening(const Connection::Limits& limits, Files... files) : Base(files...), _limits(limits)
    {}

    void widenQueue() { ::listen(this->svr_sock_, waitingConnections); }

private:
    SSL_CTX* tls() const
    {
        if constexpr (std::is_same_v<Base, httplib::SSLServer>)
            return this->ssl_context();
        else
            return nullptr;
    }

    bool process_and_close_socket(socket_t socket) override
    {
        Connection connection(socket, tls(), _limits);
        bool goesOn = connection.shakeHands();
        for (int left = mostRequests; goesOn && left > 0 && connection.awaitRequest(); left--)
        {
            bool closes = false;
            goesOn = this->process_request(connection, left == 1, closes, nullptr);
            goesOn = connection.finishRequest() && goesOn && !closes;
            giveBackMemory(connection.received());
        }
        return goesOn;
    }

    const Connection::Limits _limits;
};

using Plain = Listening<httplib::Server>;
using Secure = Listening<httplib::SSLServer>;

std::unique_ptr<httplib::Server> makeServer(const ServerOptions& options, const Connection::Limits& limits)
{
    if (options.certificate.empty())
        return std::make_unique<Plain>(limits);
    auto server = std::make_unique<Secure>(limits, options.certificate.c_str(), options.key.c_str());
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

/// The body of a request that the library refuses by its head is unread, and would be taken for the next request.
void endBehindError(const httplib::Request&, httplib::Response& response)
{
    response.set_header("Connection", "close");
    Connection::current().endBehindResponse();
}

void setUp(httplib::Server& server)
{
    server.new_task_queue = [] { return new httplib::ThreadPool(mostConnections); };
    server.set_payload_max_length(largestBody);
    server.set_keep_alive_max_count(mostRequests); // clients are told
    server.set_error_handler(httplib::Server::Handler(endBehindError));
    server.set_socket_options(takeNoSharedPort);
}

/// Refuses a request by its head. Its body stays unread.
httplib::Server::HandlerResponse refuse(httplib::Response& response, int status)
{
    response.status = status;
    response.set_header("Connection", "close");
    Connection::current().endBehindResponse();
    return httplib::Server::HandlerResponse::Handled;
}

/// The response, from within the operation. A client of HTTP 1.1 misses the last chunk of one that broke off, any other
/// the end of the document.
bool deliver(broker::Broker& broker, Pulls& pulls, const Message& message, httplib::DataSink& sink)
{
    try
    {
        std::size_t given = 0;
        const auto give = [&](std::string_view part)
        {
            given += part.size();
            return sink.write(part.data(), part.size());
        };
        bool whole = false;
        {
            const Connection::Hurry hurry;
            whole = answer(broker, pulls, message, give);
        }
        giveBackMemory(given);
        if (whole)
            sink.done();
        return whole;
    }
    catch (const std::exception&)
    {
        return false;
    }
}

void answerTo(broker::Broker& broker, Pulls& pulls, const httplib::Request& request, httplib::Response& response)
{
    constexpr char type[] = "application/xml; charset=\"utf-8\"";
    try
    {
        const auto message = std::make_shared<const Message>(request.body);
        const auto provide = [&broker, &pulls, message](std::size_t, httplib::DataSink& sink)
        { return deliver(broker, pulls, *message, sink); };
        response.set_header("CIMOperation", "MethodResponse");
        if (request.version == "HTTP/1.0")
        {
            response.set_content_provider(type, provide);
            Connection::current().endBehindResponse();
        }
        else
            response.set_chunked_content_provider(type, provide);
    }
    catch (const HttpRefusal& refusal)
    {
        response.status = refusal.status;
        response.set_header("CIMError", refusal.header);
    }
}

} // namespace

struct Server::Listener
{
    Listener(broker::Broker& broker, const ServerOptions& options)
        : server(makeServer(options, {options.patience, options.silence, largestBody + smallBody, ending}))
    {
        setUp(*server);
        server->set_pre_routing_handler(
            [this, users = options.users](const httplib::Request& request, httplib::Response& response)
            { return admit(users, request, response); });
        server->Post(".*", [this, &broker](const httplib::Request& request, httplib::Response& response)
                     { answerTo(broker, pulls, request, response); });
        port = options.port == 0                                     ? server->bind_to_any_port(options.address)
               : server->bind_to_port(options.address, options.port) ? options.port
                                                                     : -1;
        if (port < 0)
            throw std::runtime_error("cannot listen on " + options.address + ":" + std::to_string(options.port));
        if (auto* secure = dynamic_cast<Secure*>(server.get()))
            secure->widenQueue();
        else
            dynamic_cast<Plain&>(*server).widenQueue();
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
        ending = true;
        server->stop();
        thread.join();
    }

    /// By its head. Compressed bodies are refused: nobody knows how large they become.
    httplib::Server::HandlerResponse admit(const Users& users, const httplib::Request& request,
                                           httplib::Response& response)
    {
        if (!users.empty() && !users.admit(request.get_header_value("Authorization")))
        {
            response.set_header("WWW-Authenticate", "Basic realm=\"tvrcim\"");
            return refuse(response, 401);
        }
        // A page of another site can have a browser send what needs no header of its own; and browsers name the site.
        if (request.has_header("Origin"))
            return refuse(response, 403);
        if (request.method == "POST" && !request.has_header("CIMOperation"))
            return refuse(response, 400);
        if (request.has_header("Content-Encoding"))
            return refuse(response, 415);
        const bool chunked = request.has_header("Transfer-Encoding"); // then it may become as large as any
        if (request.method == "POST" && !chunked && !request.has_header("Content-Length"))
            return refuse(response, 411);
        const auto length = chunked ? largestBody : request.get_header_value<std::uint64_t>("Content-Length");
        if (length > largestBody)
            return refuse(response, 413);
        if (length > smallBody && !takeSeat())
            return refuse(response, 503);
        return httplib::Server::HandlerResponse::Unhandled;
    }

    bool takeSeat()
    {
        if (!seats.try_acquire())
            return false;
        Connection::current().keep(std::shared_ptr<void>(this, [this](void*) { seats.release(); }));
        return true;
    }

    Pulls pulls;
    std::counting_semaphore<mostLarge> seats{mostLarge}; ///< for large bodies
    std::atomic<bool> ending = false;
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
