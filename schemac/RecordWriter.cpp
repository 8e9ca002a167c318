// Record types: a class per CIM class and per method, with a slot per own property, reference and parameter.
#include "schemac/CppNames.h"
#include "schemac/Output.h"
#include "schemac/Types.h"

#include <set>

namespace schemac
{

namespace
{

std::string slot_type(const Feature& feature)
{
    if (feature.kind == FeatureKind::Reference)
    {
        const std::string target = feature.embedded == Embedded::Object ? "Instance" : feature.class_name;
        return feature.subscript == 0 ? target + "*" : "Property<Array<Instance*>>";
    }
    const std::string value = find_type(feature.type)->cpp;
    return feature.subscript == 0 ? "Property<" + value + ">" : "Property<Array<" + value + ">>";
}

std::string slot(const Feature& feature)
{
    return "    " + slot_type(feature) + " " + feature.name + ";\n";
}

/// Classes that slots point to; they are declared ahead, so that headers do not include each other.
void collect_targets(const std::vector<Feature>& features, std::set<std::string>& targets)
{
    for (const Feature& feature : features)
    {
        if (feature.kind == FeatureKind::Reference && feature.subscript == 0 && feature.embedded != Embedded::Object)
            targets.insert(feature.class_name);
        collect_targets(feature.parameters, targets);
    }
}

std::string record(const std::string& name, const std::string& base, const std::string& slots, const std::string& meta)
{
    return "class " + name + " : public " + base + "\n{\npublic:\n" + slots + (slots.empty() ? "" : "\n") +
           "    static const " + meta + ";\n};\n";
}

std::string class_record(const Class& c)
{
    std::string slots;
    for (const Feature& feature : recorded_features(c))
        if (feature.kind != FeatureKind::Method && !find(feature.qualifiers, "Override"))
            slots += slot(feature);
    return record(c.name, c.superclass ? c.superclass->name : "Instance", slots, "Meta_Class static_meta_class");
}

std::string method_record(const Class& c, const Feature& method)
{
    std::string slots = "    using Class = " + c.name + ";\n";
    for (const Feature& parameter : method.parameters)
        slots += slot(parameter);
    slots += slot(return_value_of(method));
    return "\n" + record(method_record_name(c, method), "Instance", slots, "Meta_Method static_meta_method");
}

OutputFile class_header(const Class& c)
{
    std::string text = banner(c.place.file) + "#pragma once\n\n#include \"" +
                       (c.superclass ? header_name(*c.superclass) : "runtime/meta/Instance.h") +
                       "\"\n\nnamespace cimple\n{\n\n";
    std::set<std::string> targets;
    collect_targets(recorded_features(c), targets);
    targets.erase(c.name);
    for (const std::string& target : targets)
        text += "class " + target + ";\n";
    text += (targets.empty() ? "" : "\n") + class_record(c);
    for (const Feature& feature : recorded_features(c))
        if (feature.kind == FeatureKind::Method)
            text += method_record(c, feature);
    return {header_name(c), text + "\n} // namespace cimple\n"};
}

} // namespace

OutputFiles write_records(const Schema& schema)
{
    OutputFiles files;
    std::string all = banner("the schema") + "#pragma once\n\n";
    for (const Class& c : schema.classes)
    {
        files.push_back(class_header(c));
        if (is_served(c))
            all += "#include \"" + header_name(c) + "\"\n";
    }
    files.push_back({"schema/AllClasses.h", all});
    return files;
}

} // namespace schemac
