/// A movie, opened once from a URL. Main queue only, unless said otherwise.
///
/// Assets of one URL share the open file, so a movie stays readable after its file was removed.
#pragma once

#include "base/Error.h"
#include "base/Geometry.h"
#include "base/MediaTime.h"
#include "base/Url.h"
#include "runtime/Object.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace platform {

enum class MediaType { Video, Audio };

struct AssetTrack {
    int trackID = 0;
    MediaType type = MediaType::Video;
    /// Points, before the preferred transform; pixels that are not square are widened.
    base::Size naturalSize;
    /// How the pictures must be turned to stand upright.
    base::AffineTransform preferredTransform;
    base::MediaTimeRange timeRange;
};

/// Of a movie whose end is missing.
struct CutOff {
    double seconds = 0;                       ///< that are there
    std::optional<double> secondsBefore = {}; ///< that there were, where the file tells

    friend bool operator==(const CutOff&, const CutOff&) = default;
};

class Asset : public runtime::Object {
public:
    /// Nothing when the asset was made without a URL.
    virtual const std::optional<base::Url>& url() const = 0;

    /// Why it cannot be used; null while loading and when all is well.
    virtual base::ErrorRef error() const = 0;
    /// Indefinite until known.
    virtual base::MediaTime duration() const = 0;
    /// In the file's order; empty until known.
    virtual std::vector<AssetTrack> tracks() const = 0;
    std::vector<AssetTrack> tracksWithMediaType(MediaType type) const;
    /// What is left of a movie that was cut off; nothing when it is whole, or not known yet.
    virtual std::optional<CutOff> cutOff() const { return std::nullopt; }
    /// Calls `then` on the main queue, not before this returns, when the above is known or the error is.
    /// Not when the asset goes first.
    virtual void whenLoaded(std::function<void()> then) = 0;
};

} // namespace platform
