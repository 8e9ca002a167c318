#include "schemac/Check.h"
#include "schemac/Types.h"

#include <algorithm>

namespace schemac
{

namespace
{

class QualifierCheck
{
public:
    explicit QualifierCheck(const Schema& schema) : _schema(schema) {}

    std::vector<std::string> run()
    {
        for (const QualifierDeclaration& declaration : _schema.qualifiers)
            check_declaration(declaration);
        for (const Class& c : _schema.classes)
        {
            check_uses(c.qualifiers, class_scopes(c));
            for (const Feature& feature : c.features)
                check_feature(feature);
        }
        return std::move(_refusals);
    }

private:
    void refuse(const Place& place, const std::string& reason) { _refusals.push_back(refusal(place, reason)); }

    void check_declaration(const QualifierDeclaration& declaration)
    {
        if (_schema.find_qualifier(declaration.name) != &declaration)
            refuse(declaration.place, "qualifier \"" + declaration.name + "\" is declared twice");
        if (!find_type(declaration.type))
        {
            refuse(declaration.place,
                   "qualifier \"" + declaration.name + "\" has the unknown type \"" + declaration.type + "\"");
        }
        else if (declaration.default_value)
        {
            check_value(declaration, *declaration.default_value, declaration.place);
        }
    }

    /// The scopes that allow a qualifier on the class. An association and an indication have scopes of their own.
    static std::vector<std::string> class_scopes(const Class& c)
    {
        if (is_set(c.qualifiers, "Association"))
            return {"association"};
        return is_set(c.qualifiers, "Indication") ? std::vector<std::string>{"class", "indication"}
                                                  : std::vector<std::string>{"class"};
    }

    void check_feature(const Feature& feature)
    {
        switch (feature.kind)
        {
        case FeatureKind::Property:
            check_uses(feature.qualifiers, {"property"});
            break;
        case FeatureKind::Reference:
            check_uses(feature.qualifiers, {feature.embedded == Embedded::No ? "reference" : "property"});
            break;
        case FeatureKind::Method:
            check_uses(feature.qualifiers, {"method"});
            for (const Feature& parameter : feature.parameters)
                check_uses(parameter.qualifiers, {"parameter"});
        }
    }

    void check_uses(const Qualifiers& uses, const std::vector<std::string>& scopes)
    {
        for (const Qualifier& use : uses)
        {
            const std::string what = "qualifier \"" + use.name + "\"";
            const QualifierDeclaration* declaration = _schema.find_qualifier(use.name);
            if (!declaration)
            {
                refuse(use.place, "unknown " + what);
                continue;
            }
            if (find(uses, use.name) != &use)
                refuse(use.place, what + " stands there twice");
            if (!allowed(*declaration, scopes))
                refuse(use.place, what + " is not allowed on a " + scopes.back());
            check_use(*declaration, use);
        }
    }

    static bool allowed(const QualifierDeclaration& declaration, const std::vector<std::string>& scopes)
    {
        return std::any_of(declaration.scopes.begin(), declaration.scopes.end(),
                           [&](const std::string& allowed)
                           {
                               return same_name(allowed, "any") ||
                                      std::any_of(scopes.begin(), scopes.end(),
                                                  [&](const std::string& scope) { return same_name(allowed, scope); });
                           });
    }

    void check_use(const QualifierDeclaration& declaration, const Qualifier& use)
    {
        if (use.value)
            check_value(declaration, *use.value, use.place);
        else if (!same_name(declaration.type, "boolean") || declaration.is_array)
            refuse(use.place, "qualifier \"" + use.name + "\" needs a value");
    }

    void check_value(const QualifierDeclaration& declaration, const Value& value, const Place& place)
    {
        const TypeRow* type = find_type(declaration.type);
        const bool null = !value.is_array && value.items.front().kind == Literal::Kind::Null;
        const bool fits = type && value.is_array == declaration.is_array &&
                          std::all_of(value.items.begin(), value.items.end(),
                                      [&](const Literal& item) { return !cpp_value(*type, item).empty(); });
        if (!fits && !null)
        {
            refuse(place, "qualifier \"" + declaration.name + "\" takes a " + declaration.type +
                              (declaration.is_array ? " list" : ""));
        }
    }

    const Schema& _schema;
    std::vector<std::string> _refusals;
};

} // namespace

std::vector<std::string> check_qualifiers(const Schema& schema)
{
    return QualifierCheck(schema).run();
}

} // namespace schemac
