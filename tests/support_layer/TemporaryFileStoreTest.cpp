#include "support/VKFileManagerExtensions.h"

#include "support/FakeFileManager.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <cctype>
#include <cmath>
#include <cstdint>
#include <limits>

namespace {

using namespace VKExtensions;
using base::MemoryLog;
using Kind = MemoryLog::Line::Kind;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::FileOperation;

const std::string kStore = VKScreenRecorderTempDirectory;
constexpr double kNow = 1'700'000'000;

/// Begins-with for ASCII; the real one is tested with the real file system.
struct AsciiFolding final : platform::StringFolding {
    bool hasPrefix(std::string_view text, std::string_view prefix) const override
    {
        auto lower = [](std::string_view some) {
            std::string result(some);
            for (char& character : result)
                character = static_cast<char>(std::tolower(static_cast<unsigned char>(character)));
            return result;
        };
        return lower(text).starts_with(lower(prefix));
    }
};

std::string lowHalfOf(const base::ErrorRef& error)
{
    const auto address = reinterpret_cast<std::uintptr_t>(error.get());
    return std::to_string(static_cast<std::int32_t>(static_cast<std::uint32_t>(address)));
}

class TemporaryFileStore : public testing::Test {
protected:
    tests::TestSystem machine{base::Date{kNow}};
    tests::FakeFileManager files{machine.system};
    AsciiFolding folding;

    std::string entry(const std::string& name) const { return kStore + "/" + name; }
    void addEntry(const std::string& name, std::int64_t size, double age = 0)
    {
        files.addFile(entry(name), size, base::Date{kNow - age});
    }
    std::vector<std::string> said(Kind kind) const { return machine.log.texts(kind); }
};

class CleaningUp : public TemporaryFileStore {
protected:
    static std::string reported(int code)
    {
        return "error in _vqRemoveFile_srDeleteFilesOlderThanTimeToLiveInSeconds, error code: " + std::to_string(code);
    }
};

// Where it is

TEST_F(TemporaryFileStore, ItsPathEndsWithASlash)
{
    EXPECT_EQ(_srTempPath(files), "/private/var/mobile/Library/Velkor/");
}

// Set-up

TEST_F(TemporaryFileStore, SettingUpMakesTheDirectory)
{
    files.addDirectory("/private/var/mobile/Library");
    _srSetupTempDirectory(files);
    EXPECT_TRUE(files.holds(kStore));
    EXPECT_EQ(machine.log.lines(), (std::vector<MemoryLog::Line>{{Kind::Message, "_srSetupTempDirectory"}}));
}

TEST_F(TemporaryFileStore, SettingUpLeavesWhateverIsThere)
{
    files.addFile("/private/var/mobile/Library/Velkor", 5);
    _srSetupTempDirectory(files);
    EXPECT_THAT(files.calls, ElementsAre("exists " + kStore));
    EXPECT_THAT(said(Kind::Error), IsEmpty());
}

TEST_F(TemporaryFileStore, SettingUpDoesNotMakeTheDirectoriesAboveAndSaysSoOnBothLogs)
{
    _srSetupTempDirectory(files);
    EXPECT_FALSE(files.holds(kStore));
    ASSERT_EQ(machine.log.lines().size(), 3u);
    EXPECT_EQ(machine.log.lines()[0], (MemoryLog::Line{Kind::Message, "_srSetupTempDirectory"}));
    EXPECT_EQ(machine.log.lines()[1].kind, Kind::Console);
    EXPECT_TRUE(machine.log.lines()[1].text.starts_with("error: create directory " + kStore));
    EXPECT_EQ(machine.log.lines()[2], (MemoryLog::Line{Kind::Error, "error creating temp directory"}));
}

// Size

TEST_F(TemporaryFileStore, ItsSizeIsThatOfTheDirectoryEntryAndNotOfWhatItHolds)
{
    addEntry("a.mp4", 1'000'000);
    base::ErrorRef error;
    EXPECT_EQ(_srSizeOfTempDir(files, &error), 4096);
    EXPECT_FALSE(error);
}

TEST_F(TemporaryFileStore, ItsSizeIsNothingAndTheErrorIsPassedOnWhenItCannotBeRead)
{
    const base::ErrorRef scripted = files.fail(FileOperation::Attributes, kStore, EACCES);
    base::ErrorRef error;
    EXPECT_EQ(_srSizeOfTempDir(files, &error), 0);
    EXPECT_EQ(error, scripted);
    EXPECT_EQ(_srSizeOfTempDir(files, nullptr), 0);
}

TEST_F(TemporaryFileStore, ReadingItsSizeLeavesAnEarlierErrorAlone)
{
    files.addDirectory(kStore);
    const base::ErrorRef earlier = base::Error::make("test", 1, "earlier");
    base::ErrorRef error = earlier;
    EXPECT_EQ(_srSizeOfTempDir(files, &error), 4096);
    EXPECT_EQ(error, earlier);
}

// Clean-up by age

TEST_F(CleaningUp, WithATimeToLiveOfZeroDeletesEveryEntryRegardlessOfAge)
{
    addEntry("old.mp4", 10, 1e6);
    addEntry("new.mp4", 20, 0);
    addEntry("from the future.mp4", 40, -1e6);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, 0.0), 70);
    EXPECT_EQ(files.contentsOfDirectory(kStore).value().size(), 0u);
    EXPECT_THAT(said(Kind::Message), ElementsAre("_srDeleteFilesOlderThanTimeToLiveInSeconds: 0", "deleting old file",
                                                 "deleting old file", "deleting old file"));
}

