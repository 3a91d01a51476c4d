// `clipsa mix`, as a program, on the test movies.
#include "app/host/MediaCommandLine.h"
#include "support/Program.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <gmock/gmock.h>

#include <fstream>

namespace {

using testing::HasSubstr;
using testing::IsEmpty;

using Words = std::vector<std::string>;

std::string movie(const std::string& name)
{
    return std::string(CLIPSA_TEST_MOVIES) + "/" + name;
}

std::string refusal(const Words& words)
{
    const auto command = host::parseMediaCommand(words);
    return command ? "(accepted)" : command.error()->description();
}

TEST(MixCommandLine, TakesAMovieAndWhereItGoes)
{
    const auto command = host::parseMediaCommand({"mix", "-o", "o.mp4", "m.mkv", "--force"});
    ASSERT_TRUE(command);
    const auto mix = std::get<host::MixCommand>(command.value().value());
    EXPECT_EQ(mix.movie, "m.mkv");
    EXPECT_EQ(mix.output, "o.mp4");
    EXPECT_TRUE(mix.force);
    EXPECT_THAT(refusal({"mix", "-o", "o"}), HasSubstr("needs a movie"));
    EXPECT_THAT(refusal({"mix", "m"}), HasSubstr("needs -o OUT"));
    EXPECT_THAT(refusal({"mix", "m", "-o", "o", "--from", "1"}), HasSubstr("no option --from"));
}

class Mix : public ::testing::Test {
protected:
    int run(Words words)
    {
        words.insert(words.begin(), {std::string(CLIPSA_BIN) + "/clipsa", "mix"});
        tests::Program program(words, {});
        const int status = program.wait();
        errors = program.errors();
        return status;
    }
    QJsonObject probe(const std::string& path)
    {
        tests::Program program({std::string(CLIPSA_BIN) + "/clipsa", "probe", path, "--json"}, {});
        EXPECT_EQ(program.wait(), 0);
        return QJsonDocument::fromJson(QByteArray::fromStdString(program.output())).object();
    }

    tests::PrivateDirectory directory;
    const std::string out = directory.path() / "out.mp4";
    std::string errors;
};

TEST_F(Mix, MakesOneTrackOfTwoAndKeepsThePictures)
{
    ASSERT_EQ(probe(movie("clock.mp4"))["audio"].toArray().size(), 2);
    ASSERT_EQ(run({movie("clock.mp4"), "-o", out}), 0) << errors;
    EXPECT_THAT(errors, IsEmpty());
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 1);
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 120);
}

TEST_F(Mix, TakesAMovieWithoutSoundAsItIs)
{
    ASSERT_EQ(run({movie("no-sound.mp4"), "-o", out}), 0) << errors;
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 0);
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 120);
}

TEST_F(Mix, DoesNotReplaceAFileUnlessTold)
{
    std::ofstream(out) << "mine";
    EXPECT_EQ(run({movie("clock.mp4"), "-o", out}), 2);
    EXPECT_EQ(tests::PrivateDirectory::read(out), "mine");
    EXPECT_EQ(run({movie("clock.mp4"), "-o", out, "--force"}), 0) << errors;
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 1);
}

} // namespace
