#include "linux/ffmpeg/exporting/sound/SoundSources.h"

#include "linux/ffmpeg/exporting/sound/CopiedTrack.h"
#include "linux/ffmpeg/exporting/sound/EncodedTrack.h"
#include "linux/ffmpeg/exporting/sound/MixedSamples.h"
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
    return base::Error::make("ffmpeg", AVERROR_EXIT, "the export was cancelled");
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
    Opening(std::shared_ptr<const Movie> movie, const ExportRange& range, SoundMode mode, Cancelled cancelled,
            TellLog log)
        : m_movie(std::move(movie)), m_range(range), m_mode(mode), m_cancelled(std::move(cancelled)),
          m_log(std::move(log))
    {
    }

    base::Result<Sources> allTracks();
    base::Result<Sources> mixed(const platform::AudioMix& mix);

private:
    struct Track {
        int stream;
        std::size_t number; ///< among the sound tracks, from 1
    };

    struct Reader {
        Track track;
        std::unique_ptr<TrackPackets> packets;
    };

    std::vector<Track> soundTracks() const;
    std::unique_ptr<TrackPackets> packetsOf(const Track& track) const;
    std::unique_ptr<TrackSource> sourceOf(const Track& track, std::size_t tracks) const;
    std::unique_ptr<TrackSource> encoded(const Track& track, std::size_t tracks, bool keepsLossless) const;
    std::unique_ptr<TrackSource> only(const Reader& reader) const;
    std::vector<Reader> readersOf(const platform::AudioMix& mix) const;
    std::unique_ptr<SampleSource> samplesOf(std::unique_ptr<TrackPackets> packets, const Track& track, int rate,
                                            int channels) const;
    base::Result<std::unique_ptr<ChunkedEncoder>> encoderOf(std::unique_ptr<SampleSource> samples,
                                                            std::size_t tracks) const;
    void tell(const Track& track, const std::string& what) const
    {
        m_log("Sound track " + std::to_string(track.number) + " of “" + m_movie->file()->name() + "” " + what + ".");
    }

    std::shared_ptr<const Movie> m_movie;
    ExportRange m_range;
    SoundMode m_mode;
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
        tell(track, "is left out: " + packets.error()->description());
    return nullptr;
}

std::unique_ptr<SampleSource> Opening::samplesOf(std::unique_ptr<TrackPackets> packets, const Track& track, int rate,
                                                 int channels) const
{
    auto samples = TrackSamples::open(std::move(packets), m_range, rate, channels,
                                      [self = *this, track](const std::string& what) { self.tell(track, what); });
    if (!samples)
        tell(track, "is left out: it cannot be decoded");
    else if (samples->isEmpty() && !isSet(m_cancelled)) {
        tell(track, samples->isDamaged() ? "is left out: nothing of it can be decoded"
                                         : "is left out: there is no sound of it in the range");
        return nullptr;
    }
    return samples;
}

base::Result<std::unique_ptr<ChunkedEncoder>> Opening::encoderOf(std::unique_ptr<SampleSource> samples,
                                                                 std::size_t tracks) const
{
    const int rate = samples->rate();
    const std::int64_t length = (m_range.end - m_range.start).convertedTo(rate).value;
    const std::int64_t bits = SoundEncoder::kBitsForChannel * samples->channels();
    const auto plan = ChunkedEncoder::plan(length, rate, std::thread::hardware_concurrency(), tracks);
    return ChunkedEncoder::open(std::move(samples), bits, plan, m_cancelled);
}

std::unique_ptr<TrackSource> Opening::encoded(const Track& track, std::size_t tracks, bool keepsLossless) const
{
    auto packets = packetsOf(track);
    if (!packets)
        return nullptr;
    const AVCodecParameters& about = packets->parameters();
    const AVCodecID codec = about.codec_id;
    TrackLabels labels = TrackLabels::of(packets->stream());
    // Sound of 32 bits is more than these encoders take.
    const int bits = std::max(about.bits_per_raw_sample, about.bits_per_coded_sample) > 16 ? 24 : 16;
    const bool isLossless = keepsLossless && (codec == AV_CODEC_ID_FLAC || codec == AV_CODEC_ID_ALAC)
                            && about.bits_per_raw_sample <= 24 && about.ch_layout.nb_channels <= 8;
    const int rate = isLossless ? about.sample_rate : aacRateFor(about.sample_rate);
    const int channels = isLossless ? about.ch_layout.nb_channels : aacChannelsFor(about.ch_layout.nb_channels);
    auto samples = samplesOf(std::move(packets), track, rate, channels);
    if (!samples)
        return nullptr;
    base::ErrorRef error;
    if (isLossless) {
        auto source = LosslessTrack::open(std::move(samples), codec, bits, std::move(labels));
        if (source)
            return std::move(source).value();
        error = source.error();
    } else {
        auto encoder = encoderOf(std::move(samples), tracks);
        if (encoder)
            return std::make_unique<EncodedTrack>(std::move(encoder).value(), std::move(labels));
        error = encoder.error();
    }
    tell(track, "is left out: " + error->description());
    return nullptr;
}

