#include "linux/ffmpeg/exporting/video/SplicedVideoSource.h"

#include "linux/ffmpeg/exporting/CannotCopy.h"
#include "linux/ffmpeg/exporting/video/DeservedQuality.h"
#include "linux/ffmpeg/exporting/video/StreamTraits.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace ffmpeg {

using base::Result;

namespace {

constexpr std::int64_t kNone = std::numeric_limits<std::int64_t>::min();
constexpr int kMostWindows = 16; ///< looking back for a place to cut; each time farther

Result<VideoPlan> planFor(PicturePackets& packets, const Splicer& splicer, std::int64_t start, std::int64_t end)
{
    const auto head = packets.headWindow(start, end, splicer);
    if (!head)
        return head.error();
    std::int64_t tailFrom = end;
    for (int tries = 0; tries < kMostWindows; ++tries) {
        const auto tail = packets.tailWindow(tailFrom, end, splicer);
        if (!tail)
            return tail.error();
        VideoPlan plan = planVideo(head.value(), tail.value(), start, end);
        if (!plan.wantsEarlierTail)
            return plan.copies() ? Result<VideoPlan>(std::move(plan)) : cannotCopy(plan.reason);
        tailFrom = tail.value().packets.empty() ? start : tail.value().packets.front().pts - 1;
    }
    return cannotCopy("no place to cut was found");
}

} // namespace

SplicedVideoSource::SplicedVideoSource(std::unique_ptr<PicturePackets> packets, std::unique_ptr<Splicer> splicer,
                                       VideoPlan plan, std::int64_t start, std::int64_t end, TellLog log)
    : m_packets(std::move(packets)), m_splicer(std::move(splicer)), m_plan(std::move(plan)), m_start(start), m_end(end),
      m_log(std::move(log)), m_format(static_cast<AVPixelFormat>(m_packets->movie().firstFrame()->picture().format)),
      m_request(EncoderRequest::like(m_packets->stream(), m_packets->movie().firstFrame()->picture(),
                                     m_packets->outTimeBase())),
      m_lastEncoded(kNone)
{
}

Result<std::unique_ptr<TrackSource>> SplicedVideoSource::open(std::unique_ptr<PicturePackets> packets,
                                                              std::int64_t start, std::int64_t end, TellLog log)
{
    auto splicer = Splicer::make(packets->stream(), packets->movie().firstFrame()->picture());
    if (!splicer)
        return splicer.error();
    if (splicer.value()->showsInOrder())
        packets->setShowsInOrder();
    auto plan = planFor(*packets, *splicer.value(), start, end);
    if (!plan)
        return plan.error();
    std::unique_ptr<SplicedVideoSource> source(new SplicedVideoSource(
        std::move(packets), std::move(splicer).value(), std::move(plan).value(), start, end, std::move(log)));
    for (const auto& step : {&SplicedVideoSource::findInterruptions, &SplicedVideoSource::showToSplicer,
                             &SplicedVideoSource::prepareEncoder}) {
        if (const auto done = (*source.*step)(); !done)
            return done.error();
    }
    const auto why = whyMostIsEncoded(source->m_plan, source->m_packets->outTimeBase().den);
    if (!why.empty() && source->m_log)
        source->m_log("“" + source->m_packets->movie().file()->name() + "” is encoded for the most part: " + why + ".");
    return std::unique_ptr<TrackSource>(std::move(source));
}

Result<void> SplicedVideoSource::findInterruptions()
{
    if (!m_packets->isInterrupted())
        return {};
    const auto packets = m_packets->copiedWindow(m_plan, *m_splicer);
    if (!packets)
        return packets.error();
    auto gaps = findGaps(packets.value());
    if (!gaps)
        return cannotCopy("an edit list leaves out pictures between others that need them");
    m_plan.gaps = std::move(*gaps);
    if (m_plan.gaps.empty() || m_plan.gaps.back().joint)
        return {};
    // What follows the last gap is all encoded, as what the end breaks is.
    m_plan.tail.insert(m_plan.tail.begin(), m_plan.gaps.back().firstPts);
    m_plan.copiesToHidden = true;
    m_plan.gaps.pop_back();
    return {};
}

