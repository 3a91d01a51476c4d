#include "app/host/EditorDirectory.h"

#include "base/Environment.h"
#include "linux/dbus/HostConnection.h"

#include <cerrno>
#include <cstdlib>
#include <ctime>
#include <fcntl.h>
#include <filesystem>
#include <pwd.h>
#include <string_view>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

constexpr std::string_view kPrefix = "editor-";
constexpr const char* kLock = "lock";
constexpr const char* kSocket = "socket";
constexpr time_t kDay = time_t(24) * 60 * 60;

std::string environmentPath(const char* name)
{
    std::string value = base::environment(name);
    return value.starts_with('/') ? value : "";
}

/// Where the socket of an editor lies whose directory's path is too long for one.
std::string socketOutside(const std::string& directory)
{
    const std::string runtime = environmentPath("XDG_RUNTIME_DIR");
    return runtime.empty() ? "" : runtime + "/clipsa-" + directory.substr(directory.rfind('/') + 1);
}

/// And where, if that path is too long too, or is not known.
std::string temporaryDirectory(const std::string& directory)
{
    return "/tmp/clipsa-" + directory.substr(directory.rfind('/') + 1);
}

void removeTemporaryDirectory(const std::string& path)
{
    // Its place is everybody's: only what is ours is looked into.
    const posix::FileDescriptor directory(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    struct stat status = {};
    if (!directory || ::fstat(directory.get(), &status) != 0 || status.st_uid != ::geteuid())
        return;
    ::unlinkat(directory.get(), kSocket, 0);
    ::rmdir(path.c_str());
}

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

void removeDirectory(const std::string& path)
{
    // The lock last: a directory that has one is swept another time when we are killed here, or cannot remove it all.
    std::error_code error;
    bool isEmpty = true;
    for (const auto& entry : std::filesystem::directory_iterator(path, error))
        if (entry.path().filename() != kLock)
            isEmpty &= removeAll(entry.path());
    if (isEmpty)
        removeAll(path);
    if (const std::string socket = socketOutside(path); !socket.empty())
        ::unlink(socket.c_str());
    removeTemporaryDirectory(temporaryDirectory(path));
}

/// Takes the lock of a directory: held by nobody else as long as the result lives.
posix::FileDescriptor takeLock(int directory)
{
    posix::FileDescriptor lock(::openat(directory, kLock, O_RDWR | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
    if (lock && ::flock(lock.get(), LOCK_EX | LOCK_NB) != 0)
        return {};
    return lock;
}

bool isDead(const std::string& path)
{
    const posix::FileDescriptor directory(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
    struct stat status = {};
    if (!directory || ::fstat(directory.get(), &status) != 0 || status.st_uid != ::geteuid())
        return false;
    if (::faccessat(directory.get(), kLock, F_OK, AT_SYMLINK_NOFOLLOW) != 0)
        // Being made just now, or left by somebody who died while making it.
        return errno == ENOENT && std::time(nullptr) - status.st_mtim.tv_sec > kDay;
    return static_cast<bool>(takeLock(directory.get()));
}

/// A lock that is held from the moment on which it has its name: nobody can find it free in between.
base::Result<posix::FileDescriptor> makeLock(const std::string& directory)
{
    const std::string early = directory + "/lock.new";
    posix::FileDescriptor lock(::open(early.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!lock || ::flock(lock.get(), LOCK_EX | LOCK_NB) != 0
        || ::rename(early.c_str(), (std::filesystem::path(directory) / kLock).c_str()) != 0)
        return base::Error::fromErrno(errno, "cannot lock " + directory);
    return lock;
}

} // namespace

base::Result<std::string> editorDirectoriesRoot()
{
    if (const std::string cache = environmentPath("XDG_CACHE_HOME"); !cache.empty())
        return cache + "/clipsa";
    if (const std::string home = environmentPath("HOME"); !home.empty())
        return home + "/.cache/clipsa";
    const passwd* user = ::getpwuid(::geteuid()); // NOLINT(concurrency-mt-unsafe): asked once, before any thread
    if (user && user->pw_dir[0] == '/')
        return std::string(user->pw_dir) + "/.cache/clipsa";
    return base::Error::make(base::kPosixErrorDomain, ENOENT, "there is no home directory; set XDG_CACHE_HOME");
}

int sweepEditorDirectories(const std::string& root)
{
    int swept = 0;
    std::error_code error;
    for (auto entry = std::filesystem::directory_iterator(root, error); !error && entry != end(entry);
         entry.increment(error)) {
        const std::string path = entry->path().string();
        if (!entry->path().filename().string().starts_with(kPrefix) || !isDead(path))
            continue;
        removeDirectory(path);
        ++swept;
    }
    return swept;
}

base::Result<EditorDirectory> EditorDirectory::make(const std::string& root)
{
    std::error_code error;
    std::filesystem::create_directories(root, error);
    std::string path = root + "/" + std::string(kPrefix) + "XXXXXX";
    if (error || !::mkdtemp(path.data()))
        return base::Error::fromErrno(error ? error.value() : errno, "cannot make a directory in " + root);
    auto lock = makeLock(path);
    if (!lock) {
        removeDirectory(path);
        return lock.error();
    }
    EditorDirectory directory(std::move(path), std::move(lock).value());
    for (const std::string& inner : {directory.deviceRoot(), directory.movieDirectory()})
        if (::mkdir(inner.c_str(), S_IRWXU) != 0)
            return base::Error::fromErrno(errno, "cannot make " + inner);
    return directory;
}

EditorDirectory::EditorDirectory(std::string path, posix::FileDescriptor lock)
    : m_path(std::move(path)), m_lock(std::move(lock))
{
}

EditorDirectory::~EditorDirectory()
{
    // A moved string need not be empty, a moved descriptor is closed.
    if (m_lock)
        removeDirectory(m_path);
}

base::Result<std::string> EditorDirectory::socketPath() const
{
    // It may be that of somebody else, or gone.
    const std::string outside = socketOutside(m_path);
    const bool hasRuntime = !outside.empty() && ::access(outside.substr(0, outside.rfind('/')).c_str(), W_OK) == 0;
    for (const std::string& path : {m_path + "/" + kSocket, hasRuntime ? outside : std::string()})
        if (!path.empty() && path.size() <= dbus::HostConnection::kMaximumPathSize)
            return path;
    const std::string temporary = temporaryDirectory(m_path);
    if (::mkdir(temporary.c_str(), S_IRWXU) != 0)
        return base::Error::fromErrno(errno,
                                      "the path of " + m_path + " is too long for a socket; cannot make " + temporary);
    return temporary + "/" + kSocket;
}

} // namespace host
