/// What the marks of a file's format say of whether it is whole: a few bytes, read without the library, which does not
/// tell. Any thread.
#pragma once

#include "linux/ffmpeg/OpenFile.h"

#include <cstdint>
#include <optional>

namespace ffmpeg {

/// How many bytes the file had, at least, when it was finished. Nothing where its format has no such mark, or whoever
/// wrote it did not know, as when it was streamed.
std::optional<std::int64_t> announcedSize(const OpenFile& file);

/// Whether it is an MP4 file whose media is there, but not the index, which comes last.
bool lacksIndex(const OpenFile& file);

} // namespace ffmpeg
