// A client's connection, with an end to everything that he could draw out: the head of a request has a size, a request
// and its response a time in which more must move than a trickle. While a provider is at work nothing waits for the
// client: providers work for one client at a time, and the others would wait with them.
#pragma once

#include "broker/http/Spool.h"

#include <httplib.h>

#include <array>
#include <atomic>
#include <chrono>
#include <memory>

namespace http
{

class Connection : public httplib::Stream
{
public:
    using Time = std::chrono::microseconds;
    struct Limits
    {
        Time patience;         ///< that a client may stand still within one request, and again within its response
        Time silence;          ///< between two requests
        std::size_t mostBytes; ///< of a request, from its first line to the end of its body
        const std::atomic<bool>& ending;
    };

    /// Owns the socket. `tls` is null for none.
    Connection(socket_t socket, SSL_CTX* tls, const Limits& limits);
    ~Connection() override;
    Connection(const Connection&) = delete;
    Connection& operator=(const Connection&) = delete;

    /// The one that this thread serves.
    static Connection& current();

    /// False when the client does not keep to TLS.
    bool shakeHands();
    /// False when none comes.
    bool awaitRequest();
    std::size_t received() const { return _received; } ///< bytes of this request
    /// Sends what the client has not taken. False when there will be no other request.
    bool finishRequest();

    /// There is no other request behind this one, whose body stays unread.
    void endBehindResponse() { _over = true; }
    /// Keeps something until the end of the request.
    void keep(std::shared_ptr<void> held) { _held.push_back(std::move(held)); }

    /// While it lives, what the client does not take at once is kept for later.
    class Hurry
    {
    public:
        Hurry() { current()._hurries = true; }
        ~Hurry() { current()._hurries = false; }
        Hurry(const Hurry&) = delete;
        Hurry& operator=(const Hurry&) = delete;
    };

    bool is_readable() const override { return !_over; }
    bool is_writable() const override { return !_broken; }
    ssize_t read(char* bytes, std::size_t size) override;
    ssize_t write(const char* bytes, std::size_t size) override;
    void get_remote_ip_and_port(std::string& address, int& port) const override;
    void get_local_ip_and_port(std::string& address, int& port) const override;
    socket_t socket() const override { return _socket; }

private:
    /// What came of an attempt: bytes, or what to wait for, or neither at the end.
    struct Step
    {
        std::size_t bytes = 0;
        short awaited = 0;
    };
    Step stepOfTls(int result) const;
    Step receive(char* bytes, std::size_t size);
    Step send(std::string_view bytes);
    bool wait(short events, Time& left) const;
    bool fill();
    void followHead(std::string_view bytes);
    bool give(std::string_view& bytes, bool waits);
    bool drain(bool waits);
    void discard();

    socket_t _socket;
    Limits _limits;
    std::unique_ptr<SSL, void (*)(SSL*)> _tls;
    std::array<char, 16 << 10> _buffer;
    std::size_t _next = 0, _end = 0; ///< in the buffer
    std::size_t _received = 0;       ///< of this request
    std::size_t _headBytes = 0;
    int _lineEnds = 0;               ///< one behind the other; two end the head
    Time _receiving{0}, _sending{0}; ///< left of the client's time
    Spool _spool;
    std::vector<std::shared_ptr<void>> _held;
    bool _hurries = false;
    bool _over = false;   ///< nothing more is read
    bool _broken = false; ///< nor written
};

} // namespace http
