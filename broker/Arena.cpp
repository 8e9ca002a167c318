#include "broker/Arena.h"

#include "broker/Core.h"
#include "broker/Handles.h"

#include <utility>

namespace broker
{

namespace
{

std::vector<Frame*>& threadFrames()
{
    thread_local std::vector<Frame*> frames;
    return frames;
}

} // namespace

void Graveyard::accept(std::vector<std::unique_ptr<Tracked>>&& objects)
{
    for (const auto& object : objects)
    {
        object->bury();
    }
    std::vector<std::unique_ptr<Tracked>> tooOld; // freed outside the lock
    const std::lock_guard lock(_mutex);
    for (auto& object : objects)
    {
        _dead.push_back(std::move(object));
    }
    while (_dead.size() > _capacity)
    {
        tooOld.push_back(std::move(_dead.front()));
        _dead.pop_front();
    }
}

void CloneRegistry::add(std::unique_ptr<Tracked> clone)
{
    const std::lock_guard lock(_mutex);
    Tracked* key = clone.get();
    _clones.emplace(key, std::move(clone));
}

std::unique_ptr<Tracked> CloneRegistry::take(Tracked* clone)
{
    const std::lock_guard lock(_mutex);
    auto node = _clones.extract(clone);
    return node ? std::move(node.mapped()) : nullptr;
}

std::size_t CloneRegistry::count() const
{
    const std::lock_guard lock(_mutex);
    return _clones.size();
}

std::vector<std::unique_ptr<Tracked>> CloneRegistry::takeAll()
{
    const std::lock_guard lock(_mutex);
    std::vector<std::unique_ptr<Tracked>> all;
    for (auto& [key, clone] : std::exchange(_clones, {}))
    {
        all.push_back(std::move(clone));
    }
    return all;
}

Frame::Frame(Core& frameCore, const CMPIBroker* frameBroker, std::string name, std::vector<Property> contextEntries)
    : core(frameCore), broker(frameBroker), what(std::move(name)),
      context(make<ContextHandle>(std::move(contextEntries)))
{}

Frame::~Frame()
{
    core.graveyard.accept(std::move(_objects));
}

Frame* Frame::current()
{
    const std::vector<Frame*>& frames = threadFrames();
    return frames.empty() ? nullptr : frames.back();
}

Frame* Frame::current(const Core& wanted)
{
    Frame* frame = current();
    return frame && &frame->core == &wanted ? frame : nullptr;
}

void Frame::push()
{
    threadFrames().push_back(this);
}

bool Frame::pop()
{
    std::vector<Frame*>& frames = threadFrames();
    if (frames.empty() || frames.back() != this)
    {
        return false;
    }
    frames.pop_back();
    return true;
}

} // namespace broker
