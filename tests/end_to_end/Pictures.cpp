// What the editor looks like, in both arrangements and on both kinds of devices: as in docs/pictures, which
// tools/make-pictures makes.
#include "end_to_end/Machine.h"
#include "end_to_end/Screenshot.h"
#include "support/CaseName.h"

#include <gmock/gmock.h>

using namespace tests;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

namespace fs = std::filesystem;

class Picture : public testing::TestWithParam<const char*> {};

// The next font renderer draws letters a little otherwise; a button that is missing or elsewhere, even one that is pale
// because it is disabled, makes a difference of 10 or more.
constexpr double kLargestDifference = 7;
constexpr const char* kRemedy = "if it is meant to look different now, run tools/make-pictures and look at them";

} // namespace

TEST_P(Picture, LooksAsItDid)
{
    const std::string name = GetParam();
    const PrivateDirectory made;
    Machine machine;
    Child tool({sourceFile("tools/make-pictures"), "--output", made.path(), "--only", name, "--clipsa",
                program("clipsa"), "--movies", movie("pictures")},
               machine.environment());
    const auto end = tool.wait();
    ASSERT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(end.err, IsEmpty());
    for (const auto& file : fs::directory_iterator(made.path())) {
        SCOPED_TRACE(file.path().filename());
        const Screenshot now(file.path());
        const Screenshot before(fs::path(sourceFile("docs/pictures")) / file.path().filename());
        ASSERT_FALSE(before.isNull()) << "docs/pictures does not have it";
        ASSERT_EQ(now.image().size(), before.image().size());
        EXPECT_LT(differenceOf(now.image(), before.image()), kLargestDifference) << kRemedy;
    }
}

INSTANTIATE_TEST_SUITE_P(EndToEnd, Picture,
                         testing::Values("phone", "phone-landscape", "phone-landscape-flat",
                                         "phone-without-home-button", "phone-dark", "phone-trim", "phone-dark-trim",
                                         "phone-share", "phone-dark-share", "phone-arabic", "phone-arabic-share", "pad",
                                         "pad-without-home-button", "pad-flat", "pad-dark", "pad-trim", "pad-share"),
                         [](const auto& picture) { return caseName(picture.param); });

TEST(TurningAPhone, ToItsSideAndBackShowsWhatWasThere)
{
    for (const char* homeButton : {"yes", "no"}) {
        SCOPED_TRACE(homeButton);
        Machine machine;
        machine.keepReport();
        machine.setScript(R"(
            wait picture
            wait ready
            size 390 760
            wait thumbnails
            picture before.png
            print {layout}
            size 760 390
            picture on-its-side.png
            print {layout}
            size 390 760
            wait thumbnails
            picture after.png
            print {layout}
            tap Cancel)");
        const auto end = machine.open(machine.movie("clock.mp4"), {"--device", "phone", "--home-button", homeButton});
        ASSERT_EQ(end.exitStatus, 0) << end.err;
        EXPECT_THAT(machine.report(), ElementsAre("phone", "pad", "phone"));
        EXPECT_EQ(Screenshot(machine.picture("before.png")).image(), Screenshot(machine.picture("after.png")).image());
        EXPECT_EQ(Screenshot(machine.picture("on-its-side.png")).image().size(), QSize(760, 390));
    }
}

TEST(TurningAPad, KeepsOneBarHoweverItIsHeld)
{
    Machine machine;
    machine.keepReport();
    machine.setScript(R"(
        wait ready
        size 1024 700
        print {layout}
        size 700 1024
        print {layout}
        tap Cancel)");
    EXPECT_EQ(machine.open(machine.movie("clock.mp4"), {"--device", "pad"}).exitStatus, 0);
    EXPECT_THAT(machine.report(), ElementsAre("pad", "pad"));
}
