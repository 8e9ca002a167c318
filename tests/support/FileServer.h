// A server of files on loopback, by HTTP or HTTPS with a certificate that nobody has signed.
#pragma once

#include <functional>
#include <memory>
#include <string>

namespace test_support
{

class FileServer
{
public:
    enum class Protocol
    {
        http,
        https,
    };

    /// Serves at once, until the end of its life.
    explicit FileServer(Protocol protocol = Protocol::http);
    ~FileServer();
    FileServer(const FileServer&) = delete;
    FileServer& operator=(const FileServer&) = delete;

    /// URI of a path; `login` is "user:password@" or nothing.
    std::string uri(const std::string& path, const std::string& login = "") const;
    /// What a GET of the path gives. All other paths are not found, and "/moved" leads to "/fw.grp".
    void put(const std::string& path, const std::string& content);
    /// Runs inside every GET from now on, on a thread of the server.
    void whileServing(std::function<void()> work);
    /// What came with the last PUT of the path by the user "joe" with the password "se cret"; empty without one.
    std::string received(const std::string& path) const;

private:
    struct Server;
    std::unique_ptr<Server> _server;
};

} // namespace test_support
