#include "linux/ffmpeg/exporting/sound/SoundSources.h"

#include "linux/ffmpeg/exporting/sound/CopiedTrack.h"
#include "linux/ffmpeg/exporting/sound/EncodedTrack.h"
#include "linux/ffmpeg/exporting/sound/TrackSamples.h"

#include <algorithm>
#include <array>
#include <thread>
#include <utility>

namespace ffmpeg {

namespace {

using Sources = std::vector<std::unique_ptr<TrackSource>>;

constexpr int kUsualRate = 48000;
/// What AAC can be (ISO/IEC 14496-3, 4.5.1.1).
constexpr std::array kAacRates = {96000, 88200, 64000, 48000, 44100, 32000, 24000,
                                  22050, 16000, 12000, 11025, 8000,  7350};

base::Result<Sources> cancelledResult()
{
    return base::Error::make("ffmpeg", AVERROR_EXIT, "The export was cancelled.");
}

bool isSet(const Cancelled& cancelled)
{
    return cancelled && *cancelled;
}

int aacRateFor(int rate)
{
    return std::find(kAacRates.begin(), kAacRates.end(), rate) != kAacRates.end() ? rate : kUsualRate;
}

/// AAC has layouts for these; players expect others as stereo.
int aacChannelsFor(int channels)
{
    return channels == 7 || channels > 8 ? 2 : channels;
}

/// Opens what is to be read for one export.
class Opening {
public:
    Opening(std::shared_ptr<const Movie> movie, const ExportRange& range, Cancelled cancelled, TellLog log)
        : m_movie(std::move(movie)), m_range(range), m_cancelled(std::move(cancelled)), m_log(std::move(log))
    {
    }

    base::Result<Sources> allTracks();

private:
    struct Track {
        int stream;
        std::size_t number; ///< among the sound tracks, from 1
    };

    std::vector<Track> soundTracks() const;
    std::unique_ptr<TrackPackets> packetsOf(const Track& track) const;
    std::unique_ptr<TrackSource> sourceOf(const Track& track, std::size_t tracks) const;
    std::unique_ptr<TrackSource> encoded(const Track& track, std::size_t tracks) const;
    void tell(const Track& track, const std::string& what) const
    {
        m_log("Sound track " + std::to_string(track.number) + " of “" + m_movie->file()->name() + "” " + what + ".");
    }

    std::shared_ptr<const Movie> m_movie;
    ExportRange m_range;
    Cancelled m_cancelled;
    TellLog m_log;
};

std::vector<Opening::Track> Opening::soundTracks() const
{
    std::vector<Track> tracks;
    for (const int stream : m_movie->audioStreams())
        tracks.push_back({stream, tracks.size() + 1});
    return tracks;
}

std::unique_ptr<TrackPackets> Opening::packetsOf(const Track& track) const
{
    auto packets = TrackPackets::open(m_movie, track.stream, m_cancelled);
    if (packets)
        return std::move(packets).value();
    if (!isSet(m_cancelled))
        tell(track, "is left out. " + packets.error()->description());
    return nullptr;
}

std::unique_ptr<TrackSource> Opening::encoded(const Track& track, std::size_t tracks) const
{
    auto packets = packetsOf(track);
    if (!packets)
        return nullptr;
    const AVCodecParameters& about = packets->parameters();
    const AVCodecID codec = about.codec_id;
    const TrackLabels labels = TrackLabels::of(packets->stream());
    // Sound of 32 bits is more than these encoders take.
    const int bits = std::max(about.bits_per_raw_sample, about.bits_per_coded_sample) > 16 ? 24 : 16;
    const bool isLossless = (codec == AV_CODEC_ID_FLAC || codec == AV_CODEC_ID_ALAC) && about.bits_per_raw_sample <= 24
                            && about.ch_layout.nb_channels <= 8;
    const int rate = isLossless ? about.sample_rate : aacRateFor(about.sample_rate);
    const int channels = isLossless ? about.ch_layout.nb_channels : aacChannelsFor(about.ch_layout.nb_channels);
    auto samples = TrackSamples::open(std::move(packets), m_range, rate, channels,
                                      [this_ = *this, track](const std::string& what) { this_.tell(track, what); });
    if (!samples) {
        tell(track, "is left out: it cannot be decoded");
        return nullptr;
    }
    if (isLossless) {
        auto source = LosslessTrack::open(std::move(samples), codec, bits, labels);
        if (source)
            return std::move(source).value();
        tell(track, "is left out. " + source.error()->description());
        return nullptr;
    }
    const std::int64_t length = (m_range.end - m_range.start).convertedTo(rate).value;
    auto encoder = ChunkedEncoder::open(std::move(samples), SoundEncoder::kBitsForChannel * channels,
                                        ChunkedEncoder::plan(length, rate, std::thread::hardware_concurrency(), tracks),
                                        m_cancelled);
    if (encoder)
        return std::make_unique<EncodedTrack>(std::move(encoder).value(), labels);
    tell(track, "is left out. " + encoder.error()->description());
    return nullptr;
}

std::unique_ptr<TrackSource> Opening::sourceOf(const Track& track, std::size_t tracks) const
{
    auto packets = packetsOf(track);
    if (!packets)
        return nullptr;
    auto copied = CopiedTrack::open(std::move(packets), m_range);
    if (auto* source = std::get_if<std::unique_ptr<CopiedTrack>>(&copied))
        return std::move(*source);
    const auto& refusal = std::get<CopiedTrack::Refusal>(copied);
    if (refusal.error < 0)
        return nullptr;
    if (refusal.reason.empty()) {
        tell(track, "is left out: there is no sound of it in the range");
        return nullptr;
    }
    tell(track, "is encoded again: " + refusal.reason);
    return encoded(track, tracks);
}

base::Result<Sources> Opening::allTracks()
{
    Sources sources;
    const auto tracks = soundTracks();
    for (const Track& track : tracks) {
        auto source = sourceOf(track, tracks.size());
        if (isSet(m_cancelled))
            return cancelledResult();
        if (source)
            sources.push_back(std::move(source));
    }
    return sources;
}

} // namespace

base::Result<Sources> openSoundSources(std::shared_ptr<const Movie> movie, const ExportRange& range,
                                       const std::optional<platform::AudioMix>& mix, const Cancelled& cancelled,
                                       const TellLog& log)
{
    (void)mix;
    return Opening(std::move(movie), range, cancelled, log).allTracks();
}

} // namespace ffmpeg
