/// The NAL units of H.264 and HEVC packets: between start codes, as broadcasts have them, or behind their lengths, as
/// files do. Views into what they were made from.
#pragma once

#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/bitstream/Bits.h"

#include <optional>
#include <vector>

namespace ffmpeg {

/// Units between start codes.
std::vector<ByteView> unitsBetweenStartCodes(ByteView data);
/// Units behind big-endian lengths of so many bytes, without trailing zeros. Nothing where a length leads beyond the end.
std::optional<std::vector<ByteView>> unitsBehindLengths(ByteView data, int lengthSize);

/// So many units of a stream's header behind lengths of two bytes, from `at` on, which is moved behind them. Nothing where
/// one leads beyond the end.
std::optional<std::vector<ByteView>> unitsOfHeader(ByteView header, std::size_t& at, int count);

/// One message of a unit of supplemental enhancement information (SEI).
struct SeiMessage {
    std::uint32_t type;
    ByteView payload;
};
/// Those of such a unit, behind its header; `bytes` are without what keeps start codes from occurring inside. Up to the
/// first that leads beyond the end.
std::vector<SeiMessage> seiMessagesIn(ByteView bytes);

/// No unit ends with a zero. But some files count in what stood before the next start code when they were made.
inline ByteView withoutTrailingZeros(ByteView unit)
{
    while (!unit.empty() && unit.back() == 0)
        unit = unit.first(unit.size() - 1);
    return unit;
}

/// A packet's payload made of units behind lengths of so many bytes; 0 puts start codes before them. False when one is
/// too long for its length, or memory ran out.
/// Times, flags and the rest of `packet` stay.
bool replacePayload(AVPacket& packet, const std::vector<ByteView>& units, int lengthSize);

inline ByteView payloadOf(const AVPacket& packet)
{
    return {packet.data, static_cast<std::size_t>(packet.size)};
}

inline ByteView extradataOf(const AVCodecParameters& parameters)
{
    return {parameters.extradata, static_cast<std::size_t>(parameters.extradata_size)};
}

/// Replaces it. False without memory.
bool setExtradata(AVCodecParameters& parameters, ByteView bytes);

} // namespace ffmpeg
