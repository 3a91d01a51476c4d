/// Who asks for something on the bus, as far as the bus and the kernel tell, and whether a path of theirs is one for us.
/// Any thread.
#pragma once

#include "linux/posix/FileDescriptor.h"

#include <string>

namespace dbus {

struct Asker {
    /// Its process's directory in /proc, and never that of a process that gets its number later; none where the process
    /// is not known, or is another user's.
    posix::FileDescriptor process;
    std::string securityLabel; ///< as the kernel had it when the connection was made; empty without one
};

/// Whether it is in a sandbox, sees other files than we do, or cannot be looked at: then it may have no right to a file
/// that it names, and what it names need not be what we find there. May take for ever, as the asker's file system is
/// looked at. `self` is where our own process is in /proc.
bool isConfined(const Asker& asker, const std::string& self = "/proc/self");

} // namespace dbus
