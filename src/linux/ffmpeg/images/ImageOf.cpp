#include "linux/ffmpeg/images/ImageOf.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <utility>

namespace ffmpeg {

base::Size fitted(base::Size size, base::Size maximum)
{
    double part = 1;
    // Comparisons with what is no number are false.
    if (maximum.width > 0)
        part = std::min(part, maximum.width / size.width);
    if (maximum.height > 0)
        part = std::min(part, maximum.height / size.height);
    return {std::max(1.0, std::round(size.width * part)), std::max(1.0, std::round(size.height * part))};
}

platform::ImageRef imageOf(const DecodedFrame& frame, base::Size maximum)
{
    const base::Size size = fitted(frame.displaySize(), maximum);
    const auto width = static_cast<int>(size.width);
    const auto height = static_cast<int>(size.height);
    auto bitmap = platform::Bitmap::transparent(width, height);
    if (!frame.render(bitmap.rgba.data(), std::ptrdiff_t{4} * width, width, height,
                      platform::VideoFrame::Quality::Exact))
        return nullptr;
    for (std::size_t i = 0; i + 3 < bitmap.rgba.size(); i += 4)
        std::swap(bitmap.rgba[i], bitmap.rgba[i + 2]);
    return std::make_shared<const platform::Image>(std::move(bitmap), 1);
}

} // namespace ffmpeg
