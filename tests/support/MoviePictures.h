/// Reads the number that every picture of the test movies carries (tests/movies/README.md).
#pragma once

#include "platform/media/VideoFrame.h"

#include <cstddef>
#include <cstdint>
#include <vector>

namespace tests {

/// A picture of four bytes a pixel: blue, green, red, 255.
struct Pixels {
    int width = 0;
    int height = 0;
    std::vector<std::uint8_t> bytes;

    const std::uint8_t* at(int x, int y) const
    {
        return bytes.data()
               + (static_cast<std::size_t>(y) * static_cast<std::size_t>(width) + static_cast<std::size_t>(x)) * 4;
    }
    int luma(int x, int y) const
    {
        const std::uint8_t* pixel = at(x, y);
        return (pixel[0] * 29 + pixel[1] * 150 + pixel[2] * 77) / 256;
    }
};

/// Empty when it cannot be drawn.
inline Pixels pixelsOf(const platform::VideoFrame& frame, int width, int height,
                       platform::VideoFrame::Quality quality = platform::VideoFrame::Quality::Exact)
{
    Pixels pixels{width, height, std::vector<std::uint8_t>(static_cast<std::size_t>(width * height) * 4)};
    if (!frame.render(pixels.bytes.data(), std::ptrdiff_t{4} * width, width, height, quality))
        return {};
    return pixels;
}

/// The number in an upright picture; -1 when there is no picture.
inline int numberIn(const Pixels& pixels)
{
    if (pixels.bytes.empty())
        return -1;
    const int perRow = pixels.width >= 640 ? 16 : 8;
    int number = 0;
    for (int i = 0; i < 16; ++i) {
        const int x = 8 + 38 * (i % perRow) + 16;
        const int y = 8 + 38 * (i / perRow) + 16;
        number |= (pixels.luma(x, y) > 125) << i;
    }
    return number;
}

inline int numberIn(const platform::VideoFrameRef& frame)
{
    if (!frame)
        return -1;
    const auto size = frame->displaySize();
    return numberIn(pixelsOf(*frame, static_cast<int>(size.width), static_cast<int>(size.height)));
}

} // namespace tests
