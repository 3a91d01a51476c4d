/// How a track's pictures are turned and stretched to stand upright in square pixels. A value.
#pragma once

#include "base/Geometry.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstdint>

namespace ffmpeg {

/// What to do with the coded picture, in this order: exchange rows and columns, then mirror.
struct Orientation {
    bool transpose = false;
    bool mirrorX = false;
    bool mirrorY = false;

    /// The nearest of the eight; other angles do not occur in recordings.
    static Orientation fromTransform(const base::AffineTransform& transform);
    bool isIdentity() const { return !transpose && !mirrorX && !mirrorY; }
};

/// The stream's display matrix, its translation made such that the turned picture begins at zero.
base::AffineTransform preferredTransform(const AVStream& stream, base::Size naturalSize);

/// Pixels made square by widening; a ratio that makes no sense is taken as 1:1.
base::Size squareSize(int width, int height, AVRational sampleAspect);

/// Copies `width` × `height` pixels of four bytes, turned, to where they have their final size.
void turn(const Orientation& orientation, const std::uint8_t* from, std::ptrdiff_t fromStride, int width, int height,
          std::uint8_t* to, std::ptrdiff_t toStride);

} // namespace ffmpeg
