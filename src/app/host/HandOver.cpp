#include "app/host/HandOver.h"

#include "linux/posix/FileDescriptor.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <linux/fs.h>
#include <optional>
#include <sys/ioctl.h>
#include <sys/sendfile.h>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace host {

namespace {

/// Large enough to cost nothing, small enough to stop soon.
constexpr std::size_t kStep = 16 * 1024 * 1024;
constexpr std::size_t kBuffer = 256 * 1024;

/// Copies up to kStep bytes at `offset`: the number of bytes, 0 at the end, -1 with errno.
using CopyStep = ssize_t (*)(int from, int to, off_t offset);

ssize_t copyInKernel(int from, int to, off_t offset)
{
    off_t in = offset;
    off_t out = offset;
    return ::copy_file_range(from, &in, to, &out, kStep, 0);
}

ssize_t copyWithSendfile(int from, int to, off_t offset)
{
    if (::lseek(to, offset, SEEK_SET) < 0)
        return -1;
    off_t in = offset;
    return ::sendfile(to, from, &in, kStep);
}

ssize_t copyByHand(int from, int to, off_t offset)
{
    std::vector<char> buffer(kBuffer);
    const ssize_t count = ::pread(from, buffer.data(), buffer.size(), offset);
    for (ssize_t written = 0; written < count;) {
        const ssize_t more =
            ::pwrite(to, buffer.data() + written, static_cast<std::size_t>(count - written), offset + written);
        if (more < 0 && errno != EINTR)
            return -1;
        written += std::max<ssize_t>(more, 0);
    }
    return count;
}

/// These say that a way does not work between two files; all else says that copying does not.
bool isRefusal(int number)
{
    return number == EXDEV || number == EINVAL || number == ENOSYS || number == EOPNOTSUPP || number == EPERM
           || number == EBADF || number == ETXTBSY;
}

/// Until the source ends. Null, or why not.
base::ErrorRef copyAll(int from, int to, std::uint64_t total, const CopyProgress& goOn)
{
    static constexpr CopyStep kWays[] = {copyInKernel, copyWithSendfile, copyByHand};
    const CopyStep* way = std::begin(kWays);
    off_t offset = 0;
    for (;;) {
        const ssize_t count = (*way)(from, to, offset);
        const bool last = way + 1 == std::end(kWays);
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0 && (last || !isRefusal(errno)))
            return base::Error::fromErrno(errno, "cannot copy the recording");
        if (count < 0 || (count == 0 && !last)) {
            ++way; // a way that gives nothing on a strange file system is not the end of the file
            continue;
        }
        if (count == 0)
            return nullptr;
        offset += count;
        if (goOn && !goOn(static_cast<std::uint64_t>(offset), total))
            return base::Error::fromErrno(ECANCELED, "copying the recording was stopped");
    }
}

/// A hard link that the editor can read; false when there is none.
bool makeHardLink(int source, const struct stat& status, const std::string& path)
{
    const std::string open = "/proc/self/fd/" + std::to_string(source);
    if (::linkat(AT_FDCWD, open.c_str(), AT_FDCWD, path.c_str(), AT_SYMLINK_FOLLOW) != 0)
        return false;
    struct stat linked = {};
    if (::lstat(path.c_str(), &linked) == 0 && linked.st_ino == status.st_ino && linked.st_dev == status.st_dev
        && ::access(path.c_str(), R_OK) == 0)
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
    if (first == HandOverWay::HardLink && makeHardLink(source, status, path))
        return HandOverWay::HardLink;

    const posix::FileDescriptor target(
        ::open(path.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!target)
        return base::Error::fromErrno(errno, "cannot make " + path);
    HandOverWay way = HandOverWay::Reflink;
    base::ErrorRef error;
    if (first == HandOverWay::Copy || ::ioctl(target.get(), FICLONE, source) != 0) {
        way = HandOverWay::Copy;
        error = copyAll(source, target.get(), static_cast<std::uint64_t>(status.st_size), goOn);
    }
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
