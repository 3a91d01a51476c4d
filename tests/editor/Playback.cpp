#include "EditorFixture.h"

using base::MediaTime;
using platform::PlayerItem;

namespace {

class Playback : public EditorTest {
protected:
    /// Playing from here goes on to the end of the movie, which shows bars and start again.
    void expectTheEndShowsTheBarsAndTheStart()
    {
        editor->playAction();
        EXPECT_TRUE(editor->isUIHidden());
        player().advance(20);
        settle();
        EXPECT_FALSE(player().isPlaying());
        EXPECT_FALSE(editor->isUIHidden());
        EXPECT_EQ(player().currentTime(), MediaTime::zero());
    }
};

} // namespace

TEST_F(Playback, AReadyItemWiresTheScrubberOnce)
{
    fake->media.movies.clear();
    open();
    EXPECT_EQ(editor->avTrimmer()->delegate(), nullptr);
    EXPECT_EQ(editor->editStartTime(), 0.0);
    EXPECT_EQ(editor->editEndTime(), 0.0);
    fake->media.item()->becomeReady(10);
    EXPECT_TRUE(editor->currentItemLoaded());
    EXPECT_EQ(editor->avTrimmer()->delegate(), editor);
    EXPECT_EQ(editor->avTrimmer()->dataSource(), editor);
    EXPECT_EQ(editor->avTrimmer()->duration(), 10);
    EXPECT_EQ(editor->editStartTime(), 0.0);
    EXPECT_EQ(editor->editEndTime(), 10.0);

    editor->setEditEndTime(7);
    fake->media.item()->becomeReady(12);
    EXPECT_EQ(editor->editEndTime(), 7);
}

TEST_F(Playback, ADurationThatIsNotNumericYetWaitsForOneThatIs)
{
    fake->media.movies.clear();
    open();
    tests::FakeMovie endless;
    fake->media.item()->becomeReady(endless);
    EXPECT_FALSE(editor->currentItemLoaded());
    fake->media.item()->becomeReady(10);
    EXPECT_TRUE(editor->currentItemLoaded());
}

TEST_F(Playback, ADurationThatComesBeforeTheStatusWaitsForItAndIsTakenOnce)
{
    fake->media.movies.clear();
    open();
    fake->media.item()->learnDuration(10);
    EXPECT_FALSE(editor->currentItemLoaded());
    EXPECT_EQ(editor->avTrimmer()->delegate(), nullptr);
    EXPECT_TRUE(std::isnan(editor->getPlayerDuration()));
    fake->media.item()->becomeReady(10);
    EXPECT_TRUE(editor->currentItemLoaded());
    EXPECT_EQ(editor->editEndTime(), 10);
    editor->setEditEndTime(7);
    fake->media.item()->learnDuration(12);
    EXPECT_EQ(editor->editEndTime(), 7);
}

TEST_F(Playback, AStatusThatIsToldAloneOrADurationThatIsMakesTheItemReady)
{
    fake->media.movies.clear();
    open();
    fake->media.item()->learnDuration(10);
    fake->media.item()->learnThatItIsReady();
    EXPECT_TRUE(editor->currentItemLoaded()) << "of the status";

    editor->reloadAVLayerWithURL(base::Url::fromPath(kMovie));
    fake->media.item()->learnThatItIsReady();
    EXPECT_FALSE(editor->currentItemLoaded());
    fake->media.item()->learnDuration(4);
    EXPECT_TRUE(editor->currentItemLoaded()) << "of the duration";
    EXPECT_EQ(editor->editEndTime(), 4);
}

TEST_F(Playback, ChangesOfOtherObjectsAndKeysAreNotTheEditors)
{
    fake->media.movies.clear();
    open();
    const auto other = std::make_shared<tests::FakePlayerItem>(nullptr);
    other->becomeReady(3);
    editor->observeValueForKeyPath_ofObject_change_context("status", *other, {}, nullptr);
    EXPECT_FALSE(editor->currentItemLoaded());
    fake->media.item()->becomeReady(10);
    editor->setCurrentItemLoaded(false);
    editor->observeValueForKeyPath_ofObject_change_context("rate", *editor->avPlayerItem(), {}, nullptr);
    EXPECT_FALSE(editor->currentItemLoaded());
}

TEST_F(Playback, AFailedItemIsNeverLoaded)
{
    fake->media.movies[kMovie] = tests::FakeMovie::failing();
    open();
    EXPECT_EQ(editor->avPlayerItem()->status(), PlayerItem::Status::Failed);
    EXPECT_FALSE(editor->currentItemLoaded());
    EXPECT_EQ(editor->avTrimmer()->delegate(), nullptr);
    EXPECT_TRUE(std::isnan(editor->getPlayerDuration()));
}

