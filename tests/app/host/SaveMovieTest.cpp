// `clipsa save`, as a program, on the test movies.
#include "app/host/SaveMovie.h"
#include "app/host/ClipsaProgram.h"
#include "support/ProcessorTime.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <poll.h>
#include <random>
#include <sys/inotify.h>
#include <sys/stat.h>

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

using tests::namesIn;
using tests::parsed;
using tests::refusal;
using tests::Words;

namespace fs = std::filesystem;

TEST(TheSaveCommand, MixesForMostOfItsTimeAndCopiesForTheRest)
{
    EXPECT_DOUBLE_EQ(host::partOfSave(0, 0), 0);
    EXPECT_DOUBLE_EQ(host::partOfSave(0.5, 0), 0.45);
    EXPECT_DOUBLE_EQ(host::partOfSave(1, 0), 0.9);
    EXPECT_DOUBLE_EQ(host::partOfSave(1, 0.5), 0.95);
    EXPECT_DOUBLE_EQ(host::partOfSave(1, 1), 1);
}

TEST(TheSaveCommand, TakesAMovieAndTheNameOfItsApp)
{
    EXPECT_EQ(parsed<host::SaveCommand>({"save", "m.mp4"}).movie, "m.mp4");
    EXPECT_EQ(parsed<host::SaveCommand>({"save", "m.mp4"}).appName, "");
    EXPECT_EQ(parsed<host::SaveCommand>({"save", "--app-name", "Tux Racer", "m.mp4"}).appName, "Tux Racer");
    EXPECT_THAT(refusal({"save"}), HasSubstr("save needs a movie"));
    EXPECT_THAT(refusal({"save", "a", "b"}), HasSubstr("both a and b"));
    EXPECT_THAT(refusal({"save", "a", "-o", "b"}), HasSubstr("save has no option -o"));
}

