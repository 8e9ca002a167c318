// Names of ports as clients and instances have them.
#pragma once

#include "agent/LogText.h"
#include "device/RmApi.h"

namespace cimple
{

/// The name behind a DeviceID. False, with its line in the log, if it is none; `wwpn` stays as it is then.
bool toWwn(HBA_WWN& wwpn, const char* deviceId, const LogText& noPlainName, const LogText& noWwn);

} // namespace cimple
