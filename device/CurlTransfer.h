// Files from and to a URI, by libcurl where the host has it.
#pragma once

#include <string>

namespace cimple
{

/// Gives `file` the name of a local file with what `uri` names: the path that the URI is or has in it, if a file is
/// there, otherwise a new file with the URI's last part for a name in the current directory, fetched by libcurl. 0 on
/// success, or a curl code, or -1. What a failed transfer has begun is removed.
int downloadFileUsingCurl(const std::string& uri, std::string& file);

/// Puts a local file where `uri` says, with the user and the password that stand in it. 0 on success, -1 without
/// libcurl or the file, or a curl code.
int uploadFileUsingCurl(const std::string& uri, const std::string& file);

} // namespace cimple
