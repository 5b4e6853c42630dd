// The version properties that all kinds of software identity share.
#pragma once

#include <string>

#include "common/CLogger.h"
#include "common/TVX_Common.h"

namespace cimrt {

/// Puts what `parseVersion` finds in a version text into the version properties of an identity.
/// They stay null when the text is refused. `what` begins the log lines.
template <class Identity>
void setParsedVersion(Identity& identity, const char* what, const std::string& text) {
  TVX_LOG(TVX_DBG, "%s- Parsing VersionString", what);
  ParsedVersion version;
  if (parseVersion(text.c_str(), version) == 0) {
    TVX_LOG(TVX_DBG, "%s- Parsing Success", what);
    identity.MajorVersion.set(version.Major);
    identity.MinorVersion.set(version.Minor);
    identity.RevisionNumber.set(version.Revision);
    identity.BuildNumber.set(version.Build);
    identity.ReleaseType.set(version.ReleaseType.c_str());
    identity.TestReleaseVersion.set(version.TestReleaseVersion.c_str());
  }
  TVX_LOG(TVX_DBG, "%s- Parsing Done", what);
}

}  // namespace cimrt
