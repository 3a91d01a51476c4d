#include "StoreInMemory.h"

#include <limits>

namespace {

using namespace VKExtensions;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::FileOperation;

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
    EXPECT_EQ(machine.log.lines(), (std::vector<Line>{{Kind::Message, "_srSetupTempDirectory"}}));
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
    EXPECT_EQ(machine.log.lines()[0], (Line{Kind::Message, "_srSetupTempDirectory"}));
    EXPECT_EQ(machine.log.lines()[1].kind, Kind::Console);
    EXPECT_TRUE(machine.log.lines()[1].text.starts_with("error: create directory " + kStore));
    EXPECT_EQ(machine.log.lines()[2], (Line{Kind::Error, "error creating temp directory"}));
}

// Size

TEST_F(TemporaryFileStore, ItsSizeIsThatOfTheDirectoryEntryAndNotOfWhatItHolds)
{
    addEntry("a.mp4", 1'000'000);
    base::ErrorRef error;
    EXPECT_EQ(_srSizeOfTempDir(files, &error), 4096);
    EXPECT_FALSE(error);
}

TEST_F(TemporaryFileStore, ItsSizeIsAskedOfTheSharedManager)
{
    tests::FakeFileManager shared{machine.system};
    files.shared = &shared;
    shared.addFile(kStore, 7);
    files.addFile(kStore, 8);
    EXPECT_EQ(_srSizeOfTempDir(files, nullptr), 7);
    EXPECT_THAT(shared.calls, ElementsAre("attributes " + kStore));
    EXPECT_THAT(files.calls, IsEmpty());

    const base::ErrorRef scripted = shared.fail(FileOperation::Attributes, kStore, EACCES);
    base::ErrorRef error;
    EXPECT_EQ(_srSizeOfTempDir(files, &error), 0);
    EXPECT_EQ(error, scripted);
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
