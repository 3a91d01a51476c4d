#include "linux/photos/UnsavedMovie.h"

#include "linux/photos/LibraryDirectory.h"
#include "linux/posix/CopyContents.h"
#include "linux/posix/NewFile.h"

#include <cerrno>
#include <cstdint>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace photos {

namespace {

/// Needs no room; nothing where there can be no second name: on another file system, or of a file without any.
base::Result<std::string> link(int movie, const LibraryName& name, const LibraryDirectory& directory)
{
    const std::string open = "/proc/self/fd/" + std::to_string(movie);
    for (int number = 1;; ++number) {
        std::string candidate = name.numbered(number);
        if (::linkat(AT_FDCWD, open.c_str(), directory.descriptor(), candidate.c_str(), AT_SYMLINK_FOLLOW) == 0) {
            posix::flush(movie); // as a copy is brought to the disk; its end is as good as it gets
            return candidate;
        }
        if (errno != EEXIST)
            return base::Error::fromErrno(errno, "naming it " + candidate);
    }
}

base::Result<std::string> copy(int movie, const struct stat& status, const LibraryName& name,
                               const LibraryDirectory& directory)
{
    posix::sweepNewFiles(directory.descriptor());
    auto file = posix::NewFile::make(directory.descriptor());
    if (!file)
        return file.error();
    if (const int number = file.value().keepAsPrivateAs(status.st_mode); number != 0)
        return base::Error::fromErrno(number, "copying it");
    const int to = file.value().descriptor();
    if (!posix::shareContents(movie, to))
        if (const int number = posix::copyContents(movie, to, static_cast<std::uint64_t>(status.st_size), {});
            number != 0)
            return base::Error::fromErrno(number, "copying it");
    if (const auto sealed = file.value().seal(status.st_mtim); !sealed)
        return sealed.error();
    return directory.publish(file.value(), name);
}

base::Result<std::string> keepIn(const std::string& path, int movie, const LibraryName& name)
{
    const auto directory = LibraryDirectory::open(path);
    if (!directory)
        return directory.error();
    struct stat status = {};
    if (::fstat(movie, &status) != 0)
        return base::Error::fromErrno(errno, "looking at it");
    // Who has the file by another name, as a recorder has whose recording could not even be mixed, may write over it.
    const bool isOthersToo = status.st_nlink > 1;
    auto kept = isOthersToo ? copy(movie, status, name, directory.value()) : link(movie, name, directory.value());
    if (!kept)
        kept = isOthersToo ? link(movie, name, directory.value()) : copy(movie, status, name, directory.value());
    if (!kept)
        return base::Error::make(kept.error()->domain(), kept.error()->code(),
                                 "cannot keep it in " + path + ": " + kept.error()->description());
    // A name that a power cut takes is no reason to keep none.
    static_cast<void>(directory.value().flush());
    return path + "/" + kept.value();
}

} // namespace

base::Result<std::string> keepUnsaved(int movie, const LibraryName& name, const std::vector<std::string>& directories)
{
    base::ErrorRef error;
    for (const std::string& directory : directories) {
        auto kept = keepIn(directory, movie, name);
        if (kept)
            return kept;
        if (!error)
            error = kept.error();
    }
    return error;
}

} // namespace photos
