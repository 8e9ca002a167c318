// Meta records built at run time. They start with `refs` 1, own all that they point to, and are freed by
// unref_meta(); the memory of a freed record is first overwritten with 0xDDDDDDDD.
#pragma once

#include "runtime/meta/Meta.h"

namespace cimple
{

/// Deep copies: texts, defaults, qualifiers and features are duplicated. Superclasses and referenced classes
/// are linked and counted. Null gives null.
Meta_Class* clone_meta(const Meta_Class* mc);
Meta_Property* clone_meta(const Meta_Property* mp);
Meta_Reference* clone_meta(const Meta_Reference* mr);
Meta_Method* clone_meta(const Meta_Method* mm);
Meta_Qualifier* clone_meta(const Meta_Qualifier* mq);

/// Frees the qualifiers of a dynamic record, and with a class or method those of its features. Does nothing
/// to a static record.
void drop_qualifiers(Meta_Feature* record);

} // namespace cimple
