#include "broker/http/Connection.h"

#include <openssl/err.h>
#include <openssl/ssl.h>

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <netdb.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

namespace http
{

namespace
{

using Clock = std::chrono::steady_clock;

constexpr std::size_t largestHead = 64 << 10;
constexpr std::size_t bytesASecond = 16 << 10; ///< a client that is slower uses his patience up
constexpr std::size_t blockBytes = 64 << 10;   ///< from the file of the spool

thread_local Connection* served = nullptr;

Connection::Time timeOf(std::size_t bytes)
{
    return Connection::Time(bytes * 1'000'000 / bytesASecond);
}

void setUp(int socket)
{
    fcntl(socket, F_SETFL, fcntl(socket, F_GETFL) | O_NONBLOCK);
    const int on = 1;
    setsockopt(socket, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
}

void readName(int (*ask)(int, sockaddr*, socklen_t*), int socket, std::string& address, int& port)
{
    sockaddr_storage name{};
    socklen_t length = sizeof name;
    auto* any = reinterpret_cast<sockaddr*>(&name);
    std::array<char, NI_MAXHOST> host{};
    std::array<char, NI_MAXSERV> service{};
    if (ask(socket, any, &length) != 0 || getnameinfo(any, length, host.data(), host.size(), service.data(),
                                                      service.size(), NI_NUMERICHOST | NI_NUMERICSERV) != 0)
        return;
    address = host.data();
    port = std::atoi(service.data());
}

} // namespace

Connection::Connection(socket_t socket, SSL_CTX* tls, const Limits& limits)
    : _socket(socket), _limits(limits), _tls(tls ? SSL_new(tls) : nullptr, SSL_free)
{
    setUp(socket);
    if (_tls)
    {
        SSL_set_fd(_tls.get(), socket);
        SSL_set_mode(_tls.get(), SSL_MODE_ENABLE_PARTIAL_WRITE | SSL_MODE_ACCEPT_MOVING_WRITE_BUFFER);
        SSL_set_options(_tls.get(), SSL_OP_NO_RENEGOTIATION);
    }
    else if (tls)
        _over = _broken = true;
    served = this;
}

Connection::~Connection()
{
    served = nullptr;
    if (_tls && SSL_is_init_finished(_tls.get()))
        SSL_shutdown(_tls.get());
    shutdown(_socket, SHUT_WR);
    discard();
    close(_socket);
}

Connection& Connection::current()
{
    return *served;
}

/// What a client still sends would reset the connection, and take the response from him that is on its way.
void Connection::discard()
{
    Time left = std::chrono::seconds(1);
    const Clock::time_point end = Clock::now() + left;
    while (!_broken && Clock::now() < end && wait(POLLIN, left) &&
           recv(_socket, _buffer.data(), _buffer.size(), MSG_DONTWAIT) > 0)
        ;
}

// --- waiting ---------------------------------------------------------------------------------------------

/// False when the time is over, or the server ends.
bool Connection::wait(short events, Time& left) const
{
    constexpr std::chrono::milliseconds longestSleep(100); // then the end is looked for
    while (left > Time(0) && !_limits.ending)
    {
        const Clock::time_point start = Clock::now();
        pollfd entry{_socket, events, 0};
        const auto sleep = std::min(std::chrono::ceil<std::chrono::milliseconds>(left), longestSleep);
        const int ready = poll(&entry, 1, static_cast<int>(sleep.count()));
        left -= std::chrono::duration_cast<Time>(Clock::now() - start);
        if (ready > 0)
            return true;
    }
    return false;
}

Connection::Step Connection::stepOfTls(int result) const
{
    if (result > 0)
        return {static_cast<std::size_t>(result), 0};
    const int error = SSL_get_error(_tls.get(), result);
    const bool reads = error == SSL_ERROR_WANT_READ, writes = error == SSL_ERROR_WANT_WRITE;
    return {0, static_cast<short>(reads ? POLLIN : writes ? POLLOUT : 0)};
}

Connection::Step Connection::receive(char* bytes, std::size_t size)
{
    if (_tls)
    {
        ERR_clear_error();
        return stepOfTls(SSL_read(_tls.get(), bytes, static_cast<int>(size)));
    }
    const ssize_t got = recv(_socket, bytes, size, MSG_DONTWAIT);
    if (got > 0)
        return {static_cast<std::size_t>(got), 0};
    return {0, static_cast<short>(got < 0 && (errno == EAGAIN || errno == EINTR) ? POLLIN : 0)};
}

Connection::Step Connection::send(std::string_view bytes)
{
    constexpr std::size_t mostAtOnce = 1 << 20;
    bytes = bytes.substr(0, mostAtOnce);
    if (_tls)
    {
        ERR_clear_error();
        return stepOfTls(SSL_write(_tls.get(), bytes.data(), static_cast<int>(bytes.size())));
    }
    const ssize_t sent = ::send(_socket, bytes.data(), bytes.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
    if (sent > 0)
        return {static_cast<std::size_t>(sent), 0};
    return {0, static_cast<short>(sent < 0 && (errno == EAGAIN || errno == EINTR) ? POLLOUT : 0)};
}

// --- requests --------------------------------------------------------------------------------------------

bool Connection::shakeHands()
{
    Time left = _limits.patience;
    while (_tls && !_broken)
    {
        ERR_clear_error();
        const Step step = stepOfTls(SSL_accept(_tls.get()));
        if (step.bytes > 0)
            break;
        _broken = step.awaited == 0 || !wait(step.awaited, left);
    }
    return !_broken;
}

bool Connection::awaitRequest()
{
    if (_over || _broken)
        return false;
    _received = _end - _next;
    _headBytes = 0;
    _lineEnds = 0;
    _receiving = _limits.silence;
    if (_next == _end && !fill())
        return false;
    _receiving = _sending = _limits.patience;
    return true;
}

bool Connection::finishRequest()
{
    _held.clear();
    _broken = _broken || !drain(true);
    return !_broken && !_over;
}

bool Connection::fill()
{
    while (!_over && _received <= _limits.mostBytes)
    {
        const Step step = receive(_buffer.data(), _buffer.size());
        if (step.bytes > 0)
        {
            _next = 0;
            _end = step.bytes;
            _received += step.bytes;
            _receiving = std::min(_receiving + timeOf(step.bytes), _limits.patience);
            return true;
        }
        if (step.awaited == 0 || !wait(step.awaited, _receiving))
            break;
    }
    _over = true;
    return false;
}

/// The head of a request ends with an empty line.
void Connection::followHead(std::string_view bytes)
{
    for (const char c : bytes)
    {
        if (_lineEnds == 2)
            return;
        if (c != '\r')
            _lineEnds = c == '\n' ? _lineEnds + 1 : 0;
        _over = _over || ++_headBytes > largestHead;
    }
}

ssize_t Connection::read(char* bytes, std::size_t size)
{
    if (_over || (_next == _end && !fill()))
        return -1;
    const std::size_t taken = std::min(size, _end - _next);
    std::copy_n(_buffer.data() + _next, taken, bytes);
    followHead({bytes, taken});
    _next += taken;
    return static_cast<ssize_t>(taken);
}

// --- responses -------------------------------------------------------------------------------------------

/// Sends bytes from the head of `bytes`: all of them, or without waiting what the client takes. False where he takes
/// none any more.
bool Connection::give(std::string_view& bytes, bool waits)
{
    while (!bytes.empty())
    {
        const Step step = send(bytes);
        bytes.remove_prefix(step.bytes);
        _sending = std::min(_sending + timeOf(step.bytes), _limits.patience);
        if (step.bytes > 0)
            continue;
        if (step.awaited == 0)
            return false;
        if (!waits)
            return true;
        if (!wait(step.awaited, _sending))
            return false;
    }
    return true;
}

/// The same with what is in the spool.
bool Connection::drain(bool waits)
{
    if (_spool.empty())
        return true;
    const auto block = std::make_unique_for_overwrite<char[]>(blockBytes);
    while (!_spool.empty())
    {
        const std::size_t read = _spool.peek(block.get(), blockBytes);
        std::string_view rest(block.get(), read);
        if (read == 0 || !give(rest, waits))
            return false;
        _spool.drop(read - rest.size());
        if (!rest.empty())
            return true;
    }
    return true;
}

ssize_t Connection::write(const char* bytes, std::size_t size)
{
    std::string_view rest(bytes, size);
    _broken = _broken || !drain(!_hurries);
    if (!_broken && _spool.empty())
        _broken = !give(rest, !_hurries);
    if (!_broken && !rest.empty())
        _broken = !_spool.append(rest);
    return _broken ? -1 : static_cast<ssize_t>(size);
}

void Connection::get_remote_ip_and_port(std::string& address, int& port) const
{
    readName(getpeername, _socket, address, port);
}

void Connection::get_local_ip_and_port(std::string& address, int& port) const
{
    readName(getsockname, _socket, address, port);
}

} // namespace http
