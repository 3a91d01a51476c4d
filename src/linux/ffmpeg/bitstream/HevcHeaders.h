/// What HEVC says in its parameter sets, as far as joining two streams needs it. Values; any thread.
///
/// A set gets another number by writing it anew. Slices name their picture set by a code whose length depends on the
/// number: from 15 to 30 it is eight bits longer than that of 0, so that all behind it moves by a whole byte.
#pragma once

#include "linux/ffmpeg/bitstream/Bits.h"

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

namespace ffmpeg::hevc {

enum class Unit : std::uint8_t {
    FirstIrap = 16,
    Bla = 18, ///< a beginning in the middle of a stream, with nothing shown before it
    IdrWithLeading = 19,
    Idr = 20,
    Cra = 21, ///< what is shown before it may need what stands before it
    LastIrap = 23,
    LastPicture = 31,
    Vps = 32,
    Sps = 33,
    Pps = 34,
    Delimiter = 35,
    PrefixInfo = 39,
    LastInfo = 40,
};

inline Unit unitOf(ByteView nal)
{
    return static_cast<Unit>(nal[0] >> 1 & 0x3F);
}
inline bool isSet(ByteView nal)
{
    return unitOf(nal) >= Unit::Vps && unitOf(nal) <= Unit::Pps;
}

/// The numbers that slices of 0 can be given.
inline constexpr std::uint32_t kFirstMovablePps = 15;
inline constexpr std::uint32_t kLastMovablePps = 30;

struct Ids {
    std::uint32_t vps = 0;
    std::uint32_t sps = 0;
    std::uint32_t pps = 0;
};

/// A sequence parameter set.
///
/// Two streams are joined under one header by giving each sets of its own. Another set becomes active only where a group
/// begins that needs nothing before it, and decoders derive all anew from it: coding tools, block sizes, scaling lists,
/// bits of the picture order, quantisers, and all of a picture set may differ. What may not:
/// - chroma format, depths, planes of their own, the part that is shown: what is decoded into is made for them.
/// - how many pictures are kept and how far they are reordered: where that changes, or the coded size, decoders may forget
///   the pictures that they have not shown yet. The set that is added says of it what the other one does
///   (withBuffering()), and its coded size is the same where the encoder can make it so.
/// - usability (aspect, colours): the encoder is told what the pictures say.
/// - passing blocks by without transform, which a picture set allows: decoders look it up, but what is without loss must
///   stay so.
struct Sps {
    std::uint32_t id = 0;
    std::uint32_t vps = 0;
    std::uint32_t layers = 0; ///< in time, beside the lowest
    std::uint32_t chromaFormat = 1;
    bool hasSeparatePlanes = false;
    std::uint32_t width = 0; ///< as coded
    std::uint32_t height = 0;
    std::array<std::uint32_t, 4> window{}; ///< samples of chroma that are not shown: left, right, top, bottom
    std::uint32_t lumaDepth = 8;
    std::uint32_t chromaDepth = 8;
    struct Buffering {
        std::uint32_t pictures = 0; ///< one less than are kept
        std::uint32_t reordered = 0;
        std::uint32_t latency = 0; ///< one more than are shown later at most than what is decoded behind them; 0: any
    };
    Buffering buffering;          ///< of all layers together
    std::size_t bufferingBit = 0; ///< its position, without layers
};

std::uint32_t idOfVps(ByteView nal);
/// Nothing when it is damaged.
std::optional<Sps> parseSps(ByteView nal);
/// Whether pictures of both look alike to whoever shows them.
bool canFollow(const Sps& a, const Sps& b);
/// The same set, which has no layers, for a stream whose pictures are kept and reordered at least like those of `source`.
std::optional<Bytes> withBuffering(ByteView nal, const Sps& source);
/// Whether blocks may be kept as they are, without loss.
bool allowsLossless(ByteView pps);
/// Its own number and that of its sequence set.
Ids idsOfPps(ByteView nal);
/// The picture set that a slice refers to.
std::uint32_t ppsOfSlice(ByteView nal);

/// A set without layers with other numbers: its own, and those of what it refers to. Nothing when that cannot be done.
std::optional<Bytes> renumbered(ByteView set, const Ids& ids);
/// A slice that referred to picture set 0. Nothing when it refers to another.
std::optional<Bytes> renumberedSlice(ByteView slice, std::uint32_t pps);

/// A slice of an open group's first picture as one of a group that nothing is shown before.
Bytes closed(ByteView slice);

/// Whether it is information about the display that the movie was mastered on, or about how light it gets.
bool saysHdr(ByteView nal);

/// The sets of a stream's header, "hvcC" or between start codes.
struct Configuration {
    int lengthSize = 0; ///< 0: units stand between start codes
    std::vector<Bytes> sets;

    static std::optional<Configuration> parse(ByteView extradata);
};

} // namespace ffmpeg::hevc
