// How a movie gets into the library: under which name, with which date, in which ways, and beside whom.

#include "linux/photos/LibraryFixture.h"
#include "support/RefusedSystemCalls.h"

#include <future>
#include <set>
#include <sys/file.h>
#include <thread>

namespace {

using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::namesIn;
using tests::PrivateDirectory;
using tests::RefusedSystemCall;
namespace fs = std::filesystem;

class TheVideoLibrary : public tests::LibraryFixture {};

TEST_F(TheVideoLibrary, NamesAMovieAfterItsAppAndDate)
{
    const auto outcome = save();
    EXPECT_TRUE(outcome.success) << outcome.text();
    EXPECT_EQ(outcome.completions, 1);
    EXPECT_THAT(namesIn(videos), ElementsAre(name));
    EXPECT_THAT(published, ElementsAre(videos / name));
    EXPECT_THAT(errors(), IsEmpty());
    EXPECT_THAT(log.texts(base::MemoryLog::Line::Kind::Message),
                ElementsAre("saved in the library: " + (videos / name).native()));
}

TEST_F(TheVideoLibrary, HoldsTheWholeMovieAndLeavesTheRecordingAsItWas)
{
    const double before = tests::modified(source);
    ASSERT_TRUE(save().success);
    EXPECT_TRUE(tests::holds(videos / name, bytes));
    EXPECT_TRUE(tests::holds(source, bytes));
    EXPECT_EQ(tests::modified(source), before);
    // A second name of the same file would change whenever the first one is written to.
    EXPECT_EQ(fs::hard_link_count(videos / name), 1U);
}

TEST_F(TheVideoLibrary, IsAsPrivateAsTheRecording)
{
    ASSERT_EQ(::chmod(source.c_str(), 0600), 0);
    ASSERT_TRUE(save().success);
    EXPECT_EQ(fs::status(published.back()).permissions(), fs::perms(0600));
    tests::whileRefusing({tests::noUnnamedFiles()}, [&] {
        ASSERT_TRUE(save().success);
        EXPECT_EQ(fs::status(published.back()).permissions(), fs::perms(0600));
    });
}

TEST_F(TheVideoLibrary, IsReadByThoseWhoMayReadTheRecording)
{
    const mode_t before = ::umask(022);
    ASSERT_EQ(::chmod(source.c_str(), 0640), 0);
    EXPECT_TRUE(save().success);
    ::umask(before);
    ASSERT_EQ(published.size(), 1U);
    EXPECT_EQ(fs::status(published.back()).permissions(), fs::perms(0640));
}

TEST_F(TheVideoLibrary, KeepsTheDateOfTheRecording)
{
    recording.date = base::Date{1'500'000'000.25};
    ASSERT_TRUE(save().success);
    EXPECT_EQ(tests::modified(published.front()), 1'500'000'000.25);
}

TEST_F(TheVideoLibrary, TakesTheDateOfTheFileForWantOfABetterOne)
{
    recording = {};
    const auto date = tests::localDate(2025, 1, 2, 3, 4, 5);
    const timespec times[] = {{0, UTIME_OMIT}, {static_cast<std::time_t>(date.secondsSince1970), 500'000'000}};
    ASSERT_EQ(::utimensat(AT_FDCWD, source.c_str(), times, 0), 0);
    ASSERT_TRUE(save().success);
    EXPECT_THAT(namesIn(videos), ElementsAre("Recording 2025-01-02 03-04-05.mp4"));
    EXPECT_EQ(tests::modified(published.front()), date.secondsSince1970 + 0.5);
}

TEST_F(TheVideoLibrary, NeverReplacesAFile)
{
    home.write("Videos/" + name, "mine");
    fs::create_symlink("nowhere", videos / "Tux Racer 2026-11-21 15-04-05 (2).mp4");
    ASSERT_TRUE(save().success);
    ASSERT_TRUE(save().success);
    EXPECT_THAT(namesIn(videos),
                ElementsAre("Tux Racer 2026-11-21 15-04-05 (2).mp4", "Tux Racer 2026-11-21 15-04-05 (3).mp4",
                            "Tux Racer 2026-11-21 15-04-05 (4).mp4", name));
    EXPECT_EQ(PrivateDirectory::read(videos / name), "mine");
    EXPECT_TRUE(tests::holds(published.front(), bytes));
    EXPECT_EQ(published.front(), videos / "Tux Racer 2026-11-21 15-04-05 (3).mp4");
}

TEST_F(TheVideoLibrary, IsMadeWhenItIsNotThere)
{
    auto with = options();
    with.directories.videos = home.path() / "Media/Videos";
    EXPECT_TRUE(save(base::Url::fromPath(source), with).success);
    EXPECT_THAT(namesIn(home.path() / "Media/Videos"), ElementsAre(name));
}

TEST_F(TheVideoLibrary, MayBeALinkToADirectory)
{
    fs::create_directory(home.path() / "disk");
    fs::create_directory_symlink("disk", videos);
    EXPECT_TRUE(save().success);
    EXPECT_THAT(namesIn(home.path() / "disk"), ElementsAre(name));
    EXPECT_THAT(published, ElementsAre(videos / name)) << "as the user finds it";
}

TEST_F(TheVideoLibrary, FindsMoviesWhereTheDevicesPathsReallyAre)
{
    auto with = options();
    with.resolvedPath = [this](const std::string& path) { return home.path().native() + "/cache" + path.substr(7); };
    EXPECT_TRUE(save(base::Url::fromPath("/device/movie.mp4"), with).success);
}

TEST_F(TheVideoLibrary, KeepsTheKindOfAMovieThatIsNotMPEG4)
{
    ASSERT_TRUE(save(home.write("a/clip.webm", bytes)).success);
    EXPECT_THAT(namesIn(videos), ElementsAre("Tux Racer 2026-11-21 15-04-05.webm"));
}

TEST_F(TheVideoLibrary, HasReadTheMovieEvenIfItGoesRightBehindTheChange)
{
    bool saved = false;
    photos::VideoLibrary(options(), log, works)
        .performChanges(
            [&](platform::PhotoLibraryChange& change) {
                change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
                fs::remove(source);
            },
            [&](bool success, const base::ErrorRef&) { saved = success; });
    EXPECT_TRUE(saved);
    EXPECT_TRUE(tests::holds(videos / name, bytes));
}

TEST_F(TheVideoLibrary, WorksOnAThreadOfItsOwnUntilTheCompletionHasReturned)
{
    const auto here = std::this_thread::get_id();
    std::promise<void> goOn;
    std::vector<bool> busy;
    {
        photos::VideoLibrary library(options(), log, works);
        library.performChanges(
            [&](platform::PhotoLibraryChange&) {
                goOn.get_future().wait();
                EXPECT_NE(std::this_thread::get_id(), here);
            },
            [&](bool, const base::ErrorRef&) {
                EXPECT_NE(std::this_thread::get_id(), here);
                busy.push_back(!works.isEmpty());
            });
        busy.push_back(!works.isEmpty());
        goOn.set_value();
    }
    EXPECT_THAT(busy, ElementsAre(true, true));
    EXPECT_TRUE(works.isEmpty());
}

TEST_F(TheVideoLibrary, FinishesAllThatWasBegunBeforeItGoes)
{
    std::promise<void> goOn;
    const std::shared_future<void> mayGoOn = goOn.get_future();
    int saved = 0;
    {
        photos::VideoLibrary library(options(), log, works);
        for (int i = 0; i < 3; ++i)
            library.performChanges(
                [&, mayGoOn](platform::PhotoLibraryChange& change) {
                    mayGoOn.wait();
                    change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
                },
                [&](bool success, const base::ErrorRef&) { saved += success ? 1 : 0; });
        goOn.set_value();
    }
    EXPECT_EQ(saved, 3);
    EXPECT_EQ(namesIn(videos).size(), 3U);
}

TEST_F(TheVideoLibrary, TellsHowFarItIsWithAllMoviesOfAChange)
{
    std::vector<double> told;
    works.setChangeHandler([&] {
        if (const auto progress = works.progress())
            told.push_back(*progress);
    });
    // By hand it goes in steps of a mebibyte.
    const auto size = static_cast<double>(kSize);
    tests::whileRefusing({tests::noReflinks(), {SYS_copy_file_range, EXDEV}, {SYS_sendfile, EINVAL}}, [&] {
        photos::VideoLibrary(options(), log, works)
            .performChanges(
                [&](platform::PhotoLibraryChange& change) {
                    change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
                    change.createAssetFromVideoAtFileURL(base::Url::fromPath(source));
                },
                [](bool success, const base::ErrorRef&) { EXPECT_TRUE(success); });
    });
    works.setChangeHandler({});
    const std::vector<double> parts = {1048576 / size, 2097152 / size, 1, 1 + 1048576 / size, 1 + 2097152 / size, 2};
    ASSERT_EQ(told.size(), parts.size());
    for (std::size_t i = 0; i < parts.size(); ++i)
        EXPECT_DOUBLE_EQ(told[i], parts[i] / 2) << i;
}

TEST_F(TheVideoLibrary, IsAtWorkUntilAllIsLetGoThatItWasGiven)
{
    std::vector<std::string> story;
    const auto told = [&](const char* what) {
        // Told when its last owner goes.
        return std::shared_ptr<void>(nullptr, [&story, this, what](void*) {
            story.push_back(std::string(what) + (works.isEmpty() ? " late" : " in time"));
        });
    };
    photos::VideoLibrary(options(), log, works)
        .performChanges(
            [held = told("the change")](platform::PhotoLibraryChange&) {},
            [held = told("the completion"), &story](bool, const base::ErrorRef&) { story.emplace_back("completed"); });
    EXPECT_THAT(story, ElementsAre("completed", "the change in time", "the completion in time"));
    EXPECT_TRUE(works.isEmpty());
}

TEST_F(TheVideoLibrary, CanBeToldToGiveUpWhileItCopies)
{
    auto with = options();
    with.goOn = [] { return false; };
    tests::whileRefusing({tests::noReflinks()}, [&] {
        const auto outcome = save(base::Url::fromPath(source), with);
        expectFailure(outcome, ECANCELED);
        EXPECT_THAT(outcome.text(), testing::EndsWith(": it was given up")) << "which the library can do nothing about";
    });
}

/// One that can do less than the one that the tests run on.
struct FileSystem {
    std::string name;
    std::vector<RefusedSystemCall> refused;

    friend void PrintTo(const FileSystem& system, std::ostream* stream) { *stream << system.name; }
};

class TheVideoLibraryOn : public tests::LibraryFixture, public testing::WithParamInterface<FileSystem> {};

TEST_P(TheVideoLibraryOn, HoldsTheWholeMovieAndNothingElse)
{
    recording.date = base::Date{1'500'000'000};
    tests::whileRefusing(GetParam().refused, [&] {
        const auto outcome = save();
        EXPECT_TRUE(outcome.success) << outcome.text();
    });
    ASSERT_EQ(published.size(), 1U);
    EXPECT_THAT(namesIn(videos), ElementsAre(fs::path(published.front()).filename()));
    EXPECT_TRUE(tests::holds(published.front(), bytes));
    EXPECT_TRUE(tests::holds(source, bytes));
    EXPECT_EQ(tests::modified(published.front()), 1'500'000'000);
}

TEST_P(TheVideoLibraryOn, NeverReplacesAFile)
{
    home.write("Videos/" + name, "mine");
    tests::whileRefusing(GetParam().refused, [&] { EXPECT_TRUE(save().success); });
    EXPECT_THAT(namesIn(videos), ElementsAre("Tux Racer 2026-11-21 15-04-05 (2).mp4", name));
    EXPECT_EQ(PrivateDirectory::read(videos / name), "mine");
}

const RefusedSystemCall kNoCopies{SYS_copy_file_range, EXDEV};
const RefusedSystemCall kNoSendfile{SYS_sendfile, EINVAL};
const RefusedSystemCall kNoFlags{SYS_renameat2, EINVAL};
const RefusedSystemCall kNoLinks{SYS_linkat, EPERM};

INSTANTIATE_TEST_SUITE_P(
    FileSystems, TheVideoLibraryOn,
    testing::Values(FileSystem{"WithoutReflinks", {tests::noReflinks()}},
                    FileSystem{"WithoutCopiesInTheKernel", {tests::noReflinks(), kNoCopies}},
                    FileSystem{"WithoutAnyWayToCopy", {tests::noReflinks(), kNoCopies, kNoSendfile}},
                    FileSystem{"WithoutUnnamedFiles", {tests::noUnnamedFiles()}},
                    FileSystem{"WithoutUnnamedFilesOnAnOldKernel", {tests::noUnnamedFiles(EISDIR)}},
                    FileSystem{"WithoutFlags", {tests::noUnnamedFiles(), kNoFlags}},
                    FileSystem{"WithoutFlagsAndLinks", {tests::noUnnamedFiles(), kNoFlags, kNoLinks}},
                    FileSystem{"WithoutLinks", {kNoLinks}}, FileSystem{"WithoutFlushing", {{SYS_fsync, EINVAL}}},
                    FileSystem{"WithoutLocks", {tests::noUnnamedFiles(), {SYS_flock, EOPNOTSUPP}}}),
    [](const auto& kind) { return kind.param.name; });

TEST_F(TheVideoLibrary, SweepsWhatWasLeftByOnesThatWereKilled)
{
    home.write("Videos/.clipsa-12-3.part", "half");
    home.write("Videos/.clipsa-notes", "not ours");
    home.write("Videos/film.part", "not ours either");
    const fs::path live = home.write("Videos/.clipsa-45-6.part", "being written");
    const int writer = ::open(live.c_str(), O_RDWR | O_CLOEXEC);
    ASSERT_EQ(::flock(writer, LOCK_EX), 0);
    ASSERT_TRUE(save().success);
    ::close(writer);
    EXPECT_THAT(namesIn(videos), ElementsAre(".clipsa-45-6.part", ".clipsa-notes", name, "film.part"));
}

/// Several libraries at once, each with a movie of its own, all under one name.
void publishTogether(const fs::path& home, photos::LibraryOptions options,
                     const std::vector<RefusedSystemCall>& refused)
{
    constexpr unsigned kLibraries = 8;
    options.published = {};
    base::MemoryLog log;
    base::WorkList works;
    std::set<std::string> contents;
    std::vector<std::thread> threads;
    for (unsigned i = 0; i < kLibraries; ++i) {
        const fs::path movie = home / ("movie" + std::to_string(i) + ".mp4");
        const std::string bytes = tests::movieBytes(500'000, i + 1);
        std::ofstream(movie, std::ios::binary) << bytes;
        contents.insert(bytes);
        threads.emplace_back([=, &log, &works] {
            tests::refuseSystemCalls(refused);
            photos::VideoLibrary library(options, log, works);
            for (int times = 0; times < 3; ++times)
                library.performChanges(
                    [&](platform::PhotoLibraryChange& change) {
                        change.createAssetFromVideoAtFileURL(base::Url::fromPath(movie));
                    },
                    [](bool success, const base::ErrorRef& error) { EXPECT_TRUE(success) << error->description(); });
        });
    }
    for (std::thread& thread : threads)
        thread.join();

    const auto names = namesIn(options.directories.videos);
    EXPECT_EQ(names.size(), 3 * kLibraries);
    EXPECT_THAT(names, Each(testing::EndsWith(".mp4")));
    std::map<std::string, int> found;
    for (const auto& file : names)
        ++found[PrivateDirectory::read(fs::path(options.directories.videos) / file)];
    for (const auto& bytes : contents)
        EXPECT_EQ(found[bytes], 3);
}

TEST_F(TheVideoLibrary, TakesMoviesFromSeveralWithTheSameNameAtOnce)
{
    publishTogether(home.path(), options(), {});
}

TEST_F(TheVideoLibrary, TakesMoviesFromSeveralAtOnceWithoutUnnamedFiles)
{
    publishTogether(home.path(), options(), {tests::noUnnamedFiles()});
}

} // namespace
