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
    /// The one whom an Authorization header names with his password (RFC 7617). A few passwords are checked at a time,
    /// since that is made to take long; the others wait.
    std::optional<User> admit(std::string_view authorization) const;
    /// The name in the header, of whoever it may be; empty where there is none.
    static std::string nameIn(std::string_view authorization);

private:
    struct Entry
    {
        std::string hash; ///< empty for one who is locked out
        bool mayChange;
    };
    std::map<std::string, Entry, std::less<>> _entries;
    std::string _likeness; ///< a hash that a password can have, of any entry
    bool _readByOthers = false;
};

} // namespace http
