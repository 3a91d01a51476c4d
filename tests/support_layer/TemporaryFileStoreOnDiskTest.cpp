#include "support/VKFileManagerExtensions.h"

#include "linux/icu/StringFolding.h"
#include "linux/xdg/FileManager.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <cmath>
#include <fcntl.h>
#include <future>
#include <limits>
#include <sys/stat.h>

namespace {

using namespace VKExtensions;
using Kind = base::MemoryLog::Line::Kind;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

namespace fs = std::filesystem;

constexpr double kNow = 1'700'000'000;

/// The store on a real file system, the device's library mounted on a directory of the test's own.
class TheStoreOnDisk : public testing::Test {
protected:
    tests::TestSystem machine{base::Date{kNow}};
    tests::PrivateDirectory library;
    const intl::StringFolding folding{};
    xdg::FileManager files{machine.system, mounts()};

    void SetUp() override { _srSetupTempDirectory(files); }

    xdg::MountTable mounts() const
    {
        xdg::MountTable table;
        table.mount(xdg::kPrivateLibraryPrefix, library.path());
        return table;
    }
    static base::Url url(const std::string& name)
    {
        return base::Url::fromPath(VKScreenRecorderTempDirectory + ("/" + name));
    }
    void addEntry(const std::string& name, std::size_t size, double age = 0)
    {
        const fs::path file = library.write("Velkor/" + name, std::string(size, 'x'));
        const double modified = kNow - age;
        struct timespec times[2] = {};
        for (struct timespec& time : times) {
            time.tv_sec = static_cast<std::time_t>(std::floor(modified));
            time.tv_nsec = static_cast<long>((modified - std::floor(modified)) * 1e9);
        }
        ASSERT_EQ(::utimensat(AT_FDCWD, file.c_str(), times, AT_SYMLINK_NOFOLLOW), 0);
    }
    std::vector<std::string> names() const
    {
        std::vector<std::string> result;
        for (const auto& entry : fs::directory_iterator(library.path() / "Velkor"))
            result.push_back(entry.path().filename());
        return result;
    }
};

TEST_F(TheStoreOnDisk, IsSetUpOnceAndNotAgain)
{
    EXPECT_TRUE(fs::is_directory(library.path() / "Velkor"));
    _srSetupTempDirectory(files);
    EXPECT_THAT(machine.log.texts(Kind::Error), IsEmpty());
}

TEST_F(TheStoreOnDisk, CannotBeSetUpWithoutItsParent)
{
    fs::remove_all(library.path());
    _srSetupTempDirectory(files);
    EXPECT_THAT(machine.log.texts(Kind::Error), testing::ElementsAre("error creating temp directory"));
}

TEST_F(TheStoreOnDisk, KnowsItsOwnSizeAndNotThatOfItsFiles)
{
    addEntry("a.mp4", 300'000);
    base::ErrorRef error;
    EXPECT_EQ(_srSizeOfTempDir(files, &error),
              files.attributesOfItem("/private/var/mobile/Library/Velkor").value().size);
    EXPECT_LT(_srSizeOfTempDir(files, &error), 300'000);
    EXPECT_FALSE(error);
}

TEST_F(TheStoreOnDisk, KeepsWhatIsAsOldAsTheTimeToLiveAndDeletesWhatIsAFractionOlder)
{
    addEntry("as old.mp4", 10, 60);
    addEntry("older.mp4", 20, 60.25);
    addEntry("new.mp4", 40);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, 60), 20);
    EXPECT_THAT(names(), UnorderedElementsAre("as old.mp4", "new.mp4"));
}

TEST_F(TheStoreOnDisk, IsEmptiedOfFilesDirectoriesAndLinksButNotOfWhatLinksPointTo)
{
    const fs::path kept = library.write("kept.mp4", "kept");
    addEntry("a.mp4", 10);
    addEntry("directory/b.mp4", 10);
    fs::create_symlink(kept, library.path() / "Velkor/link");
    fs::create_symlink("/nowhere", library.path() / "Velkor/dangling");
    EXPECT_GT(_srDeleteAllTempFiles(files), 0);
    EXPECT_THAT(names(), IsEmpty());
    EXPECT_EQ(tests::PrivateDirectory::read(kept), "kept");
    EXPECT_THAT(machine.log.texts(Kind::Error), IsEmpty());
}

TEST_F(TheStoreOnDisk, CountsTheBytesThatItDeletes)
{
    addEntry("a.mp4", 123);
    addEntry("b.mp4", 1000);
    EXPECT_EQ(_srDeleteAllTempFiles(files), 1123);
}

TEST_F(TheStoreOnDisk, WithANegativeTimeToLiveLosesAllOrdinaryFiles)
{
    addEntry("a.mp4", 10, 0);
    addEntry("b.mp4", 20, 100);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, -1), 30);
}

