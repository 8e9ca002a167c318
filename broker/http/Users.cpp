#include "broker/http/Users.h"

#include "broker/values/PathText.h"

#include <algorithm>
#include <fstream>
#include <memory>
#include <semaphore>
#include <stdexcept>

#include <crypt.h>
#include <openssl/crypto.h>
#include <openssl/evp.h>
#include <sys/stat.h>

namespace http
{

namespace
{

std::optional<std::string> fromBase64(std::string_view text)
{
    if (text.empty() || text.size() % 4 != 0 || text.size() > 4096)
        return std::nullopt;
    std::string bytes(text.size() / 4 * 3, '\0');
    const int size =
        EVP_DecodeBlock(reinterpret_cast<unsigned char*>(bytes.data()),
                        reinterpret_cast<const unsigned char*>(text.data()), static_cast<int>(text.size()));
    if (size < 0)
        return std::nullopt;
    const std::size_t padding = text.ends_with("==") ? 2 : text.ends_with('=') ? 1 : 0;
    bytes.resize(static_cast<std::size_t>(size) - padding);
    return bytes;
}

struct Credentials
{
    std::string name, password;
};

std::optional<Credentials> credentialsIn(std::string_view authorization)
{
    constexpr std::string_view scheme = "Basic ";
    if (authorization.size() < scheme.size() || !broker::sameName(authorization.substr(0, scheme.size()), scheme))
        return std::nullopt;
    const std::optional<std::string> pair = fromBase64(authorization.substr(scheme.size()));
    const std::size_t mark = pair ? pair->find(':') : std::string::npos;
    if (mark == std::string::npos || pair->find('\0') != pair->npos)
        return std::nullopt;
    return Credentials{pair->substr(0, mark), pair->substr(mark + 1)};
}

/// The hosts that are managed here have other work than to check the passwords of those who try many.
constexpr std::ptrdiff_t mostChecks = 4;
std::counting_semaphore<mostChecks> checks{mostChecks};

/// Whether a password can have it; "!" and its like lock a user out.
bool isHash(const std::string& text)
{
    const int judged = crypt_checksalt(text.c_str());
    return judged != CRYPT_SALT_INVALID && judged != CRYPT_SALT_METHOD_DISABLED;
}

bool isHashOf(const std::string& password, const std::string& hash)
{
    checks.acquire();
    const std::unique_ptr<void, void (*)(void*)> seat(&checks, [](void*) { checks.release(); });
    crypt_data room{};
    const char* same = crypt_r(password.c_str(), hash.c_str(), &room);
    return same && *same != '*' && hash.size() == std::string_view(same).size() &&
           CRYPTO_memcmp(same, hash.data(), hash.size()) == 0;
}

} // namespace

Users::Users(const std::string& file)
{
    std::ifstream stream(file);
    struct stat status
    {};
    if (!stream || stat(file.c_str(), &status) != 0 || !S_ISREG(status.st_mode))
        throw std::runtime_error("cannot read the users' file '" + file + "'");
    if (status.st_mode & (S_IWGRP | S_IWOTH))
        throw std::runtime_error("others may write the users' file '" + file + "'");
    _readByOthers = status.st_mode & S_IROTH;
    std::size_t number = 0;
    for (std::string line; std::getline(stream, line);)
    {
        number++;
        if (line.ends_with('\r'))
            line.pop_back();
        if (line.empty() || line.front() == '#')
            continue;
        const std::size_t name = line.find(':'), hash = std::min(line.find(':', name + 1), line.size());
        const std::string_view mark = std::string_view(line).substr(hash);
        if (name == 0 || name == line.npos || name + 1 == hash || !(mark.empty() || mark == ":reader"))
            throw std::runtime_error(file + ":" + std::to_string(number) +
                                     ": a line is written name:hash or name:hash:reader");
        std::string own = line.substr(name + 1, hash - name - 1);
        if (!isHash(own))
            own.clear();
        else if (_likeness.empty())
            _likeness = own;
        _entries[line.substr(0, name)] = {std::move(own), mark.empty()};
    }
    if (_entries.empty())
        throw std::runtime_error("there is no user in '" + file + "'");
}

std::optional<User> Users::admit(std::string_view authorization) const
{
    const std::optional<Credentials> given = credentialsIn(authorization);
    if (!given)
        return std::nullopt;
    // A name that nobody has, or may use, takes as long as others do, where all hashes are made by one method.
    const auto known = _entries.find(given->name);
    const bool isUsable = known != _entries.end() && !known->second.hash.empty();
    const bool same = isHashOf(given->password, isUsable ? known->second.hash : _likeness);
    if (!same || !isUsable)
        return std::nullopt;
    return User{known->first, known->second.mayChange};
}

std::string Users::nameIn(std::string_view authorization)
{
    const std::optional<Credentials> given = credentialsIn(authorization);
    return given ? given->name : std::string();
}

} // namespace http
