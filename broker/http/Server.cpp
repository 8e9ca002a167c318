#include "broker/http/Server.h"

#include "broker/http/Admission.h"
#include "broker/http/Connection.h"
#include "broker/http/Journal.h"
#include "broker/http/Memory.h"
#include "broker/http/Workers.h"
#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <atomic>
#include <cerrno>
#include <poll.h>
#include <semaphore>
#include <stdexcept>
#include <sys/socket.h>
#include <thread>
#include <type_traits>
#include <unistd.h>

namespace http
{

namespace
{

constexpr std::ptrdiff_t mostLarge = 4;      ///< larger bodies at once: read, they are many times as large
constexpr std::size_t mostConnections = 256; ///< each has a thread while it is open
constexpr std::ptrdiff_t mostAsking = 224;   ///< the rest tell clients so where a library of the hardware hangs
constexpr int mostRequests = 100;            ///< of one connection
constexpr int waitingConnections = 512;      ///< that are not accepted yet

void expectSafe(const ServerOptions& options)
{
    if (isOfThisHost(options.address))
        return;
    if (options.users.empty() || options.certificate.empty())
        throw std::runtime_error("other hosts are served with users and TLS alone");
}

/// The request that a thread serves.
struct Served
{
    Admitted found = {};
    bool isAnswered = false; ///< by its route, and not by the library
};

/// Of this thread. A pointer, for what has a destructor costs a thread memory that there may not be.
constinit thread_local Served* served = nullptr;

/// The library's server, of HTTP or HTTPS, on connections that are ours.
template <class Base> class Listening : public Base
{
public:
    template <class... Files>
    explicit Listening(const Connection::Limits& limits, Files... files) : Base(files...), _limits(limits)
    {}

    /// Serves what comes until the end is set.
    void serve(Workers& workers)
    {
        ::listen(this->svr_sock_, waitingConnections);
        while (!_limits.ending)
            if (const socket_t socket = workers.full() ? (pause(), -1) : accept(); socket >= 0)
                serve(workers, socket);
        close(this->svr_sock_.exchange(INVALID_SOCKET));
    }

private:
    static constexpr int longestSleep = 100; ///< milliseconds, behind which the end is looked for

    /// A client whom no thread or memory is left for is sent away.
    void serve(Workers& workers, socket_t socket)
    {
        try
        {
            if (workers.give([this, socket] { process_and_close_socket(socket); }))
                return;
        }
        catch (const std::bad_alloc&)
        {}
        close(socket);
    }

    static void pause() { poll(nullptr, 0, longestSleep); }

    /// -1 for none. Neither a client who has gone nor a host that has run out of descriptors or memory ends the port.
    socket_t accept() const
    {
        pollfd entry{this->svr_sock_, POLLIN, 0};
        if (poll(&entry, 1, longestSleep) <= 0)
            return -1;
        const socket_t socket = accept4(this->svr_sock_, nullptr, nullptr, SOCK_CLOEXEC);
        if (socket < 0 && errno != ECONNABORTED && errno != EINTR)
            pause();
        return socket;
    }

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
            Served now;
            served = &now;
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

/// The body of a request that is refused by its head is unread, and would be taken for the next request.
void closeBehind(httplib::Response& response)
{
    if (!response.has_header("Connection"))
        response.set_header("Connection", "close");
    Connection::current().endBehindResponse();
}

void tell(httplib::Response& response, int status, const std::string& reason)
{
    response.status = status;
    // No lists of JSON: they want memory even when they are freed, and there may be none.
    response.set_content(R"({"error":{"kind":"refused","text":)" + broker::jsonText(reason) + "}}", "application/json");
}

/// What the library refuses by itself: a head that it cannot read, or a body, of which the rest is still to come.
void endBehindError(const httplib::Request&, httplib::Response& response)
{
    if (served->isAnswered)
        return;
    constexpr int addressTooLong = 414;
    if (response.body.empty())
        tell(response, response.status,
             response.status == addressTooLong ? "the address is too long" : "this is no request that is understood");
    closeBehind(response);
}

void endBehindException(const httplib::Request&, httplib::Response& response, std::exception_ptr)
{
    tell(response, 500, "the answer could not be made");
}

/// What a browser may make of an answer: a page has scripts, styles and pictures of this port alone, asks it alone, and
/// stands in no page of another.
httplib::Headers answersOfThisPort()
{
    return {{"Content-Security-Policy",
             "default-src 'none'; script-src 'self'; style-src 'self'; img-src 'self'; connect-src 'self'; "
             "base-uri 'none'; form-action 'none'; frame-ancestors 'none'"},
            {"X-Content-Type-Options", "nosniff"},
            {"Referrer-Policy", "no-referrer"},
            {"Cross-Origin-Resource-Policy", "same-origin"},
            {"Cross-Origin-Opener-Policy", "same-origin"}};
}

void setUp(httplib::Server& server)
{
    server.set_default_headers(answersOfThisPort());
    server.set_payload_max_length(largestBody);
    server.set_keep_alive_max_count(mostRequests); // clients are told
    server.set_error_handler(httplib::Server::Handler(endBehindError));
    server.set_exception_handler(endBehindException);
    server.set_socket_options(takeNoSharedPort);
}

} // namespace

struct Server::Listener
{
    Listener(Site routes, const ServerOptions& options)
        : site(std::move(routes)), house{.users = options.users,
                                         .scheme = options.certificate.empty() ? "http" : "https",
                                         .ofThisHost = isOfThisHost(options.address),
                                         .changesWithoutUsers = options.changesWithoutUsers,
                                         .token = makeToken()},
          patience(options.patience),
          server(makeServer(options, {options.patience, options.silence, largestBody + smallBody, ending}))
    {
        setUp(*server);
        server->set_pre_routing_handler([this](const httplib::Request& request, httplib::Response& response)
                                        { return receive(request, response); });
        const auto answer = [](const httplib::Request& request, httplib::Response& response)
        {
            served->isAnswered = true;
            served->found.route->answer(request, response, served->found.caller);
        };
        constexpr const char* anyPath = "[^]*"; // line ends too
        server->Get(anyPath, answer);
        server->Post(anyPath, answer);
        port = options.port == 0                                     ? server->bind_to_any_port(options.address)
               : server->bind_to_port(options.address, options.port) ? options.port
                                                                     : -1;
        if (port < 0)
            throw CannotListen("cannot listen on " + options.address + ":" + std::to_string(options.port));
        thread = std::thread(
            [this]
            {
                if (auto* secure = dynamic_cast<Secure*>(server.get()))
                    secure->serve(workers);
                else
                    dynamic_cast<Plain&>(*server).serve(workers);
            });
    }