TEST_F(CleaningUp, WithATimeToLiveOfMinusZeroIsTheSame)
{
    addEntry("new.mp4", 20);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, -0.0), 20);
}

TEST_F(CleaningUp, OfAllFilesIsExactlyATimeToLiveOfZero)
{
    addEntry("a.mp4", 10, -50);
    addEntry("b.mp4", 20, 50);
    EXPECT_EQ(_srDeleteAllTempFiles(files), 30);
    EXPECT_FALSE(files.holds(entry("a.mp4")));
    EXPECT_FALSE(files.holds(entry("b.mp4")));
    EXPECT_EQ(said(Kind::Message).front(), "_srDeleteFilesOlderThanTimeToLiveInSeconds: 0");
}

TEST_F(CleaningUp, KeepsAFileAsOldAsTheTimeToLiveAndDeletesOneAFractionOlder)
{
    addEntry("as old.mp4", 10, 60);
    addEntry("older.mp4", 20, 60.25);
    addEntry("younger.mp4", 40, 59.75);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, 60), 20);
    EXPECT_TRUE(files.holds(entry("as old.mp4")));
    EXPECT_FALSE(files.holds(entry("older.mp4")));
    EXPECT_TRUE(files.holds(entry("younger.mp4")));
}

TEST_F(CleaningUp, AgesFilesByTheirModificationAndNotTheirCreation)
{
    files.addFile(entry("edited.mp4"), 10, base::Date{kNow - 1}, base::Date{kNow - 1000});
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, 60), 0);
    EXPECT_TRUE(files.holds(entry("edited.mp4")));
}

TEST_F(CleaningUp, WithANegativeTimeToLiveDeletesEveryEntryOfAHigherAge)
{
    addEntry("new.mp4", 10, 0);
    addEntry("old.mp4", 20, 100);
    addEntry("from the future.mp4", 40, -8);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, -5), 30);
    EXPECT_TRUE(files.holds(entry("from the future.mp4")));
}

TEST_F(CleaningUp, WithATimeToLiveThatIsNotANumberDeletesNothing)
{
    addEntry("old.mp4", 10, 1e9);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, std::nan("")), 0);
    EXPECT_TRUE(files.holds(entry("old.mp4")));
    EXPECT_THAT(said(Kind::Message), ElementsAre("_srDeleteFilesOlderThanTimeToLiveInSeconds: 0"));
}

