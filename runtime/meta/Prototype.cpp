#include "runtime/meta/Prototype.h"

#include "runtime/base/Assert.h"
#include "runtime/meta/InstanceSlots.h"

namespace cimple
{

namespace
{

// What is empty but has memory gives it back, so that a copy of its bytes is enough. All tell whether it is empty.

bool release_if_zero(Datetime& time)
{
    const bool zero = time == Datetime();
    if (zero)
        time.clear();
    return zero;
}

bool release_if_empty(String& text)
{
    const bool empty = text.empty();
    if (empty)
        text.clear();
    return empty;
}

bool release_if_empty(Array_Base& array)
{
    const bool empty = array.size() == 0;
    if (empty)
        array = Array_Base(array.traits());
    return empty;
}

} // namespace

Prototype_Base::Prototype_Base(Ref<> model) : _model(std::move(model))
{
    for (const Meta_Feature* mf : features_of(_model.get()))
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        switch (slot_kind(mf))
        {
        case Slot_Kind::scalar:
            if (mp->type == DATETIME)
            {
                if (!release_if_zero(slot<Datetime>(_model.get(), mp->offset)))
                    _times.push_back(mp);
            }
            else if (mp->type == STRING && !release_if_empty(slot<String>(_model.get(), mp->offset)))
                _texts.push_back(mp);
            break;
        case Slot_Kind::array:
            if (!release_if_empty(array_slot(_model.get(), mp->offset)))
                _arrays.push_back(mp);
            break;
        case Slot_Kind::reference:
        case Slot_Kind::reference_array:
            CIMPLE_ASSERT(!"a prototype without references");
            break;
        case Slot_Kind::none:
            break;
        }
    }
}

Instance* Prototype_Base::copy() const
{
    Ref<> copied(clone_empty(_model.get()));
    // Whatever throws below leaves no slot that is the model's.
    for (const Meta_Property* mp : _arrays)
        std::construct_at(&array_slot(copied.get(), mp->offset), array_traits(mp->type));
    for (const Meta_Property* mp : _texts)
        std::construct_at(&slot<String>(copied.get(), mp->offset), slot<String>(_model.get(), mp->offset));
    for (const Meta_Property* mp : _times)
        std::construct_at(&slot<Datetime>(copied.get(), mp->offset), slot<Datetime>(_model.get(), mp->offset));
    for (const Meta_Property* mp : _arrays)
        array_slot(copied.get(), mp->offset) = array_slot(_model.get(), mp->offset);
    return copied.release();
}

} // namespace cimple
