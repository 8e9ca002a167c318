// Who may use the port: names with the hashes of their passwords, as crypt(5) has them.
#pragma once

#include <map>
#include <string>
#include <string_view>

namespace cimxml
{

class Users
{
public:
    /// Nobody is asked who he is.
    Users() = default;
    /// A file of lines name:hash, as `openssl passwd -6` prints the hash; empty lines and those that begin with # do
    /// not count. Throws std::runtime_error for a file that cannot be read, that others may write, or that has another
    /// line.
    explicit Users(const std::string& file);

    bool empty() const { return _hashes.empty(); }
    /// Whether others can try passwords on the hashes, since they may read the file.
    bool readByOthers() const { return _readByOthers; }
    /// Whether an Authorization header names one of them with the password (RFC 7617).
    bool admit(std::string_view authorization) const;

private:
    std::map<std::string, std::string, std::less<>> _hashes;
    bool _readByOthers = false;
};

} // namespace cimxml
