#include "linux/xdg/FileManager.h"

#include "linux/posix/FileDescriptor.h"
#include "linux/xdg/MoveItem.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>
#include <utility>

namespace xdg {

namespace {

namespace fs = std::filesystem;

base::ErrorRef failed(const char* verb, const std::string& path, int number)
{
    return base::Error::fromErrno(number, std::string(verb) + " " + path);
}

base::Date dateOf(const struct statx_timestamp& time)
{
    return {static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) * 1e-9};
}

} // namespace

FileManager::FileManager(const base::System& system, MountTable mounts) : m_system(system), m_mounts(std::move(mounts))
{
}

bool FileManager::fileExists(const std::string& path)
{
    return ::access(resolvedPath(path).c_str(), F_OK) == 0;
}

base::Result<void> FileManager::createDirectory(const std::string& path)
{
    if (::mkdir(resolvedPath(path).c_str(), 0777) != 0)
        return failed("create directory", path, errno);
    return {};
}

base::Result<std::vector<std::string>> FileManager::contentsOfDirectory(const std::string& path)
{
    std::error_code error;
    std::vector<std::string> names;
    fs::directory_iterator entry(resolvedPath(path), error);
    for (; !error && entry != fs::directory_iterator(); entry.increment(error))
        names.push_back(entry->path().filename().native());
    if (error)
        return failed("list", path, error.value());
    return names;
}

base::Result<std::string> FileManager::contentsOfFile(const std::string& path, std::size_t mostBytes)
{
    // Without waiting: a pipe that nobody writes to is no file to read either.
    const posix::FileDescriptor file(::open(resolvedPath(path).c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    struct stat found = {};
    if (!file || ::fstat(file.get(), &found) != 0)
        return failed("read", path, errno);
    if (!S_ISREG(found.st_mode))
        return failed("read", path, S_ISDIR(found.st_mode) ? EISDIR : EINVAL);
    std::string contents(mostBytes + 1, '\0');
    std::size_t size = 0;
    while (size < contents.size()) {
        const ssize_t count = ::read(file.get(), contents.data() + size, contents.size() - size);
        if (count == 0)
            break;
        if (count > 0)
            size += static_cast<std::size_t>(count);
        else if (errno != EINTR)
            return failed("read", path, errno);
    }
    if (size > mostBytes)
        return failed("read", path, EFBIG);
    contents.resize(size);
    return contents;
}

base::Result<platform::FileAttributes> FileManager::attributesOfItem(const std::string& path)
{
    struct statx found = {};
    if (::statx(AT_FDCWD, resolvedPath(path).c_str(), AT_SYMLINK_NOFOLLOW, STATX_BASIC_STATS | STATX_BTIME, &found)
        != 0)
        return failed("read the attributes of", path, errno);

    platform::FileAttributes attributes;
    attributes.size = static_cast<std::int64_t>(found.stx_size);
    attributes.isDirectory = S_ISDIR(found.stx_mode);
    attributes.modificationDate = dateOf(found.stx_mtime);
    attributes.creationDate = attributes.modificationDate;
    if (found.stx_mask & STATX_BTIME) // some file systems do not know it
        attributes.creationDate = std::min(attributes.modificationDate, dateOf(found.stx_btime));
    return attributes;
}

base::Result<platform::FileSystemAttributes> FileManager::attributesOfFileSystem(const std::string& path)
{
    struct statvfs found = {};
    if (::statvfs(resolvedPath(path).c_str(), &found) != 0)
        return failed("read the free space at", path, errno);
    // f_bavail, not f_bfree: what is reserved for the super-user is not free to us.
    return platform::FileSystemAttributes{static_cast<std::uint64_t>(found.f_bavail) * found.f_frsize};
}

base::Result<void> FileManager::removeItem(const std::string& path)
{
    if (m_mounts.isRoot(path))
        return failed("remove", path, EBUSY);
    std::error_code error;
    const auto removed = fs::remove_all(resolvedPath(path), error);
    if (error)
        return failed("remove", path, error.value());
    if (removed == 0) // which remove_all() does not mind
        return failed("remove", path, ENOENT);
    return {};
}

base::Result<void> FileManager::moveItem(const std::string& from, const std::string& to)
{
    const std::string doing = "move " + from + " to " + to;
    if (m_mounts.isRoot(from))
        return base::Error::fromErrno(EBUSY, doing);
    if (const int number = xdg::moveItem(resolvedPath(from), resolvedPath(to)); number != 0)
        return base::Error::fromErrno(number, doing);
    return {};
}

std::string FileManager::resolvedPath(const std::string& path) const
{
    return m_mounts.resolved(path);
}

} // namespace xdg