TEST_F(Playback, TheLargeButtonPlaysHidesTheChromeAndGoesForGood)
{
    open();
    tap(editor->videoOverlayPlayButton()->asView());
    EXPECT_TRUE(player().isPlaying());
    EXPECT_TRUE(editor->isUIHidden());
    EXPECT_FALSE(editor->isIntroMode());
    EXPECT_EQ(editor->videoOverlayPlayButton()->asView()->superview(), nullptr);
    EXPECT_EQ(bottom(),
              (Items{editor->shareButton(), editor->flexSpace(), editor->pauseButton(), editor->flexSpace()}));

    // Later plays do not touch it.
    editor->view()->addSubview(editor->videoOverlayPlayButton()->asView());
    editor->playAction();
    EXPECT_EQ(editor->videoOverlayPlayButton()->asView()->superview(), editor->view());
}

TEST_F(Playback, PausingShowsPlayButNeitherTheBarsNorAnotherPlace)
{
    open();
    editor->playAction();
    player().advance(2);
    const auto seeks = player().seeks().size();
    editor->pauseAction();
    EXPECT_FALSE(player().isPlaying());
    EXPECT_TRUE(editor->isUIHidden());
    EXPECT_EQ(player().seeks().size(), seeks);
    EXPECT_EQ(bottom(), (Items{editor->shareButton(), editor->flexSpace(), editor->playButton(), editor->flexSpace()}));
}

TEST_F(Playback, ThePadsOneBarShowsPauseAndPlay)
{
    makePlatform({1024, 768});
    open();
    editor->playAction();
    EXPECT_EQ(top(), pad(editor->cancelButton(), {editor->pauseButton(), editor->shareButton(), editor->saveButton()}));
    editor->pauseAction();
    EXPECT_EQ(top(), pad(editor->cancelButton(), {editor->playButton(), editor->shareButton(), editor->saveButton()}));
    editor->setTrimming(true);
    editor->pauseAction();
    EXPECT_EQ(top(),
              pad(editor->cancelTrimButton(), {editor->playButton(), editor->shareButton(), editor->trimButton()}));
}

TEST_F(Playback, ThePlayHeadFollowsPlaying)
{
    open();
    editor->playAction();
    player().advance(2.5);
    EXPECT_NEAR(editor->avTrimmer()->value(), 2.5, 1.0 / 30 + 1e-6);
    player().advance(1);
    EXPECT_NEAR(editor->avTrimmer()->value(), 3.5, 1.0 / 30 + 1e-6);
}

TEST_F(Playback, PlayingInTrimModeGoesFromStartToEndAndStartsAgain)
{
    open();
    trimFrom(5, 8);
    editor->playAction();
    EXPECT_NEAR(player().currentTime().seconds(), 5, 1e-9);
    player().advance(4);
    settle();
    EXPECT_FALSE(player().isPlaying());
    EXPECT_NEAR(player().currentTime().seconds(), 8, 1e-9);
    editor->playAction();
    EXPECT_NEAR(player().currentTime().seconds(), 5, 1e-9);
    EXPECT_TRUE(player().isPlaying());
}

TEST_F(Playback, TheLatestEndOfATrimsRangeCanBeTakenBack)
{
    open();
    EXPECT_EQ(editor->timeObserver(), nullptr);
    trimFrom(5, 8);
    editor->playAction();
    const auto former = editor->timeObserver();
    editor->playAction();
    ASSERT_NE(editor->timeObserver(), former);
    player().removeTimeObserver(former);
    player().removeTimeObserver(editor->timeObserver());
    player().advance(4);
    EXPECT_TRUE(player().isPlaying()) << "behind 8 where nobody waits any more";
}

TEST_F(Playback, AFormerEndStaysAttachedAndKeepsPausing)
{
    open();
    trimFrom(5, 8);
    editor->playAction();
    player().advance(4);
    settle();
    editor->movieScrubber_editingEndValueDidChange(*editor->avTrimmer(), 9.5);
    settle();
    editor->playAction();
    player().advance(4);
    settle();
    EXPECT_FALSE(player().isPlaying());
    EXPECT_NEAR(player().currentTime().seconds(), 8, 1e-9);
}

TEST_F(Playback, TheEndOfTheMovieShowsTheBarsPlayAndTheStart)
{
    open();
    expectTheEndShowsTheBarsAndTheStart();
    EXPECT_EQ(bottom(), (Items{editor->shareButton(), editor->flexSpace(), editor->playButton(), editor->flexSpace()}));
    EXPECT_EQ(editor->avTrimmer()->value(), 0);
}

TEST_F(Playback, ATrimThatEndsWithTheMovieShowsTheBarsPlayAndTheStartToo)
{
    open();
    trimFrom(5, editor->getPlayerDuration());
    for (int run = 0; run < 2; ++run) {
        expectTheEndShowsTheBarsAndTheStart();
        EXPECT_TRUE(editor->isTrimming());
    }
}

