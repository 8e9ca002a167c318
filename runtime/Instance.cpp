// Life of instances: create, clone, count, clear, destroy.
#include "runtime/Instance.h"

#include "runtime/InstanceSlots.h"
#include "runtime/Memory.h"

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

void construct_scalar(Instance* instance, const Meta_Property* mp, bool defaults)
{
    if (mp->type == STRING)
        std::construct_at(&slot<String>(instance, mp->offset));
    else if (mp->type == DATETIME)
        std::construct_at(&slot<Datetime>(instance, mp->offset));
    if (!defaults)
        return;
    if (mp->value)
        set_scalar_default(instance, mp);
    else
        null_byte(instance, mp) = 1;
}

void construct_array(Instance* instance, const Meta_Property* mp, bool defaults)
{
    Array_Base* array = std::construct_at(&array_slot(instance, mp->offset), array_traits(mp->type));
    if (!defaults)
        return;
    if (mp->value)
        set_array_default(*array, mp);
    else
        null_byte(instance, mp) = 1;
}

Instance* create_record(const Meta_Record* record, bool defaults)
{
    Instance* instance = make_head(allocate_zeroed(record->size), record, String());
    for (const Meta_Feature* mf : features_of(record))
    {
        switch (slot_kind(mf))
        {
        case Slot_Kind::scalar:
            construct_scalar(instance, static_cast<const Meta_Property*>(mf), defaults);
            break;
        case Slot_Kind::array:
            construct_array(instance, static_cast<const Meta_Property*>(mf), defaults);
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
    return instance;
}

// --- clone ------------------------------------------------------------------------------------------------

/// Turns the copied bytes of a slot into a value of its own.
void clone_slot(Instance* copy, const Instance* instance, const Meta_Feature* mf)
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
        reference_slot(copy, mr) = clone(reference_slot(instance, mr));
        break;
    }
    case Slot_Kind::reference_array:
    {
        const std::uint32_t offset = static_cast<const Meta_Reference*>(mf)->offset;
        auto& array = slot<Array<Instance*>>(copy, offset);
        std::construct_at(&array, slot<Array<Instance*>>(instance, offset));
        for (Instance*& element : array)
            element = clone(element);
        break;
    }
    case Slot_Kind::none:
        break;
    }
}

// --- clear and destroy ------------------------------------------------------------------------------------

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

void unref_elements(const Instance* instance, const Meta_Reference* mr)
{
    for (const Instance* element : references_in(instance, mr))
        unref(element);
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

} // namespace

Instance* create(const Meta_Class* mc, bool defaults)
{
    return create_record(mc, defaults);
}

Instance* create(const Meta_Method* mm, bool defaults)
{
    return create_record(mm, defaults);
}

Instance* clone(const Instance* instance)
{
    if (!instance)
        return nullptr;
    const Meta_Record* record = instance->__meta_class;
    Instance* copy = make_head(allocate(record->size), record, instance->__name_space);
    std::memcpy(body_of(copy), body_of(instance), record->size - sizeof(Instance));
    for (const Meta_Feature* mf : features_of(record))
        clone_slot(copy, instance, mf);
    return copy;
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
    const Meta_Feature* record = instance->__meta_class;
    for (const Meta_Feature* mf : features_of(instance))
        destroy_slot(instance, mf);
    std::destroy_at(&instance->__name_space);
    std::destroy_at(&instance->__refs);
    std::free(instance);
    unref_meta(record);
}

void clear(Instance* instance)
{
    instance->__name_space.clear();
    for (const Meta_Feature* mf : features_of(instance))
        clear_feature(instance, mf);
}

} // namespace cimple
