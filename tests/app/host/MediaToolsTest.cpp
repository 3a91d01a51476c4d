// The commands that need no window, as programs, on the test movies.
#include "app/host/ClipsaProgram.h"
#include "app/host/JsonObject.h"
#include "app/host/MakeThumbnails.h"
#include "support/RefusedSystemCalls.h"

#include <QJsonArray>
#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <fstream>
#include <poll.h>
#include <pty.h>
#include <sys/inotify.h>
#include <thread>

namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

using tests::movie;
using tests::namesIn;
using tests::parsed;
using tests::refusal;
using tests::Words;

namespace fs = std::filesystem;

TEST(MediaCommandLine, TakesWhatThumbnailsNeed)
{
    const auto command =
        parsed<host::ThumbnailsCommand>({"thumbnails", "-n", "20", "m.mp4", "-o", "out", "--size=320x180"});
    EXPECT_EQ(command.movie, "m.mp4");
    EXPECT_EQ(command.count, 20);
    EXPECT_EQ(command.output, "out");
    EXPECT_EQ(command.size, (base::Size{320, 180}));
    EXPECT_FALSE(command.force);
    EXPECT_TRUE(parsed<host::ThumbnailsCommand>({"thumbnails", "m", "-n", "1", "-o", "d", "--force"}).force);
}

TEST(MediaCommandLine, SaysWhichWordIsWrong)
{
    EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d"}), HasSubstr("needs -n N"));
    EXPECT_THAT(refusal({"thumbnails", "m", "-n", "3"}), HasSubstr("needs -o DIR"));
    EXPECT_THAT(refusal({"thumbnails", "-n", "3", "-o", "d"}), HasSubstr("needs a movie"));
    for (const char* count : {"0", "-1", "x", "", "10001"})
        EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d", "-n", count}), HasSubstr("-n is a number from 1")) << count;
    for (const char* size : {"320", "x", "320x", "x9", "0x9", "3x2x1", "320X180", "99999x1"})
        EXPECT_THAT(refusal({"thumbnails", "m", "-o", "d", "-n", "1", "--size", size}), HasSubstr("like 320x180"))
            << size;
    EXPECT_THAT(refusal({"thumbnails", "m", "--json"}), HasSubstr("no option --json"));
    EXPECT_THAT(refusal({"thumbnails", "a", "b"}), HasSubstr("both a and b"));
    EXPECT_THAT(refusal({"probe"}), HasSubstr("needs a movie"));
    EXPECT_THAT(refusal({"probe", "m", "--force"}), HasSubstr("no option --force"));
    EXPECT_THAT(refusal({"probe", "m", "--json=1"}), HasSubstr("takes no value"));
}

