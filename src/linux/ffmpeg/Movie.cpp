#include "linux/ffmpeg/Movie.h"

#include "linux/ffmpeg/FileMarks.h"
#include "linux/ffmpeg/VideoDecoder.h"
#include "linux/ffmpeg/Words.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace ffmpeg {

using base::Error;
using base::MediaTime;

namespace {

constexpr int kPacketsToFirstFrame = 20'000; ///< an edit list may hide many before it

bool isPicture(const AVStream& stream)
{
    // Covers of albums are no movies.
    return stream.codecpar->codec_type == AVMEDIA_TYPE_VIDEO && !(stream.disposition & AV_DISPOSITION_ATTACHED_PIC);
}

bool isSound(const AVStream& stream)
{
    return stream.codecpar->codec_type == AVMEDIA_TYPE_AUDIO;
}

constexpr std::int64_t kFar = AV_TIME_BASE; ///< a movie that starts later than this is taken to start at 0
constexpr int kPacketsToOrigin = 64;
constexpr std::int64_t kRunUp = AV_TIME_BASE / 10;

/// What a writer rounds, or leaves standing behind the last picture, is not cut off.
constexpr std::int64_t kNoticeable = AV_TIME_BASE / 2;
constexpr std::int64_t kLittle = 20; ///< a table at the end takes no larger part of a file

/// What a track is that does not come along.
std::string nameOf(const AVStream& stream)
{
    std::string codec = avcodec_get_name(stream.codecpar->codec_id);
    if (stream.codecpar->codec_tag == MKTAG('t', 'm', 'c', 'd'))
        return "a time code";
    if (stream.disposition & AV_DISPOSITION_ATTACHED_PIC)
        return "a cover";
    switch (stream.codecpar->codec_type) {
    case AVMEDIA_TYPE_VIDEO:
        return "another picture track (" + codec + ")";
    case AVMEDIA_TYPE_AUDIO:
        return "sound that cannot be decoded"
               + (stream.codecpar->codec_id == AV_CODEC_ID_NONE ? "" : " (" + codec + ")");
    case AVMEDIA_TYPE_SUBTITLE:
        return "subtitles (" + codec + ")";
    case AVMEDIA_TYPE_ATTACHMENT:
        return "an attached file";
    default:
        return "data that is neither picture nor sound";
    }
}

constexpr double kPicturesASecond = 61;
constexpr double kSoundPacketsASecond = 102;

base::ErrorRef explained(int code, const char* why, const char* messageKey)
{
    return Error::withMessage(Error::make("ffmpeg", code, why), messageKey, {});
}

} // namespace

base::Result<std::shared_ptr<Movie>> Movie::open(std::shared_ptr<OpenFile> file, const Cancelled& cancelled)
{
    auto demuxer = Demuxer::open(file, cancelled);
    if (!demuxer)
        return demuxer.error();
    const auto movie = std::make_shared<Movie>();
    movie->m_file = std::move(file);
    movie->m_spare = std::move(demuxer).value();

    const auto failed = [&](const base::ErrorRef& why) { return notAMovie(movie->m_file->name(), why); };
    movie->describe();
    if (!movie->m_video && movie->m_audioStreams.empty())
        return failed(explained(AVERROR_STREAM_NOT_FOUND, "it has neither pictures nor sound", "MOVIE_WITHOUT_TRACKS"));
    if (movie->m_video) {
        if (const auto decoded = movie->decodeFirstFrame(cancelled); !decoded)
            return failed(decoded.error());
    }
    if (const auto found = movie->findDuration(cancelled); !found)
        return failed(found.error());
    movie->findLikelyPackets();
    movie->m_spare->detach(); // for whoever asks for a reader first
    return movie;
}

void Movie::describe()
{
    AVFormatContext& context = m_spare->context();
    if (!m_spare->isMatroska()) // its table is read when somebody wants it
        m_hasTable = m_spare->isMov();
    // Broadcast streams start at any time; movies with a header mean what they say.
    if (!m_spare->seeksByTable() && context.start_time != AV_NOPTS_VALUE)
        m_origin = context.start_time;
    AVDictionary* metadata = nullptr;
    av_dict_copy(&metadata, context.metadata, 0);
    m_metadata.reset(metadata);
    for (int i = 0; i < m_spare->streamCount(); ++i) {
        const AVStream& stream = m_spare->stream(i);
        const bool isHeard = isSound(stream) && avcodec_find_decoder(stream.codecpar->codec_id);
        if (!isHeard && (!isPicture(stream) || m_video))
            m_otherTracks.push_back(nameOf(stream));
        if (!isPicture(stream) && !isSound(stream))
            continue;
        if (isPicture(stream) && !m_video)
            describeVideo(stream);
        if (isHeard)
            m_audioStreams.push_back(i);
        platform::AssetTrack track;
        track.trackID = trackIDOf(stream);
        track.type = isPicture(stream) ? platform::MediaType::Video : platform::MediaType::Audio;
        m_tracks.push_back(track);
    }
}

