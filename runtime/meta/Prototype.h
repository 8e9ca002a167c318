// Many instances that begin alike.
#pragma once

#include "runtime/meta/Instance.h"

#include <vector>

namespace cimple
{

/// Makes copies of one instance, each as clone() would. What a copy takes beside its bytes is listed once, so that it
/// costs little more than these: most slots of a large class are empty.
class Prototype_Base
{
public:
    explicit Prototype_Base(Ref<> model);
    /// The caller owns it.
    Instance* copy() const;

private:
    Ref<> _model;
    std::vector<const Meta_Property*> _texts;  ///< slots with a text of their own
    std::vector<const Meta_Property*> _times;  ///< that are not zero
    std::vector<const Meta_Property*> _arrays; ///< with elements
};

/// The model has no references and no arrays of them, and is not changed any more.
template <class Record> class Prototype : private Prototype_Base
{
public:
    explicit Prototype(const Ref<Record>& model) : Prototype_Base(Ref<>(Ref<Record>(model).release())) {}
    Ref<Record> copy() const { return Ref<Record>(static_cast<Record*>(Prototype_Base::copy())); }
};

} // namespace cimple
