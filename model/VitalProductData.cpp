#include "model/VitalProductData.h"

#include "agent/Build.h"
#include "device/TVR_MethodWrapper.h"

namespace cimple
{

std::uint32_t readVitalProductData(PortContext& port)
{
    return TVR_MethodWrapper::GetVPD(port.port.name.c_str(), &port.vpd) == RM_OK ? BUILD_DONE : BUILD_FAILED;
}

} // namespace cimple
