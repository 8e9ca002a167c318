#include "agent/Instance_Map.h"

#include "agent/SharedEnds.h"
#include "runtime/meta/InstanceSlots.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <utility>

namespace cimple
{

namespace
{

/// Multiplies and folds, sixteen bytes at a time.
std::uint64_t mix(std::uint64_t hash, std::uint64_t low, std::uint64_t high = 0)
{
    const auto product = static_cast<unsigned __int128>(hash ^ low ^ 0x9E3779B97F4A7C15ULL) *
                         static_cast<unsigned __int128>(high ^ 0xD6E8FEB86659FD93ULL);
    return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
}

std::uint64_t wordAt(const unsigned char* bytes)
{
    std::uint64_t word;
    std::memcpy(&word, bytes, sizeof word);
    return word;
}

std::uint64_t hashBytes(std::uint64_t hash, const void* data, std::size_t size)
{
    const auto* bytes = static_cast<const unsigned char*>(data);
    const unsigned char* const end = bytes + size;
    for (; end - bytes > 16; bytes += 16)
        hash = mix(hash, wordAt(bytes), wordAt(bytes + 8));
    if (size >= 16) // the last ones, some of them again
        return mix(hash ^ size, wordAt(end - 16), wordAt(end - 8));
    if (size >= 8)
        return mix(hash ^ size, wordAt(bytes), wordAt(end - 8));
    std::uint64_t tail = 0;
    std::memcpy(&tail, bytes, size);
    return mix(hash ^ size, tail);
}

/// Adds a property to the hash. Reals add nothing: their equality is not that of their bytes.
std::uint64_t hashProperty(std::uint64_t hash, const Instance* instance, const Meta_Property* property)
{
    if (property->subscript != 0 || property->type == REAL32 || property->type == REAL64)
        return hash;
    if (null_byte(instance, property))
        return mix(hash, 1);
    if (property->type == STRING)
    {
        const auto& text = slot<String>(instance, property->offset);
        return hashBytes(hash, text.c_str(), text.size());
    }
    if (property->type == DATETIME)
        return mix(hash, slot<Datetime>(instance, property->offset).usec());
    return hashBytes(hash, &slot<char>(instance, property->offset), type_width(property->type));
}

/// The first class of the chain that has all keys of `mc`, which are properties: what refers to an instance by one of
/// its superclasses, and the instance's own map, have one hash of them.
const Meta_Class* ownerOfKeys(const Meta_Class* mc)
{
    while (mc->super_meta_class && mc->super_meta_class->num_keys == mc->num_keys)
        mc = mc->super_meta_class;
    return mc;
}

/// Adds the keys of `as`, which is the instance's class or one of its superclasses.
bool hashKeys(std::uint64_t& hash, const Instance* instance, const Meta_Class* as);

/// Of these keys alone; nothing when they cannot be reduced safely.
std::optional<std::uint64_t> hashOf(const Instance* instance, const Meta_Class* as)
{
    std::uint64_t hash = 0x243F6A8885A308D3ULL;
    if (!is_subclass(as, instance->__meta_class) || !hashKeys(hash, instance, as))
        return std::nullopt;
    return hash;
}

bool hashKey(std::uint64_t& hash, const Instance* instance, const Meta_Feature* key)
{
    if (const Meta_Property* property = as_property(key))
    {
        hash = hashProperty(hash, instance, property);
        return true;
    }
    if (slot_kind(key) != Slot_Kind::reference)
        return true; // arrays of references take no part in key equality
    const auto* reference = static_cast<const Meta_Reference*>(key);
    const Instance* end = reference_slot(instance, reference);
    if (!end)
    {
        hash = mix(hash, 2);
        return true;
    }
    // Ends of different subclasses can be equal, so only what all of them have is looked at.
    const Meta_Class* as = ownerOfKeys(reference->meta_class);
    const auto keys = SharedEnds::keyHash(end, as, [&] { return hashOf(end, as); });
    hash = mix(hash, keys.value_or(0));
    return keys.has_value();
}

bool hashKeys(std::uint64_t& hash, const Instance* instance, const Meta_Class* as)
{
    return all_keys(as, [&](std::size_t index) { return hashKey(hash, instance, features_of(as)[index]); });
}

std::optional<std::uint32_t> folded(std::optional<std::uint64_t> hash)
{
    if (!hash)
        return std::nullopt;
    return static_cast<std::uint32_t>(*hash ^ (*hash >> 32));
}

/// 32 bits of the instance's keys, those of `as` alone; nothing when they cannot be reduced safely.
std::optional<std::uint32_t> reduce(const Instance* instance, const Meta_Class* as)
{
    return folded(hashOf(instance, as));
}

bool refersByKeys(const Meta_Class* mc)
{
    return !all_keys(mc, [mc](std::size_t index) { return !as_reference(features_of(mc)[index]); });
}

/// From so many entries on a map has a table: up to there a pass over the fingerprints is as fast.
constexpr std::size_t tableFrom = 64;

/// Index of the first element from `from` on that equals `print`, or `size`.
std::size_t scan(const std::uint32_t* prints, std::size_t from, std::size_t size, std::uint32_t print)
{
    constexpr std::size_t block = 32;
    std::size_t i = from;
    for (; i + block <= size; i += block)
    {
        std::uint32_t hit = 0;
        for (std::size_t j = 0; j < block; j++) // no branch in here: the compiler makes vector compares of it
            hit |= prints[i + j] == print ? ~0u : 0u;
        if (hit)
            break;
    }
    while (i < size && prints[i] != print)
        i++;
    return i;
}

} // namespace

Instance_Map::~Instance_Map()
{
    clear();
}

std::optional<std::uint64_t> Instance_Map::hashLocked(const Instance* keys) const
{
    if (!_printed || keys->__meta_class != _keyClass)
        return std::nullopt;
    return hashOf(keys, _keyClass);
}

std::optional<Instance_Map::Fingerprint> Instance_Map::fingerprintLocked(const Instance* keys) const
{
    return folded(hashLocked(keys));
}

std::ptrdiff_t Instance_Map::findLocked(const Instance* keys, std::optional<Fingerprint> print) const
{
    const std::size_t size = _entries.size();
    if (!print)
    {
        for (std::size_t i = 0; i < size; i++)
            if (key_eq(keys, _entries[i]))
                return static_cast<std::ptrdiff_t>(i);
        return -1;
    }
    if (!_table.empty())
    {
        for (std::size_t place = *print & (_table.size() - 1); _table[place]; place = (place + 1) & (_table.size() - 1))
            if (const std::size_t i = _table[place] - 1; _prints[i] == *print && key_eq(keys, _entries[i]))
                return static_cast<std::ptrdiff_t>(i);
        return -1;
    }
    for (std::size_t i = scan(_prints.data(), 0, size, *print); i < size; i = scan(_prints.data(), i + 1, size, *print))
        if (key_eq(keys, _entries[i]))
            return static_cast<std::ptrdiff_t>(i);
    return -1;
}

std::ptrdiff_t Instance_Map::insert(Instance* instance)
{
    if (!instance)
        return -1;
    Auto_Mutex lock(_lock);
    if (_entries.empty())
    {
        _printed = true;
        _keyClass = instance->__meta_class;
        _keysRefer = refersByKeys(_keyClass);
        _roles.clear();
        _table.clear();
    }
    const std::optional<std::uint64_t> hash = hashLocked(instance);
    const std::optional<Fingerprint> print = folded(hash);
    if (findLocked(instance, print) != -1)
        return -1;

    const std::size_t index = _entries.size();
    reserveOneMore(); // all that may throw: until here the instance is the caller's
    _entries.push_back(instance);
    if (print)
    {
        _prints.push_back(*print);
        if (!_table.empty())
            enterLocked(index);
        if (!_keysRefer)
            SharedEnds::remember(instance, ownerOfKeys(_keyClass), *hash);
    }
    else
    {
        _printed = false; // an entry of another class: compare all from here on
        _prints.clear();
        _table.clear();
    }
    return static_cast<std::ptrdiff_t>(index);
}

void Instance_Map::reserveOneMore()
{
    constexpr std::size_t first = 8;
    if (_entries.size() == _entries.capacity())
        _entries.reserve(std::max(first, 2 * _entries.size()));
    if (_printed && _prints.size() == _prints.capacity())
        _prints.reserve(std::max(first, 2 * _prints.size()));
    if (_printed && _entries.size() >= tableFrom)
        reserveTable();
}

// --- the table: linear probing, half empty at least ------------------------------------------------------

void Instance_Map::reserveTable()
{
    if (2 * (_entries.size() + 1) <= _table.size())
        return;
    std::vector<std::uint32_t> larger(std::bit_ceil(4 * _entries.size()), 0);
    _table.swap(larger);
    for (std::size_t i = 0; i < _prints.size(); i++)
        enterLocked(i);
}

void Instance_Map::enterLocked(std::size_t index)
{
    const std::size_t mask = _table.size() - 1;
    std::size_t place = _prints[index] & mask;
    while (_table[place])
        place = (place + 1) & mask;
    _table[place] = static_cast<std::uint32_t>(index + 1);
}

/// Takes the entry out, and those behind it move up by one. `_prints` still has it.
void Instance_Map::leaveLocked(std::size_t index)
{
    const std::size_t mask = _table.size() - 1;
    std::size_t hole = _prints[index] & mask;
    while (_table[hole] != index + 1)
        hole = (hole + 1) & mask;
    for (std::size_t place = (hole + 1) & mask; _table[place]; place = (place + 1) & mask)
    {
        const std::size_t home = _prints[_table[place] - 1] & mask;
        if (((place - home) & mask) < ((place - hole) & mask))
            continue; // its search does not come through the hole
        _table[hole] = _table[place];
        hole = place;
    }
    _table[hole] = 0;
    if (index + 1 < _prints.size())
        for (std::uint32_t& entry : _table)
            entry -= entry > index + 1 ? 1u : 0u;
}

std::ptrdiff_t Instance_Map::find(const Instance* keys) const
{
    if (!keys)
        return -1;
    Auto_Mutex lock(_lock);
    return findLocked(keys, fingerprintLocked(keys));
}

Instance* Instance_Map::lookup(const Instance* keys) const
{
    if (!keys)
        return nullptr;
    Auto_Mutex lock(_lock);
    const std::ptrdiff_t index = findLocked(keys, fingerprintLocked(keys));
    return index == -1 ? nullptr : _entries[static_cast<std::size_t>(index)];
}

int Instance_Map::get(const Instance* keys, Instance*& out) const
{
    if (!keys)
        return GET_INSTANCE_NOT_FOUND;
    Auto_Mutex lock(_lock);
    const std::ptrdiff_t index = findLocked(keys, fingerprintLocked(keys));
    if (index == -1)
        return GET_INSTANCE_NOT_FOUND;
    out = clone(_entries[static_cast<std::size_t>(index)]);
    return 0;
}

int Instance_Map::create(const Instance* instance)
{
    Ref<> copied(clone(instance));
    if (insert(copied.get()) == -1)
        return CREATE_INSTANCE_DUPLICATE;
    copied.release();
    return 0;
}

int Instance_Map::modify(const Instance* instance, const Instance* model)
{
    if (!instance)
        return MODIFY_INSTANCE_NOT_FOUND;
    Auto_Mutex lock(_lock);
    const std::ptrdiff_t index = findLocked(instance, fingerprintLocked(instance));
    if (index == -1)
        return MODIFY_INSTANCE_NOT_FOUND;
    _roles.clear(); // what it refers to may change
    copy(_entries[static_cast<std::size_t>(index)], instance, model);
    return 0;
}

int Instance_Map::remove(const Instance* keys)
{
    if (!keys)
        return DELETE_INSTANCE_NOT_FOUND;
    Auto_Mutex lock(_lock);
    const std::ptrdiff_t index = findLocked(keys, fingerprintLocked(keys));
    if (index == -1)
        return DELETE_INSTANCE_NOT_FOUND;
    Ref<> gone(takeLocked(static_cast<std::size_t>(index)));
    lock.unlock();
    return 0;
}

Instance* Instance_Map::remove_at(std::size_t index)
{
    Auto_Mutex lock(_lock);
    return index < _entries.size() ? takeLocked(index) : nullptr;
}

Instance* Instance_Map::takeLocked(std::size_t index)
{
    Instance* instance = _entries[index];
    _entries.erase(_entries.begin() + static_cast<std::ptrdiff_t>(index));
    if (!_table.empty())
        leaveLocked(index);
    if (_printed)
        _prints.erase(_prints.begin() + static_cast<std::ptrdiff_t>(index));
    for (Role& role : _roles)
        if (index < role.prints.size())
            role.prints.erase(role.prints.begin() + static_cast<std::ptrdiff_t>(index));
    return instance;
}

int Instance_Map::for_each(Instance_Handler proc, void* client) const
{
    for (std::size_t i = 0; Instance* copied = clone_at(i); i++)
        proc(copied, 0, client);
    return 0;
}

// --- selections -------------------------------------------------------------------------------------------

bool Instance_Map::reduceEndsLocked(Role& role) const
{
    const Meta_Class* declared = role.reference->meta_class;
    for (std::size_t i = role.prints.size(); role.reducible && i < _entries.size(); i++)
    {
        const Instance* end = reference_slot(_entries[i], role.reference);
        if (end && !role.as)
            role.as = declared->num_keys != 0 ? declared : end->__meta_class;
        const auto print = !end                                      ? Fingerprint{}
                           : is_subclass(role.as, end->__meta_class) ? reduce(end, role.as)
                                                                     : std::optional<Fingerprint>();
        role.reducible = print.has_value();
        if (print)
            role.prints.push_back(*print);
    }
    return role.reducible;
}

std::optional<std::vector<Instance_Map::Cursor>> Instance_Map::cursorsLocked(const Instance* end) const
{
    if (!_printed)
        return std::nullopt;
    if (_roles.empty())
    {
        std::vector<Role> all; // where memory runs out on the way, the next search begins anew
        for (const Meta_Feature* mf : features_of(_keyClass))
            if (const Meta_Reference* reference = as_single_reference(mf))
                all.push_back({reference, nullptr, {}, true});
        _roles = std::move(all);
    }
    std::vector<Cursor> cursors;
    for (Role& role : _roles)
    {
        if (!is_subclass(role.reference->meta_class, end->__meta_class))
            continue; // it never refers to such an instance
        if (!reduceEndsLocked(role))
            return std::nullopt;
        if (!role.as)
            continue; // it refers to nothing
        const auto print = is_subclass(role.as, end->__meta_class) ? reduce(end, role.as) : std::nullopt;
        if (!print)
            return std::nullopt;
        cursors.push_back({&role.prints, *print, 0});
    }
    return cursors;
}

/// Calls `use(index)` for each entry that refers to `end`, until it answers false.
template <class Use> void Instance_Map::eachWithEndLocked(const Instance* end, Use use) const
{
    const auto passes = [&](std::size_t i) { return !references_match(end, _entries[i], nullptr) || use(i); };
    const std::size_t size = _entries.size();
    auto cursors = size != 0 ? cursorsLocked(end) : std::nullopt;
    if (!cursors)
    {
        for (std::size_t i = 0; i < size && passes(i); i++)
            continue;
        return;
    }
    std::size_t from = 0;
    for (;;)
    {
        std::size_t next = size;
        for (Cursor& cursor : *cursors)
        {
            if (cursor.at < from || from == 0)
                cursor.at = scan(cursor.prints->data(), from, size, cursor.print);
            next = std::min(next, cursor.at);
        }
        if (next == size || !passes(next))
            return;
        from = next + 1;
    }
}

std::optional<std::size_t> Instance_Map::copy_to(Instance_Map& local, const Selection& selection) const
{
    Auto_Mutex lock(_lock);
    std::optional<std::size_t> refused;
    Ref<> blank;
    const auto copy = [&](std::size_t i)
    {
        const Instance* entry = _entries[i];
        Ref<> copied(selection.names ? clone_keys(entry, blank) : clone_sharing_referents(entry));
        if (local.insert(copied.get()) == -1)
            return refused = i, false;
        copied.release();
        return true;
    };
    if (selection.keys)
    {
        const std::ptrdiff_t index = findLocked(selection.keys, fingerprintLocked(selection.keys));
        if (index != -1)
            copy(static_cast<std::size_t>(index));
    }
    else if (selection.end)
        eachWithEndLocked(selection.end, copy);
    else
        for (std::size_t i = 0; i < _entries.size() && copy(i); i++)
            continue;
    return refused;
}

// --- all entries ------------------------------------------------------------------------------------------

namespace
{

/// What was taken out of a map.
struct Taken
{
    std::vector<Instance*> entries;

    Taken() = default;
    ~Taken()
    {
        for (Instance* instance : entries)
            unref(instance);
    }
    Taken(const Taken&) = delete;
    Taken& operator=(const Taken&) = delete;
};

} // namespace

void Instance_Map::takeAll(std::vector<Instance*>& entries)
{
    Auto_Mutex lock(_lock);
    entries.swap(_entries);
    _prints.clear();
    _table.clear();
    _roles.clear();
}

void Instance_Map::clear()
{
    Taken gone;
    takeAll(gone.entries);
}

void Instance_Map::give_away(Instance_Handler proc, void* client)
{
    Taken given;
    takeAll(given.entries);
    for (Instance*& instance : given.entries)
        proc(std::exchange(instance, nullptr), 0, client);
}

std::size_t Instance_Map::size() const
{
    Auto_Mutex lock(_lock);
    return _entries.size();
}

Instance* Instance_Map::at(std::size_t index) const
{
    Auto_Mutex lock(_lock);
    return index < _entries.size() ? _entries[index] : nullptr;
}

Instance* Instance_Map::clone_at(std::size_t index) const
{
    Auto_Mutex lock(_lock);
    return index < _entries.size() ? clone(_entries[index]) : nullptr;
}

} // namespace cimple
