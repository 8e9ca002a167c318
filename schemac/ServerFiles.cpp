// What CIM servers read: the classes, and which provider of which library serves each.
#include "schemac/CppNames.h"
#include "schemac/MofText.h"
#include "schemac/Output.h"

#include <algorithm>
#include <set>

namespace schemac
{

namespace
{

constexpr const char* library = "tavrin_fc_provider";
constexpr const char* name_space = "root/tavrin";

/// Classes below these are also served in the server's interop namespace, where clients look for profiles.
constexpr const char* profile_classes[] = {"CIM_RegisteredProfile", "CIM_ReferencedProfile",
                                           "CIM_ElementConformsToProfile"};

bool is_association(const Class& c)
{
    return is_set(c.qualifiers, "Association");
}

bool is_profile_class(const Schema& schema, const Class& c)
{
    return std::any_of(std::begin(profile_classes), std::end(profile_classes),
                       [&](const char* name)
                       {
                           const Class* profile_class = schema.find_class(name);
                           return profile_class && is_or_derives_from(&c, profile_class);
                       });
}

/// The served classes and all they need, each after the classes that it derives from or names.
class DependencyOrder
{
public:
    explicit DependencyOrder(const Schema& schema) : _schema(schema)
    {
        for (const Class& c : schema.classes)
        {
            if (is_served(c))
            {
                visit(&c);
            }
        }
    }

    const std::vector<const Class*>& classes() const { return _order; }

private:
    void visit(const Class* c)
    {
        if (!c || !_seen.insert(c).second)
        {
            return;
        }
        visit(c->superclass);
        visit_targets(c->features);
        _order.push_back(c);
    }

    void visit_targets(const std::vector<Feature>& features)
    {
        for (const Feature& feature : features)
        {
            if (!feature.class_name.empty())
            {
                visit(_schema.find_class(feature.class_name));
            }
            visit_targets(feature.parameters);
        }
    }

    const Schema& _schema;
    std::set<const Class*> _seen;
    std::vector<const Class*> _order;
};

OutputFile qualifier_file(const Schema& schema)
{
    std::string text = banner("the schema");
    for (const QualifierDeclaration& declaration : schema.qualifiers)
    {
        text += "\n" + mof_of(declaration);
    }
    return {"qualifiers.mof", text};
}

OutputFile class_file(const std::string& name, const DependencyOrder& order, bool served)
{
    std::string text = banner("the schema");
    for (const Class* c : order.classes())
    {
        if (is_served(*c) == served)
        {
            text += "\n" + mof_of(*c);
        }
    }
    return {name, text};
}

std::string provider_name(const Class& c)
{
    return c.name + "_Provider";
}

/// The small-footprint broker: one stanza a class.
std::string stanza(const Schema& schema, const Class& c)
{
    return "[" + c.name + "]\n   provider: " + provider_name(c) + "\n   location: " + library + "\n   type: instance " +
           (is_association(c) ? "association " : "") + "method\n   namespace: " + name_space +
           (is_profile_class(schema, c) ? " root/interop" : "") + "\n#\n";
}

/// The Open Group's server: instances for its interop namespace. Provider types: 2 instance, 3 association,
/// 5 method.
std::string module_instance(const std::string& version)
{
    return std::string("\ninstance of PG_ProviderModule {\n   Name = \"") + library +
           "\";\n   Vendor = \"Tavrin\";\n   Version = \"" + version +
           "\";\n   InterfaceType = \"CMPI\";\n   InterfaceVersion = \"2.0.0\";\n   Location = \"" + library +
           "\";\n};\n";
}

std::string provider_instances(const Schema& schema, const Class& c)
{
    const std::string module = std::string("   ProviderModuleName = \"") + library + "\";\n";
    return "\ninstance of PG_Provider {\n" + module + "   Name = \"" + provider_name(c) +
           "\";\n};\n\ninstance of PG_ProviderCapabilities {\n" + module + "   ProviderName = \"" + provider_name(c) +
           "\";\n   CapabilityID = \"" + c.name + "\";\n   ClassName = \"" + c.name + "\";\n   Namespaces = { \"" +
           name_space + "\"" + (is_profile_class(schema, c) ? ", \"root/PG_InterOp\"" : "") +
           " };\n   ProviderType = " + (is_association(c) ? "{ 2, 3, 5 }" : "{ 2, 5 }") +
           ";\n   SupportedProperties = NULL;\n   SupportedMethods = NULL;\n};\n";
}

} // namespace

OutputFiles write_server_files(const Schema& schema, const std::string& version)
{
    std::string stanzas;
    std::string instances = banner("the schema") + module_instance(version);
    for (const Class& c : schema.classes)
    {
        if (is_served(c))
        {
            stanzas += stanza(schema, c);
            instances += provider_instances(schema, c);
        }
    }
    const DependencyOrder order(schema);
    return {qualifier_file(schema), class_file("cim_classes.mof", order, false),
            class_file("tavrin_classes.mof", order, true), OutputFile{std::string(library) + ".reg", stanzas},
            OutputFile{std::string(library) + "_registration.mof", instances}};
}

} // namespace schemac
