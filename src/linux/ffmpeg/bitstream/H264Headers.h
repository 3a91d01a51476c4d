/// What H.264 says in its parameter sets, as far as joining two streams needs it. Values; any thread.
#pragma once

#include "linux/ffmpeg/bitstream/Bits.h"

#include <array>
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
///
/// Two streams are joined under one header by giving each sets of its own. Decoders look up a slice's sets, but what they
/// derived from the first sequence set they often keep until the size or format of pictures changes. What these say:
/// - id, bits of frame numbers and of the picture order, its type, gaps, inference of direct blocks: looked up for each
///   slice, and forgotten with each IDR. They may differ.
/// - chroma format, depths, planes of their own, bypassing of the transform, size, fields or not, cropping: they make
///   buffers, tables of functions and the order in which coefficients are read. They must be the same (canFollow()).
/// - profile, level, number of references, restriction of reordering: by them a decoder is chosen, its buffers counted,
///   and pictures held back. The set that is added asks for what the other one does (inUseLike()).
/// - usability (aspect, colours, chroma location, timing): what changes there has players and decoders begin anew. The set
///   that is added says the same, word for word (inUseLike()); what it says of its references' reach is the wider of both.
/// - scaling lists, and all of a picture set (entropy coding, weights, quantisers, transform sizes): looked up for each
///   slice, like the tables made of them. They may differ.
struct Sps {
    std::uint32_t id = 0;
    std::uint8_t profile = 0;
    std::uint8_t constraints = 0;
    std::uint8_t level = 0;
    std::uint32_t chromaFormat = 1;
    std::uint32_t lumaDepth = 8;
    std::uint32_t chromaDepth = 8;
    bool hasSeparatePlanes = false;
    bool bypassesTransform = false; ///< of blocks with the finest quantiser, which are without loss then
    int frameNumBits = 4;
    std::uint32_t orderType = 0;
    int orderBits = 4; ///< of the picture order count, of type 0
    std::uint32_t referenceFrames = 0;
    bool hasFrameNumGaps = false;
    std::uint32_t macroblocks = 0; ///< of a picture that is not interlaced
    std::uint32_t macroblocksWide = 0;
    bool isProgressive = true;
    /// Left, right, top, bottom; in samples of colour, of a field where it can be one.
    std::array<int, 4> cropping{};
    /// Of the pictures that are shown, in pixels. Containers may show less.
    int width = 0;
    int height = 0;
    /// How far pictures are reordered, and how many a decoder keeps. Nothing when it is not said.
    struct Restriction {
        std::uint32_t reorderFrames;
        std::uint32_t bufferedFrames;
    };
    std::optional<Restriction> restriction;
    std::size_t referencesBit = 0;  ///< position of the number of references
    std::size_t vuiBit = 0;         ///< of the flag that announces the usability information
    std::size_t restrictionBit = 0; ///< of the flag inside it that announces the restriction; 0 without the former
};

/// Nothing when it is damaged.
std::optional<Sps> parseSps(ByteView nal);
/// Whether slices of one set can follow those of the other in one stream.
bool canFollow(const Sps& a, const Sps& b);
/// The same set, for pictures that are used as those of `source` are, and saying this about reordering. Nothing when one
/// of them is damaged.
std::optional<Bytes> inUseLike(ByteView nal, ByteView source, Sps::Restriction restriction);

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

/// How many pictures that others refer to are decoded behind a keyframe until all that is shown is right, as far as the
/// recovery point of this SEI unit says it (recovery_frame_cnt, H.264 D.2.8): encoders that refresh pictures part by part
/// ("intra refresh") begin anew nowhere. 0 when it says nothing.
std::uint32_t picturesUntilRefreshed(ByteView info);

/// The header of a stream in MP4, "avcC".
struct Configuration {
    int lengthSize = 4;         ///< also where the sets came between start codes
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
