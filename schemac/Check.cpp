#include "schemac/Check.h"

#include "schemac/Output.h"
#include "schemac/Types.h"

#include <algorithm>
#include <iterator>

namespace schemac
{

namespace
{

/// Names that cannot be members of a record type, each between blanks: words of C++, and names that the records
/// themselves use.
constexpr std::string_view reserved_names =
    " alignas alignof and and_eq asm auto bitand bitor bool break case catch char char16_t char32_t char8_t class "
    "co_await co_return co_yield compl concept const const_cast consteval constexpr constinit continue decltype "
    "default "
    "delete do double dynamic_cast else enum explicit export extern false float for friend goto if inline int long "
    "mutable namespace new noexcept not not_eq nullptr operator or or_eq private protected public register "
    "reinterpret_cast requires return short signed sizeof static static_assert static_cast struct switch template this "
    "thread_local throw true try typedef typeid typename union unsigned using virtual void volatile wchar_t while xor "
    "xor_eq Array Datetime Instance Meta_Class Meta_Method Property String magic std static_meta_class "
    "static_meta_method ";

bool is_reserved(const std::string& name)
{
    return name.starts_with("__") || reserved_names.find(" " + name + " ") != std::string_view::npos;
}

std::string in_quotes(const std::string& name)
{
    return '"' + name + '"';
}

const char* kind_name(const Feature& feature)
{
    switch (feature.kind)
    {
    case FeatureKind::Property:
        return "property";
    case FeatureKind::Reference:
        return feature.embedded == Embedded::No ? "reference" : "embedded instance";
    case FeatureKind::Method:
        break;
    }
    return "method";
}

class Check
{
public:
    explicit Check(Schema& schema) : _schema(schema) {}

    std::vector<std::string> run()
    {
        for (Class& c : _schema.classes)
        {
            resolve_superclass(c);
            resolve_members(c);
            check_class(c);
            for (const Feature& feature : c.features)
                check_feature(c, feature);
        }
        return std::move(_refusals);
    }

private:
    void refuse(const Place& place, const std::string& reason) { _refusals.push_back(refusal(place, reason)); }

    // --- resolving ---

    void resolve_superclass(Class& c)
    {
        if (_schema.find_class(c.name) != &c)
            refuse(c.place, "class " + in_quotes(c.name) + " is declared twice");
        if (c.superclass_name.empty())
            return;
        const Class* superclass = _schema.find_class(c.superclass_name);
        if (!superclass)
        {
            refuse(c.place, "unknown superclass " + in_quotes(c.superclass_name));
        }
        else if (superclass >= &c)
        {
            refuse(c.place, "superclass " + in_quotes(c.superclass_name) + " does not stand before the class");
        }
        else
        {
            c.superclass = superclass;
            c.members = superclass->members;
        }
    }

    void resolve_members(Class& c)
    {
        for (Feature& feature : c.features)
        {
            const auto same = [&](const Member& member) { return same_name(member.feature->name, feature.name); };
            const auto member = std::find_if(c.members.begin(), c.members.end(), same);
            if (member == c.members.end())
            {
                if (find(feature.qualifiers, "Override"))
                    refuse(feature.place, in_quotes(feature.name) + " overrides nothing");
                c.members.push_back({&feature, &c});
            }
            else if (declares_before(c, feature))
            {
                refuse(feature.place, "feature " + in_quotes(feature.name) + " is declared twice");
            }
            else
            {
                check_override(c, feature, *member->feature);
                check_kept_qualifiers(feature, member->declared_by);
                feature.only_explains = is_served(c) && only_explains(feature, *member->feature);
                if (!feature.only_explains)
                    *member = {&feature, &c};
            }
        }
        for (std::size_t i = 0; i < c.members.size(); ++i)
            if (is_set(c.members[i].feature->qualifiers, "Key"))
                c.keys.push_back(i);
    }

    static bool declares_before(const Class& c, const Feature& feature)
    {
        const auto first = std::find_if(c.features.begin(), c.features.end(),
                                        [&](const Feature& other) { return same_name(other.name, feature.name); });
        return &*first != &feature;
    }