TEST_F(TheStoreOnDisk, WithATimeToLiveThatIsNoNumberLosesNothing)
{
    addEntry("a.mp4", 10, 1e8);
    EXPECT_EQ(_srDeleteFilesOlderThanTimeToLiveInSeconds(files, std::numeric_limits<double>::quiet_NaN()), 0);
    EXPECT_THAT(names(), UnorderedElementsAre("a.mp4"));
}

TEST_F(TheStoreOnDisk, WhenItIsMissingIsCleanedUpWithNothingButAReport)
{
    fs::remove_all(library.path() / "Velkor");
    EXPECT_EQ(_srDeleteAllTempFiles(files), 0);
    EXPECT_EQ(machine.log.texts(Kind::Error).size(), 1u);
}

TEST_F(TheStoreOnDisk, LosesOneFileAndSaysNothingOfOneThatIsNotThere)
{
    addEntry("a.mp4", 10);
    std::vector<base::ErrorRef> completions;
    for (int times = 0; times < 2; ++times)
        _srRemoveFile_completion(files, url("a.mp4"),
                                 [&](const base::ErrorRef& error) { completions.push_back(error); });
    machine.drain();
    EXPECT_THAT(names(), IsEmpty());
    EXPECT_THAT(completions, testing::ElementsAre(nullptr, nullptr));
    EXPECT_THAT(machine.log.texts(Kind::Message), testing::ElementsAre("_srSetupTempDirectory"));
}

TEST_F(TheStoreOnDisk, TakesAMovedFileInPlaceOfAnother)
{
    addEntry("from.mp4", 10);
    addEntry("to.mp4", 20);
    std::vector<base::ErrorRef> completions;
    _srMoveFileFromURL_toURL_completion(files, url("from.mp4"), url("to.mp4"),
                                        [&](const base::ErrorRef& error) { completions.push_back(error); });
    machine.drain();
    EXPECT_THAT(names(), UnorderedElementsAre("to.mp4"));
    EXPECT_EQ(fs::file_size(library.path() / "Velkor/to.mp4"), 10u);
    EXPECT_THAT(completions, testing::ElementsAre(nullptr));
}

TEST_F(TheStoreOnDisk, LosesTheOldDestinationOfAMoveThatFails)
{
    addEntry("to.mp4", 20);
    base::ErrorRef failure;
    _srMoveFileFromURL_toURL_completion(files, url("missing.mp4"), url("to.mp4"),
                                        [&](const base::ErrorRef& error) { failure = error; });
    machine.drain();
    EXPECT_THAT(names(), IsEmpty());
    ASSERT_TRUE(failure);
    EXPECT_EQ(failure->code(), ENOENT);
}

TEST_F(TheStoreOnDisk, LosesTheFilesOfAPrefixInAnyCaseAndWithAnyMarks)
{
    addEntry("VKClipsa_Final1700000000.mp4", 10);
    addEntry("Chess_1700000000.mp4", 10);
    addEntry("Šach_1700000000.mp4", 10);
    _srDeleteFilesWithPrefix(files, folding, "vkclipsa");
    _srDeleteFilesWithPrefix(files, folding, "SACH");
    machine.drain();
    EXPECT_THAT(names(), UnorderedElementsAre("Chess_1700000000.mp4"));
    EXPECT_THAT(machine.log.texts(Kind::Error), IsEmpty());
}

TEST_F(TheStoreOnDisk, DatesAFileByItsRecordingAndAMissingOneNotAtAll)
{
    addEntry("a.mp4", 10, 1000);
    EXPECT_EQ(_srGetCreationDateForFile(files, url("a.mp4")), base::Date{kNow - 1000});
    EXPECT_EQ(_srGetCreationDateForFile(files, url("b.mp4")), std::nullopt);
}

TEST_F(TheStoreOnDisk, HasFreeSpaceOnlyWhileItIsThere)
{
    EXPECT_GT(_srDeviceFreeDiskSpace(files), 0u);
    fs::remove_all(library.path() / "Velkor");
    EXPECT_EQ(_srDeviceFreeDiskSpace(files), 0u);
    EXPECT_FALSE(_srDeviceHasSufficientFreeSpaceForRecording(files));
}

TEST_F(TheStoreOnDisk, IsUsedByRealWorkersAtOnce)
{
    base::WorkerQueue background;
    base::WorkerQueue standard;
    const base::System system{machine.log, machine.clock, machine.mainQueue, background, standard};
    xdg::FileManager shared{system, mounts()};
    for (int i = 0; i < 20; ++i)
        addEntry("a" + std::to_string(i), 10);

    std::promise<std::thread::id> done;
    _srDeleteFilesWithPrefix(shared, folding, "a");
    _srRemoveFile_completion(shared, url("a19"), [&](const base::ErrorRef&) {
        EXPECT_TRUE(background.isCurrent());
        done.set_value(std::this_thread::get_id());
    });
    _srDeleteAllTempFiles(shared);
    EXPECT_NE(done.get_future().get(), std::this_thread::get_id());
    standard.finish();
    EXPECT_THAT(names(), IsEmpty());
}

} // namespace
