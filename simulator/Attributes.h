// Numbered attributes of the RM library: their names in scenarios, and the buffer in which they travel.
#pragma once

#include "device/RmApi.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace tvrsim
{

enum class AttributeForm : std::uint8_t
{
    number,  ///< 4 bytes, native order
    counter, ///< 8 bytes, native order
    text,    ///< travels with a zero byte at its end
    bytes,
    absent, ///< the attribute does not exist, although it would follow from another member
};

struct Attribute
{
    bool operator==(const Attribute&) const = default;

    std::uint32_t id;
    AttributeForm form;
    std::string value; ///< the bytes as they travel, a text without its zero byte
};

using AttributeList = std::vector<Attribute>;

Attribute numberAttribute(std::uint32_t id, std::uint32_t value);
Attribute counterAttribute(std::uint32_t id, std::uint64_t value);
Attribute textAttribute(std::uint32_t id, std::string_view value);

/// Adds `attribute`, in the place of one with the same number if there is one.
void setAttribute(AttributeList& list, Attribute attribute);

/// Adds to each counter what `growth` has of its number. One that is not in the list, or not counted, stays so.
void growCounters(AttributeList& list, const AttributeList& growth);

/// How a scenario names an attribute.
struct AttributeRow
{
    const char* key;
    std::uint32_t id;
    AttributeForm form;
};

extern const std::span<const AttributeRow> adapterAttributeRows;
extern const std::span<const AttributeRow> portAttributeRows;
extern const std::span<const AttributeRow> statisticsRows;
extern const std::span<const AttributeRow> serverAttributeRows;

/// The buffer that carries `list`. With `terminated` false, texts lack their zero byte and fill all their room.
std::vector<std::byte> encodeAttributes(const AttributeList& list, bool terminated = true);

/// The value of attribute `id` in a buffer that encodeAttributes made, of which any end may be missing. Empty with a
/// null pointer if the attribute is not there or the buffer is damaged before it or in it.
std::span<const std::byte> findAttribute(std::span<const std::byte> buffer, std::uint32_t id);

/// Tells a buffer that was cut how long it is now, if its beginning is still there.
void markCut(std::span<std::byte> buffer);

/// The bytes in use of a buffer of unknown size, by its own words; 0 if it holds no attributes.
std::size_t usedBytes(const void* buffer);

} // namespace tvrsim
