#include "linux/ffmpeg/bitstream/H264Headers.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"

#include <algorithm>
#include <array>
#include <tuple>

namespace ffmpeg::h264 {

namespace {

constexpr std::size_t kHeaderBytes = 4; ///< NAL header, profile, constraints, level
constexpr std::size_t kProfileByte = 1;
constexpr std::size_t kConstraintsByte = 2;

/// Profiles whose sets tell the chroma format and the bit depths.
bool isHigh(std::uint8_t profile)
{
    constexpr std::array<std::uint8_t, 13> kHigh{100, 110, 122, 244, 44, 83, 86, 118, 128, 138, 139, 134, 135};
    return std::find(kHigh.begin(), kHigh.end(), profile) != kHigh.end();
}

/// How much a profile asks of a decoder.
int rank(std::uint8_t profile)
{
    constexpr std::array<std::uint8_t, 8> kOrder{66, 88, 77, 100, 110, 122, 44, 244};
    return static_cast<int>(std::find(kOrder.begin(), kOrder.end(), profile) - kOrder.begin());
}

void skipScalingList(BitReader& in, int size)
{
    std::int32_t last = 8;
    std::int32_t next = 8;
    for (int i = 0; i < size && next != 0; ++i) {
        next = (last + in.se() + 256) % 256;
        last = next == 0 ? last : next;
    }
}

void readHigh(BitReader& in, Sps& sps)
{
    sps.chromaFormat = in.ue();
    if (sps.chromaFormat == 3)
        sps.hasSeparatePlanes = in.bit() != 0;
    sps.lumaDepth = in.ue() + 8;
    sps.chromaDepth = in.ue() + 8;
    sps.bypassesTransform = in.bit() != 0;
    if (in.bit()) {
        const int lists = sps.chromaFormat == 3 ? 12 : 8;
        for (int i = 0; i < lists; ++i)
            if (in.bit())
                skipScalingList(in, i < 6 ? 16 : 64);
    }
}

/// A number of bits of which the file can claim anything.
int bitCount(std::uint32_t beyondFour)
{
    return static_cast<int>(std::min<std::uint32_t>(beyondFour, 12)) + 4;
}

void readPictureOrder(BitReader& in, Sps& sps)
{
    sps.orderType = in.ue();
    if (sps.orderType == 0) {
        sps.orderBits = bitCount(in.ue());
    } else if (sps.orderType == 1) {
        in.skip(1);
        in.se();
        in.se();
        const std::uint32_t count = std::min<std::uint32_t>(in.ue(), 255);
        for (std::uint32_t i = 0; i < count; ++i)
            in.se();
    }
}

void readSize(BitReader& in, Sps& sps)
{
    constexpr std::uint32_t kMost = 1 << 12; // macroblocks a side; no level allows so many
    constexpr int kMacroblock = 16;
    sps.macroblocksWide = in.ue() + 1;
    const std::uint32_t rows = in.ue() + 1;
    sps.macroblocks = sps.macroblocksWide * rows;
    sps.isProgressive = in.bit() != 0;
    if (!sps.isProgressive)
        in.skip(1);
    in.skip(1);
    if (in.bit())
        for (int& each : sps.cropping)
            each = static_cast<int>(std::min(in.ue(), kMost * kMacroblock));
    const bool isSubsampled = sps.chromaFormat != 0 && !sps.hasSeparatePlanes;
    const int across = isSubsampled && sps.chromaFormat < 3 ? 2 : 1;
    const int fields = sps.isProgressive ? 1 : 2;
    const int down = (isSubsampled && sps.chromaFormat == 1 ? 2 : 1) * fields;
    sps.width = static_cast<int>(std::min(sps.macroblocksWide, kMost)) * kMacroblock
                - across * (sps.cropping[0] + sps.cropping[1]);
    sps.height =
        static_cast<int>(std::min(rows, kMost)) * kMacroblock * fields - down * (sps.cropping[2] + sps.cropping[3]);
}

void skipRates(BitReader& in)
{
    const std::uint32_t count = std::min<std::uint32_t>(in.ue() + 1, 32);
    in.skip(8);
    for (std::uint32_t i = 0; i < count; ++i) {
        in.ue();
        in.ue();
        in.skip(1);
    }
    in.skip(20);
}

/// From behind the flag that announces it up to the restriction's.
void skipUsability(BitReader& in)
{
    constexpr std::uint32_t kExtendedAspect = 255;
    if (in.bit() && in.bits(8) == kExtendedAspect)
        in.skip(32);
    if (in.bit())
        in.skip(1);
    if (in.bit()) {
        in.skip(4);
        if (in.bit())
            in.skip(24);
    }
    if (in.bit()) {
        in.ue();
        in.ue();
    }
    if (in.bit())
        in.skip(65);
    const bool nal = in.bit();
    if (nal)
        skipRates(in);
    const bool vcl = in.bit();
    if (vcl)
        skipRates(in);
    if (nal || vcl)
        in.skip(1);
    in.skip(1);
}

/// What a set promises about single pictures: whether they look beyond the edge of others; the least compression of
/// pictures and of macroblocks, 0 for none; how far motion goes, as powers of two.
struct Reach {
    bool isBeyondPicture = true;
    std::array<std::uint32_t, 4> bounds{2, 1, 16, 16}; // what is meant where nothing is said
};

Reach reachOf(const Bytes& payload, const Sps& sps)
{
    Reach reach;
    if (!sps.restriction)
        return reach;
    BitReader in(payload);
    in.skip(static_cast<int>(sps.restrictionBit) + 1);
    reach.isBeyondPicture = in.bit() != 0;
    for (std::uint32_t& each : reach.bounds)
        each = in.ue();
    return reach;
}

Reach wider(Reach a, const Reach& b)
{
    a.isBeyondPicture = a.isBeyondPicture || b.isBeyondPicture;
    for (std::size_t i = 0; i < 2; ++i)
        a.bounds[i] = std::min(a.bounds[i], b.bounds[i]);
    for (std::size_t i = 2; i < 4; ++i)
        a.bounds[i] = std::max(a.bounds[i], b.bounds[i]);
    return a;
}

} // namespace

std::optional<Sps> parseSps(ByteView nal)
{
    if (nal.size() < kHeaderBytes + 1)
        return std::nullopt;
    const Bytes payload = withoutEmulation(nal);
    BitReader in(payload);
    Sps sps;
    in.skip(8);
    sps.profile = static_cast<std::uint8_t>(in.bits(8));
    sps.constraints = static_cast<std::uint8_t>(in.bits(8));
    sps.level = static_cast<std::uint8_t>(in.bits(8));
    sps.id = in.ue();
    if (isHigh(sps.profile))
        readHigh(in, sps);
    sps.frameNumBits = bitCount(in.ue());
    readPictureOrder(in, sps);
    sps.referencesBit = in.position();
    sps.referenceFrames = in.ue();
    sps.hasFrameNumGaps = in.bit() != 0;
    readSize(in, sps);
    sps.vuiBit = in.position();
    if (in.bit()) {
        skipUsability(in);
        sps.restrictionBit = in.position();
        if (in.bit()) {
            in.skip(1);
            for (int i = 0; i < 4; ++i)
                in.ue();
            const std::uint32_t reorder = in.ue();
            sps.restriction = {reorder, in.ue()};
        }
    }
    if (in.isBeyond() || sps.id > 31)
        return std::nullopt;
    return sps;
}

bool canFollow(const Sps& a, const Sps& b)
{
    const auto shape = [](const Sps& sps) {
        return std::tie(sps.chromaFormat, sps.lumaDepth, sps.chromaDepth, sps.hasSeparatePlanes, sps.bypassesTransform,
                        sps.macroblocksWide, sps.macroblocks, sps.isProgressive, sps.cropping);
    };
    return shape(a) == shape(b);
}

std::optional<Bytes> inUseLike(ByteView nal, ByteView source, Sps::Restriction restriction)
{
    const auto own = parseSps(nal);
    const auto like = parseSps(source);
    if (!own || !like)
        return std::nullopt;
    Bytes payload = withoutEmulation(nal);
    if (isHigh(own->profile) == isHigh(like->profile) && rank(like->profile) > rank(own->profile)) {
        payload[kProfileByte] = like->profile;
        payload[kConstraintsByte] = own->constraints & like->constraints;
    }
    BitWriter out;
    out.copy(payload, 0, own->referencesBit);
    BitReader in(payload);
    in.skip(static_cast<int>(own->referencesBit));
    in.ue();
    out.ue(std::max(own->referenceFrames, like->referenceFrames));
    out.copy(payload, in.position(), own->vuiBit);

    const Bytes usability = withoutEmulation(source);
    out.bit(1);
    if (like->restrictionBit > 0)
        out.copy(usability, like->vuiBit + 1, like->restrictionBit);
    else
        out.bits(0, 8); // none of what can stand before it
    out.bit(1);
    const Reach reach = wider(reachOf(payload, *own), reachOf(usability, *like));
    out.bit(reach.isBeyondPicture);
    for (const std::uint32_t each : reach.bounds)
        out.ue(each);
    out.ue(restriction.reorderFrames);
    out.ue(restriction.bufferedFrames);
    out.finish();
    return withEmulation(out.bytes());
}

PpsIds idsOfPps(ByteView nal)
{
    const Bytes payload = withoutEmulation(nal.first(std::min<std::size_t>(nal.size(), 16)));
    BitReader in(payload);
    in.skip(8);
    const std::uint32_t pps = in.ue();
    return {pps, in.ue()};
}

std::uint32_t ppsOfSlice(ByteView nal)
{
    const Bytes payload = withoutEmulation(nal.first(std::min<std::size_t>(nal.size(), 24)));
    BitReader in(payload);
    in.skip(8);
    in.ue();
    in.ue();
    return in.ue();
}

bool isOfField(ByteView nal, const Sps& sps)
{
    if (sps.isProgressive)
        return false;
    const Bytes payload = withoutEmulation(nal.first(std::min<std::size_t>(nal.size(), 24)));
    BitReader in(payload);
    in.skip(8);
    in.ue();
    in.ue();
    in.ue();
    in.skip((sps.hasSeparatePlanes ? 2 : 0) + sps.frameNumBits);
    return in.bit() != 0;
}

std::uint32_t picturesUntilRefreshed(ByteView info)
{
    constexpr std::uint32_t kRecoveryPoint = 6;
    constexpr std::uint32_t kMostFrameNums = 1 << 16; // it says no larger number than these have
    const Bytes payload = withoutEmulation(info);
    for (const SeiMessage& each : seiMessagesIn(ByteView(payload).subspan(1)))
        if (each.type == kRecoveryPoint) {
            const std::uint32_t count = BitReader(each.payload).ue();
            return count < kMostFrameNums ? count : 0;
        }
    return 0;
}

bool Configuration::hasStartCodes(ByteView extradata)
{
    return extradata.size() >= 4 && extradata[0] == 0;
}

std::optional<Configuration> Configuration::parse(ByteView extradata)
{
    Configuration configuration;
    const auto add = [&](ByteView nal) {
        if (nal.empty())
            return;
        if (unitOf(nal) == Unit::Sps)
            configuration.sps.emplace_back(nal.begin(), nal.end());
        else if (unitOf(nal) == Unit::Pps)
            configuration.pps.emplace_back(nal.begin(), nal.end());
        else if (unitOf(nal) == Unit::SpsExtension || unitOf(nal) == Unit::SubsetSps)
            configuration.hasExtensions = true;
    };
    if (hasStartCodes(extradata)) {
        for (const ByteView nal : unitsBetweenStartCodes(extradata))
            add(nal);
    } else {
        if (extradata.size() < 7 || extradata[0] != 1)
            return std::nullopt;
        configuration.lengthSize = (extradata[4] & 3) + 1;
        std::size_t at = 5;
        for (const int mask : {0x1F, 0xFF}) {
            if (at >= extradata.size())
                return std::nullopt;
            const int count = extradata[at++] & mask;
            const auto units = unitsOfHeader(extradata, at, count);
            if (!units)
                return std::nullopt;
            std::for_each(units->begin(), units->end(), add);
        }
        configuration.hasExtensions = at + 3 < extradata.size() && extradata[at + 3] != 0;
    }
    if (configuration.sps.empty() || configuration.pps.empty())
        return std::nullopt;
    return configuration;
}

Bytes Configuration::bytes() const
{
    std::vector<std::pair<std::uint32_t, ByteView>> sorted[2];
    Sps most;
    most.constraints = 0xFF;
    most.profile = 66;
    for (const Bytes& nal : sps) {
        const Sps each = parseSps(nal).value_or(Sps{});
        sorted[0].emplace_back(each.id, nal);
        if (rank(each.profile) > rank(most.profile))
            most.profile = each.profile;
        most.constraints &= each.constraints;
        most.level = std::max(most.level, each.level);
        if (sorted[0].size() == 1)
            most.chromaFormat = each.chromaFormat;
        most.chromaFormat = std::max(most.chromaFormat, each.chromaFormat);
        most.lumaDepth = std::max(most.lumaDepth, each.lumaDepth);
        most.chromaDepth = std::max(most.chromaDepth, each.chromaDepth);
    }
    for (const Bytes& nal : pps)
        sorted[1].emplace_back(idsOfPps(nal).pps, nal);

    Bytes out{1, most.profile, most.constraints, most.level, static_cast<std::uint8_t>(0xFC | (lengthSize - 1))};
    for (auto& sets : sorted) {
        std::stable_sort(sets.begin(), sets.end(), [](const auto& a, const auto& b) { return a.first < b.first; });
        const auto count = static_cast<std::uint8_t>(sets.size());
        out.push_back(&sets == &sorted[0] ? static_cast<std::uint8_t>(0xE0 | count) : count);
        for (const auto& [id, nal] : sets) {
            out.push_back(static_cast<std::uint8_t>(nal.size() >> 8));
            out.push_back(static_cast<std::uint8_t>(nal.size()));
            out.insert(out.end(), nal.begin(), nal.end());
        }
    }
    if (isHigh(most.profile)) {
        out.push_back(static_cast<std::uint8_t>(0xFC | most.chromaFormat));
        out.push_back(static_cast<std::uint8_t>(0xF8 | (most.lumaDepth - 8)));
        out.push_back(static_cast<std::uint8_t>(0xF8 | (most.chromaDepth - 8)));
        out.push_back(0);
    }
    return out;
}

} // namespace ffmpeg::h264
