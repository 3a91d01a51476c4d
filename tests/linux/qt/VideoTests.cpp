// A player's picture on the screen.
#include "Stage.h"

#include <algorithm>
#include <functional>
#include <numeric>

namespace tests {

namespace {

using Quality = platform::VideoFrame::Quality;
using ::testing::ElementsAre;

class Video : public Stage {
protected:
    explicit Video(double atScale = 1) : Stage(atScale) {}
};

class VideoAtTwo : public Video {
protected:
    VideoAtTwo() : Video(2) {}
};

void expectLetterboxed(const std::function<QColor(double, double)>& colorAt)
{
    // 100 × 100 in 200 × 100: black on both sides.
    EXPECT_EQ(colorAt(25, 50), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(175, 50), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(49, 50), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(50, 10), QColor(255, 0, 0));
    EXPECT_EQ(colorAt(99, 10), QColor(255, 0, 0));
    EXPECT_EQ(colorAt(100, 10), QColor(0, 255, 0));
    EXPECT_EQ(colorAt(60, 90), QColor(0, 0, 255));
    EXPECT_EQ(colorAt(149, 90), QColor(255, 255, 255));
    EXPECT_EQ(colorAt(150, 90), QColor(0, 0, 0));
}

TEST_F(Video, KeepsItsProportionsOnBlack)
{
    addColor(base::Rect::make(0, 0, 200, 100), kGreen);
    addPlayer(base::Rect::make(0, 0, 200, 100), std::make_shared<QuarteredFrame>(base::Size{640, 640}));
    expectLetterboxed([this](double x, double y) { return colorAt(x, y); });
}

TEST_F(VideoAtTwo, KeepsItsProportionsAtTwoPixelsAPoint)
{
    addPlayer(base::Rect::make(0, 0, 200, 100), std::make_shared<QuarteredFrame>(base::Size{640, 640}));
    expectLetterboxed([this](double x, double y) { return colorAt(x, y); });
}

TEST_F(Video, IsBlackWhileThereIsNoPicture)
{
    addColor(base::Rect::make(0, 0, 200, 100), kGreen);
    addPlayer(base::Rect::make(0, 0, 100, 100), nullptr);
    EXPECT_EQ(colorAt(50, 50), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(150, 50), QColor(0, 255, 0));
}

TEST_F(Video, AMovieThatCannotBePlayedSaysWhyWhereItsPictureWouldBe)
{
    const auto player = addPlayer(base::Rect::make(0, 0, 300, 300), nullptr);
    const auto lightPixels = [this] {
        const QImage screen = look();
        int light = 0;
        for (int y = 0; y < std::min(300, screen.height()); ++y)
            for (int x = 0; x < std::min(300, screen.width()); ++x)
                light += screen.pixelColor(x, y).lightness() > 150;
        return light;
    };
    EXPECT_EQ(lightPixels(), 0);
    std::dynamic_pointer_cast<FakePlayerItem>(player->currentItem())
        ->fail(base::Error::make("test", 1, "“holiday.mp4” is not a movie that can be opened."));
    EXPECT_GT(lightPixels(), 200);
}

TEST_F(Video, AMovieThatWasCutOffSaysSoOverItsFirstPictureBelowTheBar)
{
    constexpr std::uint32_t kWhite = 0xffffffff;
    constexpr int kAbove = 80; // the window is low: the place of the bar is out of sight
    const base::Rect frame = base::Rect::make(0, -kAbove, 200, 300);
    const auto white = std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{200, 300}, kWhite);
    const auto item = std::make_shared<FakePlayerItem>(std::make_shared<FakeAsset>(mainQueue, std::nullopt));
    const auto player = addPlayer(frame, white, item);
    const auto darkRows = [this] {
        const QImage screen = look();
        std::vector<int> rows;
        std::vector<int> xs(static_cast<std::size_t>(std::min(200, screen.width())));
        std::iota(xs.begin(), xs.end(), 0);
        for (int y = 0; y < screen.height(); ++y)
            if (std::any_of(xs.begin(), xs.end(), [&](int x) { return screen.pixelColor(x, y).lightness() < 100; }))
                rows.push_back(y);
        return rows;
    };
    EXPECT_THAT(darkRows(), ::testing::IsEmpty());
    FakeMovie movie = FakeMovie::lasting(10);
    movie.cutOff = platform::CutOff{1, {}};
    item->becomeReady(movie);
    const auto plate = darkRows();
    ASSERT_GT(plate.size(), 20U);
    EXPECT_GE(plate.front(), 86 - kAbove) << "the upper bar covers it";
    EXPECT_LT(plate.back(), 99) << "it ends in sight";
    player->play();
    player->show(white);
    EXPECT_THAT(darkRows(), ::testing::IsEmpty());
}

TEST_F(Video, APictureIsConvertedOnceForItsSize)
{
    const auto picture = std::make_shared<QuarteredFrame>(base::Size{640, 640});
    addPlayer(base::Rect::make(0, 0, 200, 100), picture);
    look();
    addColor(base::Rect::make(0, 0, 10, 10), kGreen);
    look();
    EXPECT_THAT(picture->renders, ElementsAre(Quality::Exact));
}

TEST_F(Video, IsFastWhilePlayingAndExactAtRest)
{
    const auto picture = std::make_shared<QuarteredFrame>(base::Size{640, 640});
    const auto player = addPlayer(base::Rect::make(0, 0, 200, 100), nullptr);
    player->play();
    player->show(picture);
    look();
    EXPECT_THAT(picture->renders, ElementsAre(Quality::Fast));
    player->pause();
    addColor(base::Rect::make(0, 0, 10, 10), kGreen);
    look();
    EXPECT_THAT(picture->renders, ElementsAre(Quality::Fast, Quality::Exact));
    player->play();
    addColor(base::Rect::make(10, 0, 10, 10), kGreen);
    look();
    EXPECT_EQ(picture->renders.size(), 2U) << "what is exact already stays";
}

TEST_F(Video, PicturesFollowEachOther)
{
    const auto player = addPlayer(base::Rect::make(0, 0, 200, 100), nullptr);
    player->play();
    for (std::uint32_t i = 1; i < 12; ++i) {
        player->show(std::make_shared<FakeVideoFrame>(base::MediaTime::zero(), base::Size{2, 1}, 0xff000000 + i * 20));
        ASSERT_EQ(colorAt(100, 50).blue(), static_cast<int>(i * 20));
    }
}

TEST_F(Video, WhatNobodySeesIsNotConverted)
{
    const auto picture = std::make_shared<QuarteredFrame>(base::Size{640, 640});
    const auto holder = add<platform::View>(base::Rect::make(0, 0, 200, 100));
    const auto player = std::make_shared<FakePlayer>(mainQueue, center, nullptr);
    const auto layer = platform::PlayerLayer::withPlayer(player);
    layer->setFrame(base::Rect::make(0, 0, 200, 100));
    holder->addSublayer(layer);
    holder->setHidden(true);
    player->show(picture);
    look();
    EXPECT_TRUE(picture->renders.empty());
    holder->setHidden(false);
    EXPECT_EQ(colorAt(60, 10), QColor(255, 0, 0));
}

TEST_F(Video, TheFirstPictureOnTheScreenIsAnnouncedOnce)
{
    int told = 0;
    presenter->setFirstPictureHandler([&] { ++told; });
    const auto player = addPlayer(base::Rect::make(0, 0, 200, 100), nullptr);
    look();
    settle();
    EXPECT_EQ(told, 0);
    player->show(std::make_shared<QuarteredFrame>(base::Size{640, 640}));
    settleUntil([&] { return told > 0; });
    EXPECT_EQ(told, 1);
    player->show(std::make_shared<QuarteredFrame>(base::Size{640, 640}));
    look();
    settle();
    EXPECT_EQ(told, 1);
}

} // namespace

} // namespace tests
