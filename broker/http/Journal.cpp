#include "broker/http/Journal.h"

#include "broker/values/OneLine.h"
#include "broker/values/PathText.h"
#include "broker/values/ValueText.h"

#include <cctype>
#include <iostream>
#include <new>
#include <string_view>

namespace http
{

namespace
{

/// A name of the schema; what else a client calls something could be read as another line.
std::string nameText(std::string name)
{
    for (char& c : name)
        if (!std::isalnum(static_cast<unsigned char>(c)) && std::string_view("_/.-").find(c) == std::string_view::npos)
            c = '?';
    return name;
}

/// Of references among the keys the classes alone: their texts double with each level that they are nested.
std::string objectText(broker::Path path)
{
    constexpr std::size_t longest = 500;
    path.nameSpace = nameText(path.nameSpace);
    path.className = nameText(path.className);
    for (broker::Property& key : path.keys)
    {
        key.name = nameText(key.name);
        if (key.value.type() == CMPI_ref && !key.value.isNull())
            key.value = broker::Value::string(key.value.asPath().className);
    }
    return broker::fullPathText(path).substr(0, longest);
}

/// In one piece, so that lines of other threads stand before or behind it.
void write(const std::string& text)
{
    std::cerr << broker::oneLine(text) + "\n";
}

} // namespace

void tellChange(const Caller& caller, const std::string& verb, const broker::Path& path,
                const std::string& result) noexcept
try
{
    constexpr std::size_t longestResult = 100;
    write((caller.user.empty() ? "somebody" : caller.user) + " " + verb + " " + objectText(path) + ": " +
          result.substr(0, longestResult));
}
catch (const std::bad_alloc&)
{}

void tellCall(const Caller& caller, const std::string& method, const broker::Path& path,
              const broker::MethodReply& reply) noexcept
try
{
    tellChange(caller, "called " + method + " on", path,
               reply.ok() ? broker::valueText(reply.returnValue) : broker::statusName(reply.status));
}
catch (const std::bad_alloc&)
{}

void RefusedLogins::tell(const std::string& address, const std::string& name, Clock::time_point now) noexcept
try
{
    constexpr std::chrono::minutes period{1};
    constexpr unsigned mostLines = 10;
    constexpr std::size_t longestName = 64;
    const std::lock_guard lock(_mutex);
    if (now - _begin >= period)
    {
        if (_untold > 0)
            write(std::to_string(_untold) + " more logins were refused");
        _begin = now;
        _told = _untold = 0;
    }
    if (_told >= mostLines)
    {
        _untold++;
        return;
    }
    _told++;
    write("login refused from " + address + " of " + broker::quoteText(name.substr(0, longestName)));
}
catch (const std::bad_alloc&)
{}

} // namespace http
