#include "linux/photos/Transaction.h"

#include "linux/photos/UnsavedMovie.h"
#include "linux/posix/CopyContents.h"

#include <cerrno>
#include <cmath>
#include <fcntl.h>
#include <sys/stat.h>
#include <utility>

namespace photos {

namespace {

timespec timespecOf(base::Date date)
{
    const double whole = std::floor(date.secondsSince1970);
    return {static_cast<std::time_t>(whole), static_cast<long>((date.secondsSince1970 - whole) * 1e9)};
}

base::Date dateOf(const timespec& time)
{
    return {static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) / 1e9};
}

/// What the user can do about it.
const char* remedy(std::int64_t number)
{
    switch (number) {
    case ENOSPC:
    case EDQUOT:
        return "make room there and save again";
    case EFBIG:
        return "the file system there takes no file of this size: choose another directory for videos";
    case EACCES:
    case EPERM:
    case EROFS:
        return "allow writing there, or choose another directory for videos";
    case ENOTDIR:
    case EEXIST:
    case ENOENT:
    case ELOOP:
        return "make it a directory, or choose another one for videos";
    default:
        return "save again, or copy the movie by hand";
    }
}

base::ErrorRef notCopied(int number)
{
    switch (number) {
    case ENODATA:
        return base::Error::make(base::kPosixErrorDomain, number, "it became shorter while it was copied");
    case ECANCELED:
        return base::Error::make(base::kPosixErrorDomain, number, "it was given up");
    default:
        return base::Error::fromErrno(number, "copying it");
    }
}

} // namespace

base::Result<VideoLibrary::Transaction::Source>
VideoLibrary::Transaction::open(const std::optional<base::Url>& url) const
{
    if (!url)
        return base::Error::make(base::kPosixErrorDomain, EINVAL, "cannot save a movie in the library: there is none");
    if (!url->isFile())
        return base::Error::make(base::kPosixErrorDomain, EINVAL,
                                 "cannot save " + url->string() + " in the library: it is not a file");
    Source source;
    source.path = m_options.resolvedPath ? m_options.resolvedPath(url->path()) : url->path();
    const std::string doing = "cannot save " + source.path + " in the library";
    // A zero byte would end the path early, at another file.
    if (source.path.find('\0') != std::string::npos)
        return base::Error::fromErrno(ENOENT, doing);
    // Without waiting: it may be a pipe.
    source.file = posix::FileDescriptor(::open(source.path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    struct stat status = {};
    if (!source.file || ::fstat(source.file.get(), &status) != 0)
        return base::Error::fromErrno(errno, doing);
    if (!S_ISREG(status.st_mode))
        return base::Error::make(base::kPosixErrorDomain, S_ISDIR(status.st_mode) ? EISDIR : EINVAL,
                                 doing + ": it is not a file");
    if (status.st_size == 0)
        return base::Error::make(base::kPosixErrorDomain, ENODATA, doing + ": it is empty");
    source.permissions = status.st_mode;
    source.size = static_cast<std::uint64_t>(status.st_size);
    const Recording recording = m_options.recording ? m_options.recording(source.path) : Recording{};
    source.date = recording.date.value_or(dateOf(status.st_mtim));
    source.name = libraryName(recording.appName, source.date, source.path);
    return source;
}

void VideoLibrary::Transaction::createAssetFromVideoAtFileURL(const std::optional<base::Url>& url)
{
    m_affinity.assertHere();
    auto source = open(url);
    if (source)
        m_sources.push_back(std::move(source).value());
    else if (!m_error)
        m_error = source.error();
}

base::Result<std::vector<std::string>> VideoLibrary::Transaction::commit()
{
    m_affinity.assertHere();
    if (m_error)
        return m_error;
    if (m_sources.empty())
        return std::vector<std::string>();

    const auto directory = LibraryDirectory::open(m_options.directories.videos);
    if (!directory)
        return explained(directory.error(), m_sources.front());
    const LibraryDirectory& library = directory.value();
    posix::sweepNewFiles(library.descriptor());

    // All are copied before the first one appears: what can fail is done then.
    std::vector<posix::NewFile> files;
    for (const Source& source : m_sources) {
        auto file = copy(source, library, static_cast<double>(files.size()));
        if (!file)
            return explained(file.error(), source);
        files.push_back(std::move(file).value());
    }

    std::vector<std::string> names;
    base::ErrorRef error;
    for (std::size_t i = 0; i < files.size() && !error; ++i) {
        const auto name = library.publish(files[i], m_sources[i].name);
        if (name)
            names.push_back(name.value());
        else
            error = explained(name.error(), m_sources[i]);
    }
    if (const auto flushed = error ? base::Result<void>() : library.flush(); !flushed)
        error = explained(flushed.error(), m_sources.front());
    if (error) {
        for (const std::string& name : names)
            library.remove(name);
        return error;
    }
    for (std::string& name : names)
        name = library.path() + "/" + name;
    return names;
}

std::vector<base::Result<std::string>> VideoLibrary::Transaction::keepUnsaved() const
{
    m_affinity.assertHere();
    std::vector<base::Result<std::string>> kept;
    for (const Source& source : m_sources)
        kept.push_back(photos::keepUnsaved(source.file.get(), source.name, m_options.unsavedDirectories));
    if (m_error) // one could not even be opened
        kept.emplace_back(base::Error::make(m_error->domain(), m_error->code(), "there is nothing that could be kept"));
    return kept;
}

base::Result<posix::NewFile> VideoLibrary::Transaction::copy(const Source& source, const LibraryDirectory& directory,
                                                             double done) const
{
    auto file = posix::NewFile::make(directory.descriptor());
    if (!file)
        return file;
    const auto goOn = [&](std::uint64_t copied) {
        const double part = static_cast<double>(copied) / static_cast<double>(source.size);
        m_work.setProgress((done + part) / static_cast<double>(m_sources.size()));
        return !m_options.goOn || m_options.goOn();
    };
    if (const int number = file.value().keepAsPrivateAs(source.permissions); number != 0)
        return notCopied(number);
    const int from = source.file.get();
    const int to = file.value().descriptor();
    if (!posix::shareContents(from, to))
        if (const int number = posix::copyContents(from, to, source.size, goOn); number != 0)
            return notCopied(number);
    if (const auto sealed = file.value().seal(timespecOf(source.date)); !sealed)
        return sealed.error();
    return file;
}

base::ErrorRef VideoLibrary::Transaction::explained(const base::ErrorRef& error, const Source& source) const
{
    const auto code = error->code();
    // The failures that are not the library's.
    const std::string help = code == ENODATA || code == ECANCELED ? "" : std::string("; ") + remedy(code);
    return base::Error::make(error->domain(), code,
                             "cannot save " + source.path + " in the library " + m_options.directories.videos + ": "
                                 + error->description() + help);
}

} // namespace photos
