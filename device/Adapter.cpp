#include "device/Adapter.h"

#include "device/FreePart.h"

namespace cimple
{

Adapter::Adapter(const std::string& adapterName, std::uint32_t number, std::uint32_t type)
    : name(adapterName), adapterNumber(number), adapterType(type)
{
    TVR_LOG(TVR_DBG, "Adapter( adapterName[%s], adapterNumber[%d], adapterType[%d] )", name.c_str(), adapterNumber,
            adapterType);
}

Adapter::~Adapter()
{
    TVR_LOG(TVR_DBG, "~Adapter");
    for (Port* port : ports)
        freePart(TVR_DBG, "Error in port freeing",
                 [&]
                 {
                     std::unique_ptr<Port> owned(port);
                     TVR_LOG(TVR_DBG, "Freeing Port: %s", owned->name.c_str());
                 });
    freePart(TVR_DBG, "Adapter statistics delete failed", [&] { statistics.reset(); });
    freePart(TVR_DBG, "Adapter attribute delete failed", [&] { attributes.reset(); });
}

} // namespace cimple
