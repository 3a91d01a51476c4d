#include "linux/ffmpeg/exporting/video/H264Splicer.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/CannotCopy.h"

#include <algorithm>

namespace ffmpeg {

using h264::Unit;

namespace {

constexpr std::uint32_t kHighestSpsId = 31;

/// Somebody waits: it takes a third more bytes than the preset "veryfast" would for the same quality, and half of its
/// time.
constexpr const char* kPreset = "ultrafast";
/// The finest is nearly without loss.
constexpr QualityScale kQuality{12, 18, 30, 6};

} // namespace

base::Result<std::unique_ptr<Splicer>> H264Splicer::make(const AVStream& stream)
{
    const ByteView extradata = extradataOf(*stream.codecpar);
    auto header = h264::Configuration::parse(extradata);
    if (!header)
        return cannotCopy("its parameter sets are neither in the file's header nor in the first packet");
    if (header->hasExtensions)
        return cannotCopy("its parameter sets have extensions");
    std::unique_ptr<H264Splicer> splicer(new H264Splicer);
    splicer->m_hasStartCodes = h264::Configuration::hasStartCodes(extradata);
    splicer->m_header = std::move(*header);
    for (auto* sets : {&splicer->m_header.sps, &splicer->m_header.pps})
        for (Bytes& nal : *sets)
            nal.resize(withoutTrailingZeros(nal).size());
    for (const Bytes& nal : splicer->m_header.sps) {
        const auto sps = h264::parseSps(nal);
        if (!sps)
            return cannotCopy("a parameter set is damaged");
        splicer->m_sps.push_back(*sps);
    }
    return std::unique_ptr<Splicer>(std::move(splicer));
}

std::vector<ByteView> H264Splicer::unitsIn(const AVPacket& packet) const
{
    if (m_hasStartCodes)
        return unitsBetweenStartCodes(payloadOf(packet));
    return unitsBehindLengths(payloadOf(packet), m_header.lengthSize).value_or(std::vector<ByteView>{});
}

/// Containers mark as keyframes also pictures that later ones look past; only these are never looked past.
bool H264Splicer::isJoint(const AVPacket& keyframe) const
{
    assertHere();
    const auto units = unitsIn(keyframe);
    return std::any_of(units.begin(), units.end(), [](ByteView nal) { return h264::unitOf(nal) == Unit::Idr; });
}

const h264::Sps& H264Splicer::spsOf(ByteView slice) const
{
    for (const Bytes& nal : m_header.pps)
        for (const h264::Sps& each : m_sps)
            if (const auto ids = h264::idsOfPps(nal); ids.pps == h264::ppsOfSlice(slice) && ids.sps == each.id)
                return each;
    return m_sps.front();
}

bool H264Splicer::holdsHalf(const AVPacket& packet) const
{
    assertHere();
    if (std::all_of(m_sps.begin(), m_sps.end(), [](const h264::Sps& each) { return each.isProgressive; }))
        return false;
    int fields = 0;
    for (const ByteView nal : unitsIn(packet)) {
        const Unit unit = h264::unitOf(nal);
        const bool isSlice = unit == Unit::Slice || unit == Unit::SliceA || unit == Unit::Idr;
        fields += isSlice && h264::isFirstSlice(nal) && h264::isOfField(nal, spsOf(nal));
    }
    return fields == 1;
}

int H264Splicer::reorderDepth() const
{
    assertHere();
    std::uint32_t depth = 0;
    for (const h264::Sps& each : m_sps)
        if (each.restriction)
            depth = std::max(depth, each.restriction->reorderFrames);
    return static_cast<int>(std::min<std::uint32_t>(depth, 16));
}

bool H264Splicer::showsInOrder() const
{
    assertHere();
    constexpr std::uint32_t kInOrder = 2; // the type of picture order that knows no other
    return std::all_of(m_sps.begin(), m_sps.end(), [](const h264::Sps& each) {
        return each.profile == FF_PROFILE_H264_BASELINE || each.orderType == kInOrder
               || (each.restriction && each.restriction->reorderFrames == 0);
    });
}

void H264Splicer::see(const AVPacket& copied)
{
    assertHere();
    for (const ByteView nal : unitsIn(copied)) {
        const Unit unit = h264::unitOf(nal);
        if (unit == Unit::Slice || unit == Unit::SliceA || unit == Unit::Idr)
            m_usedPps.insert(h264::ppsOfSlice(nal));
    }
}

/// Those that something copied refers to: otherwise each export of an export would leave one more set behind.
h264::Configuration H264Splicer::usedSets() const
{
    h264::Configuration used = m_header;
    if (m_usedPps.empty())
        return used;
    std::set<std::uint32_t> usedSps;
    std::erase_if(used.pps, [&](const Bytes& nal) { return !m_usedPps.contains(h264::idsOfPps(nal).pps); });
    for (const Bytes& nal : used.pps)
        usedSps.insert(h264::idsOfPps(nal).sps);
    std::erase_if(used.sps, [&](const Bytes& nal) { return !usedSps.contains(h264::parseSps(nal)->id); });
    return used;
}

base::Result<void> H264Splicer::prepare(EncoderRequest& request, int reorderDepth)
{
    assertHere();
    std::set<std::uint32_t> taken;
    for (const h264::Sps& each : m_sps)
        taken.insert(each.id);
    for (const Bytes& nal : m_header.pps)
        taken.insert(h264::idsOfPps(nal).pps);
    std::uint32_t id = 1;
    while (taken.contains(id))
        ++id;
    if (id > kHighestSpsId)
        return cannotCopy("all ids of parameter sets are taken");

    // Decoders hold pictures back by what the sets say; where two streams differ, some would be lost at the joint.
    m_restriction = {static_cast<std::uint32_t>(std::max(reorderDepth, 0)), 1};
    for (const h264::Sps& each : m_sps) {
        const std::uint32_t buffered =
            each.restriction ? each.restriction->bufferedFrames : std::max(each.referenceFrames, 1U);
        m_restriction.bufferedFrames =
            std::max({m_restriction.bufferedFrames, buffered, m_restriction.reorderFrames, 1U});
    }
    m_used = usedSets();
    if (m_used.sps.empty())
        return cannotCopy("its pictures refer to parameter sets that are not in the file's header");
    const h264::Sps sps = *h264::parseSps(m_used.sps.front());
    // What the file leaves out of the pictures at their edges the stream still has: an odd row, for one.
    request.width = sps.width;
    request.height = sps.height;
    request.encoder = "libx264";
    if (request.format == AV_PIX_FMT_GBRP) { // which the encoder wants packed
        request.encoder = "libx264rgb";
        request.format = AV_PIX_FMT_BGR24;
    }
    if (sps.profile == FF_PROFILE_H264_BASELINE)
        request.options["profile"] = "baseline";
    else if (sps.profile == FF_PROFILE_H264_MAIN)
        request.options["profile"] = "main";
    request.options.insert({{"preset", kPreset}, {"a53cc", "0"}});
    // Only what is without loss itself can stand beside what may be: see h264::Sps.
    if (sps.bypassesTransform)
        request.options.emplace("qp", "0");
    else
        request.scale = kQuality;
    // Left to itself the preset makes a baseline stream, and decoders in hardware do not like the profile to change.
    const char* tool = ":8x8dct=1";
    if (sps.profile == FF_PROFILE_H264_BASELINE)
        tool = ":cabac=0";
    else if (sps.profile == FF_PROFILE_H264_MAIN)
        tool = ":cabac=1";
    std::string params = "stitchable=1:scenecut=0:keyint=infinite:bframes=0:ref=1:mbtree=0";
    params.append(tool).append(":sps-id=").append(std::to_string(id));
    constexpr std::uint8_t kLowestSensibleLevel = 10;
    const bool isLevel1b = sps.level == 11 && (sps.constraints & 0x10);
    if (sps.level >= kLowestSensibleLevel && !isLevel1b)
        params.append(":level=").append(std::to_string(sps.level));
    if (!sps.isProgressive && !request.isInterlaced)
        params.append(":fake-interlaced=1"); // whole pictures among such that may be of fields
    request.options["x264-params"] = params;
    return {};
}

base::Result<void> H264Splicer::join(const AVCodecContext& encoder)
{
    assertHere();
    const auto header =
        h264::Configuration::parse({encoder.extradata, static_cast<std::size_t>(encoder.extradata_size)});
    if (!header)
        return cannotCopy("the encoder did not tell its parameter sets");
    for (const Bytes& nal : header->sps) {
        const auto own = h264::inUseLike(nal, m_used.sps.front(), m_restriction);
        const auto sps = own ? h264::parseSps(*own) : std::nullopt;
        if (!sps)
            return cannotCopy("the encoder's parameter sets make no sense");
        for (const Bytes& used : m_used.sps)
            if (!h264::canFollow(*sps, *h264::parseSps(used)))
                return cannotCopy("no pictures can be encoded that decoders take for its own");
        m_encoderSps.push_back(*own);
    }
    m_encoderPps = header->pps;
    return {};
}

base::Result<void> H264Splicer::describe(AVCodecParameters& parameters)
{
    assertHere();
    h264::Configuration all = usedSets();
    all.sps.insert(all.sps.end(), m_encoderSps.begin(), m_encoderSps.end());
    all.pps.insert(all.pps.end(), m_encoderPps.begin(), m_encoderPps.end());
    if (!setExtradata(parameters, all.bytes()))
        return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
    parameters.codec_tag = MKTAG('a', 'v', 'c', '1');
    return {};
}

bool H264Splicer::isKnown(ByteView set) const
{
    const auto& known = h264::unitOf(set) == Unit::Sps ? m_header.sps : m_header.pps;
    return std::any_of(known.begin(), known.end(),
                       [&](const Bytes& each) { return std::equal(each.begin(), each.end(), set.begin(), set.end()); });
}

base::Result<void> H264Splicer::adoptCopied(AVPacket& packet)
{
    assertHere();
    std::vector<ByteView> units = unitsIn(packet);
    bool isChanged = m_hasStartCodes;
    for (const ByteView nal : units) {
        const Unit unit = h264::unitOf(nal);
        if (unit == Unit::SpsExtension || unit == Unit::SubsetSps)
            return cannotCopy("its parameter sets have extensions");
        if (unit == Unit::Sps || unit == Unit::Pps) {
            if (!isKnown(nal))
                return cannotCopy("its parameter sets change on the way");
            isChanged = true;
        }
    }
    if (!isChanged)
        return {};
    std::erase_if(units, [](ByteView nal) {
        const Unit unit = h264::unitOf(nal);
        return unit == Unit::Sps || unit == Unit::Pps || unit == Unit::Delimiter || unit == Unit::Filler;
    });
    if (!replacePayload(packet, units, m_header.lengthSize))
        return cannotCopy("a packet is too large");
    return {};
}

base::Result<void> H264Splicer::adoptEncoded(AVPacket& packet)
{
    assertHere();
    std::vector<ByteView> units = unitsBetweenStartCodes(payloadOf(packet));
    std::erase_if(units, [](ByteView nal) {
        const Unit unit = h264::unitOf(nal);
        return unit != Unit::Slice && unit != Unit::Idr;
    });
    if (!replacePayload(packet, units, m_header.lengthSize))
        return cannotCopy("an encoded packet is too large for its header");
    return {};
}

} // namespace ffmpeg
