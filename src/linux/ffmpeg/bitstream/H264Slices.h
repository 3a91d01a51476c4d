/// What H.264 says at the beginning of a slice about other pictures. Values; any thread.
#pragma once

#include "linux/ffmpeg/bitstream/H264Headers.h"

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

namespace ffmpeg::h264 {

/// A picture parameter set.
struct Pps {
    std::uint32_t id = 0;
    std::uint32_t sps = 0;
    bool hasBottomOrder = false;               ///< slices tell the order of their second field
    bool hasSliceGroups = false;               ///< what follows was not read then
    std::array<std::uint32_t, 2> references{}; ///< pictures in each list of a slice that does not say how many
    bool isWeighted = false;
    bool isWeightedB = false; ///< by weights that slices tell
    bool hasRedundance = false;
};
/// Nothing when it is damaged.
std::optional<Pps> parsePps(ByteView nal);

/// Of whole pictures, whose references are marked for a short term: recorders write no others.
struct Slice {
    enum class Kind : std::uint8_t { P, B, I };
    /// Puts a picture in front of those of a list that were not put there yet.
    struct Move {
        bool adds;           ///< to the number of the picture before, or subtracts from it
        std::uint32_t apart; ///< one less than how far apart the numbers are
    };
    struct List {
        std::uint32_t count = 0;
        std::vector<Move> moves;
    };

    Kind kind = Kind::I;
    bool isIdr = false;
    std::uint8_t importance = 0; ///< nal_ref_idc: 0 when no picture refers to this one
    std::uint32_t firstMacroblock = 0;
    std::uint32_t frameNum = 0;
    std::uint32_t order = 0; ///< the lowest bits of the picture order count
    std::array<List, 2> lists;
    bool slides = true;                  ///< the oldest reference goes when there are too many
    std::vector<std::uint32_t> unmarked; ///< else these go: one less than how far back their numbers are
};
/// Nothing when it is damaged, or says anything else than what is told here.
std::optional<Slice> parseSlice(ByteView nal, const Sps& sps, const Pps& pps);
/// Which set of parameters a slice has: nothing when it is damaged.
std::optional<std::uint32_t> ppsIdOf(ByteView slice);

/// A set of parameters for what standInFor() makes.
Bytes standInParameters(std::uint32_t pps, std::uint32_t sps);
/// A slice that does to the pictures around it what `slice` does, and is nothing to decode: its first macroblocks are
/// copies of the picture that was decoded before, and there are no others. `slice` is no IDR.
Bytes standInFor(const Slice& slice, const Sps& sps, std::uint32_t pps, std::uint32_t macroblocks);

} // namespace ffmpeg::h264
