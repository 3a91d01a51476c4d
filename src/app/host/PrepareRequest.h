/// Makes a request ready for an editor: opens and checks its files, checks its texts, fills in what it leaves open.
/// Any thread; touches nothing. Takes as long as the files' disks and the asker's file system do.
#pragma once

#include "base/Result.h"
#include "linux/dbus/EditRequest.h"

#include <functional>

namespace host {

/// The bundle identifier of a recording whose app is not known; one must be given.
inline constexpr const char* kUnknownBundleIdentifier = "org.clipsa.recording";

/// Whether an asker is in a sandbox.
using Confinement = std::function<bool(const dbus::Asker& asker)>;

/// Afterwards the movie is open, paths are absolute and without links, and the three required values are there.
/// Errors are of dbus::kBadInputDomain, one line each.
///
/// No path of an attachment is followed for an asker in a sandbox, and all that cannot be had by their paths are one
/// error to whoever asks by the bus: what there is, and for whom, is told to nobody who may not know it.
base::Result<void> prepare(dbus::EditRequest& request);
base::Result<void> prepare(dbus::EditRequest& request, const Confinement& isConfined);

} // namespace host
