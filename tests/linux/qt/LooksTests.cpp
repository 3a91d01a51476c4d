// What views look like on the screen, at one and two pixels a point.
#include "Stage.h"

#include <algorithm>
#include <array>

namespace tests {

namespace {

class Looks : public Stage {};
class LooksAtTwo : public StageAtTwo {};

class LooksAtOneAndAHalf : public Stage {
protected:
    LooksAtOneAndAHalf() : Stage(1.5) {}
};

platform::ImageRef solid(int width, int height, std::array<std::uint8_t, 4> rgba, double imageScale = 1)
{
    platform::Bitmap bitmap = platform::Bitmap::transparent(width, height);
    for (std::size_t i = 0; i < bitmap.rgba.size(); ++i)
        bitmap.rgba[i] = rgba[i % 4];
    return std::make_shared<const platform::Image>(std::move(bitmap), imageScale);
}

TEST_F(Looks, AViewShowsItsColourInItsFrameAndNowhereElse)
{
    addColor(base::Rect::make(10, 20, 30, 40), kRed);
    EXPECT_EQ(colorAt(10, 20), QColor(255, 0, 0));
    EXPECT_EQ(colorAt(39, 59), QColor(255, 0, 0));
    EXPECT_EQ(colorAt(9, 20), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(40, 59), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(39, 60), QColor(0, 0, 0));
}

TEST_F(LooksAtTwo, APointIsTwoPixels)
{
    addColor(base::Rect::make(10, 20, 0.5, 40), kRed);
    const QImage image = look();
    EXPECT_EQ(image.size(), QSize(400, 200));
    EXPECT_EQ(image.pixelColor(20, 40), QColor(255, 0, 0));
    EXPECT_EQ(image.pixelColor(21, 40), QColor(0, 0, 0));
    EXPECT_EQ(window->scale(), 2);
}

TEST_F(LooksAtOneAndAHalf, FramesLandOnWholePixels)
{
    const auto parent = addColor(base::Rect::make(3, 5, 101, 61), kRed);
    const auto child = std::make_shared<platform::View>(base::Rect::make(7, 9, 33, 21));
    child->setBackgroundColor(kBlue);
    parent->addSubview(child);
    addPlayer(base::Rect::make(121, 3, 41, 41), std::make_shared<QuarteredFrame>(base::Size{10, 10}));
    const QImage image = look();
    EXPECT_EQ(image.size(), QSize(300, 150));
    for (int y = 0; y < image.height(); ++y)
        for (int x = 0; x < image.width(); ++x)
            for (const int part : {qRed(image.pixel(x, y)), qGreen(image.pixel(x, y)), qBlue(image.pixel(x, y))})
                ASSERT_TRUE(part <= 2 || part >= 253) << x << "," << y << ": nothing is mixed at the edges";
}

TEST_F(Looks, LaterSiblingsStandInFront)
{
    const auto red = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    const auto green = addColor(base::Rect::make(0, 0, 50, 50), kGreen);
    EXPECT_EQ(colorAt(25, 25), QColor(0, 255, 0));
    window->addSubview(red);
    EXPECT_EQ(colorAt(25, 25), QColor(255, 0, 0));
}

TEST_F(Looks, ALayerStandsAmongItsSiblingsInTheirOrder)
{
    addColor(base::Rect::make(0, 0, 200, 100), kRed);
    addPlayer(base::Rect::make(0, 0, 100, 100), std::make_shared<QuarteredFrame>(base::Size{100, 100}));
    addColor(base::Rect::make(0, 0, 20, 20), kBlue);
    EXPECT_EQ(colorAt(10, 10), QColor(0, 0, 255));
    EXPECT_EQ(colorAt(75, 25), QColor(0, 255, 0));
    EXPECT_EQ(colorAt(150, 50), QColor(255, 0, 0));
}

TEST_F(Looks, HiddenAndTransparentViewsAreNotDrawn)
{
    const auto hidden = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    const auto transparent = addColor(base::Rect::make(50, 0, 50, 50), kRed);
    hidden->setHidden(true);
    transparent->setAlpha(0);
    EXPECT_EQ(colorAt(25, 25), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(75, 25), QColor(0, 0, 0));
    hidden->setHidden(false);
    EXPECT_EQ(colorAt(25, 25), QColor(255, 0, 0));
}

TEST_F(Looks, ChildrenReachBeyondTheirParentUnlessItClips)
{
    const auto parent = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    const auto child = std::make_shared<platform::View>(base::Rect::make(40, 0, 50, 50));
    child->setBackgroundColor(kGreen);
    parent->addSubview(child);
    EXPECT_EQ(colorAt(80, 25), QColor(0, 255, 0));
    parent->setClipsToBounds(true);
    EXPECT_EQ(colorAt(80, 25), QColor(0, 0, 0));
    EXPECT_EQ(colorAt(45, 25), QColor(0, 255, 0));
}

TEST_F(Looks, AnItemGoesWithItsView)
{
    const auto view = addColor(base::Rect::make(0, 0, 50, 50), kRed);
    look();
    const auto before = presenter->mirror().itemCount();
    view->removeFromSuperview();
    EXPECT_EQ(colorAt(25, 25), QColor(0, 0, 0));
    EXPECT_EQ(presenter->mirror().itemCount(), before - 1);
    EXPECT_EQ(presenter->mirror().itemFor(*view), nullptr);
}

TEST_F(Looks, AViewThatMovesToAnotherParentKeepsItsItem)
{
    const auto parent = addColor(base::Rect::make(100, 0, 50, 50), kBlue);
    const auto view = addColor(base::Rect::make(0, 0, 20, 20), kRed);
    look();
    const auto* item = presenter->mirror().itemFor(*view);
    parent->addSubview(view);
    EXPECT_EQ(colorAt(110, 10), QColor(255, 0, 0));
    EXPECT_EQ(colorAt(10, 10), QColor(0, 0, 0));
    EXPECT_EQ(presenter->mirror().itemFor(*view), item);
}

TEST_F(Looks, NothingIsDoneWhenNothingChanged)
{
    addPlayer(base::Rect::make(0, 0, 200, 100), std::make_shared<QuarteredFrame>(base::Size{100, 100}));
    add<platform::Toolbar>(base::Rect::make(0, 0, 200, 30));
    const QImage before = look();
    const auto done = presenter->statistics();
    settle();
    EXPECT_EQ(look(), before);
    EXPECT_EQ(presenter->statistics().commits, done.commits);
    window->noteChange(); // walks the tree, and finds nothing to draw
    EXPECT_EQ(look(), before);
    EXPECT_EQ(presenter->statistics().commits, done.commits + 1);
    EXPECT_EQ(presenter->statistics().drawings, done.drawings);
    EXPECT_EQ(presenter->statistics().pictures, done.pictures);
    EXPECT_EQ(presenter->statistics().blurs, done.blurs);
}

TEST_F(Looks, AChangeIsOnTheScreenWithoutBeingAskedFor)
{
    addColor(base::Rect::make(0, 0, 50, 50), kRed);
    const auto commits = presenter->statistics().commits;
    settleUntil([&] { return presenter->statistics().commits > commits; });
    EXPECT_EQ(presenter->statistics().commits, commits + 1);
    EXPECT_EQ(presenter->quickWindow().grabWindow().pixelColor(25, 25), QColor(255, 0, 0));
}

TEST_F(Looks, LabelsAreElidedWhereTheyDoNotFit)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto label = add<platform::Label>(base::Rect::make(10, 10, 60, 20));
    label->setText("A very long name of an application");
    EXPECT_GT(inkIn(base::Rect::make(10, 10, 60, 20)), 50);
    EXPECT_EQ(inkIn(base::Rect::make(72, 5, 100, 30)), 0);
}

TEST_F(Looks, LabelsAlignTheirText)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto label = add<platform::Label>(base::Rect::make(0, 10, 200, 20));
    label->setText("i");
    const auto left = base::Rect::make(0, 10, 30, 20);
    const auto middle = base::Rect::make(85, 10, 30, 20);
    const auto right = base::Rect::make(170, 10, 30, 20);
    EXPECT_GT(inkIn(left), 0);
    label->setTextAlignment(platform::TextAlignment::Center);
    EXPECT_EQ(inkIn(left), 0);
    EXPECT_GT(inkIn(middle), 0);
    label->setTextAlignment(platform::TextAlignment::Right);
    EXPECT_EQ(inkIn(middle), 0);
    EXPECT_GT(inkIn(right), 0);
}

