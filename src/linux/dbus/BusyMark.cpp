#include "linux/dbus/BusyMark.h"

#include <fcntl.h>
#include <sys/stat.h>

namespace dbus {

namespace {

std::string markPath(const std::string& deviceRoot)
{
    return deviceRoot + "/busy";
}

/// A lock of the open file, not of the process: it can be asked for from where it was set, too.
struct flock wholeFile(short kind)
{
    struct flock lock = {}; // from the start, and to the end
    lock.l_type = kind;
    return lock;
}

} // namespace

BusyMark::BusyMark(const std::string& deviceRoot) : m_path(markPath(deviceRoot)) {}

bool BusyMark::set()
{
    if (m_lock)
        return true;
    posix::FileDescriptor file(::open(m_path.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, S_IRUSR | S_IWUSR));
    struct flock lock = wholeFile(F_WRLCK);
    if (!file || ::fcntl(file.get(), F_OFD_SETLK, &lock) != 0)
        return false;
    m_lock = std::move(file);
    return true;
}

bool BusyMark::isSet(const std::string& deviceRoot)
{
    const posix::FileDescriptor file(
        ::open(markPath(deviceRoot).c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    // Only asked for: who took it to see whether it can be taken would keep the editor from taking it.
    struct flock lock = wholeFile(F_RDLCK);
    return file && ::fcntl(file.get(), F_OFD_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
}

} // namespace dbus
