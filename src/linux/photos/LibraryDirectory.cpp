#include "linux/photos/LibraryDirectory.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>
#include <utility>

namespace photos {

namespace {

namespace fs = std::filesystem;

bool isLink(const std::string& path)
{
    std::error_code ignored;
    return fs::is_symlink(fs::symlink_status(path, ignored));
}

base::ErrorRef cannotOpen(const std::string& path, int number)
{
    std::error_code ignored;
    if (number == ENOENT && isLink(path))
        return base::Error::make(base::kPosixErrorDomain, ENOENT,
                                 path + " is a link to " + fs::read_symlink(path, ignored).native()
                                     + ", which is not there");
    if (number == ENOTDIR)
        return base::Error::make(base::kPosixErrorDomain, ENOTDIR, path + " is not a directory");
    return base::Error::fromErrno(number, "opening " + path);
}

} // namespace

LibraryDirectory::LibraryDirectory(std::string path, posix::FileDescriptor directory)
    : m_path(std::move(path)), m_directory(std::move(directory))
{
}

base::Result<LibraryDirectory> LibraryDirectory::open(const std::string& path)
{
    const auto openIt = [&] { return posix::FileDescriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)); };
    posix::FileDescriptor directory = openIt();
    int number = directory ? 0 : errno;
    // What a dangling link points to is not ours to make: most likely a disk is missing.
    if (number == ENOENT && !isLink(path)) {
        std::error_code error;
        fs::create_directories(path, error);
        if (error)
            return base::Error::fromErrno(error.value(), "making the directory " + path);
        directory = openIt();
        number = directory ? 0 : errno;
    }
    if (number != 0)
        return cannotOpen(path, number);
    return LibraryDirectory(path, std::move(directory));
}

base::Result<void> LibraryDirectory::flush() const
{
    if (const int number = posix::flush(descriptor()); number != 0)
        return base::Error::fromErrno(number, "bringing its name to the disk");
    return {};
}

void LibraryDirectory::remove(const std::string& name) const
{
    ::unlinkat(descriptor(), name.c_str(), 0);
}

base::Result<std::string> LibraryDirectory::publish(posix::NewFile& file, const LibraryName& name) const
{
    for (int number = 1;; ++number) {
        std::string candidate = name.numbered(number);
        const int failed = file.takeName(candidate);
        if (failed == 0)
            return candidate;
        if (failed != EEXIST)
            return base::Error::fromErrno(failed, "naming it " + candidate);
    }
}

} // namespace photos
