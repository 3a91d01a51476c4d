// `clipsa trim`, as a program, on the test movies.
#include "app/host/ClipsaProgram.h"
#include "support/ProcessorTime.h"
#include "support/RefusedSystemCalls.h"

#include <QJsonArray>
#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>
#include <random>

namespace {

using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

using tests::movie;
using tests::namesIn;
using tests::parsed;
using tests::refusal;
using tests::Words;

namespace fs = std::filesystem;

TEST(TrimCommandLine, TakesTimesAsPeopleWriteThem)
{
    const auto seconds = [](const std::string& text) {
        const auto moment = host::momentIn(text);
        return moment ? moment->seconds() : -1;
    };
    EXPECT_EQ(seconds("0"), 0);
    EXPECT_EQ(seconds("12.5"), 12.5);
    EXPECT_EQ(seconds("90"), 90);
    EXPECT_EQ(seconds("1:30"), 90);
    EXPECT_EQ(seconds("01:02:03.25"), 3723.25);
    EXPECT_EQ(host::momentIn("0.0333333333"), base::MediaTime::make(33333, 1'000'000));
    for (const char* text : {"", ".", "1.", ".5", "-1", "x", "1:", ":1", "1:60", "1:2:3:4", "1e3", "1,5", "1:-1", " 1",
                             "0.1234567x", "0.123456-7", "1.1234567 "})
        EXPECT_EQ(seconds(text), -1) << text;
}

TEST(TrimCommandLine, TakesARange)
{
    const auto command = parsed<host::TrimCommand>({"trim", "--from", "1", "m.mp4", "--to=2.5", "-o", "out.mp4"});
    EXPECT_EQ(command.movie, "m.mp4");
    EXPECT_EQ(command.from.seconds(), 1);
    EXPECT_EQ(command.to->seconds(), 2.5);
    EXPECT_EQ(command.output, "out.mp4");
    EXPECT_FALSE(command.force);
    const auto whole = parsed<host::TrimCommand>({"trim", "m.mp4", "--output", "o", "--force"});
    EXPECT_EQ(whole.from.seconds(), 0);
    EXPECT_FALSE(whole.to);
    EXPECT_TRUE(whole.force);
}

TEST(TrimCommandLine, SaysWhichWordIsWrong)
{
    EXPECT_THAT(refusal({"trim", "-o", "o"}), HasSubstr("needs a movie"));
    EXPECT_THAT(refusal({"trim", "m"}), HasSubstr("needs -o OUT"));
    EXPECT_THAT(refusal({"trim", "m", "-o", "o", "--from", "soon"}), HasSubstr("--from is a time like"));
    EXPECT_THAT(refusal({"trim", "m", "-o", "o", "--from", "2", "--to", "1"}), HasSubstr("--to must be behind"));
    EXPECT_THAT(refusal({"trim", "m", "-o", "o", "--from", "2", "--to", "2"}), HasSubstr("--to must be behind"));
    EXPECT_THAT(refusal({"trim", "m", "-o", "o", "--size", "2"}), HasSubstr("no option --size"));
    EXPECT_THAT(refusal({"trim", "m", "n", "-o", "o"}), HasSubstr("both m and n"));
}

TEST(TrimCommandLine, WritesNoMp4UnderTheNameOfAnotherKind)
{
    for (const char* command : {"trim", "mix"}) {
        for (const char* output : {"b.webm", "dir/B.MKV", "b.mp4.avi", ".ts"})
            EXPECT_THAT(refusal({command, "m", "-o", output}), HasSubstr("writes an MP4 movie")) << output;
        for (const char* output : {"b.mp4", "b.MP4", "b.m4v", "b.mov", "b", "b.webm/c", "b.part", "b."})
            EXPECT_EQ(refusal({command, "m", "-o", output}), "(accepted)") << output;
    }
}

class Trim : public tests::ClipsaProgram {};

TEST_F(Trim, HasWhatIsShownFromATimeUpToAnother)
{
    ASSERT_EQ(run({"trim", movie("groups.mp4"), "--from", "1", "--to", "3", "-o", out}), 0) << errors;
    EXPECT_THAT(errors, IsEmpty());
    const QJsonObject facts = probe(out);
    EXPECT_NEAR(facts["duration"].toDouble(), 2, 0.03);
    EXPECT_NEAR(facts["video"][0]["pictures"].toInt(), 2 * facts["video"][0]["averageRate"].toDouble(), 1);
}

TEST_F(Trim, TakesAllOfAMovieWithoutTimes)
{
    ASSERT_EQ(run({"trim", movie("clock.mp4"), "-o", out}), 0) << errors;
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 120);
    EXPECT_EQ(probe(out)["audio"].toArray().size(), 2);
}

