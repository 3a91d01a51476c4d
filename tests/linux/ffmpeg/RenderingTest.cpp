#include "support/EngineTest.h"

extern "C" {
#include <libavutil/mastering_display_metadata.h>
}

#include <array>
#include <cmath>

namespace {

using Quality = platform::VideoFrame::Quality;

class Rendering : public tests::EngineTest {
protected:
    void expectColours(const std::string& name, Quality quality, int tolerance)
    {
        ASSERT_EQ(open(movie(name)), Status::ReadyToPlay);
        const auto pixels = tests::pixelsOf(*player->currentFrame(), 640, 360, quality);
        constexpr std::array<std::array<int, 3>, 6> kColours{
            {{255, 0, 0}, {0, 255, 0}, {0, 0, 255}, {255, 255, 255}, {128, 128, 128}, {0, 0, 0}}};
        for (std::size_t i = 0; i < kColours.size(); ++i) {
            const auto* pixel = pixels.at(106 + 212 * static_cast<int>(i % 3), 90 + 180 * static_cast<int>(i / 3));
            for (std::size_t c = 0; c < 3; ++c)
                EXPECT_NEAR(pixel[2 - c], kColours[i][c], tolerance) << name << " patch " << i << " channel " << c;
            EXPECT_EQ(pixel[3], 255);
        }
    }
};

TEST_F(Rendering, ColoursFollowTheMovieMatrixAndRange)
{
    for (const auto* name : {"bars-709.mp4", "bars-601.mp4", "bars-full.mp4"}) {
        expectColours(name, Quality::Exact, 3);
        expectColours(name, Quality::Fast, 4);
    }
}

TEST_F(Rendering, TurnedMoviesStandUpright)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    const auto flat = tests::pixelsOf(*player->currentFrame(), 640, 360);
    ASSERT_EQ(open(movie("rotated.mp4")), Status::ReadyToPlay);
    const auto left = tests::pixelsOf(*player->currentFrame(), 360, 640);
    ASSERT_EQ(open(movie("rotated-clockwise.mp4")), Status::ReadyToPlay);
    const auto right = tests::pixelsOf(*player->currentFrame(), 360, 640);
    for (int y = 4; y < 360; y += 31) {
        for (int x = 4; x < 640; x += 29) {
            // A quarter turn counterclockwise takes the top right corner to the top left.
            ASSERT_NEAR(left.luma(y, 639 - x), flat.luma(x, y), 2) << x << ", " << y;
            ASSERT_NEAR(right.luma(359 - y, x), flat.luma(x, y), 2) << x << ", " << y;
        }
    }
}

TEST_F(Rendering, AnySizeIsDrawnWithinItsRows)
{
    ASSERT_EQ(open(movie("rotated.mp4")), Status::ReadyToPlay);
    const auto frame = player->currentFrame();
    for (const auto& [width, height] : {std::pair{1, 1}, {3, 7}, {45, 80}, {333, 77}, {1080, 1920}}) {
        const std::ptrdiff_t stride = width * 4 + 20;
        std::vector<std::uint8_t> bytes(static_cast<std::size_t>(stride * height), 77);
        ASSERT_TRUE(frame->render(bytes.data(), stride, width, height, Quality::Fast)) << width;
        for (int y = 0; y < height; ++y)
            for (std::ptrdiff_t x = width * 4; x < stride; ++x)
                ASSERT_EQ(bytes[static_cast<std::size_t>(y * stride + x)], 77);
    }
}

TEST_F(Rendering, ImpossibleSizesAreRefused)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    std::vector<std::uint8_t> bytes(64);
    EXPECT_FALSE(player->currentFrame()->render(bytes.data(), 16, 0, 4, Quality::Fast));
    EXPECT_FALSE(player->currentFrame()->render(bytes.data(), 16, 4, -1, Quality::Fast));
    EXPECT_FALSE(player->currentFrame()->render(bytes.data(), 8, 4, 4, Quality::Fast));
    EXPECT_FALSE(player->currentFrame()->render(nullptr, 16, 4, 4, Quality::Fast));
}

TEST_F(Rendering, AReducedPictureLooksTheSame)
{
    ASSERT_EQ(open(movie("bars-709.mp4")), Status::ReadyToPlay);
    const auto full = std::dynamic_pointer_cast<const ffmpeg::DecodedFrame>(player->currentFrame());
    const auto small = ffmpeg::DecodedFrame::reduced(full, 320);
    ASSERT_TRUE(small);
    EXPECT_TRUE(small->isReduced());
    EXPECT_LT(small->byteCount() * 2, full->byteCount());
    EXPECT_EQ(small->displaySize(), full->displaySize());
    const auto a = tests::pixelsOf(*full, 640, 360);
    const auto b = tests::pixelsOf(*small, 640, 360);
    for (int row = 0; row < 2; ++row)
        for (int column = 0; column < 3; ++column)
            for (int c = 0; c < 4; ++c)
                EXPECT_NEAR(a.at(106 + 212 * column, 90 + 180 * row)[c], b.at(106 + 212 * column, 90 + 180 * row)[c],
                            3);
    EXPECT_EQ(ffmpeg::DecodedFrame::reduced(full, 960), full);
}

