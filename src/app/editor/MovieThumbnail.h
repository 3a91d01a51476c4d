/// A picture of a movie for whoever cannot wait on the main queue. Any thread but the main queue's.
#pragma once

#include "base/Queue.h"
#include "platform/media/MediaFramework.h"
#include "platform/views/Image.h"

#include <optional>
#include <string>

namespace app {

/// The first picture of the movie at `path`, upright, neither side longer than `side` pixels. Nothing when there is none,
/// or when it does not come in time. `media` is used on the main queue, which must be running and outlives the call.
std::optional<platform::Bitmap> movieThumbnail(base::MainQueue& mainQueue, platform::MediaFramework& media,
                                               const std::string& path, int side);

} // namespace app
