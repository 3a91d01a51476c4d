#include "linux/ffmpeg/Orientation.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace ffmpeg {

Orientation Orientation::fromTransform(const base::AffineTransform& t)
{
    if (std::abs(t.b) + std::abs(t.c) > std::abs(t.a) + std::abs(t.d))
        return {true, t.c < 0, t.b < 0};
    return {false, t.a < 0, t.d < 0};
}

base::AffineTransform preferredTransform(const AVStream& stream, base::Size size)
{
    std::size_t bytes = 0;
    const std::uint8_t* data = av_stream_get_side_data(&stream, AV_PKT_DATA_DISPLAYMATRIX, &bytes);
    if (!data || bytes < 9 * sizeof(std::int32_t))
        return {};
    std::int32_t matrix[9];
    std::memcpy(matrix, data, sizeof matrix);
    // The file's rows map (x, y) to (a·x + c·y, b·x + d·y) with y downwards, as ours do; 16.16 fixed point.
    const auto number = [&](int i) { return static_cast<double>(matrix[i]) / 65536; };
    base::AffineTransform t{number(0), number(1), number(3), number(4), 0, 0};
    if (t.a * t.d - t.b * t.c == 0)
        return {};
    t.tx = -std::min({0.0, t.a * size.width, t.c * size.height, t.a * size.width + t.c * size.height});
    t.ty = -std::min({0.0, t.b * size.width, t.d * size.height, t.b * size.width + t.d * size.height});
    return t;
}

base::Size squareSize(int width, int height, AVRational aspect)
{
    const double ratio = aspect.num > 0 && aspect.den > 0 ? av_q2d(aspect) : 1;
    const bool sane = ratio >= 1.0 / 16 && ratio <= 16;
    return {sane ? std::round(width * ratio) : width, static_cast<double>(height)};
}

void turn(const Orientation& orientation, const std::uint8_t* from, std::ptrdiff_t fromStride, int width, int height,
          std::uint8_t* to, std::ptrdiff_t toStride)
{
    const int toWidth = orientation.transpose ? height : width;
    const int toHeight = orientation.transpose ? width : height;
    for (int y = 0; y < height; ++y) {
        const std::uint8_t* row = from + y * fromStride;
        for (int x = 0; x < width; ++x) {
            int u = orientation.transpose ? y : x;
            int v = orientation.transpose ? x : y;
            if (orientation.mirrorX)
                u = toWidth - 1 - u;
            if (orientation.mirrorY)
                v = toHeight - 1 - v;
            std::memcpy(to + v * toStride + std::ptrdiff_t(u) * 4, row + std::ptrdiff_t(x) * 4, 4);
        }
    }
}

} // namespace ffmpeg
