// The cache's container: a vector of instances searched by key.
#pragma once

#include "runtime/adapter/Provider.h"
#include "runtime/meta/Instance.h"
#include "runtime/threads/Thread.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace cimple
{

/// Owns its instances. Look-up is linear by key_eq; return values, indexes and order are those of a plain vector.
///
/// While all entries and the searched keys are of one class, 32-bit fingerprints of the keys stand before key_eq: a
/// pass over them in a small map, a hash table of them in a large one. A fingerprint only filters: equal keys have
/// equal fingerprints, and what passes is still compared.
///
/// The same of the ends of associations, from when somebody first asks for those of one instance.
///
/// Nobody changes the keys of an entry, nor those of the instances that it refers to.
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

    /// Takes ownership and returns the index, or -1 when equal keys are there: the caller then still owns it, as
    /// when std::bad_alloc is thrown.
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

    /// Inserts copies of what is selected, in the order of the entries, for a reader: they share what they refer to
    /// with the entries, and nobody writes there. Stops at the first that `local` refuses and returns its index.
    std::optional<std::size_t> copy_to(Instance_Map& local, const Selection& selection) const;
    /// Empties the map and gives each entry to `proc` with status 0; its answer is not looked at.
    void give_away(Instance_Handler proc, void* client);

    std::size_t size() const;
    /// The stored instance, not counted; null when out of range.
    Instance* at(std::size_t index) const;
    /// A clone that the caller owns; null when out of range.
    Instance* clone_at(std::size_t index) const;

private:
    using Fingerprint = std::uint32_t;

    /// The ends that the entries have in one of their references.
    struct Role
    {
        const Meta_Reference* reference;
        const Meta_Class* as;            ///< the keys of this class stand for an end; null before the first end
        std::vector<Fingerprint> prints; ///< of as many entries as were there when they were last looked at
        bool reducible;                  ///< every end is of the class `as`
    };
    /// A pass over the fingerprints of a role.
    struct Cursor
    {
        const std::vector<Fingerprint>* prints;
        Fingerprint print;
        std::size_t at;
    };

    std::ptrdiff_t findLocked(const Instance* keys, std::optional<Fingerprint> print) const;
    std::optional<std::uint64_t> hashLocked(const Instance* keys) const;
    std::optional<Fingerprint> fingerprintLocked(const Instance* keys) const;
    Instance* takeLocked(std::size_t index);
    void reserveOneMore();
    void reserveTable();
    void enterLocked(std::size_t index);
    void leaveLocked(std::size_t index);
    void takeAll(std::vector<Instance*>& entries);
    bool reduceEndsLocked(Role& role) const;
    /// One for each role that may refer to `end`; nothing when fingerprints do not tell.
    std::optional<std::vector<Cursor>> cursorsLocked(const Instance* end) const;
    template <class Use> void eachWithEndLocked(const Instance* end, Use use) const;

    mutable Mutex _lock;
    std::vector<Instance*> _entries;
    std::vector<Fingerprint> _prints;      ///< parallel to _entries while _printed
    std::vector<std::uint32_t> _table;     ///< of a large map: index + 1 by fingerprint, 0 is a free place
    const Meta_Class* _keyClass = nullptr; ///< class of all entries while _printed
    bool _printed = true;
    bool _keysRefer = false;          ///< there are references among the keys of _keyClass
    mutable std::vector<Role> _roles; ///< while _printed; empty before somebody asks for ends
};

} // namespace cimple
