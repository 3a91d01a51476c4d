#include "linux/posix/HandOver.h"

#include "linux/posix/CopyContents.h"
#include "linux/posix/FileDescriptor.h"

#include <cassert>
#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <optional>
#include <sys/stat.h>
#include <unistd.h>

namespace posix {

namespace {

/// Until the source ends. Null, or why not.
base::ErrorRef copyAll(int from, int to, std::uint64_t total, const CopyProgress& goOn)
{
    const auto tell = [&](std::uint64_t copied) { return !goOn || goOn(copied, total); };
    const int number = copyContents(from, to, std::nullopt, tell);
    if (number == 0)
        return nullptr;
    return base::Error::fromErrno(number, number == ECANCELED ? "copying the recording was stopped"
                                                              : "cannot copy the recording");
}

/// A hard link that we can read; false when there is none.
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

/// Null, or why there is no such file.
base::ErrorRef makeFile(int source, const struct stat& status, const std::string& path, HandOverWay way,
                        const CopyProgress& goOn)
{
    const FileDescriptor target(
        ::open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!target)
        return base::Error::fromErrno(errno, "cannot make " + path);
    base::ErrorRef error;
    if (way == HandOverWay::Copy)
        error = copyAll(source, target.get(), static_cast<std::uint64_t>(status.st_size), goOn);
    else if (!shareContents(source, target.get()))
        error = base::Error::fromErrno(errno, "cannot share the blocks of " + path);
    // Some file systems have none. Then it stays the user's alone, which does no harm.
    static_cast<void>(::fchmod(target.get(), (status.st_mode & ACCESSPERMS) | S_IRUSR | S_IWUSR));
    const timespec times[] = {status.st_atim, status.st_mtim};
    if (!error && ::futimens(target.get(), times) != 0)
        error = base::Error::fromErrno(errno, "cannot date " + path);
    if (error)
        ::unlink(path.c_str());
    return error;
}

} // namespace

base::Result<HandOverWay> handOver(int source, const std::string& directory, const std::string& name,
                                   const CopyProgress& goOn, const std::vector<HandOverWay>& ways)
{
    assert(!ways.empty() && ways.back() == HandOverWay::Copy);
    struct stat status = {};
    if (::fstat(source, &status) != 0)
        return base::Error::fromErrno(errno, "cannot look at the recording");
    const std::string path = directory + "/" + name;
    base::ErrorRef error;
    for (const HandOverWay way : ways) {
        if (way == HandOverWay::HardLink) {
            if (makeHardLink(source, path))
                return way;
            continue;
        }
        error = makeFile(source, status, path, way, goOn);
        if (!error)
            return way;
    }
    return error;
}

} // namespace posix