void Movie::describeVideo(const AVStream& stream)
{
    VideoTrack track;
    track.stream = stream.index;
    track.timeBase = stream.time_base;
    track.origin = av_rescale_q(m_origin, AV_TIME_BASE_Q, stream.time_base);
    track.timescale = stream.time_base.den;
    while (track.timescale < 600)
        track.timescale *= 2;
    m_video = track;
}

base::Result<void> Movie::decodeFirstFrame(const Cancelled& cancelled)
{
    const int stream = m_video->stream;
    const auto decoder = VideoDecoder::open(m_spare->stream(stream), *m_video, 1);
    if (!decoder)
        return decoder.error();
    m_spare->select({stream});
    const auto packet = newPacket();
    int error = 0;
    for (int sent = 0; !m_firstFrame && sent < kPacketsToFirstFrame; ++sent) {
        error = m_spare->read(*packet);
        if (error != 0) {
            decoder.value()->finish();
            m_firstFrame = decoder.value()->receive();
            break;
        }
        decoder.value()->send(*packet);
        // A visible keyframe comes first; nothing behind it has to be waited for.
        if (sent == 0 && (packet->flags & AV_PKT_FLAG_KEY) && !(packet->flags & AV_PKT_FLAG_DISCARD)) {
            decoder.value()->finish();
            m_firstFrame = decoder.value()->receive();
            decoder.value()->flush();
            if (!m_firstFrame)
                decoder.value()->send(*packet);
        }
        if (!m_firstFrame)
            m_firstFrame = decoder.value()->receive();
    }
    if (!m_firstFrame) {
        const int why = m_spare->readError() != 0 ? m_spare->readError() : error;
        const bool isItsFault = why == 0 || why == AVERROR_EOF || why == AVERROR_INVALIDDATA;
        return isItsFault ? explained(AVERROR_INVALIDDATA, "it holds no picture", "MOVIE_WITHOUT_PICTURE")
                          : Error::make("ffmpeg", why, textOf(why));
    }

    AVStream& about = m_spare->stream(stream);
    auto* picture = const_cast<AVFrame*>(&m_firstFrame->picture()); // only read; FFmpeg's signature lacks the const
    m_video->aspect = av_guess_sample_aspect_ratio(&m_spare->context(), &about, picture);
    const base::Size natural = squareSize(picture->width, picture->height, m_video->aspect);
    const base::AffineTransform transform = preferredTransform(about, natural);
    m_video->orientation = Orientation::fromTransform(transform);
    findOrigin(m_firstFrame->pts(), cancelled);
    Owned<AVFrame> again(av_frame_clone(picture));
    const std::int64_t pts = m_firstFrame->pts();
    m_firstFrame = std::make_shared<DecodedFrame>(std::move(again), pts, m_video->timeOf(pts), m_video->orientation,
                                                  m_video->aspect);
    const auto track = std::find_if(m_tracks.begin(), m_tracks.end(),
                                    [](const auto& each) { return each.type == platform::MediaType::Video; });
    track->naturalSize = natural;
    track->preferredTransform = transform;
    return {};
}

/// Matroska that was cut from something longer, or that goes by the clock on the wall, starts far from 0. Whoever plays
/// it does not want to wait.
void Movie::findOrigin(std::int64_t firstPts, const Cancelled& cancelled)
{
    const AVRational timeBase = m_video->timeBase;
    if (m_spare->isMov() || !m_spare->seeksByTable() || av_compare_ts(firstPts, timeBase, kFar, AV_TIME_BASE_Q) < 0)
        return;
    auto reader = Demuxer::open(m_file, cancelled);
    if (!reader)
        return;
    const std::int64_t picture = av_rescale_q(firstPts, timeBase, AV_TIME_BASE_Q);
    std::int64_t first = picture;
    // Its packets stand in the order of time but for a few.
    const auto packet = newPacket();
    for (int read = 0; read < kPacketsToOrigin && reader.value()->read(*packet) == 0; ++read) {
        const AVRational ticks = reader.value()->stream(packet->stream_index).time_base;
        if (packet->pts != AV_NOPTS_VALUE)
            first = std::min(first, av_rescale_q(packet->pts, ticks, AV_TIME_BASE_Q));
    }
    // A little sound before the first picture is only what the decoder needs to start.
    m_origin = picture - first < kRunUp ? picture : first;
    m_video->origin = av_rescale_q(m_origin, AV_TIME_BASE_Q, timeBase);
}

