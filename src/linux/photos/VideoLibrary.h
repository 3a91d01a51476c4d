/// The photo library on Linux: the user's directory for videos. A movie that is put there is a file of its own, named
/// after the recorded app and the date of the recording, which it keeps; it is there whole or not at all, whenever the
/// process or the machine stops, and replaces nothing. It appears with its thumbnail in file managers, and among the
/// recent files.
///
/// Change blocks and completions run on the library's one worker, in the order of their transactions, and are destroyed
/// there. Errors carry `errno` as their code; their descriptions name the file and say what the user can do, and are
/// logged. The destructor finishes what was begun.
#pragma once

#include "base/Date.h"
#include "base/Log.h"
#include "base/Queue.h"
#include "base/Result.h"
#include "base/WorkList.h"
#include "linux/photos/UserDirectories.h"
#include "platform/photos/PhotoLibrary.h"
#include "platform/views/Image.h"

#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace photos {

/// Pixels: neither side of a thumbnail is longer.
inline constexpr int kThumbnailSide = 256;

/// What is known of a recording.
struct Recording {
    std::string appName;            ///< empty: unknown
    std::optional<base::Date> date; ///< nothing: that of its file
};

/// All functions are called on the library's worker. Each may be empty.
struct LibraryOptions {
    UserDirectories directories;
    /// Where a path of a URL really is.
    std::function<std::string(const std::string& path)> resolvedPath;
    /// Of the movie at a real path.
    std::function<Recording(const std::string& path)> recording;
    /// A picture of the movie at a real path, opaque, neither side longer than `side` pixels; nothing when there is none.
    /// It may wait for another thread, but not for ever: the file is in the library by then, and its completion waits.
    std::function<std::optional<platform::Bitmap>(const std::string& path, int side)> thumbnail;
    /// Told before the completion where a new movie is.
    std::function<void(const std::string& path)> published;
    /// Asked while a movie is copied: false ends the transaction with ECANCELED.
    std::function<bool()> goOn = {};
    /// Where a movie is kept that could not be put into the library, the better place first: whoever asked for the
    /// change may remove it right after the completion. None: it is not kept.
    std::vector<std::string> unsavedDirectories = {};
    /// Told before the completion why a movie is not in the library, and where it is kept, or why it is not.
    std::function<void(const base::ErrorRef& why, const base::Result<std::string>& kept)> unsaved = {};
};

class VideoLibrary final : public platform::PhotoLibrary {
public:
    /// `log` and `works` outlive it. A transaction is work from performChanges() until its completion has returned.
    VideoLibrary(LibraryOptions options, base::Log& log, base::WorkList& works);

    void performChanges(ChangeBlock changes, Completion completion) override;

private:
    class Transaction;

    base::Result<void> perform(const ChangeBlock& changes, base::Work& work);
    void announce(const std::string& file);
    void keepUnsaved(const Transaction& transaction, const base::ErrorRef& why);
    base::Result<void> makeThumbnail(const std::string& file);
    void logFailure(const std::string& what, const base::ErrorRef& error);

    const LibraryOptions m_options;
    base::Log& m_log;
    base::WorkList& m_works;
    base::WorkerQueue m_worker; ///< last: it uses all of the above until it has ended
};

} // namespace photos