TEST_F(Playback, DraggingPausesAndPlayingDoesNotMoveThePlayHeadMeanwhile)
{
    open();
    editor->playAction();
    player().advance(2);
    editor->movieScrubberDidBeginScrubbing_withHandle(*editor->avTrimmer(), 1);
    EXPECT_TRUE(editor->isScrubbing());
    EXPECT_FALSE(player().isPlaying());
    editor->avTrimmer()->setValue(7);
    player().play();
    player().advance(1);
    EXPECT_EQ(editor->avTrimmer()->value(), 7);
    editor->movieScrubberDidEndScrubbing_withHandle(*editor->avTrimmer(), 1);
    EXPECT_FALSE(editor->isScrubbing());
    EXPECT_NEAR(player().seeks().back().seconds(), 7, 1e-9);
    player().play();
    player().advance(1);
    EXPECT_NEAR(editor->avTrimmer()->value(), 8, 0.05);
}

TEST_F(Playback, AFingerOnTheStripSeeksAtOnce)
{
    open();
    const base::Rect strip = stripFrame();
    fake->window->touchDown({1, {strip.minX() + 180, strip.minY() + 19}, {}});
    EXPECT_TRUE(editor->isScrubbing());
    EXPECT_NEAR(player().seeks().back().seconds(), 5, 0.05);
    fake->window->touchMove({1, {strip.minX() + 350, strip.minY() + 19}, {}});
    EXPECT_NEAR(player().seeks().back().seconds(), 10, 0.05);
    fake->window->touchUp({1, {strip.minX() + 350, strip.minY() + 19}, {}});
    EXPECT_FALSE(editor->isScrubbing());
}

TEST_F(Playback, ReloadingBuildsTheWholeChainAnew)
{
    open();
    fake->media.movies["/other.mp4"] = tests::FakeMovie::lasting(4);
    const auto formerItem = editor->avPlayerItem();
    const auto former = fake->media.player();
    editor->reloadAVLayerWithURL(base::Url::fromPath("/other.mp4"));
    EXPECT_FALSE(editor->currentItemLoaded());
    EXPECT_EQ(formerItem->observerCount(), 0U);
    EXPECT_NE(editor->avPlayer(), former);
    EXPECT_EQ(editor->avPlayerLayer()->player(), editor->avPlayer());
    EXPECT_EQ(editor->videoURL(), base::Url::fromPath("/other.mp4"));
    EXPECT_EQ(editor->originalVideoURL(), base::Url::fromPath(kMovie));
    EXPECT_EQ(player().actionAtItemEnd, platform::ActionAtItemEnd::Pause);
    EXPECT_EQ(player().seeks().back(), MediaTime::zero());
    settle();
    EXPECT_TRUE(editor->currentItemLoaded());
    EXPECT_EQ(editor->editEndTime(), 4);
}

TEST_F(Playback, ReloadingEndsTrimModeFirst)
{
    open();
    trimFrom(2, 5);
    editor->reloadAVLayerWithURL(base::Url::fromPath(kMovie));
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_EQ(top(), phoneTop(editor->doneButton(), editor->saveButton()));
}

TEST_F(Playback, ThePlayHeadFollowsTheNewMovieToo)
{
    open();
    fake->media.movies["/other.mp4"] = tests::FakeMovie::lasting(4);
    editor->reloadAVLayerWithURL(base::Url::fromPath("/other.mp4"));
    settle();
    editor->playAction();
    player().advance(1.5);
    EXPECT_NEAR(editor->avTrimmer()->value(), 1.5, 1.0 / 30 + 1e-6);
}

TEST_F(Playback, ThePlayHeadMovesThirtyTimesASecond)
{
    open();
    std::vector<double> places;
    editor->playAction();
    for (int i = 0; i < 1200; ++i) {
        player().advance(1.0 / 600);
        if (places.empty() || editor->avTrimmer()->value() != places.back())
            places.push_back(editor->avTrimmer()->value());
    }
    EXPECT_EQ(places.size(), 60U + 1) << "with the one where it stood";
}

TEST_F(Playback, PlacesAreSoughtInTheTimescaleOfThePlayersTime)
{
    open();
    editor->movieScrubber_valueDidChange(*editor->avTrimmer(), 1.0 / 3);
    EXPECT_EQ(player().seeks().back().value, 200);
    EXPECT_EQ(player().seeks().back().timescale, 600);
}

TEST_F(Playback, APlaceThatIsNoNumberIsSoughtAsAnInvalidTimeAndChangesNothing)
{
    open();
    editor->movieScrubber_valueDidChange(*editor->avTrimmer(), 3);
    editor->movieScrubber_valueDidChange(*editor->avTrimmer(), std::nan(""));
    EXPECT_FALSE(player().seeks().back().isValid());
    EXPECT_NEAR(player().currentTime().seconds(), 3, 1e-9);
}

TEST_F(Playback, WithoutAPlayersTimescaleATimeIsInvalid)
{
    open();
    trimFrom(2, 5);
    const auto kept = editor->avPlayer();
    editor->setAvPlayer(nullptr);
    editor->trimVideo();
    editor->setAvPlayer(kept);
    ASSERT_TRUE(fake->media.exportSession()->timeRange);
    EXPECT_FALSE(fake->media.exportSession()->timeRange->start.isValid());
    EXPECT_FALSE(fake->media.exportSession()->timeRange->duration.isValid());
}
