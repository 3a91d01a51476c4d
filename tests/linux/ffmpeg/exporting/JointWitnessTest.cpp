// What is remembered of both sides of a joint, and what is believed of an encoder.
#include "linux/ffmpeg/exporting/video/JointWitness.h"
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/video/PictureEncoder.h"

#include <gmock/gmock.h>

namespace tests {
namespace {

using testing::HasSubstr;

class AWitness : public ExportTest {
protected:
    /// All one shade.
    static ffmpeg::Owned<AVFrame> plain(int luma, int chroma = 128)
    {
        auto picture = ffmpeg::newFrame();
        picture->format = AV_PIX_FMT_YUV420P;
        picture->width = 64;
        picture->height = 48;
        EXPECT_GE(av_frame_get_buffer(picture.get(), 0), 0);
        for (int plane = 0; plane < 3; ++plane)
            std::fill_n(picture->data[plane], picture->linesize[plane] * (plane ? 24 : 48),
                        std::uint8_t(plane ? chroma : luma));
        return picture;
    }

    /// Encodes pictures of these shades, of which the witness is shown others, and changes the packets.
    base::Result<std::vector<ffmpeg::Joint>> encode(const std::vector<int>& encoded, const std::vector<int>& shown,
                                                    const std::function<void(AVPacket&)>& change)
    {
        DecodedMovie any(exportMovie("h264.mp4"));
        auto request = ffmpeg::EncoderRequest::like(any.stream(), *plain(0), {1, 30});
        request.encoder = "libx264";
        request.options = {{"preset", "ultrafast"}, {"tune", "zerolatency"}};
        const auto encoder = ffmpeg::PictureEncoder::open(request).value();
        EXPECT_TRUE(m_witness.beginStretch(encoder->context()));
        for (std::size_t i = 0; i < encoded.size(); ++i) {
            m_witness.seePicture(*plain(shown[i]));
            EXPECT_TRUE(encoder->encode(*plain(encoded[i]), std::int64_t(i), 1));
            while (const auto packet = encoder->take()) {
                change(*packet);
                m_witness.seePacket(*packet, packet->flags & AV_PKT_FLAG_KEY);
            }
        }
        return m_witness.joints();
    }

    ffmpeg::JointWitness m_witness;
};

TEST_F(AWitness, BelievesAnEncoderWhosePicturesAreThoseItWasGiven)
{
    const auto joints = encode({40, 120, 200}, {40, 120, 200}, [](AVPacket&) {});
    ASSERT_TRUE(joints) << joints.error()->description();
    ASSERT_EQ(joints.value().size(), 1U);
    EXPECT_EQ(joints.value().front().before.packets, 0);
    EXPECT_EQ(joints.value().front().after.packets, 3);
    EXPECT_EQ(joints.value().front().after.looks.size(), 3U);
}

TEST_F(AWitness, DoesNotBelieveAnEncoderThatMakesOthers)
{
    const auto joints = encode({40, 120, 200}, {40, 40, 200}, [](AVPacket&) {});
    ASSERT_FALSE(joints);
    EXPECT_THAT(joints.error()->description(), HasSubstr("does not look like what it is made of"));
}

TEST_F(AWitness, DoesNotBelieveAnEncoderWhosePicturesNobodyCanDecode)
{
    const auto joints =
        encode({40, 120, 200}, {40, 120, 200}, [](AVPacket& packet) { std::fill_n(packet.data, packet.size, 0); });
    ASSERT_FALSE(joints);
    EXPECT_THAT(joints.error()->description(), HasSubstr("does not look like what it is made of"));
}

TEST_F(AWitness, TellsPicturesOfOtherColoursApart)
{
    EXPECT_EQ(ffmpeg::PictureLook::of(*plain(90)).hash, ffmpeg::PictureLook::of(*plain(90)).hash);
    EXPECT_NE(ffmpeg::PictureLook::of(*plain(90)).hash, ffmpeg::PictureLook::of(*plain(91)).hash);
    EXPECT_NE(ffmpeg::PictureLook::of(*plain(90)).hash, ffmpeg::PictureLook::of(*plain(90, 129)).hash);
}

// Two stretches of the same packets: the joint between them is where the last group of the first meets the second.
TEST_F(AWitness, RemembersTheLastGroupBeforeAJointAndOfEachSideNoPictureThatLacksOneBeforeIt)
{
    DecodedMovie file(exportMovie("h264-pyramid.mp4")); // groups of 20
    std::vector<ffmpeg::Owned<AVPacket>> packets;
    for (auto packet = ffmpeg::newPacket(); av_read_frame(&file.context(), packet.get()) >= 0;
         packet = ffmpeg::newPacket())
        packets.push_back(std::move(packet));
    ASSERT_EQ(packets.size(), 60U);
    for (int stretch = 0; stretch < 2; ++stretch) {
        ASSERT_TRUE(m_witness.beginStretch(*file.stream().codecpar));
        for (const auto& packet : packets)
            m_witness.seePacket(*packet, packet->flags & AV_PKT_FLAG_KEY);
    }
    const auto joints = m_witness.joints();
    ASSERT_TRUE(joints) << joints.error()->description();
    ASSERT_EQ(joints.value().size(), 1U);
    const ffmpeg::Joint& joint = joints.value().front();
    EXPECT_EQ(joint.before.firstPacket, 40);
    EXPECT_EQ(joint.after.firstPacket, 60);
    for (const ffmpeg::JointSide* side : {&joint.before, &joint.after}) {
        EXPECT_EQ(side->packets, 9) << "a keyframe, and the eight up to the picture that seven refer to";
        EXPECT_EQ(side->looks.size(), 9U);
    }
}

} // namespace
} // namespace tests
