#include "runtime/meta/Print.h"

#include "runtime/base/Assert.h"
#include "runtime/meta/InstanceSlots.h"

#include <concepts>

namespace cimple
{
namespace
{

void indent(Buffer& out, unsigned level)
{
    for (; level != 0; --level)
        out.append("    ");
}

void open_brace(Buffer& out, unsigned level)
{
    indent(out, level);
    out.append("{\n");
}

void close_brace(Buffer& out, unsigned level)
{
    indent(out, level);
    out.append("}\n");
}

void append_typed(Buffer& out, bool value)
{
    out.append(value ? "true" : "false");
}
void append_typed(Buffer& out, float value)
{
    out.appendf("%.9g", static_cast<double>(value));
}
void append_typed(Buffer& out, double value)
{
    out.appendf("%.17g", value);
}
void append_typed(Buffer& out, const String& value)
{
    out.append('"');
    out.append(value.c_str(), value.size());
    out.append('"');
}
void append_typed(Buffer& out, const Datetime& value)
{
    out.append(value.text().c_str());
}
template <std::integral Integer> void append_typed(Buffer& out, Integer value)
{
    out.append_integer(value);
}

void append_value(Buffer& out, std::uint32_t type, const void* value)
{
    const auto append = [&]<class T>(std::type_identity<T>)
    { return append_typed(out, *static_cast<const T*>(value)), true; };
    if (!with_type(type, false, append))
        out.append("?");
}

void append_elements(Buffer& out, std::uint32_t type, const Array_Base& array)
{
    out.append('{');
    for (std::size_t i = 0; i < array.size(); ++i)
    {
        if (i != 0)
            out.append(", ");
        append_value(out, type, array.at(i));
    }
    out.append('}');
}

void append_subscript(Buffer& out, std::int16_t subscript)
{
    if (subscript > 0)
        out.appendf("[%d]", subscript);
    else if (subscript < 0)
        out.append("[]");
}

/// Type and name as in a class declaration.
void append_declaration(Buffer& out, const Meta_Property* mp)
{
    out.appendf("%s %s", type_name(mp->type), mp->name);
    append_subscript(out, mp->subscript);
}

void append_declaration(Buffer& out, const Meta_Reference* mr)
{
    out.appendf("%s ref %s", mr->meta_class->name, mr->name);
    append_subscript(out, mr->subscript);
}

void print_property(Buffer& out, const Instance* instance, const Meta_Property* mp, unsigned level)
{
    indent(out, level);
    append_declaration(out, mp);
    out.append(" = ");
    if (null_byte(instance, mp))
        out.append("NULL");
    else if (mp->subscript == 0)
        append_value(out, mp->type, &slot<char>(instance, mp->offset));
    else
        append_elements(out, mp->type, array_slot(instance, mp->offset));
    out.append(";\n");
}

void print_referent(Buffer& out, const Instance* referent, unsigned level)
{
    if (referent)
        return print(out, referent, level);
    indent(out, level);
    out.append("NULL\n");
}

void print_reference(Buffer& out, const Instance* instance, const Meta_Reference* mr, unsigned level)
{
    indent(out, level);
    out.appendf("%s %s =\n", mr->meta_class->name, mr->name);
    if (mr->subscript == 0)
        return print_referent(out, reference_slot(instance, mr), level);
    open_brace(out, level);
    if (null_byte(instance, mr))
        print_referent(out, nullptr, level + 1);
    for (const Instance* referent : references_in(instance, mr))
        print_referent(out, referent, level + 1);
    close_brace(out, level);
}

} // namespace

void print(Buffer& out, const Meta_Feature* mf, unsigned level)
{
    if (const Meta_Method* mm = as_method(mf))
        return print(out, mm, level);
    indent(out, level);
    if (const Meta_Reference* mr = as_reference(mf))
        append_declaration(out, mr);
    else
        append_declaration(out, as_property(mf));
    out.append(";\n");
}

void print(Buffer& out, const Meta_Method* mm, unsigned level)
{
    CIMPLE_ASSERT(mm->num_meta_features > 0);
    indent(out, level);
    out.appendf("%s %s(\n", type_name(mm->return_type), mm->name);
    const auto parameters = features_of(mm).first(mm->num_meta_features - 1); // the last one is the return value
    for (const Meta_Feature* mf : parameters)
        print(out, mf, level + 1);
    indent(out, level);
    out.append(");\n");
}

void print(Buffer& out, const Meta_Class* mc, unsigned level)
{
    indent(out, level);
    if (mc->super_meta_class)
        out.appendf("class %s : %s\n", mc->name, mc->super_meta_class->name);
    else
        out.appendf("class %s\n", mc->name);
    open_brace(out, level);
    for (const Meta_Feature* mf : features_of(mc))
        print(out, mf, level + 1);
    close_brace(out, level);
}

void print(Buffer& out, const Instance* instance, unsigned level)
{
    indent(out, level);
    out.appendf("%s\n", instance->__meta_class->name);
    open_brace(out, level);
    for (const Meta_Feature* mf : features_of(instance))
        if (const Meta_Property* mp = as_property(mf))
            print_property(out, instance, mp, level + 1);
        else if (const Meta_Reference* mr = as_reference(mf))
            print_reference(out, instance, mr, level + 1);
    close_brace(out, level);
}

} // namespace cimple
