/// Makes a request ready for an editor: opens and checks its files, checks its texts, fills in what it leaves open.
/// Any thread; touches nothing.
#pragma once

#include "base/Result.h"
#include "linux/dbus/EditRequest.h"

namespace host {

/// The bundle identifier of a recording whose app is not known; one must be given.
inline constexpr const char* kUnknownBundleIdentifier = "org.clipsa.recording";

/// Afterwards the movie is open, paths are absolute and without links, and the three required values are there.
/// Errors are of dbus::kBadInputDomain, one line each.
base::Result<void> prepare(dbus::EditRequest& request);

} // namespace host
