#include "linux/sharing/SaveCopy.h"

#include "linux/posix/CopyContents.h"
#include "linux/posix/NewFile.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>

namespace sharing {

namespace {

base::ErrorRef withWords(const base::ErrorRef& error, const std::string& name)
{
    const char* key = "SHARE_COPY_FAILED";
    switch (error->code()) {
    case ENOSPC:
    case EDQUOT:
    case EFBIG:
        key = "SHARE_COPY_DISK_FULL";
        break;
    case EACCES:
    case EPERM:
    case EROFS:
        key = "SHARE_COPY_NOT_ALLOWED";
        break;
    default:
        break;
    }
    return base::Error::withMessage(error, key, {{"name", name}});
}

base::Result<void> save(int source, const std::string& directoryPath, const std::string& name,
                        const std::function<bool(std::uint64_t, std::uint64_t)>& goOn)
{
    struct stat status = {};
    if (::fstat(source, &status) != 0)
        return base::Error::fromErrno(errno, "cannot look at the movie");
    const posix::FileDescriptor directory(::open(directoryPath.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!directory)
        return base::Error::fromErrno(errno, "cannot open " + directoryPath);
    // Nobody means a device or a pipe, though somebody who may do anything could put a file in its place.
    struct stat there = {};
    if (::fstatat(directory.get(), name.c_str(), &there, AT_SYMLINK_NOFOLLOW) == 0 && !S_ISREG(there.st_mode)
        && !S_ISLNK(there.st_mode))
        return base::Error::fromErrno(S_ISDIR(there.st_mode) ? EISDIR : EEXIST, "it is no file: " + name);
    posix::sweepNewFiles(directory.get());
    auto made = posix::NewFile::make(directory.get());
    if (!made)
        return made.error();
    posix::NewFile& copy = made.value();
    const auto total = static_cast<std::uint64_t>(status.st_size);
    if (!posix::shareContents(source, copy.descriptor())) {
        const auto tell = [&](std::uint64_t copied) { return !goOn || goOn(copied, total); };
        if (const int number = posix::copyContents(source, copy.descriptor(), total, tell); number != 0)
            return base::Error::fromErrno(number, "cannot copy the movie");
    }
    if (const auto sealed = copy.seal(status.st_mtim); !sealed)
        return sealed;
    if (const int number = copy.replace(name); number != 0)
        return base::Error::fromErrno(number, "cannot give the copy its name");
    static_cast<void>(posix::flush(directory.get())); // it is there, and whole, even if that is lost
    return {};
}

} // namespace

base::Result<void> saveCopy(int source, const std::string& path,
                            const std::function<bool(std::uint64_t copied, std::uint64_t total)>& goOn)
{
    const std::size_t slash = path.rfind('/');
    const std::string name = slash == std::string::npos ? path : path.substr(slash + 1);
    if (slash == std::string::npos || name.empty() || name == "." || name == "..")
        return withWords(base::Error::fromErrno(EINVAL, "it is no place for a file: " + path), name);
    if (const auto saved = save(source, path.substr(0, slash + 1), name, goOn); !saved)
        return withWords(saved.error(), name);
    return {};
}

} // namespace sharing
