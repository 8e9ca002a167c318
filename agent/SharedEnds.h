// The ends of associations: one copy of an instance for all associations that refer to it.
#pragma once

#include "runtime/meta/Instance.h"

#include <unordered_map>

namespace cimple
{

/// The ends that one run of the refresh makes: while it lives, shared_end() on its thread gives one copy for equal
/// instances at one address. Later changes of an instance do not show in the ends that were made of it before.
class SharedEnds
{
public:
    SharedEnds();
    ~SharedEnds();
    SharedEnds(const SharedEnds&) = delete;
    SharedEnds& operator=(const SharedEnds&) = delete;

    static Ref<> of(const Instance* instance);

private:
    std::unordered_map<const Instance*, Ref<>> _ends; ///< by the instance that each was made of
    SharedEnds* const _outer;
};

/// A copy of the instance as it is now, which an association may refer to. Nobody writes to it.
template <class Record> Ref<Record> shared_end(const Record* instance)
{
    return Ref<Record>(static_cast<Record*>(SharedEnds::of(instance).release()));
}

} // namespace cimple
