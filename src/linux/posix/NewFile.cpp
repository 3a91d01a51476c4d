#include "linux/posix/NewFile.h"

#include "linux/posix/CopyContents.h"

#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <dirent.h>
#include <fcntl.h>
#include <memory>
#include <string_view>
#include <sys/file.h>
#include <unistd.h>
#include <utility>

namespace posix {

namespace {

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

/// A file without a name does not get one here. All else is no better for a file that has one.
bool refusesNames(int number)
{
    return number == EPERM || number == EOPNOTSUPP || number == ENOENT || number == EXDEV || number == EINVAL
           || number == ENOSYS;
}

} // namespace

int flush(int descriptor)
{
    // Some file systems flush by themselves, and say that they cannot when they are asked.
    return ::fsync(descriptor) == 0 || errno == EINVAL || errno == ENOSYS ? 0 : errno;
}

void sweepNewFiles(int directory)
{
    // A descriptor of its own: reading moves the offset.
    const int again = ::openat(directory, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    const std::unique_ptr<DIR, int (*)(DIR*)> entries(again < 0 ? nullptr : ::fdopendir(again), &::closedir);
    while (const dirent* entry = entries ? ::readdir(entries.get()) : nullptr) { // NOLINT(concurrency-mt-unsafe): ours
        if (!isHiddenName(entry->d_name))
            continue;
        const FileDescriptor file(::openat(directory, entry->d_name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
        // Who writes one holds its lock.
        if (file && ::flock(file.get(), LOCK_EX | LOCK_NB) == 0)
            ::unlinkat(directory, entry->d_name, 0);
    }
}

NewFile::NewFile(int directory, FileDescriptor file, std::string hiddenName)
    : m_directory(directory), m_file(std::move(file)), m_hiddenName(std::move(hiddenName))
{
}

NewFile::~NewFile()
{
    if (m_file && !m_hiddenName.empty())
        ::unlinkat(m_directory, m_hiddenName.c_str(), 0);
}

base::Result<NewFile> NewFile::make(int directory)
{
    FileDescriptor file(::openat(directory, ".", O_TMPFILE | O_RDWR | O_CLOEXEC, kMode));
    if (file)
        return NewFile(directory, std::move(file), {});
    // EISDIR and ENOENT: kernels and file systems that do not know the flag.
    if (errno == EOPNOTSUPP || errno == EISDIR || errno == EINVAL || errno == ENOENT || errno == ENOSYS)
        return makeHidden(directory);
    return base::Error::fromErrno(errno, "making a file there");
}

base::Result<NewFile> NewFile::makeHidden(int directory)
{
    for (;;) {
        const std::string name = nextHiddenName();
        FileDescriptor file(
            ::openat(directory, name.c_str(), O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, kMode));
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

int NewFile::keepAsPrivateAs(mode_t permissions)
{
    struct stat status = {};
    if (::fstat(descriptor(), &status) != 0)
        return errno;
    const mode_t narrowed = (status.st_mode & permissions & (S_IRWXU | S_IRWXG | S_IRWXO)) | S_IRUSR | S_IWUSR;
    return ::fchmod(descriptor(), narrowed) == 0 || errno == EPERM ? 0 : errno; // some file systems have none
}

base::Result<void> NewFile::seal(const timespec& modified)
{
    const timespec times[] = {{0, UTIME_OMIT}, modified};
    if (::futimens(descriptor(), times) != 0)
        return base::Error::fromErrno(errno, "dating it");
    if (const int number = flush(descriptor()); number != 0)
        return base::Error::fromErrno(number, "bringing it to the disk");
    return {};
}

int NewFile::takeName(const std::string& name)
{
    int failed = tryName(name);
    if (m_hiddenName.empty() && refusesNames(failed)) {
        failed = becomeHidden();
        if (failed == 0)
            failed = tryName(name);
    }
    if (failed == 0)
        m_hiddenName.clear();
    return failed;
}

int NewFile::replace(const std::string& name)
{
    // Only what has a name can take that of another.
    std::string between;
    int failed = 0;
    do {
        between = nextHiddenName();
        failed = takeName(between);
    } while (failed == EEXIST);
    if (failed != 0)
        return failed;
    if (::renameat(m_directory, between.c_str(), m_directory, name.c_str()) == 0)
        return 0;
    failed = errno;
    m_hiddenName = between; // which goes with this
    return failed;
}

int NewFile::tryName(const std::string& name) const
{
    if (m_hiddenName.empty()) {
        const std::string open = "/proc/self/fd/" + std::to_string(descriptor());
        return ::linkat(AT_FDCWD, open.c_str(), m_directory, name.c_str(), AT_SYMLINK_FOLLOW) == 0 ? 0 : errno;
    }
    if (::renameat2(m_directory, m_hiddenName.c_str(), m_directory, name.c_str(), RENAME_NOREPLACE) == 0)
        return 0;
    if (errno != EINVAL && errno != ENOSYS)
        return errno;
    // Where renaming knows no flags a second name, which replaces nothing either, serves as well.
    if (::linkat(m_directory, m_hiddenName.c_str(), m_directory, name.c_str(), 0) == 0) {
        ::unlinkat(m_directory, m_hiddenName.c_str(), 0);
        return 0;
    }
    if (errno == EEXIST)
        return EEXIST;
    // Neither flags nor second names: this leaves a gap between looking and renaming, but nothing better is left.
    if (::faccessat(m_directory, name.c_str(), F_OK, AT_SYMLINK_NOFOLLOW) == 0)
        return EEXIST;
    return ::renameat(m_directory, m_hiddenName.c_str(), m_directory, name.c_str()) == 0 ? 0 : errno;
}

int NewFile::becomeHidden()
{
    struct stat status = {};
    if (::fstat(descriptor(), &status) != 0)
        return errno;
    auto hidden = makeHidden(m_directory);
    if (!hidden)
        return static_cast<int>(hidden.error()->code());
    NewFile& copy = hidden.value();
    if (const int number = copy.keepAsPrivateAs(status.st_mode); number != 0)
        return number;
    if (!shareContents(descriptor(), copy.descriptor()))
        if (const int number =
                copyContents(descriptor(), copy.descriptor(), static_cast<std::uint64_t>(status.st_size), {});
            number != 0)
            return number;
    if (const auto sealed = copy.seal(status.st_mtim); !sealed)
        return static_cast<int>(sealed.error()->code());
    m_file = std::move(copy.m_file);
    m_hiddenName = std::exchange(copy.m_hiddenName, {});
    return 0;
}

} // namespace posix
