#include "linux/photos/LibraryDirectory.h"

#include "linux/posix/CopyContents.h"

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <dirent.h>
#include <fcntl.h>
#include <filesystem>
#include <memory>
#include <string_view>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace photos {

namespace {

namespace fs = std::filesystem;

/// Hidden names are kHiddenPrefix, whatever is free, kHiddenSuffix.
constexpr std::string_view kHiddenPrefix = ".clipsa-";
constexpr std::string_view kHiddenSuffix = ".part";

/// As any program makes a file that the user asked for; the user's umask has the last word.
constexpr mode_t kMode = 0666;

bool isHiddenName(std::string_view name)
{
    return name.size() > kHiddenPrefix.size() + kHiddenSuffix.size() && name.starts_with(kHiddenPrefix)
           && name.ends_with(kHiddenSuffix);
}

std::string nextHiddenName()
{
    static std::atomic<unsigned> count{0};
    return std::string(kHiddenPrefix) + std::to_string(::getpid()) + "-" + std::to_string(count++)
           + std::string(kHiddenSuffix);
}

/// Some file systems flush by themselves, and say that they cannot when they are asked.
int flushed(int descriptor)
{
    return ::fsync(descriptor) == 0 || errno == EINVAL || errno == ENOSYS ? 0 : errno;
}

bool isLink(const std::string& path)
{
    std::error_code ignored;
    return fs::is_symlink(fs::symlink_status(path, ignored));
}

/// A file without a name does not get one here. All else is no better for a file that has one.
bool refusesNames(int number)
{
    return number == EPERM || number == EOPNOTSUPP || number == ENOENT || number == EXDEV || number == EINVAL
           || number == ENOSYS;
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

void LibraryDirectory::sweep() const
{
    // A descriptor of its own: reading moves the offset.
    const int again = ::openat(descriptor(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    const std::unique_ptr<DIR, int (*)(DIR*)> entries(again < 0 ? nullptr : ::fdopendir(again), &::closedir);
    while (const dirent* entry = entries ? ::readdir(entries.get()) : nullptr) { // NOLINT(concurrency-mt-unsafe): ours
        if (!isHiddenName(entry->d_name))
            continue;
        const posix::FileDescriptor file(
            ::openat(descriptor(), entry->d_name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
        // Who writes one holds its lock.
        if (file && ::flock(file.get(), LOCK_EX | LOCK_NB) == 0)
            remove(entry->d_name);
    }
}

base::Result<void> LibraryDirectory::flush() const
{
    if (const int number = flushed(descriptor()); number != 0)
        return base::Error::fromErrno(number, "bringing its name to the disk");
    return {};
}

void LibraryDirectory::remove(const std::string& name) const
{
    ::unlinkat(descriptor(), name.c_str(), 0);
}

NewFile::NewFile(const LibraryDirectory& directory, posix::FileDescriptor file, std::string hiddenName)
    : m_directory(&directory), m_file(std::move(file)), m_hiddenName(std::move(hiddenName))
{
}

NewFile::~NewFile()
{
    if (m_file && !m_hiddenName.empty())
        m_directory->remove(m_hiddenName);
}

base::Result<NewFile> NewFile::make(const LibraryDirectory& directory)
{
    posix::FileDescriptor file(::openat(directory.descriptor(), ".", O_TMPFILE | O_RDWR | O_CLOEXEC, kMode));
    if (file)
        return NewFile(directory, std::move(file), {});
    // EISDIR and ENOENT: kernels and file systems that do not know the flag.
    if (errno == EOPNOTSUPP || errno == EISDIR || errno == EINVAL || errno == ENOENT || errno == ENOSYS)
        return makeHidden(directory);
    return base::Error::fromErrno(errno, "making a file there");
}

base::Result<NewFile> NewFile::makeHidden(const LibraryDirectory& directory)
{
    for (;;) {
        const std::string name = nextHiddenName();
        posix::FileDescriptor file(
            ::openat(directory.descriptor(), name.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, kMode));
        if (!file && errno == EEXIST)
            continue;
        if (!file)
            return base::Error::fromErrno(errno, "making a file there");
        NewFile made(directory, std::move(file), name);
        // Somebody's sweep may have come between the two, and taken the file for a dead one.
        const bool swept = ::flock(made.descriptor(), LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK;
        struct stat status = {};
        if (!swept && ::fstat(made.descriptor(), &status) == 0 && status.st_nlink > 0)
            return made;
    }
}

base::Result<void> NewFile::seal(const timespec& modified)
{
    const timespec times[] = {{0, UTIME_OMIT}, modified};
    if (::futimens(descriptor(), times) != 0)
        return base::Error::fromErrno(errno, "dating it");
    if (const int number = flushed(descriptor()); number != 0)
        return base::Error::fromErrno(number, "bringing it to the disk");
    return {};
}

base::Result<std::string> NewFile::publish(const LibraryName& name)
{
    for (int number = 1;; ++number) {
        const std::string candidate = name.numbered(number);
        int failed = takeName(candidate);
        if (m_hiddenName.empty() && refusesNames(failed)) {
            failed = becomeHidden();
            if (failed == 0)
                failed = takeName(candidate);
        }
        if (failed == 0) {
            m_hiddenName.clear();
            return candidate;
        }
        if (failed != EEXIST)
            return base::Error::fromErrno(failed, "naming it " + candidate);
    }
}

int NewFile::takeName(const std::string& name)
{
    const int directory = m_directory->descriptor();
    if (m_hiddenName.empty()) {
        const std::string open = "/proc/self/fd/" + std::to_string(descriptor());
        return ::linkat(AT_FDCWD, open.c_str(), directory, name.c_str(), AT_SYMLINK_FOLLOW) == 0 ? 0 : errno;
    }
    if (::renameat2(directory, m_hiddenName.c_str(), directory, name.c_str(), RENAME_NOREPLACE) == 0)
        return 0;
    if (errno != EINVAL && errno != ENOSYS)
        return errno;
    // Where renaming knows no flags a second name, which replaces nothing either, serves as well.
    if (::linkat(directory, m_hiddenName.c_str(), directory, name.c_str(), 0) == 0) {
        m_directory->remove(m_hiddenName);
        return 0;
    }
    if (errno == EEXIST)
        return EEXIST;
    // Neither flags nor second names: this leaves a gap between looking and renaming, but nothing better is left.
    if (::faccessat(directory, name.c_str(), F_OK, AT_SYMLINK_NOFOLLOW) == 0)
        return EEXIST;
    return ::renameat(directory, m_hiddenName.c_str(), directory, name.c_str()) == 0 ? 0 : errno;
}

int NewFile::becomeHidden()
{
    struct stat status = {};
    if (::fstat(descriptor(), &status) != 0)
        return errno;
    auto hidden = makeHidden(*m_directory);
    if (!hidden)
        return static_cast<int>(hidden.error()->code());
    NewFile& copy = hidden.value();
    if (!posix::shareContents(descriptor(), copy.descriptor()))
        if (const int number =
                posix::copyContents(descriptor(), copy.descriptor(), static_cast<std::uint64_t>(status.st_size), {});
            number != 0)
            return number;
    if (const auto sealed = copy.seal(status.st_mtim); !sealed)
        return static_cast<int>(sealed.error()->code());
    m_file = std::move(copy.m_file);
    m_hiddenName = std::exchange(copy.m_hiddenName, {});
    return 0;
}

} // namespace photos
