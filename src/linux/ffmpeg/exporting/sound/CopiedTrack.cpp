#include "linux/ffmpeg/exporting/sound/CopiedTrack.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <utility>

namespace ffmpeg {

namespace {

constexpr double kBefore = 1.0;         ///< seconds read before an edge: for decoders, and to place the first packet
constexpr std::int64_t kBehind = 40;    ///< frames of AAC read behind the start, in which a joint is looked for
constexpr double kSilent = 1.0 / 32768; ///< the last bit of 16
/// Before a track's first sound there may be what its decoder needs to start: Opus 80 ms.
constexpr double kPriming = 0.1;
/// Samples by which the first packet of AAC lies before the sound at most; they are what the encoder made of nothing.
constexpr std::int64_t kAacPriming = 2112;
/// Where the rate is doubled, and the filters that do it need their start, too.
constexpr std::int64_t kDoubledAacPriming = 2 * kAacPriming + 962;
/// Where a movie's header is rounded to milliseconds, its end is no cut.
constexpr double kRounding = 0.0015;

bool isSilent(const Planes& sound, std::int64_t from, std::int64_t until)
{
    from = std::max<std::int64_t>(from, 0);
    until = std::min(until, kAacFrame);
    return from >= until || std::all_of(sound.begin(), sound.end(), [&](const std::vector<float>& plane) {
               return std::all_of(plane.begin() + from, plane.begin() + until,
                                  [](float sample) { return std::abs(sample) < static_cast<float>(kSilent); });
           });
}

void silenceBefore(AacPiece& piece, std::int64_t place)
{
    for (auto& plane : piece.sound)
        std::fill_n(plane.begin(), std::clamp<std::int64_t>(place - piece.at, 0, kAacFrame), 0.0f);
}

void silenceFrom(AacPiece& piece, std::int64_t place)
{
    for (auto& plane : piece.sound)
        std::fill(plane.begin() + std::clamp<std::int64_t>(place - piece.at, 0, kAacFrame), plane.end(), 0.0f);
}

/// What MP4 carries and its players know.
bool fitsIntoMp4(const AVCodecParameters& parameters)
{
    switch (parameters.codec_id) {
    case AV_CODEC_ID_AAC:
    case AV_CODEC_ID_OPUS:
    case AV_CODEC_ID_FLAC:
    case AV_CODEC_ID_ALAC:
        return parameters.extradata_size > 0;
    case AV_CODEC_ID_MP3:
    case AV_CODEC_ID_AC3:
    case AV_CODEC_ID_EAC3:
        return true;
    default:
        return false;
    }
}

} // namespace

CopiedTrack::CopiedTrack(std::unique_ptr<TrackPackets> packets, const ExportRange& range)
    : m_packets(std::move(packets)), m_from(range.start.convertedTo(m_packets->rate()).value),
      m_until(range.end.convertedTo(m_packets->rate()).value),
      m_endsWithMovie(range.end.seconds() > m_packets->movie().duration().seconds() - kRounding),
      m_isCuttable(isPlainAac(m_packets->parameters()) && m_packets->samplesOfAac() == kAacFrame)
{
}

std::variant<std::unique_ptr<CopiedTrack>, CopiedTrack::Refusal>
CopiedTrack::open(std::unique_ptr<TrackPackets> packets, const ExportRange& range)
{
    if (!fitsIntoMp4(packets->parameters()))
        return Refusal{std::string(avcodec_get_name(packets->parameters().codec_id)) + " does not fit into MP4"};
    std::unique_ptr<CopiedTrack> track(new CopiedTrack(std::move(packets), range));
    // The start comes last: reading goes on from there.
    if (auto refusal = track->prepareEnd())
        return std::move(*refusal);
    if (auto refusal = track->prepareStart())
        return std::move(*refusal);
    return track;
}

std::int64_t CopiedTrack::samplesIn(const AVPacket& packet) const
{
    if (const int known = m_packets->samplesOfAac(); known > 0)
        return known;
    auto* parameters = const_cast<AVCodecParameters*>(&m_packets->parameters()); // FFmpeg's signature lacks the const
    if (const int known = av_get_audio_frame_duration2(parameters, packet.size); known > 0 && !isAac())
        return known;
    return std::max<std::int64_t>(0,
                                  av_rescale_q(packet.duration, m_packets->stream().time_base, {1, m_packets->rate()}));
}

/// What is heard of a packet: a file may say that its last one ends early.
std::int64_t CopiedTrack::lengthOf(const AVPacket& packet) const
{
    const std::int64_t samples = samplesIn(packet);
    const AVRational ticks = m_packets->stream().time_base;
    const std::int64_t said = av_rescale_q(packet.duration, ticks, {1, m_packets->rate()});
    const bool isRounded = said + av_rescale_q(1, ticks, {1, m_packets->rate()}) + 1 >= samples;
    return said <= 0 || isRounded ? samples : said;
}

/// The packets from `before` seconds before `sample` until `behind` samples behind it, each at its place.
int CopiedTrack::readAround(std::int64_t sample, double before, std::int64_t behind, std::vector<AacPiece>& pieces,
                            bool& isFromStart, bool& isToEnd)
{
    const int rate = m_packets->rate();
    m_packets->seek(static_cast<double>(sample) / rate - before);
    m_placement = std::make_unique<Placement>(m_packets->stream().time_base, m_packets->movie().origin(), rate,
                                              Placement::Manner::Copying);
    isFromStart = m_packets->isFromStart();
    isToEnd = false;
    const double earliest = static_cast<double>(sample) - before * rate;
    for (;;) {
        auto packet = newPacket();
        if (const int error = m_packets->read(*packet); error < 0) {
            if (error == AVERROR_EXIT)
                return error;
            isToEnd = true;
            break;
        }
        const double said = m_placement->said(packet->pts);
        if (said + static_cast<double>(samplesIn(*packet)) < earliest) {
            isFromStart = false;
            continue;
        }
        pieces.push_back({std::move(packet), 0, {}});
        if (said > static_cast<double>(sample + behind) && pieces.size() >= kPiecesToBegin)
            break;
    }
    std::vector<Placement::Piece> places;
    for (const AacPiece& piece : pieces)
        places.push_back({piece.packet->pts, samplesIn(*piece.packet)});
    m_placement->begin({places.begin(), places.begin() + std::min<std::ptrdiff_t>(kPiecesToBegin, std::ssize(places))});
    for (std::size_t i = 0; i < pieces.size(); ++i)
        pieces[i].at = m_placement->place(places[i]);
    return 0;
}

std::optional<CopiedTrack::Refusal> CopiedTrack::prepareEnd()
{
    if (m_endsWithMovie)
        return std::nullopt;
    std::vector<AacPiece> pieces;
    bool isFromStart = false;
    bool isToEnd = false;
    if (const int error = readAround(m_until, kBefore, 2 * kAacFrame, pieces, isFromStart, isToEnd); error < 0)
        return Refusal{"", error};
    const auto beyond =
        std::find_if(pieces.begin(), pieces.end(), [&](const auto& each) { return each.at >= m_until; });
    if (beyond == pieces.begin())
        return isFromStart ? std::optional<Refusal>(Refusal{"", 0}) : std::nullopt;
    const auto last = static_cast<std::size_t>(beyond - pieces.begin()) - 1;
    const AVPacket& packet = *pieces[last].packet;
    const auto rounding = static_cast<std::int64_t>(kRounding * m_packets->rate());
    if (beyond == pieces.end() && isToEnd && pieces[last].at + lengthOf(packet) <= m_until + rounding)
        return std::nullopt; // the sound ends before
    const std::string name = avcodec_get_name(m_packets->parameters().codec_id);
    if (!m_isCuttable)
        return Refusal{name + " cannot be cut to the sample without decoding it", 0};
    if (!AacJoints::decode(m_packets->parameters(), pieces))
        return Refusal{"it is not the plain AAC that its header announces", 0};
    if (beyond != pieces.end())
        m_stop = beyond->packet->pts;
    const bool isQuiet =
        isSilent(pieces[last].sound, m_until - pieces[last].at, kAacFrame)
        && (last + 1 == pieces.size() || isSilent(pieces[last + 1].sound, m_until - pieces[last + 1].at, kAacFrame));
    if (isQuiet)
        return std::nullopt;
    for (AacPiece& piece : pieces)
        silenceFrom(piece, m_until);
    auto joint = AacJoints(m_packets->parameters()).atEnd(pieces, last);
    if (!joint)
        return Refusal{"its packets cannot be joined to encoded ones at the end", 0};
    m_stop = pieces[joint->copied + 1].packet->pts;
    for (auto& each : joint->encoded)
        m_last.push_back(std::move(each));
    return std::nullopt;
}

std::optional<CopiedTrack::Refusal> CopiedTrack::prepareStart()
{
    std::vector<AacPiece> pieces;
    bool isFromStart = false;
    bool isToEnd = false;
    if (const int error = readAround(m_from, kBefore, kBehind * kAacFrame, pieces, isFromStart, isToEnd); error < 0)
        return Refusal{"", error};
    const auto reached = std::find_if(pieces.begin(), pieces.end(),
                                      [&](const AacPiece& each) { return each.at + samplesIn(*each.packet) > m_from; });
    if (reached == pieces.end() || reached->at >= m_until)
        return Refusal{m_packets->isDamaged() ? "its packets are damaged" : "", 0};
    const auto first = static_cast<std::size_t>(reached - pieces.begin());
    std::size_t copied = 0;
    if (!m_isCuttable) {
        const auto priming = isAac() ? kDoubledAacPriming : static_cast<std::int64_t>(kPriming * m_packets->rate());
        if (!isFromStart || pieces.front().at < m_from - priming)
            return Refusal{isAac() ? "this kind of AAC cannot be cut to the sample without decoding it"
                                   : std::string(avcodec_get_name(m_packets->parameters().codec_id))
                                         + " cannot be cut to the sample without decoding it",
                           0};
    } else {
        if (!AacJoints::decode(m_packets->parameters(), pieces))
            return Refusal{"it is not the plain AAC that its header announces", 0};
        const bool isWhole = m_from <= 0 && isFromStart && pieces.front().at >= m_from - kAacPriming;
        const bool isQuiet = (first == 0 || isSilent(pieces[first - 1].sound, 0, m_from - pieces[first - 1].at))
                             && isSilent(pieces[first].sound, 0, m_from - pieces[first].at);
        if (isWhole) {
            copied = 0;
        } else if (isQuiet) {
            copied = first == 0 ? 0 : first - 1;
        } else {
            for (AacPiece& piece : pieces)
                silenceBefore(piece, m_from);
            auto joint = AacJoints(m_packets->parameters()).atStart(pieces, first);
            if (!joint)
                return Refusal{"its packets cannot be joined to encoded ones at the start", 0};
            copied = joint->copied;
            m_firstAt = pieces[first].at - kAacFrame;
            for (auto& each : joint->encoded)
                m_first.push_back(std::move(each));
            if (m_stop && pieces[copied].packet->pts >= *m_stop)
                return Refusal{"the range is too short to copy anything", 0};
        }
    }
    for (std::size_t i = copied; i < pieces.size(); ++i)
        m_read.push_back(std::move(pieces[i]));
    return std::nullopt;
}

base::Result<void> CopiedTrack::describe(AVStream& output)
{
    assertHere();
    const AVStream& stream = m_packets->stream();
    if (const int error = avcodec_parameters_copy(output.codecpar, &m_packets->parameters()); error < 0)
        return base::Error::make("ffmpeg", error, "sound cannot be described: " + textOf(error));
    output.codecpar->codec_tag = 0;
    output.time_base = {1, m_packets->rate()};
    output.disposition = stream.disposition;
    av_dict_copy(&output.metadata, stream.metadata, 0);
    return {};
}

void CopiedTrack::give(AVPacket& packet, std::int64_t at, std::int64_t samples)
{
    // Times of damaged files run backwards now and then; decode times must not.
    at = std::max(at, m_next == INT64_MIN ? at : m_next - samples + 1);
    packet.pts = packet.dts = at - m_from;
    packet.duration =
        m_endsWithMovie ? samples : std::clamp<std::int64_t>(m_until - at, 1, std::max<std::int64_t>(samples, 1));
    packet.pos = -1;
    packet.time_base = {1, m_packets->rate()};
    packet.flags = AV_PKT_FLAG_KEY;
    m_next = at + samples;
}

base::Result<bool> CopiedTrack::next(AVPacket& packet)
{
    assertHere();
    av_packet_unref(&packet);
    if (!m_first.empty()) {
        av_packet_move_ref(&packet, m_first.front().get());
        m_first.pop_front();
        give(packet, m_firstAt, kAacFrame);
        m_firstAt += kAacFrame;
        return true;
    }
    while (!m_hasEnded) {
        std::int64_t at = 0;
        bool isLeftOut = false;
        if (!m_read.empty()) {
            av_packet_move_ref(&packet, m_read.front().packet.get());
            at = m_read.front().at;
            m_read.pop_front();
        } else {
            const int error = m_packets->read(packet);
            if (error == AVERROR_EXIT)
                return base::Error::make("ffmpeg", error, "reading the sound was cancelled");
            if (error < 0)
                break;
            at = m_placement->place({packet.pts, samplesIn(packet)});
        }
        isLeftOut = (packet.flags & AV_PKT_FLAG_DISCARD) && at >= m_from;
        if ((m_stop && packet.pts >= *m_stop) || (!m_endsWithMovie && at >= m_until))
            break;
        if (isLeftOut)
            continue;
        give(packet, at, lengthOf(packet));
        return true;
    }
    m_hasEnded = true;
    av_packet_unref(&packet);
    if (m_last.empty())
        return false;
    av_packet_move_ref(&packet, m_last.front().get());
    m_last.pop_front();
    give(packet, m_next, kAacFrame);
    return true;
}

void CopiedTrack::detach()
{
    m_packets->detach();
    if (m_placement)
        m_placement->detach();
    TrackSource::detach();
}

} // namespace ffmpeg
