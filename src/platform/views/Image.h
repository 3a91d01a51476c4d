/// A picture in memory: immutable, shared, any thread.
#pragma once

#include "base/Geometry.h"

#include <cstdint>
#include <memory>
#include <string_view>
#include <vector>

namespace platform {

/// Red, green, blue, alpha, one byte each, premultiplied; rows from the top, without padding.
struct Bitmap {
    int width = 0;
    int height = 0;
    std::vector<std::uint8_t> rgba;

    static Bitmap transparent(int width, int height);
    const std::uint8_t* at(int x, int y) const { return &rgba[static_cast<std::size_t>(y * width + x) * 4]; }
    std::uint8_t* at(int x, int y) { return &rgba[static_cast<std::size_t>(y * width + x) * 4]; }
};

class Image {
public:
    /// `scale` is pixels per point.
    Image(Bitmap bitmap, double scale) : m_bitmap(std::move(bitmap)), m_scale(scale) {}

    const Bitmap& bitmap() const { return m_bitmap; }
    double scale() const { return m_scale; }
    /// In points.
    base::Size size() const { return {m_bitmap.width / m_scale, m_bitmap.height / m_scale}; }

private:
    Bitmap m_bitmap;
    double m_scale;
};

using ImageRef = std::shared_ptr<const Image>;

/// The role of the program's own picture resources.
class ImageCatalog {
public:
    virtual ~ImageCatalog() = default;
    /// Drawn for the screen's scale; null when there is no such picture.
    virtual ImageRef imageNamed(std::string_view name) = 0;
};

} // namespace platform
