// Which libcurl the process has, as the module's look for it finds out.
#pragma once

#include <string>
#include <vector>

namespace module_test
{

/// The file under which dlopen() finds libcurl from now on; none when it is empty, as at first. No test depends on the
/// machine's own.
void setLibCurl(const std::string& file);

/// The same, but what is found is the machine's own library.
void setRealLibCurl(const std::string& file);

/// The files under which it was looked for since then.
std::vector<std::string> triedLibCurls();

} // namespace module_test