TEST_F(CleaningUp, LogsTheTimeToLiveTruncatedTowardZero)
{
    constexpr double kInfinity = std::numeric_limits<double>::infinity();
    files.addDirectory(kStore);
    for (const double timeToLive : {59.99, -59.99, -0.5, 1e12, -kInfinity})
        _srDeleteFilesOlderThanTimeToLiveInSeconds(files, timeToLive);
    EXPECT_THAT(said(Kind::Message), ElementsAre("_srDeleteFilesOlderThanTimeToLiveInSeconds: 59",
                                                 "_srDeleteFilesOlderThanTimeToLiveInSeconds: -59",
                                                 "_srDeleteFilesOlderThanTimeToLiveInSeconds: 0",
                                                 "_srDeleteFilesOlderThanTimeToLiveInSeconds: 2147483647",
                                                 "_srDeleteFilesOlderThanTimeToLiveInSeconds: -2147483648"));
}

TEST_F(CleaningUp, ReachesEntriesInTheOrderOfTheListingThroughDoubledSlashes)
{
    addEntry("b.mp4", 1);
    addEntry("a.mp4", 1);
    _srDeleteAllTempFiles(files);
    EXPECT_THAT(files.calls, ElementsAre("list /private/var/mobile/Library/Velkor/",
                                         "attributes /private/var/mobile/Library/Velkor//b.mp4",
                                         "remove /private/var/mobile/Library/Velkor//b.mp4",
                                         "attributes /private/var/mobile/Library/Velkor//a.mp4",
                                         "remove /private/var/mobile/Library/Velkor//a.mp4"));
}

TEST_F(CleaningUp, ListsWithTheSharedManagerAndRemovesWithTheReceiver)
{
    tests::FakeFileManager shared{machine.system};
    files.shared = &shared;
    shared.addFile(entry("a.mp4"), 1);
    addEntry("a.mp4", 10);
    EXPECT_EQ(_srDeleteAllTempFiles(files), 10);
    EXPECT_THAT(shared.calls, ElementsAre("list " + kStore));
    EXPECT_THAT(files.calls, ElementsAre("attributes " + entry("a.mp4"), "remove " + entry("a.mp4")));
}

TEST_F(CleaningUp, DoesNothingAndReportsOnceWhenTheListingFails)
{
    EXPECT_EQ(_srDeleteAllTempFiles(files), 0);
    EXPECT_THAT(files.calls, ElementsAre("list " + kStore));
    EXPECT_THAT(said(Kind::Error), ElementsAre(reported(ENOENT)));
    ASSERT_EQ(said(Kind::Console).size(), 1u);
    EXPECT_TRUE(said(Kind::Console)[0].starts_with("error = list " + kStore));
}

TEST_F(CleaningUp, ReportsAnEntryWhoseAttributesCannotBeReadAndRemovesItAllTheSame)
{
    addEntry("unreadable.mp4", 10);
    const base::ErrorRef error = files.fail(FileOperation::Attributes, entry("unreadable.mp4"), EACCES);
    EXPECT_EQ(_srDeleteAllTempFiles(files), 0);
    EXPECT_FALSE(files.holds(entry("unreadable.mp4")));
    // After the attributes, and again after the removal: the error stays set.
    EXPECT_EQ(machine.log.lines(),
              (std::vector<MemoryLog::Line>{{Kind::Message, "_srDeleteFilesOlderThanTimeToLiveInSeconds: 0"},
                                            {Kind::Error, reported(EACCES)},
                                            {Kind::Console, "error = " + error->description()},
                                            {Kind::Message, "deleting old file"},
                                            {Kind::Error, reported(EACCES)},
                                            {Kind::Console, "error = " + error->description()}}));
}

TEST_F(CleaningUp, KeepsAnEntryOfUnknownAgeUnlessAllGo)
{
    addEntry("unreadable.mp4", 10, 1e9);
    files.fail(FileOperation::Attributes, entry("unreadable.mp4"), EACCES);
    for (const double timeToLive : {60.0, -60.0}) {
        EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, timeToLive), 0);
        EXPECT_TRUE(files.holds(entry("unreadable.mp4")));
    }
}

