#include "broker/cimxml/Pulls.h"

#include <algorithm>
#include <numeric>
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

std::optional<Part> Pulls::open(PulledKind kind, std::vector<std::string> elements, std::size_t most,
                                std::chrono::seconds time)
{
    const std::size_t bytes =
        std::accumulate(elements.begin(), elements.end(), std::size_t{0},
                        [](std::size_t sum, const std::string& element) { return sum + element.size(); });
    if (elements.size() <= most)
        return Part{std::move(elements)};
    const std::lock_guard lock(_mutex);
    forgetOld();
    if (_rests.size() >= mostRests || _bytes + bytes > mostBytes)
        return std::nullopt;
    const std::string context = newContext(++_lastNumber);
    _bytes += bytes;
    Rest& rest = _rests[context] = {kind,
                                    {std::move_iterator(elements.begin()), std::move_iterator(elements.end())},
                                    bytes,
                                    time,
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
