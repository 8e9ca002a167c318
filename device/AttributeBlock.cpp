#include "device/AttributeBlock.h"

#include "device/Bindings.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <new>

namespace cimple
{

namespace
{

constexpr std::size_t maxText = 255;

RM_STATUS logText(RM_STATUS status, const char* label, const std::string& text)
{
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "%s : [ %s ]", label, text.c_str());
    else
        TVR_LOG(TVR_DBG, "ERROR: %s: RM_GetHBAAttributes call failed (%d)", label, status);
    return status;
}

} // namespace

AttributeBlock::AttributeBlock(std::uint32_t room) : _room(room), _bytes(new (std::nothrow) std::byte[room]{})
{
    if (!_bytes)
        ++left_out_for_memory;
}

RM_STATUS AttributeBlock::bytes(std::uint32_t id, std::span<const std::byte>& out) const
{
    if (!_bytes)
        return RM_ERROR_NO_MEMORY;
    std::uint32_t length = 0;
    RM_STATUS status = RM_OK;
    const void* value = RM_GetAttributeValue(_bytes.get(), id, &length, &status);
    if (status != RM_OK)
        return status;
    // The pointer comes from a foreign library: compare it as a number, it may point anywhere.
    const auto begin = reinterpret_cast<std::uintptr_t>(_bytes.get());
    const auto position = reinterpret_cast<std::uintptr_t>(value);
    if (position < begin || position - begin > _room || length > _room - (position - begin))
        return RM_ERROR;
    out = {_bytes.get() + (position - begin), length};
    return RM_OK;
}

template <class Integer> RM_STATUS AttributeBlock::integer(std::uint32_t id, Integer& out) const
{
    std::span<const std::byte> value;
    if (RM_STATUS status = bytes(id, value); status != RM_OK)
        return status;
    if (value.size() < sizeof out)
        return RM_ERROR;
    std::memcpy(&out, value.data(), sizeof out);
    return RM_OK;
}

RM_STATUS AttributeBlock::number(std::uint32_t id, std::uint32_t& out) const
{
    return integer(id, out);
}

RM_STATUS AttributeBlock::counter(std::uint32_t id, std::uint64_t& out) const
{
    return integer(id, out);
}

RM_STATUS AttributeBlock::text(std::uint32_t id, std::string& out) const
{
    std::span<const std::byte> value;
    if (RM_STATUS status = bytes(id, value); status != RM_OK)
        return status;
    const auto* text = reinterpret_cast<const char*>(value.data());
    out.assign(text, strnlen(text, std::min(value.size(), maxText)));
    return RM_OK;
}

RM_STATUS logAdapterNumber(RM_STATUS status, const char* label, std::uint32_t value)
{
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "%s: [ %d ]", label, value);
    else
        TVR_LOG(TVR_DBG, "ERROR: RM_GetHBAAttributeValue HA_%s call failed (%d)", label, status);
    return status;
}

RM_STATUS readAdapterNumber(const AttributeBlock& block, std::uint32_t id, const char* label, std::uint32_t& out)
{
    const RM_STATUS status = block.number(id, out);
    return logAdapterNumber(status, label, out);
}

RM_STATUS readPortNumber(const AttributeBlock& block, std::uint32_t id, const char* label, std::uint32_t& out)
{
    const RM_STATUS status = block.number(id, out);
    if (status == RM_OK)
        TVR_LOG(TVR_DBG, "%s: [ %d ]", label, out);
    else
        TVR_LOG(TVR_DBG, "ERROR: RM_GetPortAttributes HA_%s call failed (%d)", label, status);
    return status;
}

RM_STATUS readText(const AttributeBlock& block, std::uint32_t id, const char* label, std::string& out)
{
    const RM_STATUS status = block.text(id, out);
    return logText(status, label, out);
}

RM_STATUS readMacAddress(const AttributeBlock& block, std::uint32_t id, const char* label, std::string& out)
{
    std::span<const std::byte> value;
    RM_STATUS status = block.bytes(id, value);
    if (status == RM_OK && value.size() < 6)
        status = RM_ERROR;
    if (status == RM_OK)
    {
        const auto* b = reinterpret_cast<const unsigned char*>(value.data());
        char text[18];
        std::snprintf(text, sizeof text, "%02x:%02x:%02x:%02x:%02x:%02x", b[0], b[1], b[2], b[3], b[4], b[5]);
        out = text;
    }
    return logText(status, label, out);
}

} // namespace cimple
