/// How an editor says that it still has something to finish, when its host has already closed it: a locked file in its
/// directory. The lock goes with the process, however that ends.
#pragma once

#include "linux/posix/FileDescriptor.h"

#include <string>

namespace dbus {

class BusyMark {
public:
    /// In the directory that stands for the device's; nothing is made there yet.
    explicit BusyMark(const std::string& deviceRoot);

    /// False when the file cannot be made or locked: then nobody can know.
    bool set();
    void clear() { m_lock = {}; }

    /// Whether an editor has it set. From any process.
    static bool isSet(const std::string& deviceRoot);

private:
    std::string m_path;
    posix::FileDescriptor m_lock;
};

} // namespace dbus
