#include "linux/dbus/BusyMark.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

namespace dbus {

namespace {

std::string markPath(const std::string& deviceRoot)
{
    return deviceRoot + "/busy";
}

} // namespace

BusyMark::BusyMark(const std::string& deviceRoot) : m_path(markPath(deviceRoot)) {}

bool BusyMark::set()
{
    if (m_lock)
        return true;
    posix::FileDescriptor file(::open(m_path.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!file || ::flock(file.get(), LOCK_EX | LOCK_NB) != 0)
        return false;
    m_lock = std::move(file);
    return true;
}

bool BusyMark::isSet(const std::string& deviceRoot)
{
    const posix::FileDescriptor file(
        ::open(markPath(deviceRoot).c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    return file && ::flock(file.get(), LOCK_SH | LOCK_NB) != 0 && errno == EWOULDBLOCK;
}

} // namespace dbus
