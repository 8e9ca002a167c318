// The target mapping of an open adapter.
#pragma once

#include "device/HbaAdapter.h"

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <span>

namespace cimple
{

/// Fetches the mapping, with a buffer that grows when the library has more. No entries if it cannot be had.
class TargetMapping
{
public:
    explicit TargetMapping(const HbaAdapter& adapter);
    std::span<const HBA_FCPSCSIENTRY> entries() const { return _entries; }

private:
    HBA_STATUS fetch(const HbaAdapter& adapter);
    bool allocate();

    struct Free
    {
        void operator()(HBA_FCPTARGETMAPPING* mapping) const { std::free(mapping); }
    };
    std::unique_ptr<HBA_FCPTARGETMAPPING, Free> _mapping;
    std::uint32_t _room = 256; ///< entries that the buffer holds
    std::span<const HBA_FCPSCSIENTRY> _entries;
};

} // namespace cimple
