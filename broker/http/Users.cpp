#include "broker/http/Users.h"

#include "broker/values/PathText.h"

#include <algorithm>
#include <fstream>
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

bool isHashOf(const std::string& password, const std::string& hash)
{
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
        _entries[line.substr(0, name)] = {line.substr(name + 1, hash - name - 1), mark.empty()};
    }
    if (_entries.empty())
        throw std::runtime_error("there is no user in '" + file + "'");
}

std::optional<User> Users::admit(std::string_view authorization) const
{
    constexpr std::string_view scheme = "Basic ";
    if (authorization.size() < scheme.size() || !broker::sameName(authorization.substr(0, scheme.size()), scheme))
        return std::nullopt;
    const std::optional<std::string> pair = fromBase64(authorization.substr(scheme.size()));
    const std::size_t mark = pair ? pair->find(':') : std::string::npos;
    if (mark == std::string::npos || pair->find('\0') != pair->npos)
        return std::nullopt;
    // A name that nobody has takes as long as one that somebody has.
    static const std::string nobody = "$6$nobody$";
    const auto known = _entries.find(std::string_view(*pair).substr(0, mark));
    const bool same = isHashOf(pair->substr(mark + 1), known == _entries.end() ? nobody : known->second.hash);
    if (!same || known == _entries.end())
        return std::nullopt;
    return User{known->first, known->second.mayChange};
}

} // namespace http
