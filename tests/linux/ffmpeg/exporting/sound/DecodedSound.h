/// What a player would hear of a movie: a sound track, decoded by FFmpeg's libraries without our engine.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace tests {

struct DecodedSound {
    int rate = 0;
    std::int64_t start = 0; ///< where the first sample lies, in samples
    std::vector<std::vector<float>> channels;
    std::size_t packets = 0;
    std::string codec;
    int profile = 0;
    std::string language, handler;
    int disposition = 0;
    int errors = 0;
    std::int64_t firstPts = 0;                    ///< of the first packet, in samples
    std::vector<std::vector<std::uint8_t>> bytes; ///< of each packet

    std::size_t length() const { return channels.empty() ? 0 : channels.front().size(); }
    /// The sample at a place on the time line; 0 where there is none.
    float at(std::int64_t place, std::size_t channel) const
    {
        const std::int64_t index = place - start;
        return index >= 0 && index < static_cast<std::int64_t>(length())
                   ? channels[channel][static_cast<std::size_t>(index)]
                   : 0.0f;
    }
};

/// Of a level of 1, or of a ratio of two levels; silence is -180.
inline double decibels(double level)
{
    return 20 * std::log10(std::max(level, 1e-9));
}

/// What a player hears, or (`everything`) what is in the packets although an edit list hides it.
DecodedSound decodeSound(const std::string& path, int track = 0, bool everything = false);

/// By how many samples `cut` is late, by correlation: its sound at `at` against that of `source` at `sourceAt`, over so
/// many samples; at most `farthest`. `likeness` gets the correlation there, 1 for the same sound.
std::int64_t latenessOf(const DecodedSound& cut, std::int64_t at, const DecodedSound& source, std::int64_t sourceAt,
                        std::int64_t samples, std::int64_t farthest, double* likeness = nullptr);

} // namespace tests
