// What is checked of an output where encoded pictures stand beside copied ones.
#include "linux/ffmpeg/bitstream/H264Headers.h"
#include "linux/ffmpeg/bitstream/NalUnits.h"
#include "linux/ffmpeg/exporting/ExportTest.h"
#include "linux/ffmpeg/exporting/output/MovieWriter.h"
#include "linux/ffmpeg/exporting/output/OutputCheck.h"
#include "linux/ffmpeg/exporting/video/VideoSources.h"

#include <gmock/gmock.h>

namespace tests {
namespace {

using testing::HasSubstr;

namespace h264 = ffmpeg::h264;

/// Another source's packets, under a header that was tampered with.
class UnderAnotherHeader final : public ffmpeg::TrackSource {
public:
    using Change = std::function<void(h264::Configuration&)>;

    UnderAnotherHeader(std::unique_ptr<TrackSource> source, Change change)
        : m_source(std::move(source)), m_change(std::move(change))
    {
    }
    base::Result<void> describe(AVStream& output) override
    {
        auto done = m_source->describe(output);
        auto header = h264::Configuration::parse(ffmpeg::extradataOf(*output.codecpar));
        if (done && header) {
            m_change(*header);
            ffmpeg::setExtradata(*output.codecpar, header->bytes());
        }
        return done;
    }
    base::Result<bool> next(AVPacket& packet) override { return m_source->next(packet); }
    base::Result<std::vector<ffmpeg::Joint>> joints() override { return m_source->joints(); }
    void detach() override
    {
        m_source->detach();
        TrackSource::detach();
    }

private:
    std::unique_ptr<TrackSource> m_source;
    Change m_change;
};

class AJoint : public ExportTest {
protected:
    /// Writes pictures of a movie under a header that is changed, and checks what was written.
    base::Result<void> check(const std::string& name, double from, double to, UnderAnotherHeader::Change change,
                             const std::function<void(std::vector<ffmpeg::Joint>&)>& expect = {})
    {
        EXPECT_EQ(open(exportMovie(name)), Status::ReadyToPlay);
        const auto source = std::dynamic_pointer_cast<ffmpeg::FFmpegAsset>(asset)->movie();
        const auto cancelled = std::make_shared<std::atomic<bool>>(false);
        auto video = ffmpeg::openVideoSource(source, {at(from), at(to)}, ffmpeg::VideoMode::Copy, cancelled, {});
        if (!video)
            return video.error();
        std::vector<std::unique_ptr<ffmpeg::TrackSource>> tracks;
        tracks.push_back(std::make_unique<UnderAnotherHeader>(std::move(video).value(), std::move(change)));
        auto file = ffmpeg::OutputFile::create(output()).value();
        auto written = ffmpeg::writeMovie(
            {*file, tracks, nullptr, source->timescale(), source->likelyPackets(), to - from, cancelled, {}});
        if (written && expect)
            expect(written.value().front().joints);
        return written ? ffmpeg::checkOutput(*file, written.value(), cancelled) : written.error();
    }
    /// The flag of a set of the High profiles that says whether blocks can pass the transform by.
    static void turnBypass(ffmpeg::Bytes& sps)
    {
        ffmpeg::Bytes payload = ffmpeg::withoutEmulation(sps);
        ffmpeg::BitReader in(payload);
        in.skip(4 * 8);
        for (int i = 0; i < 4; ++i)
            in.ue();
        payload[in.position() / 8] ^= static_cast<std::uint8_t>(0x80 >> in.position() % 8);
        sps = ffmpeg::withEmulation(payload);
    }
};

TEST_F(AJoint, IsGoodAsItIs)
{
    for (const char* name : {"h264-lossless.mp4", "h264-b.mp4", "h264-open.mp4"}) {
        const auto checked = check(name, 0.5, 1.9, [](h264::Configuration&) {});
        EXPECT_TRUE(checked) << name << ": " << checked.error()->description();
    }
}

// Each group alone can be decoded: only who comes from the one to the other sees it.
TEST_F(AJoint, IsBadWhereDecodersKeepWhatTheyLearntBeforeIt)
{
    const auto checked = check("h264-lossless.mp4", 0.5, 1.9, [](h264::Configuration& header) {
        ASSERT_EQ(header.sps.size(), 2U);
        turnBypass(header.sps.back());
    });
    ASSERT_FALSE(checked);
    EXPECT_THAT(checked.error()->description(), HasSubstr("pictures beside a joint are not what they should be"));
}

TEST_F(AJoint, IsBadWhereCopiedPicturesAreNotTheSources)
{
    const auto checked = check("h264.mp4", 0.5, 3.5, [](h264::Configuration& header) {
        header.pps.front() = header.pps.back(); // under the same number as the encoder's
    });
    EXPECT_FALSE(checked);
}

// What a decoder makes up in place of damaged pictures is not the same every time.
TEST_F(AJoint, IsGoodWhereThePicturesThatDifferWereDamagedInTheSource)
{
    for (const bool isDamaged : {false, true}) {
        const auto checked = check(
            "h264-b.mp4", 0.5, 1.9, [](h264::Configuration&) {},
            [&](std::vector<ffmpeg::Joint>& joints) {
                ASSERT_FALSE(joints.front().after.looks.empty());
                joints.front().after.looks.back().hash ^= 1;
                joints.front().after.looks.back().isDamaged = isDamaged;
            });
        EXPECT_EQ(bool(checked), isDamaged);
        std::filesystem::remove(output());
    }
}

} // namespace
} // namespace tests
