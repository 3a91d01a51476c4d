#include "linux/ffmpeg/exporting/output/MovieWriter.h"

#include "linux/ffmpeg/exporting/output/IndexRoom.h"
#include "linux/ffmpeg/exporting/output/TrackTurns.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <limits>
#include <string>
#include <unistd.h>

namespace ffmpeg {

using base::Error;
using base::Result;

namespace {

constexpr int kBufferSize = 1 << 20;

/// What a packet takes in the index at most: its size, time, composition, keyframe, and a chunk of its own.
constexpr std::int64_t kIndexBytesAPacket = 4 + 8 + 8 + 4 + 12 + 8;
constexpr std::int64_t kIndexBytesBeside = 64 << 10; ///< headers of tracks and metadata

/// How much more of the whole must be done before it is told again: whoever hears of each packet has no time to write.
constexpr double kProgressStep = 0.001;

struct Closing {
    void operator()(AVFormatContext* context) const { avformat_free_context(context); }
};

/// The file as the muxer sees it.
struct Place {
    OutputFile& file;
    std::int64_t position = 0;
    std::int64_t size = 0;
};

int writeBytes(void* self, std::uint8_t* bytes, int count)
{
    Place& place = *static_cast<Place*>(self);
    const int error = place.file.write(place.position, bytes, static_cast<std::size_t>(count));
    if (error != 0)
        return error;
    place.position += count;
    place.size = std::max(place.size, place.position);
    return count;
}

int readBytes(void* self, std::uint8_t* into, int count)
{
    Place& place = *static_cast<Place*>(self);
    const ssize_t got = pread(place.file.descriptor(), into, static_cast<std::size_t>(count), place.position);
    if (got <= 0)
        return got == 0 ? AVERROR_EOF : AVERROR(errno);
    place.position += got;
    return static_cast<int>(got);
}

std::int64_t moveTo(void* self, std::int64_t offset, int whence)
{
    Place& place = *static_cast<Place*>(self);
    if (whence & AVSEEK_SIZE)
        return place.size;
    const int base = whence & ~AVSEEK_FORCE;
    offset += base == SEEK_CUR ? place.position : base == SEEK_END ? place.size : 0;
    return offset < 0 ? AVERROR(EINVAL) : place.position = offset;
}

/// The muxer reads the file again when it must move what it wrote, to make room for the index.
int openAgain(AVFormatContext* context, AVIOContext** io, const char*, int flags, AVDictionary**)
{
    if (flags & AVIO_FLAG_WRITE)
        return AVERROR(EPERM);
    auto* place = new Place(*static_cast<Place*>(context->opaque));
    place->position = 0;
    auto* buffer = static_cast<std::uint8_t*>(av_malloc(kBufferSize));
    *io = avio_alloc_context(buffer, kBufferSize, 0, place, readBytes, nullptr, moveTo);
    return 0;
}

int closeAgain(AVFormatContext*, AVIOContext* io)
{
    delete static_cast<Place*>(io->opaque);
    Owned<AVIOContext>(io).reset();
    return 0;
}

class Writer {
public:
    explicit Writer(const WriteJob& job) : m_job(job), m_place{job.file} {}

    Result<std::vector<TrackSummary>> run()
    {
        for (const auto& step : {&Writer::open, &Writer::writePackets, &Writer::finish}) {
            if (const auto done = (this->*step)(); !done)
                return done.error();
        }
        std::vector<TrackSummary> summaries;
        for (const Track& each : m_tracks) {
            auto joints = each.source->joints();
            if (!joints)
                return joints.error();
            summaries.push_back(each.summary);
            summaries.back().joints = std::move(joints).value();
        }
        return summaries;
    }

private:
    struct Track {
        TrackSource* source;
        AVRational sourceTicks;
        TrackSummary summary;
        double done = 0;
    };

    base::ErrorRef failure(int error) const
    {
        if (error == AVERROR_EXIT)
            return Error::make("ffmpeg", error, "it is no longer wanted");
        return Error::make("ffmpeg", error, "“" + m_job.file.name() + "” cannot be written: " + textOf(error) + ".");
    }

    Result<void> open()
    {
        AVFormatContext* context = nullptr;
        if (const int error = avformat_alloc_output_context2(&context, nullptr, "mp4", nullptr); error < 0)
            return failure(error);
        m_context.reset(context);
        auto* buffer = static_cast<std::uint8_t*>(av_malloc(kBufferSize));
        m_io.reset(avio_alloc_context(buffer, kBufferSize, 1, &m_place, nullptr, writeBytes, moveTo));
        context->pb = m_io.get();
        context->opaque = &m_place;
        context->io_open = openAgain;
        context->io_close2 = closeAgain;
        context->flags |= AVFMT_FLAG_CUSTOM_IO;
        context->flush_packets = 0; // the buffer is written when it is full, not behind each packet
        context->strict_std_compliance = FF_COMPLIANCE_EXPERIMENTAL; // for FLAC, which players know by now
        context->avoid_negative_ts = AVFMT_AVOID_NEG_TS_DISABLED;    // an edit list hides what is before 0
        copyMetadata(*context);
        for (const auto& source : m_job.tracks) {
            AVStream* stream = avformat_new_stream(context, nullptr);
            if (!stream)
                return failure(AVERROR(ENOMEM));
            if (auto described = source->describe(*stream); !described)
                return described;
            m_tracks.push_back({source.get(), stream->time_base, {}, 0});
        }
        AVDictionary* options = nullptr;
        if (m_job.videoTimescale > 0)
            av_dict_set_int(&options, "video_track_timescale", m_job.videoTimescale, 0);
        av_dict_set_int(&options, "movie_timescale", 90000, 0);
        // A time code says when the source's first picture was taken, and would be a track that nobody asked for.
        av_dict_set_int(&options, "write_tmcd", 0, 0);
        m_reserved = std::min<std::int64_t>(m_job.likelyPackets * kIndexBytesAPacket + kIndexBytesBeside,
                                            std::numeric_limits<int>::max() / 2);
        av_dict_set_int(&options, "moov_size", m_reserved, 0);
        const int error = avformat_write_header(context, &options);
        av_dict_free(&options);
        if (error < 0)
            return failure(error);
        for (std::size_t i = 0; i < m_tracks.size(); ++i) {
            m_tracks[i].summary.type = context->streams[i]->codecpar->codec_type;
            m_tracks[i].summary.timeBase = context->streams[i]->time_base;
        }
        return {};
    }

