#include "linux/photos/VideoLibrary.h"

#include "linux/photos/RecentFiles.h"
#include "linux/photos/Thumbnail.h"
#include "linux/photos/Transaction.h"

#include <cerrno>
#include <utility>

namespace photos {

VideoLibrary::VideoLibrary(LibraryOptions options, base::Log& log, base::WorkList& works)
    : m_options(std::move(options)), m_log(log), m_works(works)
{
}

void VideoLibrary::performChanges(ChangeBlock changes, Completion completion)
{
    m_worker.post(
        [this, changes = std::move(changes), completion = std::move(completion), work = m_works.begin()]() mutable {
            const auto performed = perform(changes, *work);
            completion(static_cast<bool>(performed), performed.error());
            // What they hold may be all that keeps somebody's window open: the work ends after them, with this.
            changes = nullptr;
            completion = nullptr;
        });
}

base::Result<void> VideoLibrary::perform(const ChangeBlock& changes, base::Work& work)
{
    Transaction transaction(m_options, work);
    changes(transaction);
    const auto files = transaction.commit();
    if (!files) {
        m_log.error(files.error()->description());
        keepUnsaved(transaction, files.error());
        return files.error();
    }
    for (const std::string& file : files.value())
        announce(file);
    return {};
}

/// The movie is safe by now: whatever fails here is worth no more than a line.
void VideoLibrary::announce(const std::string& file)
{
    m_log.message("saved in the library: " + file);
    if (m_options.published)
        m_options.published(file);
    if (m_options.thumbnail)
        if (const auto made = makeThumbnail(file); !made)
            logFailure("no thumbnail of " + file, made.error());
    if (const auto added = addRecentFile(m_options.directories.recentFiles, file); !added)
        logFailure(file + " is not among the recent files", added.error());
}

void VideoLibrary::keepUnsaved(const Transaction& transaction, const base::ErrorRef& why)
{
    if (m_options.unsavedDirectories.empty())
        return;
    for (const auto& kept : transaction.keepUnsaved())
        if (m_options.unsaved)
            m_options.unsaved(why, kept);
}

base::Result<void> VideoLibrary::makeThumbnail(const std::string& file)
{
    const auto bitmap = m_options.thumbnail(file, kThumbnailSide);
    if (!bitmap)
        return base::Error::make(base::kPosixErrorDomain, ENODATA, "there is no picture of it");
    return writeThumbnail(m_options.directories.thumbnails, file, *bitmap);
}

void VideoLibrary::logFailure(const std::string& what, const base::ErrorRef& error)
{
    m_log.error(what + ": " + error->description());
}

} // namespace photos
