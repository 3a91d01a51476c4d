// Random ranges of movies of every kind, each output decoded and compared with its source picture by picture.
#include "linux/ffmpeg/exporting/CutsTest.h"
#include "support/CaseName.h"

#include <random>

namespace tests {
namespace {

struct Kind {
    const char* file;
    /// Whether ranges that hold a whole group keep its packets.
    bool isCopied;
    int seed;
};

void PrintTo(const Kind& kind, std::ostream* stream)
{
    *stream << kind.file;
}

constexpr int kRanges = 20;

class RandomCuts : public CutsTest, public testing::WithParamInterface<Kind> {};

TEST_P(RandomCuts, HaveExactlyTheirPictures)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam().file)));
    const double length = asset->duration().seconds();
    std::mt19937 random(static_cast<unsigned>(GetParam().seed));
    std::uniform_real_distribution<double> moment(0, length);
    for (int i = 0; i < kRanges && !HasFatalFailure(); ++i) {
        double start = 0;
        double end = 0;
        do {
            start = moment(random);
            end = moment(random);
        } while (end - start < 0.1 || expected(start, end).empty());
        cutAndCheck(start, end);
    }
    EXPECT_LE(worstLateness, kTolerance);
    RecordProperty("worst_lateness_us", int(worstLateness * 1e6));
    RecordProperty("worst_remains_per_mille", int(worstRemains * 1000));
    if (!GetParam().isCopied)
        return;
    EXPECT_GT(copies, 20);
    for (const std::string& line : log.texts(base::MemoryLog::Line::Kind::Message))
        if (line.find("is encoded as a whole") != std::string::npos) {
            EXPECT_NE(line.find("no group of pictures begins in the range"), std::string::npos) << line;
        }
}

INSTANTIATE_TEST_SUITE_P(
    , RandomCuts,
    testing::Values(
        Kind{"h264.mp4", true, 1}, Kind{"h264-b.mp4", true, 2}, Kind{"h264-open.mp4", true, 3},
        Kind{"h264-sparse.mp4", true, 4}, Kind{"h264-one-group.mp4", false, 5}, Kind{"h264-444.mp4", true, 6},
        Kind{"h264-10bit.mp4", true, 7}, Kind{"h264-baseline.mp4", true, 8}, Kind{"h264-interlaced.mp4", true, 9},
        Kind{"h264-in-band.mp4", true, 10}, Kind{"h264-changing.mp4", false, 11}, Kind{"h264-b.mkv", true, 12},
        Kind{"h264-b.ts", true, 13}, Kind{"h264-fragmented.mp4", true, 14}, Kind{"h264-vfr.mp4", true, 15},
        Kind{"h264-vfr.mkv", true, 16}, Kind{"h264-edit-list.mp4", true, 17}, Kind{"h264-rotated.mp4", true, 18},
        Kind{"h264-late.mp4", true, 19}, Kind{"two-tracks.mp4", true, 20}, Kind{"vp9.webm", true, 21},
        Kind{"vp9-hidden.webm", true, 22}, Kind{"vp9-444.mkv", true, 23}, Kind{"av1.mp4", true, 24},
        Kind{"av1-hidden.mkv", true, 25}, Kind{"vp8.webm", false, 26}, Kind{"mpeg4.mp4", false, 27},
        Kind{"mjpeg.mov", false, 28}, Kind{"hevc.mp4", true, 29}, Kind{"hevc-b.mkv", true, 30},
        Kind{"hevc-open.mp4", true, 31}, Kind{"hevc-10bit.mp4", true, 32}, Kind{"sound-late.mp4", true, 33},
        Kind{"sound-early.mp4", true, 34}, Kind{"sound-fragmented.mp4", true, 35},
        Kind{"sound-edit-list.mp4", true, 36}, Kind{"sound.mkv", true, 37}, Kind{"mp3.mov", true, 38},
        Kind{"pcm.mov", true, 39}, Kind{"opus.webm", true, 40}, Kind{"opus.mkv", true, 41},
        Kind{"h264-422.mp4", true, 42}, Kind{"h264-full-range.mp4", true, 43}, Kind{"hevc-422.mp4", true, 44},
        Kind{"h264-fields.mp4", true, 45}, Kind{"h264-fields-apart.mp4", false, 46}, Kind{"h264-odd.mp4", true, 47},
        Kind{"vp9-odd.webm", true, 48}, Kind{"h264-recorded.mkv", true, 49}, Kind{"h264-recorded-one.mkv", false, 50},
        Kind{"av1.ivf", true, 51}, Kind{"vp9-422-10bit.mkv", true, 47}, Kind{"vp9-440.webm", false, 58},
        Kind{"sound-no-header.mp4", true, 52}, Kind{"sound-doubled.mkv", true, 53},
        Kind{"opus-fragmented.mp4", true, 54}, Kind{"hevc-layers.mp4", true, 55}),
    [](const auto& each) { return caseName(each.param.file); });

INSTANTIATE_TEST_SUITE_P(InOtherContainers, RandomCuts,
                         testing::Values(Kind{"h264.avi", true, 101}, Kind{"mpeg4.avi", false, 102},
                                         Kind{"wmv.asf", false, 103}, Kind{"h264.flv", true, 104},
                                         Kind{"mpeg2.mpg", false, 105}, Kind{"h264.nut", true, 106},
                                         Kind{"theora.ogv", false, 107}, Kind{"vp8-one-group.webm", false, 108},
                                         Kind{"vp8-live.webm", false, 109}, Kind{"h264-one-group.mkv", false, 110},
                                         Kind{"h264-live.mkv", true, 111}, Kind{"h264-live-one-group.mkv", false, 112}),
                         [](const auto& each) { return caseName(each.param.file); });

} // namespace
} // namespace tests