    void copyMetadata(AVFormatContext& context) const
    {
        av_dict_copy(&context.metadata, m_job.metadata, 0);
        // The muxer has words of its own for these.
        for (const char* key : {"major_brand", "minor_version", "compatible_brands", "encoder", "DURATION", "timecode"})
            av_dict_set(&context.metadata, key, nullptr, 0);
    }

    Result<void> writePackets()
    {
        std::vector<TrackTurns::Track> tracks;
        for (const Track& each : m_tracks)
            tracks.push_back({each.source, each.sourceTicks, each.summary.timeBase});
        TrackTurns turns(tracks);
        for (;;) {
            auto next = turns.next();
            if (!next)
                return next.error();
            if (!next.value())
                return {};
            const TrackTurns::Turn& turn = *next.value();
            Track& track = m_tracks[turn.track];
            for (const auto& packet : turn.packets) {
                if (m_job.cancelled && *m_job.cancelled)
                    return failure(AVERROR_EXIT);
                if (auto done = write(track, *packet); !done)
                    return done;
                tellProgress(track, static_cast<double>(packet->dts) * av_q2d(track.summary.timeBase));
            }
            if (turn.isLast)
                tellProgress(track, m_job.seconds);
        }
    }

    void tellProgress(Track& track, double seconds)
    {
        if (!m_job.progress || m_job.seconds <= 0)
            return;
        track.done = std::clamp(seconds / m_job.seconds, track.done, 1.0);
        double sum = 0;
        for (const Track& each : m_tracks)
            sum += each.done;
        const double part = sum / static_cast<double>(m_tracks.size());
        if (part < m_toldProgress + kProgressStep && part < 1)
            return;
        m_toldProgress = part;
        m_job.progress(part);
    }

    Result<void> write(Track& track, AVPacket& packet)
    {
        packet.stream_index = static_cast<int>(&track - m_tracks.data());
        TrackSummary& summary = track.summary;
        summary.firstPts = summary.packets == 0 ? packet.pts : std::min(summary.firstPts, packet.pts);
        summary.lastPts = summary.packets == 0 ? packet.pts : std::max(summary.lastPts, packet.pts);
        ++summary.packets;
        int error = av_write_frame(m_context.get(), &packet);
        if (error >= 0)
            error = m_io->error;
        return error < 0 ? Result<void>(failure(error)) : Result<void>();
    }

    Result<void> finish()
    {
        std::int64_t packets = 0;
        for (const Track& each : m_tracks)
            packets += each.summary.packets;
        if (packets == 0)
            return Error::make("ffmpeg", AVERROR_INVALIDDATA, "there is nothing in the range that could be written");
        if (packets * kIndexBytesAPacket + kIndexBytesBeside > m_reserved)
            giveUpRoom();
        int error = av_write_trailer(m_context.get());
        avio_flush(m_io.get());
        if (error >= 0)
            error = m_io->error;
        if (error >= 0)
            error = closeIndexRoom(m_job.file);
        return error < 0 ? Result<void>(failure(error)) : Result<void>();
    }

    /// More came than was thought: the muxer shall move what it wrote, behind an index of the right size.
    void giveUpRoom()
    {
        void* muxer = m_context->priv_data;
        av_opt_set_int(muxer, "moov_size", 0, 0);
        av_opt_set(muxer, "movflags", "+faststart", 0);
        // What was kept for the index becomes a box of its own, one that holds nothing.
        const std::int64_t end = avio_tell(m_io.get());
        avio_flush(m_io.get());
        std::array<std::uint8_t, 4> size{};
        const ssize_t got = pread(m_job.file.descriptor(), size.data(), size.size(), 0);
        if (got != static_cast<ssize_t>(size.size()))
            return; // a broken file, which checking finds
        // It stands behind the first box, the file type.
        avio_seek(m_io.get(), size[0] << 24 | size[1] << 16 | size[2] << 8 | size[3], SEEK_SET);
        avio_wb32(m_io.get(), static_cast<unsigned>(m_reserved));
        avio_write(m_io.get(), reinterpret_cast<const unsigned char*>("free"), 4);
        avio_seek(m_io.get(), end, SEEK_SET);
    }

    const WriteJob& m_job;
    Place m_place;
    Owned<AVIOContext> m_io;
    std::unique_ptr<AVFormatContext, Closing> m_context;
    std::vector<Track> m_tracks;
    std::int64_t m_reserved = 0;
    double m_toldProgress = 0;
};

} // namespace

base::Result<std::vector<TrackSummary>> writeMovie(const WriteJob& job)
{
    return Writer(job).run();
}

} // namespace ffmpeg
