#include "StoreInMemory.h"

#include <cctype>
#include <cstdint>

namespace {

using namespace VKExtensions;
using testing::ElementsAre;
using testing::IsEmpty;
using tests::FileOperation;

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
              (std::vector<Line>{{Kind::Message, "_vqRemoveFile error: " + std::to_string(EACCES)}}));
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
              (std::vector<Line>{{Kind::Error, "_vqMoveFileFromURL error: " + lowHalfOf(scripted)}}));
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
    AsciiFolding folding;

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
    EXPECT_EQ(machine.log.lines(), (std::vector<Line>{{Kind::Error, logged(first)}, {Kind::Error, logged(first)}}));
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

} // namespace
