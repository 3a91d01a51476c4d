#include "app/host/EditorDirectory.h"

#include "linux/dbus/HostConnection.h"
#include "linux/posix/HeldDirectory.h"
#include "linux/posix/UserDirectories.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

constexpr std::string_view kPrefix = "editor-";
constexpr const char* kSocket = "socket";

/// Where the socket of an editor lies whose directory's path is too long for one.
std::string socketOutside(const std::string& directory)
{
    const std::string runtime = posix::environmentPath("XDG_RUNTIME_DIR");
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

void removeDirectory(const std::string& path)
{
    posix::removeHeldDirectory(path);
    if (const std::string socket = socketOutside(path); !socket.empty())
        ::unlink(socket.c_str());
    removeTemporaryDirectory(temporaryDirectory(path));
}

} // namespace

base::Result<std::string> editorDirectoriesRoot()
{
    return posix::userCacheDirectory();
}

int sweepEditorDirectories(const std::string& root)
{
    int swept = 0;
    std::error_code error;
    for (auto entry = std::filesystem::directory_iterator(root, error); !error && entry != end(entry);
         entry.increment(error)) {
        const std::string path = entry->path().string();
        if (!entry->path().filename().string().starts_with(kPrefix) || !posix::isAbandoned(path))
            continue;
        removeDirectory(path);
        ++swept;
    }
    return swept;
}

base::Result<EditorDirectory> EditorDirectory::make(const std::string& root)
{
    auto held = posix::HeldDirectory::make(root, kPrefix);
    if (!held)
        return held.error();
    EditorDirectory directory(std::move(held.value().path), std::move(held.value().lock));
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
