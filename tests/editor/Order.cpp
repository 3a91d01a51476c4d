// In what order things are done, as far as the player, the disk, the presenter or a worker can tell.
#include "Story.h"
#include "TrimmingFixture.h"

#include <gmock/gmock.h>

#include <functional>

using platform::ExportSession;
using testing::ElementsAre;

namespace {

constexpr const char* kTrimmed = "/private/var/mobile/Library/Velkor//Game_1700000000.mp4";

class Order : public TrimmingTest {
protected:
    std::vector<std::string> during(const std::function<void()>& act)
    {
        Story story(*fake, editor);
        act();
        return story.end();
    }
    /// The same without tasks that were posted: those of what is not the editor's.
    std::vector<std::string> withoutTasksDuring(const std::function<void()>& act)
    {
        auto story = during(act);
        std::erase(story, "queued");
        return story;
    }
    /// What happens once the view has its new size.
    std::vector<std::string> turningTo(base::Size size)
    {
        platform::TransitionCoordinator turn(platform::Window::kTransitionDuration);
        editor->viewWillTransitionToSize_withTransitionCoordinator(size, turn);
        fake->window->setFrame({{0, 0}, size});
        settle();
        return during([&] { turn.runAlongside(); });
    }
};

} // namespace

TEST_F(Order, PlayingGoesFromTheMovieOverTheChromeToTheBars)
{
    open();
    EXPECT_THAT(during([&] { editor->playAction(); }),
                ElementsAre("play", "bars: faded", "hidden: yes", "large button: away", "bottom: share _ pause _",
                            "intro: no"));
    EXPECT_THAT(during([&] { editor->pauseAction(); }), ElementsAre("pause", "bottom: share _ play _"));
    EXPECT_THAT(during([&] { editor->playAction(); }), ElementsAre("play", "bottom: share _ pause _"));
}

TEST_F(Order, TheLargeButtonGoesBeforeItsTimeIsSaidToBeOver)
{
    open();
    editor->hideUI();
    EXPECT_THAT(during([&] { editor->playAction(); }),
                ElementsAre("play", "large button: away", "bottom: share _ pause _", "intro: no"));
}

TEST_F(Order, PlayingATrimGoesToItsStartAndKnowsItsEndBeforeItPlays)
{
    open();
    trimFrom(2, 5);
    editor->hideUI();
    editor->setIntroMode(false);
    EXPECT_THAT(during([&] { editor->playAction(); }),
                ElementsAre("seek 2", "observe 5", "play", "bottom: share _ pause _"));
}

TEST_F(Order, TheEndOfTheMoviePausesShowsTheChromeAndGoesToTheStart)
{
    open();
    editor->playAction();
    EXPECT_THAT(during([&] { editor->itemDidFinishPlaying(nullptr); }),
                ElementsAre("pause", "bottom: share _ play _", "bars: seen", "hidden: no", "seek 0"));
    trimFrom(5, 8);
    EXPECT_THAT(during([&] { editor->itemDidFinishPlaying(nullptr); }),
                ElementsAre("pause", "bottom: share _ play _", "seek 0"))
        << "also of a trim, not to where it starts";
}

TEST_F(Order, EnteringTrimModeFillsTheBarsFirst)
{
    open();
    EXPECT_THAT(during([&] { editor->movieScrubberDidBeginEditing(*editor->avTrimmer()); }),
                ElementsAre("bottom: _ play _", "top: no _ title _ trim", "edited: yes", "trimming: yes"));
    EXPECT_THAT(during([&] { editor->undoAction(); }),
                ElementsAre("bottom: share _ play _", "top: done _ title _ save", "trimming: no"));
}

TEST_F(Order, LeavingTrimModeBeginsWithTheHandles)
{
    open();
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::Start, 4);
    settle();
    EXPECT_THAT(during([&] { editor->undoAction(); }),
                ElementsAre("handles: no", "bottom: share _ play _", "top: done _ title _ save", "trimming: no"));
}

