/// Makes pictures of an asset's moments: the frame that is visible then, upright.
///
/// Main queue only; the pictures come on a thread of the generator's. Requests are gathered and sorted, so that asking
/// for one moment at a time costs no more than asking for all at once. What waits is given up when the generator goes:
/// its handlers are not called. A handler must not wait for the main queue, because the one who lets go waits for a
/// handler that runs.
#pragma once

#include "base/Error.h"
#include "base/Geometry.h"
#include "base/MediaTime.h"
#include "platform/views/Image.h"
#include "runtime/Object.h"

#include <functional>
#include <vector>

namespace platform {

class ImageGenerator : public runtime::Object {
public:
    enum class Result { Succeeded = 0, Failed = 1, Cancelled = 2 };

    /// `image` is null unless it succeeded, `error` unless it failed. `actual` is when the picture's own time begins.
    using Handler = std::function<void(base::MediaTime requested, const ImageRef& image, base::MediaTime actual,
                                       Result result, const base::ErrorRef& error)>;

    /// Pixels that a picture is fitted into, its aspect kept; it is never enlarged. A side that is not a positive number
    /// bounds nothing, and neither do both as they are made.
    virtual void setMaximumSize(base::Size size) = 0;
    virtual base::Size maximumSize() const = 0;

    /// Calls `handler` once for each time, in any order, and not before this returns.
    virtual void generateImagesAsynchronouslyForTimes(const std::vector<base::MediaTime>& times, Handler handler) = 0;
};

} // namespace platform