base::Result<void> Movie::findDuration(const Cancelled& cancelled)
{
    AVFormatContext& context = m_spare->context();
    std::int64_t length = context.duration; // microseconds
    const std::int64_t announced = announcedSize(*m_file).value_or(0);
    // What the header of a file says that does not start at 0 is sometimes its length, sometimes its end.
    if (length == AV_NOPTS_VALUE || length <= 0 || (m_origin != 0 && m_spare->seeksByTable())
        || announced > m_file->size()) {
        const auto index = packetIndex(cancelled);
        if (!index)
            return explained(AVERROR_EXIT, "it cannot be read to its end", "MOVIE_UNREADABLE");
        if (m_video && index->packets().empty())
            return explained(AVERROR_INVALIDDATA,
                             "it does not say when its pictures are shown, as a bare stream of them; have it put into "
                             "a file that does, MP4 or Matroska for example",
                             "MOVIE_WITHOUT_TIMES");
        const std::int64_t said = length == AV_NOPTS_VALUE ? 0 : length - std::max<std::int64_t>(0, m_origin);
        length = std::max<std::int64_t>(0, index->end().value_or(m_origin) - m_origin);
        noteCut(announced - m_file->size(), said, length);
    }
    m_duration = MediaTime::make(length, AV_TIME_BASE);
    auto track = m_tracks.begin();
    MediaTime longest = MediaTime::make(0, timescale());
    for (int i = 0; i < m_spare->streamCount(); ++i) {
        const AVStream& stream = m_spare->stream(i);
        if (!isPicture(stream) && !isSound(stream))
            continue;
        const auto ticks = [&](std::int64_t value) {
            return MediaTime::make(value * stream.time_base.num, stream.time_base.den);
        };
        std::int64_t start = stream.start_time;
        if (m_video && i == m_video->stream)
            start = m_firstFrame->pts();
        if (start == AV_NOPTS_VALUE)
            start = 0;
        const MediaTime from = ticks(start) - MediaTime::make(m_origin, AV_TIME_BASE);
        track->timeRange.start = std::max(from.convertedTo(timescale()), MediaTime::make(0, timescale()),
                                          [](const MediaTime& a, const MediaTime& b) { return a < b; });
        const bool known = stream.duration != AV_NOPTS_VALUE && stream.duration > 0;
        track->timeRange.duration =
            (known && !m_durationBeforeCut ? ticks(stream.duration) : m_duration - track->timeRange.start)
                .convertedTo(timescale());
        if (known && longest < track->timeRange.end())
            longest = track->timeRange.end();
        ++track;
    }
    // Headers round to milliseconds what the tracks know to the tick.
    const double rounding = std::abs(longest.seconds() - m_duration.seconds());
    m_duration = rounding < 0.002 ? longest : m_duration.convertedTo(timescale());
    return {};
}

/// `missing` are bytes; `said` and `length` microseconds. Where a file is too short, the library does not always believe
/// its header, and gives a guess.
void Movie::noteCut(std::int64_t missing, std::int64_t said, std::int64_t length)
{
    if (missing <= 0)
        return;
    if (said > length + kNoticeable)
        m_durationBeforeCut = MediaTime::make(said, AV_TIME_BASE);
    else if (missing > m_file->size() / kLittle)
        m_durationBeforeCut = MediaTime::indefinite();
}

std::optional<platform::CutOff> Movie::cutOff() const
{
    if (!m_durationBeforeCut)
        return std::nullopt;
    platform::CutOff cut{m_duration.seconds()};
    if (m_durationBeforeCut->isNumeric())
        cut.secondsBefore = m_durationBeforeCut->seconds();
    return cut;
}

std::optional<std::string> Movie::whatIsMissing() const
{
    const auto cut = cutOff();
    if (!cut)
        return std::nullopt;
    const std::string of = cut->secondsBefore ? "of " + lengthInWords(*cut->secondsBefore) + " " : "";
    return "“" + m_file->name() + "” was cut off: " + of + "only the first " + lengthInWords(cut->seconds)
           + " are there.";
}

void Movie::findLikelyPackets()
{
    for (int i = 0; i < m_spare->streamCount(); ++i) {
        const AVStream& stream = m_spare->stream(i);
        const int counted = m_spare->isMov() ? avformat_index_get_entries_count(&stream) : 0;
        const double usual = isPicture(stream) ? kPicturesASecond : kSoundPacketsASecond;
        m_likelyPackets += counted > 0 ? counted : std::llround(m_duration.seconds() * usual);
    }
}

base::Result<std::unique_ptr<Demuxer>> Movie::demuxer(Cancelled cancelled) const
{
    {
        const std::lock_guard lock(m_mutex);
        if (m_spare) {
            m_spare->setCancelled(std::move(cancelled));
            return std::move(m_spare);
        }
    }
    return Demuxer::open(m_file, std::move(cancelled));
}

bool Movie::hasTable(const Cancelled& cancelled) const
{
    const std::lock_guard lock(m_tableMutex);
    if (!m_hasTable) {
        auto reader = Demuxer::open(m_file, cancelled);
        if (!reader)
            return false;
        const bool found = reader.value()->findsKeyframes(m_video ? m_video->stream : m_audioStreams.front());
        if (!found && reader.value()->isCancelled())
            return false;
        m_hasTable = found;
    }
    return *m_hasTable;
}

std::shared_ptr<const PacketIndex> Movie::packetIndex(const Cancelled& cancelled) const
{
    const std::lock_guard lock(m_indexMutex);
    if (!m_index) {
        auto reader = Demuxer::open(m_file, cancelled);
        if (!reader)
            return nullptr;
        if (m_video)
            m_index = PacketIndex::build(*reader.value(), m_video->stream);
        else
            m_index = PacketIndex::build(*reader.value(), -1);
    }
    return m_index;
}

} // namespace ffmpeg
