/// Pictures as PNG files. Any thread.
#pragma once

#include "base/Result.h"
#include "platform/views/Image.h"

#include <cstdint>
#include <vector>

namespace ffmpeg {

/// The bytes of a file that shows an opaque `bitmap`; its alpha is left out.
base::Result<std::vector<std::uint8_t>> pngOf(const platform::Bitmap& bitmap);

} // namespace ffmpeg
