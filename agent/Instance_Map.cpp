#include "agent/Instance_Map.h"

#include "runtime/InstanceSlots.h"

#include <algorithm>
#include <cstring>

namespace cimple
{

namespace
{

/// FNV-1a over bytes, folded eight at a time for long texts.
std::uint64_t mix(std::uint64_t hash, std::uint64_t word)
{
    hash = (hash ^ word) * 0x9E3779B97F4A7C15ULL;
    return hash ^ (hash >> 29);
}

std::uint64_t hashBytes(std::uint64_t hash, const void* data, std::size_t size)
{
    const auto* bytes = static_cast<const unsigned char*>(data);
    for (; size >= 8; bytes += 8, size -= 8)
    {
        std::uint64_t word;
        std::memcpy(&word, bytes, 8);
        hash = mix(hash, word);
    }
    std::uint64_t tail = 0;
    std::memcpy(&tail, bytes, size);
    return mix(hash, tail ^ (static_cast<std::uint64_t>(size) << 56));
}

std::vector<const Meta_Feature*> keysOf(const Meta_Class* mc)
{
    std::vector<const Meta_Feature*> keys;
    for (const Meta_Feature* feature : features_of(mc))
        if (feature->flags & META_KEY)
            keys.push_back(feature);
    return keys;
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

/// Adds the keys of `as`, which is the instance's class or one of its superclasses.
bool hashKeys(std::uint64_t& hash, const Instance* instance, const Meta_Class* as);

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
    return is_subclass(reference->meta_class, end->__meta_class) && hashKeys(hash, end, reference->meta_class);
}

bool hashKeys(std::uint64_t& hash, const Instance* instance, const Meta_Class* as)
{
    for (const Meta_Feature* feature : features_of(as))
        if ((feature->flags & META_KEY) && !hashKey(hash, instance, feature))
            return false;
    return true;
}

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

std::optional<Instance_Map::Fingerprint> Instance_Map::fingerprint(const Instance* instance,
                                                                   const std::vector<const Meta_Feature*>& keys)
{
    std::uint64_t hash = 0x243F6A8885A308D3ULL;
    for (const Meta_Feature* key : keys)
        if (!hashKey(hash, instance, key))
            return std::nullopt;
    return static_cast<Fingerprint>(hash ^ (hash >> 32));
}

std::optional<Instance_Map::Fingerprint> Instance_Map::fingerprintLocked(const Instance* keys) const
{
    if (!_printed || keys->__meta_class != _keyClass)
        return std::nullopt;
    return fingerprint(keys, _keyFeatures);
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
    if (_entries.size() == 0)
    {
        _printed = true;
        if (_keyClass != instance->__meta_class)
        {
            _keyClass = instance->__meta_class;
            _keyFeatures = keysOf(_keyClass);
        }
    }
    const std::optional<Fingerprint> print = fingerprintLocked(instance);
    if (findLocked(instance, print) != -1)
        return -1;

    const std::size_t index = _entries.size();
    if (index == _entries.capacity())
        _entries.reserve(2 * index);
    _entries.append(instance);
    if (print)
        _prints.push_back(*print);
    else
    {
        _printed = false; // an entry of another class: compare all from here on
        _prints.clear();
    }
    return static_cast<std::ptrdiff_t>(index);
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
    _entries.remove(index);
    if (_printed)
        _prints.erase(_prints.begin() + static_cast<std::ptrdiff_t>(index));
    return instance;
}

int Instance_Map::for_each(Instance_Handler proc, void* client) const
{
    for (std::size_t i = 0; Instance* copied = clone_at(i); i++)
        proc(copied, 0, client);
    return 0;
}

void Instance_Map::clear()
{
    Array<Instance*> gone;
    {
        Auto_Mutex lock(_lock);
        gone.swap(_entries);
        _prints.clear();
    }
    for (Instance* instance : gone)
        unref(instance);
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