TEST_F(Trim, SaysWhyAMovieIsEncodedAsAWhole)
{
    ASSERT_EQ(run({"trim", movie("clock.mp4"), "--from", "1", "-o", out}), 0) << errors;
    EXPECT_THAT(errors, HasSubstr("“clock.mp4” is encoded as a whole: no group of pictures begins in the range"));
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 90);
}

TEST_F(Trim, DoesNotReplaceAFileUnlessTold)
{
    std::ofstream(out) << "mine";
    EXPECT_EQ(run({"trim", movie("clock.mp4"), "-o", out}), 2);
    EXPECT_THAT(errors, HasSubstr("is there already; give --force"));
    EXPECT_EQ(tests::PrivateDirectory::read(out), "mine");
    EXPECT_EQ(run({"trim", movie("clock.mp4"), "-o", out, "--force"}), 0) << errors;
    EXPECT_EQ(probe(out)["video"][0]["pictures"], 120);
    EXPECT_THAT(namesIn(directory.path()), ElementsAre("out.mp4"));
}

TEST_F(Trim, KeepsAFileThatItWasToReplaceWhenItFails)
{
    std::ofstream(out) << "mine";
    EXPECT_EQ(run({"trim", movie("clock.mp4"), "--from", "100", "-o", out, "--force"}), 1);
    EXPECT_THAT(errors, HasSubstr("“clock.mp4” cannot be exported: the range begins behind its end"));
    EXPECT_EQ(tests::PrivateDirectory::read(out), "mine");
    EXPECT_THAT(namesIn(directory.path()), ElementsAre("out.mp4"));
}

TEST_F(Trim, KeepsAFileThatCannotBeReplacedAndLeavesNothingBesideIt)
{
    std::ofstream(out) << "mine";
    tests::whileRefusing({{SYS_rename, EPERM}, {SYS_renameat, EPERM}}, [&] {
        EXPECT_EQ(run({"trim", movie("clock.mp4"), "-o", out, "--force"}), 1);
    });
    EXPECT_THAT(errors, HasSubstr("cannot replace " + out));
    EXPECT_EQ(tests::PrivateDirectory::read(out), "mine");
    EXPECT_THAT(namesIn(directory.path()), ElementsAre("out.mp4"));
}

TEST_F(Trim, NeverReplacesTheMovieItself)
{
    fs::copy_file(movie("clock.mp4"), out);
    EXPECT_EQ(run({"trim", out, "-o", out, "--force"}), 2);
    EXPECT_THAT(errors, HasSubstr("is the movie itself"));
    EXPECT_EQ(fs::file_size(out), fs::file_size(movie("clock.mp4")));
}

TEST_F(Trim, SaysWhatToDoWhenTheDiskIsFull)
{
    tests::whileRefusing({{SYS_pwrite64, ENOSPC}}, [&] {
        EXPECT_EQ(run({"trim", movie("clock.mp4"), "--to", "2", "-o", out}), 1);
    });
    EXPECT_THAT(errors, HasSubstr("the disk is full; make room there, or choose another directory\n"));
    EXPECT_EQ(std::count(errors.begin(), errors.end(), '\n'), 1) << errors;
    EXPECT_THAT(namesIn(directory.path()), IsEmpty());
}

TEST_F(Trim, NamesTheFileThatItWasToReplaceWhenTheDiskIsFull)
{
    std::ofstream(out) << "mine";
    tests::whileRefusing({{SYS_pwrite64, ENOSPC}}, [&] {
        EXPECT_EQ(run({"trim", movie("clock.mp4"), "--to", "2", "-o", out, "--force"}), 1);
    });
    EXPECT_THAT(errors, HasSubstr("“out.mp4” cannot be written: the disk is full; make room there"));
    tests::whileRefusing({{SYS_pwrite64, EIO}}, [&] {
        EXPECT_EQ(run({"trim", movie("clock.mp4"), "--to", "2", "-o", out, "--force"}), 1);
    });
    EXPECT_THAT(errors, HasSubstr("“out.mp4” cannot be written: "));
    EXPECT_THAT(namesIn(directory.path()), ElementsAre("out.mp4"));
}

TEST_F(Trim, SaysWhatIsWrongWithTheDirectory)
{
    EXPECT_EQ(run({"trim", movie("clock.mp4"), "-o", directory.path() / "none/out.mp4"}), 2);
    EXPECT_EQ(errors, "clipsa: there is no directory " + (directory.path() / "none").native()
                          + "; make it first, or choose another\n");
}

TEST_F(Trim, FailsInOneLine)
{
    EXPECT_EQ(run({"trim", movie("not-a-movie.mp4"), "-o", out}), 2);
    EXPECT_THAT(errors, HasSubstr("not-a-movie.mp4” is not a movie"));
    EXPECT_EQ(std::count(errors.begin(), errors.end(), '\n'), 1);
    EXPECT_EQ(run({"trim", movie("nothing.mp4"), "-o", out}), 2);
    EXPECT_THAT(namesIn(directory.path()), IsEmpty());
}

