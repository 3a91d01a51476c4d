#include "StoreInMemory.h"

#include <cmath>
#include <limits>

namespace {

using namespace VKExtensions;
using testing::ElementsAre;
using tests::FileOperation;

class CleaningUp : public TemporaryFileStore {
protected:
    static std::string reported(int code)
    {
        return "error in _vqRemoveFile_srDeleteFilesOlderThanTimeToLiveInSeconds, error code: " + std::to_string(code);
    }
};

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
    EXPECT_EQ(machine.log.lines(), (std::vector<Line>{{Kind::Message, "_srDeleteFilesOlderThanTimeToLiveInSeconds: 0"},
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

} // namespace
