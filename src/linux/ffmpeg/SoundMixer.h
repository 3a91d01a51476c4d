/// All sound tracks of a movie, heard at once: each at its own level, their sum kept from clipping. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Demuxer.h"
#include "linux/ffmpeg/Movie.h"
#include "linux/ffmpeg/SoundTrack.h"

#include <cstdint>
#include <memory>
#include <vector>

namespace ffmpeg {

class SoundMixer {
public:
    static base::Result<std::unique_ptr<SoundMixer>> open(const std::shared_ptr<const Movie>& movie,
                                                          const Cancelled& cancelled);

    /// What is mixed next begins at this frame of the movie, in pairs of samples at the playing rate.
    void seek(std::int64_t frame);
    std::int64_t position() const { return m_position; }
    /// The next `frames` pairs; silence where the movie has no sound, and behind its end.
    void mix(float* into, std::size_t frames);

private:
    SoundMixer(const Movie& movie, std::unique_ptr<Demuxer> demuxer, std::vector<std::unique_ptr<SoundTrack>> tracks);

    void readUntil(std::int64_t frame);
    void limit(float* samples, std::size_t frames);

    std::unique_ptr<Demuxer> m_demuxer;
    std::vector<std::unique_ptr<SoundTrack>> m_tracks;
    std::int64_t m_origin;
    int m_pictures; ///< the picture stream; -1 when there is only sound
    Owned<AVPacket> m_packet;
    std::int64_t m_position = 0;
    bool m_ended = false;
    float m_gain = 1;
    base::Affinity m_affinity = base::Affinity::detached();
};

} // namespace ffmpeg
