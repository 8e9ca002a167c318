// The URL of the management page that the instance model publishes as a remote access point.
#pragma once

#include "runtime/values/String.h"

#include <string_view>

namespace cimple
{

/// The first line that is neither empty nor a comment, from its first non-blank character on; empty if there is none.
String parseWebLaunchUrl(std::string_view text);

/// Reads the file once, when made; without a file the URL is empty.
class WebLaunchConfig
{
public:
    WebLaunchConfig();
    String getUrl() const { return _url; }

private:
    String _url;
};

} // namespace cimple
