// The version of a software identity of whatever class.
#pragma once

#include "foundation/FirmwareVersion.h"

#include <string>

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

class TVRHBA_SoftwareIdentity;

/// The version of a software in the place of what it was. Newer firmware and other software has versions of dotted
/// numbers; a text of neither form is a version without numbers.
void setVersion(TVRHBA_SoftwareIdentity& identity, const std::string& version);

} // namespace cimple
