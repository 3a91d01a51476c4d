/// Writes an asset, or a range of it, as a new movie file; never touches the source.
///
/// Set up and started on the main queue, once. The file is whole or not there at all: it gets its name last. A session
/// that was started lives until it has told its end.
#pragma once

#include "base/Error.h"
#include "base/MediaTime.h"
#include "base/Url.h"
#include "platform/media/AudioMix.h"
#include "runtime/Object.h"

#include <functional>
#include <optional>

namespace platform {

/// The asset's own quality: what can be copied is copied, the rest is encoded without visible loss.
enum class ExportPreset { HighestQuality };
enum class FileType { Mpeg4 };

class ExportSession : public runtime::Object {
public:
    enum class Status { Unknown = 0, Waiting = 1, Exporting = 2, Completed = 3, Failed = 4, Cancelled = 5 };

    /// Where the movie goes. A file that is there already is an error.
    virtual void setOutputURL(std::optional<base::Url> url) = 0;
    /// MPEG-4 unless another is asked for.
    virtual void setOutputFileType(FileType type) = 0;
    /// From `start` up to its end; what lies outside the movie is left out. All of it when nothing is set.
    virtual void setTimeRange(std::optional<base::MediaTimeRange> range) = 0;
    /// One sound track with all inputs summed at unity gain. Without a mix all tracks are kept as they are.
    virtual void setAudioMix(std::optional<AudioMix> mix) = 0;

    /// Calls `done` once, on a thread of the session's own and not before this returns; status, error and output URL
    /// are final then.
    virtual void exportAsynchronously(std::function<void()> done) = 0;

    // Any thread, at any time.
    /// Ends a running export soon, with the status Cancelled and no file.
    virtual void cancelExport() = 0;
    virtual Status status() const = 0;
    /// Why it failed; null otherwise.
    virtual base::ErrorRef error() const = 0;
    virtual std::optional<base::Url> outputURL() const = 0;
    /// From 0 to 1; it never goes back.
    virtual double progress() const = 0;
};

} // namespace platform
