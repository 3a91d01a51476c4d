#include "app/host/WholeFile.h"

#include "linux/posix/FileDescriptor.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <string>
#include <sys/stat.h>
#include <unistd.h>

namespace host {

namespace {

/// As any program makes a file that the user asked for; the user's umask has the last word.
constexpr mode_t kMode = 0666;

base::ErrorRef cannotWrite(const std::filesystem::path& path, int number)
{
    return base::Error::fromErrno(number, "cannot write " + path.native());
}

/// 0 or an error number.
int writeAll(int descriptor, const std::vector<std::uint8_t>& bytes)
{
    std::size_t written = 0;
    while (written < bytes.size()) {
        const ssize_t count = ::write(descriptor, bytes.data() + written, bytes.size() - written);
        if (count < 0 && errno != EINTR)
            return errno;
        written += static_cast<std::size_t>(std::max<ssize_t>(count, 0));
    }
    return 0;
}

/// 0 or an error number.
int giveName(const std::string& from, const std::filesystem::path& to, bool replaces)
{
    if (replaces)
        return ::rename(from.c_str(), to.c_str()) == 0 ? 0 : errno;
    if (::renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE) == 0)
        return 0;
    if (errno != EINVAL)
        return errno;
    // A file system that cannot do that in one step knows links.
    if (::link(from.c_str(), to.c_str()) != 0)
        return errno;
    ::unlink(from.c_str());
    return 0;
}

} // namespace

base::Result<void> writeWholeFile(const std::filesystem::path& path, const std::vector<std::uint8_t>& bytes,
                                  bool replaces, std::filesystem::perms permissions)
{
    const auto mode = static_cast<mode_t>(permissions & std::filesystem::perms::all) & kMode;
    const std::string beside = path.parent_path() / ("." + path.filename().native() + "." + std::to_string(::getpid()));
    const posix::FileDescriptor file(
        ::open(beside.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode | S_IRUSR | S_IWUSR));
    if (!file)
        return cannotWrite(path, errno);
    int error = writeAll(file.get(), bytes);
    if (error == 0)
        error = giveName(beside, path, replaces);
    if (error != 0) {
        ::unlink(beside.c_str());
        return cannotWrite(path, error);
    }
    return {};
}

} // namespace host
