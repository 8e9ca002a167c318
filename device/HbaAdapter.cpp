#include "device/HbaAdapter.h"

#include "device/FreePart.h"

#include <exception>

namespace cimple
{

HbaAdapter::HbaAdapter(const std::string& name)
    // The API takes char* and only reads.
    : _handle(HBA_OpenAdapter(const_cast<char*>(name.c_str())))
{
    if (_handle == 0)
    {
        TVR_LOG(TVR_ERR, "HBA_OpenAdapter failed, skipping Adapter %s", name.c_str());
        throw std::exception();
    }
}

HbaAdapter::~HbaAdapter()
{
    freePart(TVR_ERR, "HBA_CloseAdapter failed", [&] { HBA_CloseAdapter(_handle); });
}

} // namespace cimple
