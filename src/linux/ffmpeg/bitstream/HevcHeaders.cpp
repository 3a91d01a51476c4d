#include "linux/ffmpeg/bitstream/HevcHeaders.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"

#include <algorithm>
#include <tuple>

namespace ffmpeg::hevc {

namespace {

constexpr int kHeaderBits = 16;
constexpr int kProfileBits = 96; ///< of a stream without layers in time, with its level
constexpr int kLevelBits = 8;
constexpr std::uint32_t kMostLayers = 6; ///< beside the lowest
constexpr std::size_t kBeginning = 64;   ///< bytes that are enough for the numbers

bool isIrap(Unit unit)
{
    return unit >= Unit::FirstIrap && unit <= Unit::LastIrap;
}

/// Where a set's stop bit stands.
std::size_t endOf(const Bytes& payload)
{
    std::size_t bits = payload.size() * 8;
    while (bits > 0 && !(payload[(bits - 1) / 8] >> (7 - (bits - 1) % 8) & 1))
        --bits;
    return bits > 0 ? bits - 1 : 0;
}

Bytes beginningOf(ByteView nal)
{
    return withoutEmulation(nal.first(std::min(nal.size(), kBeginning)));
}

/// Profiles and levels of the layers below the highest.
void skipLayers(BitReader& in, std::uint32_t layers)
{
    if (layers == 0)
        return;
    int bits = 0;
    for (std::uint32_t i = 0; i < layers; ++i) {
        bits += in.bit() ? kProfileBits - kLevelBits : 0;
        bits += in.bit() ? kLevelBits : 0;
    }
    in.skip(2 * static_cast<int>(kMostLayers + 2 - layers) + bits);
}

} // namespace

std::uint32_t idOfVps(ByteView nal)
{
    const Bytes payload = beginningOf(nal);
    BitReader in(payload);
    in.skip(kHeaderBits);
    return in.bits(4);
}

std::optional<Sps> parseSps(ByteView nal)
{
    const Bytes payload = withoutEmulation(nal);
    BitReader in(payload);
    Sps sps;
    in.skip(kHeaderBits);
    sps.vps = in.bits(4);
    sps.layers = in.bits(3);
    if (sps.layers > kMostLayers)
        return std::nullopt;
    in.skip(1 + kProfileBits);
    skipLayers(in, sps.layers);
    sps.id = in.ue();
    sps.chromaFormat = in.ue();
    if (sps.chromaFormat == 3)
        sps.hasSeparatePlanes = in.bit() != 0;
    sps.width = in.ue();
    sps.height = in.ue();
    if (in.bit())
        for (std::uint32_t& side : sps.window)
            side = in.ue();
    sps.lumaDepth = in.ue() + 8;
    sps.chromaDepth = in.ue() + 8;
    in.ue();
    const bool isSaidOfEach = in.bit() != 0;
    sps.bufferingBit = in.position();
    for (std::uint32_t i = isSaidOfEach ? 0 : sps.layers; i <= sps.layers; ++i)
        for (std::uint32_t* each : {&sps.buffering.pictures, &sps.buffering.reordered, &sps.buffering.latency})
            *each = in.ue();
    if (in.isBeyond() || sps.id > 15)
        return std::nullopt;
    return sps;
}

bool canFollow(const Sps& a, const Sps& b)
{
    const auto looks = [](const Sps& sps) {
        const std::uint32_t across = sps.chromaFormat == 1 || sps.chromaFormat == 2 ? 2 : 1;
        const std::uint32_t down = sps.chromaFormat == 1 ? 2 : 1;
        return std::tuple(sps.chromaFormat, sps.hasSeparatePlanes, sps.lumaDepth, sps.chromaDepth, sps.window[0],
                          sps.window[2], sps.width - across * (sps.window[0] + sps.window[1]),
                          sps.height - down * (sps.window[2] + sps.window[3]));
    };
    return looks(a) == looks(b);
}

std::optional<Bytes> withBuffering(ByteView nal, const Sps& source)
{
    const auto own = parseSps(nal);
    const Bytes payload = withoutEmulation(nal);
    const std::size_t end = endOf(payload);
    if (!own || own->layers > 0 || own->bufferingBit > end)
        return std::nullopt;
    BitWriter out;
    out.copy(payload, 0, own->bufferingBit);
    out.ue(std::max(own->buffering.pictures, source.buffering.pictures));
    out.ue(std::max(own->buffering.reordered, source.buffering.reordered));
    const bool isBounded = own->buffering.latency > 0 && source.buffering.latency > 0;
    out.ue(isBounded ? std::max(own->buffering.latency, source.buffering.latency) : 0);
    BitReader in(payload);
    in.skip(static_cast<int>(own->bufferingBit));
    for (int i = 0; i < 3; ++i)
        in.ue();
    out.copy(payload, in.position(), end);
    out.finish();
    return withEmulation(out.bytes());
}

bool allowsLossless(ByteView pps)
{
    const Bytes payload = beginningOf(pps);
    BitReader in(payload);
    in.skip(kHeaderBits);
    in.ue();
    in.ue();
    in.skip(7);
    in.ue();
    in.ue();
    in.se();
    in.skip(2);
    if (in.bit())
        in.ue();
    in.se();
    in.se();
    in.skip(3);
    return in.bit() != 0;
}

Ids idsOfPps(ByteView nal)
{
    const Bytes payload = beginningOf(nal);
    BitReader in(payload);
    in.skip(kHeaderBits);
    Ids ids;
    ids.pps = in.ue();
    ids.sps = in.ue();
    return ids;
}

std::uint32_t ppsOfSlice(ByteView nal)
{
    const Bytes payload = beginningOf(nal);
    BitReader in(payload);
    in.skip(kHeaderBits + 1 + isIrap(unitOf(nal)));
    return in.ue();
}

std::optional<Bytes> renumbered(ByteView set, const Ids& ids)
{
    const Bytes payload = withoutEmulation(set);
    BitReader in(payload);
    BitWriter out;
    out.copy(payload, 0, kHeaderBits);
    in.skip(kHeaderBits);
    switch (unitOf(set)) {
    case Unit::Vps:
        in.skip(4);
        out.bits(ids.vps, 4);
        break;
    case Unit::Sps: {
        if (const auto sps = parseSps(set); !sps || sps->layers > 0)
            return std::nullopt;
        in.skip(4);
        out.bits(ids.vps, 4);
        const std::size_t at = in.position();
        in.skip(3 + 1 + kProfileBits);
        out.copy(payload, at, in.position());
        in.ue();
        out.ue(ids.sps);
        break;
    }
    case Unit::Pps:
        in.ue();
        in.ue();
        out.ue(ids.pps);
        out.ue(ids.sps);
        break;
    default:
        return std::nullopt;
    }
    const std::size_t end = endOf(payload);
    if (in.position() > end)
        return std::nullopt;
    out.copy(payload, in.position(), end);
    out.finish();
    return withEmulation(out.bytes());
}

std::optional<Bytes> renumberedSlice(ByteView slice, std::uint32_t pps)
{
    constexpr std::size_t kNumberByte = 2; // the code of 0 is one bit, which stands in it
    if (slice.size() <= kNumberByte || ppsOfSlice(slice) != 0 || pps < kFirstMovablePps || pps > kLastMovablePps)
        return std::nullopt;
    const Bytes payload = withoutEmulation(slice);
    const std::size_t code = kHeaderBits + 1 + (isIrap(unitOf(slice)) ? 1 : 0);
    BitWriter out;
    out.copy(payload, 0, code);
    out.ue(pps);
    out.copy(payload, code + 1, (kNumberByte + 1) * 8);
    Bytes bytes = out.bytes();
    bytes.insert(bytes.end(), payload.begin() + kNumberByte + 1, payload.end());
    return withEmulation(bytes);
}

Bytes closed(ByteView slice)
{
    constexpr int kTypeShift = 1;
    constexpr std::uint8_t kAllButType = 0x81;
    // In front of it others are shown yet: it must not say that they are to be forgotten.
    constexpr std::size_t kFlagByte = 2;
    constexpr std::uint8_t kForgetsOthers = 0x40;
    const Unit unit = unitOf(slice) == Unit::IdrWithLeading ? Unit::Idr : Unit::Bla;
    Bytes payload = withoutEmulation(slice);
    payload[0] = static_cast<std::uint8_t>((payload[0] & kAllButType) | static_cast<int>(unit) << kTypeShift);
    payload[kFlagByte] = static_cast<std::uint8_t>(payload[kFlagByte] & ~kForgetsOthers);
    return withEmulation(payload);
}

bool saysHdr(ByteView nal)
{
    constexpr std::uint32_t kMasteringDisplay = 137;
    constexpr std::uint32_t kContentLight = 144;
    if (unitOf(nal) != Unit::PrefixInfo)
        return false;
    const Bytes payload = withoutEmulation(nal);
    const auto messages = seiMessagesIn(ByteView(payload).subspan(kHeaderBits / 8));
    return std::any_of(messages.begin(), messages.end(), [](const SeiMessage& each) {
        return each.type == kMasteringDisplay || each.type == kContentLight;
    });
}

std::optional<Configuration> Configuration::parse(ByteView extradata)
{
    constexpr std::size_t kArrays = 22;
    Configuration configuration;
    const auto add = [&](ByteView nal) {
        nal = withoutTrailingZeros(nal);
        if (nal.size() > 2 && isSet(nal))
            configuration.sets.emplace_back(nal.begin(), nal.end());
    };
    if (extradata.size() > kArrays && extradata[0] == 1) {
        configuration.lengthSize = (extradata[kArrays - 1] & 3) + 1;
        std::size_t at = kArrays + 1;
        for (int arrays = extradata[kArrays]; arrays > 0; --arrays) {
            if (at + 3 > extradata.size())
                return std::nullopt;
            const int count = extradata[at + 1] << 8 | extradata[at + 2];
            at += 3;
            const auto units = unitsOfHeader(extradata, at, count);
            if (!units)
                return std::nullopt;
            std::for_each(units->begin(), units->end(), add);
        }
    } else {
        for (const ByteView nal : unitsBetweenStartCodes(extradata))
            add(nal);
    }
    for (const Unit unit : {Unit::Vps, Unit::Sps, Unit::Pps})
        if (std::none_of(configuration.sets.begin(), configuration.sets.end(),
                         [unit](const Bytes& set) { return unitOf(set) == unit; }))
            return std::nullopt;
    return configuration;
}

} // namespace ffmpeg::hevc