    ~Listener()
    {
        ending = true;
        thread.join();
    }

    /// The head of a request.
    httplib::Server::HandlerResponse receive(const httplib::Request& request, httplib::Response& response)
    {
        // Answers are given whole: the library would give as many parts as are asked for, each as large as the whole.
        const_cast<httplib::Request&>(request).ranges.clear();
        Admitted& found = served->found;
        found = admit(house, site, request);
        if (const std::string login = request.get_header_value("Authorization"); found.status == 401 && !login.empty())
            refusedLogins.tell(request.remote_addr, Users::nameIn(login));
        const std::string isBusy = found.status == 200 ? takeSeats(found) : std::string();
        if (found.status == 200 && isBusy.empty())
            return httplib::Server::HandlerResponse::Unhandled;
        if (found.challenges)
            response.set_header("WWW-Authenticate", "Basic realm=\"tvrcim\"");
        found.route = nullptr;
        if (found.status == 200)
            tell(response, 503, isBusy);
        else
            tell(response, found.status, found.reason);
        closeBehind(response);
        return httplib::Server::HandlerResponse::Handled;
    }

    /// Until the request has its response. Tells who is in the way where there is no seat.
    std::string takeSeats(const Admitted& found)
    {
        if (found.bodyBytes > smallBody && !keep(large, large.try_acquire()))
            return "other large requests are being read";
        if (found.route->entrance != Entrance::open && !keep(asking, asking.try_acquire_for(patience / 2)))
            return "too many others wait for the provider";
        return {};
    }

    template <class Seats> static bool keep(Seats& seats, bool isTaken)
    {
        if (isTaken)
            Connection::current().keep(std::shared_ptr<void>(&seats, [&seats](void*) { seats.release(); }));
        return isTaken;
    }

    const Site site;
    const House house;
    const Connection::Time patience;
    RefusedLogins refusedLogins;
    std::counting_semaphore<mostLarge> large{mostLarge};    ///< for large bodies
    std::counting_semaphore<mostAsking> asking{mostAsking}; ///< for who asks the provider
    std::atomic<bool> ending = false;
    std::unique_ptr<httplib::Server> server;
    int port = -1;
    Workers workers{mostConnections};
    std::thread thread;
};

Server::Server(Site site, const ServerOptions& options)
{
    expectSafe(options);
    _listener = std::make_unique<Listener>(std::move(site), options);
}

Server::~Server() = default;

int Server::port() const
{
    return _listener->port;
}

} // namespace http
