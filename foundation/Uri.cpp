#include "foundation/Uri.h"

#include <algorithm>
#include <charconv>

namespace cimple
{

namespace
{

using View = std::string_view;

/// Where the authority begins: behind "scheme:" and its slashes, or at once where there is no scheme.
std::size_t authorityOf(View uri)
{
    const std::size_t colon = uri.find_first_of(":/?#@");
    if (colon == View::npos || !uri.substr(colon).starts_with(":/"))
        return 0;
    const std::size_t authority = uri.find_first_not_of('/', colon + 1);
    return authority == View::npos ? uri.size() : authority;
}

/// A zero byte would end the text for whoever gets it, and is no part of a name: such an escape stays.
std::string unescaped(View text)
{
    std::string out;
    for (std::size_t i = 0; i < text.size(); ++i)
    {
        unsigned char byte = 0;
        const char* const digits = text.data() + i + 1;
        if (text[i] == '%' && text.size() - i > 2 && std::from_chars(digits, digits + 2, byte, 16).ptr == digits + 2 &&
            byte != 0)
        {
            out += static_cast<char>(byte);
            i += 2;
        }
        else
            out += text[i];
    }
    return out;
}

} // namespace

std::string uriForLog(View uri)
{
    const std::size_t at = uri.rfind('@');
    const std::size_t authority = authorityOf(uri);
    const bool isPath = uri.starts_with('/') && !uri.starts_with("//") && uri.find("://") == View::npos;
    if (at == View::npos || at < authority || isPath)
        return std::string(uri);
    return std::string(uri.substr(0, authority)) + "***" + std::string(uri.substr(at));
}

std::optional<std::string> lastPartOf(View uri)
{
    const std::size_t slash = uri.rfind('/');
    if (slash == View::npos)
        return std::nullopt;
    return std::string(uri.substr(slash + 1));
}

std::string localPathOf(View uri)
{
    for (const View form : {View("file:///"), View("file://localhost/")})
        if (const std::size_t place = uri.find(form); place != View::npos)
            return std::string(uri.substr(place + form.size() - 1));
    return std::string(uri);
}

UriAndLogin takeLogin(View uri)
{
    const std::size_t begin = authorityOf(uri);
    const View authority = uri.substr(begin, uri.find_first_of("/?#", begin) - begin);
    const std::size_t at = authority.rfind('@');
    if (at == View::npos)
        return {std::string(uri), std::nullopt};
    const View user = authority.substr(0, std::min(at, authority.find(':')));
    const View password = authority.substr(user.size(), at - user.size());
    return {std::string(uri.substr(0, begin)) + std::string(uri.substr(begin + at + 1)),
            unescaped(user) + ":" + unescaped(password.substr(password.empty() ? 0 : 1))};
}

} // namespace cimple