TEST_F(Order, AHandlePausesIsNotedAndHasThePictureUnderItShownLater)
{
    open();
    const auto moveStart = [this] { editor->movieScrubber_editingStartValueDidChange(*editor->avTrimmer(), 2); };
    const auto moveEnd = [this] { editor->movieScrubber_editingEndValueDidChange(*editor->avTrimmer(), 5); };
    EXPECT_THAT(during(moveStart), ElementsAre("pause", "start: 2", "queued", "trimming: yes"));
    EXPECT_THAT(during([&] { settle(); }), ElementsAre("seek 2"));
    editor->setTrimming(false);
    EXPECT_THAT(during(moveEnd), ElementsAre("pause", "end: 5", "queued", "trimming: yes"));
    EXPECT_THAT(during([&] { settle(); }), ElementsAre("seek 5"));
}

TEST_F(Order, AFingerOnTheStripCountsAsThereFromBeforeThePauseUntilAfterTheLastSeek)
{
    open();
    editor->playAction();
    editor->avTrimmer()->setValue(4);
    EXPECT_THAT(during([&] { editor->movieScrubberDidBeginScrubbing_withHandle(*editor->avTrimmer(), 0); }),
                ElementsAre("scrubbing: yes", "pause", "bottom: share _ play _"));
    EXPECT_THAT(during([&] { editor->movieScrubber_valueDidChange(*editor->avTrimmer(), 3); }), ElementsAre("seek 3"));
    EXPECT_THAT(during([&] { editor->movieScrubberDidEndScrubbing_withHandle(*editor->avTrimmer(), 0); }),
                ElementsAre("seek 4", "scrubbing: no"));
}

TEST_F(Order, AStepPausesFirst)
{
    open();
    editor->playAction();
    EXPECT_THAT(during([&] { editor->stepForward(); }), ElementsAre("pause", "bottom: share _ play _", "step 1"));
    editor->playAction();
    EXPECT_THAT(during([&] { editor->stepBackward(); }), ElementsAre("pause", "bottom: share _ play _", "step -1"));
}

TEST_F(Order, TheChromeCountsAsHiddenOrSeenBeforeItFades)
{
    open();
    std::vector<bool> hidden;
    fake->window->setNeedsCommitHandler([&] { hidden.push_back(editor->isUIHidden()); });
    fake->window->commit();
    editor->hideUI();
    fake->window->commit();
    editor->showUI();
    EXPECT_EQ(hidden, (std::vector{true, false}));
    fake->window->setNeedsCommitHandler({});
}

TEST_F(Order, ConfirmingATrimTellsThenListsThenRemovesTheFormerOne)
{
    open();
    trimFrom(2, 5);
    fake->machine.clock.advance(std::chrono::seconds(1));
    EXPECT_THAT(during([&] {
                    editor->saveAction();
                    settle();
                }),
                ElementsAre("log: saveAction", "done: 1", "exporting: yes", "files' work: 1", "asset /movie.mp4",
                            "session", "trim to: /private/var/mobile/Library/Velkor//Game_1700000001.mp4", "export",
                            "files' work: 0", std::string("exists ") + kTrimmed));
}

TEST_F(Order, ATrimThatEndsFreesTheEditorLeavesTheModeAndBuildsTheChainAnew)
{
    open();
    editor->avTrimmer()->moveHandle(platform::ScrubberHandle::End, 5);
    editor->setScrubbing(true);
    settle();
    editor->saveAction();
    settle();
    fake->media.movies[kTrimmed] = tests::FakeMovie::lasting(5);
    const std::string trimmed = kTrimmed;
    EXPECT_THAT(withoutTasksDuring([&] { session()->finish(ExportSession::Status::Completed); }),
                ElementsAre("exporting: no", "handles: no", "registered: 0", //
                            "bottom: share _ play _", "top: done _ title _ save", "movie: " + trimmed, "observers: 1",
                            "trimming: no", "asset " + trimmed, "item", "observers: 0", "player", "action at end",
                            "seek 0", "show no longer", "observers: 1", "show", "loaded: no", "observers: 3",
                            "scrubbing: no", "observe every 33333333/1000000000", "registered: 1"));
    editor->setEditStartTime(2);
    EXPECT_THAT(withoutTasksDuring([&] { settle(); }),
                ElementsAre("loaded: yes", "pictures: no yes", "generator dropped", "pictures: no no", "start: 0",
                            "generator", "pictures: yes yes"));
}

