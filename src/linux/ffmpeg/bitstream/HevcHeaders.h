/// What HEVC says in its parameter sets, as far as joining two streams needs it. Values; any thread.
///
/// A set gets another number by writing it anew. Slices name their picture set by a code whose length depends on the
/// number: from 15 to 30 it is eight bits longer than that of 0, so that all behind it moves by a whole byte.
#pragma once

#include "linux/ffmpeg/bitstream/Bits.h"

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

struct Sps {
    std::uint32_t id = 0;
    std::uint32_t vps = 0;
    std::uint32_t reorderPictures = 0;
};

std::uint32_t idOfVps(ByteView nal);
/// Nothing when it is damaged, or has layers in time.
std::optional<Sps> parseSps(ByteView nal);
/// Its own number and that of its sequence set.
Ids idsOfPps(ByteView nal);
/// The picture set that a slice refers to.
std::uint32_t ppsOfSlice(ByteView nal);

/// A set with other numbers: its own, and those of what it refers to. Nothing when that cannot be done.
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
