#include "runtime/meta/Prototype.h"

#include "runtime/base/Assert.h"
#include "runtime/meta/InstanceSlots.h"

namespace cimple
{

Prototype_Base::Prototype_Base(Ref<> model) : _model(std::move(model))
{
    for (const Meta_Feature* mf : features_of(_model.get()))
    {
        const auto* mp = static_cast<const Meta_Property*>(mf);
        switch (slot_kind(mf))
        {
        case Slot_Kind::scalar:
            CIMPLE_ASSERT(mp->type != DATETIME || null_byte(_model.get(), mp));
            if (mp->type == STRING && !slot<String>(_model.get(), mp->offset).empty())
                _texts.push_back(mp);
            break;
        case Slot_Kind::array:
            if (array_slot(_model.get(), mp->offset).size() != 0)
                _arrays.push_back(mp);
            break;
        case Slot_Kind::reference:
            CIMPLE_ASSERT(!reference_slot(_model.get(), static_cast<const Meta_Reference*>(mf)));
            break;
        case Slot_Kind::reference_array:
            CIMPLE_ASSERT(array_slot(_model.get(), static_cast<const Meta_Reference*>(mf)->offset).size() == 0);
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
    for (const Meta_Property* mp : _arrays)
        array_slot(copied.get(), mp->offset) = array_slot(_model.get(), mp->offset);
    return copied.release();
}

} // namespace cimple
