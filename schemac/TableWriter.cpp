// Meta tables: constant records of every property, reference, method and class, and the repository.
#include "schemac/CppNames.h"
#include "schemac/Output.h"
#include "schemac/Types.h"

#include <set>

namespace schemac
{

namespace
{

constexpr const char* namespace_begin = "\nnamespace cimple\n{\n\n";
constexpr const char* namespace_end = "\n} // namespace cimple\n";

/// A braced list with so many items to a line.
std::string braced(const std::vector<std::string>& items, std::size_t per_line)
{
    std::string text = "{";
    for (std::size_t i = 0; i < items.size(); i++)
    {
        text += i == 0 ? "" : ",";
        text += i % per_line == 0 ? "\n    " : " ";
        text += items[i];
    }
    return text + "}";
}

std::string feature_head(const std::string& flags, const std::string& name)
{
    return "{0, " + flags + ", " + as_string_literal(name) + ", nullptr, 0}";
}

/// Name of the record of a property or reference that a class declares.
std::string record_name(const Class& c, const Feature& feature)
{
    return c.name + "_" + feature.name;
}

std::string address_of_record(const Member& member)
{
    return "&" + (member.feature->kind == FeatureKind::Method
                      ? method_record_name(*member.declared_by, *member.feature) + "::static_meta_method"
                      : "features::" + record_name(*member.declared_by, *member.feature));
}

std::string offset_of(const std::string& record, const std::string& slot)
{
    return "offsetof(" + record + ", " + slot + ")";
}

/// Ties a slot to the layout rule that generic code goes by: the value, then one null byte right behind it; a
/// single reference is one pointer.
std::string layout_check(const std::string& record, const Feature& feature)
{
    if (feature.kind == FeatureKind::Reference && feature.subscript == 0)
        return "static_assert(sizeof(" + record + "::" + feature.name + ") == sizeof(void*));\n";
    const std::string width = feature.subscript == 0 ? width_of(*find_type(feature.type)) : "sizeof(void*)";
    return "static_assert(" + offset_of(record, feature.name + ".null") + " == " + offset_of(record, feature.name) +
           " + " + width + ");\n";
}

/// Declares the default of a property and yields the expression of its address; "nullptr" if there is none.
std::string default_value(const std::string& name, const Feature& feature, std::string& text)
{
    const std::optional<Value>& value = feature.default_value;
    if (!value)
        return "nullptr";
    const TypeRow& type = *find_type(feature.type);
    const bool is_text = type.type_class == TypeClass::Text || type.type_class == TypeClass::Datetime;
    const std::string cpp = is_text ? "const char* const " : std::string("const ") + type.cpp + " ";
    std::vector<std::string> items;
    for (const Literal& item : value->items)
        items.push_back(cpp_value(type, item));
    if (!value->is_array)
    {
        text += "static constinit " + cpp + name + "_default = " + items.front() + ";\n";
        return "&" + name + "_default";
    }
    const bool empty = items.empty();
    if (!empty)
        text += "static constinit " + cpp + name + "_default_items[] = " + braced(items, 8) + ";\n";
    text += "static constinit const Array_Default " + name + "_default = {" +
            (empty ? "nullptr" : name + "_default_items") + ", " + std::to_string(items.size()) + "};\n";
    return "&" + name + "_default";
}

/// Name of the record type of what is referenced.
std::string target_of(const Feature& reference)
{
    return reference.embedded == Embedded::Object ? "Instance" : reference.class_name;
}

/// Definition of the record `name` of a property or reference in `record`.
std::string feature_record(const std::string& storage, const std::string& name, const std::string& record,
                           const Feature& feature, const std::string& flags)
{
    std::string text;
    const std::string head = feature_head(flags, feature.name);
    const std::string subscript = std::to_string(feature.subscript);
    const std::string offset = offset_of(record, feature.name);
    if (feature.kind == FeatureKind::Reference)
    {
        return storage + "constinit const Meta_Reference " + name + " = {" + head + ", " + subscript + ", &" +
               target_of(feature) + "::static_meta_class, " + offset + "};\n";
    }
    const std::string value = default_value(name, feature, text);
    return text + storage + "constinit const Meta_Property " + name + " = {" + head + ", " +
           find_type(feature.type)->code + ", " + subscript + ", " + offset + ", " + value + "};\n";
}

std::string method_table(const Class& c, const Feature& method)
{
    const std::string record = method_record_name(c, method);
    std::vector<Feature> parameters = method.parameters;
    parameters.push_back(return_value_of(method));
    std::string text;
    std::vector<std::string> addresses;
    for (const Feature& parameter : parameters)
    {
        const std::string name = record + "_" + parameter.name;
        text += feature_record("static ", name, record, parameter, parameter_flags(parameter));
        text += layout_check(record, parameter);
        addresses.push_back("&" + name);
    }
    text += "static constinit const Meta_Feature* const " + record + "_features[] = " + braced(addresses, 1) + ";\n";
    text += "constinit const Meta_Method " + record + "::static_meta_method = {\n    {" +
            feature_head(feature_flags(method), method.name) + ", " + record + "_features, " +
            std::to_string(parameters.size()) + ", sizeof(" + record + ")}, " + find_type(method.type)->code + "};\n\n";
    return text;
}

std::string class_table(const Class& c)
{
    std::vector<std::string> addresses;
    std::vector<std::string> locals;
    std::vector<std::string> keys;
    for (std::size_t index : c.keys)
        keys.push_back(std::to_string(index));
    for (const Member& member : c.members)
    {
        addresses.push_back(address_of_record(member));
        locals.push_back(member.declared_by == &c ? "1" : "0");
    }
    std::string text;
    const bool empty = c.members.empty();
    if (!empty)
    {
        text +=
            "static constinit const Meta_Feature* const " + c.name + "_features[] = " + braced(addresses, 1) + ";\n";
        text += "static constinit const std::uint8_t " + c.name + "_locals[] = " + braced(locals, 32) + ";\n";
    }
    if (!keys.empty())
        text += "static constinit const std::uint16_t " + c.name + "_keys[] = " + braced(keys, 32) + ";\n";
    const std::string superclass = c.superclass ? "&" + c.superclass->name + "::static_meta_class" : "nullptr";
    return text + "constinit const Meta_Class " + c.name + "::static_meta_class = {\n    {" +
           feature_head(class_flags(c), c.name) + ", " + (empty ? "nullptr" : c.name + "_features") + ", " +
           std::to_string(c.members.size()) + ", sizeof(" + c.name + ")},\n    " +
           (empty ? "nullptr" : c.name + "_locals") + ", " + superclass + ", " + std::to_string(c.keys.size()) +
           ", &the_repository, " + (keys.empty() ? "nullptr" : c.name + "_keys") + "};\n";
}

std::string tables_of(const Class& c)
{
    std::string features;
    std::string methods;
    for (const Feature& feature : recorded_features(c))
    {
        if (feature.kind == FeatureKind::Method)
        {
            methods += method_table(c, feature);
            continue;
        }
        features += feature_record("", record_name(c, feature), c.name, feature, feature_flags(feature));
        if (!find(feature.qualifiers, "Override"))
            features += layout_check(c.name, feature);
    }
    return "// --- " + c.name + " ---\n\n" +
           (features.empty() ? "" : "namespace features\n{\n" + features + "} // namespace features\n\n") + methods +
           class_table(c);
}

/// Declarations of the records of properties and references, which tables of subclasses share.
OutputFile feature_declarations(const Schema& schema)
{
    std::string text = banner("the schema") + "#pragma once\n\n#include \"runtime/meta/Meta.h\"\n" +
                       "\nnamespace cimple::features\n{\n\n";
    for (const Class& c : schema.classes)
    {
        for (const Feature& feature : recorded_features(c))
        {
            if (feature.kind != FeatureKind::Method)
            {
                const bool reference = feature.kind == FeatureKind::Reference;
                text += std::string("extern const ") + (reference ? "Meta_Reference " : "Meta_Property ") +
                        record_name(c, feature) + ";\n";
            }
        }
    }
    return {"schema/Features.h", text + "\n} // namespace cimple::features\n"};
}

void collect_headers(const Schema& schema, const std::vector<Feature>& features, std::set<std::string>& headers)
{
    for (const Feature& feature : features)
    {
        if (feature.kind == FeatureKind::Reference && feature.embedded != Embedded::Object)
            headers.insert(header_name(*schema.find_class(feature.class_name)));
        collect_headers(schema, feature.parameters, headers);
    }
}

OutputFile chunk(const Schema& schema, std::size_t number, std::size_t begin, std::size_t end)
{
    std::set<std::string> headers = {"schema/Features.h", "schema/Repository.h"};
    std::string tables;
    for (std::size_t i = begin; i < end; i++)
    {
        const Class& c = schema.classes[i];
        headers.insert(header_name(c));
        collect_headers(schema, recorded_features(c), headers);
        tables += (i == begin ? "" : "\n") + tables_of(c);
    }
    std::string text = banner("the schema");
    for (const std::string& header : headers)
        text += "#include \"" + header + "\"\n";
    text +=
        "\n#include <cstddef>\n\n"
        "// Records have a base class and are therefore no standard-layout types; their layout is nevertheless fixed.\n"
        "#pragma GCC diagnostic ignored \"-Winvalid-offsetof\"\n";
    return {"schema/Tables" + std::to_string(number) + ".cpp", text + namespace_begin + tables + namespace_end};
}

OutputFiles repository(const Schema& schema)
{
    const std::string header =
        banner("the schema") + "#pragma once\n\n#include \"runtime/meta/Meta.h\"\n" + namespace_begin +
        "/// All classes, in the order of the schema sources: a class stands after its superclass.\n"
        "extern const Meta_Repository the_repository;\n" +
        namespace_end;
    std::string text = banner("the schema") + "#include \"schema/Repository.h\"\n\n";
    std::vector<std::string> addresses;
    for (const Class& c : schema.classes)
    {
        text += "#include \"" + header_name(c) + "\"\n";
        addresses.push_back("&" + c.name + "::static_meta_class");
    }
    text += namespace_begin + std::string("static constinit const Meta_Class* const classes[] = ") +
            braced(addresses, 1) + ";\nconstinit const Meta_Repository the_repository = {classes, " +
            std::to_string(addresses.size()) + "};\n" + namespace_end;
    return {{"schema/Repository.h", header}, {"schema/Repository.cpp", text}};
}

} // namespace

OutputFiles write_tables(const Schema& schema, std::size_t chunks)
{
    OutputFiles files = repository(schema);
    files.push_back(feature_declarations(schema));
    const std::size_t count = schema.classes.size();
    for (std::size_t i = 0; i < chunks; i++)
        files.push_back(chunk(schema, i, count * i / chunks, count * (i + 1) / chunks));
    return files;
}

} // namespace schemac
