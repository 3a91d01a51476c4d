#include "linux/ffmpeg/exporting/output/OutputFile.h"

#include <cerrno>
#include <chrono>
#include <fcntl.h>
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
    file->m_directory = posix::FileDescriptor(::open(folder.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
    if (!file->m_directory)
        return file->failure(errno);
    if (file->m_name.empty())
        return file->failure(EISDIR);
    if (file->isTaken())
        return file->failure(EEXIST);
    auto made = posix::NewFile::make(file->m_directory.get());
    if (!made)
        return file->failure(static_cast<int>(made.error()->code()));
    file->m_file.emplace(std::move(made).value());
    if (const int error = file->m_source ? file->m_file->keepAsPrivateAs(file->m_source->permissions()) : 0; error != 0)
        return file->failure(error);
    if (file->m_file->isHidden())
        posix::sweepNewFiles(file->m_directory.get());
    return file;
}

bool OutputFile::isTaken() const
{
    struct stat about {};
    if (fstatat(m_directory.get(), m_name.c_str(), &about, AT_SYMLINK_NOFOLLOW) != 0)
        return false;
    return S_ISLNK(about.st_mode) || !m_source || !m_source->isStillAt(m_path);
}

base::ErrorRef OutputFile::failure(int error) const
{
    return Error::fromErrno(error, "“" + m_name + "” cannot be written");
}

int OutputFile::write(std::int64_t position, const std::uint8_t* bytes, std::size_t count)
{
    m_affinity.assertHere();
    while (count > 0) {
        const ssize_t done = pwrite(descriptor(), bytes, count, position);
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
    sync_file_range(descriptor(), m_onItsWay, until - m_onItsWay, SYNC_FILE_RANGE_WRITE);
    m_onItsWay = until;
}

void OutputFile::sendToDisk()
{
    m_affinity.assertHere();
    sync_file_range(descriptor(), 0, 0, SYNC_FILE_RANGE_WRITE);
}

base::Result<void> OutputFile::clear()
{
    m_affinity.assertHere();
    if (ftruncate(descriptor(), 0) != 0)
        return failure(errno);
    m_onItsWay = 0;
    return {};
}

base::Result<void> OutputFile::publish()
{
    m_affinity.assertHere();
    if (const auto sealed = m_file->seal(); !sealed)
        return failure(static_cast<int>(sealed.error()->code()));
    int error = m_file->takeName(m_name);
    for (auto waited = 0ms; error == EEXIST && waited < kPatience && !isTaken(); waited += kPause) {
        std::this_thread::sleep_for(kPause);
        error = m_file->takeName(m_name);
    }
    if (error != 0)
        return failure(error);
    // The name is there for all to see; that it outlives a power cut too is not worth failing for.
    if (const posix::FileDescriptor directory(openat(m_directory.get(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
        directory)
        posix::flush(directory.get());
    return {};
}

} // namespace ffmpeg
