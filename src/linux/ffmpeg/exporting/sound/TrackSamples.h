/// Decodes a range of one sound track to samples at their places on the movie's time line. One thread.
#pragma once

#include "linux/ffmpeg/exporting/TrackSource.h"
#include "linux/ffmpeg/exporting/sound/Placement.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"
#include "linux/ffmpeg/exporting/sound/SoundDecoder.h"
#include "linux/ffmpeg/exporting/sound/TrackPackets.h"

#include <deque>
#include <functional>
#include <memory>
#include <string>

namespace ffmpeg {

class TrackSamples final : public SampleSource {
public:
    /// Null when it cannot be decoded. `tell` hears, once, that the track is damaged: it is silent there.
    static std::unique_ptr<TrackSamples> open(std::unique_ptr<TrackPackets> packets, const ExportRange& range, int rate,
                                              int channels, std::function<void(const std::string&)> tell);

    /// Whether there is no sound in the range; looks for the first.
    bool isEmpty();
    /// Whether a part of what was read so far could not be decoded.
    bool isDamaged() const
    {
        assertHere();
        return m_isDamaged;
    }

    int rate() const override
    {
        assertHere();
        return m_rate;
    }
    int channels() const override
    {
        assertHere();
        return m_channels;
    }
    int read(Planes& into, int count) override;
    void detach() override;

private:
    struct Block {
        std::int64_t at;
        Planes samples;
        std::int64_t end() const { return at + static_cast<std::int64_t>(samples.front().size()); }
    };

    TrackSamples(std::unique_ptr<TrackPackets> packets, std::unique_ptr<SoundDecoder> decoder, const ExportRange& range,
                 int rate, int channels);

    int decodeUntil(std::int64_t end);
    void take(const AVFrame& frame);
    void placeWaiting();
    void convert(const AVFrame& frame);
    bool prepare(const AVFrame& frame);
    void drainResampler();
    void append(std::int64_t at, Planes samples);
    std::int64_t end() const { return m_blocks.empty() ? m_end : m_blocks.back().end(); }

    std::unique_ptr<TrackPackets> m_packets;
    std::unique_ptr<SoundDecoder> m_decoder;
    std::function<void(const std::string&)> m_tell;
    int m_rate, m_channels;
    std::int64_t m_until; ///< in samples at the rate given out
    std::int64_t m_next;  ///< what is given out next
    double m_start;       ///< seconds

    Owned<AVPacket> m_packet;
    bool m_hasEnded = false;
    bool m_isDamaged = false;
    bool m_hasGiven = false;
    std::vector<Owned<AVFrame>> m_waiting; ///< until enough are known to place the first
    std::unique_ptr<Placement> m_placement;
    int m_placedRate = 0;

    Owned<SwrContext> m_resampler;
    int m_fromRate = 0, m_fromFormat = -1, m_fromChannels = 0;
    std::size_t m_given = 0;      ///< channels that the resampler gives
    std::int64_t m_resampled = 0; ///< where what the resampler gives next belongs
    std::deque<Block> m_blocks;
    std::int64_t m_end; ///< behind all that was decoded
};

} // namespace ffmpeg
