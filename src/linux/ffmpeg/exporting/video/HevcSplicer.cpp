#include "linux/ffmpeg/exporting/video/HevcSplicer.h"

#include "linux/ffmpeg/bitstream/HdrMetadata.h"
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/CannotCopy.h"

#include <algorithm>
#include <array>

namespace ffmpeg {

using hevc::Unit;

namespace {

constexpr std::uint32_t kMostSets = 16; ///< of the two kinds whose numbers end there
constexpr int kStartCodes = 0;
/// The finest is nearly without loss.
constexpr QualityScale kQuality{8, 18, 30, 6};

/// The lowest number from `first` to `last` that is free.
std::optional<std::uint32_t> freeId(const std::set<std::uint32_t>& taken, std::uint32_t first, std::uint32_t last)
{
    for (std::uint32_t id = first; id <= last; ++id)
        if (!taken.contains(id))
            return id;
    return std::nullopt;
}

/// The size of the smallest blocks by which the encoder fills up pictures to the size that `sps` has.
std::uint32_t blockSizeFor(const hevc::Sps& sps, const EncoderRequest& request)
{
    constexpr std::uint32_t kSmallest = 8;
    for (const std::uint32_t block : {kSmallest, 16U, 32U}) {
        const auto filled = [&](int side) { return (static_cast<std::uint32_t>(side) + block - 1) / block * block; };
        if (filled(request.width) == sps.width && filled(request.height) == sps.height)
            return block;
    }
    return kSmallest;
}

} // namespace

base::Result<std::unique_ptr<Splicer>> HevcSplicer::make(const AVStream& stream, const AVFrame& picture)
{
    auto header = hevc::Configuration::parse(extradataOf(*stream.codecpar));
    if (!header)
        return cannotCopy("its parameter sets are neither in the file's header nor in the first packet");
    for (const Bytes& set : header->sets)
        if (hevc::unitOf(set) == Unit::Sps && !hevc::parseSps(set))
            return cannotCopy("a parameter set is damaged");
    std::unique_ptr<HevcSplicer> splicer(new HevcSplicer);
    splicer->m_header = std::move(*header);
    if (const auto hdr = HdrMetadata::of(stream, picture); !hdr.isEmpty())
        splicer->m_hdrUnit = hdr.hevcUnit();
    return std::unique_ptr<Splicer>(std::move(splicer));
}

std::vector<ByteView> HevcSplicer::unitsIn(const AVPacket& packet) const
{
    auto units = m_header.lengthSize == 0
                     ? unitsBetweenStartCodes(payloadOf(packet))
                     : unitsBehindLengths(payloadOf(packet), m_header.lengthSize).value_or(std::vector<ByteView>{});
    std::erase_if(units, [](ByteView nal) { return nal.size() <= 2; });
    return units;
}

/// Pictures of other kinds of keyframes may be shown before them, and need what stands before them.
bool HevcSplicer::isJoint(const AVPacket& keyframe) const
{
    assertHere();
    const auto units = unitsIn(keyframe);
    return std::any_of(units.begin(), units.end(), [](ByteView nal) {
        const Unit unit = hevc::unitOf(nal);
        return unit == Unit::Bla || unit == Unit::IdrWithLeading || unit == Unit::Idr;
    });
}

bool HevcSplicer::isOpenJoint(const AVPacket& keyframe) const
{
    assertHere();
    const auto units = unitsIn(keyframe);
    return std::any_of(units.begin(), units.end(), [](ByteView nal) {
        return hevc::unitOf(nal) >= Unit::FirstIrap && hevc::unitOf(nal) <= Unit::Cra;
    });
}

int HevcSplicer::reorderDepth() const
{
    assertHere();
    std::uint32_t depth = 0;
    for (const Bytes& set : m_header.sets)
        if (hevc::unitOf(set) == Unit::Sps)
            depth = std::max(depth, hevc::parseSps(set)->buffering.reordered);
    return static_cast<int>(std::min<std::uint32_t>(depth, 16));
}

void HevcSplicer::see(const AVPacket& copied)
{
    assertHere();
    for (const ByteView nal : unitsIn(copied))
        if (hevc::unitOf(nal) <= Unit::LastPicture)
            m_usedPps.insert(hevc::ppsOfSlice(nal));
}

/// Without those that nothing refers to: otherwise each export of an export would leave some more behind.
std::vector<Bytes> HevcSplicer::usedSets() const
{
    if (m_usedPps.empty())
        return m_header.sets;
    std::set<std::uint32_t> sps;
    std::set<std::uint32_t> vps;
    for (const Bytes& set : m_header.sets)
        if (hevc::unitOf(set) == Unit::Pps && m_usedPps.contains(hevc::idsOfPps(set).pps))
            sps.insert(hevc::idsOfPps(set).sps);
    for (const Bytes& set : m_header.sets)
        if (hevc::unitOf(set) == Unit::Sps && sps.contains(hevc::parseSps(set)->id))
            vps.insert(hevc::parseSps(set)->vps);
    std::vector<Bytes> used = m_header.sets;
    std::erase_if(used, [&](const Bytes& set) {
        switch (hevc::unitOf(set)) {
        case Unit::Vps:
            return !vps.contains(hevc::idOfVps(set));
        case Unit::Sps:
            return !sps.contains(hevc::parseSps(set)->id);
        default:
            return !m_usedPps.contains(hevc::idsOfPps(set).pps);
        }
    });
    return used;
}

base::Result<void> HevcSplicer::prepare(EncoderRequest& request, int /*reorderDepth*/)
{
    assertHere();
    std::array<std::set<std::uint32_t>, 3> taken;
    for (const Bytes& set : m_header.sets) {
        if (hevc::unitOf(set) == Unit::Vps)
            taken[0].insert(hevc::idOfVps(set));
        else if (hevc::unitOf(set) == Unit::Sps)
            taken[1].insert(hevc::parseSps(set)->id);
        else
            taken[2].insert(hevc::idsOfPps(set).pps);
    }
    const auto vps = freeId(taken[0], 1, kMostSets - 1);
    const auto sps = freeId(taken[1], 1, kMostSets - 1);
    const auto pps = freeId(taken[2], hevc::kFirstMovablePps, hevc::kLastMovablePps);
    if (!vps || !sps || !pps)
        return cannotCopy("all ids of parameter sets are taken");
    m_ids = {*vps, *sps, *pps};
    bool isLossless = false;
    for (const Bytes& set : usedSets()) {
        if (hevc::unitOf(set) == Unit::Sps)
            m_used.push_back(*hevc::parseSps(set));
        else if (hevc::unitOf(set) == Unit::Pps)
            isLossless = isLossless || hevc::allowsLossless(set);
    }
    if (m_used.empty())
        return cannotCopy("its pictures refer to parameter sets that are not in the file's header");
    request.encoder = "libx265";
    if (!isLossless)
        request.scale = kQuality;
    std::string params = isLossless ? "lossless=1:" : "";
    params.append("bframes=0:scenecut=0:open-gop=0:ref=1:cutree=0:info=0:aud=0:hrd=0:repeat-headers=0:log-level=none");
    params.append(":min-cu-size=").append(std::to_string(blockSizeFor(m_used.front(), request)));
    request.options = {{"preset", "veryfast"}, {"x265-params", params}};
    return {};
}

base::Result<void> HevcSplicer::join(const AVCodecContext& encoder)
{
    assertHere();
    const auto header =
        hevc::Configuration::parse({encoder.extradata, static_cast<std::size_t>(encoder.extradata_size)});
    if (!header)
        return cannotCopy("the encoder did not tell its parameter sets");
    for (const Bytes& set : header->sets) {
        auto own = hevc::renumbered(set, m_ids);
        for (const hevc::Sps& used : m_used) {
            if (!own || hevc::unitOf(*own) != Unit::Sps)
                break;
            const auto sps = hevc::parseSps(*own);
            if (sps && !hevc::canFollow(*sps, used))
                return cannotCopy("no pictures can be encoded that decoders take for its own");
            own = hevc::withBuffering(*own, used);
        }
        if (!own)
            return cannotCopy("the encoder's parameter sets make no sense");
        m_encoderSets.push_back(std::move(*own));
    }
    return {};
}

base::Result<void> HevcSplicer::describe(AVCodecParameters& parameters)
{
    assertHere();
    std::vector<Bytes> all = usedSets();
    all.insert(all.end(), m_encoderSets.begin(), m_encoderSets.end());
    std::stable_sort(all.begin(), all.end(),
                     [](const Bytes& a, const Bytes& b) { return hevc::unitOf(a) < hevc::unitOf(b); });
    Bytes bytes;
    for (const Bytes& set : all) {
        bytes.insert(bytes.end(), {0, 0, 0, 1});
        bytes.insert(bytes.end(), set.begin(), set.end());
    }
    if (!setExtradata(parameters, bytes))
        return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
    parameters.codec_tag = MKTAG('h', 'v', 'c', '1');
    return {};
}

base::Result<void> HevcSplicer::close(AVPacket& openJoint)
{
    assertHere();
    std::vector<Bytes> changed;
    std::vector<ByteView> units = unitsIn(openJoint);
    changed.reserve(units.size()); // the views lead into them
    for (ByteView& nal : units)
        if (hevc::unitOf(nal) >= Unit::FirstIrap && hevc::unitOf(nal) <= Unit::Cra)
            nal = changed.emplace_back(hevc::closed(nal));
    if (!replacePayload(openJoint, units, m_header.lengthSize))
        return cannotCopy("a packet is damaged");
    return {};
}

void HevcSplicer::insertHdr(std::vector<ByteView>& units) const
{
    const auto isPicture = [](ByteView nal) { return hevc::unitOf(nal) <= Unit::LastPicture; };
    units.insert(std::find_if(units.begin(), units.end(), isPicture), m_hdrUnit);
}

base::Result<void> HevcSplicer::adoptCopied(AVPacket& packet)
{
    assertHere();
    std::vector<ByteView> units = unitsIn(packet);
    for (const ByteView nal : units) {
        const auto isSame = [&](const Bytes& set) {
            return std::equal(set.begin(), set.end(), nal.begin(), nal.end());
        };
        if (hevc::isSet(nal) && std::none_of(m_header.sets.begin(), m_header.sets.end(), isSame))
            return cannotCopy("its parameter sets change on the way");
    }
    std::erase_if(units, [](ByteView nal) { return hevc::isSet(nal) || hevc::unitOf(nal) == Unit::Delimiter; });
    // Some say it only in the header, or once; behind another keyframe, decoders would have forgotten it.
    if (!m_hdrUnit.empty() && (packet.flags & AV_PKT_FLAG_KEY)
        && std::none_of(units.begin(), units.end(), hevc::saysHdr))
        insertHdr(units);
    if (units.empty() || !replacePayload(packet, units, kStartCodes))
        return cannotCopy("a packet is damaged");
    return {};
}

base::Result<void> HevcSplicer::adoptEncoded(AVPacket& packet)
{
    assertHere();
    std::vector<Bytes> slices;
    for (const ByteView nal : unitsBetweenStartCodes(payloadOf(packet))) {
        if (nal.size() <= 2 || hevc::unitOf(nal) > Unit::LastPicture)
            continue;
        auto slice = hevc::renumberedSlice(nal, m_ids.pps);
        if (!slice)
            return cannotCopy("the encoder's slices make no sense");
        slices.push_back(std::move(*slice));
    }
    std::vector<ByteView> units(slices.begin(), slices.end());
    if (!m_hdrUnit.empty() && (packet.flags & AV_PKT_FLAG_KEY))
        insertHdr(units);
    if (!replacePayload(packet, units, kStartCodes))
        return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
    return {};
}

} // namespace ffmpeg
