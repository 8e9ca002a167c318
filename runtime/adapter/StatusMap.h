// The numbers of the provider procedure in the broker's terms, and the names of the broker's status codes.
#pragma once

#include "runtime/adapter/Provider.h"
#include "runtime/cmpi/Cmpi.h"

namespace cimple
{

/// What a provider's number means to the client. A number that no operation knows counts as success.
CMPIrc cmpi_status_of(int provider_status);

/// "CMPI_RC_OK", ...; a code without a name reads as CMPI_RC_ERR_FAILED.
const char* cmpi_status_name(int rc);

} // namespace cimple
