#include "linux/posix/CopyContents.h"

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <iterator>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/sendfile.h>
#include <unistd.h>
#include <vector>

namespace posix {

namespace {

/// Large enough to cost nothing, small enough to stop soon, and that the progress moves.
constexpr std::uint64_t kStep = 16 << 20;
constexpr std::size_t kBuffer = 1 << 20;

/// Copies up to `count` bytes at `offset`: the number of bytes, 0 at the end, -1 with errno.
using CopyStep = ssize_t (*)(int from, int to, off_t offset, std::size_t count);

ssize_t copyInKernel(int from, int to, off_t offset, std::size_t count)
{
    off_t in = offset;
    off_t out = offset;
    return ::copy_file_range(from, &in, to, &out, count, 0);
}

ssize_t copyWithSendfile(int from, int to, off_t offset, std::size_t count)
{
    if (::lseek(to, offset, SEEK_SET) < 0)
        return -1;
    off_t in = offset;
    return ::sendfile(to, from, &in, count);
}

ssize_t copyByHand(int from, int to, off_t offset, std::size_t count)
{
    std::vector<char> buffer(std::min(count, kBuffer));
    const ssize_t got = ::pread(from, buffer.data(), buffer.size(), offset);
    for (ssize_t written = 0; written < got;) {
        const ssize_t more =
            ::pwrite(to, buffer.data() + written, static_cast<std::size_t>(got - written), offset + written);
        if (more < 0 && errno != EINTR)
            return -1;
        written += std::max<ssize_t>(more, 0);
    }
    return got;
}

/// These say that a way does not work between two files; all else says that copying does not.
bool isRefusal(int number)
{
    return number == EXDEV || number == EINVAL || number == ENOSYS || number == EOPNOTSUPP || number == EPERM
           || number == EBADF || number == ETXTBSY;
}

} // namespace

bool shareContents(int from, int to)
{
    return ::ioctl(to, FICLONE, from) == 0;
}

int copyContents(int from, int to, std::optional<std::uint64_t> size,
                 const std::function<bool(std::uint64_t copied)>& goOn)
{
    static constexpr CopyStep kWays[] = {copyInKernel, copyWithSendfile, copyByHand};
    const CopyStep* way = std::begin(kWays);
    std::uint64_t done = 0;
    while (!size || done < *size) {
        const auto count = static_cast<std::size_t>(size ? std::min(kStep, *size - done) : kStep);
        const ssize_t copied = (*way)(from, to, static_cast<off_t>(done), count);
        const bool last = way + 1 == std::end(kWays);
        if (copied < 0 && errno == EINTR)
            continue;
        if (copied < 0 && (last || !isRefusal(errno)))
            return errno;
        if (copied == 0 && last)
            return size ? ENODATA : 0;
        if (copied <= 0) {
            ++way; // a way that gives nothing on a strange file system is not the end of the file
            continue;
        }
        done += static_cast<std::uint64_t>(copied);
        if (goOn && !goOn(done))
            return ECANCELED;
    }
    return 0;
}

} // namespace posix
