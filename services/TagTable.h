// An adapter's table of frame tags as an XML file.
#pragma once

#include "device/RmApi.h"

#include <cstddef>
#include <string>
#include <vector>

namespace cimple
{

/// Far above what an adapter holds.
inline constexpr std::size_t maximumTagEntries = 65'536;

/// Bytes of a file. A table of the most entries, as it is written here, is below.
inline constexpr std::size_t maximumTagFile = 16 * 1024 * 1024;

/// The entries in the order of their rows. What is missing or wrong in a row is logged and ends the method; a text
/// that is no document of this kind throws std::exception. Entries may be alike: what they mean is the adapter's.
std::vector<CPQFC_QosEntry> readTagTable(std::string text);

/// The document of a table, with the present time.
std::string writeTagTable(const std::string& hostName, const std::string& adapterName,
                          const std::vector<CPQFC_QosEntry>& entries);

} // namespace cimple
