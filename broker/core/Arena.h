// Life of the objects behind CMPI handles.
//
// Every object is made in a frame: the scope of one call into a provider, or of one attachment of a provider's thread.
// At the frame's end its objects die. A clone belongs to whoever made it until it is released. Dead objects lose their
// content but stay recognisable for a while in the graveyard, so that a late use is reported instead of being
// undefined.
#pragma once

#include "broker/values/Value.h"

#include <atomic>
#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace broker
{

struct Core;
class Frame;

/// Reports a breach, with the call of this thread's frame in front of the text. Without a frame it goes to `core`, and
/// without that to standard error.
void reportViolation(const Core* core, const std::string& text);
/// Version that the function tables of the core's objects have.
int objectVersion(const Core& core);
struct ContextHandle;

/// Base of all objects behind handles.
class Tracked
{
public:
    explicit Tracked(Core& owner) : core(&owner) {}
    Tracked(const Tracked&) = delete;
    Tracked& operator=(const Tracked&) = delete;
    virtual ~Tracked() = default;
    virtual const char* kind() const = 0;
    /// Gives up the content.
    virtual void empty() = 0;

    void bury()
    {
        alive = false;
        empty();
    }

    Core* core;
    std::atomic<bool> alive{true};
    std::atomic<bool> used{true}; ///< since the frame last looked
    bool isClone = false;
};

/// Keeps the last dead objects.
class Graveyard
{
public:
    explicit Graveyard(std::size_t capacity) : _capacity(capacity) {}
    void accept(std::vector<std::unique_ptr<Tracked>>&& objects);

private:
    std::size_t _capacity;
    std::mutex _mutex;
    std::deque<std::unique_ptr<Tracked>> _dead;
};

/// Owns the objects made during one call into a provider or one attachment.
class Frame
{
public:
    /// `broker` is the pointer that the provider was given; `what` names the call in violations.
    Frame(Core& core, const CMPIBroker* broker, std::string what, std::vector<Property> contextEntries);
    Frame(const Frame&) = delete;
    Frame& operator=(const Frame&) = delete;
    ~Frame();

    /// The innermost frame of this thread if it is one of `core`, otherwise null.
    static Frame* current(const Core& core);
    /// The innermost frame of this thread whatever its broker.
    static Frame* current();
    /// Makes this frame the thread's innermost one, and takes it off again (false if it is not the innermost).
    void push();
    bool pop();

    template <class H> H* make(typename H::Content content)
    {
        auto object = std::make_unique<H>(core, std::move(content));
        H* raw = object.get();
        _objects.push_back(std::move(object));
        return raw;
    }

    /// Remembers which objects there are; release() lets the later ones die, with the marks that were set after this
    /// one. It answers how many marks that ended: 0 for what is no mark of this frame.
    const void* mark();
    std::size_t release(const void* mark);
    bool marked() const { return !_marks.empty(); }

    /// The provider has given a result. In a frame that forgets, objects that were made behind the first and that it
    /// leaves alone for a while die.
    void resultGiven();

    Core& core;
    const CMPIBroker* broker;
    std::string what;

private:
    std::vector<std::unique_ptr<Tracked>> _objects;   ///< the first is the context
    std::vector<std::unique_ptr<std::size_t>> _marks; ///< how many objects there were
    Frame* _outer = nullptr;                          ///< of the thread, while this one is within it
    std::size_t _results = 0;
    std::size_t _lasting = 0; ///< how many objects there were at the first result

public:
    ContextHandle* context;
    bool forgets = false;
    bool attached = false;     ///< pushed by attachThread rather than by a call
    bool unmarkedWork = false; ///< an up-call was made while no mark was set
};

/// A frame that is the thread's innermost one for its own life.
class CallFrame : public Frame
{
public:
    CallFrame(Core& core, const CMPIBroker* broker, std::string what, std::vector<Property> contextEntries)
        : Frame(core, broker, std::move(what), std::move(contextEntries))
    {
        push();
    }
    ~CallFrame() { pop(); }
};

} // namespace broker
