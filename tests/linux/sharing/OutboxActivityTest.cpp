// Activities that give files from the outbox: what they give, how far they say they are, and how they are given up.
#include "linux/sharing/OutboxActivity.h"

#include "support/EnglishWords.h"
#include "support/FakeFileManager.h"
#include "support/PrivateDirectory.h"
#include "support/RefusedSystemCalls.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <filesystem>

namespace tests {

namespace {

namespace fs = std::filesystem;
using platform::ShareItems;
using sharing::Outbox;
using sharing::OutboxActivity;
using testing::ElementsAre;
using testing::IsEmpty;

/// Ends when a test says so.
class Giving final : public OutboxActivity {
public:
    using OutboxActivity::complete;
    using OutboxActivity::fail;
    using OutboxActivity::files;
    using OutboxActivity::isUnderWay;
    using OutboxActivity::OutboxActivity;
    using OutboxActivity::setProgress;
    using OutboxActivity::text;
    using OutboxActivity::title;
    using OutboxActivity::workInBackground;

    std::string activityType() const override { return "Giving"; }
    std::string activityTitle() const override { return "Give"; }

    bool onlyTheMovie = false;
    bool usesOutbox = true;
    bool tells = true;
    int given = 0;
    int stopped = 0;

protected:
    bool takesOnlyTheMovie() const override { return onlyTheMovie; }
    bool needsOutbox() const override { return usesOutbox; }
    bool tellsPutting() const override { return tells; }
    void give() override { ++given; }
    void stop() override { ++stopped; }
};

struct AnOutboxActivity : testing::Test {
    static constexpr std::uintmax_t kStep = 16 << 20; ///< of a copy

    TestSystem machine;
    EnglishWords words;
    FakeFileManager files{machine.system};
    PrivateDirectory directory;
    base::WorkList works;
    Outbox outbox{directory.path() / "outbox"};
    sharing::Environment environment{
        machine.system, words,  files,
        works,          outbox, [](const base::Url& file) {
                                         return "seen " + file.lastPathComponent(); }};
    fs::path movie = directory.write("race.mp4", "the movie");
    fs::path notes = directory.write("notes.txt", "the notes");
    ShareItems items{"A race", base::Url::fromPath(movie), "and more", base::Url::fromPath(notes)};
    std::shared_ptr<Giving> activity = make(Outbox::Use::Read);
    std::vector<platform::Activity::End> ends;
    std::vector<double> told; ///< -1 for what is not known

