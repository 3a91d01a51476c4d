// A file that is there whole, under its name, or not at all; on all kinds of file systems.
#include "linux/posix/NewFile.h"

#include "support/Names.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/SystemCalls.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <fcntl.h>
#include <optional>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;
using tests::namesIn;
using tests::PrivateDirectory;
using tests::RefusedSystemCall;
namespace fs = std::filesystem;

const RefusedSystemCall kNoFlags{SYS_renameat2, EINVAL};

class ANewFile : public testing::Test {
protected:
    ~ANewFile() override { tests::systemCalls() = {}; }

    /// With some bytes in it, and sealed.
    posix::NewFile make() const
    {
        auto made = posix::NewFile::make(parent.get());
        EXPECT_TRUE(made) << made.error()->description();
        EXPECT_EQ(::write(made.value().descriptor(), "contents", 8), 8);
        EXPECT_TRUE(made.value().seal());
        return std::move(made).value();
    }
    /// As make(), and named, on a thread where `refused` are refused.
    int publish(const std::vector<RefusedSystemCall>& refused, const std::string& name = "movie.mp4") const
    {
        int number = -1;
        tests::whileRefusing(refused, [&] { number = make().takeName(name); });
        return number;
    }
    void forgetAll() const
    {
        for (const std::string& name : namesIn(place))
            fs::remove(place / name);
    }
    std::string contents(const std::string& name = "movie.mp4") const { return PrivateDirectory::read(place / name); }

    PrivateDirectory directory;
    const fs::path place = directory.write("place/x", "").parent_path();
    const posix::FileDescriptor parent{::open(place.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)};

    void SetUp() override { fs::remove(place / "x"); }
};

TEST_F(ANewFile, HasNoNameUntilItIsNamed)
{
    posix::NewFile file = make();
    EXPECT_FALSE(file.isHidden());
    EXPECT_THAT(namesIn(place), IsEmpty());
    EXPECT_EQ(file.takeName("movie.mp4"), 0);
    EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
    EXPECT_EQ(contents(), "contents");
}

TEST_F(ANewFile, IsMadeAsPrivateAsTheUserWantsFilesToBe)
{
    const mode_t before = ::umask(0);
    tests::whileRefusing({}, [&] { EXPECT_EQ(make().takeName("open"), 0); });
    tests::whileRefusing({tests::noUnnamedFiles()}, [&] { EXPECT_EQ(make().takeName("hidden"), 0); });
    ::umask(027);
    EXPECT_EQ(make().takeName("closed"), 0);
    ::umask(before);
    EXPECT_EQ(fs::status(place / "open").permissions(), fs::perms(0666));
    EXPECT_EQ(fs::status(place / "hidden").permissions(), fs::perms(0666));
    EXPECT_EQ(fs::status(place / "closed").permissions(), fs::perms(0640));
}

TEST_F(ANewFile, IsReadByNobodyWhoMayNotReadWhatItWasMadeFrom)
{
    const mode_t before = ::umask(022);
    const std::pair<mode_t, mode_t> kModes[] = {{0666, 0644}, {0640, 0640}, {04604, 0604}, {0, 0600}, {0444, 0644}};
    for (const auto& [given, kept] : kModes) {
        posix::NewFile file = make();
        EXPECT_EQ(file.keepAsPrivateAs(S_IFREG | given), 0);
        struct stat status = {};
        ASSERT_EQ(::fstat(file.descriptor(), &status), 0);
        EXPECT_EQ(status.st_mode & 07777, kept) << given;
    }
    ::umask(before);
}

TEST_F(ANewFile, IsAsPrivateAsCanBeWhereFilesHaveNoPermissions)
{
    tests::whileRefusing({{SYS_fchmod, EPERM}}, [&] { EXPECT_EQ(make().keepAsPrivateAs(0600), 0); });
    tests::whileRefusing({{SYS_fchmod, EIO}}, [&] { EXPECT_EQ(make().keepAsPrivateAs(0600), EIO); });
}

