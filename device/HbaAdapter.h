// Calls of the HBA API on an open adapter, with their retry rules.
#pragma once

#include "device/Bindings.h"

#include <string>

namespace cimple
{

/// An open adapter. The constructor logs a failure and throws std::exception.
class HbaAdapter
{
public:
    explicit HbaAdapter(const std::string& name);
    ~HbaAdapter();
    HbaAdapter(const HbaAdapter&) = delete;
    HbaAdapter& operator=(const HbaAdapter&) = delete;
    HBA_HANDLE handle() const { return _handle; }

private:
    HBA_HANDLE _handle;
};

/// Reads a zeroed record by `call(record)`; stale data is refreshed and read again at most `refreshes` times.
template <class Record, class Call>
HBA_STATUS readRefreshed(const HbaAdapter& adapter, Record& record, unsigned refreshes, const Call& call)
{
    for (;; --refreshes)
    {
        record = {};
        const HBA_STATUS status = call(&record);
        if (status != HBA_STATUS_ERROR_STALE_DATA || refreshes == 0)
            return status;
        HBA_RefreshInformation(adapter.handle());
    }
}

inline HBA_STATUS readPortAttributes(const HbaAdapter& adapter, HBA_UINT32 port, HBA_PORTATTRIBUTES& record,
                                     unsigned refreshes)
{
    return readRefreshed(adapter, record, refreshes,
                         [&](HBA_PORTATTRIBUTES* out)
                         { return HBA_GetAdapterPortAttributes(adapter.handle(), port, out); });
}

} // namespace cimple
