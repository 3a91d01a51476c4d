#include "linux/posix/HeldDirectory.h"

#include <cerrno>
#include <cstdlib>
#include <ctime>
#include <fcntl.h>
#include <filesystem>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace posix {

namespace {

constexpr const char* kLock = "lock";
constexpr std::chrono::hours kDay{24};

/// False when something of it is left.
bool removeAll(const std::filesystem::path& path)
{
    // It gives up when somebody else removes an entry meanwhile, as libdbus does with its socket from its own thread.
    std::error_code error;
    for (int attempt = 0; attempt < 4; ++attempt) {
        std::filesystem::remove_all(path, error);
        if (!error)
            return true;
    }
    return false;
}

/// Takes the lock of a directory: held by nobody else as long as the result lives.
FileDescriptor takeLock(int directory)
{
    FileDescriptor lock(::openat(directory, kLock, O_RDWR | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (lock && ::flock(lock.get(), LOCK_EX | LOCK_NB) != 0)
        return {};
    return lock;
}

/// A lock that is held from the moment on which it has its name: nobody can find it free in between.
base::Result<FileDescriptor> makeLock(const std::string& directory)
{
    const std::string early = directory + "/lock.new";
    FileDescriptor lock(::open(early.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!lock || ::flock(lock.get(), LOCK_EX | LOCK_NB) != 0
        || ::rename(early.c_str(), (std::filesystem::path(directory) / kLock).c_str()) != 0)
        return base::Error::fromErrno(errno, "cannot lock " + directory);
    return lock;
}

} // namespace

base::Result<HeldDirectory> HeldDirectory::make(const std::string& root, std::string_view prefix)
{
    std::error_code error;
    std::filesystem::create_directories(root, error);
    std::string path = root + "/" + std::string(prefix) + "XXXXXX";
    if (error || !::mkdtemp(path.data()))
        return base::Error::fromErrno(error ? error.value() : errno, "cannot make a directory in " + root);
    auto lock = makeLock(path);
    if (!lock) {
        removeHeldDirectory(path);
        return lock.error();
    }
    return HeldDirectory{std::move(path), std::move(lock).value()};
}

bool isAbandoned(const std::string& path, std::chrono::seconds age)
{
    const FileDescriptor directory(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    struct stat status = {};
    if (!directory || ::fstat(directory.get(), &status) != 0 || status.st_uid != ::geteuid())
        return false;
    // What was made in the future was made before the clock was set back.
    const std::chrono::seconds since =
        std::chrono::abs(std::chrono::seconds(std::time(nullptr) - status.st_mtim.tv_sec));
    if (::faccessat(directory.get(), kLock, F_OK, AT_SYMLINK_NOFOLLOW) != 0)
        // Being made just now, or left by somebody who died while making it.
        return errno == ENOENT && since > kDay;
    return since >= age && takeLock(directory.get());
}

void removeHeldDirectory(const std::string& path)
{
    std::error_code error;
    bool isEmpty = true;
    for (const auto& entry : std::filesystem::directory_iterator(path, error))
        if (entry.path().filename() != kLock)
            isEmpty &= removeAll(entry.path());
    if (isEmpty)
        removeAll(path);
}

} // namespace posix
