#include "app/host/HandOver.h"

#include "linux/posix/CopyContents.h"
#include "linux/posix/FileDescriptor.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

namespace host {

namespace {

/// Until the source ends. Null, or why not.
base::ErrorRef copyAll(int from, int to, std::uint64_t total, const CopyProgress& goOn)
{
    const auto tell = [&](std::uint64_t copied) { return !goOn || goOn(copied, total); };
    const int number = posix::copyContents(from, to, std::nullopt, tell);
    if (number == 0)
        return nullptr;
    return base::Error::fromErrno(number, number == ECANCELED ? "copying the recording was stopped"
                                                              : "cannot copy the recording");
}

/// A hard link that the editor can read; false when there is none.
bool makeHardLink(int source, const std::string& path)
{
    const std::string open = "/proc/self/fd/" + std::to_string(source);
    if (::linkat(AT_FDCWD, open.c_str(), AT_FDCWD, path.c_str(), AT_SYMLINK_FOLLOW) != 0)
        return false;
    std::error_code ignored;
    if (std::filesystem::equivalent(open, path, ignored) && ::access(path.c_str(), R_OK) == 0)
        return true;
    ::unlink(path.c_str());
    return false;
}

} // namespace

base::Result<HandOverWay> handOver(int source, const std::string& directory, const std::string& name,
                                   const CopyProgress& goOn, HandOverWay first)
{
    struct stat status = {};
    if (::fstat(source, &status) != 0)
        return base::Error::fromErrno(errno, "cannot look at the recording");
    const std::string path = directory + "/" + name;
    if (first == HandOverWay::HardLink && makeHardLink(source, path))
        return HandOverWay::HardLink;

    const posix::FileDescriptor target(
        ::open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!target)
        return base::Error::fromErrno(errno, "cannot make " + path);
    HandOverWay way = HandOverWay::Reflink;
    base::ErrorRef error;
    if (first == HandOverWay::Copy || !posix::shareContents(source, target.get())) {
        way = HandOverWay::Copy;
        error = copyAll(source, target.get(), static_cast<std::uint64_t>(status.st_size), goOn);
    }
    // Some file systems have none. Then it stays the user's alone, which does no harm.
    static_cast<void>(::fchmod(target.get(), (status.st_mode & ACCESSPERMS) | S_IRUSR | S_IWUSR));
    const timespec times[] = {status.st_atim, status.st_mtim};
    if (!error && ::futimens(target.get(), times) != 0)
        error = base::Error::fromErrno(errno, "cannot date " + path);
    if (error) {
        ::unlink(path.c_str());
        return error;
    }
    return way;
}

} // namespace host
