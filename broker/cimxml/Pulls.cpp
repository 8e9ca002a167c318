#include "broker/cimxml/Pulls.h"

#include <iterator>
#include <random>
#include <utility>

namespace cimxml
{

namespace
{

constexpr std::size_t mostRests = 64;
constexpr std::size_t mostBytes = 64 << 20;

/// Nobody guesses the context of another client.
std::string newContext(std::uint64_t number)
{
    std::random_device random;
    return std::to_string(number) + "-" + std::to_string(random()) + "-" + std::to_string(random());
}

} // namespace

Collected::~Collected()
{
    const std::lock_guard lock(_pulls._mutex);
    _pulls._bytes -= _bytes;
}

bool Collected::add(std::string element)
{
    const std::size_t bytes = sizeof element + element.size();
    const std::lock_guard lock(_pulls._mutex);
    if (_pulls._bytes + bytes > mostBytes)
        _pulls.forgetOld();
    _tooMuch = _tooMuch || _pulls._bytes + bytes > mostBytes;
    if (_tooMuch)
        return false;
    _elements.push_back(std::move(element));
    _bytes += bytes;
    _pulls._bytes += bytes;
    return true;
}

std::optional<Part> Pulls::open(PulledKind kind, Collected& result, std::size_t most, std::chrono::seconds time)
{
    const std::lock_guard lock(_mutex);
    forgetOld();
    if (result._tooMuch)
        return std::nullopt;
    if (result._elements.size() <= most)
        return Part{{std::move_iterator(result._elements.begin()), std::move_iterator(result._elements.end())}};
    if (_rests.size() >= mostRests)
        return std::nullopt;
    const std::string context = newContext(++_lastNumber);
    Rest& rest = _rests[context] = {kind, std::move(result._elements), std::exchange(result._bytes, 0), time,
                                    Clock::now() + time};
    return take(context, rest, most);
}

std::optional<Part> Pulls::pull(PulledKind kind, const std::string& context, std::size_t most)
{
    const std::lock_guard lock(_mutex);
    forgetOld();
    const auto found = _rests.find(context);
    if (found == _rests.end() || found->second.kind != kind)
        return std::nullopt;
    return take(context, found->second, most);
}

bool Pulls::close(const std::string& context)
{
    const std::lock_guard lock(_mutex);
    forgetOld();
    const auto found = _rests.find(context);
    if (found == _rests.end())
        return false;
    forget(found);
    return true;
}

Part Pulls::take(const std::string& context, Rest& rest, std::size_t most)
{
    Part part;
    for (; part.elements.size() < most && !rest.elements.empty(); rest.elements.pop_front())
        part.elements.push_back(std::move(rest.elements.front()));
    rest.end = Clock::now() + rest.time;
    if (rest.elements.empty())
        forget(_rests.find(context));
    else
        part.context = context;
    return part;
}

void Pulls::forget(std::map<std::string, Rest>::iterator rest)
{
    _bytes -= rest->second.bytes;
    _rests.erase(rest);
}

void Pulls::forgetOld()
{
    for (auto rest = _rests.begin(); rest != _rests.end();)
    {
        const auto next = std::next(rest);
        if (rest->second.end < Clock::now())
            forget(rest);
        rest = next;
    }
}

} // namespace cimxml