TEST(Thumbnails, AreSpacedEvenlyFromTheStart)
{
    const auto times = host::evenlySpaced(base::MediaTime::make(600, 60), 4);
    ASSERT_EQ(times.size(), 4U);
    EXPECT_EQ(times[0], base::MediaTime::make(0, 1));
    EXPECT_EQ(times[3], base::MediaTime::make(7500, 1000));
    EXPECT_EQ(host::evenlySpaced(base::MediaTime::indefinite(), 2)[1], base::MediaTime::zero());
    EXPECT_EQ(host::evenlySpaced(base::MediaTime::make(-5, 1), 2)[1], base::MediaTime::zero());
    // Never behind the place: thousandths are rounded down.
    const auto thirds = host::evenlySpaced(base::MediaTime::make(20, 1), 3);
    EXPECT_EQ(thirds[1], base::MediaTime::make(6'666, 1000));
    EXPECT_EQ(thirds[2], base::MediaTime::make(13'333, 1000));
    EXPECT_EQ(thirds[1].timescale, 1000);
}

TEST(Thumbnails, AreNamedByPlaceAndTime)
{
    EXPECT_EQ(host::thumbnailName(7, 100, base::MediaTime::make(90'500, 1000)), "07_00-01-30.500.png");
    EXPECT_EQ(host::thumbnailName(0, 1, base::MediaTime::make(0, 1000)), "0_00-00-00.000.png");
    EXPECT_EQ(host::thumbnailName(9, 11, base::MediaTime::make(3'599'999, 1000)), "09_00-59-59.999.png");
    EXPECT_EQ(host::thumbnailName(9, 10, base::MediaTime::make(36'061'001, 1000)), "9_10-01-01.001.png");
    EXPECT_EQ(host::thumbnailName(9, 10, base::MediaTime::make(7'200'000, 1000)), "9_02-00-00.000.png");
}

class MediaTools : public tests::ClipsaProgram {
protected:
    Words files() const { return namesIn(folder); }
    static auto lines(const std::string& text) { return std::count(text.begin(), text.end(), '\n'); }

    const fs::path folder = directory.path() / "pictures";
};

TEST_F(MediaTools, LeaveThumbnailsInADirectory)
{
    EXPECT_EQ(run({"thumbnails", movie("clock.mp4"), "-n", "4", "-o", folder, "--size", "160x160"}), 0) << errors;
    EXPECT_THAT(files(),
                ElementsAre("0_00-00-00.000.png", "1_00-00-01.000.png", "2_00-00-02.000.png", "3_00-00-03.000.png"));
    EXPECT_THAT(errors, IsEmpty()) << "no bar where there is no terminal";
    const std::string png = tests::PrivateDirectory::read(folder / "3_00-00-03.000.png");
    ASSERT_GT(png.size(), 33U);
    EXPECT_EQ(png.substr(1, 3), "PNG");
    EXPECT_EQ(png.substr(16, 8), std::string("\0\0\0\xA0\0\0\0\x5A", 8)) << "160 by 90";
}

TEST_F(MediaTools, DoNotReplaceThumbnailsUnlessTold)
{
    fs::create_directories(folder);
    for (const std::string mine : {"0_00-00-00.000.png", "1_00-00-02.000.png"}) {
        std::ofstream(folder / mine) << "mine";
        EXPECT_EQ(run({"thumbnails", movie("clock.mp4"), "-n", "2", "-o", folder}), 2);
        EXPECT_THAT(errors, HasSubstr(mine + " is there already; give --force"));
        EXPECT_EQ(lines(errors), 1);
        EXPECT_THAT(files(), ElementsAre(mine)) << "nothing is begun";
        EXPECT_EQ(tests::PrivateDirectory::read(folder / mine), "mine");
        fs::remove(folder / mine);
    }
    std::ofstream(folder / "1_00-00-02.000.png") << "mine";
    EXPECT_EQ(run({"thumbnails", movie("clock.mp4"), "-n", "2", "-o", folder, "--force"}), 0) << errors;
    EXPECT_THAT(files(), ElementsAre("0_00-00-00.000.png", "1_00-00-02.000.png"));
    EXPECT_THAT(tests::PrivateDirectory::read(folder / "1_00-00-02.000.png"), HasSubstr("PNG"));
}

TEST_F(MediaTools, SayHowManyThumbnailsAreMissingAndWhyTheFirst)
{
    const Words words = {"thumbnails", movie("clock.mp4"), "-n", "3", "-o", folder, "--force"};
    fs::create_directories(folder / "1_00-00-01.333.png/not a picture");
    EXPECT_EQ(run(words), 1);
    EXPECT_EQ(lines(errors), 1);
    EXPECT_THAT(errors, AllOf(HasSubstr("1_00-00-01.333.png"), Not(HasSubstr("of 3 pictures"))));
    EXPECT_EQ(files().size(), 3U) << "the others are there";
    fs::create_directories(folder / "2_00-00-02.666.png.d");
    fs::remove(folder / "2_00-00-02.666.png");
    fs::rename(folder / "2_00-00-02.666.png.d", folder / "2_00-00-02.666.png");
    EXPECT_EQ(run(words), 1);
    EXPECT_EQ(lines(errors), 1);
    EXPECT_THAT(errors,
                AllOf(HasSubstr("2 of 3 pictures could not be made; the first: "), HasSubstr("1_00-00-01.333.png")));
}

TEST_F(MediaTools, LeaveNoDirectoryOfTheirsBehindThatIsEmpty)
{
    std::thread([this] {
        // No picture gets its name.
        tests::refuseSystemCalls({{SYS_renameat2, EROFS}});
        const Words words = {"thumbnails", movie("clock.mp4"), "-n", "2", "-o", folder};
        EXPECT_EQ(run(words), 1) << errors;
        EXPECT_FALSE(fs::exists(folder));
        fs::create_directory(folder);
        EXPECT_EQ(run(words), 1) << errors;
    }).join();
    EXPECT_TRUE(fs::exists(folder)) << "that was not theirs";
}

TEST_F(MediaTools, SayInOneLineWhyTheyFail)
{
    EXPECT_EQ(run({"thumbnails", movie("audio-only.m4a"), "-n", "2", "-o", folder}), 2);
    EXPECT_THAT(errors, HasSubstr("has no pictures, only sound"));
    EXPECT_EQ(lines(errors), 1);
    EXPECT_EQ(run({"thumbnails", movie("not-a-movie.mp4"), "-n", "2", "-o", folder}), 2);
    EXPECT_THAT(errors, HasSubstr("not-a-movie.mp4” is not a movie"));
    EXPECT_EQ(lines(errors), 1);
    EXPECT_FALSE(fs::exists(folder));
    EXPECT_EQ(run({"probe", movie("nothing.mp4")}), 2);
    EXPECT_THAT(errors, HasSubstr("there is no file"));
    std::ofstream(folder.native()) << "a file";
    EXPECT_EQ(run({"thumbnails", movie("clock.mp4"), "-n", "2", "-o", folder}), 2);
    EXPECT_THAT(errors, StartsWith("clipsa: cannot write pictures into"));
    EXPECT_EQ(lines(errors), 1);
}

TEST_F(MediaTools, MakeWhatCanBeMadeOfADamagedMovie)
{
    EXPECT_EQ(run({"thumbnails", movie("truncated.mp4"), "-n", "8", "-o", folder}), 0) << errors;
    EXPECT_EQ(files().size(), 8U);
}

TEST_F(MediaTools, LeaveNothingHalfWrittenWhenInterrupted)
{
    fs::create_directories(folder);
    const int watch = ::inotify_init1(IN_CLOEXEC);
    ASSERT_GE(::inotify_add_watch(watch, folder.c_str(), IN_MOVED_TO | IN_CREATE), 0);
    // Pictures of full size, so many that the first is there long before the last.
    tests::Program program(command({"thumbnails", movie("long-gop.mp4"), "-n", "1200", "-o", folder}), {});
    pollfd arrival = {watch, POLLIN, 0};
    EXPECT_EQ(::poll(&arrival, 1, 60'000), 1) << "no picture has come";
    ::close(watch);
    program.signal(SIGINT);
    EXPECT_EQ(program.wait(), 128 + SIGINT);
    EXPECT_THAT(program.errors(), IsEmpty());
    const Words names = files();
    EXPECT_LT(names.size(), 1200U);
    for (const std::string& name : names) {
        const std::string png = tests::PrivateDirectory::read(folder / name);
        EXPECT_THAT(name, testing::EndsWith(".png"));
        EXPECT_THAT(png, HasSubstr("IEND")) << name;
    }
}

/// What stands on a terminal in the end, with all that was taken away again.
std::string shownOnATerminal(const Words& words)
{
    int terminal = -1;
    const pid_t process = ::forkpty(&terminal, nullptr, nullptr, nullptr);
    if (process == 0) {
        std::vector<const char*> arguments = {"clipsa"};
        for (const std::string& word : words)
            arguments.push_back(word.c_str());
        arguments.push_back(nullptr);
        ::setenv("TERM", "xterm", 1);
        ::execv(tests::program("clipsa").c_str(), const_cast<char**>(arguments.data()));
        ::_exit(127);
    }
    std::string shown;
    char bytes[512];
    for (ssize_t count = 0; (count = ::read(terminal, bytes, sizeof bytes)) > 0;)
        shown.append(bytes, static_cast<std::size_t>(count));
    int status = -1;
    ::waitpid(process, &status, 0);
    ::close(terminal);
    EXPECT_EQ(status, 0) << shown;
    return shown;
}

TEST_F(MediaTools, ShowABarOnATerminalOfWhichNothingIsLeft)
{
    const Words thumbnails = {"thumbnails", movie("long-gop.mp4"), "-n", "50", "-o", folder};
    EXPECT_THAT(shownOnATerminal(thumbnails), AllOf(HasSubstr("Making pictures ["), testing::EndsWith("\r\033[K")));
    const Words trim = {"trim", movie("groups.mp4"), "--from", "0.5", "-o", directory.path() / "trimmed.mp4"};
    EXPECT_THAT(shownOnATerminal(trim), AllOf(HasSubstr("Trimming ["), testing::EndsWith("\r\033[K")));
    const std::string saved = shownOnATerminal({"save", movie("long-gop.mp4")});
    EXPECT_THAT(saved, AllOf(HasSubstr("Saving ["), HasSubstr("]   0 %"), HasSubstr("\r\033[K/")));
}

TEST_F(MediaTools, TellWhatAMovieIsMadeOf)
{
    const QJsonObject facts = probe(movie("clock.mp4"));
    EXPECT_EQ(facts["container"], "MP4");
    EXPECT_EQ(facts["duration"], 4.0);
    const QJsonObject picture = facts["video"][0].toObject();
    EXPECT_EQ(picture["codec"], "h264");
    EXPECT_EQ(picture["profile"], "High");
    EXPECT_EQ(picture["width"], 640);
    EXPECT_EQ(picture["height"], 360);
    EXPECT_EQ(picture["rotation"], 0);
    EXPECT_EQ(picture["pictures"], 120);
    EXPECT_NEAR(picture["averageRate"].toDouble(), 30, 0.001);
    EXPECT_EQ(picture["variableRate"], false);
    EXPECT_EQ(picture["keyframes"], 1);
    EXPECT_FALSE(picture.contains("medianKeyframeDistance"));
    ASSERT_EQ(facts["audio"].toArray().size(), 2);
    EXPECT_EQ(facts["audio"][0]["title"], "App sound");
    EXPECT_EQ(facts["audio"][0]["layout"], "stereo");
    EXPECT_EQ(facts["audio"][1]["title"], "Microphone");
    EXPECT_EQ(facts["audio"][1]["channels"], 1);
    EXPECT_EQ(facts["audio"][1]["sampleRate"], 48000);
    EXPECT_NEAR(facts["audio"][1]["bitRate"].toDouble(), 64000, 3000);
}

TEST_F(MediaTools, TellHowAMovieIsTurnedTimedAndGrouped)
{
    EXPECT_EQ(probe(movie("rotated.mp4"))["video"][0]["rotation"], 270);
    const QJsonObject turned = probe(movie("rotated-clockwise.mp4"))["video"][0].toObject();
    EXPECT_EQ(turned["rotation"], 90);
    EXPECT_EQ(turned["displayWidth"], 360);
    EXPECT_EQ(probe(movie("non-square.mp4"))["video"][0]["displayWidth"], 640);
    const QJsonObject uneven = probe(movie("vfr.mkv"))["video"][0].toObject();
    EXPECT_EQ(uneven["variableRate"], true);
    EXPECT_NEAR(uneven["averageRate"].toDouble(), 20.72, 0.01);
    EXPECT_NEAR(uneven["longestPicture"].toDouble(), 0.447, 0.001);
    const QJsonObject grouped = probe(movie("groups.mp4"))["video"][0].toObject();
    EXPECT_EQ(grouped["keyframes"], 8);
    EXPECT_EQ(grouped["medianKeyframeDistance"], 1.0);
    EXPECT_EQ(probe(movie("vp9.webm"))["video"][0]["variableRate"], false) << "its times are rounded to milliseconds";
    EXPECT_EQ(probe(movie("edit-list.mp4"))["video"][0]["pictures"], 90) << "what is hidden is no picture";
    EXPECT_EQ(probe(movie("edit-list.mp4"))["video"][0]["keyframes"], 1);
    EXPECT_EQ(probe(movie("audio-only.m4a"))["video"].toArray().size(), 0);
    EXPECT_EQ(probe(movie("one-frame.mp4"))["video"][0]["pictures"], 1);
}

TEST_F(MediaTools, TellPeopleInWords)
{
    EXPECT_EQ(run({"probe", movie("rotated-clockwise.mp4")}), 0);
    EXPECT_THAT(printed, HasSubstr("shown turned by 90° clockwise, as 360×640"));
    EXPECT_THAT(printed, HasSubstr("120 pictures, 30.00 a second"));
    EXPECT_THAT(printed, HasSubstr("“Microphone”, 48000 Hz, mono"));
    EXPECT_EQ(run({"probe", movie("groups.mp4")}), 0);
    EXPECT_THAT(printed, HasSubstr("8 keyframes, 1.00 s apart (1.00 to 1.00 s)"));
}

TEST(JsonObject, QuotesWhateverStandsInAFile)
{
    host::JsonObject object;
    object.add("a", "\"\\\n\x01 é 𝄞")
        .add("b", "\xFF\xC3 x\xED\xA0\x80")
        .add("c", std::nan(""))
        .add("d", 0.5)
        .add("e", -3);
    const auto parsed = QJsonDocument::fromJson(QByteArray::fromStdString(object.text())).object();
    EXPECT_EQ(parsed["a"].toString().toStdString(), "\"\\\n\x01 é 𝄞");
    EXPECT_THAT(parsed["b"].toString().toStdString(), StartsWith("\uFFFD\uFFFD x\uFFFD"));
    EXPECT_TRUE(parsed["c"].isNull());
    EXPECT_EQ(parsed["d"], 0.5);
    EXPECT_EQ(parsed["e"], -3);
}

} // namespace
