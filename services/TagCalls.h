// Frame tagging by the library: an adapter's global flag and its table.
#pragma once

#include "device/RmApi.h"

#include <cstdint>
#include <string>
#include <vector>

namespace cimple
{

/// An adapter that is open for tagging, closed at the end of its life. Its functions log what the library answers.
class TagAdapter
{
public:
    /// Ends the method if there is no adapter, or this one does not open.
    explicit TagAdapter(const std::string& name);
    ~TagAdapter();
    TagAdapter(const TagAdapter&) = delete;
    TagAdapter& operator=(const TagAdapter&) = delete;

    RM_STATUS setGlobalFlag(std::uint32_t state) const;
    /// Changes `state` on success only.
    RM_STATUS getGlobalFlag(std::uint32_t& state) const;
    /// Takes the place of the adapter's table. Ends the method without memory.
    RM_STATUS setTable(const std::vector<CPQFC_QosEntry>& entries) const;
    /// Ends the method if the table cannot be read.
    std::vector<CPQFC_QosEntry> table() const;

private:
    std::uint32_t _handle = 0;
};

} // namespace cimple
