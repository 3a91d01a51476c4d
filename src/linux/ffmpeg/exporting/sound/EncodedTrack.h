/// Sound tracks that are made of samples. One thread.
#pragma once

#include "linux/ffmpeg/exporting/TrackSource.h"
#include "linux/ffmpeg/exporting/sound/ChunkedEncoder.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"

#include <map>
#include <memory>
#include <string>

namespace ffmpeg {

/// What a track says of itself beside its sound.
struct TrackLabels {
    std::map<std::string, std::string> metadata;
    int disposition = 0;

    static TrackLabels of(const AVStream& stream);
    void putOn(AVStream& output) const;
};

/// Encodes to AAC, on all cores.
class EncodedTrack final : public TrackSource {
public:
    EncodedTrack(std::unique_ptr<ChunkedEncoder> encoder, TrackLabels labels)
        : m_encoder(std::move(encoder)), m_labels(std::move(labels))
    {
    }

    base::Result<void> describe(AVStream& output) override;
    base::Result<bool> next(AVPacket& packet) override
    {
        assertHere();
        return m_encoder->next(packet);
    }
    void detach() override;

private:
    std::unique_ptr<ChunkedEncoder> m_encoder;
    TrackLabels m_labels;
};

/// Encodes to a codec that loses nothing, which is fast.
class LosslessTrack final : public TrackSource {
public:
    /// `codec` is FLAC or ALAC; `bits` of a sample, 16 or 24.
    static base::Result<std::unique_ptr<TrackSource>> open(std::unique_ptr<SampleSource> samples, AVCodecID codec,
                                                           int bits, TrackLabels labels);

    base::Result<void> describe(AVStream& output) override;
    base::Result<bool> next(AVPacket& packet) override;
    void detach() override;

private:
    LosslessTrack(std::unique_ptr<SampleSource> samples, std::unique_ptr<SoundEncoder> encoder, TrackLabels labels)
        : m_samples(std::move(samples)), m_encoder(std::move(encoder)), m_labels(std::move(labels))
    {
    }

    std::unique_ptr<SampleSource> m_samples;
    std::unique_ptr<SoundEncoder> m_encoder;
    TrackLabels m_labels;
    std::int64_t m_sent = 0;
    bool m_hasEnded = false;
};

} // namespace ffmpeg
