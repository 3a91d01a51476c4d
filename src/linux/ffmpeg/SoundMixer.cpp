#include "linux/ffmpeg/SoundMixer.h"

#include "linux/ffmpeg/AudioOutput.h"

#include <algorithm>
#include <cmath>

namespace ffmpeg {

namespace {

/// A track that has no packets for so long is taken as silent; reading on for it would fill the memory with the others.
constexpr std::int64_t kFarthestAhead = std::int64_t(kSampleRate) * 4;
/// Sought before what is wanted: decoders need a start.
constexpr std::int64_t kRunUp = AV_TIME_BASE / 4;
/// The limiter's gain returns to 1 with this share a sample: about a tenth of a second.
constexpr float kRelease = 1.0f / 4800;

} // namespace

SoundMixer::SoundMixer(const Movie& movie, std::unique_ptr<Demuxer> demuxer,
                       std::vector<std::unique_ptr<SoundTrack>> tracks)
    : m_demuxer(std::move(demuxer)), m_tracks(std::move(tracks)), m_origin(movie.origin()),
      m_pictures(movie.video() ? movie.video()->stream : -1), m_packet(newPacket())
{
}

base::Result<std::unique_ptr<SoundMixer>> SoundMixer::open(const std::shared_ptr<const Movie>& movie,
                                                           const Cancelled& cancelled)
{
    // Not the one that opened the movie: that is for the pictures, which are wanted sooner.
    auto demuxer = Demuxer::open(movie->file(), cancelled);
    if (!demuxer)
        return demuxer.error();
    std::vector<std::unique_ptr<SoundTrack>> tracks;
    std::vector<int> streams;
    for (const int stream : movie->audioStreams()) {
        if (stream >= demuxer.value()->streamCount())
            continue;
        if (auto track = SoundTrack::open(demuxer.value()->stream(stream), movie->origin())) {
            tracks.push_back(std::move(track));
            streams.push_back(stream);
        }
    }
    if (tracks.empty())
        return base::Error::make("ffmpeg", AVERROR_DECODER_NOT_FOUND,
                                 "“" + movie->file()->name() + "” has no sound that can be played.");
    demuxer.value()->select(streams);
    return std::unique_ptr<SoundMixer>(new SoundMixer(*movie, std::move(demuxer).value(), std::move(tracks)));
}

void SoundMixer::seek(std::int64_t frame)
{
    m_affinity.assertHere();
    m_position = frame;
    m_ended = false;
    m_gain = 1;
    for (const auto& track : m_tracks)
        track->seek(frame);
    const int stream = m_tracks.front()->stream();
    const std::int64_t moment = av_rescale(frame, AV_TIME_BASE, kSampleRate) + m_origin - kRunUp;
    if (moment <= m_origin || !m_demuxer->seekSound(stream, m_pictures, moment))
        m_demuxer->seekToStart(stream);
}

void SoundMixer::mix(float* into, std::size_t frames)
{
    m_affinity.assertHere();
    std::fill(into, into + frames * 2, 0.0f);
    readUntil(m_position + static_cast<std::int64_t>(frames));
    for (const auto& track : m_tracks)
        track->addTo(into, m_position, frames);
    limit(into, frames);
    m_position += static_cast<std::int64_t>(frames);
}

void SoundMixer::readUntil(std::int64_t frame)
{
    const auto lacks = [&](const auto& track) { return track->end() < frame; };
    const auto isFarAhead = [&](const auto& track) { return track->end() > frame + kFarthestAhead; };
    while (!m_ended && std::any_of(m_tracks.begin(), m_tracks.end(), lacks)
           && std::none_of(m_tracks.begin(), m_tracks.end(), isFarAhead)) {
        if (m_demuxer->read(*m_packet) != 0) {
            m_ended = true;
            return;
        }
        for (const auto& track : m_tracks)
            if (track->stream() == m_packet->stream_index && !track->isTooEarly(*m_packet))
                track->decode(*m_packet);
    }
}

void SoundMixer::limit(float* samples, std::size_t frames)
{
    for (std::size_t i = 0; i < frames; ++i) {
        float& left = samples[2 * i];
        float& right = samples[2 * i + 1];
        const float peak = std::max(std::abs(left), std::abs(right));
        m_gain += (1 - m_gain) * kRelease;
        if (!(peak * m_gain <= 1))
            m_gain = std::isfinite(peak) && peak > 0 ? 1 / peak : 0;
        left = std::isfinite(left) ? left * m_gain : 0;
        right = std::isfinite(right) ? right * m_gain : 0;
    }
}

} // namespace ffmpeg
