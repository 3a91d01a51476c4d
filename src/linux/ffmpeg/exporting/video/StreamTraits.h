/// What an exported picture stream keeps of its source beside the pictures.
#pragma once

#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"

namespace ffmpeg {

/// Parameters, side data (the display matrix among them), metadata, disposition, aspect and rate; and what `picture`, one
/// of the source's, says of its light.
base::Result<void> describeLike(const AVStream& source, const AVFrame& picture, AVRational timeBase, AVStream& output);

/// What a usual picture lasts, in ticks of `timeBase`; at least 1.
std::int64_t usualStep(const AVStream& source, AVRational timeBase);

} // namespace ffmpeg
