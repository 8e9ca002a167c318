#include "runtime/meta/MetaDynamic.h"

#include "runtime/base/Memory.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <memory>
#include <new>
#include <utility>

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
    deallocate(block);
}

void free_block(const void* block)
{
    deallocate(const_cast<void*>(block));
}

struct Free_Block
{
    void operator()(const void* block) const { free_block(block); }
};

void* duplicate_bytes(const void* bytes, std::size_t size)
{
    void* copy = allocate(size ? size : 1);
    if (size)
        std::memcpy(copy, bytes, size);
    return copy;
}

template <class T> const T* duplicate_array(const T* elements, std::size_t count)
{
    return elements ? static_cast<const T*>(duplicate_bytes(elements, count * sizeof(T))) : nullptr;
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

void release(const Meta_Qualifier* mq);

void release(const Meta_Feature* record)
{
    unref_meta(record);
}

/// A copy in the making: what it has so far is released with it unless it is finished.
template <class Record> class Half_Built
{
public:
    explicit Half_Built(Record* copy) : _copy(copy) {}
    ~Half_Built()
    {
        if (_copy)
            release(_copy);
    }
    Half_Built(const Half_Built&) = delete;
    Half_Built& operator=(const Half_Built&) = delete;

    Record* operator->() const { return _copy; }
    Record* get() const { return _copy; }
    Record* finish() { return std::exchange(_copy, nullptr); }

private:
    Record* _copy;
};

// --- values: what a property default or a qualifier points to ---------------------------------------------

bool is_text(std::uint32_t type)
{
    return type == STRING || type == DATETIME;
}

void free_elements(std::uint32_t type, const void* elements, std::size_t count);

/// Values in the making; texts that are not copied yet are null.
class Half_Built_Elements
{
public:
    Half_Built_Elements(std::uint32_t type, std::size_t count)
        : _type(type), _count(count), _elements(allocate_zeroed(std::max<std::size_t>(count * type_width(type), 1)))
    {}
    ~Half_Built_Elements()
    {
        if (_elements)
            free_elements(_type, _elements, _count);
    }
    Half_Built_Elements(const Half_Built_Elements&) = delete;
    Half_Built_Elements& operator=(const Half_Built_Elements&) = delete;

    void copy(const void* elements)
    {
        if (!is_text(_type))
        {
            std::memcpy(_elements, elements, _count * type_width(_type));
            return;
        }
        for (std::size_t i = 0; i < _count; ++i)
            static_cast<const char**>(_elements)[i] = duplicate_text(static_cast<const char* const*>(elements)[i]);
    }
    void* finish() { return std::exchange(_elements, nullptr); }

private:
    std::uint32_t _type;
    std::size_t _count;
    void* _elements;
};

/// Copies `count` raw values; the values of texts are char pointers.
void* clone_elements(std::uint32_t type, const void* elements, std::size_t count)
{
    Half_Built_Elements copy(type, count);
    if (count != 0)
        copy.copy(elements);
    return copy.finish();
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
    std::unique_ptr<void, Free_Block> head(allocate(sizeof(Array_Default)));
    const void* data = clone_elements(type, elements->data, elements->size);
    return new (head.release()) Array_Default{data, elements->size};
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

/// Copies a list into one of a record in the making, which counts them as they come.
template <class Record, class Clone>
void clone_list(const Record* const* records, std::size_t count, const Record* const*& list, std::size_t& size,
                Clone clone_one)
{
    list = nullptr;
    size = 0;
    if (count == 0)
        return;
    auto** copies = static_cast<const Record**>(allocate(count * sizeof(const Record*)));
    for (list = copies; size < count; ++size)
        copies[size] = clone_one(records[size]);
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

/// What a copy has of the original's and does not own yet.
void forget_head(Meta_Feature* copy)
{
    copy->name = nullptr;
    copy->meta_qualifiers = nullptr;
    copy->num_meta_qualifiers = 0;
}

void forget_features(Meta_Record* copy)
{
    forget_head(copy);
    copy->meta_features = nullptr;
    copy->num_meta_features = 0;
}

void clone_head(Meta_Feature* copy, const Meta_Feature* record)
{
    copy->name = duplicate_text(record->name);
    clone_list(record->meta_qualifiers, record->num_meta_qualifiers, copy->meta_qualifiers, copy->num_meta_qualifiers,
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

void clone_features(Meta_Record* copy, const Meta_Record* record)
{
    clone_list(record->meta_features, record->num_meta_features, copy->meta_features, copy->num_meta_features,
               clone_feature);
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
    free_block(mc->keys);
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
    Half_Built copy(duplicate_record(mq));
    copy->name = nullptr;
    copy->value = nullptr;
    copy->name = duplicate_text(mq->name);
    copy->value = clone_value(mq->type, mq->array != 0, mq->value);
    return copy.finish();
}

Meta_Property* clone_meta(const Meta_Property* mp)
{
    if (!mp)
        return nullptr;
    Half_Built copy(duplicate_record(mp));
    forget_head(copy.get());
    copy->value = nullptr;
    clone_head(copy.get(), mp);
    copy->value = clone_value(mp->type, mp->subscript != 0, mp->value);
    return copy.finish();
}

Meta_Reference* clone_meta(const Meta_Reference* mr)
{
    if (!mr)
        return nullptr;
    Half_Built copy(duplicate_record(mr));
    forget_head(copy.get());
    ref_meta(copy->meta_class);
    clone_head(copy.get(), mr);
    return copy.finish();
}

Meta_Method* clone_meta(const Meta_Method* mm)
{
    if (!mm)
        return nullptr;
    Half_Built copy(duplicate_record(mm));
    forget_features(copy.get());
    clone_head(copy.get(), mm);
    clone_features(copy.get(), mm);
    return copy.finish();
}

Meta_Class* clone_meta(const Meta_Class* mc)
{
    if (!mc)
        return nullptr;
    Half_Built copy(duplicate_record(mc));
    forget_features(copy.get());
    copy->locals = nullptr;
    copy->keys = nullptr;
    ref_meta(copy->super_meta_class);
    clone_head(copy.get(), mc);
    clone_features(copy.get(), mc);
    copy->locals = duplicate_array(mc->locals, mc->num_meta_features);
    copy->keys = duplicate_array(mc->keys, mc->num_keys);
    return copy.finish();
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