class SavingFromAShell : public tests::ClipsaProgram {
protected:
    const fs::path home = directory.path();
    const fs::path videos = home / "Videos";
    /// A recording of 21 November 2026, 15:04:05 UTC.
    fs::path recording(const std::string& name)
    {
        const fs::path copy = home / ("race" + fs::path(name).extension().native());
        fs::copy_file(tests::movie(name), copy);
        const timespec times[] = {{0, UTIME_OMIT}, {1'795'273'445, 0}};
        ::utimensat(AT_FDCWD, copy.c_str(), times, 0);
        bytes = tests::PrivateDirectory::read(copy);
        return copy;
    }

    tests::Program::Variables variables() const
    {
        const std::string at = home;
        return {{"HOME", at},
                {"XDG_CACHE_HOME", at + "/.cache"},
                {"XDG_DATA_HOME", at + "/.local/share"},
                {"TZ", "UTC"},
                {"XDG_CONFIG_HOME", at + "/.config"}};
    }
    int save(Words words)
    {
        words.insert(words.begin(), "save");
        return run(words, variables());
    }
    /// What a program that knows movies says of them.
    static std::string ffprobe(const fs::path& movie, const std::string& entries)
    {
        tests::Program program({"ffprobe", "-v", "error", "-show_entries", entries, "-of", "csv=p=0", movie}, {});
        EXPECT_EQ(program.wait(), 0) << program.errors();
        return program.output();
    }
    /// The error is one line; nothing is left on the way, and the recording is as it was.
    void expectFailure(const fs::path& movie)
    {
        EXPECT_THAT(printed, IsEmpty());
        EXPECT_THAT(errors, StartsWith("clipsa: "));
        EXPECT_EQ(std::count(errors.begin(), errors.end(), '\n'), 1) << errors;
        EXPECT_THAT(namesIn(home / ".cache/clipsa"), IsEmpty());
        EXPECT_EQ(tests::PrivateDirectory::read(movie), bytes);
    }

    std::string bytes;
};

TEST_F(SavingFromAShell, PutsTheMovieIntoTheLibraryAndSaysWhere)
{
    const fs::path movie = recording("clock.mp4");
    ASSERT_EQ(save({movie}), 0) << errors;
    EXPECT_THAT(errors, IsEmpty()) << "no bar where there is no terminal, and the sound could be mixed";
    const fs::path saved = videos / "race 2026-11-21 15-04-05.mp4";
    EXPECT_EQ(printed, saved.native() + "\n");
    EXPECT_THAT(namesIn(videos), ElementsAre(saved.filename()));
    EXPECT_EQ(ffprobe(saved, "stream=codec_type"), "video\naudio\n");
    EXPECT_THAT(ffprobe(saved, "format=duration"), StartsWith(ffprobe(movie, "format=duration").substr(0, 3)));
    struct stat status = {};
    ASSERT_EQ(::stat(saved.c_str(), &status), 0);
    EXPECT_EQ(status.st_mtim.tv_sec, 1'795'273'445) << "the recording's date";
    EXPECT_EQ(tests::PrivateDirectory::read(movie), bytes) << "the user's own file is left as it is";
    EXPECT_THAT(namesIn(home / ".cache/clipsa"), IsEmpty()) << "what was made on the way has gone";
    EXPECT_EQ(namesIn(home / ".cache/thumbnails/large").size(), 1U);
    EXPECT_THAT(tests::PrivateDirectory::read(home / ".local/share/recently-used.xbel"),
                HasSubstr("race%202026-11-21%2015-04-05.mp4"));
}

TEST_F(SavingFromAShell, MakesOneTrackOfAllSound)
{
    const fs::path movie = home / "two.mp4";
    tests::Program remux({"ffmpeg", "-v", "error", "-i", tests::movie("clock.mp4"), "-i", tests::movie("clock.mp4"),
                          "-map", "0:v", "-map", "0:a:0", "-map", "1:a:0", "-c", "copy", movie},
                         {});
    ASSERT_EQ(remux.wait(), 0) << remux.errors();
    ASSERT_EQ(ffprobe(movie, "stream=codec_type"), "video\naudio\naudio\n");
    ASSERT_EQ(save({"--app-name", "Tux: Racer", movie}), 0) << errors;
    const Words names = namesIn(videos);
    ASSERT_EQ(names.size(), 1U);
    EXPECT_THAT(names.front(), StartsWith("Tux- Racer 20"));
    EXPECT_EQ(ffprobe(videos / names.front(), "stream=codec_type"), "video\naudio\n");
}

TEST_F(SavingFromAShell, TakesAMovieWithoutSound)
{
    ASSERT_EQ(save({recording("no-sound.mp4")}), 0) << errors;
    EXPECT_EQ(ffprobe(videos / "race 2026-11-21 15-04-05.mp4", "stream=codec_type"), "video\n");
}

TEST_F(SavingFromAShell, SavesTheSameMovieTwice)
{
    const fs::path movie = recording("clock.mp4");
    ASSERT_EQ(save({movie}), 0) << errors;
    ASSERT_EQ(save({movie}), 0) << errors;
    EXPECT_THAT(namesIn(videos), ElementsAre("race 2026-11-21 15-04-05 (2).mp4", "race 2026-11-21 15-04-05.mp4"));
}

TEST_F(SavingFromAShell, SaysWhyAMovieCannotBeOpened)
{
    EXPECT_EQ(save({home / "nothing.mp4"}), 2);
    EXPECT_THAT(errors, HasSubstr("there is no file"));
    const fs::path movie = recording("not-a-movie.mp4");
    EXPECT_EQ(save({movie}), 2);
    EXPECT_THAT(errors, HasSubstr("is not a movie"));
    expectFailure(movie);
    EXPECT_FALSE(fs::exists(videos));
}

TEST_F(SavingFromAShell, SaysWhyTheLibraryTakesNothing)
{
    std::ofstream(videos.native()) << "a file";
    const fs::path movie = recording("clock.mp4");
    EXPECT_EQ(save({movie}), 1);
    EXPECT_THAT(errors, HasSubstr(videos.native() + " is not a directory"));
    expectFailure(movie);
    EXPECT_EQ(tests::PrivateDirectory::read(videos), "a file");
}

TEST_F(SavingFromAShell, SaysWhyNothingMayBeWrittenInTheLibrary)
{
    const tests::WithoutPrivileges here;
    fs::create_directory(videos);
    fs::permissions(videos, fs::perms::owner_read | fs::perms::owner_exec);
    const fs::path movie = recording("clock.mp4");
    EXPECT_EQ(save({movie}), 1);
    EXPECT_THAT(errors, HasSubstr("allow writing there"));
    expectFailure(movie);
}

TEST_F(SavingFromAShell, SavesAMovieAsItIsWhenItsSoundCannotBeMixed)
{
    // There is room for the movie, but not for the mixed one, whose sound is better. In blocks of 512 bytes.
    const fs::path movie = recording("clock.mp4");
    ASSERT_LT(bytes.size(), 150'000U);
    const std::string save = "trap '' XFSZ; ulimit -f 293; exec \"$0\" save \"$1\"";
    tests::Program program({"sh", "-c", save, tests::program("clipsa"), movie}, variables());
    EXPECT_EQ(program.wait(), 0) << program.errors();
    EXPECT_THAT(program.errors(), StartsWith("clipsa: the sound of " + movie.native() + " cannot be mixed ("));
    const fs::path saved = videos / "race 2026-11-21 15-04-05.mp4";
    EXPECT_EQ(program.output(), saved.native() + "\n");
    EXPECT_TRUE(tests::PrivateDirectory::read(saved) == bytes);
    EXPECT_THAT(namesIn(home / ".cache/clipsa"), IsEmpty());
}

TEST_F(SavingFromAShell, SaysWhatDidNotComeAlongWithTheMovie)
{
    fs::create_directories(home / ".local/share");
    std::ofstream(home / ".local/share/recently-used.xbel") << "<xbel> broken";
    ASSERT_EQ(save({recording("clock.mp4")}), 0) << errors;
    const fs::path saved = videos / "race 2026-11-21 15-04-05.mp4";
    EXPECT_EQ(printed, saved.native() + "\n");
    EXPECT_THAT(errors, StartsWith("clipsa: " + saved.native() + " is not among the recent files: "));
    EXPECT_EQ(std::count(errors.begin(), errors.end(), '\n'), 1) << errors;
}

TEST_F(SavingFromAShell, SaysWhichSoundIsLeftOut)
{
    const fs::path movie = home / "silenced.mkv";
    tests::Program remux(
        {"ffmpeg", "-nostdin", "-v", "error", "-i", tests::movie("clock.mp4"), "-map", "0", "-c", "copy", movie}, {});
    ASSERT_EQ(remux.wait(), 0) << remux.errors();
    std::string file = tests::PrivateDirectory::read(movie);
    const std::size_t codec = file.rfind("A_AAC");
    ASSERT_NE(codec, std::string::npos);
    std::ofstream(movie, std::ios::binary) << file.replace(codec, 5, "A_XYZ");
    ASSERT_EQ(save({movie}), 0) << errors;
    EXPECT_EQ(errors, "clipsa: Of “silenced.mkv” does not come along: sound that cannot be decoded.\n");
}

// The moments are spread over the whole work: from the start of the program to the thumbnail and beyond.
TEST_F(SavingFromAShell, LeavesTheWholeMovieOrNothingWheneverItIsKilled)
{
    constexpr int kMoments = 200;
    const fs::path root = home / ".cache/clipsa";
    const fs::path movie = recording("one-frame.mp4");
    tests::Program cut(
        {"ffmpeg", "-v", "error", "-y", "-i", tests::movie("clock.mp4"), "-t", "1", "-map", "0", "-c", "copy", movie},
        {});
    ASSERT_EQ(cut.wait(), 0) << cut.errors();
    bytes = tests::PrivateDirectory::read(movie);
    const Words words = command({"save", "--app-name", "Tux", movie});
    tests::Program first(words, variables());
    const auto whole = tests::waitForWork(first.process());
    ASSERT_EQ(first.wait(), 0) << first.errors();
    const Words saved = namesIn(videos);
    ASSERT_EQ(saved.size(), 1U);
    const std::string wanted = tests::PrivateDirectory::read(videos / saved.front());
    ASSERT_EQ(ffprobe(videos / saved.front(), "stream=codec_type"), "video\naudio\n") << "mixed";

    std::mt19937 random(5);
    int found = 0;
    int leftBehind = 0;
    for (int i = 0; i < kMoments; ++i) {
        SCOPED_TRACE("kill " + std::to_string(i));
        fs::remove_all(videos);
        tests::Program program(words, variables());
        tests::waitForWork(program.process(), whole * (random() % 1000) / 900);
        program.signal(SIGKILL);
        program.wait();
        const Words names = namesIn(videos);
        if (!names.empty()) {
            ASSERT_EQ(names, saved);
            ASSERT_TRUE(tests::PrivateDirectory::read(videos / names.front()) == wanted) << "not whole";
            ++found;
        }
        ASSERT_TRUE(tests::PrivateDirectory::read(movie) == bytes) << "the recording";
        leftBehind += !namesIn(root).empty();
    }
    EXPECT_GT(found, 0);
    EXPECT_LT(found, kMoments);
    EXPECT_GT(leftBehind, 0) << "none was killed in the middle";
    fs::remove_all(videos);
    ASSERT_EQ(save({"--app-name", "Tux", movie}), 0) << errors;
    // The next one sweeps up what the dead ones left; a directory of one that died while making it is empty.
    for (const auto& left : fs::recursive_directory_iterator(root))
        EXPECT_TRUE(left.is_directory() || left.file_size() == 0) << left.path();
    EXPECT_EQ(namesIn(videos), saved);
}

TEST_F(SavingFromAShell, LeavesNothingBehindWhenItIsInterrupted)
{
    const fs::path movie = recording("long-gop.mp4");
    const fs::path root = home / ".cache/clipsa";
    fs::create_directories(root);
    const int watch = ::inotify_init1(IN_CLOEXEC);
    ASSERT_GE(::inotify_add_watch(watch, root.c_str(), IN_CREATE), 0);
    tests::Program program(command({"save", movie}), variables());
    pollfd begun = {watch, POLLIN, 0};
    EXPECT_EQ(::poll(&begun, 1, 60'000), 1) << "nothing is begun";
    ::close(watch);
    program.signal(SIGINT);
    EXPECT_EQ(program.wait(), 128 + SIGINT);
    EXPECT_THAT(program.output(), IsEmpty());
    EXPECT_THAT(program.errors(), IsEmpty());
    EXPECT_THAT(namesIn(videos), IsEmpty());
    EXPECT_THAT(namesIn(root), IsEmpty());
    EXPECT_EQ(tests::PrivateDirectory::read(movie), bytes);
}

} // namespace
