#include "linux/xdg/MoveItem.h"

#include <atomic>
#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace xdg {

namespace {

namespace fs = std::filesystem;

bool exists(const std::string& path)
{
    struct stat found = {};
    return ::lstat(path.c_str(), &found) == 0;
}

/// renameat2() that works where the file system knows no flags, at the price of a gap between looking and renaming.
int renameWithoutReplacing(const std::string& from, const std::string& to)
{
    if (::renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE) == 0)
        return 0;
    if (errno != EINVAL && errno != ENOSYS)
        return errno;
    if (exists(to))
        return EEXIST;
    return ::rename(from.c_str(), to.c_str()) == 0 ? 0 : errno;
}

/// A name in the same directory that nobody else uses, and never too long for it.
std::string hiddenNameBeside(const std::string& path)
{
    static std::atomic<unsigned> count{0};
    std::string name;
    do {
        const std::string unique = std::to_string(::getpid()) + "-" + std::to_string(count++);
        name = (fs::path(path).parent_path() / (".clipsa-" + unique + ".part")).native();
    } while (exists(name));
    return name;
}

/// To the disk: the source is about to go.
int flush(const fs::path& path)
{
    const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (file < 0)
        return errno;
    const int number = ::fsync(file) == 0 ? 0 : errno;
    ::close(file);
    return number;
}

int copyTree(const fs::path& from, const fs::path& to);

int copyContents(const fs::path& from, const fs::path& to, std::error_code& error)
{
    fs::directory_iterator entry(from, error);
    for (; !error && entry != fs::directory_iterator(); entry.increment(error))
        if (const int number = copyTree(entry->path(), to / entry->path().filename()); number != 0)
            return number;
    return 0;
}

int copyTree(const fs::path& from, const fs::path& to)
{
    struct stat found = {};
    if (::lstat(from.c_str(), &found) != 0)
        return errno;

    std::error_code error;
    if (S_ISREG(found.st_mode)) {
        fs::copy_file(from, to, error);
        if (const int number = error ? error.value() : flush(to); number != 0)
            return number;
    } else if (S_ISLNK(found.st_mode)) {
        fs::copy_symlink(from, to, error);
    } else if (S_ISDIR(found.st_mode)) {
        // Ours until it is full: its own permissions may forbid to write into it.
        if (::mkdir(to.c_str(), 0700) != 0)
            return errno;
        if (const int number = copyContents(from, to, error); number != 0)
            return number;
    } else {
        return EXDEV;
    }
    if (error)
        return error.value();

    if (!S_ISLNK(found.st_mode) && ::chmod(to.c_str(), found.st_mode & 07777) != 0)
        return errno;
    // After all else: filling a directory dates it anew.
    const struct timespec times[] = {found.st_atim, found.st_mtim};
    return ::utimensat(AT_FDCWD, to.c_str(), times, AT_SYMLINK_NOFOLLOW) == 0 ? 0 : errno;
}

} // namespace

int copyItem(const std::string& from, const std::string& to)
{
    // Known to fail before much is copied; the rename at the end makes sure.
    if (exists(to))
        return EEXIST;

    const std::string part = hiddenNameBeside(to);
    int number = copyTree(from, part);
    if (number == 0)
        number = renameWithoutReplacing(part, to);
    if (number != 0) {
        std::error_code ignored;
        fs::remove_all(part, ignored);
    }
    return number;
}

int moveItem(const std::string& from, const std::string& to)
{
    int number = renameWithoutReplacing(from, to);
    if (number != EXDEV)
        return number;
    number = copyItem(from, to);
    if (number != 0)
        return number;
    std::error_code error;
    fs::remove_all(from, error);
    return error.value();
}

} // namespace xdg
