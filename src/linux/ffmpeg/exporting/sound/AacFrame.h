/// What an AAC packet says of its windows: packets of two encoders fit together only where the windows do.
#pragma once

#include "linux/ffmpeg/Libraries.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace ffmpeg {

/// Samples of each channel that a packet of AAC-LC brings, and by which its window overlaps the next one.
inline constexpr std::int64_t kAacFrame = 1024;

/// How the windows of one packet look; of all its channels, or of its first element where `isOfAll` is false.
struct AacWindows {
    enum class Sequence { Long = 0, Start = 1, Short = 2, Stop = 3 };

    Sequence sequence;
    int shape;            ///< of its second half: 0 for a sine, 1 for Kaiser-Bessel derived
    std::size_t shapeBit; ///< where the packet says so
    bool isOfAll;

    bool beginsLong() const { return sequence == Sequence::Long || sequence == Sequence::Start; }
    bool endsLong() const { return sequence == Sequence::Long || sequence == Sequence::Stop; }
};

/// Nothing when the packet cannot be read. `channels` are those of the track.
std::optional<AacWindows> aacWindowsOf(const AVPacket& packet, int channels);
void setAacShape(AVPacket& packet, const AacWindows& windows, int shape);

/// Whether packets of our encoder can stand among those of this track: plain AAC-LC with frames of 1,024 samples, in a
/// layout that needs no description of its own.
bool isPlainAac(const AVCodecParameters& parameters);

/// The rising half of a long window.
const std::array<float, kAacFrame>& aacWindow(int shape);

/// Changes one frame of samples, where the packet before and the packet behind a joint overlap, as little as it takes
/// that our encoder's window `made` brings the very same coefficients as the window `wanted` would have. What an encoder
/// keeps of a half window is half as many numbers as there are samples, so there are many signals to choose from.
void bendForRisingHalf(std::span<float> frame, int made, int wanted);
void bendForFallingHalf(std::span<float> frame, int made, int wanted);

} // namespace ffmpeg
