#include "tests/unit/runtime/Records.h"

#include <iterator>

// Records derive from each other, so that offsetof() is only conditionally supported; both compilers do.
#pragma GCC diagnostic ignored "-Winvalid-offsetof"

namespace cimple
{
namespace
{

constexpr std::uint32_t READ = META_READ | META_PROPERTY;
constexpr std::uint32_t KEY = META_READ | META_KEY | META_PROPERTY;
constexpr std::uint32_t KEY_REFERENCE = META_KEY | META_REFERENCE;

constexpr Meta_Feature head(std::uint32_t flags, const char* name)
{
    return {0, flags, name, nullptr, 0};
}

constexpr Meta_Property scalar(std::uint32_t flags, const char* name, Type type, std::size_t offset,
                               const void* value = nullptr)
{
    return {head(flags, name), type, 0, static_cast<std::uint32_t>(offset), value};
}

constexpr Meta_Property array(std::uint32_t flags, const char* name, Type type, std::size_t offset,
                              const void* value = nullptr)
{
    return {head(flags, name), type, -1, static_cast<std::uint32_t>(offset), value};
}

constexpr Meta_Reference reference(std::uint32_t flags, const char* name, const Meta_Class* mc, std::size_t offset,
                                   std::int16_t subscript = 0)
{
    return {head(flags, name), subscript, mc, static_cast<std::uint32_t>(offset)};
}

template <std::size_t N>
constexpr Meta_Class meta_class(const char* name, std::uint32_t flags, const Meta_Feature* const (&features)[N],
                                const std::uint8_t (&locals)[N], std::size_t size, std::size_t num_keys,
                                const Meta_Class* super = nullptr)
{
    return {{head(flags, name), features, N, size}, locals, super, num_keys, &test_repository};
}

// T_Base
constexpr Meta_Property base_caption = scalar(READ, "Caption", STRING, offsetof(T_Base, Caption));
constexpr Meta_Property base_system = scalar(KEY, "System", STRING, offsetof(T_Base, System));
constexpr Meta_Property base_name = scalar(KEY, "Name", STRING, offsetof(T_Base, Name));
constexpr const Meta_Feature* base_features[] = {&base_caption, &base_system, &base_name};
constexpr std::uint8_t base_locals[] = {1, 1, 1};

// T_Disk and its method
constexpr std::uint64_t default_size = 512;
constexpr const char* default_since = "00000001000000.000000:000";
constexpr const char* default_vendor = "none";
constexpr std::uint16_t default_status[] = {2, 3};
constexpr Array_Default default_statuses = {default_status, std::size(default_status)};
constexpr const char* default_note[] = {"a", "b"};
constexpr Array_Default default_notes = {default_note, std::size(default_note)};

constexpr Meta_Property reset_force = scalar(META_IN | META_PROPERTY, "Force", BOOLEAN, offsetof(T_Disk_Reset, Force));
constexpr Meta_Reference reset_target =
    reference(META_IN | META_REFERENCE, "Target", &T_Base::static_meta_class, offsetof(T_Disk_Reset, Target));
constexpr Meta_Property reset_return =
    scalar(META_OUT | META_PROPERTY, "return_value", UINT32, offsetof(T_Disk_Reset, return_value));
constexpr const Meta_Feature* reset_features[] = {&reset_force, &reset_target, &reset_return};

constexpr Meta_Property disk_online = scalar(READ, "Online", BOOLEAN, offsetof(T_Disk, Online));
constexpr Meta_Property disk_size = scalar(READ, "Size", UINT64, offsetof(T_Disk, Size), &default_size);
constexpr Meta_Property disk_ratio = scalar(READ, "Ratio", REAL64, offsetof(T_Disk, Ratio));
constexpr Meta_Property disk_since = scalar(READ, "Since", DATETIME, offsetof(T_Disk, Since), &default_since);
constexpr Meta_Property disk_vendor = scalar(READ, "Vendor", STRING, offsetof(T_Disk, Vendor), &default_vendor);
constexpr Meta_Property disk_status = array(READ, "Status", UINT16, offsetof(T_Disk, Status), &default_statuses);
constexpr Meta_Property disk_notes = array(READ, "Notes", STRING, offsetof(T_Disk, Notes), &default_notes);
constexpr Meta_Reference disk_twin =
    reference(META_EMBEDDED_INSTANCE | META_REFERENCE, "Twin", &T_Base::static_meta_class, offsetof(T_Disk, Twin));
constexpr Meta_Reference disk_parts =
    reference(META_REFERENCE, "Parts", &T_Base::static_meta_class, offsetof(T_Disk, Parts), -1);
constexpr const Meta_Feature* disk_features[] = {
    &base_caption,
    &base_system,
    &base_name,
    &disk_online,
    &disk_size,
    &disk_ratio,
    &disk_since,
    &disk_vendor,
    &disk_status,
    &disk_notes,
    &disk_twin,
    &disk_parts,
    &T_Disk_Reset::static_meta_method,
};
constexpr std::uint8_t disk_locals[] = {0, 0, 0, 1, 1, 1, 1, 1, 1, 1, 1, 1, 1};

// T_OtherDisk
constexpr Meta_Property other_name = scalar(KEY, "NAME", STRING, offsetof(T_OtherDisk, Name));
constexpr const Meta_Feature* other_features[] = {&base_caption, &base_system, &other_name};
constexpr std::uint8_t other_locals[] = {0, 0, 1};

// T_Link and T_SubLink
constexpr Meta_Reference link_antecedent =
    reference(KEY_REFERENCE, "Antecedent", &T_Base::static_meta_class, offsetof(T_Link, Antecedent));
constexpr Meta_Reference link_dependent =
    reference(KEY_REFERENCE, "Dependent", &T_Base::static_meta_class, offsetof(T_Link, Dependent));
constexpr const Meta_Feature* link_features[] = {&link_antecedent, &link_dependent};
constexpr std::uint8_t link_locals[] = {1, 1};
constexpr Meta_Property sub_link_note = scalar(READ, "Note", STRING, offsetof(T_SubLink, Note));
constexpr const Meta_Feature* sub_link_features[] = {&link_antecedent, &link_dependent, &sub_link_note};
constexpr std::uint8_t sub_link_locals[] = {0, 0, 1};

// T_Typed
constexpr Meta_Property typed_flag = scalar(KEY, "Flag", BOOLEAN, offsetof(T_Typed, Flag));
constexpr Meta_Property typed_u8 = scalar(KEY, "U8", UINT8, offsetof(T_Typed, U8));
constexpr Meta_Property typed_s64 = scalar(KEY, "S64", SINT64, offsetof(T_Typed, S64));
constexpr Meta_Property typed_u64 = scalar(KEY, "U64", UINT64, offsetof(T_Typed, U64));
constexpr Meta_Property typed_text = scalar(KEY, "Text", STRING, offsetof(T_Typed, Text));
constexpr Meta_Reference typed_owner =
    reference(KEY_REFERENCE, "Owner", &T_Base::static_meta_class, offsetof(T_Typed, Owner));
constexpr Meta_Property typed_comment = scalar(READ, "Comment", STRING, offsetof(T_Typed, Comment));
constexpr const Meta_Feature* typed_features[] = {&typed_flag, &typed_u8,    &typed_s64,    &typed_u64,
                                                  &typed_text, &typed_owner, &typed_comment};
constexpr std::uint8_t typed_locals[] = {1, 1, 1, 1, 1, 1, 1};

// T_Odd
constexpr Meta_Property odd_real = scalar(KEY, "Real", REAL32, offsetof(T_Odd, Real));
constexpr Meta_Property odd_when = scalar(KEY, "When", DATETIME, offsetof(T_Odd, When));
constexpr Meta_Property odd_list = array(KEY, "List", UINT16, offsetof(T_Odd, List));
constexpr Meta_Reference odd_others =
    reference(KEY_REFERENCE, "Others", &T_Base::static_meta_class, offsetof(T_Odd, Others), -1);
constexpr const Meta_Feature* odd_features[] = {&odd_real, &odd_when, &odd_list, &odd_others};
constexpr std::uint8_t odd_locals[] = {1, 1, 1, 1};

// T_Stranger
constexpr Meta_Property stranger_system = scalar(KEY, "System", STRING, offsetof(T_Stranger, System));
constexpr Meta_Property stranger_name = scalar(KEY, "Name", UINT32, offsetof(T_Stranger, Name));
constexpr const Meta_Feature* stranger_features[] = {&stranger_system, &stranger_name};
constexpr std::uint8_t stranger_locals[] = {1, 1};

constexpr const Meta_Class* test_classes[] = {
    &T_Base::static_meta_class, &T_Disk::static_meta_class,     &T_OtherDisk::static_meta_class,
    &T_Link::static_meta_class, &T_SubLink::static_meta_class,  &T_Typed::static_meta_class,
    &T_Odd::static_meta_class,  &T_Stranger::static_meta_class,
};

} // namespace

constinit const Meta_Repository test_repository = {test_classes, std::size(test_classes)};

constinit const Meta_Method T_Disk_Reset::static_meta_method = {
    {head(META_METHOD, "Reset"), reset_features, std::size(reset_features), sizeof(T_Disk_Reset)}, UINT32};

constinit const Meta_Class T_Base::static_meta_class =
    meta_class("T_Base", META_CLASS, base_features, base_locals, sizeof(T_Base), 2);
constinit const Meta_Class T_Disk::static_meta_class =
    meta_class("T_Disk", META_CLASS, disk_features, disk_locals, sizeof(T_Disk), 2, &T_Base::static_meta_class);
constinit const Meta_Class T_OtherDisk::static_meta_class = meta_class(
    "T_OtherDisk", META_CLASS, other_features, other_locals, sizeof(T_OtherDisk), 2, &T_Base::static_meta_class);
constinit const Meta_Class T_Link::static_meta_class =
    meta_class("T_Link", META_ASSOCIATION, link_features, link_locals, sizeof(T_Link), 2);
constinit const Meta_Class T_SubLink::static_meta_class =
    meta_class("T_SubLink", META_ASSOCIATION, sub_link_features, sub_link_locals, sizeof(T_SubLink), 2,
               &T_Link::static_meta_class);
constinit const Meta_Class T_Typed::static_meta_class =
    meta_class("T_Typed", META_CLASS, typed_features, typed_locals, sizeof(T_Typed), 6);
constinit const Meta_Class T_Odd::static_meta_class =
    meta_class("T_Odd", META_CLASS, odd_features, odd_locals, sizeof(T_Odd), 4);
constinit const Meta_Class T_Stranger::static_meta_class =
    meta_class("T_Stranger", META_CLASS, stranger_features, stranger_locals, sizeof(T_Stranger), 2);

} // namespace cimple
