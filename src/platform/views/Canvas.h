/// A bitmap to draw on: transparent at first, in points, y downwards. One thread at a time.
#pragma once

#include "base/Affinity.h"
#include "base/Geometry.h"
#include "platform/views/Image.h"

namespace platform {

enum class BlendMode {
    SourceOver,     ///< result = source + destination × (1 − source alpha)
    DestinationOut, ///< result = destination × (1 − source alpha)
};

class Canvas {
public:
    /// `size` in points, rounded up to whole pixels at `scale` pixels per point.
    Canvas(base::Size size, double scale);

    /// Replaces the pixels of `rect` by grey of that level and opacity.
    void fill(base::Rect rect, double white, double alpha);
    /// Draws `image` with its origin at `at`; one made for another scale is resampled to this canvas's.
    void draw(const Image& image, base::Point at, BlendMode mode, double alpha);

    ImageRef image() const;

private:
    base::Affinity m_affinity;
    Bitmap m_bitmap;
    double m_scale;
};

} // namespace platform