TEST_F(ANewFile, ReplacesNothingAndCanTakeAnotherName)
{
    directory.write("place/movie.mp4", "somebody's");
    for (const auto& refused : {std::vector<RefusedSystemCall>{},
                                {tests::noUnnamedFiles()},
                                {tests::noUnnamedFiles(), kNoFlags},
                                {tests::noUnnamedFiles(), kNoFlags, {SYS_linkat, EPERM}}}) {
        tests::whileRefusing(refused, [&] {
            posix::NewFile file = make();
            EXPECT_EQ(file.takeName("movie.mp4"), EEXIST);
            EXPECT_EQ(file.isHidden(), !refused.empty()) << "it is not copied for a name that is taken";
            EXPECT_EQ(file.takeName("other.mp4"), 0);
            EXPECT_FALSE(file.isHidden());
        });
        EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4", "other.mp4"));
        EXPECT_EQ(contents(), "somebody's");
        EXPECT_EQ(contents("other.mp4"), "contents");
        fs::remove(place / "other.mp4");
    }
}

TEST_F(ANewFile, TakesThePlaceOfAnotherWhenItIsTold)
{
    for (const bool isHidden : {false, true}) {
        directory.write("place/movie.mp4", "what was there");
        int number = -1;
        const std::vector<RefusedSystemCall> refused =
            isHidden ? std::vector{tests::noUnnamedFiles()} : std::vector<RefusedSystemCall>();
        const auto replace = [&] { number = make().replace("movie.mp4"); };
        if (isHidden)
            tests::whileRefusing(refused, replace);
        else
            replace();
        EXPECT_EQ(number, 0);
        EXPECT_EQ(contents(), "contents");
        EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
    }
}

TEST_F(ANewFile, ThatCannotTakeThePlaceOfAnotherLeavesNothingBehind)
{
    directory.write("place/movie.mp4/within", "it is a directory");
    EXPECT_EQ(make().replace("movie.mp4"), EISDIR);
    EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
}

TEST_F(ANewFile, TakesNoNameThatIsALinkToNothing)
{
    fs::create_symlink("nowhere", place / "movie.mp4");
    EXPECT_EQ(publish({tests::noUnnamedFiles(), kNoFlags, {SYS_linkat, EPERM}}), EEXIST);
    EXPECT_TRUE(fs::is_symlink(place / "movie.mp4"));
    EXPECT_THAT(namesIn(place), SizeIs(1));
}

TEST_F(ANewFile, ThatIsHiddenGoesWhenItGetsNoName)
{
    tests::whileRefusing({tests::noUnnamedFiles()}, [&] {
        std::optional<posix::NewFile> file(make());
        EXPECT_TRUE(file->isHidden());
        const std::string pattern = ".clipsa-" + std::to_string(::getpid()) + "-";
        EXPECT_THAT(namesIn(place),
                    ElementsAre(testing::AllOf(testing::StartsWith(pattern), testing::EndsWith(".part"))));
        posix::NewFile moved(std::move(*file));
        file.reset();
        EXPECT_THAT(namesIn(place), SizeIs(1)) << "another has it now";
    });
    EXPECT_THAT(namesIn(place), IsEmpty());
}

TEST_F(ANewFile, ThatIsHiddenStaysUnderItsNameWhateverComesLater)
{
    for (const auto& refused : {std::vector<RefusedSystemCall>{}, {kNoFlags}, {kNoFlags, {SYS_linkat, EPERM}}}) {
        auto all = refused;
        all.push_back(tests::noUnnamedFiles());
        EXPECT_EQ(publish(all), 0);
        EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4")) << refused.size();
        EXPECT_EQ(contents(), "contents");
        forgetAll();
    }
}

TEST_F(ANewFile, TakesNoHiddenNameThatIsInUse)
{
    tests::whileRefusing({tests::noUnnamedFiles()}, [&] {
        const posix::NewFile first = make();
        const std::string name = namesIn(place).front();
        const std::string start = ".clipsa-" + std::to_string(::getpid()) + "-";
        const int number = std::stoi(name.substr(start.size()));
        const std::string next = start + std::to_string(number + 1) + ".part";
        directory.write("place/" + next, "somebody's");
        const posix::NewFile second = make();
        EXPECT_THAT(namesIn(place), SizeIs(3));
        EXPECT_EQ(contents(next), "somebody's");
    });
}

