#include "platform/media/PlayerLayer.h"

#include "support/FakeMedia.h"

#include <gtest/gtest.h>

using platform::PlayerLayer;

namespace {

class Layers : public testing::Test {
protected:
    base::ManualClock clock;
    base::MainQueue mainQueue{clock};
    runtime::NotificationCenter center;
    tests::FakeMediaFramework media{mainQueue, center};

    std::shared_ptr<platform::Player> playerOf(const tests::FakeMovie& movie)
    {
        media.movies["/movie.mp4"] = movie;
        return media.playerWithPlayerItem(
            media.playerItemWithAsset(media.assetWithURL(base::Url::fromPath("/movie.mp4"))));
    }
};

} // namespace

TEST_F(Layers, ShowAPlayersPictureFittedInTheMiddle)
{
    const auto player = playerOf(tests::FakeMovie::lasting(10));
    const auto layer = PlayerLayer::withPlayer(player);
    EXPECT_TRUE(layer->videoRect(base::Rect::make(0, 0, 100, 100)).isEmpty());
    media.player()->show(std::make_shared<tests::FakeVideoFrame>(base::MediaTime::zero(), base::Size{1920, 1080}));
    EXPECT_EQ(layer->videoRect(base::Rect::make(0, 0, 160, 200)), base::Rect::make(0, 55, 160, 90));
    EXPECT_EQ(layer->videoRect(base::Rect::make(0, 0, 320, 90)), base::Rect::make(80, 0, 160, 90));
}

TEST_F(Layers, AskToBeDrawnWithEachNewPictureAndPlayer)
{
    const auto player = playerOf(tests::FakeMovie::lasting(10));
    const auto layer = PlayerLayer::withPlayer(player);
    int drawings = 0;
    layer->setDisplayHandler([&] { ++drawings; });
    media.player()->show(std::make_shared<tests::FakeVideoFrame>(base::MediaTime::zero(), base::Size{2, 2}));
    EXPECT_EQ(drawings, 1);
    layer->setPlayer(playerOf(tests::FakeMovie::lasting(5)));
    EXPECT_EQ(drawings, 2);
    layer->setPlayer(layer->player());
    EXPECT_EQ(drawings, 2);
}

TEST_F(Layers, TellWhyAMovieCannotBePlayedAndAskToBeDrawnThen)
{
    const auto layer = PlayerLayer::withPlayer(
        playerOf(tests::FakeMovie::failing(base::Error::make("test", 1, "movie.mp4 is no movie."))));
    int drawings = 0;
    layer->setDisplayHandler([&] { ++drawings; });
    EXPECT_FALSE(layer->hasFailed());
    EXPECT_EQ(layer->failure(), nullptr);
    mainQueue.drain();
    EXPECT_TRUE(layer->hasFailed());
    EXPECT_EQ(layer->failure()->description(), "movie.mp4 is no movie.");
    EXPECT_GE(drawings, 1);
}

TEST_F(Layers, TellThatAMovieWasCutOffWhereItBeginsAndRests)
{
    auto movie = tests::FakeMovie::lasting(10);
    movie.cutOff = platform::CutOff{10, 20};
    const auto player = playerOf(movie);
    const auto layer = PlayerLayer::withPlayer(player);
    mainQueue.drain();
    EXPECT_EQ(layer->notice(), (platform::CutOff{10, 20}));
    player->play();
    EXPECT_EQ(layer->notice(), std::nullopt);
    player->pause();
    player->seekToTime(base::MediaTime::fromSeconds(3, 600));
    mainQueue.drain();
    EXPECT_EQ(layer->notice(), std::nullopt);
    layer->setPlayer(playerOf(tests::FakeMovie::lasting(5)));
    mainQueue.drain();
    EXPECT_EQ(layer->notice(), std::nullopt) << "this one is whole";
}

TEST_F(Layers, LetGoOfAFormerPlayer)
{
    const auto former = playerOf(tests::FakeMovie::lasting(10));
    const auto layer = PlayerLayer::withPlayer(former);
    EXPECT_EQ(former->currentItem()->observerCount(), 1U);
    layer->setPlayer(nullptr);
    EXPECT_EQ(former->currentItem()->observerCount(), 0U);
    EXPECT_FALSE(layer->hasFailed());
    EXPECT_EQ(layer->currentFrame(), nullptr);
}
