// The tool as a server on a free port of this host, and wbemcli as its client.
#pragma once

#include "tests/system/Tool.h"

#include <filesystem>
#include <string>
#include <vector>

namespace system_test
{

/// A folder of the test's own.
class Folder
{
public:
    Folder();
    ~Folder();
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;

    std::string file(const std::string& name) const { return _path / name; }
    /// Makes a certificate for 127.0.0.1, signed by itself, with its key: `name`.pem and `name`.key.
    void makeCertificate(const std::string& name) const;
    /// Makes a file that only its owner reads, as `openssl passwd` writes the hash: of a user, and of "reader" with the
    /// same password, who may only read.
    std::string makeUsers(const std::string& user, const std::string& password) const;

private:
    std::filesystem::path _path;
};

class Serving
{
public:
    /// On a free port of this host, unless the options say where.
    explicit Serving(const std::vector<std::string>& options = {}, const std::vector<std::string>& toolOptions = {});

    /// What wbemcli says in all calls that name no user: who it is, as "name:password@", and options.
    void introduce(const std::string& user, const std::string& options);
    /// `operation` with its options, `path` as it stands behind the port of wbemcli's object path.
    Answer wbemcli(const std::string& operation, const std::string& path, const std::string& arguments = "") const;
    Answer wbemcliAs(const std::string& user, const std::string& operation, const std::string& path,
                     const std::string& arguments = "") const;
    const std::string& url() const { return _url; } ///< scheme://127.0.0.1:port
    std::string port() const { return _url.substr(_url.rfind(':') + 1); }
    /// A path that the server gave, without its host.
    static std::string withoutHost(const std::string& line) { return line.substr(line.find('/')); }
    long memory() const { return _tool.memory(); } ///< KiB
    pid_t process() const { return _tool.process(); }
    int end();

private:
    Running _tool;
    std::string _url;
    std::string _user;
    std::string _clientOptions;
};

} // namespace system_test
