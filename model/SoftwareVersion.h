// The version of a software identity of whatever class.
#pragma once

#include "foundation/FirmwareVersion.h"

namespace cimple
{

/// The text, and its numbers where it has the form of a firmware version; false where it has another.
template <class Identity> bool setFirmwareVersion(Identity& identity, const String& text)
{
    identity.VersionString.set(text);
    FirmwareVersion version;
    if (parseVersion(text.c_str(), version) != 0)
        return false;
    identity.MajorVersion.set(version.major);
    identity.MinorVersion.set(version.minor);
    identity.RevisionNumber.set(version.revision);
    identity.BuildNumber.set(version.build);
    identity.ReleaseType.set(version.releaseType);
    identity.TestReleaseVersion.set(version.testRelease);
    return true;
}

} // namespace cimple
