// What the MOF sources say, as read: qualifier declarations and classes with their features.
//
// The parser fills everything but the fields that check() resolves.
#pragma once

#include <cstddef>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace schemac
{

/// Where a declaration stands.
struct Place
{
    std::string file;
    int line = 0;
};

/// "file:line: reason"
std::string refusal(const Place& place, const std::string& reason);

/// Text that is not MOF of the supported subset; what() is the refusal.
class SyntaxError : public std::runtime_error
{
public:
    SyntaxError(const Place& place, const std::string& reason) : std::runtime_error(refusal(place, reason)) {}
};

struct Literal
{
    enum class Kind
    {
        Null,
        Boolean,
        Integer,
        Real,
        String,
    };
    Kind kind;
    std::string text; ///< decoded content of a string, otherwise as written (booleans in lower case)
};

/// A scalar (exactly one item) or a list in braces.
struct Value
{
    bool is_array = false;
    std::vector<Literal> items;
};

struct Qualifier
{
    std::string name;
    std::optional<Value> value;
    Place place;
};
using Qualifiers = std::vector<Qualifier>;

struct QualifierDeclaration
{
    std::string name;
    std::string type;
    bool is_array = false;
    std::optional<Value> default_value;
    std::vector<std::string> scopes;
    std::vector<std::string> flavors;
    Place place;
};

enum class FeatureKind
{
    Property,
    Reference,
    Method,
};

/// How a reference is declared: as a REF, or as a string that carries an instance.
enum class Embedded
{
    No,
    Object,   ///< of any class
    Instance, ///< of a named class
};

/// A property, reference or method of a class, or a parameter of a method.
struct Feature
{
    FeatureKind kind = FeatureKind::Property;
    Embedded embedded = Embedded::No;
    std::string name;
    std::string type;       ///< CIM type of a property, or what a method returns; empty for a REF
    std::string class_name; ///< of a reference; empty for an embedded object
    int subscript = 0;      ///< 0 scalar, -1 array, above 0 array of fixed length
    std::optional<Value> default_value;
    Qualifiers qualifiers;
    std::vector<Feature> parameters;
    Place place;

    // resolved by check()
    bool only_explains = false; ///< an override that changes nothing but texts, which the meta tables do not have
};

struct Class;

/// A feature as a class has it, with the class that declares or last overrides it.
struct Member
{
    const Feature* feature;
    const Class* declared_by;
};

struct Class
{
    std::string name;
    std::string superclass_name;
    Qualifiers qualifiers;
    std::vector<Feature> features; ///< declared here
    Place place;

    // resolved by check()
    const Class* superclass = nullptr;
    std::vector<Member> members;   ///< inherited ones in their order, then the own ones
    std::vector<std::size_t> keys; ///< indexes in `members`
};

struct Schema
{
    std::vector<QualifierDeclaration> qualifiers;
    std::vector<Class> classes;

    Schema() = default;
    Schema(Schema&&) = default;
    Schema& operator=(Schema&&) = default;

    const Class* find_class(std::string_view name) const;
    const QualifierDeclaration* find_qualifier(std::string_view name) const;
};

/// CIM names compare without case.
bool same_name(std::string_view a, std::string_view b);

const Qualifier* find(const Qualifiers& qualifiers, std::string_view name);

/// True if the qualifier stands there and is neither false nor null.
bool is_set(const Qualifiers& qualifiers, std::string_view name);

/// The text of a string qualifier; null if it is absent or has no text.
const std::string* text_of(const Qualifiers& qualifiers, std::string_view name);

/// The own features of a class without those that only explain inherited ones (checked classes only).
std::vector<Feature> recorded_features(const Class& c);

/// True if `ancestor` is `descendant` or one of its superclasses (resolved classes only).
bool is_or_derives_from(const Class* descendant, const Class* ancestor);

} // namespace schemac