TEST_F(Order, AMovieCountsAsLoadedBeforeTheStripIsWiredAndTheRangeIsSetBeforeItAsks)
{
    fake->media.movies.clear();
    open();
    editor->movieScrubber_requestThumbnailImageForTimestamp(*editor->avTrimmer(), 0);
    EXPECT_THAT(during([&] { fake->media.item()->becomeReady(10); }),
                ElementsAre("loaded: yes", "pictures: no yes", "generator dropped", "asked: yes yes", "end: 10",
                            "pictures: no no", "generator", "pictures: yes yes"));
}

TEST_F(Order, TurningEmptiesTheBarsRefitsThemDropsThePicturesAndThenArranges)
{
    open();
    editor->playAction();
    EXPECT_THAT(turningTo({720, 360}),
                ElementsAre("top: empty", "bottom: empty", "bottom frame: 0,316 720x44", "pictures: no yes",
                            "generator dropped", "pictures: no no", "generator", "pictures: yes yes", "insets: 8 8 5",
                            "top: cancel _ title _ play . share . save", "strip: on nothing", "bottom bar: away",
                            "strip: on the edge", "one bar: yes"));
    EXPECT_EQ(bottom(), Items{}) << "it is left as it was, which was empty";
    EXPECT_THAT(turningTo({360, 720}),
                ElementsAre("top: empty", "bottom frame: 0,676 360x44", "pictures: no yes", "generator dropped",
                            "pictures: no no", "generator", "pictures: yes yes", "bottom: share _ play _",
                            "insets: 0 0 0", "top: cancel _ title _ save", "bottom bar: shown", "strip: on the bar",
                            "one bar: no"));
}

TEST_F(Order, SavingGoesFromTheMixOverTheLibraryToTheHost)
{
    open();
    fake->files.addFile(kMovie, 100);
    EXPECT_THAT(withoutTasksDuring([&] {
                    editor->saveAction();
                    settle();
                }),
                ElementsAre("log: saveAction", "done: 1", "asset /movie.mp4", "session", "export"));
    EXPECT_THAT(withoutTasksDuring([&] {
                    session()->finish(ExportSession::Status::Completed);
                    settle();
                }),
                ElementsAre("files' work: 1", "movie: /private/var/mobile/Library/Velkor//VKClipsa_Final1700000000.mp4",
                            "library", "files' work: 0", "exists /movie.mp4", "remove /movie.mp4"));
    EXPECT_THAT(withoutTasksDuring([&] {
                    fake->photos.fail(base::Error::make("posix", 28, "full"));
                    settle();
                }),
                ElementsAre("log: Error writing video to camera roll: 28", "pause"))
        << "the player rests as the host is told";
}

TEST_F(Order, OpeningReadsTheDateBuildsTheChainAndSetsThePlayHeadGoingLast)
{
    fake->files.addFile(kMovie, 5, base::Date{1'234.0});
    auto story = during([&] { open(); });
    story.resize(10);
    EXPECT_THAT(story,
                ElementsAre("attributes /movie.mp4", "asset /movie.mp4", "item", "player", "seek 0", "observers: 1",
                            "registered: 1", "show", "observers: 3", "observe every 33333333/1000000000"));
}

TEST_F(Order, AnEditorThatGoesLetsGoOfThePlayerThenOfItsItemAndRemovesTheFilesLast)
{
    fake->files.addFile("/private/var/mobile/Library/Velkor/movie.mp4", 5);
    open();
    trimFrom(5, 8);
    editor->playAction();
    const auto keptItem = fake->media.item();
    const auto keptPlayer = fake->media.player();
    EXPECT_THAT(during([&] { close(); }),
                ElementsAre("observe no longer", "log: _srDeleteFilesOlderThanTimeToLiveInSeconds: 0", "observers: 1",
                            "registered: 0", "list /private/var/mobile/Library/Velkor/",
                            "attributes /private/var/mobile/Library/Velkor//movie.mp4", "log: deleting old file",
                            "remove /private/var/mobile/Library/Velkor//movie.mp4", "generator dropped", "observers: 0",
                            "show no longer"))
        << "the picture's layer, which observes the item too, is the last to let go";
    EXPECT_TRUE(keptPlayer->hasObservers()) << "the end of the trim's range goes with its player";
}
