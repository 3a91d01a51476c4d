#include "linux/ffmpeg/bitstream/HdrMetadata.h"

#include <gtest/gtest.h>

namespace {

using ffmpeg::HdrMetadata;

class Light : public testing::Test {
protected:
    Light() { of(*stream) = {700, 200}; }

    static AVContentLightMetadata& of(AVStream& stream)
    {
        constexpr auto kKind = AV_PKT_DATA_CONTENT_LIGHT_LEVEL;
        return *reinterpret_cast<AVContentLightMetadata*>(
            av_stream_new_side_data(&stream, kKind, sizeof(AVContentLightMetadata)));
    }

    ffmpeg::Owned<AVFormatContext> context{avformat_alloc_context()};
    AVStream* stream = avformat_new_stream(context.get(), nullptr);
    ffmpeg::Owned<AVFrame> picture = ffmpeg::newFrame();
};

TEST_F(Light, IsWhatTheFileSaysWhereThePictureSaysNothing)
{
    const auto found = HdrMetadata::of(*stream, *picture);
    ASSERT_TRUE(found.light);
    EXPECT_EQ(found.light->MaxCLL, 700U);
    EXPECT_EQ(found.light->MaxFALL, 200U);
    EXPECT_FALSE(found.display);
}

TEST_F(Light, IsWhatThePictureSaysWhereBothDo)
{
    av_content_light_metadata_create_side_data(picture.get())->MaxCLL = 900;
    EXPECT_EQ(HdrMetadata::of(*stream, *picture).light->MaxCLL, 900U);
}

TEST_F(Light, OfADisplayOfWhichOnlyHalfIsSaidIsNotSaid)
{
    av_mastering_display_metadata_create_side_data(picture.get())->has_luminance = 1;
    EXPECT_FALSE(HdrMetadata::of(*stream, *picture).display);
}

} // namespace
