// What the program asks about the host's operating system.
#pragma once

#include "runtime/values/String.h"

struct statvfs;

namespace cimple
{

/// True if the root file system is mounted read-only. Asked once until it is forgotten; a failed question is asked
/// again.
bool IsReadOnlyFS();

/// What IsReadOnlyFS() asks; tests replace it, null restores the system's. Forgets the known answer.
using Statvfs = int (*)(const char* path, struct statvfs* status);
void setStatvfs(Statvfs function);
void forgetRootFileSystem();

/// The kernel's version line and the distribution's banner with all its lines and escape sequences. Returns 0, or
/// non-zero when a file could not be read; what was not read is "Unknown". Of the banner the first 64 KiB are read.
int getOSInformation(String& osName, String& osDistribution);

} // namespace cimple
