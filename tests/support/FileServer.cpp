#include "tests/support/FileServer.h"

#include "tests/support/Eventually.h"

#include <httplib.h>
#include <openssl/evp.h>
#include <openssl/x509.h>

#include <map>
#include <mutex>
#include <stdexcept>
#include <thread>

namespace test_support
{

namespace
{

/// A key, and a certificate for it by itself.
struct Identity
{
    Identity() : key(EVP_EC_gen("P-256"), &EVP_PKEY_free), certificate(X509_new(), &X509_free)
    {
        ASN1_INTEGER_set(X509_get_serialNumber(certificate.get()), 1);
        X509_gmtime_adj(X509_getm_notBefore(certificate.get()), -3600);
        X509_gmtime_adj(X509_getm_notAfter(certificate.get()), 3600);
        X509_set_pubkey(certificate.get(), key.get());
        X509_NAME* const name = X509_get_subject_name(certificate.get());
        const auto* other = reinterpret_cast<const unsigned char*>("another.example.net");
        X509_NAME_add_entry_by_txt(name, "CN", MBSTRING_ASC, other, -1, -1, 0);
        X509_set_issuer_name(certificate.get(), name);
        X509_sign(certificate.get(), key.get(), EVP_sha256());
    }
    std::unique_ptr<EVP_PKEY, decltype(&EVP_PKEY_free)> key;
    std::unique_ptr<X509, decltype(&X509_free)> certificate;
};

std::unique_ptr<httplib::Server> makeServer(FileServer::Protocol protocol)
{
    if (protocol == FileServer::Protocol::http)
        return std::make_unique<httplib::Server>();
    const Identity self;
    return std::make_unique<httplib::SSLServer>(self.certificate.get(), self.key.get());
}

} // namespace

struct FileServer::Server
{
    explicit Server(Protocol protocol)
        : scheme(protocol == Protocol::http ? "http://" : "https://"), server(makeServer(protocol))
    {
        server->Get("/moved", [](const auto&, httplib::Response& answer) { answer.set_redirect("/fw.grp"); });
        server->Get(".*",
                    [this](const httplib::Request& request, httplib::Response& answer)
                    {
                        work();
                        const std::lock_guard lock(mutex);
                        const auto file = files.find(request.path);
                        answer.status = file == files.end() ? 404 : 200;
                        answer.set_content(file == files.end() ? "<p>not found" : file->second, "application/binary");
                    });
        server->Put(".*",
                    [this](const httplib::Request& request, httplib::Response& answer)
                    {
                        const std::lock_guard lock(mutex);
                        const bool mayPut =
                            request.get_header_value("Authorization") == "Basic am9lOnNlIGNyZXQ="; // joe:se cret
                        answer.status = mayPut ? 201 : 401;
                        if (mayPut)
                            received[request.path] = request.body;
                    });
        port = server->bind_to_any_port("127.0.0.1");
        thread = std::thread([this] { server->listen_after_bind(); });
        if (!eventually([this] { return server->is_running(); }))
            throw std::runtime_error("no server");
    }
    ~Server()
    {
        server->stop();
        thread.join();
    }

    const std::string scheme;
    std::mutex mutex;
    std::map<std::string, std::string> files, received;
    std::function<void()> work = [] {};
    std::unique_ptr<httplib::Server> server;
    int port = 0;
    std::thread thread;
};

FileServer::FileServer(Protocol protocol) : _server(std::make_unique<Server>(protocol)) {}
FileServer::~FileServer() = default;

std::string FileServer::uri(const std::string& path, const std::string& login) const
{
    return _server->scheme + login + "127.0.0.1:" + std::to_string(_server->port) + path;
}

void FileServer::put(const std::string& path, const std::string& content)
{
    const std::lock_guard lock(_server->mutex);
    _server->files[path] = content;
}

void FileServer::whileServing(std::function<void()> work)
{
    _server->work = std::move(work);
}

std::string FileServer::received(const std::string& path) const
{
    const std::lock_guard lock(_server->mutex);
    return _server->received[path];
}

} // namespace test_support