std::unique_ptr<TrackSource> Opening::sourceOf(const Track& track, std::size_t tracks) const
{
    if (m_mode == SoundMode::Encode)
        return encoded(track, tracks, true);
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
    return encoded(track, tracks, true);
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

/// One track needs no mixing; AAC, which is what a mix is in, may keep its packets.
std::unique_ptr<TrackSource> Opening::only(const Reader& reader) const
{
    const bool isAac = reader.packets->parameters().codec_id == AV_CODEC_ID_AAC;
    return isAac ? sourceOf(reader.track, 1) : encoded(reader.track, 1, false);
}

std::vector<Opening::Reader> Opening::readersOf(const platform::AudioMix& mix) const
{
    std::vector<Reader> all;
    for (const Track& track : soundTracks())
        if (auto packets = packetsOf(track))
            all.push_back({track, std::move(packets)});
    const auto& tracks = m_movie->tracks();
    std::vector<Reader> wanted;
    for (const platform::AudioMixInput& input : mix.inputs) {
        const auto hasItsID = [&](const Reader& each) {
            return each.packets && Movie::trackIDOf(each.packets->stream()) == input.trackID;
        };
        const auto tellOfInput = [&](const std::string& why) {
            m_log("Track " + std::to_string(input.trackID) + " of “" + m_movie->file()->name()
                  + "” is left out of the mix: " + why + ".");
        };
        if (std::any_of(wanted.begin(), wanted.end(), hasItsID)) {
            tellOfInput("it is in it already");
        } else if (const auto found = std::find_if(all.begin(), all.end(), hasItsID); found != all.end()) {
            wanted.push_back(std::move(*found));
        } else if (std::none_of(tracks.begin(), tracks.end(), [&](const platform::AssetTrack& track) {
                       return track.type == platform::MediaType::Audio && track.trackID == input.trackID;
                   })) {
            // Of sound that cannot be read another line tells.
            tellOfInput("there is no such sound track");
        }
    }
    return wanted;
}

base::Result<Sources> Opening::mixed(const platform::AudioMix& mix)
{
    Sources sources;
    auto readers = readersOf(mix);
    if (isSet(m_cancelled))
        return cancelledResult();
    if (readers.size() == 1) {
        if (auto source = only(readers.front()))
            sources.push_back(std::move(source));
        return isSet(m_cancelled) ? cancelledResult() : std::move(sources);
    }
    int rate = 0;
    for (const Reader& reader : readers)
        rate = std::max(rate, std::min(reader.packets->rate(), kAacRates.front()));
    std::vector<std::unique_ptr<SampleSource>> samples;
    TrackLabels labels;
    labels.disposition = AV_DISPOSITION_DEFAULT;
    for (auto& [track, packets] : readers) {
        const auto own = TrackLabels::of(packets->stream()).metadata;
        auto each = samplesOf(std::move(packets), track, aacRateFor(rate), 2);
        if (!each)
            continue;
        // Only what all of them say is true of their sum.
        const auto language = own.find("language");
        const std::string spoken = language == own.end() ? "und" : language->second;
        std::string& common = labels.metadata["language"];
        common = samples.empty() || common == spoken ? spoken : "und";
        samples.push_back(std::move(each));
    }
    if (samples.empty())
        return sources;
    auto encoder = encoderOf(std::make_unique<MixedSamples>(std::move(samples)), 1);
    if (!encoder)
        return encoder.error();
    sources.push_back(std::make_unique<EncodedTrack>(std::move(encoder).value(), std::move(labels)));
    return sources;
}

} // namespace

base::Result<Sources> openSoundSources(std::shared_ptr<const Movie> movie, const ExportRange& range,
                                       const std::optional<platform::AudioMix>& mix, SoundMode mode,
                                       const Cancelled& cancelled, const TellLog& log)
{
    Opening opening(std::move(movie), range, mode, cancelled, log);
    return mix ? opening.mixed(*mix) : opening.allTracks();
}

} // namespace ffmpeg
