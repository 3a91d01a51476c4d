// What is encoded to stand before copied pictures, at the quality and in the formats that exporting asks for.
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/video/Splicer.h"

#include <random>

namespace tests {
namespace {

struct Closing {
    void operator()(AVFormatContext* context) const { avformat_free_context(context); }
};

class Heads : public testing::Test {
protected:
    /// A picture of noise, the hardest there is: encoders need more room for it than it takes itself.
    static ffmpeg::Owned<AVFrame> noise(AVPixelFormat format, int width, int height)
    {
        auto picture = ffmpeg::newFrame();
        picture->format = format;
        picture->width = width;
        picture->height = height;
        EXPECT_GE(av_frame_get_buffer(picture.get(), 0), 0);
        const AVPixFmtDescriptor& about = *av_pix_fmt_desc_get(format);
        const int depth = about.comp[0].depth;
        std::minstd_rand random(7);
        for (int plane = 0; plane < av_pix_fmt_count_planes(format); ++plane) {
            const int rows = plane ? AV_CEIL_RSHIFT(height, about.log2_chroma_h) : height;
            for (int y = 0; y < rows; ++y) {
                std::uint8_t* row = picture->data[plane] + std::ptrdiff_t(y) * picture->linesize[plane];
                for (int x = 0; x < picture->linesize[plane]; ++x) {
                    const bool isHighByte = depth > 8 && x % 2 == 1;
                    row[x] = std::uint8_t((random() >> 8) & (isHighByte ? (1U << (depth - 8)) - 1 : 255U));
                }
            }
        }
        return picture;
    }

    /// How many pictures come out of two.
    static int encode(AVCodecID codec, AVPixelFormat format, int width, int height)
    {
        const std::unique_ptr<AVFormatContext, Closing> context(avformat_alloc_context());
        AVStream& stream = *avformat_new_stream(context.get(), nullptr);
        stream.codecpar->codec_id = codec;
        if (codec == AV_CODEC_ID_AV1)
            ffmpeg::setExtradata(*stream.codecpar, ffmpeg::Bytes{0x0A, 0}); // any header
        const auto picture = noise(format, width, height);
        const auto splicer = ffmpeg::Splicer::make(stream, *picture);
        if (!splicer)
            return -1;
        auto request = ffmpeg::EncoderRequest::like(stream, *picture, {1, 90000});
        request.threads = 4;
        if (!splicer.value()->prepare(request, 0))
            return -1;
        const auto encoder = ffmpeg::PictureEncoder::open(request);
        if (!encoder)
            return -1;
        EXPECT_TRUE(encoder.value()->encode(*picture, 0, 3000));
        EXPECT_TRUE(encoder.value()->encode(*noise(format, width, height), 3000, 3000));
        EXPECT_TRUE(encoder.value()->finish());
        int count = 0;
        while (encoder.value()->take())
            ++count;
        return count;
    }
};

TEST_F(Heads, OfVp9HoldNoiseInEveryFormat)
{
    for (const AVPixelFormat format :
         {AV_PIX_FMT_YUV420P, AV_PIX_FMT_YUV422P, AV_PIX_FMT_YUV444P, AV_PIX_FMT_GBRP, AV_PIX_FMT_YUV420P12,
          AV_PIX_FMT_YUV422P10, AV_PIX_FMT_YUV444P12, AV_PIX_FMT_GBRP10})
        EXPECT_EQ(encode(AV_CODEC_ID_VP9, format, 640, 360), 2) << av_get_pix_fmt_name(format);
    // So wide that there is more than one column of tiles in any case.
    EXPECT_EQ(encode(AV_CODEC_ID_VP9, AV_PIX_FMT_YUV444P, 4160, 128), 2);
}

// The encoder writes where nothing is.
TEST_F(Heads, OfAv1WithoutColoursAreNotEncoded)
{
    EXPECT_EQ(encode(AV_CODEC_ID_AV1, AV_PIX_FMT_GRAY8, 320, 180), -1);
    EXPECT_EQ(encode(AV_CODEC_ID_AV1, AV_PIX_FMT_GRAY10, 320, 180), -1);
    EXPECT_EQ(encode(AV_CODEC_ID_AV1, AV_PIX_FMT_YUV444P, 320, 180), 2);
}

} // namespace
} // namespace tests