/// A picture of one colour, of 10 bits a channel: the codes of limited range.
std::shared_ptr<const ffmpeg::DecodedFrame> picture(AVColorTransferCharacteristic transfer, int y, int u, int v)
{
    auto frame = ffmpeg::newFrame();
    frame->format = AV_PIX_FMT_YUV420P10;
    frame->width = 64;
    frame->height = 32;
    frame->color_trc = transfer;
    frame->color_primaries = AVCOL_PRI_BT2020;
    frame->colorspace = AVCOL_SPC_BT2020_NCL;
    frame->color_range = AVCOL_RANGE_MPEG;
    EXPECT_GE(av_frame_get_buffer(frame.get(), 0), 0);
    const std::array<int, 3> codes{y, u, v};
    for (std::size_t plane = 0; plane < 3; ++plane)
        for (int row = 0; row < (plane ? 16 : 32); ++row)
            std::fill_n(reinterpret_cast<std::uint16_t*>(frame->data[plane] + row * frame->linesize[plane]),
                        plane ? 32 : 64, static_cast<std::uint16_t>(codes[plane]));
    return std::make_shared<ffmpeg::DecodedFrame>(std::move(frame), 0, base::MediaTime::make(0, 30),
                                                  ffmpeg::Orientation{}, AVRational{1, 1});
}

std::array<int, 3> shown(const ffmpeg::DecodedFrame& frame, Quality quality)
{
    const auto pixels = tests::pixelsOf(frame, 40, 20, quality);
    const auto* pixel = pixels.at(20, 10);
    return {pixel[2], pixel[1], pixel[0]};
}

// PQ codes a page's white, 203 candelas, as 0.58, half of it as 0.51, and a peak of 1000 as 0.75. HLG codes it as 0.75.
TEST(HighDynamicRange, IsBroughtToThatOfTheScreen)
{
    for (const Quality quality : {Quality::Exact, Quality::Fast}) {
        const auto code = [](double part) { return static_cast<int>(std::lround(64 + part * 876)); };
        const auto grey = [&](AVColorTransferCharacteristic transfer, double part) {
            const auto colour = shown(*picture(transfer, code(part), 512, 512), quality);
            EXPECT_NEAR(colour[0], colour[1], 1);
            EXPECT_NEAR(colour[2], colour[1], 1);
            return colour[1];
        };
        EXPECT_EQ(grey(AVCOL_TRC_SMPTE2084, 0), 0);
        EXPECT_NEAR(grey(AVCOL_TRC_SMPTE2084, 0.5096), 188, 3) << "half of a page's white, as on any screen";
        EXPECT_NEAR(grey(AVCOL_TRC_SMPTE2084, 0.5807), 226, 3) << "a page";
        EXPECT_NEAR(grey(AVCOL_TRC_SMPTE2084, 0.7518), 255, 1) << "the peak";
        EXPECT_EQ(grey(AVCOL_TRC_SMPTE2084, 1), 255);
        EXPECT_EQ(grey(AVCOL_TRC_ARIB_STD_B67, 0), 0);
        EXPECT_NEAR(grey(AVCOL_TRC_ARIB_STD_B67, 0.75), 226, 4) << "a page";
        EXPECT_NEAR(grey(AVCOL_TRC_ARIB_STD_B67, 1), 255, 1);
    }
}

TEST(HighDynamicRange, KeepsTheColoursOfTheScreen)
{
    // The screen's red at half of a page's white, (0.627, 0.069, 0.016) of that in wide primaries.
    const auto red = shown(*picture(AVCOL_TRC_SMPTE2084, 342, 446, 601), Quality::Exact);
    EXPECT_GT(red[0], 170);
    EXPECT_LT(red[1], 40);
    EXPECT_LT(red[2], 40);
}

TEST(HighDynamicRange, LooksTheSameInAReducedPicture)
{
    const auto full = picture(AVCOL_TRC_SMPTE2084, 500, 480, 540);
    const auto small = ffmpeg::DecodedFrame::reduced(full, 32);
    ASSERT_TRUE(small && small->isReduced());
    const auto a = shown(*full, Quality::Exact);
    const auto b = shown(*small, Quality::Exact);
    for (std::size_t c = 0; c < 3; ++c)
        EXPECT_NEAR(a[c], b[c], 5);
}

TEST(HighDynamicRange, GoesUpToThePeakThatTheMovieTellsOf)
{
    const auto grey = [](int peak, bool isOfDisplay) {
        // 400 candelas.
        auto frame = ffmpeg::Owned<AVFrame>(av_frame_clone(&picture(AVCOL_TRC_SMPTE2084, 636, 512, 512)->picture()));
        if (isOfDisplay)
            *av_mastering_display_metadata_create_side_data(frame.get()) = {{}, {}, {0, 1}, {peak, 1}, 0, peak > 0};
        else
            av_content_light_metadata_create_side_data(frame.get())->MaxCLL = static_cast<unsigned>(peak);
        const ffmpeg::DecodedFrame made(std::move(frame), 0, base::MediaTime::make(0, 30), ffmpeg::Orientation{},
                                        {1, 1});
        return shown(made, Quality::Exact)[1];
    };
    for (const bool isOfDisplay : {false, true}) {
        const int usual = grey(0, isOfDisplay);
        EXPECT_EQ(grey(1000, isOfDisplay), usual);
        EXPECT_LT(grey(4000, isOfDisplay), usual - 2) << "there is brighter";
        EXPECT_GT(usual, 235);
        EXPECT_EQ(grey(400, isOfDisplay), 255);
        EXPECT_EQ(grey(1, isOfDisplay), 255) << "which cannot be";
    }
}

