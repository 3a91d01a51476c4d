/// How finely pictures are encoded that stand beside copied ones: no finer than the source deserves, and never so coarsely
/// that an eye could tell. One thread.
///
/// The source's own packets say what its pictures are worth: a keyframe and a few pictures behind it are decoded and
/// encoded again, for a trial, and the bytes of both are compared. What is encoded may take a little more than twice those
/// of the source: then the loss of the second time adds about a quarter to that of the first. A few pictures are looked at
/// because encoders at a constant rate make keyframes coarse and refine them with the next pictures; and because bytes are
/// compared, what an encoder varies within a picture counts, too.
#pragma once

#include "linux/ffmpeg/exporting/video/PicturePackets.h"

namespace ffmpeg {

/// The value of "crf" to encode with in place of that of `request`, for pictures around this tick of the output. Where
/// nothing can be compared it is one that is fine enough for all. `splicer` is prepared.
int deservedQuality(PicturePackets& packets, std::int64_t outTick, EncoderRequest request, Splicer& splicer);

} // namespace ffmpeg
