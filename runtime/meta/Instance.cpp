// Life of instances: create, clone, count, clear, destroy.
#include "runtime/meta/Instance.h"

#include "runtime/base/Memory.h"
#include "runtime/meta/InstanceSlots.h"

#include <cstring>

namespace cimple
{

constinit const Meta_Class Instance::static_meta_class = {
    {{0, META_CLASS, "Instance", nullptr, 0}, nullptr, 0, sizeof(Instance)}, nullptr, nullptr, 0, nullptr,
};

namespace
{

// Slots follow the head directly, whatever the base class of a record.
static_assert(sizeof(Instance) == 2 * sizeof(std::uint32_t) + 2 * sizeof(void*));

/// Fills the head of a record in raw memory.
Instance* make_head(void* block, const Meta_Record* record, const String& name_space)
{
    ref_meta(record);
    auto* instance = static_cast<Instance*>(block);
    instance->__magic = Instance::magic;
    std::construct_at(&instance->__refs, 1u);
    // A parameter record stands on its Meta_Method, of which only the part shared with classes is used.
    instance->__meta_class = static_cast<const Meta_Class*>(record);
    std::construct_at(&instance->__name_space, name_space);
    return instance;
}

char* body_of(Instance* instance)
{
    return reinterpret_cast<char*>(instance) + sizeof(Instance);
}

const char* body_of(const Instance* instance)
{
    return reinterpret_cast<const char*>(instance) + sizeof(Instance);
}

// --- destroy ----------------------------------------------------------------------------------------------

void unref_elements(const Instance* instance, const Meta_Reference* mr)
{
    for (const Instance* element : references_in(instance, mr))
        unref(element);
}

void destroy_slot(Instance* instance, const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        if (mp->type == STRING)
            std::destroy_at(&slot<String>(instance, mp->offset));
        else if (mp->type == DATETIME)
            std::destroy_at(&slot<Datetime>(instance, mp->offset));
        break;
    }
    case Slot_Kind::array:
        std::destroy_at(&array_slot(instance, static_cast<const Meta_Property*>(mf)->offset));
        break;
    case Slot_Kind::reference:
        unref(reference_slot(instance, static_cast<const Meta_Reference*>(mf)));
        break;
    case Slot_Kind::reference_array:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        unref_elements(instance, mr);
        std::destroy_at(&array_slot(instance, mr->offset));
        break;
    }
    case Slot_Kind::none:
        break;
    }
}

/// Frees a record whose first `slots` features have values.
void destroy_record(Instance* instance, std::size_t slots)
{
    const Meta_Feature* record = instance->__meta_class;
    for (const Meta_Feature* mf : features_of(instance).first(slots))
        destroy_slot(instance, mf);
    std::destroy_at(&instance->__name_space);
    std::destroy_at(&instance->__refs);
    deallocate(instance);
    unref_meta(record);
}

/// A record in the making, which an exception takes away with the slots that it has so far.
class Half_Built
{
public:
    explicit Half_Built(Instance* instance) : _instance(instance) {}
    ~Half_Built()
    {
        if (_instance)
            destroy_record(_instance, _slots);
    }
    Half_Built(const Half_Built&) = delete;
    Half_Built& operator=(const Half_Built&) = delete;

    Instance* instance() const { return _instance; }
    void count_slot() { ++_slots; }
    Instance* finish() { return std::exchange(_instance, nullptr); }

private:
    Instance* _instance;
    std::size_t _slots = 0;
};

// --- create -----------------------------------------------------------------------------------------------

void set_scalar_default(Instance* instance, const Meta_Property* mp)
{
    switch (mp->type)
    {
    case STRING:
        slot<String>(instance, mp->offset) = *static_cast<const char* const*>(mp->value);
        break;
    case DATETIME:
        slot<Datetime>(instance, mp->offset).parse(*static_cast<const char* const*>(mp->value));
        break;
    default:
        std::memcpy(&slot<char>(instance, mp->offset), mp->value, type_width(mp->type));
    }
}

void append_text_default(Array_Base& array, std::uint32_t type, const char* text)
{
    if (type == STRING)
    {
        const String element(text);
        array.append(&element);
        return;
    }
    Datetime element;
    element.parse(text);
    array.append(&element);
}

void set_array_default(Array_Base& array, const Meta_Property* mp)
{
    const auto& elements = *static_cast<const Array_Default*>(mp->value);
    if (mp->type != STRING && mp->type != DATETIME)
    {
        array.append(elements.data, elements.size);
        return;
    }
    for (std::size_t i = 0; i < elements.size; ++i)
        append_text_default(array, mp->type, static_cast<const char* const*>(elements.data)[i]);
}

/// An empty value in the zeroed slot. Takes no memory.
void construct_slot(Instance* instance, const Meta_Feature* mf)
{
    const auto* mp = static_cast<const Meta_Property*>(mf);
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
        if (mp->type == STRING)
            std::construct_at(&slot<String>(instance, mp->offset));
        else if (mp->type == DATETIME)
            std::construct_at(&slot<Datetime>(instance, mp->offset));
        break;
    case Slot_Kind::array:
        std::construct_at(&array_slot(instance, mp->offset), array_traits(mp->type));
        break;
    case Slot_Kind::reference_array:
        std::construct_at(&array_slot(instance, static_cast<const Meta_Reference*>(mf)->offset),
                          instance_array_traits());
        break;
    case Slot_Kind::reference:
    case Slot_Kind::none:
        break;
    }
}

