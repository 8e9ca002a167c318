#include "agent/SharedEnds.h"

#include <utility>

namespace cimple
{

namespace
{

thread_local SharedEnds* current = nullptr;

} // namespace

SharedEnds::SharedEnds() : _outer(std::exchange(current, this)) {}

SharedEnds::~SharedEnds()
{
    current = _outer;
}

SharedEnds* SharedEnds::running()
{
    return current;
}

void SharedEnds::remember(const Instance* end, const Meta_Class* as, std::uint64_t hash)
{
    if (current)
        current->placeOf(end) = {Ref<const Instance>(ref(end)), as, hash};
}

Ref<> SharedEnds::of(const Instance* instance)
{
    if (!current || !instance)
        return Ref<>(clone(instance));
    Ref<>& end = current->_ends[instance];
    if (!end || !identical(end.get(), instance)) // the instance has changed, or another one has its place
        end.reset(clone(instance));
    return end;
}

} // namespace cimple