TEST_F(CleaningUp, GoesOnAfterTheFirstFailureButCountsNoLongerAndReportsAfterEveryStep)
{
    addEntry("a.mp4", 10);
    addEntry("b.mp4", 20);
    addEntry("c.mp4", 40);
    files.fail(FileOperation::Remove, entry("b.mp4"), EBUSY);
    EXPECT_EQ(_srDeleteAllTempFiles(files), 10);
    EXPECT_FALSE(files.holds(entry("a.mp4")));
    EXPECT_TRUE(files.holds(entry("b.mp4")));
    EXPECT_FALSE(files.holds(entry("c.mp4")));
    // b's removal, c's attributes, c's removal.
    EXPECT_THAT(said(Kind::Error), ElementsAre(reported(EBUSY), reported(EBUSY), reported(EBUSY)));
    EXPECT_EQ(said(Kind::Console).size(), 3u);
}

TEST_F(CleaningUp, CountsNothingOfAFileThatCouldNotBeRemoved)
{
    addEntry("a.mp4", 10);
    files.fail(FileOperation::Remove, entry("a.mp4"), EBUSY);
    EXPECT_EQ(_srDeleteAllTempFiles(files), 0);
}

TEST_F(CleaningUp, ReportsTheLatestError)
{
    addEntry("a.mp4", 10);
    addEntry("b.mp4", 10);
    files.fail(FileOperation::Remove, entry("a.mp4"), EBUSY);
    files.fail(FileOperation::Remove, entry("b.mp4"), EACCES);
    _srDeleteAllTempFiles(files);
    EXPECT_THAT(said(Kind::Error), ElementsAre(reported(EBUSY), reported(EBUSY), reported(EACCES)));
}

// Removing one file

class RemovingAFile : public TemporaryFileStore {
protected:
    void remove()
    {
        _srRemoveFile_completion(files, base::Url::fromPath(entry("a.mp4")), [this](const base::ErrorRef& error) {
            EXPECT_TRUE(machine.backgroundQueue.isCurrent());
            completions.push_back(error);
        });
    }
    std::vector<base::ErrorRef> completions;
};

