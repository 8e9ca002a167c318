// Files from and to a URI, by libcurl where the host has it.
#pragma once

#include <string>

namespace cimple
{

/// Gives `file` the name of a local file with what `uri` names: the path that the URI is or has in it, if something is
/// there, otherwise a new file with the URI's last part for a name in the current directory, fetched by libcurl. 0 on
/// success; `file` stays otherwise, and what came of the file is removed. Takes as long as the server sends: not under
/// the data lock.
int downloadFileUsingCurl(const std::string& uri, std::string& file);

/// Puts a local file where `uri` says, with the user and the password that stand in it. 0 on success, -1 without
/// libcurl or the file, or a curl code. May take minutes as well.
int uploadFileUsingCurl(const std::string& uri, const std::string& file);

} // namespace cimple
