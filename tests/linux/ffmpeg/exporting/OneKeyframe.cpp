// Movies as recorders of screens write them: behind one keyframe, or without a table.
#include "linux/ffmpeg/exporting/CutsTest.h"
#include "support/CaseName.h"

namespace tests {
namespace {

class AsRecorded : public CutsTest, public testing::WithParamInterface<const char*> {};

INSTANTIATE_TEST_SUITE_P(, AsRecorded,
                         testing::Values("vp8-one-group.webm", "vp8-live.webm", "h264-one-group.mkv", "h264-live.mkv",
                                         "h264-live-one-group.mkv"),
                         [](const auto& each) { return caseName(each.param); });

TEST_P(AsRecorded, AMovieIsCutFromItsStart)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam())));
    cutAndCheck(0, 1.3);
    cutAndCheck(0, 3.9);
}

TEST_P(AsRecorded, AMovieIsExportedWholeWithAllItsPictures)
{
    ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam())));
    ASSERT_EQ(cut(movie, output(), std::nullopt), ExportStatus::Completed) << errorText();
    const auto got = DecodedMovie(output()).all();
    ASSERT_EQ(got.size(), source.size());
    for (std::size_t i = 0; i < got.size(); ++i) {
        ASSERT_EQ(got[i].number, source[i].number);
        ASSERT_NEAR(got[i].seconds, source[i].seconds, kTolerance);
    }
}

} // namespace
} // namespace tests
