// Movies that are exported from their beginning to their end: nothing is cut, so nothing need be encoded again.
#include "linux/ffmpeg/exporting/CutsTest.h"
#include "support/CaseName.h"

namespace tests {
namespace {

class WholeMovies : public CutsTest, public testing::WithParamInterface<const char*> {};

TEST_P(WholeMovies, KeepEachPictureBitForBit)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam())));
    cutAndCheck(0, asset->duration().seconds());
    EXPECT_EQ(copies, int(source.size()));
    EXPECT_FALSE(saysEncodedAsAWhole());
}

INSTANTIATE_TEST_SUITE_P(, WholeMovies,
                         testing::Values("h264-b.mp4", "h264-b.mkv", "h264-b.ts", "h264-open.mp4", "h264-vfr.mkv",
                                         "h264-in-band.mp4", "hevc-b.mkv", "hevc-open.mp4", "hevc-layers.mp4",
                                         "vp9.webm", "vp9-hidden.webm", "av1-hidden.mkv", "av1.ivf", "h264-odd.mp4",
                                         "vp9-odd.webm", "h264-recorded.mkv", "h264-recorded-one.mkv", "h264.avi"),
                         [](const auto& each) { return caseName(each.param); });

class Bursts : public CutsTest {};

TEST_F(Bursts, KeepAllOfTheirPicturesAndTheTimeOfTheLastOrOfAKeyframe)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie("h264-bursts.mkv")));
    int bursts = 0;
    for (std::size_t i = 0; i + 1 < source.size(); ++i)
        if (source[i].seconds == source[i + 1].seconds) {
            const bool isKeyframe = source[i].number == 0 || source[i].number == 30;
            source[i + (isKeyframe ? 1 : 0)].seconds += isKeyframe ? 0.001 : -0.001;
            ++bursts;
        }
    ASSERT_EQ(bursts, 18);
    const double length = asset->duration().seconds();
    cutAndCheck(0, length);
    EXPECT_EQ(copies, int(source.size()));
    for (double start = 0.02; start < 1.9; start += 0.16)
        cutAndCheck(start, start + 1.03);
    EXPECT_FALSE(saysEncodedAsAWhole());
}

struct Edited {
    const char* file;
    int copies; ///< of the whole
};

void PrintTo(const Edited& edited, std::ostream* stream)
{
    *stream << edited.file;
}

class InterruptedMovies : public CutsTest, public testing::WithParamInterface<Edited> {};

TEST_P(InterruptedMovies, AreEncodedOnlyUpToTheNextGroup)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam().file)));
    const double length = asset->duration().seconds();
    cutAndCheck(0, length);
    EXPECT_GE(copies, GetParam().copies);
    for (double start = 0; start < length; start += 0.9)
        for (double end = length; end > start + 0.1; end -= 0.95)
            cutAndCheck(start, end);
    for (const std::string& line : log.texts(base::MemoryLog::Line::Kind::Message))
        EXPECT_NE(line.find("no group of pictures begins in the range"), std::string::npos) << line;
}

INSTANTIATE_TEST_SUITE_P(, InterruptedMovies,
                         // One picture is left out, and 20 of its group follow it; in three parts two groups are whole.
                         testing::Values(Edited{"h264-edits.mp4", 128}, Edited{"h264-edits-b.mp4", 48},
                                         Edited{"h264-edits-back.mp4", 130}),
                         [](const auto& each) { return caseName(each.param.file); });

} // namespace
} // namespace tests