    void check_override(const Class& c, const Feature& feature, const Feature& base)
    {
        const std::string what = in_quotes(feature.name);
        const std::string* overridden = text_of(feature.qualifiers, "Override");
        if (!overridden)
            refuse(feature.place, what + " stands in a superclass of " + in_quotes(c.name) + " and has no Override");
        else if (*overridden != feature.name || base.name != feature.name)
            refuse(feature.place, what + " must override " + in_quotes(base.name) + ", in this spelling");
        if (feature.kind != base.kind || feature.embedded != base.embedded)
        {
            refuse(feature.place, what + " changes its kind from " + kind_name(base) + " to " + kind_name(feature));
        }
        else if (!same_name(feature.type, base.type) || feature.subscript != base.subscript)
        {
            refuse(feature.place, what + " overrides a feature of another type");
        }
        else if (!base.class_name.empty() && !narrows(feature.class_name, base.class_name))
        {
            refuse(feature.place, what + " overrides a reference to " + in_quotes(base.class_name) +
                                      " with a class that does not derive from it");
        }
        if (is_set(base.qualifiers, "Key") && !is_set(feature.qualifiers, "Key"))
            refuse(feature.place, what + " overrides a key and does not repeat Key");
        for (const Feature& parameter : feature.parameters)
            for (const Feature& overridden : base.parameters)
                if (same_name(parameter.name, overridden.name) && !same_form(parameter, overridden))
                    refuse(parameter.place,
                           "parameter " + in_quotes(parameter.name) + " overrides one of another type");
    }

    /// True if the override has texts of its own and the tables would have the same of it as of what it overrides.
    /// Published classes keep the overrides that they are published with.
    static bool only_explains(const Feature& feature, const Feature& base)
    {
        constexpr const char* texts[] = {"Description", "ValueMap", "BitMap", "PUnit"};
        return std::any_of(std::begin(texts), std::end(texts),
                           [&](const char* name) { return find(feature.qualifiers, name); }) &&
               feature_flags(feature) == feature_flags(base) && same_record(feature, base) &&
               std::equal(feature.parameters.begin(), feature.parameters.end(), base.parameters.begin(),
                          base.parameters.end(),
                          [](const Feature& a, const Feature& b) {
                              return a.name == b.name && parameter_flags(a) == parameter_flags(b) && same_record(a, b);
                          });
    }

    static bool same_record(const Feature& a, const Feature& b)
    {
        const auto value = [](const Feature& feature)
        { return feature.default_value ? feature.default_value->items : std::vector<Literal>(); };
        const std::vector<Literal> x = value(a);
        const std::vector<Literal> y = value(b);
        return same_form(a, b) && a.class_name == b.class_name &&
               std::equal(x.begin(), x.end(), y.begin(), y.end(),
                          [](const Literal& p, const Literal& q) { return p.kind == q.kind && p.text == q.text; });
    }

    static bool same_form(const Feature& a, const Feature& b)
    {
        return a.kind == b.kind && a.embedded == b.embedded && same_name(a.type, b.type) && a.subscript == b.subscript;
    }

    /// What a superclass says with a qualifier that cannot be overridden holds for subclasses; they may repeat it.
    void check_kept_qualifiers(const Feature& feature, const Class* overridden_in)
    {
        for (const Qualifier& qualifier : feature.qualifiers)
        {
            const QualifierDeclaration* declaration = _schema.find_qualifier(qualifier.name);
            const Qualifier* kept = nearest_qualifier(overridden_in, feature.name, qualifier.name);
            if (declaration && has_flavor(*declaration, "DisableOverride") && kept &&
                said_by(*declaration, qualifier) != said_by(*declaration, *kept))
                refuse(feature.place,
                       in_quotes(feature.name) + " changes the qualifier " + in_quotes(declaration->name));
        }
    }

    /// The qualifier of a feature as the class or the nearest superclass that has it says it.
    static const Qualifier* nearest_qualifier(const Class* owner, const std::string& feature_name,
                                              const std::string& qualifier_name)
    {
        for (; owner; owner = owner->superclass)
            for (const Feature& feature : owner->features)
                if (same_name(feature.name, feature_name))
                    if (const Qualifier* qualifier = find(feature.qualifiers, qualifier_name))
                        return qualifier;
        return nullptr;
    }

