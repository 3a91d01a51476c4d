#include "linux/ffmpeg/VideoSource.h"
#include "support/EngineTest.h"

#include <algorithm>
#include <random>
#include <semaphore>

namespace {

class Seeking : public tests::EngineTest {
protected:
    MediaTime frame(int number, int rate) { return MediaTime::make(number, rate); }
};

TEST_F(Seeking, TheTimeIsTheSoughtOneAtOnceAndThePictureFollows)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    player->seekToTime(at(1.5));
    EXPECT_EQ(player->currentTime(), at(1.5));
    EXPECT_EQ(item->currentTime(), at(1.5));
    EXPECT_EQ(player->currentTime().timescale, 15360);
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 0);
    EXPECT_EQ(numberAt(at(1.5)), 45);
}

TEST_F(Seeking, EveryPictureOfALongGroupIsFoundInAnyOrder)
{
    ASSERT_EQ(open(movie("long-gop.mp4")), Status::ReadyToPlay);
    std::mt19937 random(7);
    for (int i = 0; i < 25; ++i) {
        const int number = static_cast<int>(random() % 1200);
        ASSERT_EQ(numberAt(frame(number, 60)), number);
    }
}

TEST_F(Seeking, APictureIsVisibleFromItsTimeUntilTheNext)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(MediaTime::make(60LL * 512, 15360)), 60);
    EXPECT_EQ(numberAt(MediaTime::make(61LL * 512 - 1, 15360)), 60);
    EXPECT_EQ(numberAt(MediaTime::make(61LL * 512, 15360)), 61);
    EXPECT_EQ(numberAt(MediaTime::make(60LL * 512 - 1, 15360)), 59);
}

TEST_F(Seeking, IrregularTimesAreKept)
{
    ASSERT_EQ(open(movie("vfr.mkv")), Status::ReadyToPlay);
    const auto time = [](int n) { return 33 * n + 2 * (7 * n % 11) + 400 * (n / 20); };
    for (const int n : {79, 3, 40, 19, 20, 21, 0, 55}) {
        EXPECT_EQ(numberAt(MediaTime::make(time(n), 1000)), time(n));
        EXPECT_EQ(player->currentFrame()->time(), MediaTime::make(time(n), 1000));
    }
    EXPECT_EQ(numberAt(MediaTime::make(time(20) - 1, 1000)), time(19)) << "the gap shows the picture before it";
}

TEST_F(Seeking, BothEndsClamp)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(at(99)), 119);
    EXPECT_EQ(player->currentTime(), at(4));
    EXPECT_EQ(numberAt(at(-5)), 0);
    EXPECT_EQ(player->currentTime(), at(0));
}

TEST_F(Seeking, ATimeThatIsNotNumericIsIgnored)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(at(2)), 60);
    for (const auto time : {MediaTime::invalid(), MediaTime::indefinite(), MediaTime::positiveInfinity()})
        player->seekToTime(time);
    EXPECT_EQ(player->currentTime(), at(2));
}

TEST_F(Seeking, ANewerSeekOvertakesTheOlderOnes)
{
    ASSERT_EQ(open(movie("long-gop.mp4")), Status::ReadyToPlay);
    for (int i = 0; i < 300; ++i)
        player->seekToTime(frame(i * 4, 60));
    EXPECT_EQ(numberAt(frame(17, 60)), 17);
}

TEST_F(Seeking, APictureThatComesAfterTheNextSeekIsNotShown)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    std::vector<int> shown;
    player->setFrameHandler([&] { shown.push_back(tests::numberIn(player->currentFrame())); });
    std::counting_semaphore<> posted(0);
    mainQueue.setWake([&] { posted.release(); });
    player->seekToTime(at(1));
    posted.acquire(); // the observers' call
    ASSERT_TRUE(posted.try_acquire_for(std::chrono::seconds(20))) << "the picture, which nobody has taken yet";
    mainQueue.setWake({});
    player->seekToTime(at(2));
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_EQ(shown, std::vector<int>{60});
}

