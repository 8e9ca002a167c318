#include "broker/tvrcim/Progress.h"

#include <chrono>
#include <utility>

namespace tvrcim
{

Progress::Progress(std::ostream* terminal, std::string what) : _terminal(terminal), _what(std::move(what))
{
    if (_terminal)
        _thread = std::thread([this] { show(); });
}

Progress::~Progress()
{
    if (!_thread.joinable())
        return;
    {
        const std::lock_guard lock(_mutex);
        _ended = true;
    }
    _end.notify_one();
    _thread.join();
}

void Progress::show()
{
    const auto begin = std::chrono::steady_clock::now();
    std::string shown;
    std::unique_lock lock(_mutex);
    for (unsigned seconds = 1; !_end.wait_until(lock, begin + std::chrono::seconds(seconds), [this] { return _ended; });
         ++seconds)
    {
        shown = _what + " ... " + std::to_string(seconds) + " s";
        *_terminal << '\r' << shown << std::flush;
    }
    if (!shown.empty())
        *_terminal << '\r' << std::string(shown.size(), ' ') << '\r' << std::flush;
}

} // namespace tvrcim
