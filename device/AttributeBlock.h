// Numbered attributes as one call of the RM library returned them.
#pragma once

#include "device/RmApi.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>

namespace cimple
{

/// A buffer that the library fills and reads. A value counts only if it lies inside the buffer and is no shorter than
/// its form, since libraries round lengths up; anything else is a failure of status RM_ERROR. The readers leave `out`
/// alone on failure.
class AttributeBlock
{
public:
    /// `room` in bytes. The block is zeroed; allocated() is false when there is no memory for it.
    explicit AttributeBlock(std::uint32_t room);
    bool allocated() const { return _bytes != nullptr; }

    /// Fills the block by a fetch function such as LRM_GetHBAAttributes.
    template <class Fetch> RM_STATUS fetch(const Fetch& function, const HBA_WWN& wwpn)
    {
        std::uint32_t size = _room;
        return _bytes ? function(wwpn, _bytes.get(), &size) : RM_ERROR_NO_MEMORY;
    }

    RM_STATUS bytes(std::uint32_t id, std::span<const std::byte>& out) const;
    RM_STATUS number(std::uint32_t id, std::uint32_t& out) const;
    RM_STATUS counter(std::uint32_t id, std::uint64_t& out) const;
    /// At most 255 bytes, up to the first zero byte.
    RM_STATUS text(std::uint32_t id, std::string& out) const;

private:
    template <class Integer> RM_STATUS integer(std::uint32_t id, Integer& out) const;

    std::uint32_t _room;
    std::unique_ptr<std::byte[]> _bytes;
};

/// The readers above with the log lines of the attribute named `label`.
RM_STATUS readAdapterNumber(const AttributeBlock& block, std::uint32_t id, const char* label, std::uint32_t& out);
RM_STATUS readPortNumber(const AttributeBlock& block, std::uint32_t id, const char* label, std::uint32_t& out);
RM_STATUS readText(const AttributeBlock& block, std::uint32_t id, const char* label, std::string& out);
/// Six bytes as pairs of lower-case digits with colons between.
RM_STATUS readMacAddress(const AttributeBlock& block, std::uint32_t id, const char* label, std::string& out);

/// The log lines of an adapter number whose value came with `status` from elsewhere. Returns `status`.
RM_STATUS logAdapterNumber(RM_STATUS status, const char* label, std::uint32_t value);

} // namespace cimple
