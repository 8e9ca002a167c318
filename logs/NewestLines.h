// Searching a log of any size from its end.
#pragma once

#include <cstddef>
#include <functional>
#include <string_view>

namespace cimple
{

/// Of a longer line its head is shown. rsyslog takes no longer message, and clients get some hundred lines at once.
inline constexpr std::size_t longestLine = 8192;

/// Gives `take` the lines of a file that contain `keyword`, the last one first, until it answers false. A line lacks
/// its line feed, and may be without one. What is written while the search is on is not seen. Of anything but a regular
/// file, and of what cannot be read, there are no lines. However large the file and its lines, the search needs the
/// room of a block.
void newestLinesWith(const char* path, std::string_view keyword, const std::function<bool(std::string_view)>& take);

} // namespace cimple
