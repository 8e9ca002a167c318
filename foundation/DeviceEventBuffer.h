// The kernel driver's lines of the system log, as the driver log shows them.
#pragma once

#include "runtime/values/String.h"

#include <cstddef>
#include <vector>

namespace cimple
{

/// Keeps the first `maximum` strings that it is given. Not locked: its owner guards it.
class DeviceEventBuffer
{
public:
    explicit DeviceEventBuffer(std::size_t maximum = 200) : _maximum(maximum) {}

    /// 0 when the string was added, 1 when the buffer was full. An empty string is passed over with 0.
    int add(const String& text);
    void clear() { _strings.clear(); }
    const std::vector<String>& strings() const { return _strings; }

private:
    std::size_t _maximum;
    std::vector<String> _strings;
};

} // namespace cimple
