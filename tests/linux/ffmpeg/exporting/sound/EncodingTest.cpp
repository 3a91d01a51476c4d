// A track that is encoded in pieces, on all cores, is the same as one that is encoded from its start to its end.
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

struct Packets {
    std::vector<std::int64_t> times;
    std::vector<float> sound;
};

Packets encodeIn(std::int64_t framesInChunk, std::int64_t length)
{
    Packets result;
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
        avcodec_send_packet(decoder.get(), packet.get());
        while (avcodec_receive_frame(decoder.get(), frame.get()) >= 0) {
            const auto* samples = reinterpret_cast<const float*>(frame->extended_data[0]);
            result.sound.insert(result.sound.end(), samples, samples + frame->nb_samples);
        }
    }
}

TEST(ChunkedEncoding, HasThePacketsOfOneEncoderAndNoSeam)
{
    for (const std::int64_t length : {480000, 480001, 300 * 1024, 301 * 1024 - 1, 1000, 0}) {
        SCOPED_TRACE(length);
        const auto whole = encodeIn(100000, length);
        const auto chunked = encodeIn(100, length);
        EXPECT_EQ(chunked.times, whole.times);
        if (length > 0) {
            ASSERT_FALSE(whole.times.empty());
            EXPECT_EQ(whole.times.front(), -1024);
        }
        ASSERT_EQ(chunked.sound.size(), whole.sound.size());
        const auto wanted = speechLike(0.5);
        // Nowhere is it farther from the sound than one encoder is anywhere.
        double worst[2] = {0, 0};
        for (std::size_t at = 1024;
             at + 240 <= std::min<std::size_t>(whole.sound.size(), 1024 + static_cast<std::size_t>(length));
             at += 240) {
            double sum[2] = {0, 0};
            for (std::size_t i = at; i < at + 240; ++i) {
                const double truth = wanted(static_cast<double>(i - 1024) / 48000, 0);
                sum[0] += std::pow(static_cast<double>(whole.sound[i]) - truth, 2);
                sum[1] += std::pow(static_cast<double>(chunked.sound[i]) - truth, 2);
            }
            worst[0] = std::max(worst[0], std::sqrt(sum[0] / 240));
            worst[1] = std::max(worst[1], std::sqrt(sum[1] / 240));
        }
        EXPECT_LT(decibels(worst[1]), decibels(worst[0]) + 1);
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
