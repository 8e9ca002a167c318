// libcurl, which a host need not have: it is opened where it is used, and closed again.
#pragma once

#include "runtime/values/Array.h"

#include <cstdint>

namespace cimple
{

/// libcurl from the first place where it is, opened with that mode of dlopen(); null when there is none. The caller
/// closes it.
void* openCurl(int mode);

/// Adds the schemes that libcurl fetches from to those that the software installation service takes (values of
/// CIM_SoftwareInstallationServiceCapabilities.SupportedURISchemes), if the host has libcurl and a root file system
/// that a download can be written to.
void UpdateCURLCapabilities(Array<std::uint16_t>& uriSchemes);

} // namespace cimple
