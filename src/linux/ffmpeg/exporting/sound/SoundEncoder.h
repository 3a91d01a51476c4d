/// Encodes samples to packets. One thread.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/ffmpeg/Libraries.h"
#include "linux/ffmpeg/exporting/sound/SampleSource.h"

#include <cstdint>
#include <memory>

namespace ffmpeg {

class SoundEncoder {
public:
    /// For Edges a few packets are made as well as they can be made; for Tracks speed counts too.
    enum class Purpose { Tracks, Edges };

    struct Settings {
        AVCodecID codec = AV_CODEC_ID_AAC;
        int rate = 48000;
        int channels = 2;
        std::int64_t bitRate = 0; ///< bits a second; of no concern where nothing is lost
        int bits = 16;            ///< of each sample, where nothing is lost: 16 or 24
        Purpose purpose = Purpose::Tracks;
    };

    static base::Result<std::unique_ptr<SoundEncoder>> open(const Settings& settings);

    /// Of AAC as we encode it: twice what is said to be transparent, because sound is encoded once more where it goes.
    static constexpr std::int64_t kBitsForChannel = 128'000;
    /// The most that a packet of AAC may take.
    static std::int64_t mostBits(int rate, int channels);

    /// How many samples each send() must bring, but for the last.
    int frameSize() const
    {
        m_affinity.assertHere();
        return m_context->frame_size;
    }
    int rate() const
    {
        m_affinity.assertHere();
        return m_context->sample_rate;
    }
    /// How many samples the first packet begins before the first that was sent.
    int priming() const
    {
        m_affinity.assertHere();
        return m_context->initial_padding;
    }
    base::Result<void> describe(AVCodecParameters& parameters) const;

    /// A frame of `count` samples of `planes`, from `from` on, which is shown at `pts` (in samples).
    int send(const Planes& planes, std::size_t from, int count, std::int64_t pts);
    int finish()
    {
        m_affinity.assertHere();
        return avcodec_send_frame(m_context.get(), nullptr);
    }
    /// False when there is none yet, or none left.
    bool receive(AVPacket& packet)
    {
        m_affinity.assertHere();
        return avcodec_receive_packet(m_context.get(), &packet) >= 0;
    }
    /// What its owner calls last before another thread goes on with it.
    void detach() { m_affinity.detach(); }

private:
    SoundEncoder(Owned<AVCodecContext> context, int bits)
        : m_context(std::move(context)), m_frame(newFrame()), m_bits(bits)
    {
    }

    base::Affinity m_affinity;
    Owned<AVCodecContext> m_context;
    Owned<AVFrame> m_frame;
    int m_bits;
};

} // namespace ffmpeg
