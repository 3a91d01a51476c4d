/// Writes tracks into an MP4 file whose index stands in front. One thread.
#pragma once

#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/exporting/TrackSource.h"
#include "linux/ffmpeg/exporting/output/OutputFile.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

namespace ffmpeg {

struct TrackSummary {
    AVMediaType type = AVMEDIA_TYPE_UNKNOWN;
    AVRational timeBase{1, 1};
    std::int64_t packets = 0;
    std::int64_t firstPts = 0;
    std::int64_t lastPts = 0; ///< the latest
    std::vector<Joint> joints;
};

struct WriteJob {
    OutputFile& file;
    std::vector<std::unique_ptr<TrackSource>>& tracks;
    const AVDictionary* metadata = nullptr;
    std::int32_t videoTimescale = 0; ///< 0 without pictures
    /// Packets that all tracks together will hardly exceed: so much room is kept for the index.
    std::int64_t likelyPackets = 0;
    double seconds = 0; ///< of the whole, for telling how far it is
    Cancelled cancelled;
    std::function<void(double)> progress; ///< from 0 to 1
};

/// What was written, a summary for each track. The error names the file when it could not be written.
base::Result<std::vector<TrackSummary>> writeMovie(const WriteJob& job);

} // namespace ffmpeg
