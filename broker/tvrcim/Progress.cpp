#include "broker/tvrcim/Progress.h"

#include <algorithm>
#include <chrono>
#include <utility>

namespace tvrcim
{

Progress::Progress(std::ostream* terminal, std::string what) : Progress(terminal, std::move(what), false) {}

Progress::Progress(std::ostream* out, std::string what, bool lines)
    : _terminal(out), _lines(lines), _what(std::move(what))
{
    if (_terminal)
        _thread = std::thread([this] { _lines ? showInLines() : show(); });
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

void Progress::change(std::string what)
{
    {
        const std::lock_guard lock(_mutex);
        if (_what == what)
            return;
        _what = std::move(what);
        _changed = true;
    }
    _end.notify_one();
}

void Progress::show()
{
    const auto begin = std::chrono::steady_clock::now();
    std::size_t width = 0;
    std::unique_lock lock(_mutex);
    for (unsigned seconds = 1; !_end.wait_until(lock, begin + std::chrono::seconds(seconds), [this] { return _ended; });
         ++seconds)
    {
        const std::string shown = _what + " ... " + std::to_string(seconds) + " s";
        width = std::max(width, shown.size());
        *_terminal << '\r' << shown << std::string(width - shown.size(), ' ') << std::flush;
    }
    if (width != 0)
        *_terminal << '\r' << std::string(width, ' ') << '\r' << std::flush;
}

void Progress::showInLines()
{
    using namespace std::chrono;
    constexpr seconds interval{10};
    const auto begin = steady_clock::now();
    std::unique_lock lock(_mutex);
    do
    {
        const auto elapsed = duration_cast<seconds>(steady_clock::now() - begin).count();
        *_terminal << _what << " ... " << elapsed << " s" << std::endl;
        _changed = false;
        _end.wait_for(lock, interval, [this] { return _ended || _changed; });
    } while (!_ended);
}

} // namespace tvrcim