TEST_F(Seeking, ASeekBeforeTheItemIsReadyIsKept)
{
    asset = media.assetWithURL(base::Url::fromPath(movie("clock.mp4")));
    item = media.playerItemWithAsset(asset);
    player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(media.playerWithPlayerItem(item));
    player->seekToTime(at(3));
    EXPECT_EQ(player->currentTime(), at(3));
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 90);
}

TEST_F(Seeking, OffsetsEditListsAndBroadcastClocksStartAtZero)
{
    ASSERT_EQ(open(movie("edit-list.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(at(1)), 60);
    EXPECT_EQ(numberAt(at(0)), 30);
    ASSERT_EQ(open(movie("start-offset.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(at(2.5)), 30);
    EXPECT_EQ(numberAt(at(1)), 0) << "before the first picture, the first";
    EXPECT_EQ(numberAt(at(5.5)), 119);
    ASSERT_EQ(open(movie("size-change.ts")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(MediaTime::make(15, 30)), 15);
    EXPECT_EQ(numberAt(MediaTime::make(45, 30)), 45);
    EXPECT_EQ(player->currentFrame()->displaySize(), (base::Size{360, 640}));
    EXPECT_EQ(numberAt(MediaTime::make(7, 30)), 7);
}

TEST_F(Seeking, OtherCodecsAreExactToo)
{
    ASSERT_EQ(open(movie("vp9.webm")), Status::ReadyToPlay);
    for (const int n : {50, 10, 59, 0})
        EXPECT_EQ(numberAt(MediaTime::make(n * 1000 / 30 + 9, 1000)), n);
}

TEST_F(Seeking, PeriodicObserversAreCalledAfterASeekAndNotInsideIt)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    std::vector<MediaTime> told;
    const auto token = player->addPeriodicTimeObserver(at(0.1), [&](MediaTime time) { told.push_back(time); });
    player->seekToTime(at(2));
    EXPECT_TRUE(told.empty());
    mainQueue.drain();
    EXPECT_EQ(told, std::vector<MediaTime>{at(2)});
    player->removeTimeObserver(token);
    player->seekToTime(at(3));
    mainQueue.drain();
    EXPECT_EQ(told.size(), 1u);
}

TEST_F(Seeking, TheFrameHandlerIsNotCalledInsideTheSeek)
{
    ASSERT_EQ(open(movie("clock.mp4")), Status::ReadyToPlay);
    int changes = 0;
    player->setFrameHandler([&] { ++changes; });
    player->seekToTime(at(1));
    EXPECT_EQ(changes, 0);
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_EQ(changes, 1);
    EXPECT_EQ(numberAt(at(1.001)), 30);
    EXPECT_EQ(changes, 1) << "the picture is the same";
}

TEST_F(Seeking, StepsKeepToIrregularTimesAndPassOverWhatAnEditListHides)
{
    ASSERT_EQ(open(movie("vfr.mkv")), Status::ReadyToPlay);
    const auto time = [](int n) { return 33 * n + 2 * (7 * n % 11) + 400 * (n / 20); };
    const auto stepTo = [&](int count) {
        player->stepByCount(count);
        waitFor([&] { return player->isSettled(); });
        return tests::numberIn(player->currentFrame());
    };
    numberAt(MediaTime::make(time(18), 1000));
    for (const int n : {19, 20, 21}) {
        EXPECT_EQ(stepTo(1), time(n));
        EXPECT_EQ(player->currentTime(), MediaTime::make(time(n), 1000));
    }
    EXPECT_EQ(stepTo(-3), time(18));
    ASSERT_EQ(open(movie("edit-list.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(stepTo(2), 32);
    EXPECT_EQ(player->currentTime(), MediaTime::make(2, 30));
    EXPECT_EQ(stepTo(-5), 30);
    ASSERT_EQ(open(movie("size-change.ts")), Status::ReadyToPlay);
    EXPECT_EQ(stepTo(31), 31);
    EXPECT_EQ(stepTo(-30), 1);
}

TEST_F(Seeking, StepsBeforeTheItemIsReadyAreKept)
{
    asset = media.assetWithURL(base::Url::fromPath(movie("clock.mp4")));
    item = media.playerItemWithAsset(asset);
    player = std::dynamic_pointer_cast<ffmpeg::FFmpegPlayer>(media.playerWithPlayerItem(item));
    player->stepByCount(3);
    player->stepByCount(4);
    ASSERT_TRUE(waitFor([&] { return player->isSettled(); }));
    EXPECT_EQ(tests::numberIn(player->currentFrame()), 7);
}

// How much is decoded.

class Scrubbing : public Seeking {
protected:
    std::unique_ptr<ffmpeg::VideoSource> source(const std::string& name)
    {
        auto file = ffmpeg::OpenFile::open(movie(name));
        auto opened = ffmpeg::Movie::open(std::move(file).value(), cancelled);
        auto made = ffmpeg::VideoSource::open(std::move(opened).value(), cancelled, 2);
        return std::move(made).value();
    }
    int number(ffmpeg::VideoSource& from, int of, int rate = 60)
    {
        const auto shown =
            from.at(std::int64_t(of) * 15360 / rate, ffmpeg::VideoSource::Want::Any, [] { return false; });
        return shown ? tests::numberIn(shown->frame) : -1;
    }

    std::shared_ptr<std::atomic<bool>> cancelled = std::make_shared<std::atomic<bool>>(false);
};

TEST_F(Scrubbing, WhatLiesBesideAPictureIsDecodedOnceMoreAtMost)
{
    const auto movie = source("long-gop.mp4");
    EXPECT_EQ(number(*movie, 300), 300);
    const auto once = movie->decodedCount();
    EXPECT_LT(once, 304) << "not what nothing refers to";
    for (int i = 299; i >= 220; --i)
        ASSERT_EQ(number(*movie, i), i);
    EXPECT_EQ(movie->decodedCount(), once) << "stepping back a little decodes nothing again";
    for (int i = 219; i >= 0; --i)
        ASSERT_EQ(number(*movie, i), i);
    EXPECT_LE(movie->decodedCount(), once + 224) << "stepping back farther decodes once";
}

TEST_F(Scrubbing, GoingForwardGoesOnWhereItStood)
{
    const auto movie = source("long-gop.mp4");
    EXPECT_EQ(number(*movie, 300), 300);
    const auto once = movie->decodedCount();
    EXPECT_EQ(number(*movie, 310), 310);
    EXPECT_LE(movie->decodedCount(), once + 10);
}

TEST_F(Seeking, WhatTakesLongShowsAPictureNearItFirst)
{
    ASSERT_EQ(open(movie("long-gop.mp4")), Status::ReadyToPlay);
    EXPECT_EQ(numberAt(frame(1100, 60)), 1100);
    std::vector<int> shown;
    player->setFrameHandler([&] { shown.push_back(tests::numberIn(player->currentFrame())); });
    EXPECT_EQ(numberAt(frame(400, 60)), 400);
    ASSERT_GE(shown.size(), 2u);
    EXPECT_EQ(shown.back(), 400);
    for (std::size_t i = 1; i < shown.size(); ++i)
        EXPECT_LT(std::abs(shown[i] - 400), std::abs(shown[i - 1] - 400)) << "each is nearer";
}

TEST_F(Scrubbing, TheCacheKeepsItsBound)
{
    ffmpeg::FrameCache cache(3'000'000);
    const auto movie = source("long-gop.mp4");
    std::int64_t until = 0;
    for (int i = 0; i < 100; ++i) {
        const auto shown = movie->at(until, ffmpeg::VideoSource::Want::Full, [] { return false; });
        ASSERT_TRUE(shown);
        cache.insert(*shown, shown->frame->pts());
        ASSERT_LE(cache.byteCount(), 3'000'000u);
        until = shown->until;
    }
    EXPECT_FALSE(cache.at(0)) << "the farthest goes first";
    EXPECT_TRUE(cache.at(99LL * 256));
    EXPECT_FALSE(cache.at(100LL * 256)) << "nobody knows what comes there";
}

/// A grey picture that was never coded.
ffmpeg::ShownFrame madeFrame(std::int64_t pts, int width, int height)
{
    ffmpeg::Owned<AVFrame> picture = ffmpeg::newFrame();
    picture->width = width;
    picture->height = height;
    picture->format = AV_PIX_FMT_YUV420P;
    EXPECT_EQ(av_frame_get_buffer(picture.get(), 0), 0);
    for (int plane = 0; plane < 3; ++plane)
        std::fill_n(picture->data[plane], std::ptrdiff_t(picture->linesize[plane]) * (plane == 0 ? height : height / 2),
                    std::uint8_t(128));
    return {std::make_shared<ffmpeg::DecodedFrame>(std::move(picture), pts, base::MediaTime::make(pts, 60),
                                                   ffmpeg::Orientation{}, AVRational{1, 1}),
            pts + 1};
}

TEST_F(Scrubbing, TenSecondsOfALargeMovieStayUnderTheBoundAndTheNearestInFull)
{
    ffmpeg::FrameCache cache;
    EXPECT_GE(cache.capacity(*madeFrame(0, 1920, 1080).frame, ffmpeg::FrameCache::Overflow::Reduce), 600);
    for (int i = 0; i < 600; ++i) {
        cache.insert(madeFrame(i, 1920, 1080), i, ffmpeg::FrameCache::Overflow::Reduce, 700);
        ASSERT_LE(cache.byteCount(), ffmpeg::FrameCache::kMostBytes);
    }
    for (int i = 0; i < 600; ++i)
        ASSERT_TRUE(cache.at(i)) << i;
    for (int i = 596; i < 600; ++i)
        EXPECT_FALSE(cache.at(i)->frame->isReduced()) << i;
    EXPECT_TRUE(cache.at(0)->frame->isReduced());
    EXPECT_EQ(cache.at(0)->frame->displaySize(), (base::Size{1920, 1080}));
    cache.insert(madeFrame(0, 960, 540), 599, ffmpeg::FrameCache::Overflow::Reduce, 700);
    EXPECT_TRUE(cache.at(599)) << "what is near stays";
}

TEST_F(Scrubbing, PicturesNearTheFingerAreReducedLessThanThoseFarAway)
{
    ffmpeg::FrameCache cache(40'000'000);
    for (int i = 0; i < 100; ++i)
        cache.insert(madeFrame(i, 1920, 1080), i, ffmpeg::FrameCache::Overflow::Reduce, 700);
    const auto width = [&](int i) { return cache.at(i)->frame->picture().width; };
    EXPECT_EQ(width(0), 480);
    EXPECT_EQ(width(95), 960);
    EXPECT_EQ(width(99), 1920);
    for (int i = 1; i < 100; ++i)
        EXPECT_GE(width(i), width(i - 1)) << i;
}

TEST_F(Scrubbing, WhatLiesOutOfReachGoesBeforeAnythingIsMadeSmaller)
{
    ffmpeg::FrameCache cache(20'000'000);
    for (int i = 0; i < 20; ++i)
        cache.insert(madeFrame(i, 960, 540), i, ffmpeg::FrameCache::Overflow::Reduce, 100);
    for (int i = 1000; i < 1010; ++i)
        cache.insert(madeFrame(i, 960, 540), i, ffmpeg::FrameCache::Overflow::Reduce, 100);
    EXPECT_FALSE(cache.at(0));
    for (int i = 1000; i < 1010; ++i)
        EXPECT_EQ(cache.at(i)->frame->picture().width, 960);
}

TEST_F(Scrubbing, OfVeryLargePicturesFewAreKeptInFull)
{
    ffmpeg::FrameCache cache;
    for (int i = 0; i < 12; ++i)
        cache.insert(madeFrame(i, 3840, 2160), i, ffmpeg::FrameCache::Overflow::Reduce, 100);
    int full = 0;
    for (int i = 0; i < 12; ++i)
        full += !cache.at(i)->frame->isReduced();
    EXPECT_EQ(full, 2);
    EXPECT_EQ(cache.at(0)->frame->picture().width, 480);
    EXPECT_LT(cache.byteCount(), std::size_t{30} << 20);
}

TEST_F(Scrubbing, AStoppedSearchGivesNothingAndTheNextOneStillWorks)
{
    const auto movie = source("long-gop.mp4");
    int asked = 0;
    EXPECT_FALSE(movie->at(1000LL * 256, ffmpeg::VideoSource::Want::Any, [&] { return ++asked > 50; }));
    EXPECT_EQ(number(*movie, 5), 5);
    EXPECT_EQ(number(*movie, 700), 700);
}

} // namespace
