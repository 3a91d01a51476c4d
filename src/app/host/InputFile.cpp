#include "app/host/InputFile.h"

#include "linux/dbus/EditRequest.h"

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>

namespace host {

namespace {

base::ErrorRef refusal(int number, const std::string& text)
{
    return base::Error::make(dbus::kBadInputDomain, number, text);
}

base::ErrorRef cannotOpen(const std::string& path, int number)
{
    switch (number) {
    case ENOENT:
    case ENOTDIR:
        return refusal(number, "there is no file " + path + "; check the name");
    case EACCES:
    case EPERM:
        return refusal(number, path + " may not be read; ask its owner for permission, or copy it");
    case ELOOP:
        return refusal(number, path + " is a link that leads round in circles; give the file itself");
    case ENXIO:
        return refusal(number, path + " is not a file with a movie; give a recording that is on disk");
    default:
        return refusal(number, base::Error::fromErrno(number, "cannot open " + path)->description());
    }
}

} // namespace

base::Result<posix::FileDescriptor> openInput(const std::string& path, Emptiness emptiness)
{
    posix::FileDescriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY));
    if (!file)
        return cannotOpen(path, errno);
    if (const auto checked = checkInput(file.get(), path, emptiness); !checked)
        return checked.error();
    return file;
}

base::Result<void> checkInput(int descriptor, const std::string& what, Emptiness emptiness)
{
    struct stat status = {};
    const int flags = ::fcntl(descriptor, F_GETFL);
    if (flags < 0 || ::fstat(descriptor, &status) != 0)
        return refusal(errno, base::Error::fromErrno(errno, "cannot look at " + what)->description());
    if (S_ISDIR(status.st_mode))
        return refusal(EISDIR, what + " is a directory; give one recording in it");
    if (!S_ISREG(status.st_mode))
        return refusal(ENXIO, what + " is not a regular file; give a recording that is on disk");
    if ((flags & O_PATH) != 0 || (flags & O_ACCMODE) == O_WRONLY)
        return refusal(EACCES, what + " was not opened for reading; open it again with O_RDONLY");
    if (emptiness == Emptiness::Refused && status.st_size == 0)
        return refusal(ENODATA, what + " is empty; wait until the recorder has written it");
    return {};
}

} // namespace host
