#include "diagnostics/PortName.h"

#include "device/TVR_MethodWrapper.h"

namespace cimple
{

bool toWwn(HBA_WWN& wwpn, const char* deviceId, const LogText& noPlainName, const LogText& noWwn)
{
    char name[TVR_MethodWrapper::hbaNameLength + 1];
    if (TVR_MethodWrapper::Id2HBAName(name, deviceId) != 0)
        return noPlainName.log(), false;
    if (TVR_MethodWrapper::str2HBAName(&wwpn, name) != 0)
        return noWwn.log(), false;
    return true;
}

} // namespace cimple