    static bool has_flavor(const QualifierDeclaration& declaration, std::string_view flavor)
    {
        return std::any_of(declaration.flavors.begin(), declaration.flavors.end(),
                           [&](const std::string& other) { return same_name(other, flavor); });
    }

    /// The texts of the qualifier's value; a boolean without value is true.
    static std::vector<std::string> said_by(const QualifierDeclaration& declaration, const Qualifier& qualifier)
    {
        if (!qualifier.value)
            return {same_name(declaration.type, "boolean") ? "true" : ""};
        std::vector<std::string> texts;
        for (const Literal& item : qualifier.value->items)
            texts.push_back(item.text);
        return texts;
    }

    /// True if the first class is the second or derives from it, or if one is unknown, which is refused apart.
    /// A class may stand behind, where superclasses are not yet resolved, so names are followed; the number of
    /// steps is bounded because a chain that is to be refused may be circular.
    bool narrows(const std::string& name, const std::string& base_name) const
    {
        const Class* c = _schema.find_class(name);
        const Class* base = _schema.find_class(base_name);
        if (!c || !base)
            return true;
        for (std::size_t steps = 0; c && steps <= _schema.classes.size();
             c = _schema.find_class(c->superclass_name), steps++)
            if (c == base)
                return true;
        return false;
    }

    // --- classes ---

    void check_class(const Class& c)
    {
        for (const char* qualifier : {"Association", "Aggregation"})
            check_kind_is_repeated(c, qualifier);
        const bool association = is_set(c.qualifiers, "Association");
        if (association && c.superclass && !is_set(c.superclass->qualifiers, "Association"))
            refuse(c.place, "association " + in_quotes(c.name) + " derives from a class that is none");
        for (const char* qualifier : {"Aggregation", "Composition"})
            if (is_set(c.qualifiers, qualifier) && !association)
                refuse(c.place, in_quotes(c.name) + " has " + qualifier + " and is no association");
        if (association && count_references(c) < 2)
            refuse(c.place, "association " + in_quotes(c.name) + " has fewer than two references");
        check_new_keys(c);
    }

    /// What a class is stands with the class, so that its flags do not depend on its superclass.
    void check_kind_is_repeated(const Class& c, const char* qualifier)
    {
        if (c.superclass && is_set(c.superclass->qualifiers, qualifier) && !is_set(c.qualifiers, qualifier))
            refuse(c.place, in_quotes(c.name) + " does not repeat " + qualifier + " of its superclass");
    }

    static std::size_t count_references(const Class& c)
    {
        return std::count_if(c.members.begin(), c.members.end(),
                             [](const Member& m) {
                                 return m.feature->kind == FeatureKind::Reference &&
                                        m.feature->embedded == Embedded::No;
                             });
    }

    /// A subclass keeps the keys of its superclass: more of them would change what identifies an instance.
    void check_new_keys(const Class& c)
    {
        if (c.superclass && !c.superclass->keys.empty() && c.keys.size() > c.superclass->keys.size())
            refuse(c.place, "class " + in_quotes(c.name) + " adds keys to those of its superclass");
    }

    // --- features ---

    void check_feature(const Class& c, const Feature& feature)
    {
        check_name(feature);
        switch (feature.kind)
        {
        case FeatureKind::Property:
            check_property(feature);
            break;
        case FeatureKind::Reference:
            check_reference(feature);
            if (feature.embedded == Embedded::No)
                check_association_end(c, feature);
            break;
        case FeatureKind::Method:
            check_method(feature);
            break;
        }
        check_key(feature);
    }

    void check_name(const Feature& feature)
    {
        if (is_reserved(feature.name))
            refuse(feature.place, in_quotes(feature.name) + " is a reserved name");
    }

    void check_property(const Feature& feature)
    {
        const TypeRow* type = find_type(feature.type);
        if (!type)
        {
            refuse(feature.place,
                   "property " + in_quotes(feature.name) + " has the unknown type " + in_quotes(feature.type));
        }
        else if (feature.default_value)
        {
            check_default(*type, feature);
        }
    }

