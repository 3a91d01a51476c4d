// What a movie of a high dynamic range says of its light is said of every picture of its exports.
#include "linux/ffmpeg/bitstream/HdrMetadata.h"
#include "linux/ffmpeg/exporting/CutsTest.h"

namespace tests {
namespace {

/// Of a picture, or of the file where no picture is given, in the units of HEVC; empty when nothing is said.
std::vector<long> lightOf(const AVStream& stream, const AVFrame* picture)
{
    std::vector<long> all;
    const auto add = [&](AVRational value, double unit) { all.push_back(std::lround(av_q2d(value) * unit)); };
    const auto find = [&](AVFrameSideDataType inPicture, AVPacketSideDataType inStream) -> const std::uint8_t* {
        const AVFrameSideData* data = picture ? av_frame_get_side_data(picture, inPicture) : nullptr;
        return picture ? (data ? data->data : nullptr) : av_stream_get_side_data(&stream, inStream, nullptr);
    };
    if (const auto* data = find(AV_FRAME_DATA_MASTERING_DISPLAY_METADATA, AV_PKT_DATA_MASTERING_DISPLAY_METADATA)) {
        const auto& display = *reinterpret_cast<const AVMasteringDisplayMetadata*>(data);
        for (const auto& primary : display.display_primaries)
            for (const AVRational each : primary)
                add(each, 1000);
        for (const AVRational each : display.white_point)
            add(each, 1000);
        add(display.max_luminance, 1);
        add(display.min_luminance, 1000);
    }
    if (const auto* data = find(AV_FRAME_DATA_CONTENT_LIGHT_LEVEL, AV_PKT_DATA_CONTENT_LIGHT_LEVEL)) {
        const auto& light = *reinterpret_cast<const AVContentLightMetadata*>(data);
        all.insert(all.end(), {long(light.MaxCLL), long(light.MaxFALL)});
    }
    return all;
}

const std::vector<long> kLight{680, 320, 265, 690, 150, 60, 313, 329, 1000, 5, 1000, 400};

class Light : public CutsTest {
protected:
    /// In every picture and in the file's header.
    void expectLight(const std::string& path)
    {
        DecodedMovie decoded(path);
        EXPECT_EQ(lightOf(decoded.stream(), nullptr), kLight);
        EXPECT_EQ(decoded.stream().codecpar->color_trc, AVCOL_TRC_SMPTE2084);
        EXPECT_EQ(decoded.stream().codecpar->color_primaries, AVCOL_PRI_BT2020);
        int picture = 0;
        decoded.everyFrame([&](const AVFrame& frame) {
            EXPECT_EQ(lightOf(decoded.stream(), &frame), kLight) << "picture " << picture;
            EXPECT_EQ(av_pix_fmt_desc_get(AVPixelFormat(frame.format))->comp[0].depth, 10);
            ++picture;
        });
        EXPECT_GT(picture, 10);
    }
    void checkFile() override { expectLight(output()); }
};

TEST_F(Light, IsKeptWhereAHeadIsEncoded)
{
    for (const char* name : {"hdr10.mp4", "hdr10-header.mkv", "hdr10-av1.mp4"}) {
        SCOPED_TRACE(name);
        sounds.clear();
        ASSERT_NO_FATAL_FAILURE(take(exportMovie(name)));
        cutAndCheck(0.4, 2.7);
        cutAndCheck(1.5, 3);
    }
    EXPECT_GT(copies, 60);
    EXPECT_FALSE(saysEncodedAsAWhole());
}

TEST_F(Light, IsKeptWhereNothingIsCut)
{
    for (const char* name : {"hdr10.mp4", "hdr10-header.mkv", "hdr10-av1.mp4"}) {
        SCOPED_TRACE(name);
        ASSERT_EQ(cut(exportMovie(name), output(), std::nullopt), ExportStatus::Completed) << errorText();
        expectLight(output());
        std::filesystem::remove(output());
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

TEST_F(Light, IsKeptWhereAllIsEncoded)
{
    for (const char* name : {"hdr10.mp4", "hdr10-header.mkv", "hdr10-av1.mp4"}) {
        SCOPED_TRACE(name);
        ASSERT_NO_FATAL_FAILURE(take(exportMovie(name)));
        cutAndCheck(0.1, 0.8);
    }
    EXPECT_TRUE(saysEncodedAsAWhole());
    ASSERT_EQ(cut(exportMovie("hdr10-av1.mp4"), output(), fromTo(0.1, 0.8)), ExportStatus::Completed);
    EXPECT_EQ(DecodedMovie(output()).stream().codecpar->codec_id, AV_CODEC_ID_HEVC);
}

} // namespace
} // namespace tests
