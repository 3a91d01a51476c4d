// A movie that could not be put into the library: whoever made it removes it, so it is kept elsewhere before.
#include "linux/photos/UnsavedMovie.h"

#include "linux/photos/LibraryFixture.h"
#include "linux/posix/FileDescriptor.h"
#include "support/RefusedSystemCalls.h"
#include "support/SystemCalls.h"

#include <fcntl.h>
#include <fstream>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

namespace tests {

namespace {

class UnsavedMovie : public LibraryFixture {
protected:
    UnsavedMovie() { std::ofstream(videos) << "not a directory"; }

    const fs::path first = home.path() / ".local/share/clipsa/unsaved";
    const fs::path second = home.path() / "cache/unsaved";
    std::vector<std::string> kept;
    std::vector<std::string> refusals;
    std::vector<std::string> reasons;

    photos::LibraryOptions keeping()
    {
        photos::LibraryOptions made = options();
        made.unsavedDirectories = {first, second};
        made.unsaved = [this](const base::ErrorRef& why, const base::Result<std::string>& path) {
            reasons.push_back(why->description());
            EXPECT_THAT(errors(), testing::Not(IsEmpty())) << "the log has it first";
            if (path)
                kept.push_back(path.value());
            else
                refusals.push_back(path.error()->description());
        };
        return made;
    }
    Outcome saveKeeping() { return save(base::Url::fromPath(source), keeping()); }
};

} // namespace

TEST_F(UnsavedMovie, IsAnotherNameOfTheSameFile)
{
    const Outcome outcome = saveKeeping();
    EXPECT_FALSE(outcome.success);
    ASSERT_THAT(kept, ElementsAre((first / name).native()));
    EXPECT_TRUE(fs::equivalent(kept.front(), source)) << "it took room on a disk that may be full";
    fs::remove(source);
    EXPECT_TRUE(holds(kept.front(), bytes));
}

TEST_F(UnsavedMovie, TakesThePlaceOfNone)
{
    home.write(".local/share/clipsa/unsaved/" + name, "somebody's");
    saveKeeping();
    saveKeeping(); // as a copy, because the file has another name now
    EXPECT_THAT(kept, ElementsAre((first / "Tux Racer 2026-11-21 15-04-05 (2).mp4").native(),
                                  (first / "Tux Racer 2026-11-21 15-04-05 (3).mp4").native()));
    EXPECT_TRUE(holds(first / name, "somebody's"));
}

TEST_F(UnsavedMovie, IsKeptBesideTheStoreWhereTheUsersDataCannotBeWritten)
{
    home.write(".local/share/clipsa", "not a directory");
    saveKeeping();
    ASSERT_THAT(kept, ElementsAre((second / name).native()));
    EXPECT_TRUE(holds(kept.front(), bytes));
}

TEST_F(UnsavedMovie, IsSaidToBeNowhereWhenItIs)
{
    home.write(".local/share/clipsa", "not a directory");
    home.write("cache/unsaved", "not a directory");
    saveKeeping();
    EXPECT_THAT(kept, IsEmpty());
    EXPECT_THAT(refusals, ElementsAre(HasSubstr(first.native())));
}

TEST_F(UnsavedMovie, WithoutANameLeftIsCopiedWithItsDate)
{
    const posix::FileDescriptor file(::open(source.c_str(), O_RDONLY | O_CLOEXEC));
    const double date = modified(source);
    fs::remove(source);
    const auto path = photos::keepUnsaved(file.get(), {"movie", ".mp4"}, {first});
    ASSERT_TRUE(path) << path.error()->description();
    EXPECT_TRUE(holds(path.value(), bytes));
    EXPECT_EQ(modified(path.value()), date);
    EXPECT_THAT(namesIn(first), SizeIs(1));
}

TEST_F(UnsavedMovie, ThatTheRecorderHasTooIsKeptAsACopy)
{
    const fs::path recorders = home.path() / "recording.mp4";
    fs::create_hard_link(source, recorders);
    saveKeeping();
    ASSERT_THAT(kept, ElementsAre((first / name).native()));
    std::ofstream(recorders) << "the next recording";
    EXPECT_TRUE(holds(kept.front(), bytes)) << "the recorder wrote over it";
}

TEST_F(UnsavedMovie, ThatTheRecorderHasTooIsAnotherNameWhereThereIsNoRoom)
{
    fs::create_hard_link(source, home.path() / "recording.mp4");
    whileRefusing({noReflinks(), {SYS_copy_file_range, ENOSPC}}, [&] { saveKeeping(); });
    ASSERT_THAT(kept, ElementsAre((first / name).native()));
    EXPECT_TRUE(fs::equivalent(kept.front(), source));
    EXPECT_THAT(namesIn(first), SizeIs(1));
}

TEST_F(UnsavedMovie, IsAsPrivateAsItWas)
{
    ASSERT_EQ(::chmod(source.c_str(), 0600), 0);
    saveKeeping();
    fs::create_hard_link(source, home.path() / "recording.mp4");
    saveKeeping();
    ASSERT_THAT(kept, SizeIs(2));
    for (const auto& each : kept)
        EXPECT_EQ(fs::status(each).permissions(), fs::perms(0600)) << each;
}

TEST_F(UnsavedMovie, IsOnTheDiskBeforeItsNameIs)
{
    const fs::path recorders = home.path() / "recording.mp4";
    for (const bool recorderHasItToo : {false, true}) {
        if (recorderHasItToo)
            fs::create_hard_link(source, recorders);
        std::vector<std::string> flushed;
        tests::systemCalls().flushing = [&](int file) -> std::optional<ssize_t> {
            const std::string open = fs::read_symlink("/proc/self/fd/" + std::to_string(file)).native();
            flushed.emplace_back(open == source ? "the movie" : open == first ? "its place" : "a copy");
            return std::nullopt;
        };
        saveKeeping();
        tests::systemCalls() = {};
        EXPECT_THAT(flushed, ElementsAre(recorderHasItToo ? "a copy" : "the movie", "its place"));
        fs::remove_all(first);
    }
}

TEST_F(UnsavedMovie, IsKeptWhereNamesCannotBeMadeToLast)
{
    tests::whileRefusing({{SYS_fsync, EINVAL}}, [&] { saveKeeping(); });
    EXPECT_THAT(kept, ElementsAre((first / name).native()));
}

TEST_F(UnsavedMovie, ThatIsCopiedTakesThePlaceOfThoseThatWereNeverFinished)
{
    fs::create_hard_link(source, home.path() / "recording.mp4");
    home.write(".local/share/clipsa/unsaved/.clipsa-1-2.part", "half");
    saveKeeping();
    EXPECT_THAT(namesIn(first), ElementsAre(name));
}

TEST_F(UnsavedMovie, IsKeptOnlyWhereThatWasAskedFor)
{
    save();
    EXPECT_FALSE(fs::exists(first));
    EXPECT_FALSE(fs::exists(second));
}

TEST_F(UnsavedMovie, IsNoneWhenTheMovieWasSaved)
{
    fs::remove(videos);
    EXPECT_TRUE(saveKeeping().success);
    EXPECT_THAT(kept, IsEmpty());
    EXPECT_FALSE(fs::exists(first));
}

TEST_F(UnsavedMovie, ThatIsNotThereIsSaidToBeNowhere)
{
    save(base::Url::fromPath(home.path() / "gone.mp4"), keeping());
    EXPECT_THAT(kept, IsEmpty());
    EXPECT_THAT(refusals, ElementsAre("there is nothing that could be kept"));
    EXPECT_THAT(reasons, ElementsAre(HasSubstr("gone.mp4"))) << "it is said once which, and why";
}

} // namespace tests
