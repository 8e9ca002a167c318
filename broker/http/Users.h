// Who may use the port: names with the hashes of their passwords, as crypt(5) has them.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace http
{

struct User
{
    std::string name;
    bool mayChange;
};

class Users
{
public:
    /// Nobody is asked who he is.
    Users() = default;
    /// A file of lines name:hash, as `openssl passwd -6` prints the hash, or name:hash:reader for one who may only
    /// read; empty lines and those that begin with # do not count. Throws std::runtime_error for a file that cannot be
    /// read, that others may write, or that has another line.
    explicit Users(const std::string& file);

    bool empty() const { return _entries.empty(); }
    /// Whether others can try passwords on the hashes, since they may read the file.
    bool readByOthers() const { return _readByOthers; }
    /// The one whom an Authorization header names with his password (RFC 7617).
    std::optional<User> admit(std::string_view authorization) const;

private:
    struct Entry
    {
        std::string hash;
        bool mayChange;
    };
    std::map<std::string, Entry, std::less<>> _entries;
    bool _readByOthers = false;
};

} // namespace http
