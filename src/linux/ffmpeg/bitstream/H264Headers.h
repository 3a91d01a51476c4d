/// What H.264 says in its parameter sets, as far as joining two streams needs it. Values; any thread.
#pragma once

#include "linux/ffmpeg/bitstream/Bits.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace ffmpeg::h264 {

enum class Unit : std::uint8_t {
    Slice = 1,
    SliceA = 2, ///< of slices that come in parts
    Idr = 5,
    Info = 6,
    Sps = 7,
    Pps = 8,
    Delimiter = 9,
    Filler = 12,
    SpsExtension = 13,
    SubsetSps = 15,
};

inline Unit unitOf(ByteView nal)
{
    return static_cast<Unit>(nal[0] & 0x1F);
}

/// A sequence parameter set.
struct Sps {
    std::uint32_t id = 0;
    std::uint8_t profile = 0;
    std::uint8_t constraints = 0;
    std::uint8_t level = 0;
    std::uint32_t chromaFormat = 1;
    std::uint32_t lumaDepth = 8;
    std::uint32_t chromaDepth = 8;
    bool hasSeparatePlanes = false;
    int frameNumBits = 4;
    std::uint32_t orderType = 0;
    int orderBits = 4; ///< of the picture order count, of type 0
    std::uint32_t referenceFrames = 0;
    bool hasFrameNumGaps = false;
    std::uint32_t macroblocks = 0; ///< of a picture that is not interlaced
    bool isProgressive = true;
    /// Of the pictures that are shown, in pixels. Containers may show less.
    int width = 0;
    int height = 0;
    /// How far pictures are reordered, and how many a decoder keeps. Nothing when it is not said.
    struct Restriction {
        std::uint32_t reorderFrames;
        std::uint32_t bufferedFrames;
    };
    std::optional<Restriction> restriction;
    std::size_t vuiBit = 0;         ///< position of the flag that announces the usability information
    std::size_t restrictionBit = 0; ///< of the flag inside it that announces the restriction; 0 without the former
};

/// Nothing when it is damaged.
std::optional<Sps> parseSps(ByteView nal);
/// The same set, saying this about reordering.
std::optional<Bytes> withRestriction(ByteView nal, Sps::Restriction restriction);

struct PpsIds {
    std::uint32_t pps;
    std::uint32_t sps;
};
PpsIds idsOfPps(ByteView nal);
/// The picture parameter set that a slice refers to.
std::uint32_t ppsOfSlice(ByteView nal);
/// Whether a slice is the first of its picture, or of its field.
inline bool isFirstSlice(ByteView nal)
{
    return nal.size() > 1 && (nal[1] & 0x80);
}
/// Whether a slice is of one field. `sps` is the sequence set that it refers to.
bool isOfField(ByteView nal, const Sps& sps);

/// The header of a stream in MP4, "avcC".
struct Configuration {
    int lengthSize = 4;
    bool hasExtensions = false; ///< sets that this does not keep
    std::vector<Bytes> sps;
    std::vector<Bytes> pps;

    /// From "avcC", or from sets between start codes. Nothing when there is not one set of each kind.
    static std::optional<Configuration> parse(ByteView extradata);
    static bool hasStartCodes(ByteView extradata);
    /// "avcC", with the sets in the order of their ids, asking of a decoder what any of them does.
    Bytes bytes() const;
};

} // namespace ffmpeg::h264