TEST_F(Looks, BlackTextTurnsNearlyWhiteInADarkScheme)
{
    const auto label = add<platform::Label>(base::Rect::make(0, 0, 200, 40));
    label->setText("MMMM");
    label->setFontSize(30);
    const auto lightest = [this] {
        const QImage image = look();
        int value = 0;
        for (int y = 0; y < 40; ++y)
            for (int x = 0; x < 200; ++x)
                value = std::max(value, qGray(image.pixel(x, y)));
        return value;
    };
    EXPECT_LT(lightest(), 20);
    presenter->setScheme(qtui::Scheme::Dark);
    EXPECT_GT(lightest(), 220);
    label->setTextColor(kRed);
    EXPECT_LT(lightest(), 100);
}

TEST_F(LooksAtTwo, TextIsDrawnForTheScreensPixels)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto label = add<platform::Label>(base::Rect::make(10, 10, 100, 20));
    label->setText("Sharp");
    // Text for one pixel a point, doubled, would be made of equal blocks of four.
    const QImage image = look();
    int uneven = 0;
    for (int y = 20; y < 60; y += 2)
        for (int x = 20; x < 220; x += 2)
            uneven += image.pixel(x, y) != image.pixel(x + 1, y) || image.pixel(x, y) != image.pixel(x, y + 1) ? 1 : 0;
    EXPECT_GT(uneven, 40);
}

