#include "app/host/MakeThumbnails.h"

#include "app/host/ExitStatus.h"
#include "app/host/MediaTool.h"
#include "app/host/ProgressBar.h"
#include "app/host/WholeFile.h"
#include "base/Affinity.h"
#include "linux/dbus/EditRequest.h"
#include "linux/ffmpeg/Png.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <system_error>
#include <utility>

namespace host {

namespace {

namespace fs = std::filesystem;

/// Takes the pictures as they come, and writes them. Main queue.
class Thumbnails {
public:
    Thumbnails(const ThumbnailsCommand& command, fs::path folder, std::vector<base::MediaTime> times)
        : m_command(command), m_folder(std::move(folder)), m_times(std::move(times))
    {
        std::error_code error;
        const fs::file_status status = fs::status(command.movie, error);
        m_permissions = error ? fs::perms::owner_all : status.permissions();
    }

    const std::vector<base::MediaTime>& times() const { return m_times; }
    bool isDone() const { return m_came == m_times.size(); }
    double part() const { return double(m_came) / double(m_times.size()); }

    fs::path path(std::size_t index) const
    {
        return m_folder / thumbnailName(static_cast<int>(index), m_command.count, m_times[index]);
    }

    void take(std::size_t index, const platform::ImageRef& image, const base::ErrorRef& error)
    {
        m_affinity.assertHere();
        ++m_came;
        if (const auto written = image ? write(index, *image) : base::Result<void>(error); !written) {
            ++m_failed;
            m_firstError = m_firstError ? m_firstError : written.error();
        }
    }

    /// Null when all are there.
    base::ErrorRef error() const
    {
        if (m_failed <= 1)
            return m_firstError;
        return base::Error::make(m_firstError->domain(), m_firstError->code(),
                                 std::to_string(m_failed) + " of " + std::to_string(m_times.size())
                                     + " pictures could not be made; the first: " + m_firstError->description());
    }

private:
    base::Result<void> write(std::size_t index, const platform::Image& image) const
    {
        const auto png = ffmpeg::pngOf(image.bitmap());
        if (!png)
            return png.error();
        return writeWholeFile(path(index), png.value(), m_command.force, m_permissions);
    }

    const ThumbnailsCommand& m_command;
    const fs::path m_folder;
    const std::vector<base::MediaTime> m_times;
    fs::perms m_permissions; ///< of the movie
    std::size_t m_came = 0;
    std::size_t m_failed = 0;
    base::ErrorRef m_firstError;
    base::Affinity m_affinity;
};

base::ErrorRef cannotWrite(const fs::path& folder, const std::error_code& error)
{
    const auto why = base::Error::fromErrno(error.value(), "cannot write pictures into " + folder.native());
    return base::Error::make(dbus::kBadInputDomain, error.value(), why->description());
}

/// Looked at before anything is made: either all names are free, or none is used.
base::Result<void> checkNames(const Thumbnails& thumbnails)
{
    for (std::size_t i = 0; i < thumbnails.times().size(); ++i) {
        const fs::path path = thumbnails.path(i);
        std::error_code error;
        if (fs::exists(fs::symlink_status(path, error)))
            return base::Error::make(dbus::kBadInputDomain, EEXIST,
                                     path.native() + " is there already; give --force to replace it");
    }
    return {};
}

base::ErrorRef make(MediaTool& tool, const ThumbnailsCommand& command)
{
    const auto asset = tool.open(command.movie);
    if (!asset)
        return asset.error();
    if (asset.value()->tracksWithMediaType(platform::MediaType::Video).empty())
        return base::Error::make(dbus::kBadInputDomain, ENODATA, command.movie + " has no pictures, only sound");

    std::error_code error;
    const fs::path folder = command.output;
    Thumbnails thumbnails(command, folder, evenlySpaced(asset.value()->duration(), command.count));
    if (!command.force) {
        if (const auto free = checkNames(thumbnails); !free)
            return free.error();
    }
    const bool isNew = fs::create_directories(folder, error);
    if (error)
        return cannotWrite(folder, error);

    const auto generator = tool.media().imageGeneratorWithAsset(asset.value());
    generator->setMaximumSize(command.size);
    base::MainQueue& main = tool.system().mainQueue;
    for (std::size_t i = 0; i < thumbnails.times().size(); ++i)
        generator->generateImagesAsynchronouslyForTimes(
            {thumbnails.times()[i]}, [i, &main, &thumbnails](base::MediaTime, const platform::ImageRef& image,
                                                             base::MediaTime, auto, const base::ErrorRef& why) {
                main.post([i, image, why, &thumbnails] { thumbnails.take(i, image, why); });
            });
    ProgressBar progress("Making pictures");
    const bool ended = tool.runUntil([&] { return thumbnails.isDone(); }, [&] { progress.show(thumbnails.part()); });
    if (isNew)
        fs::remove(folder, error); // where there is nothing in it
    return ended ? thumbnails.error() : base::Error::fromErrno(ECANCELED, "cannot make the pictures");
}

} // namespace

std::vector<base::MediaTime> evenlySpaced(base::MediaTime duration, int count)
{
    // Thousandths, so that the names tell the whole truth.
    const double length = duration.isNumeric() ? std::max(0.0, duration.seconds()) : 0;
    std::vector<base::MediaTime> times;
    for (int i = 0; i < count; ++i)
        times.push_back(base::MediaTime::make(std::int64_t(std::floor(length * 1000 * i / count)), 1000));
    return times;
}

std::string thumbnailName(int index, int count, base::MediaTime time)
{
    const int digits = static_cast<int>(std::to_string(count - 1).size());
    const auto all = static_cast<long long>(time.convertedTo(1000).value);
    const long long seconds = all / 1000;
    char name[96];
    std::snprintf(name, sizeof name, "%0*d_%02lld-%02lld-%02lld.%03lld.png", digits, index, seconds / 3600,
                  seconds / 60 % 60, seconds % 60, all % 1000);
    return name;
}

int makeThumbnails(const ThumbnailsCommand& command)
{
    MediaTool tool;
    const base::ErrorRef error = make(tool, command);
    return error ? tool.fail(error) : kExitDone;
}

} // namespace host
