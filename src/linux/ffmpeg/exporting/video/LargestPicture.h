/// Finds the size that a recording has, where it begins with smaller pictures: browsers' do. One thread, but the decoder
/// uses more.
#pragma once

#include "linux/ffmpeg/exporting/video/PicturePackets.h"

namespace ffmpeg {

/// The first of the largest pictures from `start` up to `end`, which are ticks of the output; the movie's first picture
/// where none is larger. Reads the range, and decodes what can have another size than the picture before it.
base::Result<FrameRef> largestPicture(PicturePackets& packets, std::int64_t start, std::int64_t end);

} // namespace ffmpeg
