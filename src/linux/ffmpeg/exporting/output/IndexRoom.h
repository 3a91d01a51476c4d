/// The room that was kept in front of an MP4's data for its index, once it is known how much of it is needed. One thread.
#pragma once

#include "linux/ffmpeg/exporting/output/OutputFile.h"

namespace ffmpeg {

/// Moves the data of a written movie up to its index where what is left between them is much in comparison. 0, or a
/// negative errno, after which the file is not whole. A movie that is laid out otherwise stays as it is.
int closeIndexRoom(OutputFile& file);

} // namespace ffmpeg
