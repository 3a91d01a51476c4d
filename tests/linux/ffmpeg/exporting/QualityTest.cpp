// What pictures cost that are encoded beside copied ones.
#include "linux/ffmpeg/exporting/CutsTest.h"
#include "support/CaseName.h"

namespace tests {
namespace {

class HeadsOfOneSource : public CutsTest {
protected:
    /// Bytes of the packets that are shown from one time up to another.
    static std::int64_t bytesOfPackets(const std::string& path, double from, double to)
    {
        DecodedMovie file(path);
        std::int64_t bytes = 0;
        const auto packet = ffmpeg::newPacket();
        for (; av_read_frame(&file.context(), packet.get()) >= 0; av_packet_unref(packet.get())) {
            const double seconds = double(packet->pts) * av_q2d(file.stream().time_base);
            if (packet->stream_index == file.stream().index && seconds > from - 1e-3 && seconds < to - 1e-3)
                bytes += packet->size;
        }
        return bytes;
    }
};

class EncodedHeads : public HeadsOfOneSource, public testing::WithParamInterface<const char*> {};

TEST_P(EncodedHeads, CostNoMoreThanTheirSourcesDeserve)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam())));
    ASSERT_EQ(cut(movie, output(), fromTo(0.4, 2)), ExportStatus::Completed) << errorText();
    EXPECT_FALSE(saysEncodedAsAWhole());
    const std::int64_t was = bytesOfPackets(movie, 0, 1 / 30.0) + bytesOfPackets(movie, 0.4, 1);
    const std::int64_t is = bytesOfPackets(output(), 0, 0.6);
    EXPECT_LT(is, was * 4) << "the source's keyframe, and its pictures from the cut up to the next";
    const auto pictures = DecodedMovie(output()).all();
    ASSERT_EQ(pictures.size(), 48U);
    double worst = 100;
    for (std::size_t i = 0; i < 18; ++i)
        worst = std::min(worst, likeness(pictures[i], source[i + 12]));
    EXPECT_GT(worst, 36);
    RecordProperty("bytes_per_mille", int(is * 1000 / was));
    RecordProperty("worst_centibels", int(worst * 10));
}

TEST_F(HeadsOfOneSource, CostTheSameWhateverItsClock)
{
    std::vector<std::int64_t> sizes;
    for (const char* name : {"h264-coarse.mp4", "h264-coarse-ticks.mp4"}) {
        ASSERT_EQ(cut(exportMovie(name), output(name), fromTo(0.4, 2)), ExportStatus::Completed) << errorText();
        sizes.push_back(bytesOfPackets(output(name), 0, 0.6));
    }
    EXPECT_NEAR(double(sizes[1]), double(sizes[0]), 0.02 * double(sizes[0]));
}

INSTANTIATE_TEST_SUITE_P(, EncodedHeads,
                         testing::Values("h264-coarse.mp4", "hevc-coarse.mp4", "vp9-coarse.webm", "av1-coarse.mp4"),
                         [](const auto& each) { return caseName(each.param); });

} // namespace
} // namespace tests