/// The schema's default, or null where it has none.
void set_default(Instance* instance, const Meta_Property* mp)
{
    if (!mp->value)
        null_byte(instance, mp) = 1;
    else if (mp->subscript == 0)
        set_scalar_default(instance, mp);
    else
        set_array_default(array_slot(instance, mp->offset), mp);
}

// --- clone ------------------------------------------------------------------------------------------------

/// Turns the copied bytes of a slot into a value of its own, or leaves them when it throws.
template <Copy_Referent copy_referent> void clone_slot(Instance* copy, const Instance* instance, const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        if (mp->type == STRING)
            std::construct_at(&slot<String>(copy, mp->offset), slot<String>(instance, mp->offset));
        else if (mp->type == DATETIME)
            std::construct_at(&slot<Datetime>(copy, mp->offset), slot<Datetime>(instance, mp->offset));
        break;
    }
    case Slot_Kind::array:
    {
        const std::uint32_t offset = static_cast<const Meta_Property*>(mf)->offset;
        std::construct_at(&array_slot(copy, offset), array_slot(instance, offset));
        break;
    }
    case Slot_Kind::reference:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        reference_slot(copy, mr) = copy_referent(reference_slot(instance, mr));
        break;
    }
    case Slot_Kind::reference_array:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        Reference_List elements;
        elements.append_copies(references_in(instance, mr), copy_referent);
        elements.swap(*std::construct_at(&array_slot(copy, mr->offset), instance_array_traits()));
        break;
    }
    case Slot_Kind::none:
        break;
    }
}

/// A copy whose slots are bytes so far.
Instance* copy_bytes(const Instance* instance)
{
    const Meta_Record* record = instance->__meta_class;
    Instance* copy = make_head(allocate(record->size), record, instance->__name_space);
    std::memcpy(body_of(copy), body_of(instance), record->size - sizeof(Instance));
    return copy;
}

template <Copy_Referent copy_referent> Instance* copy_record(const Instance* instance)
{
    if (!instance)
        return nullptr;
    Half_Built half(copy_bytes(instance));
    for (const Meta_Feature* mf : features_of(instance))
    {
        clone_slot<copy_referent>(half.instance(), instance, mf);
        half.count_slot();
    }
    return half.finish();
}

// --- clear ------------------------------------------------------------------------------------------------

void clear_scalar(Instance* instance, const Meta_Property* mp)
{
    if (mp->type == STRING)
        slot<String>(instance, mp->offset).clear();
    else if (mp->type == DATETIME)
        slot<Datetime>(instance, mp->offset).clear();
    else
        std::memset(&slot<char>(instance, mp->offset), 0, type_width(mp->type));
    null_byte(instance, mp) = 1;
}

void clear_feature(Instance* instance, const Meta_Feature* mf)
{
    switch (slot_kind(mf))
    {
    case Slot_Kind::scalar:
        clear_scalar(instance, static_cast<const Meta_Property*>(mf));
        break;
    case Slot_Kind::array:
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        array_slot(instance, mp->offset).clear();
        null_byte(instance, mp) = 1;
        break;
    }
    case Slot_Kind::reference:
        unref(std::exchange(reference_slot(instance, static_cast<const Meta_Reference*>(mf)), nullptr));
        break;
    case Slot_Kind::reference_array:
    {
        const auto* mr = static_cast<const Meta_Reference*>(mf);
        unref_elements(instance, mr);
        array_slot(instance, mr->offset).clear();
        null_byte(instance, mr) = 1;
        break;
    }
    case Slot_Kind::none:
        break;
    }
}

} // namespace

Instance* create(const Meta_Record* record, bool defaults)
{
    Half_Built half(make_head(allocate_zeroed(record->size), record, String()));
    for (const Meta_Feature* mf : features_of(record))
    {
        construct_slot(half.instance(), mf);
        half.count_slot();
        const Meta_Property* mp = defaults ? as_property(mf) : nullptr;
        if (mp)
            set_default(half.instance(), mp);
    }
    return half.finish();
}

Instance* clone(const Instance* instance)
{
    return copy_record<clone>(instance);
}

Instance* clone_sharing_referents(const Instance* instance)
{
    return copy_record<share_referent>(instance);
}

Instance* clone_empty(const Instance* instance)
{
    return copy_bytes(instance);
}

const Instance* ref(const Instance* instance)
{
    if (instance)
        const_cast<Instance*>(instance)->__refs.fetch_add(1, std::memory_order_relaxed);
    return instance;
}

void unref(const Instance* instance)
{
    auto* counted = const_cast<Instance*>(instance);
    if (counted && counted->__refs.fetch_sub(1, std::memory_order_acq_rel) == 1)
        destroy(counted);
}

void destroy(Instance* instance)
{
    destroy_record(instance, features_of(instance).size());
}

void clear(Instance* instance)
{
    instance->__name_space.clear();
    for (const Meta_Feature* mf : features_of(instance))
        clear_feature(instance, mf);
}

} // namespace cimple
