/// The files that are handed in, opened and looked at without trusting them. Any thread. Errors are of
/// dbus::kBadInputDomain: one line that names the file and says what to do.
#pragma once

#include "base/Result.h"
#include "linux/posix/FileDescriptor.h"

#include <string>

namespace host {

enum class Emptiness { Allowed, Refused };

/// Opens a regular file for reading, without waiting for a FIFO's other end.
base::Result<posix::FileDescriptor> openInput(const std::string& path, Emptiness emptiness);

/// Whether a descriptor that somebody sent is a regular file that can be read. Looks at nothing but the descriptor.
base::Result<void> checkInput(int descriptor, const std::string& what, Emptiness emptiness);

} // namespace host