TEST(HighDynamicRange, InThePrimariesOfTheScreenIsNotMadeMoreColourful)
{
    const auto colour = [](AVColorPrimaries primaries) {
        auto frame = ffmpeg::Owned<AVFrame>(av_frame_clone(&picture(AVCOL_TRC_SMPTE2084, 400, 470, 560)->picture()));
        frame->color_primaries = primaries;
        const ffmpeg::DecodedFrame made(std::move(frame), 0, base::MediaTime::make(0, 30), ffmpeg::Orientation{},
                                        {1, 1});
        return shown(made, Quality::Exact);
    };
    const auto wide = colour(AVCOL_PRI_BT2020);
    EXPECT_EQ(colour(AVCOL_PRI_UNSPECIFIED), wide);
    const auto usual = colour(AVCOL_PRI_BT709);
    EXPECT_LT(usual[0], wide[0] - 5);
    EXPECT_GT(usual[2], wide[2] + 5);
}

TEST(HighDynamicRange, WithoutAMatrixHasItsUsualOne)
{
    const auto tagged = picture(AVCOL_TRC_ARIB_STD_B67, 400, 470, 560);
    auto frame = ffmpeg::Owned<AVFrame>(av_frame_clone(&tagged->picture()));
    frame->colorspace = AVCOL_SPC_UNSPECIFIED;
    const ffmpeg::DecodedFrame untagged(std::move(frame), 0, base::MediaTime::make(0, 30), ffmpeg::Orientation{},
                                        {1, 1});
    EXPECT_EQ(shown(untagged, Quality::Exact), shown(*tagged, Quality::Exact));
}

TEST(AReducedPicture, KeepsItsMatrix)
{
    for (const AVColorSpace matrix : {AVCOL_SPC_BT709, AVCOL_SPC_SMPTE170M, AVCOL_SPC_BT470BG, AVCOL_SPC_SMPTE240M,
                                      AVCOL_SPC_FCC, AVCOL_SPC_BT2020_NCL, AVCOL_SPC_UNSPECIFIED}) {
        auto frame = ffmpeg::Owned<AVFrame>(av_frame_clone(&picture(AVCOL_TRC_BT709, 500, 600, 580)->picture()));
        frame->colorspace = matrix;
        const auto full = std::make_shared<ffmpeg::DecodedFrame>(std::move(frame), 0, base::MediaTime::make(0, 30),
                                                                 ffmpeg::Orientation{}, AVRational{1, 1});
        const auto a = shown(*full, Quality::Exact);
        const auto b = shown(*ffmpeg::DecodedFrame::reduced(full, 32), Quality::Exact);
        for (std::size_t c = 0; c < 3; ++c)
            EXPECT_NEAR(a[c], b[c], 2) << av_color_space_name(matrix) << " channel " << c;
    }
}

TEST(Palettes, KeepTheirColoursAtEverySize)
{
    constexpr std::array<int, 3> kGreen{0, 182, 0};
    for (const AVPixelFormat format : {AV_PIX_FMT_PAL8, AV_PIX_FMT_RGB8}) {
        auto frame = ffmpeg::newFrame();
        frame->format = format;
        frame->width = 1280;
        frame->height = 720; // high definition has another matrix
        ASSERT_GE(av_frame_get_buffer(frame.get(), 0), 0);
        const bool hasPalette = format == AV_PIX_FMT_PAL8;
        constexpr std::uint8_t kGreenOfRgb8 = 5 << 2;
        for (int y = 0; y < frame->height; ++y)
            std::fill_n(frame->data[0] + y * frame->linesize[0], frame->width, hasPalette ? 7 : kGreenOfRgb8);
        if (hasPalette)
            reinterpret_cast<std::uint32_t*>(frame->data[1])[7] = 0xff00b600;
        const auto full = std::make_shared<ffmpeg::DecodedFrame>(std::move(frame), 0, base::MediaTime::make(0, 30),
                                                                 ffmpeg::Orientation{}, AVRational{1, 1});
        for (const auto& each :
             {std::shared_ptr<const ffmpeg::DecodedFrame>(full), ffmpeg::DecodedFrame::reduced(full, 320)}) {
            const auto colour = shown(*each, Quality::Exact);
            for (std::size_t c = 0; c < 3; ++c)
                EXPECT_NEAR(colour[c], kGreen[c], 3) << av_get_pix_fmt_name(format) << " channel " << c;
        }
    }
}

} // namespace