TEST_F(ANewFile, IsMadeAnewWhenASweepTookItForADeadOne)
{
    int calls = 0;
    tests::systemCalls().locking = [&](int) -> std::optional<ssize_t> {
        if (++calls > 1)
            return std::nullopt;
        for (const std::string& name : namesIn(place))
            fs::remove(place / name);
        return std::nullopt;
    };
    EXPECT_EQ(publish({tests::noUnnamedFiles()}), 0);
    EXPECT_EQ(calls, 2);
    EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
}

TEST_F(ANewFile, IsMadeAnewWhenASweepIsAboutToTakeIt)
{
    int calls = 0;
    tests::systemCalls().locking = [&](int) -> std::optional<ssize_t> {
        if (++calls > 1)
            return std::nullopt;
        errno = EWOULDBLOCK;
        return -1;
    };
    EXPECT_EQ(publish({tests::noUnnamedFiles()}), 0);
    EXPECT_EQ(calls, 2);
    EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4")) << "and the first one is left to the sweep";
}

TEST_F(ANewFile, IsMadeWhereThereAreNoLocks)
{
    EXPECT_EQ(publish({tests::noUnnamedFiles(), {SYS_flock, EOPNOTSUPP}}), 0);
}

TEST_F(ANewFile, IsLockedWhileItIsHidden)
{
    tests::whileRefusing({tests::noUnnamedFiles()}, [&] {
        posix::NewFile file = make();
        posix::sweepNewFiles(parent.get());
        EXPECT_THAT(namesIn(place), SizeIs(1));
        EXPECT_EQ(file.takeName("movie.mp4"), 0);
    });
}

TEST_F(ANewFile, ThatCannotBeMadeSaysWhy)
{
    for (const int number : {EACCES, ENOSPC, EROFS, ENOTDIR}) {
        tests::whileRefusing({tests::noUnnamedFiles(number)}, [&] {
            const auto made = posix::NewFile::make(parent.get());
            ASSERT_FALSE(made);
            EXPECT_EQ(made.error()->code(), number);
        });
        tests::whileRefusing({tests::noUnnamedFiles(), {SYS_openat, number, 2, O_CREAT}}, [&] {
            const auto made = posix::NewFile::make(parent.get());
            ASSERT_FALSE(made);
            EXPECT_EQ(made.error()->code(), number);
        });
    }
    EXPECT_THAT(namesIn(place), IsEmpty());
}

TEST_F(ANewFile, ThatCannotBeDatedOrBroughtToTheDiskSaysWhy)
{
    tests::whileRefusing({{SYS_utimensat, EIO}}, [&] {
        auto made = posix::NewFile::make(parent.get());
        ASSERT_TRUE(made);
        const auto sealed = made.value().seal({5, 6});
        ASSERT_FALSE(sealed);
        EXPECT_EQ(sealed.error()->code(), EIO);
    });
    tests::whileRefusing({{SYS_fsync, ENOSPC}}, [&] {
        auto made = posix::NewFile::make(parent.get());
        ASSERT_TRUE(made);
        const auto sealed = made.value().seal({5, 6});
        ASSERT_FALSE(sealed);
        EXPECT_EQ(sealed.error()->code(), ENOSPC);
    });
}