Result<void> SplicedVideoSource::prepareEncoder()
{
    VideoPlan& plan = m_plan;
    plan.reorderDepth =
        std::max({plan.reorderDepth, m_splicer->reorderDepth(), m_packets->stream().codecpar->video_delay});
    const std::int64_t step = usualStep(m_packets->stream(), m_packets->outTimeBase());
    // Where pictures follow the last, it ends with the range; else when it would have ended anyway.
    m_line = std::make_unique<PictureLine>(plan.reorderDepth, step,
                                           plan.isCutAtEnd ? std::optional(plan.lastPts - m_start) : std::nullopt,
                                           m_end - m_start);
    if (!plan.encodesHead() && plan.tail.empty()
        && std::none_of(plan.gaps.begin(), plan.gaps.end(), [](const VideoGap& each) { return each.encodes(); }))
        return {};
    if (auto prepared = m_splicer->prepare(m_request, plan.reorderDepth); !prepared)
        return prepared;
    if (m_request.scale) {
        const std::int64_t first = plan.encodesHead() || plan.tail.empty() ? plan.firstPts : plan.tail.front();
        m_request.options["crf"] = std::to_string(deservedQuality(*m_packets, first, m_request, *m_splicer));
    }
    if (auto opened = openEncoder(); !opened)
        return cannotCopy(opened.error()->description());
    return m_splicer->join(m_encoder->context());
}

Result<void> SplicedVideoSource::openEncoder()
{
    auto encoder = PictureEncoder::open(m_request);
    if (!encoder)
        return encoder.error();
    m_encoder = std::move(encoder).value();
    const AVCodecContext& context = m_encoder->context();
    std::vector<std::uint8_t> header(context.extradata, context.extradata + context.extradata_size);
    if (!m_encoderHeader.empty() && header != m_encoderHeader)
        return cannotCopy("the encoder's header is not the same twice");
    m_encoderHeader = std::move(header);
    return {};
}

Result<void> SplicedVideoSource::showToSplicer()
{
    if (!m_splicer->wantsToSee())
        return {};
    const auto packet = newPacket();
    bool isCopied = false;
    m_packets->seek(m_plan.copyFrom);
    while (m_packets->read(*packet) == 0) {
        isCopied = isCopied || isFirstCopied(*packet);
        if (isCopied && isBehindCopied(*packet))
            break;
        if (isCopied)
            m_splicer->see(*packet);
    }
    return {};
}

Result<void> SplicedVideoSource::describe(AVStream& output)
{
    assertHere();
    if (auto done = describeLike(m_packets->stream(), m_packets->movie().firstFrame()->picture(),
                                 m_packets->outTimeBase(), output);
        !done)
        return done;
    if (auto done = m_splicer->describe(*output.codecpar); !done)
        return done;
    return beginStretch(m_plan.encodesHead() ? State::Head : State::Copy);
}

Result<bool> SplicedVideoSource::next(AVPacket& packet)
{
    assertHere();
    while (!m_line->pop(packet)) {
        if (m_state == State::Ended)
            return false;
        if (auto done = goOn(); !done)
            return done.error();
    }
    return true;
}

Result<void> SplicedVideoSource::goOn()
{
    return m_state == State::Copy ? copyOne() : encodeSome();
}

