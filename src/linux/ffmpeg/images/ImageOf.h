/// Decoded pictures as images. Any thread.
#pragma once

#include "base/Geometry.h"
#include "linux/ffmpeg/DecodedFrame.h"
#include "platform/views/Image.h"

namespace ffmpeg {

/// `size` fitted into `maximum`, its aspect kept, in whole pixels; never enlarged. A side of `maximum` that is not a
/// positive number bounds nothing.
base::Size fitted(base::Size size, base::Size maximum);

/// `frame` upright and in square pixels, scaled once, to what is fitted into `maximum`. Null when it cannot be drawn.
platform::ImageRef imageOf(const DecodedFrame& frame, base::Size maximum);

} // namespace ffmpeg
