// Cuts a few pictures before and behind a keyframe: every phase of what is reordered around it.
#include "linux/ffmpeg/exporting/CutsTest.h"
#include "support/CaseName.h"

namespace tests {
namespace {

struct Groups {
    const char* file;
    int joint;     ///< the number of a keyframe's picture
    int nextJoint; ///< of one behind it
    int keyframe;  ///< of one between them, or the next: open groups have those that nothing is joined at
    int step = 1;  ///< between the phases that are tried: encoding HEVC takes its time
};

void PrintTo(const Groups& groups, std::ostream* stream)
{
    *stream << groups.file;
}

constexpr int kPhases = 8;

class EdgesOfGroups : public CutsTest, public testing::WithParamInterface<Groups> {
protected:
    void SetUp() override { ASSERT_NO_FATAL_FAILURE(take(exportMovie(GetParam().file))); }
    /// From one picture up to another.
    void cutPictures(int from, int to) { cutAndCheck(from / 30.0, to / 30.0); }
};

TEST_P(EdgesOfGroups, MayLieAnywhereAroundAKeyframe)
{
    const auto& [file, joint, nextJoint, keyframe, step] = GetParam();
    for (int phase = 1; phase <= kPhases && !HasFatalFailure(); phase += step) {
        cutPictures(joint - phase, joint + phase);
        cutPictures(joint + phase, nextJoint + kPhases + 1 - phase);
        cutPictures(joint, keyframe + phase);
    }
    EXPECT_FALSE(saysEncodedAsAWhole());
}

INSTANTIATE_TEST_SUITE_P(, EdgesOfGroups,
                         testing::Values(Groups{"h264.mp4", 30, 60, 60}, Groups{"h264-b.mp4", 30, 60, 60},
                                         Groups{"h264-b-flat.mp4", 20, 40, 40}, Groups{"h264-pyramid.mp4", 20, 40, 40},
                                         Groups{"h264-open.mp4", 45, 63, 60}, Groups{"h264-open.mp4", 63, 96, 93},
                                         Groups{"hevc-open.mp4", 30, 60, 60, 2},
                                         Groups{"hevc-leading.mp4", 20, 40, 40, 3}),
                         [](const auto& each) {
                             return caseName(each.param.file + ("_" + std::to_string(each.param.joint)));
                         });

} // namespace
} // namespace tests
