#include "runtime/MetaDynamic.h"

#include "runtime/Memory.h"

#include <atomic>
#include <cstring>
#include <new>

namespace cimple
{
namespace
{

constexpr std::uint32_t released_pattern = 0xDDDDDDDD;

using Count = std::atomic_ref<std::uint32_t>;

/// Static records lie in read-only memory: their count of 0 is read and never written.
Count count_of(const std::uint32_t& refs)
{
    return Count(const_cast<std::uint32_t&>(refs));
}

void count_up(const std::uint32_t& refs)
{
    if (count_of(refs).load(std::memory_order_relaxed) != 0)
        count_of(refs).fetch_add(1, std::memory_order_relaxed);
}

/// True when the record lost its last count.
bool count_down(const std::uint32_t& refs)
{
    return count_of(refs).load(std::memory_order_relaxed) != 0 &&
           count_of(refs).fetch_sub(1, std::memory_order_acq_rel) == 1;
}

/// Overwrites a record so that a use after its release is seen, then frees it.
template <class Record> void free_record(const Record* record)
{
    static_assert(sizeof(Record) % sizeof(released_pattern) == 0);
    void* block = const_cast<Record*>(record);
    volatile std::uint32_t* words = static_cast<volatile std::uint32_t*>(block);
    for (std::size_t i = 0; i < sizeof(Record) / sizeof(released_pattern); ++i)
        words[i] = released_pattern;
    std::free(block);
}

void free_block(const void* block)
{
    std::free(const_cast<void*>(block));
}

void* duplicate_bytes(const void* bytes, std::size_t size)
{
    void* copy = allocate(size ? size : 1);
    if (size)
        std::memcpy(copy, bytes, size);
    return copy;
}

char* duplicate_text(const char* text)
{
    return text ? static_cast<char*>(duplicate_bytes(text, std::strlen(text) + 1)) : nullptr;
}

/// A copy of the record's own bytes with `refs` 1; the pointers in it still belong to the original.
template <class Record> Record* duplicate_record(const Record* record)
{
    auto* copy = new (allocate(sizeof(Record))) Record(*record);
    copy->refs = 1;
    return copy;
}

// --- values: what a property default or a qualifier points to ---------------------------------------------

bool is_text(std::uint32_t type)
{
    return type == STRING || type == DATETIME;
}

/// Copies `count` raw values; the values of texts are char pointers.
void* clone_elements(std::uint32_t type, const void* elements, std::size_t count)
{
    void* copy = duplicate_bytes(elements, count * type_width(type));
    if (is_text(type))
    {
        auto** texts = static_cast<const char**>(copy);
        for (std::size_t i = 0; i < count; ++i)
            texts[i] = duplicate_text(texts[i]);
    }
    return copy;
}

void free_elements(std::uint32_t type, const void* elements, std::size_t count)
{
    if (is_text(type))
    {
        const auto* texts = static_cast<const char* const*>(elements);
        for (std::size_t i = 0; i < count; ++i)
            free_block(texts[i]);
    }
    free_block(elements);
}

const void* clone_value(std::uint32_t type, bool array, const void* value)
{
    if (!value)
        return nullptr;
    if (!array)
        return clone_elements(type, value, 1);
    const auto* elements = static_cast<const Array_Default*>(value);
    return new (allocate(sizeof(Array_Default)))
        Array_Default{clone_elements(type, elements->data, elements->size), elements->size};
}

void free_value(std::uint32_t type, bool array, const void* value)
{
    if (!value)
        return;
    if (!array)
        return free_elements(type, value, 1);
    const auto* elements = static_cast<const Array_Default*>(value);
    free_elements(type, elements->data, elements->size);
    free_block(elements);
}

// --- lists ------------------------------------------------------------------------------------------------

template <class Record, class Clone>
const Record* const* clone_list(const Record* const* records, std::size_t count, Clone clone_one)
{
    if (count == 0)
        return nullptr;
    auto** copies = static_cast<const Record**>(allocate(count * sizeof(const Record*)));
    for (std::size_t i = 0; i < count; ++i)
        copies[i] = clone_one(records[i]);
    return copies;
}

void release(const Meta_Qualifier* mq)
{
    if (!count_down(mq->refs))
        return;
    free_value(mq->type, mq->array != 0, mq->value);
    free_block(mq->name);
    free_record(mq);
}

void drop_own_qualifiers(Meta_Feature* record)
{
    for (std::size_t i = 0; i < record->num_meta_qualifiers; ++i)
        release(record->meta_qualifiers[i]);
    free_block(record->meta_qualifiers);
    record->meta_qualifiers = nullptr;
    record->num_meta_qualifiers = 0;
}

// --- records ----------------------------------------------------------------------------------------------

void clone_head(Meta_Feature* copy)
{
    copy->name = duplicate_text(copy->name);
    copy->meta_qualifiers = clone_list(copy->meta_qualifiers, copy->num_meta_qualifiers,
                                       [](const Meta_Qualifier* mq) { return clone_meta(mq); });
}

void free_head(const Meta_Feature* record)
{
    drop_own_qualifiers(const_cast<Meta_Feature*>(record));
    free_block(record->name);
}

const Meta_Feature* clone_feature(const Meta_Feature* mf)
{
    if (const Meta_Property* mp = as_property(mf))
        return clone_meta(mp);
    if (const Meta_Reference* mr = as_reference(mf))
        return clone_meta(mr);
    return clone_meta(as_method(mf));
}

void clone_features(Meta_Record* copy)
{
    copy->meta_features = clone_list(copy->meta_features, copy->num_meta_features, clone_feature);
}

void free_features(const Meta_Record* record)
{
    for (std::size_t i = 0; i < record->num_meta_features; ++i)
        unref_meta(record->meta_features[i]);
    free_block(record->meta_features);
}

void free_dynamic(const Meta_Property* mp)
{
    free_value(mp->type, mp->subscript != 0, mp->value);
    free_head(mp);
    free_record(mp);
}

void free_dynamic(const Meta_Reference* mr)
{
    unref_meta(mr->meta_class);
    free_head(mr);
    free_record(mr);
}

void free_dynamic(const Meta_Method* mm)
{
    free_features(mm);
    free_head(mm);
    free_record(mm);
}

void free_dynamic(const Meta_Class* mc)
{
    free_features(mc);
    free_block(mc->locals);
    unref_meta(mc->super_meta_class);
    free_head(mc);
    free_record(mc);
}

} // namespace

void ref_meta(const Meta_Feature* record)
{
    if (record)
        count_up(record->refs);
}

void unref_meta(const Meta_Class* mc)
{
    if (mc && count_down(mc->refs))
        free_dynamic(mc);
}

void unref_meta(const Meta_Feature* feature)
{
    if (!feature || !count_down(feature->refs))
        return;
    if (const Meta_Property* mp = as_property(feature))
        free_dynamic(mp);
    else if (const Meta_Reference* mr = as_reference(feature))
        free_dynamic(mr);
    else if (const Meta_Method* mm = as_method(feature))
        free_dynamic(mm);
    else
        free_dynamic(static_cast<const Meta_Class*>(feature));
}

Meta_Qualifier* clone_meta(const Meta_Qualifier* mq)
{
    if (!mq)
        return nullptr;
    Meta_Qualifier* copy = duplicate_record(mq);
    copy->name = duplicate_text(mq->name);
    copy->value = clone_value(mq->type, mq->array != 0, mq->value);
    return copy;
}

Meta_Property* clone_meta(const Meta_Property* mp)
{
    if (!mp)
        return nullptr;
    Meta_Property* copy = duplicate_record(mp);
    clone_head(copy);
    copy->value = clone_value(mp->type, mp->subscript != 0, mp->value);
    return copy;
}

Meta_Reference* clone_meta(const Meta_Reference* mr)
{
    if (!mr)
        return nullptr;
    Meta_Reference* copy = duplicate_record(mr);
    clone_head(copy);
    ref_meta(copy->meta_class);
    return copy;
}

Meta_Method* clone_meta(const Meta_Method* mm)
{
    if (!mm)
        return nullptr;
    Meta_Method* copy = duplicate_record(mm);
    clone_head(copy);
    clone_features(copy);
    return copy;
}

Meta_Class* clone_meta(const Meta_Class* mc)
{
    if (!mc)
        return nullptr;
    Meta_Class* copy = duplicate_record(mc);
    clone_head(copy);
    clone_features(copy);
    if (mc->locals)
        copy->locals = static_cast<const std::uint8_t*>(duplicate_bytes(mc->locals, mc->num_meta_features));
    ref_meta(copy->super_meta_class);
    return copy;
}

void drop_qualifiers(Meta_Feature* record)
{
    if (!record || count_of(record->refs).load(std::memory_order_relaxed) == 0)
        return;
    drop_own_qualifiers(record);
    if (record->flags & (META_PROPERTY | META_REFERENCE))
        return;
    auto* owner = static_cast<Meta_Record*>(record);
    for (std::size_t i = 0; i < owner->num_meta_features; ++i)
        drop_qualifiers(const_cast<Meta_Feature*>(owner->meta_features[i]));
}

} // namespace cimple
