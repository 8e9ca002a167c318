// The cache's container: a vector of instances searched by key.
#pragma once

#include "runtime/Instance.h"
#include "runtime/Provider.h"
#include "runtime/Thread.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace cimple
{

/// Owns its instances. Look-up is linear by key_eq; return values, indexes and order are those of a plain vector.
///
/// While all entries and the searched keys are of one class, a pass over 32-bit fingerprints of the keys stands
/// before key_eq, so that an insert into a large map touches four bytes an entry. A fingerprint only filters:
/// equal keys have equal fingerprints, and what passes is still compared.
///
/// A leaf lock guards the structure, so that readers and the threads that fill a map can meet in it. It is never
/// held while calling out. Pointers that lookup() and at() return stay valid until the entry is removed: callers
/// hold the data mutex of the agent.
class Instance_Map
{
public:
    explicit Instance_Map(const Meta_Class* mc = nullptr) : meta_class(mc) {}
    ~Instance_Map();
    Instance_Map(const Instance_Map&) = delete;
    Instance_Map& operator=(const Instance_Map&) = delete;

    /// The class this map is for.
    const Meta_Class* meta_class;

    /// Takes ownership and returns the index, or -1 when equal keys are there: the caller then still owns it.
    std::ptrdiff_t insert(Instance* instance);
    /// Index or -1.
    std::ptrdiff_t find(const Instance* keys) const;
    /// The stored instance, not counted, or null.
    Instance* lookup(const Instance* keys) const;
    /// 0 and a clone that the caller owns, or GET_INSTANCE_NOT_FOUND.
    int get(const Instance* keys, Instance*& out) const;
    /// 0 after storing a clone, or CREATE_INSTANCE_DUPLICATE.
    int create(const Instance* instance);
    /// 0 after copying what the model has non-null, or MODIFY_INSTANCE_NOT_FOUND.
    int modify(const Instance* instance, const Instance* model);
    /// 0 after destroying the entry, or DELETE_INSTANCE_NOT_FOUND.
    int remove(const Instance* keys);
    /// Takes the entry out without destroying it; null when out of range.
    Instance* remove_at(std::size_t index);
    /// Hands a clone of each entry to `proc` with status 0; its answer is not looked at. Returns 0.
    int for_each(Instance_Handler proc, void* client) const;
    void clear();

    std::size_t size() const;
    /// The stored instance, not counted; null when out of range.
    Instance* at(std::size_t index) const;
    /// A clone that the caller owns; null when out of range.
    Instance* clone_at(std::size_t index) const;

private:
    using Fingerprint = std::uint32_t;

    /// Nothing when the instance's keys cannot be reduced safely.
    static std::optional<Fingerprint> fingerprint(const Instance* instance,
                                                  const std::vector<const Meta_Feature*>& keys);
    std::ptrdiff_t findLocked(const Instance* keys, std::optional<Fingerprint> print) const;
    std::optional<Fingerprint> fingerprintLocked(const Instance* keys) const;
    Instance* takeLocked(std::size_t index);

    mutable Mutex _lock;
    Array<Instance*> _entries;
    std::vector<Fingerprint> _prints;              ///< parallel to _entries while _printed
    const Meta_Class* _keyClass = nullptr;         ///< class of all entries while _printed
    std::vector<const Meta_Feature*> _keyFeatures; ///< keys of _keyClass
    bool _printed = true;
};

} // namespace cimple
