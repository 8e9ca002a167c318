// The meta model: read-only records that describe every class, property, reference and method.
//
// All generic work of the runtime (clone, compare, null out, convert, print) walks these records. The
// generated tables are constant data whose `refs` is 0; a count of 0 marks a static record that is never
// counted, written or freed. Records built at run time (see MetaDynamic.h) start with `refs` 1.
#pragma once

#include "runtime/values/LowerCase.h"
#include "runtime/values/Types.h"

#include <cstddef>
#include <cstdint>

namespace cimple
{

/// Bits of `flags`; bit n has the n-th name of flag_name().
enum Meta_Flag : std::uint32_t
{
    META_PROPERTY = 0x00000001,
    META_REFERENCE = 0x00000002,
    META_METHOD = 0x00000004,
    META_CLASS = 0x00000008,
    META_ABSTRACT = 0x00000010,
    META_AGGREGATE = 0x00000020,
    META_AGGREGATION = 0x00000040,
    META_ASSOCIATION = 0x00000080,
    META_COMPOSITION = 0x00000100,
    META_COUNTER = 0x00000200,
    META_DELETE = 0x00000400,
    META_DN = 0x00000800,
    META_EMBEDDED_OBJECT = 0x00001000,
    META_EXCEPTION = 0x00002000,
    META_EXPENSIVE = 0x00004000,
    META_EXPERIMENTAL = 0x00008000,
    META_GAUGE = 0x00010000,
    META_IF_DELETED = 0x00020000,
    META_IN = 0x00040000,
    META_INDICATION = 0x00080000,
    META_INVISIBLE = 0x00100000,
    META_KEY = 0x00200000,
    META_LARGE = 0x00400000,
    META_OCTET_STRING = 0x00800000,
    META_OUT = 0x01000000,
    META_READ = 0x02000000,
    META_REQUIRED = 0x04000000,
    META_STATIC = 0x08000000,
    META_TERMINAL = 0x10000000,
    META_WEAK = 0x20000000,
    META_WRITE = 0x40000000,
    META_EMBEDDED_INSTANCE = 0x80000000,
};

/// Masks of find_feature().
inline constexpr std::uint32_t any_feature = META_PROPERTY | META_REFERENCE | META_METHOD;
inline constexpr std::uint32_t property_or_reference = META_PROPERTY | META_REFERENCE;

/// The names of the flags, by bit.
inline constexpr const char* flag_names[32] = {
    "Property",
    "Reference",
    "Method",
    "Class",
    "Abstract",
    "Aggregate",
    "Aggregation",
    "Association",
    "Composition",
    "Counter",
    "Delete",
    "DN",
    "EmbeddedObject",
    "Exception",
    "Expensive",
    "Experimental",
    "Gauge",
    "IfDeleted",
    "In",
    "Indication",
    "Invisible",
    "Key",
    "Large",
    "OctetString",
    "Out",
    "Read",
    "Required",
    "Static",
    "Terminal",
    "Weak",
    "Write",
    "EmbeddedInstance",
};

/// Name of flag bit `bit` ("Property", "Reference", ...); null above 31.
const char* flag_name(unsigned bit);

/// Bit number of a flag (qualifier) name, case-insensitive; -1 if it is none.
int flag_bit(const char* name);

struct Meta_Qualifier
{
    std::uint32_t refs;
    const char* name;
    std::uint8_t type;  ///< CIM type code
    std::uint8_t array; ///< boolean
    const void* value;
};

/// Head of every feature record. The kind is in bits 0 to 2 of `flags`.
struct Meta_Feature
{
    std::uint32_t refs;
    std::uint32_t flags;
    const char* name;
    const Meta_Qualifier* const* meta_qualifiers;
    std::size_t num_meta_qualifiers;
};

/// Elements of an array default: `data` points to `size` raw values (char pointers for string and datetime).
struct Array_Default
{
    const void* data;
    std::size_t size;
};

struct Meta_Property : Meta_Feature
{
    std::uint16_t type;     ///< Type
    std::int16_t subscript; ///< 0 scalar, -1 variable-length array, above 0 fixed length
    std::uint32_t offset;   ///< of the slot in the instance
    const void* value;      ///< default or null: raw value, or an Array_Default for arrays
};

struct Meta_Class;
struct Meta_Repository;

struct Meta_Reference : Meta_Feature
{
    std::int16_t subscript; ///< 0 a single reference, otherwise an array of references
    const Meta_Class* meta_class;
    std::uint32_t offset; ///< of the pointer slot or array slot in the instance
};

/// What classes and method records share: a list of features laid out in a record of `size` bytes.
/// A method's parameter record is an instance whose `__meta_class` points to its Meta_Method.
struct Meta_Record : Meta_Feature
{
    const Meta_Feature* const* meta_features;
    std::size_t num_meta_features;
    std::size_t size;
};

/// The last parameter is always "return_value" (flag Out, type `return_type`).
struct Meta_Method : Meta_Record
{
    std::uint16_t return_type;
};

struct Meta_Class : Meta_Record
{
    const std::uint8_t* locals; ///< one per feature: 1 declared here, 0 inherited
    const Meta_Class* super_meta_class;
    std::size_t num_keys; ///< of the whole chain
    const Meta_Repository* meta_repository;
    const std::uint16_t* keys = nullptr; ///< indexes of the num_keys key features, or null: their flags tell
};

struct Meta_Repository
{
    const Meta_Class* const* meta_classes;
    std::size_t num_meta_classes;
};

/// Counts a record up or down; both do nothing to a record whose count is 0. The count reaching 0 frees a
/// dynamic record of its kind.
void ref_meta(const Meta_Feature* record);
void unref_meta(const Meta_Class* mc);
void unref_meta(const Meta_Feature* feature);

/// First feature named `name` whose flags share a bit with `mask`; null if there is none. Linear.
const Meta_Feature* find_feature(const Meta_Record* mc, const char* name, std::uint32_t mask = any_feature);

inline const Meta_Property* as_property(const Meta_Feature* mf)
{
    return mf && (mf->flags & META_PROPERTY) ? static_cast<const Meta_Property*>(mf) : nullptr;
}
inline const Meta_Reference* as_reference(const Meta_Feature* mf)
{
    return mf && (mf->flags & META_REFERENCE) ? static_cast<const Meta_Reference*>(mf) : nullptr;
}
inline const Meta_Method* as_method(const Meta_Feature* mf)
{
    return mf && (mf->flags & META_METHOD) ? static_cast<const Meta_Method*>(mf) : nullptr;
}

/// Class by name, case-insensitive, linear; null if absent or the repository is null.
const Meta_Class* find_class(const Meta_Repository* repository, const char* name);

/// Searches `mc` and its superclasses, then its repository.
const Meta_Class* find_class_in_chain(const Meta_Class* mc, const char* name);

/// True if `ancestor` is the root class or is `descendant` or one of its superclasses (by pointer, then name).
bool is_subclass(const Meta_Class* ancestor, const Meta_Class* descendant);

/// 0 yes, 1 no, -1 when an argument is missing or a class is unknown.
int is_subclass_by_name(const Meta_Repository* repository, const char* ancestor, const char* descendant);

/// True if `mc` or one of its superclasses has this name, case-insensitive.
bool is_or_derives_from(const Meta_Class* mc, const char* name);

/// The same as a client's filter by class: null or empty lets every class pass.
bool fits_class(const Meta_Class* mc, const char* filter);

/// True when some feature of the class has a bit of `mask`.
bool has_flag(const Meta_Record* mc, std::uint32_t mask);

} // namespace cimple
