/// Opens what was written and compares it with what should have been. One thread.
#pragma once

#include "linux/ffmpeg/exporting/output/MovieWriter.h"

#include <vector>

namespace ffmpeg {

/// The error says what is wrong: a track, its first picture or sound, its length, a group that cannot be decoded, or
/// pictures beside a joint that are not the source's. It saysCannotCopySound() where that is a matter of the sound alone,
/// and saysCannotCopy() otherwise.
base::Result<void> checkOutput(const OutputFile& file, const std::vector<TrackSummary>& written,
                               const Cancelled& cancelled);

} // namespace ffmpeg