TEST_F(RemovingAFile, HappensLaterOnTheBackgroundQueue)
{
    addEntry("a.mp4", 10);
    remove();
    EXPECT_THAT(files.calls, IsEmpty());
    EXPECT_EQ(machine.defaultQueue.pending(), 0u);
    machine.backgroundQueue.drain();
    EXPECT_FALSE(files.holds(entry("a.mp4")));
    EXPECT_THAT(completions, ElementsAre(nullptr));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

TEST_F(RemovingAFile, ThatIsNotThereIsASuccessAndLogsNothing)
{
    remove();
    machine.drain();
    EXPECT_THAT(completions, ElementsAre(nullptr));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
    EXPECT_THAT(files.calls, ElementsAre("exists " + entry("a.mp4")));
}

TEST_F(RemovingAFile, ThatCannotBeRemovedLogsTheCodeAtDefaultLevelAndPassesTheErrorOn)
{
    addEntry("a.mp4", 10);
    const base::ErrorRef scripted = files.fail(FileOperation::Remove, entry("a.mp4"), EACCES);
    remove();
    machine.drain();
    EXPECT_THAT(completions, ElementsAre(scripted));
    EXPECT_EQ(machine.log.lines(),
              (std::vector<MemoryLog::Line>{{Kind::Message, "_vqRemoveFile error: " + std::to_string(EACCES)}}));
}

TEST_F(RemovingAFile, NeedsNoCompletion)
{
    addEntry("a.mp4", 10);
    _srRemoveFile_completion(files, base::Url::fromPath(entry("a.mp4")), {});
    machine.drain();
    EXPECT_FALSE(files.holds(entry("a.mp4")));
}

// Moving one file

class MovingAFile : public TemporaryFileStore {
protected:
    void move()
    {
        _srMoveFileFromURL_toURL_completion(files, base::Url::fromPath("/from.mp4"), base::Url::fromPath("/to.mp4"),
                                            [this](const base::ErrorRef& error) {
                                                EXPECT_TRUE(machine.defaultQueue.isCurrent());
                                                completions.push_back(error);
                                            });
    }
    std::vector<base::ErrorRef> completions;
};

TEST_F(MovingAFile, HappensLaterOnTheDefaultQueue)
{
    files.addFile("/from.mp4", 10);
    move();
    EXPECT_THAT(files.calls, IsEmpty());
    EXPECT_EQ(machine.backgroundQueue.pending(), 0u);
    machine.defaultQueue.drain();
    EXPECT_TRUE(files.holds("/to.mp4"));
    EXPECT_FALSE(files.holds("/from.mp4"));
    EXPECT_THAT(completions, ElementsAre(nullptr));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

TEST_F(MovingAFile, OntoAnotherReplacesIt)
{
    files.addFile("/from.mp4", 10);
    files.addFile("/to.mp4", 20);
    move();
    machine.drain();
    EXPECT_EQ(files.attributesOfItem("/to.mp4").value().size, 10);
    EXPECT_THAT(completions, ElementsAre(nullptr));
}

TEST_F(MovingAFile, LosesTheOldDestinationEvenWhenTheMoveFails)
{
    files.addFile("/from.mp4", 10);
    files.addFile("/to.mp4", 20);
    const base::ErrorRef scripted = files.fail(FileOperation::Move, "/from.mp4", EIO);
    move();
    machine.drain();
    EXPECT_FALSE(files.holds("/to.mp4"));
    EXPECT_TRUE(files.holds("/from.mp4"));
    EXPECT_THAT(completions, ElementsAre(scripted));
}

TEST_F(MovingAFile, LogsTheErrorsAddressAndNotItsCode)
{
    const base::ErrorRef scripted = files.fail(FileOperation::Move, "/from.mp4", EIO);
    move();
    machine.drain();
    EXPECT_EQ(machine.log.lines(),
              (std::vector<MemoryLog::Line>{{Kind::Error, "_vqMoveFileFromURL error: " + lowHalfOf(scripted)}}));
}

TEST_F(MovingAFile, SaysNothingOfADestinationThatCouldNotBeRemovedAndTriesAllTheSame)
{
    files.addFile("/from.mp4", 10);
    files.addFile("/to.mp4", 20);
    files.fail(FileOperation::Remove, "/to.mp4", EACCES);
    move();
    machine.drain();
    EXPECT_THAT(files.calls, ElementsAre("exists /to.mp4", "remove /to.mp4", "move /from.mp4 to /to.mp4"));
    ASSERT_EQ(completions.size(), 1u);
    EXPECT_EQ(completions[0]->code(), EEXIST);
    EXPECT_EQ(machine.log.lines().size(), 1u);
}

TEST_F(MovingAFile, NeedsNoCompletion)
{
    files.addFile("/from.mp4", 10);
    _srMoveFileFromURL_toURL_completion(files, base::Url::fromPath("/from.mp4"), base::Url::fromPath("/to.mp4"), {});
    machine.drain();
    EXPECT_TRUE(files.holds("/to.mp4"));
}

// Deleting by prefix

class DeletingByPrefix : public TemporaryFileStore {
protected:
    static std::string logged(const base::ErrorRef& error)
    {
        return "_vqDeleteFilesWithPrefix error: " + lowHalfOf(error);
    }
};

TEST_F(DeletingByPrefix, HappensLaterOnTheDefaultQueueAndIgnoresCase)
{
    addEntry("VKClipsa_Final1700000000.mp4", 10);
    addEntry("Chess_1700000000.mp4", 10);
    _srDeleteFilesWithPrefix(files, folding, "vkclipsa");
    EXPECT_THAT(files.calls, IsEmpty());
    EXPECT_EQ(machine.backgroundQueue.pending(), 0u);
    machine.defaultQueue.drain();
    EXPECT_THAT(files.calls, ElementsAre("list " + kStore, "remove " + entry("VKClipsa_Final1700000000.mp4")));
    EXPECT_TRUE(files.holds(entry("Chess_1700000000.mp4")));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

TEST_F(DeletingByPrefix, ListsWithTheSharedManagerAndRemovesWithTheReceiver)
{
    tests::FakeFileManager shared{machine.system};
    files.shared = &shared;
    shared.addFile(entry("a.mp4"), 1);
    addEntry("a.mp4", 1);
    _srDeleteFilesWithPrefix(files, folding, "a");
    machine.drain();
    EXPECT_TRUE(shared.holds(entry("a.mp4")));
    EXPECT_FALSE(files.holds(entry("a.mp4")));
}

TEST_F(DeletingByPrefix, LogsEachErrorByItsAddressWhenTheNextNameIsHandled)
{
    for (const char* name : {"a1", "other", "a2", "a3"})
        addEntry(name, 10);
    const base::ErrorRef first = files.fail(FileOperation::Remove, entry("a1"), EACCES);
    _srDeleteFilesWithPrefix(files, folding, "a");
    machine.drain();
    // A success leaves the error as it was: before a2, and again before a3.
    EXPECT_EQ(machine.log.lines(),
              (std::vector<MemoryLog::Line>{{Kind::Error, logged(first)}, {Kind::Error, logged(first)}}));
    EXPECT_FALSE(files.holds(entry("a2")));
    EXPECT_FALSE(files.holds(entry("a3")));
}

TEST_F(DeletingByPrefix, NeverLogsTheErrorOfTheLastRemoval)
{
    addEntry("a1", 10);
    addEntry("a2", 10);
    files.fail(FileOperation::Remove, entry("a2"), EACCES);
    _srDeleteFilesWithPrefix(files, folding, "a");
    machine.drain();
    EXPECT_TRUE(files.holds(entry("a2")));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

TEST_F(DeletingByPrefix, SaysNothingOfAFailedListingBecauseNoNameMatches)
{
    _srDeleteFilesWithPrefix(files, folding, "a");
    machine.drain();
    EXPECT_THAT(files.calls, ElementsAre("list " + kStore));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

// Creation date

TEST_F(TemporaryFileStore, TheCreationDateOfAFileComesFromTheSharedManager)
{
    tests::FakeFileManager shared{machine.system};
    files.shared = &shared;
    shared.addFile("/a.mp4", 1, base::Date{200}, base::Date{100});
    EXPECT_EQ(_srGetCreationDateForFile(files, base::Url::fromPath("/a.mp4")), base::Date{100});
    EXPECT_THAT(files.calls, IsEmpty());
}

TEST_F(TemporaryFileStore, AMissingOrUnreadableFileHasNoCreationDateAndNothingIsLogged)
{
    EXPECT_EQ(_srGetCreationDateForFile(files, base::Url::fromPath("/a.mp4")), std::nullopt);
    files.addFile("/a.mp4", 1);
    files.fail(FileOperation::Attributes, "/a.mp4", EACCES);
    EXPECT_EQ(_srGetCreationDateForFile(files, base::Url::fromPath("/a.mp4")), std::nullopt);
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

// Free space

TEST_F(TemporaryFileStore, FreeSpaceOfExactlyTheRequiredBytesIsNotSufficientAndOneMoreIs)
{
    files.addDirectory(kStore);
    files.freeSize = 100'000'000;
    EXPECT_EQ(_srDeviceFreeDiskSpace(files), VKScreenRecorderRequiredFreeSpace);
    EXPECT_FALSE(_srDeviceHasSufficientFreeSpaceForRecording(files));
    files.freeSize = 100'000'001;
    EXPECT_TRUE(_srDeviceHasSufficientFreeSpaceForRecording(files));
}

TEST_F(TemporaryFileStore, FreeSpaceBeyondTheSignedRangeIsSufficient)
{
    files.addDirectory(kStore);
    files.freeSize = std::numeric_limits<std::uint64_t>::max();
    EXPECT_TRUE(_srDeviceHasSufficientFreeSpaceForRecording(files));
}

TEST_F(TemporaryFileStore, FreeSpaceIsNothingWithoutTheDirectory)
{
    EXPECT_EQ(_srDeviceFreeDiskSpace(files), 0u);
    EXPECT_FALSE(_srDeviceHasSufficientFreeSpaceForRecording(files));
    EXPECT_THAT(machine.log.lines(), IsEmpty());
}

TEST_F(TemporaryFileStore, FreeSpaceIsAskedOfTheSharedManager)
{
    tests::FakeFileManager shared{machine.system};
    files.shared = &shared;
    shared.addDirectory(kStore);
    EXPECT_GT(_srDeviceFreeDiskSpace(files), 0u);
    EXPECT_THAT(shared.calls, ElementsAre("file system " + kStore));
}

} // namespace
