/// The small picture of a file that all file managers share. Any thread; it blocks.
#pragma once

#include "base/Result.h"
#include "platform/views/Image.h"

#include <string>

namespace photos {

/// Writes the large thumbnail of `file` below `thumbnails`, in place of one that is there; whole or not at all.
base::Result<void> writeThumbnail(const std::string& thumbnails, const std::string& file,
                                  const platform::Bitmap& bitmap);

} // namespace photos
