// RGB and palettes keep their colours: what is encoded says how it was converted, and what is copied stays RGB.
#include "linux/ffmpeg/exporting/CutsTest.h"

namespace tests {
namespace {

using Colour = std::array<int, 3>;

class Colours : public CutsTest {
protected:
    /// As RGB, by what the file itself says and by nothing else.
    static std::vector<std::uint8_t> rgbOf(const AVFrame& frame)
    {
        const ffmpeg::Owned<SwsContext> context(sws_getContext(
            frame.width, frame.height, AVPixelFormat(frame.format), frame.width, frame.height, AV_PIX_FMT_RGB24,
            SWS_BICUBIC | SWS_ACCURATE_RND | SWS_FULL_CHR_H_INT, nullptr, nullptr, nullptr));
        // Who is not told takes the matrix of standard definition for a picture as small as these.
        const int matrix = frame.colorspace == AVCOL_SPC_UNSPECIFIED ? SWS_CS_ITU601 : frame.colorspace;
        const int* table = sws_getCoefficients(matrix);
        const int isFull = frame.color_range == AVCOL_RANGE_JPEG;
        sws_setColorspaceDetails(context.get(), table, isFull, table, isFull, 0, 1 << 16, 1 << 16);
        std::vector<std::uint8_t> rgb(std::size_t(frame.width) * std::size_t(frame.height) * 3);
        std::uint8_t* const to[] = {rgb.data()};
        const int stride[] = {frame.width * 3};
        sws_scale(context.get(), frame.data, frame.linesize, 0, frame.height, to, stride);
        return rgb;
    }
    static std::vector<std::vector<std::uint8_t>> allOf(const std::string& path)
    {
        std::vector<std::vector<std::uint8_t>> all;
        DecodedMovie(path).everyFrame([&](const AVFrame& frame) { all.push_back(rgbOf(frame)); });
        return all;
    }
};

TEST_F(Colours, OfRgbAndPalettesStayWhereAllIsEncoded)
{
    constexpr std::array<Colour, 6> kPatches{
        {{0, 180, 0}, {200, 30, 30}, {20, 40, 210}, {240, 240, 240}, {224, 192, 32}, {16, 16, 16}}};
    for (const char* name : {"patches-rgb.mov", "patches-palette.mov"}) {
        ASSERT_EQ(cut(exportMovie(name), output(), std::nullopt), ExportStatus::Completed) << errorText();
        const auto pictures = allOf(output());
        ASSERT_EQ(pictures.size(), 15U);
        for (const auto& picture : {pictures.front(), pictures.back()})
            for (std::size_t i = 0; i < kPatches.size(); ++i)
                for (std::size_t c = 0; c < 3; ++c)
                    EXPECT_NEAR(picture[((45 + 90 * (i / 3)) * 320 + 53 + 106 * (i % 3)) * 3 + c], kPatches[i][c], 3)
                        << name << " patch " << i << " channel " << c;
        std::filesystem::remove(output());
    }
}

TEST_F(Colours, OfRgbAreJoinedWithTheirOwnKind)
{
    for (const char* name : {"rgb-h264.mp4", "rgb-hevc.mp4", "rgb-vp9.webm"}) {
        SCOPED_TRACE(name);
        ASSERT_NO_FATAL_FAILURE(take(exportMovie(name)));
        copies = 0;
        cutAndCheck(0.4, 1.9);
        EXPECT_GE(copies, 30);
        ASSERT_EQ(cut(movie, output(), fromTo(0.4, 1.9)), ExportStatus::Completed) << errorText();
        const auto before = allOf(movie);
        const auto after = allOf(output());
        ASSERT_EQ(after.size(), 45U);
        for (std::size_t i = 0; i < after.size(); ++i) {
            double sum = 0;
            for (std::size_t k = 0; k < after[i].size(); ++k)
                sum += std::pow(double(after[i][k]) - before[i + 12][k], 2);
            EXPECT_LT(sum / double(after[i].size()), 4) << "picture " << i; // 42 dB
        }
        DecodedMovie(output()).everyFrame([](const AVFrame& frame) {
            EXPECT_EQ(frame.format, AV_PIX_FMT_GBRP);
            EXPECT_EQ(frame.color_range, AVCOL_RANGE_JPEG);
        });
        std::filesystem::remove(output());
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

} // namespace
} // namespace tests
