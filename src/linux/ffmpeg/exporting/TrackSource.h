/// One track of an exported movie, given packet by packet in decode order. One thread at a time.
#pragma once

#include "base/MediaTime.h"
#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/exporting/Detachable.h"
#include "linux/ffmpeg/exporting/video/JointWitness.h"

namespace ffmpeg {

/// What is exported, on the movie's time line: from `start` up to `end`. Both lie within the movie, and are moments of
/// its picture track's clock where there is one, so that no track has to round them differently from another.
struct ExportRange {
    base::MediaTime start;
    base::MediaTime end;
};

class TrackSource : public Detachable {
public:
    /// Fills in the output's stream: codec parameters with their header, time base, metadata, disposition, side data.
    /// Called once, before the first packet.
    virtual base::Result<void> describe(AVStream& output) = 0;

    /// The next packet, in the time base that describe() left, `start` being 0. Times before 0 are what a decoder needs
    /// but nobody sees or hears: an edit list hides them. False when there is none left.
    virtual base::Result<bool> next(AVPacket& packet) = 0;

    /// When all have come: where packets of different origin follow each other, and what is to be seen there.
    virtual base::Result<std::vector<Joint>> joints()
    {
        assertHere();
        return std::vector<Joint>();
    }
};

} // namespace ffmpeg
