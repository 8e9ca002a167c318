#include "broker/http/Journal.h"

#include "broker/host/ReadableText.h"
#include "broker/values/PathText.h"

#include <iostream>
#include <new>

namespace http
{

namespace
{

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
    constexpr std::size_t longestPath = 500, longestResult = 100;
    write((caller.user.empty() ? "somebody" : caller.user) + " " + verb + " " +
          broker::fullPathText(path).substr(0, longestPath) + ": " + result.substr(0, longestResult));
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
    write("login refused of '" + name.substr(0, longestName) + "' from " + address);
}
catch (const std::bad_alloc&)
{}

} // namespace http