TEST_F(Looks, AGlyphIsDrawnInTheTintColourOfItsParents)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto parent = add<platform::View>(base::Rect::make(0, 0, 100, 100));
    const auto button = std::make_shared<platform::Button>(base::Rect::make(0, 0, 44, 44));
    button->setGlyph("pause");
    parent->addSubview(button);
    EXPECT_EQ(colorAt(19, 22), qtui::Theme::forScheme(qtui::Scheme::Light).accent);
    parent->setTintColor(kGreen);
    EXPECT_EQ(colorAt(19, 22), QColor(0, 255, 0));
    EXPECT_EQ(colorAt(4, 4), QColor(255, 255, 255));
}

TEST_F(Looks, InsetsMoveAGlyph)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto button = add<platform::Button>(base::Rect::make(0, 0, 44, 60));
    button->setGlyph("pause");
    const auto below = base::Rect::make(10, 42, 24, 8);
    EXPECT_EQ(inkIn(below), 0);
    button->setImageInsets({8, 0, -8, 0});
    EXPECT_GT(inkIn(below), 0);
}

TEST_F(Looks, DisabledAndPressedButtonsArePaler)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto button = add<platform::Button>(base::Rect::make(0, 0, 44, 44));
    button->setGlyph("pause");
    const int normal = colorAt(19, 22).lightness();
    button->setHighlighted(true);
    const int pressed = colorAt(19, 22).lightness();
    button->setHighlighted(false);
    button->setEnabled(false);
    const int disabled = colorAt(19, 22).lightness();
    EXPECT_GT(pressed, normal + 40);
    EXPECT_GT(disabled, pressed);
}

TEST_F(Looks, AnEmphasizedTitleIsBolder)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto button = add<platform::Button>(base::Rect::make(0, 0, 100, 44));
    button->setTitle("Save");
    const int plain = inkIn(base::Rect::make(0, 0, 100, 44));
    button->setEmphasized(true);
    EXPECT_GT(inkIn(base::Rect::make(0, 0, 100, 44)), plain);
}

