#include "linux/ffmpeg/exporting/video/EncodedVideoSource.h"

#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/video/LargestPicture.h"
#include "linux/ffmpeg/exporting/video/StreamTraits.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace ffmpeg {

using base::Result;

namespace {

/// Above 45 dB on recordings of screens, where an eye finds no difference.
constexpr const char* kQuality = "12";
constexpr double kSecondsBetweenKeyframes = 2; ///< so that seeking is quick

/// What becomes of RGB must say how it was converted: players take the matrix of standard definition for small pictures
/// that do not.
void describeRgb(EncoderRequest& request)
{
    const bool isWide = request.primaries == AVCOL_PRI_BT2020;
    request.matrix = isWide ? AVCOL_SPC_BT2020_NCL : AVCOL_SPC_BT709;
    if (request.primaries == AVCOL_PRI_UNSPECIFIED)
        request.primaries = AVCOL_PRI_BT709;
    if (request.transfer == AVCOL_TRC_UNSPECIFIED)
        request.transfer = AVCOL_TRC_BT709;
    if (request.range == AVCOL_RANGE_UNSPECIFIED)
        request.range = AVCOL_RANGE_MPEG;
}

EncoderRequest requestFor(const AVStream& stream, const AVFrame& picture, AVRational timeBase)
{
    EncoderRequest request = EncoderRequest::like(stream, picture, timeBase);
    const bool isHevc = isHdr(request.transfer); // few players know H.264 of more than 8 bits
    request.encoder = isHevc ? "libx265" : "libx264";
    request.format = isHevc ? formatForHdr(request.format) : formatForH264(request.format);
    const AVPixFmtDescriptor& about = *av_pix_fmt_desc_get(request.format);
    // Odd sizes have half a sample of colour at the edge, which x264 refuses. What is added the file does not show.
    request.width = AV_CEIL_RSHIFT(request.width, about.log2_chroma_w) << about.log2_chroma_w;
    request.height = AV_CEIL_RSHIFT(request.height, about.log2_chroma_h) << about.log2_chroma_h;
    if (isRgb(static_cast<AVPixelFormat>(picture.format)))
        describeRgb(request);
    request.isInterlaced = false;
    request.keyframeInterval =
        std::max(1, static_cast<int>(std::lround(av_q2d(request.frameRate) * kSecondsBetweenKeyframes)));
    if (isHevc) {
        request.options = {
            {"preset", "veryfast"},
            {"x265-params", std::string("open-gop=0:cutree=0:info=0:repeat-headers=0:log-level=none:crf=") + kQuality}};
        return request;
    }
    // Saving on pictures that few others look at is what shows in short movies.
    request.options = {{"preset", "veryfast"}, {"crf", kQuality}, {"x264-params", "mbtree=0"}};
    return request;
}

} // namespace

EncodedVideoSource::EncodedVideoSource(std::unique_ptr<PicturePackets> packets, const AVFrame& picture,
                                       std::int64_t start, std::int64_t end)
    : m_packets(std::move(packets)), m_start(start), m_end(end), m_shownWidth(picture.width),
      m_shownHeight(picture.height), m_hdr(HdrMetadata::of(m_packets->stream(), picture)),
      m_request(requestFor(m_packets->stream(), picture, m_packets->outTimeBase())),
      m_scaler(m_request.format, m_request.width, m_request.height, m_request.matrix),
      m_line(0, usualStep(m_packets->stream(), m_packets->outTimeBase()), std::nullopt, end - start)
{
}

Result<std::unique_ptr<TrackSource>> EncodedVideoSource::open(std::unique_ptr<PicturePackets> packets,
                                                              std::int64_t start, std::int64_t end)
{
    const auto largest = largestPicture(*packets, start, end);
    if (!largest)
        return largest.error();
    std::unique_ptr<EncodedVideoSource> source(
        new EncodedVideoSource(std::move(packets), largest.value()->picture(), start, end));
    auto encoder = PictureEncoder::open(source->m_request);
    if (!encoder)
        return encoder.error();
    source->m_encoder = std::move(encoder).value();
    return std::unique_ptr<TrackSource>(std::move(source));
}

