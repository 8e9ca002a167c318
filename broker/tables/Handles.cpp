#include "broker/tables/Handles.h"

#include "broker/core/Core.h"

#include <cstdio>

namespace broker
{

void setStatus(CMPIStatus* rc, CMPIrc code)
{
    if (rc)
        *rc = makeStatus(code);
}

CMPIData nullData(CMPIType type, CMPIValueState state)
{
    CMPIData data{};
    data.type = type;
    data.state = static_cast<CMPIValueState>(CMPI_nullValue | state);
    return data;
}

void reportViolation(const Core* core, const std::string& text)
{
    const Frame* frame = Frame::current();
    const Core* owner = core ? core : frame ? &frame->core : nullptr;
    const std::string where = frame ? frame->what + ": " : "outside of a call: ";
    if (owner)
        owner->violations.add(where + text);
    else
        std::fprintf(stderr, "broker: violation %s%s\n", where.c_str(), text.c_str());
}

Tracked* openTracked(const void* object, bool isOurs, void* hdl, const char* kind, const char* function)
{
    const std::string call = std::string(kind) + "." + function;
    if (!object)
    {
        reportViolation(nullptr, call + " of a null object");
        return nullptr;
    }
    if (!isOurs || !hdl)
    {
        reportViolation(nullptr, call + " of an object that is no " + kind + " of this broker");
        return nullptr;
    }
    auto* tracked = static_cast<Tracked*>(hdl);
    if (!tracked->alive)
    {
        reportViolation(tracked->core,
                        call + (tracked->isClone ? " of a released clone" : " of an object whose request has ended"));
        return nullptr;
    }
    tracked->used.store(true, std::memory_order_relaxed);
    return tracked;
}

Frame* openFrame(const Core& core, const char* function, CMPIStatus* rc)
{
    Frame* frame = Frame::current(core);
    if (!frame)
        reportViolation(&core, std::string(function) + " on a thread that is not attached to the broker");
    setStatus(rc, frame ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
    return frame;
}

void adoptClone(Core& core, std::unique_ptr<Tracked> clone)
{
    clone->isClone = true;
    core.clones.add(clone.get(), std::move(clone));
}

CMPIStatus releaseClone(Tracked* object)
{
    Core& core = *object->core;
    std::unique_ptr<Tracked> clone = core.clones.take(object);
    if (!clone)
    {
        core.violation(std::string(object->kind()) + ".release of an object that is no clone");
        return makeStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    std::vector<std::unique_ptr<Tracked>> dead;
    dead.push_back(std::move(clone));
    core.graveyard.accept(std::move(dead));
    return makeStatus(CMPI_RC_OK);
}

namespace
{

template <class... H> bool isTableOfAny(const void* table)
{
    return (... || isTableOf<H>(table));
}

} // namespace

Tracked* openAny(const void* object)
{
    if (!object)
        return nullptr;
    // Every encapsulated object has a handle and a function table, whatever its kind.
    const auto* members = static_cast<const CMPIString*>(object);
    const bool isOurs =
        isTableOfAny<StringHandle, DateTimeHandle, ArrayHandle, EnumerationHandle, PathHandle, InstanceHandle,
                     ArgsHandle, ContextHandle, SelectExpHandle, ResultHandle>(members->ft);
    return isOurs ? static_cast<Tracked*>(members->hdl) : nullptr;
}

} // namespace broker