TEST_F(ANewFile, HasTheDateThatItIsSealedWith)
{
    auto made = posix::NewFile::make(parent.get());
    ASSERT_TRUE(made && made.value().seal({1'500'000'000, 250'000'000}));
    struct stat status = {};
    ASSERT_EQ(::fstat(made.value().descriptor(), &status), 0);
    EXPECT_EQ(status.st_mtim.tv_sec, 1'500'000'000);
    EXPECT_EQ(status.st_mtim.tv_nsec, 250'000'000);
    EXPECT_NE(status.st_atim.tv_sec, 1'500'000'000) << "when it is read is nobody's business";
}

TEST_F(ANewFile, ThatCannotGetItsNameSaysWhy)
{
    for (const int number : {ENOSPC, EIO, EACCES, EROFS}) {
        EXPECT_EQ(publish({{SYS_linkat, number}}), number);
        EXPECT_EQ(publish({tests::noUnnamedFiles(), {SYS_renameat2, number}}), number);
        EXPECT_EQ(publish({tests::noUnnamedFiles(), kNoFlags, {SYS_linkat, number}, {SYS_renameat, number}}), number);
    }
    EXPECT_THAT(namesIn(place), IsEmpty());
}

TEST_F(ANewFile, ThatGotASecondNameLosesTheFirst)
{
    EXPECT_EQ(publish({tests::noUnnamedFiles(), kNoFlags, {SYS_renameat, EIO}}), 0);
    EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
    EXPECT_EQ(fs::hard_link_count(place / "movie.mp4"), 1U);
}

/// File systems where a file without a name cannot get one, in any of the ways to say so.
class ANewFileWithoutLinks : public ANewFile, public testing::WithParamInterface<int> {};

TEST_P(ANewFileWithoutLinks, IsCopiedWithItsContentsDateAndPermissions)
{
    tests::whileRefusing({{SYS_linkat, GetParam()}, tests::noReflinks()}, [&] {
        auto made = posix::NewFile::make(parent.get());
        ASSERT_TRUE(made);
        ASSERT_EQ(::write(made.value().descriptor(), "contents", 8), 8);
        ASSERT_EQ(made.value().keepAsPrivateAs(0600), 0);
        ASSERT_TRUE(made.value().seal({1'500'000'000, 0}));
        EXPECT_EQ(made.value().takeName("movie.mp4"), 0);
        EXPECT_FALSE(made.value().isHidden());
    });
    EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
    EXPECT_EQ(contents(), "contents");
    struct stat status = {};
    ASSERT_EQ(::stat((place / "movie.mp4").c_str(), &status), 0);
    EXPECT_EQ(status.st_mtim.tv_sec, 1'500'000'000);
    EXPECT_EQ(status.st_mode & 07777, 0600U);
}

const auto kErrorName = [](const auto& error) { return std::string(::strerrorname_np(error.param)); };

INSTANTIATE_TEST_SUITE_P(Errors, ANewFileWithoutLinks,
                         testing::Values(EPERM, EOPNOTSUPP, ENOENT, EXDEV, EINVAL, ENOSYS), kErrorName);

TEST_F(ANewFile, ThatIsCopiedForItsNameFailsAsTheCopyDoes)
{
    const RefusedSystemCall noLinks{SYS_linkat, EPERM};
    const RefusedSystemCall failures[] = {{SYS_openat, EMFILE, 2, O_CREAT},
                                          {SYS_fchmod, EIO},
                                          {SYS_copy_file_range, ENOSPC},
                                          {SYS_utimensat, EROFS, 2, 0},
                                          {SYS_renameat2, EDQUOT}};
    for (const RefusedSystemCall& failure : failures) {
        // Made before: only what follows fails.
        posix::NewFile file = make();
        int number = 0;
        tests::whileRefusing({noLinks, tests::noReflinks(), failure}, [&] { number = file.takeName("movie.mp4"); });
        EXPECT_EQ(number, failure.error);
        EXPECT_THAT(namesIn(place), SizeIs(file.isHidden() ? 1 : 0)) << failure.error;
        // Nothing of it is lost: it is somebody's, and can be tried again.
        posix::sweepNewFiles(parent.get());
        EXPECT_EQ(file.takeName("movie.mp4"), 0);
        EXPECT_EQ(contents(), "contents");
        EXPECT_THAT(namesIn(place), ElementsAre("movie.mp4"));
        forgetAll();
    }
}

/// File systems without unnamed files, in any of the ways to say so.
class ANewFileWhereAllHaveNames : public ANewFile, public testing::WithParamInterface<int> {};

TEST_P(ANewFileWhereAllHaveNames, IsHidden)
{
    EXPECT_EQ(publish({tests::noUnnamedFiles(GetParam()), {SYS_linkat, EIO}}), 0);
    EXPECT_EQ(contents(), "contents");
}

INSTANTIATE_TEST_SUITE_P(Errors, ANewFileWhereAllHaveNames, testing::Values(EOPNOTSUPP, EISDIR, EINVAL, ENOENT, ENOSYS),
                         kErrorName);

TEST_F(ANewFile, IsRenamedWithoutFlagsWhereTheyAreUnknown)
{
    for (const int number : {EINVAL, ENOSYS}) {
        EXPECT_EQ(publish({tests::noUnnamedFiles(), {SYS_renameat2, number}, {SYS_linkat, EPERM}}), 0);
        EXPECT_EQ(contents(), "contents");
        forgetAll();
    }
}

} // namespace
