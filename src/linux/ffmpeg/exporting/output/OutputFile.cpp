#include "linux/ffmpeg/exporting/output/OutputFile.h"

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <fcntl.h>
#include <random>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>
#include <utility>

namespace ffmpeg {

using base::Error;

namespace {

using namespace std::chrono_literals;

/// Removals wait their turn on a worker that has little to do.
constexpr auto kPatience = 2s;
constexpr auto kPause = 5ms;

/// Written bytes go to the disk while others are written, not all at the end, and so many at once that it makes no haste.
constexpr std::int64_t kToDiskAtOnce = 8 << 20;

} // namespace

OutputFile::OutputFile(std::string path, std::shared_ptr<const OpenFile> source)
    : m_path(std::move(path)), m_source(std::move(source)), m_name(m_path.substr(m_path.find_last_of('/') + 1))
{
}

base::Result<std::unique_ptr<OutputFile>> OutputFile::create(const std::string& path,
                                                             std::shared_ptr<const OpenFile> source)
{
    const std::size_t slash = path.find_last_of('/');
    const std::string folder = slash == std::string::npos ? "." : slash == 0 ? "/" : path.substr(0, slash);
    std::unique_ptr<OutputFile> file(new OutputFile(path, std::move(source)));
    const int directory = file->m_directory = ::open(folder.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
    if (directory < 0)
        return file->failure(errno);
    if (file->m_name.empty())
        return file->failure(EISDIR);
    if (file->isTaken())
        return file->failure(EEXIST);
    constexpr mode_t kMode = 0666; // what the user's mask leaves of it
    file->m_descriptor = openat(directory, ".", O_TMPFILE | O_RDWR | O_CLOEXEC, kMode);
    if (file->m_descriptor < 0 && (errno == EOPNOTSUPP || errno == EISDIR || errno == ENOENT || errno == EINVAL)) {
        std::random_device random;
        char tag[32];
        std::snprintf(tag, sizeof tag, ".%08x.part", random());
        file->m_hiddenName.assign(1, '.').append(file->m_name, 0, 200).append(tag);
        file->m_descriptor =
            openat(directory, file->m_hiddenName.c_str(), O_CREAT | O_EXCL | O_RDWR | O_CLOEXEC, kMode);
    }
    if (file->m_descriptor < 0)
        return file->failure(errno);
    return file;
}

OutputFile::~OutputFile()
{
    if (m_descriptor >= 0) {
        if (!m_published && !m_hiddenName.empty())
            unlinkat(m_directory, m_hiddenName.c_str(), 0);
        ::close(m_descriptor);
    }
    if (m_directory >= 0)
        ::close(m_directory);
}

bool OutputFile::isTaken() const
{
    struct stat about {};
    if (fstatat(m_directory, m_name.c_str(), &about, AT_SYMLINK_NOFOLLOW) != 0)
        return false;
    return S_ISLNK(about.st_mode) || !m_source || !m_source->isStillAt(m_path);
}

base::ErrorRef OutputFile::failure(int error) const
{
    return Error::fromErrno(error, "“" + m_name + "” cannot be written");
}

int OutputFile::write(std::int64_t position, const std::uint8_t* bytes, std::size_t count)
{
    while (count > 0) {
        const ssize_t done = pwrite(m_descriptor, bytes, count, position);
        if (done < 0 && errno == EINTR)
            continue;
        if (done < 0)
            return -errno;
        position += done;
        bytes += done;
        count -= static_cast<std::size_t>(done);
    }
    if (position >= m_onItsWay + kToDiskAtOnce)
        sendToDisk(position);
    return 0;
}

void OutputFile::sendToDisk(std::int64_t until)
{
    // Nothing is promised by it; what goes wrong, fsync() tells.
    sync_file_range(m_descriptor, m_onItsWay, until - m_onItsWay, SYNC_FILE_RANGE_WRITE);
    m_onItsWay = until;
}

void OutputFile::sendToDisk()
{
    sync_file_range(m_descriptor, 0, 0, SYNC_FILE_RANGE_WRITE);
}

base::Result<void> OutputFile::clear()
{
    if (ftruncate(m_descriptor, 0) != 0)
        return failure(errno);
    m_onItsWay = 0;
    return {};
}

int OutputFile::link() const
{
    if (m_hiddenName.empty()) {
        const std::string self = "/proc/self/fd/" + std::to_string(m_descriptor);
        return linkat(AT_FDCWD, self.c_str(), m_directory, m_name.c_str(), AT_SYMLINK_FOLLOW) == 0 ? 0 : errno;
    }
    if (renameat2(m_directory, m_hiddenName.c_str(), m_directory, m_name.c_str(), RENAME_NOREPLACE) == 0)
        return 0;
    if (errno != EINVAL && errno != ENOSYS)
        return errno;
    // A file system that cannot rename so; a link does not replace anything either.
    if (linkat(m_directory, m_hiddenName.c_str(), m_directory, m_name.c_str(), 0) != 0)
        return errno;
    unlinkat(m_directory, m_hiddenName.c_str(), 0);
    return 0;
}

base::Result<void> OutputFile::publish()
{
    if (fsync(m_descriptor) != 0)
        return failure(errno);
    int error = link();
    for (auto waited = 0ms; error == EEXIST && waited < kPatience && !isTaken(); waited += kPause) {
        std::this_thread::sleep_for(kPause);
        error = link();
    }
    if (error != 0)
        return failure(error);
    m_published = true;
    // The name is there for all to see; that it outlives a power cut too is not worth failing for.
    if (const int directory = openat(m_directory, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC); directory >= 0) {
        fsync(directory);
        ::close(directory);
    }
    return {};
}

} // namespace ffmpeg
