#include "linux/ffmpeg/OpenFile.h"

#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/Words.h"

#include <cerrno>
#include <fcntl.h>
#include <unistd.h>

namespace ffmpeg {

namespace {

base::ErrorRef cannotOpen(const std::string& name, int number)
{
    const bool isNoFile = number == EISDIR || number == EINVAL;
    return base::Error::withMessage(base::Error::fromErrno(number, "“" + name + "” cannot be opened"),
                                    isNoFile ? "MOVIE_NOT_A_FILE" : messageKeyOf(AVERROR(number)), {{"name", name}});
}

} // namespace

base::Result<std::shared_ptr<OpenFile>> OpenFile::open(const std::string& path)
{
    const std::string name = path.substr(path.find_last_of('/') + 1);
    // Without O_NONBLOCK a pipe would wait for somebody to write to it.
    const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (descriptor < 0)
        return cannotOpen(name, errno);
    std::shared_ptr<OpenFile> file(new OpenFile(descriptor, name));
    struct stat about {};
    if (fstat(descriptor, &about) != 0)
        return cannotOpen(name, errno);
    if (S_ISDIR(about.st_mode))
        return cannotOpen(name, EISDIR);
    if (!S_ISREG(about.st_mode))
        return cannotOpen(name, EINVAL);
    file->m_identity = identityOf(about);
    file->m_permissions = about.st_mode & ACCESSPERMS;
    return file;
}

base::Result<std::shared_ptr<OpenFile>> OpenFile::of(int descriptor, const std::string& name)
{
    const int own = fcntl(descriptor, F_DUPFD_CLOEXEC, 0);
    if (own < 0)
        return cannotOpen(name, errno);
    std::shared_ptr<OpenFile> file(new OpenFile(own, name));
    struct stat about {};
    if (fstat(own, &about) == 0)
        file->m_identity = identityOf(about);
    return file;
}

OpenFile::~OpenFile()
{
    ::close(m_descriptor);
}

std::int64_t OpenFile::size() const
{
    struct stat about {};
    return fstat(m_descriptor, &about) == 0 ? about.st_size : -1;
}

std::int64_t OpenFile::read(std::int64_t position, std::uint8_t* into, std::size_t count) const
{
    for (;;) {
        const ssize_t got = pread(m_descriptor, into, count, position);
        if (got >= 0)
            return got;
        if (errno == EINTR)
            continue;
        const int error = errno;
        ++m_failedReads;
        return -error;
    }
}

bool OpenFile::hasChanged() const
{
    struct stat about {};
    return fstat(m_descriptor, &about) != 0 || identityOf(about) != m_identity;
}

bool OpenFile::isStillAt(const std::string& path) const
{
    struct stat there {};
    if (stat(path.c_str(), &there) != 0)
        return errno == ENOENT || errno == ENOTDIR;
    return identityOf(there) == m_identity;
}

OpenFile::Identity OpenFile::identityOf(const struct stat& about)
{
    return {about.st_dev, about.st_ino, about.st_size, about.st_mtim.tv_sec, about.st_mtim.tv_nsec};
}

} // namespace ffmpeg
