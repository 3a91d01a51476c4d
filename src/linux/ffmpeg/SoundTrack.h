/// Decodes one sound track to stereo at the playing rate, by places on the movie's time line. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/ffmpeg/Libraries.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

namespace ffmpeg {

class SoundTrack {
public:
    /// Null when it cannot be decoded. `origin` is where the movie begins, in microseconds of the file's time.
    static std::unique_ptr<SoundTrack> open(const AVStream& stream, std::int64_t origin);

    int stream() const { return m_stream; }
    /// Forgets everything; what lies before `frame` is not wanted.
    void seek(std::int64_t frame);
    /// Whether the packet ends so long before what is wanted that it need not be decoded.
    bool isTooEarly(const AVPacket& packet) const;
    void decode(const AVPacket& packet);

    /// Behind the last frame that is there.
    std::int64_t end() const { return m_start + static_cast<std::int64_t>(m_samples.size() / 2); }
    /// Adds what there is between `from` and `from + frames` to `into`, and forgets all before that end.
    void addTo(float* into, std::int64_t from, std::size_t frames);

private:
    SoundTrack(Owned<AVCodecContext> context, const AVStream& stream, std::int64_t origin);

    void take(const AVFrame& frame);
    bool prepare(const AVFrame& frame);
    void append(std::int64_t at, const float* samples, std::size_t frames);
    std::int64_t frameAt(std::int64_t pts) const;

    Owned<AVCodecContext> m_context;
    Owned<SwrContext> m_resampler;
    Owned<AVFrame> m_frame;
    int m_stream;
    AVRational m_timeBase;
    std::int64_t m_origin;
    int m_rate = 0, m_format = -1, m_channels = 0; ///< what the resampler was made for
    std::int64_t m_wanted = 0;
    std::int64_t m_start = 0; ///< where m_samples begins
    std::vector<float> m_samples;
    std::vector<float> m_converted;
    bool m_continues = false; ///< the next samples belong right behind the last
    base::Affinity m_affinity = base::Affinity::detached();
};

} // namespace ffmpeg
