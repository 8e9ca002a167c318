// Results that clients take in parts (DSP0200 5.4.2.24): what is left of each, between two requests.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

namespace cimxml
{

/// What the elements of a result are; it is to be pulled as such.
enum class PulledKind
{
    instances,
    paths,
};

/// A part of a result.
struct Part
{
    std::vector<std::string> elements = {};
    std::string context = {}; ///< by which the rest is asked for; empty behind the end
};

class Pulls;

/// A result that is being collected. It counts among what is kept from its first element on.
class Collected
{
public:
    explicit Collected(Pulls& pulls) : _pulls(pulls) {}
    ~Collected();
    Collected(const Collected&) = delete;
    Collected& operator=(const Collected&) = delete;

    /// False, from then on too, if too much is kept already.
    bool add(std::string element);

private:
    friend class Pulls;
    Pulls& _pulls;
    std::deque<std::string> _elements;
    std::size_t _bytes = 0;
    bool _tooMuch = false;
};

/// May be called from many threads at once. A result that nobody asks for is given up when its time is over.
class Pulls
{
public:
    using Clock = std::chrono::steady_clock;

    /// Keeps a result but for its first `most` elements, which are given. Nothing if too much is kept already.
    std::optional<Part> open(PulledKind kind, Collected& result, std::size_t most, std::chrono::seconds time);
    /// Nothing for a context that is not known, or of the other kind.
    std::optional<Part> pull(PulledKind kind, const std::string& context, std::size_t most);
    /// False for a context that is not known.
    bool close(const std::string& context);

private:
    friend class Collected;
    struct Rest
    {
        PulledKind kind;
        std::deque<std::string> elements;
        std::size_t bytes; ///< of all its elements, until the last is taken
        std::chrono::seconds time;
        Clock::time_point end;
    };
    Part take(const std::string& context, Rest& rest, std::size_t most);
    void forget(std::map<std::string, Rest>::iterator rest);
    void forgetOld();

    std::mutex _mutex;
    std::map<std::string, Rest> _rests;
    std::size_t _bytes = 0;
    std::uint64_t _lastNumber = 0;
};

} // namespace cimxml