    void check_default(const TypeRow& type, const Feature& feature)
    {
        const Value& value = *feature.default_value;
        const bool fits = value.is_array == (feature.subscript != 0) &&
                          (feature.subscript <= 0 || value.items.size() <= std::size_t(feature.subscript)) &&
                          std::all_of(value.items.begin(), value.items.end(),
                                      [&](const Literal& item) { return !cpp_value(type, item).empty(); });
        if (!fits)
            refuse(feature.place, "the default of " + in_quotes(feature.name) + " is no value of its type");
    }

    void check_reference(const Feature& feature)
    {
        const std::string what = std::string(kind_name(feature)) + " " + in_quotes(feature.name);
        if (feature.embedded != Embedded::No && !same_name(feature.type, "string"))
            refuse(feature.place, what + " is not declared as a string");
        if (feature.embedded != Embedded::Object && !is_known(feature.class_name))
            refuse(feature.place, what + " is of the unknown class " + in_quotes(feature.class_name));
        if (feature.default_value)
            refuse(feature.place, what + " has a default");
    }

    /// The generated code uses the name as it is written.
    bool is_known(const std::string& class_name) const
    {
        const Class* c = _schema.find_class(class_name);
        return c && c->name == class_name;
    }

    void check_association_end(const Class& c, const Feature& feature)
    {
        if (!is_set(c.qualifiers, "Association"))
            refuse(feature.place, "reference " + in_quotes(feature.name) + " in a class without Association");
        if (feature.subscript != 0)
            refuse(feature.place, "reference " + in_quotes(feature.name) + " is an array");
        if (is_set(feature.qualifiers, "Aggregate") && !is_set(c.qualifiers, "Aggregation"))
            refuse(feature.place, "aggregate " + in_quotes(feature.name) + " in a class without Aggregation");
    }

    /// A key must compare and print exactly: no lists, no embedded instances, no reals.
    void check_key(const Feature& feature)
    {
        if (!is_set(feature.qualifiers, "Key"))
            return;
        const TypeRow* type = find_type(feature.type);
        if (feature.subscript != 0 || feature.embedded != Embedded::No || (type && type->type_class == TypeClass::Real))
            refuse(feature.place, "key " + in_quotes(feature.name) + " is of a type that cannot be a key");
    }

    // --- methods ---

    void check_method(const Feature& method)
    {
        if (!find_type(method.type))
        {
            refuse(method.place,
                   "method " + in_quotes(method.name) + " returns the unsupported type " + in_quotes(method.type));
        }
        if (text_of(method.qualifiers, "EmbeddedInstance") || is_set(method.qualifiers, "EmbeddedObject"))
            refuse(method.place, "method " + in_quotes(method.name) + " returns an embedded instance");
        for (const Feature& parameter : method.parameters)
            check_parameter(method, parameter);
    }

    void check_parameter(const Feature& method, const Feature& parameter)
    {
        const auto first = std::find_if(method.parameters.begin(), method.parameters.end(),
                                        [&](const Feature& x) { return same_name(x.name, parameter.name); });
        if (&*first != &parameter)
            refuse(parameter.place, "parameter " + in_quotes(parameter.name) + " is declared twice");
        if (same_name(parameter.name, "return_value"))
            refuse(parameter.place, "\"return_value\" is a reserved name");
        check_name(parameter);
        if (parameter_flags(parameter).find("META_IN") == std::string::npos && !is_set(parameter.qualifiers, "Out"))
            refuse(parameter.place, "parameter " + in_quotes(parameter.name) + " is neither In nor Out");
        if (parameter.kind == FeatureKind::Property)
            check_property(parameter);
        else
            check_reference(parameter);
    }

    Schema& _schema;
    std::vector<std::string> _refusals;
};

} // namespace

std::vector<std::string> check(Schema& schema)
{
    std::vector<std::string> refusals = check_qualifiers(schema);
    const std::vector<std::string> others = Check(schema).run();
    refusals.insert(refusals.end(), others.begin(), others.end());
    const std::vector<std::string> maps = check_value_maps(schema);
    refusals.insert(refusals.end(), maps.begin(), maps.end());
    return refusals;
}

} // namespace schemac
