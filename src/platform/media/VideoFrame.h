/// One decoded picture, upright and in square pixels when drawn. Immutable, shared, any thread.
#pragma once

#include "base/Geometry.h"
#include "base/MediaTime.h"

#include <cstddef>
#include <cstdint>
#include <memory>

namespace platform {

class VideoFrame {
public:
    virtual ~VideoFrame() = default;

    /// When it is shown, on the item's time line.
    virtual base::MediaTime time() const = 0;
    /// Pixels, turned as the track says and with pixels made square.
    virtual base::Size displaySize() const = 0;

    enum class Quality { Fast, Exact }; ///< while things move; when they rest

    /// Draws the whole picture, scaled to `width` × `height` pixels of blue, green, red, 255, one byte each.
    /// Colours are converted by the stream's own matrix and range. Any thread. False when that is impossible.
    virtual bool render(std::uint8_t* bgra, std::ptrdiff_t bytesPerRow, int width, int height,
                        Quality quality) const = 0;
};

using VideoFrameRef = std::shared_ptr<const VideoFrame>;

} // namespace platform
