#include "linux/ffmpeg/bitstream/H264Slices.h"

#include <algorithm>

namespace ffmpeg::h264 {

namespace {

constexpr std::size_t kHeaderBytes = 512; ///< more than any header has; the rest is not looked at
constexpr std::uint32_t kMostReferences = 32;

/// The lists of a slice: how many, and what is moved to the front. False when it says what is not understood.
bool readLists(BitReader& in, const Pps& pps, Slice& slice)
{
    const std::size_t lists = slice.kind == Slice::Kind::B ? 2 : slice.kind == Slice::Kind::P ? 1 : 0;
    if (lists == 0)
        return true;
    const bool overrides = in.bit() != 0;
    for (std::size_t i = 0; i < lists; ++i) {
        slice.lists[i].count = overrides ? in.ue() + 1 : pps.references[i];
        if (slice.lists[i].count == 0 || slice.lists[i].count > kMostReferences)
            return false;
    }
    for (std::size_t i = 0; i < lists; ++i) {
        if (!in.bit())
            continue;
        for (;;) {
            const std::uint32_t what = in.ue();
            if (what == 3)
                break;
            if (what > 1 || in.isBeyond() || slice.lists[i].moves.size() > kMostReferences)
                return false; // long terms, or another view's pictures
            slice.lists[i].moves.push_back({what == 1, in.ue()});
        }
    }
    return true;
}

void skipWeights(BitReader& in, const Sps& sps, const Slice& slice)
{
    const bool hasChroma = sps.chromaFormat != 0 && !sps.hasSeparatePlanes;
    in.ue();
    if (hasChroma)
        in.ue();
    for (const Slice::List& list : slice.lists) {
        for (std::uint32_t i = 0; i < list.count; ++i) {
            if (in.bit()) {
                in.se();
                in.se();
            }
            if (hasChroma && in.bit()) {
                for (int part = 0; part < 4; ++part)
                    in.se();
            }
        }
    }
}

/// What goes from the references once this picture is one. False when anything is kept for a long term.
bool readMarking(BitReader& in, Slice& slice)
{
    if (slice.isIdr) {
        in.skip(1);
        return !in.bit();
    }
    slice.slides = !in.bit();
    while (!slice.slides) {
        const std::uint32_t what = in.ue();
        if (what == 0)
            break;
        if (what != 1 || in.isBeyond() || slice.unmarked.size() > kMostReferences)
            return false;
        slice.unmarked.push_back(in.ue());
    }
    return true;
}

} // namespace

std::optional<Pps> parsePps(ByteView nal)
{
    const Bytes payload = withoutEmulation(nal);
    BitReader in(payload);
    Pps pps;
    in.skip(8);
    pps.id = in.ue();
    pps.sps = in.ue();
    in.skip(1);
    pps.hasBottomOrder = in.bit() != 0;
    pps.hasSliceGroups = in.ue() != 0;
    if (!pps.hasSliceGroups) {
        pps.references = {in.ue() + 1, 0};
        pps.references[1] = in.ue() + 1;
        pps.isWeighted = in.bit() != 0;
        pps.isWeightedB = in.bits(2) == 1;
        for (int i = 0; i < 3; ++i)
            in.se();
        in.skip(2);
        pps.hasRedundance = in.bit() != 0;
    }
    if (in.isBeyond() || pps.id > 255 || pps.sps > 31)
        return std::nullopt;
    return pps;
}

std::optional<std::uint32_t> ppsIdOf(ByteView slice)
{
    const std::uint32_t id = slice.empty() ? 256 : ppsOfSlice(slice);
    return id <= 255 ? std::optional(id) : std::nullopt;
}

std::optional<Slice> parseSlice(ByteView nal, const Sps& sps, const Pps& pps)
{
    if (!sps.isProgressive || sps.hasSeparatePlanes || sps.hasFrameNumGaps || sps.orderType != 0 || pps.hasBottomOrder
        || pps.hasSliceGroups || pps.hasRedundance || nal.empty())
        return std::nullopt;
    const Bytes payload = withoutEmulation(nal.first(std::min(nal.size(), kHeaderBytes)));
    BitReader in(payload);
    Slice slice;
    in.skip(1);
    slice.importance = static_cast<std::uint8_t>(in.bits(2));
    in.skip(5);
    slice.isIdr = unitOf(nal) == Unit::Idr;
    slice.firstMacroblock = in.ue();
    const std::uint32_t type = in.ue();
    if (type > 9 || type % 5 > 2)
        return std::nullopt;
    slice.kind = static_cast<Slice::Kind>(type % 5);
    in.ue();
    slice.frameNum = in.bits(sps.frameNumBits);
    if (slice.isIdr)
        in.ue();
    slice.order = in.bits(sps.orderBits);
    if (slice.kind == Slice::Kind::B)
        in.skip(1);
    if (!readLists(in, pps, slice))
        return std::nullopt;
    if (slice.kind == Slice::Kind::P ? pps.isWeighted : slice.kind == Slice::Kind::B && pps.isWeightedB)
        skipWeights(in, sps, slice);
    if (slice.importance != 0 && !readMarking(in, slice))
        return std::nullopt;
    if (in.isBeyond())
        return std::nullopt;
    return slice;
}

Bytes standInParameters(std::uint32_t pps, std::uint32_t sps)
{
    BitWriter out;
    out.bits(3 << 5 | static_cast<std::uint32_t>(Unit::Pps), 8);
    out.ue(pps);
    out.ue(sps);
    out.bits(0, 2); // coded without arithmetic: what follows can be written down as it is
    for (int i = 0; i < 3; ++i)
        out.ue(0);
    out.bits(0, 3);
    for (int i = 0; i < 3; ++i)
        out.ue(0);
    out.bits(0b100, 3); // slices say how they are smoothed
    out.finish();
    return withEmulation(out.bytes());
}

Bytes standInFor(const Slice& slice, const Sps& sps, std::uint32_t pps, std::uint32_t macroblocks)
{
    BitWriter out;
    out.bits(std::uint32_t{slice.importance} << 5 | static_cast<std::uint32_t>(Unit::Slice), 8);
    out.ue(0);
    out.ue(static_cast<std::uint32_t>(Slice::Kind::P));
    out.ue(pps);
    out.bits(slice.frameNum, sps.frameNumBits);
    out.bits(slice.order, sps.orderBits);
    out.bits(0, 2); // one reference, the latest
    if (slice.importance != 0) {
        out.bit(slice.slides ? 0 : 1);
        for (const std::uint32_t each : slice.unmarked) {
            out.ue(1);
            out.ue(each);
        }
        if (!slice.slides)
            out.ue(0);
    }
    out.ue(0);
    out.ue(1);           // not smoothed
    out.ue(macroblocks); // so many are skipped
    out.finish();
    return withEmulation(out.bytes());
}

} // namespace ffmpeg::h264
