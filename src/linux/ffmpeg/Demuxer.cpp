#include "linux/ffmpeg/Demuxer.h"

#include "linux/ffmpeg/FileMarks.h"
#include "linux/ffmpeg/Words.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace ffmpeg {

namespace {

constexpr int kBufferSize = 64 * 1024;
constexpr unsigned kMostTracks = 64;
constexpr int kTooManyTracks = AVERROR(E2BIG);
constexpr int kErrorsInARow = 64; ///< after so many failed reads without a packet there is nothing more to come

/// Formats that hold movies in one file. Playlists and the like, which name other files, are left out on purpose.
constexpr const char* kFormats = "mov,mp4,matroska,webm,mpegts,mpeg,avi,flv,ogg,asf,nut,ivf,h264,hevc,m4v,gif,"
                                 "wav,mp3,aac,flac,caf,aiff,w64,apng";

int refuseToOpen(AVFormatContext*, AVIOContext**, const char*, int, AVDictionary**)
{
    return AVERROR(EPERM);
}

/// Whether the header of its stream is known. Browsers leave it to the first packet.
bool hasHeader(const AVCodecParameters& parameters)
{
    const AVCodecID codec = parameters.codec_id;
    const bool needsOne = codec == AV_CODEC_ID_H264 || codec == AV_CODEC_ID_HEVC || codec == AV_CODEC_ID_AV1;
    return !needsOne || parameters.extradata_size > 0;
}

bool isKnown(const AVStream& stream)
{
    const AVCodecParameters& parameters = *stream.codecpar;
    if (parameters.codec_type == AVMEDIA_TYPE_VIDEO)
        return parameters.codec_id != AV_CODEC_ID_NONE && parameters.width > 0 && parameters.height > 0
               && hasHeader(parameters);
    if (parameters.codec_type == AVMEDIA_TYPE_AUDIO)
        return parameters.codec_id != AV_CODEC_ID_NONE && parameters.sample_rate > 0
               && parameters.ch_layout.nb_channels > 0;
    return parameters.codec_type != AVMEDIA_TYPE_UNKNOWN;
}

/// Why it cannot be opened, and what to do.
base::ErrorRef whyNot(const OpenFile& file, int error)
{
    const auto explained = [error](const std::string& why, const char* key) {
        return base::Error::withMessage(base::Error::make("ffmpeg", error, why), key, {});
    };
    if (error == kTooManyTracks)
        return explained("it has more than " + std::to_string(kMostTracks) + " tracks, as no recording has",
                         "MOVIE_TOO_MANY_TRACKS");
    if (error == AVERROR_INVALIDDATA && lacksIndex(file))
        return explained("its index is missing, because its recorder was stopped before the end or only a part of it "
                         "was copied; copy it again, or have it repaired",
                         "MOVIE_WITHOUT_INDEX");
    return base::Error::make("ffmpeg", error, textOf(error));
}

bool isOfKind(const AVFormatContext& context, std::string_view kind)
{
    return std::string_view(context.iformat->name).find(kind) != std::string_view::npos;
}

bool hasTable(const AVFormatContext& context)
{
    return isOfKind(context, "mov") || isOfKind(context, "matroska");
}

} // namespace

Demuxer::Demuxer(std::shared_ptr<OpenFile> file, Cancelled cancelled)
    : m_file(std::move(file)), m_cancelled(std::move(cancelled))
{
}

Demuxer::~Demuxer() = default;

int Demuxer::readBytes(void* self, std::uint8_t* into, int count)
{
    auto& demuxer = *static_cast<Demuxer*>(self);
    if (demuxer.isCancelled())
        return AVERROR_EXIT;
    const std::int64_t got = demuxer.m_file->read(demuxer.m_position, into, static_cast<std::size_t>(count));
    if (got == 0)
        return AVERROR_EOF;
    if (got < 0) {
        if (demuxer.m_readError == 0)
            demuxer.m_readError = static_cast<int>(got);
        return static_cast<int>(got);
    }
    demuxer.m_position += got;
    return static_cast<int>(got);
}

std::int64_t Demuxer::moveTo(void* self, std::int64_t offset, int whence)
{
    auto& demuxer = *static_cast<Demuxer*>(self);
    if (whence & AVSEEK_SIZE)
        return demuxer.m_file->size();
    switch (whence & ~AVSEEK_FORCE) {
    case SEEK_SET:
        break;
    case SEEK_CUR:
        offset += demuxer.m_position;
        break;
    case SEEK_END:
        offset += demuxer.m_file->size();
        break;
    default:
        return AVERROR(EINVAL);
    }
    if (offset < 0)
        return AVERROR(EINVAL);
    return demuxer.m_position = offset;
}