Result<void> EncodedVideoSource::describe(AVStream& output)
{
    assertHere();
    if (auto done = describeLike(m_packets->stream(), m_packets->movie().firstFrame()->picture(),
                                 m_packets->outTimeBase(), output);
        !done)
        return done;
    const AVCodecContext& encoder = m_encoder->context();
    if (const int error = avcodec_parameters_from_context(output.codecpar, &encoder); error < 0)
        return base::Error::make("ffmpeg", error, textOf(error));
    output.codecpar->codec_tag = isHdr(m_request.transfer) ? MKTAG('h', 'v', 'c', '1') : MKTAG('a', 'v', 'c', '1');
    output.codecpar->width = m_shownWidth;
    output.codecpar->height = m_shownHeight;
    const auto isEnd = [this, behind = 0](const AVPacket& packet) mutable {
        const bool isShown = packet.pts != AV_NOPTS_VALUE && !(packet.flags & AV_PKT_FLAG_DISCARD);
        behind += isShown && m_packets->outTick(packet.pts) >= m_end;
        return behind > PicturePackets::kFarthestReorder;
    };
    auto feed = PictureFeed::start(*m_packets, m_start, PictureFeed::Before::Decode, PictureFeed::Size::OfFile, isEnd);
    if (!feed)
        return feed.error();
    m_feed = std::move(feed).value();
    return {};
}

Result<bool> EncodedVideoSource::next(AVPacket& packet)
{
    assertHere();
    while (!m_line.pop(packet)) {
        if (m_ended)
            return false;
        if (auto done = goOn(); !done)
            return done.error();
    }
    return true;
}

Result<void> EncodedVideoSource::goOn()
{
    const auto next = m_feed->next();
    if (!next)
        return next.error();
    const FrameRef& picture = next.value();
    const std::int64_t pts = picture ? m_packets->outTick(picture->pts()) : m_end;
    if (picture && pts < m_end) {
        const std::int64_t waiting = m_waiting ? m_packets->outTick(m_waiting->pts()) : pts - 1;
        if (pts <= waiting)
            return {}; // broken files give pictures out of order
        // What another replaces before the range begins is not seen in it.
        const FrameRef shown = std::exchange(m_waiting, picture);
        return shown && pts > m_start ? encode(*shown, pts) : Result<void>();
    }
    // Before the first picture of all begins, it is what is seen.
    if (picture && picture->pts() == m_packets->movie().firstFrame()->pts())
        m_waiting = picture;
    std::int64_t end = pts;
    if (m_waiting && !picture) {
        // The movie ends before the range does, and its last picture when it would have ended anyway.
        const std::int64_t begin = m_packets->outTick(m_waiting->pts());
        const std::int64_t own = m_packets->outTicks(m_waiting->picture().pkt_duration);
        const std::int64_t usual = usualStep(m_packets->stream(), m_packets->outTimeBase());
        end = std::min(m_end, std::max(begin, m_start) + (own > 0 ? own : usual));
    }
    end = std::min(end, m_end);
    if (m_waiting) {
        if (auto done = encode(*std::exchange(m_waiting, nullptr), end); !done)
            return done;
    }
    if (auto done = m_encoder->finish(); !done)
        return done;
    if (auto done = moveOut(); !done)
        return done;
    m_line.finish(end - m_start);
    m_ended = true;
    return {};
}

Result<void> EncodedVideoSource::encode(const DecodedFrame& picture, std::int64_t until)
{
    auto fitting = m_scaler.fit(picture.picture());
    if (!fitting)
        return fitting.error();
    const std::int64_t own = m_packets->outTick(picture.pts());
    const std::int64_t pts = own < m_end ? std::max(own, m_start) : m_start;
    if (auto done = m_encoder->encode(*fitting.value(), pts, until - pts); !done)
        return done;
    return moveOut();
}

/// Decoders forget it at a keyframe that does not say it again.
Result<void> EncodedVideoSource::insertHdr(AVPacket& keyframe) const
{
    if (!isHdr(m_request.transfer) || m_hdr.isEmpty())
        return {};
    const Bytes unit = m_hdr.hevcUnit();
    std::vector<ByteView> units = unitsBetweenStartCodes(payloadOf(keyframe));
    units.insert(units.begin(), unit);
    constexpr int kStartCodes = 0;
    if (!replacePayload(keyframe, units, kStartCodes))
        return base::Error::make("ffmpeg", AVERROR(ENOMEM), "there is not enough memory");
    return {};
}

Result<void> EncodedVideoSource::moveOut()
{
    while (auto packet = m_encoder->take()) {
        packet->pts -= m_start;
        const bool isJoint = packet->flags & AV_PKT_FLAG_KEY;
        if (auto done = isJoint ? insertHdr(*packet) : Result<void>(); !done)
            return done;
        if (auto done = m_line.push(std::move(packet), isJoint); !done)
            return done;
    }
    return {};
}

void EncodedVideoSource::detach()
{
    m_packets->detach();
    m_scaler.detach();
    m_encoder->detach();
    if (m_feed)
        m_feed->detach();
    m_line.detach();
    TrackSource::detach();
}

} // namespace ffmpeg
