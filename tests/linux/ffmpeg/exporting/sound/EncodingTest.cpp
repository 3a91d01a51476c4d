// A track that is encoded in pieces, on all cores, has the packets' times of one that is encoded from its start to its
// end, and sounds as good.
#include "DecodedSound.h"
#include "SoundFiles.h"

#include "linux/ffmpeg/exporting/sound/ChunkedEncoder.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

using namespace tests;

/// Gives a formula's samples.
class Formula final : public ffmpeg::SampleSource {
public:
    Formula(Signal signal, std::int64_t length) : m_signal(std::move(signal)), m_length(length) {}
    int rate() const override { return 48000; }
    int channels() const override { return 2; }
    int read(ffmpeg::Planes& into, int count) override
    {
        into.resize(2);
        const auto got = std::min<std::int64_t>(count, m_length - m_at);
        for (std::int64_t i = 0; i < got; ++i, ++m_at)
            for (int channel = 0; channel < 2; ++channel)
                into[static_cast<std::size_t>(channel)].push_back(
                    static_cast<float>(m_signal(static_cast<double>(m_at) / 48000, channel)));
        return static_cast<int>(got);
    }

private:
    Signal m_signal;
    std::int64_t m_length;
    std::int64_t m_at = 0;
};

struct Encoded {
    std::vector<std::int64_t> times;              ///< of the packets, in samples
    std::vector<std::vector<std::uint8_t>> bytes; ///< of each
    std::vector<float> sound[2];                  ///< decoded; it begins with the encoder's priming
};

constexpr std::int64_t kPriming = 1024; // samples

Encoded encodeIn(std::int64_t framesInChunk, std::int64_t length)
{
    Encoded result;
    auto encoder = ffmpeg::ChunkedEncoder::open(std::make_unique<Formula>(speechLike(0.5), length), 256000,
                                                {framesInChunk, 2}, nullptr);
    EXPECT_TRUE(encoder);
    const AVCodec* codec = avcodec_find_decoder(AV_CODEC_ID_AAC);
    ffmpeg::Owned<AVCodecContext> decoder(avcodec_alloc_context3(codec));
    AVCodecParameters* parameters = avcodec_parameters_alloc();
    EXPECT_TRUE(encoder.value()->model().describe(*parameters));
    avcodec_parameters_to_context(decoder.get(), parameters);
    avcodec_parameters_free(&parameters);
    EXPECT_GE(avcodec_open2(decoder.get(), codec, nullptr), 0);
    const auto packet = ffmpeg::newPacket();
    const auto frame = ffmpeg::newFrame();
    for (;;) {
        const auto more = encoder.value()->next(*packet);
        EXPECT_TRUE(more);
        if (!more || !more.value())
            return result;
        result.times.push_back(packet->pts);
        result.bytes.emplace_back(packet->data, packet->data + packet->size);
        avcodec_send_packet(decoder.get(), packet.get());
        while (avcodec_receive_frame(decoder.get(), frame.get()) >= 0)
            for (int channel = 0; channel < 2; ++channel) {
                const auto* samples = reinterpret_cast<const float*>(frame->extended_data[channel]);
                result.sound[channel].insert(result.sound[channel].end(), samples, samples + frame->nb_samples);
            }
    }
}

/// How far what was encoded is from the formula, at its worst in some 5 ms between two samples of the formula; in decibels.
double worstError(const Encoded& encoded, const Signal& wanted, std::int64_t from, std::int64_t until)
{
    constexpr std::int64_t kWindow = 240;
    double worst = 0;
    for (int channel = 0; channel < 2; ++channel)
        for (std::int64_t begin = from; begin + kWindow <= until; begin += kWindow) {
            double sum = 0;
            for (std::int64_t i = begin; i < begin + kWindow; ++i) {
                const auto got = static_cast<double>(encoded.sound[channel][static_cast<std::size_t>(kPriming + i)]);
                sum += std::pow(got - wanted(static_cast<double>(i) / 48000, channel), 2);
            }
            worst = std::max(worst, std::sqrt(sum / kWindow));
        }
    return decibels(worst);
}

// Its encoders' states come close to that of one encoder, no more: a packet in five or so has other bytes.
TEST(ChunkedEncoding, HasTheTimesOfOneEncoderAndSoundsLikeItAtEachSeam)
{
    constexpr std::int64_t kFramesInChunk = 100;
    constexpr std::int64_t kChunk = kFramesInChunk * 1024;
    const auto wanted = speechLike(0.5);
    for (const std::int64_t length : {480000, 480001, 300 * 1024, 301 * 1024 - 1, 1000, 0}) {
        SCOPED_TRACE(length);
        const auto whole = encodeIn(100000, length);
        const auto chunked = encodeIn(kFramesInChunk, length);
        EXPECT_EQ(chunked.times, whole.times);
        for (std::size_t i = 0; i < whole.times.size(); ++i)
            ASSERT_EQ(whole.times[i], static_cast<std::int64_t>(i) * 1024 - kPriming);
        ASSERT_EQ(whole.times.empty(), length == 0);
        for (std::size_t i = 0; i < std::min<std::size_t>(kFramesInChunk, whole.bytes.size()); ++i)
            ASSERT_EQ(chunked.bytes[i], whole.bytes[i]) << "the first chunk has heard nothing else, packet " << i;
        ASSERT_EQ(chunked.sound[0].size(), whole.sound[0].size());
        EXPECT_NEAR(worstError(chunked, wanted, 0, length), worstError(whole, wanted, 0, length), 1);
        for (std::int64_t seam = kChunk; seam < length; seam += kChunk) {
            const std::int64_t until = std::min(length, seam + 2048);
            // Where the sound ends within a frame of the seam both are off by more, and differ by some 4 dB; a seam that was
            // not prepared is off at -30 dB.
            EXPECT_LE(worstError(chunked, wanted, seam - 2048, until),
                      std::max(worstError(whole, wanted, seam - 2048, until) + 1, -55.0))
                << "at the seam at " << seam;
        }
    }
}

TEST(ChunkedEncoding, SharesTheWorkEvenlyAndKeepsTheMemorySmall)
{
    const auto tenMinutes = ffmpeg::ChunkedEncoder::plan(600 * 48000, 48000, 2, 1);
    EXPECT_LE(tenMinutes.framesInChunk * 1024, 60 * 48000 + 1024);
    EXPECT_EQ((600 * 48000 / 1024 + 1 + tenMinutes.framesInChunk) / tenMinutes.framesInChunk % 2, 0);
    EXPECT_LE(ffmpeg::ChunkedEncoder::plan(3600 * 48000, 48000, 2, 16).framesInChunk * 1024, 10 * 48000);
    EXPECT_GE(ffmpeg::ChunkedEncoder::plan(48000, 48000, 64, 1).framesInChunk * 1024, 9 * 48000);
}

} // namespace