    std::shared_ptr<Giving> make(Outbox::Use use) { return std::make_shared<Giving>(environment, use); }
    void begin()
    {
        activity->setEndHandler([this](const platform::Activity::End& end) { ends.push_back(end); });
        activity->setProgressHandler([this](std::optional<double> progress) { told.push_back(progress.value_or(-1)); });
        activity->prepareWithActivityItems(items);
        activity->performActivity();
    }
    /// Runs the worker where files are copied byte by byte.
    void copy()
    {
        whileRefusing({noReflinks(), {SYS_copy_file_range, EXDEV}}, [this] { machine.defaultQueue.drain(); });
        machine.drain();
    }
    void beginToCopy(bool tells = true)
    {
        fs::resize_file(movie, 2 * kStep);
        fs::resize_file(notes, 2 * kStep);
        activity = make(Outbox::Use::Change);
        activity->tells = tells;
        begin();
    }
    std::vector<std::string> names() const
    {
        std::vector<std::string> all;
        for (const auto& file : activity->files())
            all.push_back(fs::path(file->path()).filename());
        return all;
    }
    /// The bytes that lie in the outbox.
    std::uintmax_t bytesThere() const
    {
        std::uintmax_t sum = 0;
        std::error_code error;
        for (const auto& entry : fs::recursive_directory_iterator(directory.path() / "outbox", error))
            sum += entry.is_regular_file() ? entry.file_size() : 0;
        return sum;
    }
};

TEST_F(AnOutboxActivity, GivesAllFilesUnderTheNamesThatTheirReceiverSees)
{
    begin();
    EXPECT_EQ(activity->given, 0) << "not before they are there";
    machine.defaultQueue.drain();
    EXPECT_EQ(activity->given, 0) << "not on the worker";
    machine.drain();
    EXPECT_EQ(activity->given, 1);
    EXPECT_THAT(names(), ElementsAre("seen race.mp4", "seen notes.txt"));
    EXPECT_EQ(PrivateDirectory::read(activity->files()[1]->path()), "the notes");
    EXPECT_EQ(activity->text(), "A race\nand more");
    activity->complete();
    ASSERT_EQ(ends.size(), 1U);
    EXPECT_TRUE(ends[0].completed);
    EXPECT_EQ(activity->stopped, 1);
}

TEST_F(AnOutboxActivity, MayGiveOnlyTheMovie)
{
    activity->onlyTheMovie = true;
    begin();
    machine.drain();
    EXPECT_THAT(names(), ElementsAre("seen race.mp4"));
}

TEST_F(AnOutboxActivity, MayDoWithoutTheOutbox)
{
    activity->usesOutbox = false;
    begin();
    machine.drain();
    EXPECT_EQ(activity->given, 1);
    EXPECT_THAT(names(), IsEmpty());
    EXPECT_FALSE(fs::exists(directory.path() / "outbox"));
}

TEST_F(AnOutboxActivity, CallsWhatItGivesByTheMoviesNameWithoutItsKind)
{
    EXPECT_EQ(activity->title(), "");
    activity->prepareWithActivityItems(items);
    EXPECT_EQ(activity->title(), "seen race");
    environment.nameOf = [](const base::Url&) { return std::string("a.b.mp4"); };
    activity->prepareWithActivityItems(items);
    EXPECT_EQ(activity->title(), "a.b");
    environment.nameOf = [](const base::Url&) { return std::string(".hidden"); };
    activity->prepareWithActivityItems(items);
    EXPECT_EQ(activity->title(), ".hidden");
}

TEST_F(AnOutboxActivity, TellsHowFarAllFilesTogetherAreCopied)
{
    beginToCopy();
    copy();
    EXPECT_THAT(told, ElementsAre(-1, 0.25, 0.5, 0.75, 1));
    EXPECT_EQ(bytesThere(), 4 * kStep);
}

TEST_F(AnOutboxActivity, TellsOnlyWhatAnybodyCouldSee)
{
    activity->usesOutbox = false;
    begin();
    machine.drain();
    told.clear();
    activity->workInBackground(
        [](const std::function<bool(double)>& goOn) -> base::Result<void> {
            for (const double progress : {0.0, 0.009, 0.01, 0.0199, 0.5, 0.5, 1.0})
                EXPECT_TRUE(goOn(progress));
            return {};
        },
        [] {});
    machine.drain();
    EXPECT_THAT(told, ElementsAre(0.01, 0.5, 1));
}

TEST_F(AnOutboxActivity, SaysNothingOfACopyThatIsNotWorthIt)
{
    beginToCopy(false);
    copy();
    EXPECT_THAT(told, ElementsAre(-1));
    EXPECT_EQ(activity->given, 1);
}

TEST_F(AnOutboxActivity, KeepsTheProcessAliveUntilThoseWhoWaitHaveBeenTold)
{
    EXPECT_TRUE(works.isEmpty());
    bool wasAlive = false;
    begin();
    activity->setEndHandler([&](const platform::Activity::End&) { wasAlive = !works.isEmpty(); });
    EXPECT_FALSE(works.isEmpty());
    machine.drain();
    activity->setProgress(0.5);
    EXPECT_EQ(works.progress(), 0.5);
    activity->complete();
    EXPECT_TRUE(wasAlive);
    EXPECT_TRUE(works.isEmpty());
}

TEST_F(AnOutboxActivity, CancellingItStopsTheCopyAndIsNoError)
{
    beginToCopy();
    activity->cancel();
    ASSERT_EQ(ends.size(), 1U);
    EXPECT_FALSE(ends[0].completed);
    EXPECT_FALSE(ends[0].error);
    EXPECT_EQ(activity->stopped, 1);
    copy();
    EXPECT_EQ(bytesThere(), 0U);
    EXPECT_EQ(activity->given, 0);
    activity->cancel();
    activity->complete();
    activity->setProgress(0.5);
    EXPECT_EQ(ends.size(), 1U) << "it has ended";
    EXPECT_EQ(activity->stopped, 1);
    EXPECT_THAT(told, ElementsAre(-1));
}

TEST_F(AnOutboxActivity, WhoeverLetsGoOfItStopsTheCopy)
{
    beginToCopy();
    const std::weak_ptr<Giving> weak = activity;
    activity.reset();
    EXPECT_TRUE(weak.expired()) << "the worker would end it";
    copy();
    EXPECT_EQ(bytesThere(), 0U);
    EXPECT_THAT(ends, IsEmpty());
    EXPECT_TRUE(works.isEmpty());
}

TEST_F(AnOutboxActivity, SaysWhyAFileCannotBeGivenAndBeginsAnewWhenAsked)
{
    fs::remove(notes);
    begin();
    machine.drain();
    ASSERT_EQ(ends.size(), 1U);
    ASSERT_TRUE(ends[0].error);
    EXPECT_EQ(ends[0].error->userInfo().at(base::Error::kMessageKey), "SHARE_FILE_GONE");
    EXPECT_EQ(activity->given, 0);
    EXPECT_TRUE(machine.log.contains(base::MemoryLog::Line::Kind::Error,
                                     "cannot share by Giving: " + ends[0].error->description()));

    directory.write("notes.txt", "again");
    begin();
    machine.drain();
    EXPECT_EQ(activity->given, 1);
    EXPECT_THAT(names(), ElementsAre("seen race.mp4", "seen notes.txt"));
}

TEST_F(AnOutboxActivity, WhatAnEarlierTurnCopiedIsNotGivenInALaterOne)
{
    beginToCopy();
    activity->cancel();
    begin();
    copy();
    EXPECT_EQ(activity->given, 1);
    EXPECT_EQ(ends.size(), 1U);
    EXPECT_THAT(told, ElementsAre(-1, -1, 0.25, 0.5, 0.75, 1));
}

TEST_F(AnOutboxActivity, NeedsAFile)
{
    EXPECT_FALSE(activity->canPerformWithActivityItems({"A race"}));
    EXPECT_TRUE(activity->canPerformWithActivityItems(items));
}

} // namespace

} // namespace tests