TEST_F(Looks, ATitleIsSetSmallerBeforeItIsCutOff)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto button = add<platform::Button>(base::Rect::make(50, 0, 54, 44));
    button->setTitle("Cancel");
    EXPECT_GT(inkIn(base::Rect::make(50, 0, 54, 44)), 50);
    EXPECT_EQ(inkIn(base::Rect::make(105, 0, 50, 44)), 0);
    EXPECT_EQ(inkIn(base::Rect::make(0, 0, 49, 44)), 0);
}

TEST_F(Looks, AButtonShowsThePictureOfItsState)
{
    const auto button = add<platform::Button>(base::Rect::make(0, 0, 40, 40));
    button->setImage(solid(40, 40, {255, 0, 0, 255}), platform::Button::State::Normal);
    button->setImage(solid(40, 40, {0, 0, 255, 255}), platform::Button::State::Highlighted);
    EXPECT_EQ(colorAt(20, 20), QColor(255, 0, 0));
    button->setHighlighted(true);
    EXPECT_EQ(colorAt(20, 20), QColor(0, 0, 255));
}

TEST_F(LooksAtTwo, APictureMadeForTheScreenKeepsItsPixels)
{
    platform::Bitmap bitmap = platform::Bitmap::transparent(20, 20);
    for (int y = 0; y < 20; ++y)
        for (int x = 0; x < 20; ++x) {
            const std::uint8_t value = (x + y) % 2 ? 255 : 0;
            std::uint8_t* at = bitmap.at(x, y);
            at[0] = at[1] = at[2] = value;
            at[3] = 255;
        }
    add<platform::ImageView>(base::Rect::make(5, 5, 10, 10), std::make_shared<platform::Image>(std::move(bitmap), 2));
    const QImage image = look();
    for (int y = 10; y < 30; ++y)
        for (int x = 10; x < 30; ++x)
            ASSERT_EQ(qGray(image.pixel(x, y)), (x + y) % 2 ? 255 : 0) << x << "," << y;
}

TEST_F(Looks, ABarHasAHairlineTowardTheContent)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    add<platform::Toolbar>(base::Rect::make(0, 0, 200, 30));
    add<platform::Toolbar>(base::Rect::make(0, 70, 200, 30));
    EXPECT_LT(colorAt(100, 29).lightness(), colorAt(100, 28).lightness() - 20);
    EXPECT_LT(colorAt(100, 70).lightness(), colorAt(100, 71).lightness() - 20);
    EXPECT_EQ(colorAt(100, 1), colorAt(100, 20));
}

TEST_F(Looks, TextOnABarIsReadableOverAnyPicture)
{
    using platform::Color;
    const auto ground = addColor(base::Rect::make(0, 0, 200, 100), Color::white(1));
    add<platform::Toolbar>(base::Rect::make(0, 0, 200, 30));
    for (const auto scheme : {qtui::Scheme::Light, qtui::Scheme::Dark}) {
        presenter->setScheme(scheme);
        const qtui::Theme theme = qtui::Theme::forScheme(scheme);
        for (const Color& color : {Color::white(1), Color::black(), kRed, kGreen, kBlue, Color::white(0.5)}) {
            ground->setBackgroundColor(color);
            for (const bool live : {true, false}) {
                presenter->setLiveBlur(live);
                EXPECT_GE(contrast(colorAt(100, 15), theme.text), 4.5);
                EXPECT_GE(contrast(colorAt(100, 15), theme.accent), 4.5);
            }
        }
    }
}

TEST_F(Looks, TheSamePictureIsTheSameBytes)
{
    addPlayer(base::Rect::make(0, 0, 200, 100), std::make_shared<QuarteredFrame>(base::Size{160, 90}));
    const auto label = add<platform::Label>(base::Rect::make(10, 10, 100, 20));
    label->setText("Again");
    add<platform::Toolbar>(base::Rect::make(0, 0, 200, 30));
    const QImage first = look();
    presenter = std::make_unique<qtui::Presenter>(window, clock, words);
    presenter->setScheme(qtui::Scheme::Light);
    presenter->show();
    settle();
    EXPECT_EQ(look(), first);
}

} // namespace

} // namespace tests
