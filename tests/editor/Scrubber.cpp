#include "EditorFixture.h"

namespace {

class Scrubber : public EditorTest {
protected:
    std::vector<double> stamps(int count, double start, double end)
    {
        return editor->movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(*editor->avTrimmer(), count, start,
                                                                                end);
    }
};

} // namespace

TEST_F(Scrubber, TimestampsAreEvenlySpacedAndStopAtTheMoviesEnd)
{
    fake->media.movies[kMovie] = tests::FakeMovie::lasting(15);
    open();
    EXPECT_EQ(stamps(10, 0, 20), (std::vector<double>{0, 2, 4, 6, 8, 10, 12, 14}));
}

TEST_F(Scrubber, TimestampsStopAtTheirCountAndOneAtTheVeryEndCounts)
{
    open();
    EXPECT_EQ(stamps(5, 0, 10), (std::vector<double>{0, 2, 4, 6, 8}));
    EXPECT_EQ(stamps(3, 1, 4), (std::vector<double>{1, 2, 3}));
    EXPECT_EQ(stamps(6, 0, 12), (std::vector<double>{0, 2, 4, 6, 8, 10}));
}

TEST_F(Scrubber, AnEndOfZeroGivesOneTimestampAndACountOfZeroNone)
{
    open();
    EXPECT_EQ(stamps(10, 0, 0), (std::vector<double>{0}));
    EXPECT_TRUE(stamps(0, 0, 20).empty());
    EXPECT_TRUE(stamps(-3, 0, 20).empty());
}

TEST_F(Scrubber, AnUnknownDurationStopsAfterTheFirst)
{
    fake->media.movies.clear();
    open();
    EXPECT_EQ(stamps(10, 0, 20), (std::vector<double>{0}));
}

TEST_F(Scrubber, EnteringTrimModeAndCancellingTurnsTheFirstButtonIntoDone)
{
    open();
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    EXPECT_TRUE(editor->isTrimming());
    EXPECT_TRUE(editor->hasEdit());
    EXPECT_EQ(top(), phoneTop(editor->cancelTrimButton(), editor->trimButton()));
    editor->undoAction();
    EXPECT_FALSE(editor->isTrimming());
    EXPECT_EQ(top(), phoneTop(editor->doneButton(), editor->saveButton()));
    EXPECT_EQ(bottom(), (Items{editor->shareButton(), editor->flexSpace(), editor->playButton(), editor->flexSpace()}));
}

TEST_F(Scrubber, UndoDoesNothingWhileExporting)
{
    open();
    editor->movieScrubberDidBeginEditing(*editor->avTrimmer());
    editor->setExporting(true);
    editor->undoAction();
    EXPECT_TRUE(editor->isTrimming());
}

TEST_F(Scrubber, MovingAHandlePausesSeeksLaterAndLeavesTheBarsAsTheyWere)
{
    for (const bool isStart : {true, false}) {
        SCOPED_TRACE(isStart);
        makePlatform(tests::FakePlatform::kPhone);
        open();
        editor->playAction();
        const auto before = bottom();
        const auto seeks = player().seeks().size();
        if (isStart)
            editor->movieScrubber_editingStartValueDidChange(*editor->avTrimmer(), 3);
        else
            editor->movieScrubber_editingEndValueDidChange(*editor->avTrimmer(), 3);
        EXPECT_FALSE(player().isPlaying());
        EXPECT_TRUE(editor->isTrimming());
        EXPECT_EQ(editor->editStartTime(), isStart ? 3 : 0);
        EXPECT_EQ(editor->editEndTime(), isStart ? 10 : 3);
        EXPECT_EQ(player().seeks().size(), seeks);
        EXPECT_EQ(bottom(), before);
        fake->machine.drain();
        EXPECT_NEAR(player().seeks().back().seconds(), 3, 1e-9);
        close();
    }
}

TEST_F(Scrubber, ATurnedTrackGivesAnUprightSize)
{
    auto movie = tests::FakeMovie::lasting(10, {1920, 1080});
    movie.tracks.front().preferredTransform = {0, 1, -1, 0, 1080, 0};
    fake->media.movies[kMovie] = movie;
    open();
    EXPECT_EQ(editor->getVideoSize(), (base::Size{1080, 1920}));
    EXPECT_DOUBLE_EQ(editor->movieScrubberThumbnailAspectRatio(*editor->avTrimmer()), 0.5625);
}

TEST_F(Scrubber, OnlyAMovieThatIsWideAndHighHasAnAspectRatioOfItsOwn)
{
    const auto ratioOf = [this](base::Size size) {
        close();
        makePlatform(tests::FakePlatform::kPhone);
        fake->media.movies[kMovie] = tests::FakeMovie::lasting(10, size);
        open();
        return editor->movieScrubberThumbnailAspectRatio(*editor->avTrimmer());
    };
    EXPECT_EQ(ratioOf({0, 100}), 1);
    EXPECT_EQ(ratioOf({100, 0}), 1);
    EXPECT_EQ(ratioOf({1, 2}), 0.5);
    EXPECT_EQ(ratioOf({2, 1}), 2);
}

TEST_F(Scrubber, AMovieWithoutAPictureHasNoSizeAndAnAspectRatioOfOne)
{
    auto movie = tests::FakeMovie::lasting(10);
    movie.tracks.erase(movie.tracks.begin());
    fake->media.movies[kMovie] = movie;
    open();
    EXPECT_EQ(editor->getVideoSize(), base::Size{});
    EXPECT_EQ(editor->movieScrubberThumbnailAspectRatio(*editor->avTrimmer()), 1.0);
}
