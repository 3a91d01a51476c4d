#include "linux/ffmpeg/images/H264References.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"

#include <algorithm>
#include <utility>

namespace ffmpeg {

using h264::Slice;
using h264::Sps;
using h264::Unit;

namespace {

/// The largest, which is one less than a power of two.
std::uint32_t lastFrameNum(const Sps& sps)
{
    return (1U << sps.frameNumBits) - 1;
}

} // namespace

bool H264References::Picture::refersToPicture(std::int64_t other) const
{
    return std::find(refersTo.begin(), refersTo.end(), other) != refersTo.end();
}

bool H264References::Picture::keeps(std::int64_t other) const
{
    return std::find(kept.begin(), kept.end(), other) != kept.end();
}

H264References::H264References(h264::Configuration configuration) : m_configuration(std::move(configuration)) {}

std::unique_ptr<H264References> H264References::of(const AVCodecParameters& parameters)
{
    if (parameters.codec_id != AV_CODEC_ID_H264)
        return nullptr;
    const ByteView header = extradataOf(parameters);
    auto configuration = h264::Configuration::parse(header);
    if (!configuration || h264::Configuration::hasStartCodes(header) || configuration->hasExtensions)
        return nullptr;
    std::unique_ptr<H264References> references(new H264References(std::move(*configuration)));
    return references->readParameters() ? std::move(references) : nullptr;
}

bool H264References::readParameters()
{
    for (const Bytes& nal : m_configuration.sps) {
        const auto sps = h264::parseSps(nal);
        if (!sps || !m_sps.emplace(sps->id, *sps).second)
            return false;
    }
    for (const Bytes& nal : m_configuration.pps) {
        const auto pps = h264::parsePps(nal);
        if (!pps || !m_sps.count(pps->sps) || !m_pps.emplace(pps->id, *pps).second)
            return false;
    }
    for (m_standInId = 255; m_pps.count(m_standInId);)
        if (m_standInId-- == 0)
            return false;
    return true;
}

void H264References::restart()
{
    m_affinity.assertHere();
    m_isKnown = false;
}

H264References::Picture H264References::follow(const AVPacket& packet)
{
    m_affinity.assertHere();
    Picture picture;
    picture.number = m_count++;
    m_isKnown = picture.isKnown = read(packet, picture);
    return picture;
}

/// Whether the header has the very same set: then it changes nothing.
bool H264References::isKnownSet(ByteView nal) const
{
    const auto& sets = h264::unitOf(nal) == Unit::Sps ? m_configuration.sps : m_configuration.pps;
    return std::any_of(sets.begin(), sets.end(),
                       [&](const Bytes& each) { return std::equal(each.begin(), each.end(), nal.begin(), nal.end()); });
}

bool H264References::read(const AVPacket& packet, Picture& picture)
{
    const auto units = unitsBehindLengths(payloadOf(packet), m_configuration.lengthSize);
    if (!units || av_packet_get_side_data(&packet, AV_PKT_DATA_NEW_EXTRADATA, nullptr))
        return false;
    bool isFirst = true;
    for (const ByteView nal : *units) {
        switch (h264::unitOf(nal)) {
        case Unit::Slice:
        case Unit::Idr:
            if (!readSlice(nal, picture, std::exchange(isFirst, false)))
                return false;
            break;
        case Unit::Sps:
        case Unit::Pps:
            if (!isKnownSet(nal))
                return false;
            break;
        case Unit::Info:
        case Unit::Delimiter:
        case Unit::Filler:
            break;
        default:
            return false;
        }
    }
    if (isFirst)
        return false;
    mark(picture, m_sps.at(picture.sps));
    return true;
}

bool H264References::readSlice(ByteView nal, Picture& picture, bool isFirst)
{
    const auto id = h264::ppsIdOf(nal);
    const auto pps = id ? m_pps.find(*id) : m_pps.end();
    if (pps == m_pps.end())
        return false;
    const Sps& sps = m_sps.at(pps->second.sps);
    const auto slice = h264::parseSlice(nal, sps, pps->second);
    if (!slice || (slice->firstMacroblock == 0) != isFirst)
        return false;
    if (isFirst) {
        if (!begin(*slice, sps))
            return false;
        picture.slice = *slice;
        picture.sps = sps.id;
    } else if (slice->kind != picture.slice.kind || slice->frameNum != picture.slice.frameNum
               || slice->order != picture.slice.order || slice->isIdr != picture.slice.isIdr
               || pps->second.sps != picture.sps) {
        return false;
    }
    return addReferences(*slice, sps, picture);
}

bool H264References::begin(const Slice& slice, const Sps& sps)
{
    const std::int64_t range = std::int64_t{1} << sps.orderBits;
    if (slice.isIdr) {
        m_references.clear();
        m_orderBase = m_orderLow = 0;
        m_frameNum = 0;
    } else if (!m_isKnown || slice.frameNum != ((m_frameNum + 1) & lastFrameNum(sps))) {
        return false; // pictures are missing
    }
    const std::int64_t apart = std::int64_t{slice.order} - m_orderLow;
    std::int64_t base = m_orderBase;
    if (apart <= -range / 2)
        base += range;
    else if (apart > range / 2)
        base -= range;
    m_order = base + slice.order;
    if (slice.importance != 0) {
        m_orderBase = base;
        m_orderLow = slice.order;
    }
    return true;
}

/// The picture has been decoded: what others can refer to from now on.
void H264References::mark(Picture& picture, const Sps& sps)
{
    const Slice& slice = picture.slice;
    if (slice.importance != 0) {
        for (const std::uint32_t each : slice.unmarked) {
            const std::uint32_t gone = (slice.frameNum - each - 1) & lastFrameNum(sps);
            std::erase_if(m_references, [&](const Reference& other) { return other.frameNum == gone; });
        }
        const std::size_t most = std::max<std::size_t>(1, sps.referenceFrames);
        while (m_references.size() >= most)
            m_references.erase(m_references.begin());
        m_references.push_back({picture.number, slice.frameNum, m_order});
        m_frameNum = slice.frameNum;
    }
    for (const Reference& each : m_references)
        picture.kept.push_back(each.number);
}

bool H264References::addReferences(const Slice& slice, const Sps& sps, Picture& picture) const
{
    const std::size_t lists = slice.kind == Slice::Kind::B ? 2 : slice.kind == Slice::Kind::P ? 1 : 0;
    for (std::size_t which = 0; which < lists; ++which) {
        const Slice::List& about = slice.lists[which];
        std::vector<Reference> list = listOf(slice, which);
        std::uint32_t frameNum = slice.frameNum;
        std::ptrdiff_t front = 0;
        for (const Slice::Move& move : about.moves) {
            frameNum = (move.adds ? frameNum + move.apart + 1 : frameNum - move.apart - 1) & lastFrameNum(sps);
            const auto moved = std::find_if(m_references.begin(), m_references.end(),
                                            [&](const Reference& each) { return each.frameNum == frameNum; });
            if (moved == m_references.end())
                return false;
            // One that was put in front before stays there too: it can be weighted in two ways.
            list.erase(std::remove_if(list.begin() + front, list.end(),
                                      [&](const Reference& each) { return each.number == moved->number; }),
                       list.end());
            list.insert(list.begin() + front++, *moved);
        }
        list.resize(std::min<std::size_t>(list.size(), about.count));
        for (const Reference& each : list)
            picture.refersTo.push_back(each.number);
    }
    return true;
}

/// In the order that a slice has unasked: a P slice what was decoded last first, a B slice what is shown nearest, in its
/// first list before it and in its second behind it.
std::vector<H264References::Reference> H264References::listOf(const Slice& slice, std::size_t which) const
{
    std::vector<Reference> latest(m_references.rbegin(), m_references.rend());
    if (slice.kind == Slice::Kind::P)
        return latest;
    std::vector<Reference> list(m_references);
    std::sort(list.begin(), list.end(), [](const Reference& a, const Reference& b) { return a.order < b.order; });
    const auto middle = std::find_if(list.begin(), list.end(), [&](const Reference& a) { return a.order > m_order; });
    const auto before = middle - list.begin();
    std::reverse(list.begin(), middle);
    if (which == 1) {
        std::rotate(list.begin(), middle, list.end());
        if (list.size() > 1 && (before == 0 || middle == list.end()))
            std::swap(list[0], list[1]); // else both lists would be the same
    }
    return list;
}

Owned<AVPacket> H264References::standInFor(const AVPacket& packet, const Picture& picture, bool isWhole) const
{
    m_affinity.assertHere();
    Owned<AVPacket> standIn = newPacket();
    const Bytes parameters = h264::standInParameters(m_standInId, picture.sps);
    const Sps& sps = m_sps.at(picture.sps);
    const Bytes slice = h264::standInFor(picture.slice, sps, m_standInId, isWhole ? sps.macroblocks : 1);
    if (!standIn || av_packet_copy_props(standIn.get(), &packet) < 0
        || !replacePayload(*standIn, {parameters, slice}, m_configuration.lengthSize))
        return nullptr;
    standIn->flags |= AV_PKT_FLAG_DISCARD;
    return standIn;
}

} // namespace ffmpeg