Result<void> SplicedVideoSource::beginStretch(State state)
{
    m_state = state;
    if (state == State::Ended) {
        m_line->finish();
        return {};
    }
    if (state == State::Copy) {
        if (auto begun = m_witness.beginStretch(*m_packets->stream().codecpar); !begun)
            return begun;
        if (!m_copied)
            m_packets->seek(m_plan.copyFrom);
        return {};
    }
    if (!m_encoder) {
        if (auto opened = openEncoder(); !opened)
            return opened;
    }
    if (auto begun = m_witness.beginStretch(m_encoder->context()); !begun)
        return begun;
    const std::int64_t from = state == State::Head ? m_plan.firstPts : m_plan.tail.front();
    m_lastEncoded = kNone;
    m_hasReachedJoint = false;
    const auto isEnd = [this, behind = 0](const AVPacket& packet) mutable {
        const std::int64_t pts = m_packets->outTick(packet.pts);
        if (m_state == State::Head) {
            m_hasReachedJoint = m_hasReachedJoint || isFirstCopied(packet);
            return m_hasReachedJoint && (!m_plan.joinsOpenGroup || pts > m_plan.copyFrom);
        }
        behind += !(packet.flags & AV_PKT_FLAG_DISCARD) && pts > m_plan.lastPts;
        return behind > PicturePackets::kFarthestReorder;
    };
    auto feed = PictureFeed::start(*m_packets, from, PictureFeed::Before::Skip, PictureFeed::Size::OfStream, isEnd);
    if (!feed)
        return feed.error();
    m_feed = std::move(feed).value();
    return {};
}

Result<void> SplicedVideoSource::encode(const AVFrame& picture, std::int64_t pts)
{
    const std::int64_t duration = m_packets->outTicks(picture.pkt_duration);
    if (m_request.format == m_format)
        return m_encoder->encode(picture, pts, duration);
    if (!m_packer)
        m_packer.emplace(m_request.format, m_request.width, m_request.height, m_request.matrix);
    const auto packed = m_packer->fit(picture);
    return packed ? m_encoder->encode(*packed.value(), pts, duration) : Result<void>(packed.error());
}

Result<void> SplicedVideoSource::encodeSome()
{
    const std::int64_t from = m_state == State::Head ? m_plan.firstPts : m_plan.tail.front();
    const std::int64_t to = m_state == State::Head ? m_plan.copyFrom : m_plan.lastPts + 1;
    const auto frame = m_feed->next();
    if (!frame)
        return frame.error();
    if (const FrameRef& picture = frame.value()) {
        const std::int64_t pts = m_packets->outTick(picture->pts());
        if (pts < from || pts >= to || pts <= m_lastEncoded)
            return {};
        const AVFrame& coded = picture->picture();
        if (coded.width != m_request.width || coded.height != m_request.height || coded.format != m_format)
            return cannotCopy("its pictures change their size or format");
        m_lastEncoded = pts;
        m_witness.seePicture(coded);
        if (auto done = encode(coded, std::max(pts, m_start)); !done)
            return done;
    } else if (auto done = m_encoder->finish(); !done) {
        return done;
    }
    while (auto packet = m_encoder->take()) {
        packet->pts -= m_start;
        const bool isJoint = packet->flags & AV_PKT_FLAG_KEY;
        m_witness.seePacket(*packet, isJoint);
        if (auto done = m_splicer->adoptEncoded(*packet); !done)
            return done;
        if (auto done = m_line->push(std::move(packet), isJoint); !done)
            return done;
    }
    if (frame.value())
        return {};
    m_copied = m_plan.joinsOpenGroup ? nullptr : m_feed->takeEnd(); // which is behind an open joint
    m_feed.reset();
    m_encoder.reset();
    return beginStretch(m_state == State::Head && m_hasReachedJoint ? State::Copy : State::Ended);
}

