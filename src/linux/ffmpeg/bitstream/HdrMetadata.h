/// What a movie says of the display that it was mastered on, and of how light it gets; the same for all of its pictures.
/// Values; any thread.
#pragma once

#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/bitstream/Bits.h"

extern "C" {
#include <libavutil/mastering_display_metadata.h>
}

#include <optional>

namespace ffmpeg {

/// Whether pictures have a high dynamic range: those of an 8-bit stream, as H.264 is, would not do.
inline bool isHdr(AVColorTransferCharacteristic transfer)
{
    return transfer == AVCOL_TRC_SMPTE2084 || transfer == AVCOL_TRC_ARIB_STD_B67;
}

struct HdrMetadata {
    std::optional<AVMasteringDisplayMetadata> display; ///< whole: primaries and luminance
    std::optional<AVContentLightMetadata> light;

    /// What the picture says; else what the file says of the stream.
    static HdrMetadata of(const AVStream& stream, const AVFrame& picture);

    bool isEmpty() const { return !display && !light; }
    /// A unit that stands before the first slice of an HEVC keyframe.
    Bytes hevcUnit() const;
    /// Units that stand behind the sequence header of an AV1 keyframe.
    Bytes av1Units() const;
    /// Has the file's header say it too, where it does not yet.
    base::Result<void> describe(AVStream& output) const;
};

} // namespace ffmpeg
