#include "linux/ffmpeg/exporting/video/HiddenPictures.h"

#include <algorithm>
#include <vector>

namespace ffmpeg {

namespace {

/// The frames of a superframe; the packet itself where it is none.
std::vector<ByteView> framesOfVp9(ByteView packet)
{
    if (packet.empty() || (packet.back() & 0xE0) != 0xC0)
        return {packet};
    const auto count = static_cast<std::size_t>(packet.back() & 7) + 1;
    const auto bytes = static_cast<std::size_t>(packet.back() >> 3 & 3) + 1;
    const std::size_t index = 2 + count * bytes;
    if (packet.size() < index || packet[packet.size() - index] != packet.back())
        return {packet};
    std::vector<ByteView> frames;
    std::size_t at = 0;
    const ByteView sizes = packet.subspan(packet.size() - index + 1);
    for (std::size_t i = 0; i < count; ++i) {
        std::size_t size = 0;
        for (std::size_t k = 0; k < bytes; ++k)
            size |= static_cast<std::size_t>(sizes[i * bytes + k]) << (8 * k);
        if (size > packet.size() - index - at)
            break;
        if (size > 0)
            frames.push_back(packet.subspan(at, size));
        at += size;
    }
    return frames;
}

/// A number of 7 bits a byte, the lowest first.
std::size_t leb128(ByteView bytes, std::size_t& at)
{
    std::size_t value = 0;
    for (int i = 0; i < 8 && at < bytes.size(); ++i) {
        const std::uint8_t byte = bytes[at++];
        value |= static_cast<std::size_t>(byte & 0x7F) << (7 * i);
        if (!(byte & 0x80))
            break;
    }
    return value;
}

enum class Obu : std::uint8_t { SequenceHeader = 1, FrameHeader = 3, Metadata = 5, Frame = 6 };

constexpr std::uint8_t kContentLight = 1;
constexpr std::uint8_t kMasteringDisplay = 2;

/// `in` stands behind what says whether a keyframe is shown.
void readSize(BitReader& in, std::uint32_t profile, PacketPictures& found)
{
    constexpr int kSyncCode = 24;
    constexpr std::uint32_t kRgb = 7;
    in.skip(1 + kSyncCode);
    if (profile >= 2)
        in.skip(1); // 10 or 12 bits
    const bool isAnyFormat = profile & 1;
    if (in.bits(3) == kRgb)
        in.skip(isAnyFormat ? 1 : 0);
    else
        in.skip(isAnyFormat ? 4 : 1); // range and subsampling
    found.width = static_cast<int>(in.bits(16)) + 1;
    found.height = static_cast<int>(in.bits(16)) + 1;
    if (in.isBeyond())
        found.width = found.height = 0;
}

} // namespace

PacketPictures picturesOfVp9(ByteView packet)
{
    PacketPictures found;
    bool isFirst = true;
    for (const ByteView frame : framesOfVp9(packet)) {
        BitReader in(frame);
        in.skip(2);
        const std::uint32_t low = in.bit();
        const std::uint32_t profile = low + 2 * in.bit();
        if (profile == 3)
            in.skip(1);
        if (in.bit()) {
            ++found.shownAgain;
            continue;
        }
        const bool isKeyframe = !in.bit();
        const bool isShown = in.bit();
        found.hidden += !isShown;
        found.startsGroup = found.startsGroup || (isFirst && isKeyframe && isShown);
        if (isKeyframe)
            readSize(in, profile, found);
        isFirst = false;
    }
    return found;
}

PacketPictures picturesOfAv1(ByteView packet)
{
    PacketPictures found;
    bool isFirst = true;
    for (std::size_t at = 0; at < packet.size();) {
        const std::uint8_t header = packet[at++];
        const auto type = static_cast<Obu>(header >> 3 & 15);
        if (header & 4)
            ++at;
        const std::size_t size = header & 2 ? leb128(packet, at) : packet.size() - std::min(at, packet.size());
        if (at > packet.size() || size > packet.size() - at)
            break;
        if (type == Obu::SequenceHeader) {
            found.hasHeader = true;
            found.bytesToHeader = at + size;
        }
        if (type == Obu::Metadata && size > 0)
            found.saysHdr = found.saysHdr || packet[at] == kContentLight || packet[at] == kMasteringDisplay;
        if ((type == Obu::FrameHeader || type == Obu::Frame) && size > 0) {
            BitReader in(packet.subspan(at, size));
            if (in.bit()) {
                ++found.shownAgain;
            } else {
                const bool isKeyframe = in.bits(2) == 0;
                const bool isShown = in.bit();
                found.hidden += !isShown;
                found.startsGroup = found.startsGroup || (isFirst && isKeyframe && isShown);
            }
            isFirst = false;
        }
        at += size;
    }
    return found;
}

} // namespace ffmpeg
