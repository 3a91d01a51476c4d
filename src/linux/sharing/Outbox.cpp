#include "linux/sharing/Outbox.h"

#include "linux/posix/FileName.h"
#include "linux/posix/HandOver.h"
#include "linux/posix/HeldDirectory.h"
#include "linux/posix/UserDirectories.h"

#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <string_view>
#include <sys/stat.h>
#include <utility>

namespace sharing {

namespace {

constexpr std::string_view kPrefix = "file-";
/// The file is in a directory below the one that is held, so that who is shown where it lies sees nothing else. That has
/// its name from the moment on which the file is whole.
constexpr const char* kUnfinished = "/unfinished";
constexpr const char* kFinished = "/shared";

using posix::HandOverWay;

std::vector<HandOverWay> waysFor(Outbox::Use use)
{
    // A hard link is the same file: who changes it changes what the user has.
    if (use == Outbox::Use::Change)
        return {HandOverWay::Reflink, HandOverWay::Copy};
    return {HandOverWay::Reflink, HandOverWay::HardLink, HandOverWay::Copy};
}

/// Opened without waiting for whoever is at its other end, if it has one.
base::Result<posix::FileDescriptor> openFile(const std::string& path)
{
    posix::FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    struct stat status = {};
    if (!file || ::fstat(file.get(), &status) != 0)
        return base::Error::fromErrno(errno, "cannot open " + path);
    if (!S_ISREG(status.st_mode))
        return base::Error::fromErrno(EINVAL, "it is no file: " + path);
    return file;
}

base::ErrorRef withWords(const base::ErrorRef& error, const std::string& name)
{
    const char* key = "SHARE_CANNOT_PREPARE";
    switch (error->code()) {
    case ENOENT:
    case ESTALE:
        key = "SHARE_FILE_GONE";
        break;
    case EACCES:
    case EPERM:
        key = "SHARE_FILE_NOT_ALLOWED";
        break;
    case ENOSPC:
    case EDQUOT:
    case EFBIG:
        key = "SHARE_DISK_FULL";
        break;
    default:
        break;
    }
    return base::Error::withMessage(error, key, {{"name", name}});
}

base::Result<posix::HeldDirectory> putThere(const std::string& root, const std::string& path, const std::string& name,
                                            const Outbox::Progress& goOn, Outbox::Use use)
{
    auto source = openFile(path);
    if (!source)
        return source.error();
    auto held = posix::HeldDirectory::make(root, kPrefix);
    if (!held)
        return held;
    const std::string unfinished = held.value().path + kUnfinished;
    const auto finish = [&]() -> base::Result<void> {
        if (::mkdir(unfinished.c_str(), S_IRWXU) != 0)
            return base::Error::fromErrno(errno, "cannot make " + unfinished);
        if (const auto way = posix::handOver(source.value().get(), unfinished, name, goOn, waysFor(use)); !way)
            return way.error();
        if (::rename(unfinished.c_str(), (held.value().path + kFinished).c_str()) != 0)
            return base::Error::fromErrno(errno, "cannot rename " + unfinished);
        return {};
    };
    if (const auto finished = finish(); !finished) {
        posix::removeHeldDirectory(held.value().path);
        return finished.error();
    }
    return held;
}

} // namespace

posix::FileDescriptor Outbox::File::openForReading() const
{
    return posix::FileDescriptor(::open(m_path.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC));
}

base::Result<Outbox> Outbox::ofUser()
{
    const auto cache = posix::userCacheDirectory();
    if (!cache)
        return cache.error();
    return Outbox(cache.value() + "/outbox");
}

base::Result<std::shared_ptr<const Outbox::File>> Outbox::put(const std::string& path, const std::string& name,
                                                              const Progress& goOn, Use use) const
{
    sweep();
    const std::string safeName = posix::wholeFileNameSafe(name, kLongestName);
    auto held = putThere(m_root, path, safeName, goOn, use);
    if (!held)
        return withWords(held.error(), safeName);
    return std::make_shared<const File>(held.value().path + kFinished + "/" + safeName, std::move(held.value().lock));
}

void Outbox::sweep() const
{
    std::error_code error;
    for (auto entry = std::filesystem::directory_iterator(m_root, error); !error && entry != end(entry);
         entry.increment(error)) {
        const std::string path = entry->path().string();
        if (!entry->path().filename().string().starts_with(kPrefix))
            continue;
        // Whoever still works on it holds it, so what is unfinished now stays so: it died, and told nobody of the file.
        std::error_code failed;
        if (posix::isAbandoned(path)
            && (posix::isAbandoned(path, kLifetime) || (!std::filesystem::exists(path + kFinished, failed) && !failed)))
            posix::removeHeldDirectory(path);
    }
}

} // namespace sharing
