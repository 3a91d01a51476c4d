/// The role of the user's library of photos and videos: what is in it was put there on purpose, and stays. Any thread.
#pragma once

#include "base/Error.h"
#include "base/Url.h"

#include <functional>
#include <optional>

namespace platform {

/// What one transaction is asked to do. Only inside the change block that it was given to.
class PhotoLibraryChange {
public:
    virtual ~PhotoLibraryChange() = default;
    /// A new asset with the content of the video at `url`, which is left as it is. No URL makes the transaction fail.
    virtual void createAssetFromVideoAtFileURL(const std::optional<base::Url>& url) = 0;
};

class PhotoLibrary {
public:
    using ChangeBlock = std::function<void(PhotoLibraryChange& change)>;
    /// `error` is null exactly when it succeeded.
    using Completion = std::function<void(bool success, const base::ErrorRef& error)>;

    virtual ~PhotoLibrary() = default;

    /// Runs `changes` on a queue of the library's own, carries out what it asked for, and calls `completion` there, once:
    /// the asset is in the library then, whole, or not at all.
    virtual void performChanges(ChangeBlock changes, Completion completion) = 0;
};

} // namespace platform
