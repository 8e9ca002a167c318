// A client of the CIM-XML port that writes bytes, whatever they are.
#pragma once

#include <arpa/inet.h>
#include <chrono>
#include <cstddef>
#include <netinet/in.h>
#include <string>
#include <string_view>
#include <sys/socket.h>
#include <sys/time.h>
#include <unistd.h>
#include <utility>

class RawClient
{
public:
    /// `receiveBuffer` is how much waits for this end to read; 0 for what the system gives.
    explicit RawClient(int port, int receiveBuffer = 0) : _socket(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0))
    {
        const timeval longest{60, 0};
        setsockopt(_socket, SOL_SOCKET, SO_RCVTIMEO, &longest, sizeof longest);
        setsockopt(_socket, SOL_SOCKET, SO_SNDTIMEO, &longest, sizeof longest);
        if (receiveBuffer != 0)
            setsockopt(_socket, SOL_SOCKET, SO_RCVBUF, &receiveBuffer, sizeof receiveBuffer);
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_port = htons(static_cast<std::uint16_t>(port));
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        _connected = connect(_socket, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0;
    }
    ~RawClient() { close(_socket); }
    RawClient(RawClient&& other) noexcept
        : _socket(std::exchange(other._socket, -1)), _connected(std::exchange(other._connected, false))
    {}
    RawClient& operator=(RawClient&&) = delete;

    bool connected() const { return _connected; }
    /// False when the server has gone.
    bool send(std::string_view bytes) const
    {
        while (!bytes.empty())
        {
            const ssize_t sent = ::send(_socket, bytes.data(), bytes.size(), MSG_NOSIGNAL);
            if (sent <= 0)
                return false;
            bytes.remove_prefix(static_cast<std::size_t>(sent));
        }
        return true;
    }
    /// Gives `take(bytes)` what comes, to the end of the connection.
    template <class Take> void read(Take take) const
    {
        char buffer[64 << 10];
        for (ssize_t got = 0; (got = recv(_socket, buffer, sizeof buffer, 0)) > 0;)
            take(std::string_view(buffer, static_cast<std::size_t>(got)));
    }
    std::string readAll() const
    {
        std::string all;
        read([&](std::string_view bytes) { all += bytes; });
        return all;
    }

private:
    int _socket;
    bool _connected = false;
};

/// The head of a request on a connection of its own.
inline std::string httpHead(const std::string& fields, const std::string& line = "POST /cimom HTTP/1.1")
{
    return line +
           "\r\nHost: localhost\r\nConnection: close\r\nContent-Type: application/xml; charset=\"utf-8\"\r\n"
           "CIMOperation: MethodCall\r\n" +
           fields + "\r\n";
}

inline std::string httpRequest(const std::string& body)
{
    return httpHead("Content-Length: " + std::to_string(body.size()) + "\r\n") + body;
}

/// The message of an operation of one class.
inline std::string cimMessage(const std::string& operation, const std::string& className)
{
    return R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" )"
           R"(PROTOCOLVERSION="1.0"><SIMPLEREQ><IMETHODCALL NAME=")" +
           operation +
           R"("><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="tavrin"/></LOCALNAMESPACEPATH>)"
           R"(<IPARAMVALUE NAME="ClassName"><CLASSNAME NAME=")" +
           className + R"("/></IPARAMVALUE></IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>)";
}