base::Result<std::unique_ptr<Demuxer>> Demuxer::open(std::shared_ptr<OpenFile> file, Cancelled cancelled)
{
    std::unique_ptr<Demuxer> demuxer(new Demuxer(std::move(file), std::move(cancelled)));
    if (const int error = demuxer->begin(); error < 0)
        return notAMovie(demuxer->m_file->name(),
                         whyNot(*demuxer->m_file, demuxer->m_readError ? demuxer->m_readError : error));
    return demuxer;
}

int Demuxer::begin()
{
    m_position = 0;
    m_readError = 0;
    m_hasLookedAtPackets = false;
    auto* buffer = static_cast<std::uint8_t*>(av_malloc(kBufferSize));
    Owned<AVIOContext> io(avio_alloc_context(buffer, kBufferSize, 0, this, readBytes, nullptr, moveTo));
    AVFormatContext* opened = avformat_alloc_context();
    opened->pb = io.get();
    opened->io_open = refuseToOpen;
    opened->interrupt_callback = {[](void* self) { return int(static_cast<Demuxer*>(self)->isCancelled()); }, this};
    opened->probesize = 4 << 20;
    opened->max_analyze_duration = std::int64_t(2) * AV_TIME_BASE;
    opened->format_whitelist = av_strdup(kFormats);
    if (const int error = avformat_open_input(&opened, nullptr, nullptr, nullptr); error < 0)
        return error; // it freed the context
    Owned<AVFormatContext> context(opened);
    // Movies with a header need no look at their packets, which would delay the first picture.
    const auto streams = context->streams;
    if (!hasTable(*context) || context->nb_streams == 0
        || !std::all_of(streams, streams + context->nb_streams, [](AVStream* each) { return isKnown(*each); })) {
        if (const int error = avformat_find_stream_info(opened, nullptr); error < 0)
            return error;
        m_hasLookedAtPackets = true;
    }
    if (context->nb_streams > kMostTracks)
        return kTooManyTracks;
    m_context = std::move(context); // before what it reads through
    m_io = std::move(io);
    m_isFresh = true;
    m_peeked.reset();
    return 0;
}

void Demuxer::lookAtPackets()
{
    m_affinity.assertHere();
    if (!std::exchange(m_hasLookedAtPackets, true))
        avformat_find_stream_info(m_context.get(), nullptr);
}

void Demuxer::select(const std::vector<int>& streams)
{
    m_affinity.assertHere();
    m_selected = streams;
    for (int i = 0; i < streamCount(); ++i) {
        const bool wanted = std::find(streams.begin(), streams.end(), i) != streams.end();
        stream(i).discard = wanted ? AVDISCARD_DEFAULT : AVDISCARD_ALL;
    }
}

int Demuxer::read(AVPacket& packet)
{
    m_affinity.assertHere();
    av_packet_unref(&packet);
    if (m_lost != 0)
        return m_lost;
    m_isFresh = false;
    if (m_peeked) {
        av_packet_move_ref(&packet, m_peeked.get());
        m_peeked.reset();
        return 0;
    }
    for (int tries = 0; tries < kErrorsInARow; ++tries) {
        if (isCancelled())
            return AVERROR_EXIT;
        const int result = av_read_frame(m_context.get(), &packet);
        if (result >= 0 && stream(packet.stream_index).discard < AVDISCARD_ALL)
            return 0;
        // The library takes a place that cannot be read for the end of the file.
        if (result < 0 && m_readError != 0)
            return m_readError;
        if (result == AVERROR_EOF || result == AVERROR_EXIT || result == AVERROR(EIO))
            return result;
        if (result >= 0)
            tries = -1; // a packet that nobody wanted
        av_packet_unref(&packet);
    }
    return AVERROR_INVALIDDATA;
}

bool Demuxer::seeksByTable() const
{
    m_affinity.assertHere();
    return hasTable(*m_context);
}

bool Demuxer::isMov() const
{
    m_affinity.assertHere();
    return isOfKind(*m_context, "mov");
}

bool Demuxer::isMatroska() const
{
    m_affinity.assertHere();
    return isOfKind(*m_context, "matroska");
}

} // namespace ffmpeg
