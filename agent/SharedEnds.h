// The ends of associations: one copy of an instance for all associations that refer to it.
#pragma once

#include "runtime/meta/Instance.h"

#include <array>
#include <cstdint>
#include <optional>
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

    /// What `hash()` gives of the keys that an end has as an instance of the class `as`: a number, or false. The run
    /// remembers those of the last ends, since an end stands in several associations.
    template <class Hash>
    static std::optional<std::uint64_t> keyHash(const Instance* end, const Meta_Class* as, Hash hash)
    {
        SharedEnds* run = running();
        if (!run)
            return hash();
        if (const KeyHash& known = run->placeOf(end); known.end.get() == end && known.as == as)
            return known.hash;
        const std::optional<std::uint64_t> made = hash();
        if (made)
            remember(end, as, *made);
        return made;
    }
    /// Of an instance that may become an end, and does not change its keys any more.
    static void remember(const Instance* end, const Meta_Class* as, std::uint64_t hash);

private:
    /// The end is held: another instance at its address would be taken for it.
    struct KeyHash
    {
        Ref<const Instance> end;
        const Meta_Class* as = nullptr;
        std::uint64_t hash = 0;
    };

    static SharedEnds* running();
    KeyHash& placeOf(const Instance* end)
    {
        const auto address = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(end));
        return _keyHashes[address * 0x9E3779B97F4A7C15 >> 58];
    }

    std::unordered_map<const Instance*, Ref<>> _ends; ///< by the instance that each was made of
    std::array<KeyHash, 64> _keyHashes;               ///< by the address of the end
    SharedEnds* const _outer;
};

/// A copy of the instance as it is now, which an association may refer to. Nobody writes to it.
template <class Record> Ref<Record> shared_end(const Record* instance)
{
    return Ref<Record>(static_cast<Record*>(SharedEnds::of(instance).release()));
}

} // namespace cimple
