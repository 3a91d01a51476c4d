// What the strip looks like: its pictures, the grips, the frame around the chosen range, the play head.
#include "Stage.h"

#include "linux/qt/Theme.h"

#include <QAccessible>
#include <QAccessibleActionInterface>
#include <QAccessibleValueInterface>

namespace tests {

namespace {

/// A strip of 200 points, whose track of ten seconds goes from 26 to 174.
class Strip : public Stage {
protected:
    explicit Strip(double itsScale = 1) : Stage(itsScale)
    {
        scrubber = add<platform::MovieScrubber>(base::Rect::make(0, 30, 200, 38), words);
        scrubber->setEdgeInset(10);
        scrubber->setEditable(true);
        scrubber->setMinimumTrimLength(1);
        scrubber->setZoomDelay(0.5);
        scrubber->setDataSource(movie);
        scrubber->setDelegate(movie);
        scrubber->reloadData();
        scrubber->setValue(6); // away from the grips
        presenter->commit();
    }
    void fillWith(platform::Color color)
    {
        for (const double timestamp : scrubber->timestamps())
            scrubber->setThumbnailImage_forTimestamp(picture(color), timestamp);
    }
    static platform::ImageRef picture(platform::Color color)
    {
        platform::Bitmap bitmap = platform::Bitmap::transparent(20, 20);
        for (std::size_t i = 0; i < bitmap.rgba.size(); i += 4) {
            bitmap.rgba[i] = static_cast<std::uint8_t>(color.red * 255);
            bitmap.rgba[i + 1] = static_cast<std::uint8_t>(color.green * 255);
            bitmap.rgba[i + 2] = static_cast<std::uint8_t>(color.blue * 255);
            bitmap.rgba[i + 3] = 255;
        }
        return std::make_shared<platform::Image>(std::move(bitmap), 1);
    }
    QAccessibleInterface* interfaceOf(const platform::View& view)
    {
        return QAccessible::queryAccessibleInterface(presenter->mirror().itemFor(view));
    }

