/// Pictures of VP9 and AV1 that are decoded now and shown later. Pure functions; any thread.
#pragma once

#include "linux/ffmpeg/bitstream/Bits.h"

namespace ffmpeg {

struct PacketPictures {
    int hidden = 0;            ///< decoded, not shown by this packet
    int shownAgain = 0;        ///< shown by it, decoded before
    int width = 0, height = 0; ///< VP9: of its keyframe; 0 when it has none
    bool startsGroup = false;  ///< its first is a keyframe that is shown
    bool hasHeader = false;    ///< AV1: a sequence header
    /// AV1: how many bytes it takes up to the end of its sequence header; 0 when it has none.
    std::size_t bytesToHeader = 0;
    bool saysHdr = false; ///< AV1: of the display that the movie was mastered on, or how light it gets
};

/// What a VP9 packet holds; a superframe has several pictures.
PacketPictures picturesOfVp9(ByteView packet);
/// What an AV1 temporal unit holds.
PacketPictures picturesOfAv1(ByteView packet);

} // namespace ffmpeg
