/// The header of an AAC track: whether it tells all about the packets, what a decoder finds in them where it does not, and
/// one for a track that has none. Values; any thread.
#pragma once

#include "linux/ffmpeg/Libraries.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace ffmpeg {

/// Packets looked at: the first may be damaged.
inline constexpr int kAacPacketsToHear = 8;

/// Whether the packet begins with a header of its own, as in broadcasts.
bool hasOwnAacHeader(const AVPacket& packet);

/// Whether packets can hold something else than 1,024 samples at the rate that the header names. Of rates that are low
/// enough, only the packets say whether they are doubled.
bool mayHoldMoreThanItSays(const AVCodecParameters& parameters);

/// What a decoder gives for a packet.
struct AacHeard {
    int rate;
    int channels;
    int samples; ///< of each channel
};

/// Nothing when none of the packets can be decoded.
std::optional<AacHeard> hearAac(const AVCodecParameters& parameters, const std::vector<Owned<AVPacket>>& packets);

/// Gives `parameters` a header of plain AAC by what the container says of the track, corrected by what the packets hold,
/// which are of `ticks` a second. False when none of them can be decoded.
bool makeAacHeader(AVCodecParameters& parameters, const std::vector<Owned<AVPacket>>& packets, AVRational ticks);

} // namespace ffmpeg