// The moments are spread over the whole work: from the start of the program to beyond the end of the export.
TEST_F(Trim, LeavesAWholeMovieOrNoneWheneverItIsKilled)
{
    const Words words = command({"trim", movie("groups.mp4"), "--from", "0.5", "-o", out});
    tests::Program first(words, {});
    const auto whole = tests::waitForWork(first.process());
    ASSERT_EQ(first.wait(), 0);
    const auto size = fs::file_size(out);
    fs::remove(out);
    std::mt19937 random(7);
    int finished = 0;
    constexpr int kMoments = 40;
    for (int i = 0; i < kMoments; ++i) {
        tests::Program program(words, {});
        tests::waitForWork(program.process(), whole * (random() % 1000) / 800);
        program.signal(i % 2 ? SIGKILL : SIGINT);
        const int status = program.wait();
        const Words names = namesIn(directory.path());
        if (!names.empty()) {
            ASSERT_THAT(names, ElementsAre("out.mp4"));
            ASSERT_EQ(fs::file_size(out), size);
            ++finished;
            fs::remove(out);
        } else {
            EXPECT_NE(status, 0);
        }
    }
    EXPECT_LT(finished, kMoments);
}

TEST_F(Trim, ItsResultIsAsPrivateAsTheMovie)
{
    const fs::path source = directory.path() / "source.mp4";
    const fs::path pictures = directory.path() / "pictures";
    fs::copy_file(movie("clock.mp4"), source);
    for (const auto& [given, kept] : {std::pair(0600, 0600), std::pair(0640, 0640), std::pair(0444, 0644)}) {
        fs::permissions(source, fs::perms(given));
        ASSERT_EQ(run({"trim", source, "--to", "1", "-o", out, "--force"}), 0) << errors;
        EXPECT_EQ(fs::status(out).permissions(), fs::perms(kept));
        ASSERT_EQ(run({"mix", source, "-o", out, "--force"}), 0) << errors;
        EXPECT_EQ(fs::status(out).permissions(), fs::perms(kept));
        ASSERT_EQ(run({"thumbnails", source, "-n", "1", "-o", pictures, "--force"}), 0) << errors;
        EXPECT_EQ(fs::status(pictures / "0_00-00-00.000.png").permissions(), fs::perms(kept));
    }
}

TEST_F(Trim, ReplacesNothingButTheFileItself)
{
    const fs::path beside = directory.path() / ".out.mp4.new";
    std::ofstream(beside) << "mine";
    std::ofstream(out) << "old";
    ASSERT_EQ(run({"trim", movie("clock.mp4"), "--to", "1", "-o", out, "--force"}), 0) << errors;
    EXPECT_EQ(tests::PrivateDirectory::read(beside), "mine");
    EXPECT_THAT(namesIn(directory.path()), UnorderedElementsAre(".out.mp4.new", "out.mp4"));
    EXPECT_NEAR(probe(out)["duration"].toDouble(), 1, 0.05);
}

TEST_F(Trim, WritesWhatTakesAFilesPlaceUnderANameThatNobodyElseHas)
{
    std::ofstream(out) << "mine";
    tests::whileRefusing({{SYS_rename, EPERM}, {SYS_renameat, EPERM}, {SYS_unlink, EPERM}, {SYS_unlinkat, EPERM}}, [&] {
        for (int i = 0; i < 2; ++i)
            EXPECT_EQ(run({"trim", movie("clock.mp4"), "--to", "1", "-o", out, "--force"}), 1);
    });
    EXPECT_EQ(namesIn(directory.path()).size(), 3U) << "the file, and two that could not be removed";
}

TEST_F(Trim, TwoThatMakeOneFileAtOnceDoNotDisturbEachOther)
{
    for (const bool force : {true, false}) {
        fs::remove(out);
        Words words = {"trim", movie("groups.mp4"), "--to", "3", "-o", out};
        if (force)
            words.emplace_back("--force");
        tests::Program first(command(words), {});
        tests::Program second(command(words), {});
        const std::vector<int> ends = {first.wait(), second.wait()};
        EXPECT_THAT(ends, force ? UnorderedElementsAre(0, 0) : UnorderedElementsAre(0, 2))
            << first.errors() << second.errors();
        if (!force) {
            EXPECT_THAT(first.errors() + second.errors(),
                        EndsWith("out.mp4 is there already; give --force to replace it\n"));
        }
        EXPECT_NEAR(probe(out)["duration"].toDouble(), 3, 0.05);
        EXPECT_THAT(namesIn(directory.path()), ElementsAre("out.mp4"));
    }
}

} // namespace
