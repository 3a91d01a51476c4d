#include "platform/views/Canvas.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

namespace platform {

namespace {

std::uint8_t toByte(double value)
{
    return static_cast<std::uint8_t>(std::lround(std::clamp(value, 0.0, 255.0)));
}

int toPixels(double points, double scale)
{
    // Not a pixel more for what is only the noise of the multiplication.
    return std::max(0, static_cast<int>(std::ceil(points * scale - 1e-6)));
}

struct Weight {
    int source;
    double weight;
};

/// What one row (or column) of pixels of the canvas gets of which rows of an image.
struct Line {
    int target;
    std::vector<Weight> weights;
};

/// Maps `sourceCount` pixels onto the canvas from `start` on, each as wide as `pixel`: by area where the image gets
/// smaller, by the two nearest where it grows. The edges keep their part of the pixels that they cover only partly.
std::vector<Line> lines(int sourceCount, double start, double pixel, int targetCount)
{
    std::vector<Line> result;
    const double end = start + sourceCount * pixel;
    const int first = std::max(0, static_cast<int>(std::floor(start + 1e-9)));
    const int last = std::min(targetCount, static_cast<int>(std::ceil(end - 1e-9)));
    const double half = std::max(1.0, 1 / pixel) / 2;
    for (int target = first; target < last; ++target) {
        const double coverage = std::min(target + 1.0, end) - std::max<double>(target, start);
        const double middle = (target + 0.5 - start) / pixel;
        const double from = std::max(0.0, middle - half);
        const double to = std::min<double>(sourceCount, middle + half);
        if (coverage <= 1e-9 || to <= from)
            continue;
        Line line{target, {}};
        for (int source = static_cast<int>(from); source < sourceCount && source < to; ++source) {
            const double overlap = std::min(source + 1.0, to) - std::max<double>(source, from);
            if (overlap > 1e-9)
                line.weights.push_back({source, overlap / (to - from) * std::min(1.0, coverage)});
        }
        result.push_back(std::move(line));
    }
    return result;
}

using Pixel = std::array<double, 4>;

Pixel sample(const Bitmap& bitmap, const Line& column, const Line& row)
{
    Pixel sum{};
    for (const Weight& y : row.weights)
        for (const Weight& x : column.weights) {
            const std::uint8_t* const pixel = bitmap.at(x.source, y.source);
            for (std::size_t i = 0; i < sum.size(); ++i)
                sum[i] += pixel[i] * x.weight * y.weight;
        }
    return sum;
}

} // namespace

Canvas::Canvas(base::Size size, double scale)
    : m_bitmap(Bitmap::transparent(toPixels(size.width, scale), toPixels(size.height, scale))), m_scale(scale)
{
}

void Canvas::fill(base::Rect rect, double white, double alpha)
{
    m_affinity.assertHere();
    const auto edge = [this](double points, int most) {
        return static_cast<int>(std::lround(std::clamp(points * m_scale, 0.0, static_cast<double>(most))));
    };
    const std::uint8_t opacity = toByte(alpha * 255);
    const std::uint8_t level = std::min(opacity, toByte(white * alpha * 255));
    for (int y = edge(rect.minY(), m_bitmap.height); y < edge(rect.maxY(), m_bitmap.height); ++y)
        for (int x = edge(rect.minX(), m_bitmap.width); x < edge(rect.maxX(), m_bitmap.width); ++x) {
            std::uint8_t* const pixel = m_bitmap.at(x, y);
            std::fill(pixel, pixel + 3, level);
            pixel[3] = opacity;
        }
}

void Canvas::draw(const Image& image, base::Point at, BlendMode mode, double alpha)
{
    m_affinity.assertHere();
    const Bitmap& source = image.bitmap();
    const double pixel = m_scale / image.scale();
    const auto columns = lines(source.width, at.x * m_scale, pixel, m_bitmap.width);
    const auto rows = lines(source.height, at.y * m_scale, pixel, m_bitmap.height);
    for (const Line& row : rows)
        for (const Line& column : columns) {
            const Pixel from = sample(source, column, row);
            std::uint8_t* const onto = m_bitmap.at(column.target, row.target);
            const double remaining = 1 - from[3] * alpha / 255;
            for (std::size_t i = 0; i < from.size(); ++i) {
                const double added = mode == BlendMode::SourceOver ? from[i] * alpha : 0;
                onto[i] = toByte(added + onto[i] * remaining);
            }
        }
}

ImageRef Canvas::image() const
{
    m_affinity.assertHere();
    return std::make_shared<const Image>(m_bitmap, m_scale);
}

} // namespace platform