Result<void> SplicedVideoSource::copyOne()
{
    auto packet = m_copied ? std::exchange(m_copied, nullptr) : newPacket();
    for (;;) {
        if (!packet->data) {
            const int result = m_packets->read(*packet);
            if (result == AVERROR_EXIT)
                return base::Error::make("ffmpeg", result, "it is no longer wanted");
            if (result != 0)
                return endCopying(!m_plan.copyTo);
        }
        if (packet->pts == AV_NOPTS_VALUE)
            return cannotCopy("its packets do not say when they are shown");
        const std::int64_t pts = m_packets->outTick(packet->pts);
        const bool isOpenJoint = m_plan.joinsOpenGroup && isFirstCopied(*packet) && !m_isPastJoint;
        m_isPastJoint = m_isPastJoint || isFirstCopied(*packet);
        if (isOpenJoint)
            if (auto done = m_splicer->close(*packet); !done)
                return done;
        if (m_isPastJoint && (!m_plan.joinsOpenGroup || pts >= m_plan.copyFrom))
            break;
        // What lies between the keyframe that was found and the joint, or behind it but is shown before.
        av_packet_unref(packet.get());
    }
    const std::int64_t pts = m_packets->outTick(packet->pts);
    const bool isHidden = packet->flags & AV_PKT_FLAG_DISCARD;
    if (isHidden && !m_plan.gaps.empty())
        return leap();
    if (isBehindCopied(*packet))
        return endCopying(true);
    if (isHidden || pts < m_plan.copyFrom || pts > m_plan.lastCopied)
        return cannotCopy("an edit list leaves out pictures on the way");
    std::size_t size = 0;
    const std::uint8_t* header = av_packet_get_side_data(packet.get(), AV_PKT_DATA_NEW_EXTRADATA, &size);
    const AVCodecParameters& parameters = *m_packets->stream().codecpar;
    if (header
        && !std::equal(header, header + size, parameters.extradata, parameters.extradata + parameters.extradata_size))
        return cannotCopy("its header changes on the way");
    m_lastDts = std::max(m_lastDts, packet->dts);
    const bool isJoint = (packet->flags & AV_PKT_FLAG_KEY) && m_splicer->isJoint(*packet);
    m_witness.seePacket(*packet, isJoint);
    if (auto done = m_splicer->adoptCopied(*packet); !done)
        return done;
    av_packet_free_side_data(packet.get());
    packet->duration = m_packets->outTicks(packet->duration);
    packet->pts = std::max<std::int64_t>(0, pts - m_start);
    return m_line->push(std::move(packet), isJoint);
}

/// Over what an edit list leaves out, to where it shows pictures again.
Result<void> SplicedVideoSource::leap()
{
    const VideoGap gap = m_plan.gaps.front();
    m_plan.gaps.erase(m_plan.gaps.begin());
    m_plan.firstPts = gap.firstPts;
    m_plan.copyFrom = *gap.joint;
    m_plan.joinsOpenGroup = false;
    m_isPastJoint = false;
    return gap.encodes() ? beginStretch(State::Head) : Result<void>();
}

/// What an edit list hides can have the time of a picture that it shows.
bool SplicedVideoSource::isFirstCopied(const AVPacket& packet) const
{
    return !(packet.flags & AV_PKT_FLAG_DISCARD) && m_packets->outTick(packet.pts) == m_plan.copyFrom;
}

bool SplicedVideoSource::isBehindCopied(const AVPacket& packet) const
{
    if (packet.flags & AV_PKT_FLAG_DISCARD)
        return m_plan.copiesToHidden && m_plan.gaps.empty();
    return !m_plan.copiesToHidden && m_plan.copyTo == m_packets->outTick(packet.pts);
}

Result<void> SplicedVideoSource::endCopying(bool isExpected)
{
    AVStream& stream = m_packets->stream();
    const AVIndexEntry* last =
        m_packets->isMov() ? avformat_index_get_entry(&stream, avformat_index_get_entries_count(&stream) - 1) : nullptr;
    const bool isCut = !isExpected || (!m_plan.copyTo && !m_plan.copiesToHidden && last && last->timestamp > m_lastDts);
    if (isCut && m_log && !m_packets->movie().durationBeforeCut()) // which is told already
        m_log("“" + m_packets->movie().file()->name() + "” ends before its index does: pictures are missing.");
    return beginStretch(isExpected && !m_plan.tail.empty() ? State::Tail : State::Ended);
}

void SplicedVideoSource::detach()
{
    m_packets->detach();
    m_splicer->detach();
    if (m_encoder)
        m_encoder->detach();
    if (m_packer)
        m_packer->detach();
    if (m_feed)
        m_feed->detach();
    if (m_line)
        m_line->detach();
    m_witness.detach();
    TrackSource::detach();
}

} // namespace ffmpeg
