// `clipsa mix`, as a program, on the test movies.
#include "app/host/ClipsaProgram.h"

#include <QJsonArray>
#include <gmock/gmock.h>

#include <fstream>

namespace {

using testing::HasSubstr;
using testing::IsEmpty;

using tests::movie;
using tests::parsed;
using tests::refusal;

TEST(MixCommandLine, TakesAMovieAndWhereItGoes)
{
    const auto mix = parsed<host::MixCommand>({"mix", "-o", "o.mp4", "m.mkv", "--force"});
    EXPECT_EQ(mix.movie, "m.mkv");
    EXPECT_EQ(mix.output, "o.mp4");
    EXPECT_TRUE(mix.force);
    EXPECT_THAT(refusal({"mix", "-o", "o"}), HasSubstr("needs a movie"));
    EXPECT_THAT(refusal({"mix", "m"}), HasSubstr("needs -o OUT"));
    EXPECT_THAT(refusal({"mix", "m", "-o", "o", "--from", "1"}), HasSubstr("no option --from"));
}

class Mix : public tests::ClipsaProgram {};

TEST_F(Mix, MakesOneTrackOfTwoAndKeepsThePictures)
{
    ASSERT_EQ(probe(movie("clock.mp4"))["audio"].toArray().size(), 2);
    ASSERT_EQ(run({"mix", movie("clock.mp4"), "-o", out}), 0) << errors;
    EXPECT_THAT(errors, IsEmpty());
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 1);
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 120);
}

TEST_F(Mix, TakesAMovieWithoutSoundAsItIs)
{
    ASSERT_EQ(run({"mix", movie("no-sound.mp4"), "-o", out}), 0) << errors;
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 0);
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 120);
}

TEST_F(Mix, DoesNotReplaceAFileUnlessTold)
{
    std::ofstream(out) << "mine";
    EXPECT_EQ(run({"mix", movie("clock.mp4"), "-o", out}), 2);
    EXPECT_EQ(tests::PrivateDirectory::read(out), "mine");
    EXPECT_EQ(run({"mix", movie("clock.mp4"), "-o", out, "--force"}), 0) << errors;
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 1);
}

} // namespace