    std::shared_ptr<Movie> movie = std::make_shared<Movie>();
    std::shared_ptr<platform::MovieScrubber> scrubber;
};

class StripAtTwo : public Strip {
protected:
    StripAtTwo() : Strip(2) {}
};

constexpr double kMiddle = 49; ///< of the strip's height, in the window
/// A place in a grip that is not its mark.
constexpr double kBesideMark = 5;

TEST_F(Strip, PicturesFillTheTrackAndNotTheGrips)
{
    fillWith(kGreen);
    EXPECT_EQ(colorAt(100, kMiddle), QColor(0, 255, 0));
    EXPECT_EQ(colorAt(28, 40), QColor(0, 255, 0));
    EXPECT_EQ(colorAt(172, 40), QColor(0, 255, 0));
    EXPECT_LT(colorAt(10 + kBesideMark, kMiddle).lightness(), 40);
    EXPECT_LT(colorAt(189 - kBesideMark, kMiddle).lightness(), 40);
}

TEST_F(Strip, TheGripsHaveAMarkThatCanBeSeen)
{
    for (const double x : {18.0, 182.0}) {
        EXPECT_GE(contrast(colorAt(x, kMiddle), colorAt(x + kBesideMark, kMiddle)), 4.5) << x;
        EXPECT_LT(colorAt(x, 34).lightness(), 60) << "not as high as the strip";
    }
}

TEST_F(Strip, EditingPutsAFrameAroundTheRangeAndShadesTheRest)
{
    for (const auto scheme : {qtui::Scheme::Light, qtui::Scheme::Dark}) {
        presenter->setScheme(scheme);
        const qtui::Theme theme = qtui::Theme::forScheme(scheme);
        fillWith(kGreen);
        scrubber->setEditing_animated(true, false);
        scrubber->moveHandle(platform::ScrubberHandle::Start, 5);
        // Five seconds are 74 points: the left grip stands from 84 to 100.
        EXPECT_EQ(colorAt(84 + kBesideMark, kMiddle), theme.trim);
        EXPECT_EQ(colorAt(174 + kBesideMark, kMiddle), theme.trim);
        EXPECT_EQ(colorAt(150, 32), theme.trim) << "above";
        EXPECT_EQ(colorAt(150, 65), theme.trim) << "below";
        EXPECT_EQ(colorAt(150, kMiddle), QColor(0, 255, 0)) << "what is kept is as it was";
        EXPECT_LT(colorAt(60, kMiddle).lightness(), QColor(0, 255, 0).lightness() / 2) << "what is cut away";
        EXPECT_GE(contrast(theme.trimMark, theme.trim), 4.5);
        scrubber->setEditing_animated(false, false);
        EXPECT_EQ(colorAt(60, kMiddle), QColor(0, 255, 0));
        EXPECT_NE(colorAt(150, 32), theme.trim);
    }
}

TEST_F(StripAtTwo, AGripsMarkStandsOnWholePixels)
{
    scrubber->setEditing_animated(true, false);
    const QImage image = look();
    const QColor trim = qtui::Theme::forScheme(qtui::Scheme::Light).trim;
    const QColor mark = qtui::Theme::forScheme(qtui::Scheme::Light).trimMark;
    int marked = 0;
    for (int x = 24; x < 50; ++x) {
        const QColor color = image.pixelColor(x, static_cast<int>(kMiddle * 2));
        EXPECT_TRUE(color == trim || color == mark) << x << " is blurred: " << color.name().toStdString();
        marked += color == mark ? 1 : 0;
    }
    EXPECT_EQ(marked, 6);
}

TEST_F(Strip, AHandleThatIsHeldShowsIt)
{
    const auto markAt = [this](double y) { return colorAt(18, y); };
    window->touchDown({1, {18, kMiddle}, {}});
    window->touchUp({1, {18, kMiddle}, {}});
    const QColor before = markAt(40.5);
    window->touchDown({1, {18, kMiddle}, {}});
    EXPECT_NE(markAt(40.5), before);
}

TEST_F(Strip, LeavingMovesTheFrameBackInItsOwnTime)
{
    scrubber->moveHandle(platform::ScrubberHandle::Start, 5);
    look();
    scrubber->setEditing_animated(false, true);
    look();
    const auto frameLeft = [this] { return presenter->mirror().itemFor(*scrubber->trimFrame())->windowRect().left(); };
    EXPECT_EQ(frameLeft(), 84);
    clock.advance(platform::MovieScrubber::kFrameDuration / 2);
    look();
    EXPECT_NEAR(frameLeft(), 47, 1);
    clock.advance(platform::MovieScrubber::kFrameDuration);
    look();
    EXPECT_EQ(frameLeft(), 10);
}

TEST_F(Strip, ThePlayHeadStandsWhereTheTimeIsAndMovesWithoutDrawing)
{
    fillWith(kGreen);
    scrubber->setValue(5);
    EXPECT_EQ(colorAt(100, 34), QColor(255, 255, 255));
    const auto before = presenter->statistics();
    scrubber->setValue(7.5);
    EXPECT_EQ(colorAt(137, 34), QColor(255, 255, 255));
    EXPECT_EQ(colorAt(100, kMiddle), QColor(0, 255, 0));
    EXPECT_LE(presenter->statistics().drawings, before.drawings + 1) << "not the strip again";
}

TEST_F(Strip, ThePlayHeadIsInFrontOfTheFrame)
{
    scrubber->setEditing_animated(true, false);
    scrubber->setValue(5);
    EXPECT_EQ(colorAt(100, 34), QColor(255, 255, 255));
    EXPECT_EQ(colorAt(100, 32), QColor(255, 255, 255));
}

TEST_F(Strip, AZoomedStripHasTicksAndNoGaps)
{
    fillWith(kGreen);
    look();
    scrubber->setValue(1);
    window->touchDown({1, {18, kMiddle}, {}});
    window->touchMove({1, {92, kMiddle}, {}});
    look();
    const auto ticks = [this] { return inkIn(base::Rect::make(112, 58, 50, 4)); };
    EXPECT_EQ(ticks(), 0);
    clock.advance(std::chrono::milliseconds(500));
    mainQueue.drain();
    ASSERT_TRUE(scrubber->isZoomed());
    clock.advance(platform::MovieScrubber::kFrameDuration);
    look();
    EXPECT_GT(ticks(), 10);
    EXPECT_EQ(colorAt(130, kMiddle), QColor(0, 255, 0)) << "the nearest picture, until its own comes";
    window->touchUp({1, {92, kMiddle}, {}});
    clock.advance(platform::MovieScrubber::kFrameDuration);
    look();
    EXPECT_EQ(ticks(), 0);
}

TEST_F(Strip, EachHandleIsASliderOfItsOwnToAssistiveTechnology)
{
    for (const auto& handle : {scrubber->startHandle(), scrubber->endHandle()}) {
        QAccessibleInterface* slider = interfaceOf(*handle);
        ASSERT_TRUE(slider);
        EXPECT_EQ(slider->role(), QAccessible::Slider);
        EXPECT_EQ(slider->parent(), interfaceOf(*scrubber));
        EXPECT_TRUE(slider->state().focusable);
    }
    QAccessibleInterface* start = interfaceOf(*scrubber->startHandle());
    EXPECT_EQ(start->text(QAccessible::Name), "Trim start");
    const QRect strip = interfaceOf(*scrubber)->rect();
    EXPECT_EQ(start->rect(), QRect(strip.left() + 10, strip.top(), 16, 38));
    start->valueInterface()->setCurrentValue(4);
    EXPECT_TRUE(scrubber->isEditing());
    EXPECT_EQ(start->text(QAccessible::Value), "4.00 s");
    EXPECT_EQ(start->valueInterface()->maximumValue().toDouble(), 9);
    start->actionInterface()->doAction(QAccessibleActionInterface::increaseAction());
    EXPECT_NEAR(scrubber->editingStartValue(), 4.1, 1e-9);
    QAccessibleInterface* end = interfaceOf(*scrubber->endHandle());
    EXPECT_EQ(end->text(QAccessible::Name), "Trim end");
    end->valueInterface()->setCurrentValue(2);
    EXPECT_NEAR(scrubber->editingEndValue(), 5.1, 1e-9) << "the minimum length apart";
    scrubber->setEditable(false);
    presenter->commit();
    EXPECT_EQ(interfaceOf(*scrubber)->childCount(), 0);
}

} // namespace

} // namespace tests
