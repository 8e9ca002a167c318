// The two text formats that monitoring scrapes: OpenMetrics 1.0 and the format of Prometheus, version 0.0.4.
#pragma once

#include "broker/metrics/Series.h"

#include <string>
#include <string_view>

namespace metrics
{

enum class Format
{
    prometheus,
    openMetrics,
};

/// What an Accept header likes best; the format of Prometheus where it likes both alike or neither.
Format formatFor(std::string_view accept);
const char* contentType(Format format);
std::string exposition(const Families& families, Format format);

} // namespace metrics
