#include "broker/core/Arena.h"

#include "broker/core/Core.h"
#include "broker/tables/Handles.h"

#include <algorithm>
#include <iterator>
#include <utility>

namespace broker
{

namespace
{

/// Without a destructor, which a thread that has run out of memory could not even have registered.
constinit thread_local Frame* innermost = nullptr;

} // namespace

void Graveyard::accept(std::vector<std::unique_ptr<Tracked>>&& objects)
{
    for (const auto& object : objects)
        object->bury();
    std::vector<std::unique_ptr<Tracked>> tooOld; // freed outside the lock
    const std::lock_guard lock(_mutex);
    try
    {
        for (auto& object : objects)
            _dead.push_back(std::move(object));
        while (_dead.size() > _capacity)
        {
            tooOld.push_back(std::move(_dead.front()));
            _dead.pop_front();
        }
    }
    catch (const std::bad_alloc&)
    {
        // Where there is no memory for the dead, they are freed at once.
    }
}

Frame::Frame(Core& frameCore, const CMPIBroker* frameBroker, std::string name, std::vector<Property> contextEntries)
    : core(frameCore), broker(frameBroker), what(std::move(name)),
      context(make<ContextHandle>(std::move(contextEntries)))
{}

Frame::~Frame()
{
    core.graveyard.accept(std::move(_objects));
}

const void* Frame::mark()
{
    return _marks.emplace_back(std::make_unique<std::size_t>(_objects.size())).get();
}

std::size_t Frame::release(const void* mark)
{
    const auto set =
        std::find_if(_marks.begin(), _marks.end(), [&](const auto& candidate) { return candidate.get() == mark; });
    if (set == _marks.end())
        return 0;
    const auto later = _objects.begin() + static_cast<std::ptrdiff_t>(**set);
    std::vector<std::unique_ptr<Tracked>> dead(std::make_move_iterator(later), std::make_move_iterator(_objects.end()));
    _objects.erase(later, _objects.end());
    core.graveyard.accept(std::move(dead));
    const auto ended = static_cast<std::size_t>(_marks.end() - set);
    _marks.erase(set, _marks.end());
    return ended;
}

void Frame::resultGiven()
{
    constexpr std::size_t resultsBetween = 64;
    if (++_results == 1)
        _lasting = _objects.size();
    if (!forgets || marked() || _results % resultsBetween != 0)
        return;
    const auto later = _objects.begin() + static_cast<std::ptrdiff_t>(_lasting);
    const auto isUsed = [](const std::unique_ptr<Tracked>& object) { return object->used.exchange(false); };
    const auto unused = std::stable_partition(later, _objects.end(), isUsed);
    std::vector<std::unique_ptr<Tracked>> dead(std::make_move_iterator(unused),
                                               std::make_move_iterator(_objects.end()));
    _objects.erase(unused, _objects.end());
    core.graveyard.accept(std::move(dead));
}

int objectVersion(const Core& core)
{
    return core.options.personality.objectVersion;
}

Frame* Frame::current()
{
    return innermost;
}

Frame* Frame::current(const Core& wanted)
{
    Frame* frame = current();
    return frame && &frame->core == &wanted ? frame : nullptr;
}

void Frame::push()
{
    _outer = std::exchange(innermost, this);
}

bool Frame::pop()
{
    if (innermost != this)
        return false;
    innermost = _outer;
    return true;
}

} // namespace broker
