// The large play button in both looks: which one it is, what a finger does to it, and whom it tells.
#include "overlay/VKFlatVideoOverlayButton.h"
#include "overlay/VKHighFidelityVideoOverlayButton.h"
#include "platform/views/GestureRecognizer.h"
#include "support/FakePlatform.h"

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <utility>

using platform::Button;
using platform::View;
using runtime::Selector;

namespace {

/// Counts the taps that reach it, and remembers who sent the last.
class Target final : public runtime::Object {
public:
    int taps = 0;
    std::shared_ptr<runtime::Object> sender;
    std::function<void()> onTap = [] {};

    void tapped(const std::shared_ptr<runtime::Object>& from)
    {
        ++taps;
        sender = from;
        onTap();
    }
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance = runtime::ClassBuilder<Target>("OverlayTarget", &Object::classObject())
                                                    .method("tapped:", &Target::tapped)
                                                    .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }
};

class OverlayButtons : public testing::Test {
protected:
    tests::FakePlatform fake;
    std::shared_ptr<Target> target = std::make_shared<Target>();
    const Selector tapped{"tapped:"};

    std::shared_ptr<VKVideoOverlayButton> make(std::int64_t style)
    {
        return VKExtensions::_srVideoOverlayButtonWithStyle(fake.platform, style);
    }
    /// In the window at (100, 100), wired to the target.
    template <typename T> std::shared_ptr<T> shown(std::int64_t style)
    {
        const auto button = make(style);
        const auto view = button->asView();
        view->setFrame({{100, 100}, view->frame().size});
        fake.window->addSubview(view);
        fake.window->commit();
        button->setTarget_action(target, tapped);
        return std::dynamic_pointer_cast<T>(view);
    }
    void down(double x, double y) { fake.window->touchDown({1, {x, y}, {}}); }
    void move(double x, double y) { fake.window->touchMove({1, {x, y}, {}}); }
    void up(double x, double y) { fake.window->touchUp({1, {x, y}, {}}); }
    void tap() { down(140, 140), up(140, 140); }
};

using FlatButton = VKFlatVideoOverlayButton;
using FineButton = VKHighFidelityVideoOverlayButton;

} // namespace

TEST_F(OverlayButtons, TheConstantsAreTheSinglePrecisionValuesWidened)
{
    EXPECT_EQ(VKVideoOverlayDefaultGlyphAlpha, 0.30000001192092896);
    EXPECT_EQ(VKVideoOverlayHighlightedGlyphAlpha, 0.5);
    EXPECT_EQ(VKVideoOverlayFlatBackgroundWhite, 0.9599999785423279);
    EXPECT_EQ(VKVideoOverlayFlatBackgroundAlpha, 0.9599999785423279);
}

TEST_F(OverlayButtons, StyleTwoIsAlwaysFlat)
{
    for (const int quality : {0, 10, 100}) {
        fake.device.quality = quality;
        EXPECT_TRUE(std::dynamic_pointer_cast<FlatButton>(make(2)));
    }
}

TEST_F(OverlayButtons, TheAutomaticStyleIsFlatOnlyWhenTheGraphicsQualityIsExactlyTen)
{
    for (const int quality : {0, 9, 11, 100, -10}) {
        fake.device.quality = quality;
        EXPECT_TRUE(std::dynamic_pointer_cast<FineButton>(make(0))) << quality;
    }
    fake.device.quality = 10;
    EXPECT_TRUE(std::dynamic_pointer_cast<FlatButton>(make(0)));
}

TEST_F(OverlayButtons, OtherStylesAreAGlyphWithoutABackdropWhateverTheQuality)
{
    fake.device.quality = 10;
    for (const std::int64_t style : {1LL, 3LL, -1LL, 1LL << 40}) {
        const auto button = std::dynamic_pointer_cast<FineButton>(make(style));
        ASSERT_TRUE(button) << style;
        EXPECT_EQ(button->backdropView(), nullptr);
        EXPECT_EQ(runtime::fromValue<std::shared_ptr<View>>(button->instanceVariable("_backdropView")), nullptr);
        EXPECT_EQ(button->style(), style);
        EXPECT_EQ(button->subviews().size(), 1U);
    }
}

TEST_F(OverlayButtons, AFlatButtonMadeForTheAutomaticStyleReportsTheAutomaticStyle)
{
    fake.device.quality = 10;
    EXPECT_EQ(make(0)->style(), 0);
    EXPECT_EQ(make(2)->style(), 2);
}

TEST_F(OverlayButtons, TheFineButtonIsAsLargeAsItsGlyphAndFollowsItsParentsMiddle)
{
    const auto button = shown<FineButton>(0);
    EXPECT_EQ(button->frame().size, (base::Size{80, 80}));
    EXPECT_EQ(button->button()->frame(), base::Rect::make(0, 0, 80, 80));
    EXPECT_EQ(button->autoresizingMask(), unsigned{platform::kFlexibleLeftMargin | platform::kFlexibleRightMargin
                                                   | platform::kFlexibleTopMargin | platform::kFlexibleBottomMargin});
}

TEST_F(OverlayButtons, TheAutomaticFineButtonHasABackdropBelowTheGlyphMaskedByDiscAndGlyph)
{
    const auto button = shown<FineButton>(0);
    ASSERT_TRUE(button->backdropView());
    EXPECT_EQ(button->backdropView()->style(), 2010);

    const auto subviews = button->subviews();
    ASSERT_EQ(subviews.size(), 3U);
    EXPECT_EQ(subviews[0], button->backdropView());
    EXPECT_EQ(subviews[1], button->button());
    EXPECT_EQ(subviews[2]->backdropMaskFlags(), 7U);
    EXPECT_EQ(subviews[2]->alpha(), 0.0);
    EXPECT_EQ(button->button()->backdropMaskFlags(), 3U);
    EXPECT_EQ(button->backdropView()->maskViews(), (std::vector<std::shared_ptr<View>>{subviews[2], subviews[1]}));
}

TEST_F(OverlayButtons, TheGlyphRestsAtThreeTenthsAndBrightensWhilePressed)
{
    const auto button = shown<FineButton>(0);
    EXPECT_EQ(button->button()->alpha(), VKVideoOverlayDefaultGlyphAlpha);
    down(140, 140);
    EXPECT_EQ(button->button()->alpha(), 0.5);
    move(141, 141);
    EXPECT_EQ(button->button()->alpha(), 0.5);
    double toldAt = 0;
    target->onTap = [&] { toldAt = button->button()->alpha(); };
    up(141, 141);
    EXPECT_EQ(target->taps, 1);
    EXPECT_EQ(toldAt, VKVideoOverlayDefaultGlyphAlpha) << "at rest before the movie is played";
    EXPECT_EQ(button->button()->alpha(), VKVideoOverlayDefaultGlyphAlpha);
}

TEST_F(OverlayButtons, ThePressedLookDoesNotAnimate)
{
    const auto button = shown<FineButton>(0);
    down(140, 140);
    EXPECT_TRUE(button->button()->takeAnimations().empty());
}

TEST_F(OverlayButtons, AFingerThatLeavesAndLiftsOutsideSendsNothingAndLeavesTheGlyphAtRest)
{
    const auto button = shown<FineButton>(0);
    down(140, 140);
    move(300, 300);
    EXPECT_EQ(button->button()->alpha(), VKVideoOverlayDefaultGlyphAlpha);
    up(300, 300);
    EXPECT_EQ(button->button()->alpha(), VKVideoOverlayDefaultGlyphAlpha);
    EXPECT_EQ(target->taps, 0);
}

TEST_F(OverlayButtons, AFingerThatComesBackPressesAgain)
{
    const auto button = shown<FineButton>(0);
    down(140, 140);
    move(300, 300);
    move(140, 140);
    EXPECT_EQ(button->button()->alpha(), 0.5);
    up(140, 140);
    EXPECT_EQ(target->taps, 1);
}

TEST_F(OverlayButtons, TheActionsArgumentIsTheOverlayButtonItself)
{
    const auto fine = shown<FineButton>(0);
    tap();
    EXPECT_EQ(target->sender, fine);
    fine->removeFromSuperview();

    const auto flat = shown<FlatButton>(2);
    tap();
    EXPECT_EQ(target->sender, flat);
    EXPECT_EQ(target->taps, 2);
}

TEST_F(OverlayButtons, ATapWithoutATargetOrWithOneThatDoesNotAnswerDoesNothing)
{
    for (const std::int64_t style : {0, 2}) {
        const auto button = shown<View>(style);
        const auto overlay = std::dynamic_pointer_cast<VKVideoOverlayButton>(button);
        overlay->setTarget_action({}, tapped);
        tap();
        overlay->setTarget_action(target, Selector("unheardOf:"));
        tap();
        overlay->setTarget_action(target, Selector());
        tap();
        EXPECT_EQ(target->taps, 0);
        button->removeFromSuperview();
    }
}

TEST_F(OverlayButtons, TheTargetIsNotKeptAlive)
{
    for (const std::int64_t style : {0, 2}) {
        const auto button = shown<View>(style);
        const std::weak_ptr<Target> gone = target;
        target.reset();
        EXPECT_TRUE(gone.expired());
        tap();
        button->removeFromSuperview();
        target = std::make_shared<Target>();
    }
}

TEST_F(OverlayButtons, TouchesOnTheButtonStayAwayFromRecognisersBehindIt)
{
    fake.window->addGestureRecognizer(std::make_shared<platform::TapGestureRecognizer>(target, Selector("tapped:")));
    for (const std::int64_t style : {0, 2}) {
        const auto button = shown<View>(style);
        std::dynamic_pointer_cast<VKVideoOverlayButton>(button)->setTarget_action({}, {});
        tap();
        EXPECT_EQ(target->taps, 0);
        button->removeFromSuperview();
    }
    tap();
    EXPECT_EQ(target->taps, 1);
}

TEST_F(OverlayButtons, BothLooksAreReadAloudAsPlay)
{
    const auto told = shown<FineButton>(0)->button()->accessibility();
    EXPECT_EQ(told.name, "Play");
    EXPECT_EQ(told.role, platform::AccessibilityRole::Button);
    EXPECT_EQ(shown<FlatButton>(2)->accessibility().name, "Play");
}

TEST_F(OverlayButtons, TheFlatButtonSwitchesImagesWhilePressed)
{
    const auto button = shown<FlatButton>(2);
    EXPECT_EQ(button->currentImage(), button->image(Button::State::Normal));
    down(140, 140);
    EXPECT_EQ(button->currentImage(), button->image(Button::State::Highlighted));
    up(140, 140);
    EXPECT_EQ(button->currentImage(), button->image(Button::State::Normal));
}

TEST_F(OverlayButtons, TheFieldsCanBeReadByName)
{
    const auto fine = shown<FineButton>(0);
    EXPECT_EQ(runtime::fromValue<std::shared_ptr<Button>>(fine->instanceVariable("_button")), fine->button());
    EXPECT_EQ(runtime::fromValue<std::shared_ptr<View>>(fine->instanceVariable("_backdropView")), fine->backdropView());
    const auto flat = shown<FlatButton>(2);
    for (const auto& [view, style] : {std::pair<std::shared_ptr<View>, int>(fine, 0), {flat, 2}}) {
        EXPECT_EQ(std::any_cast<std::int64_t>(view->instanceVariable("_style")), style);
        EXPECT_EQ(std::any_cast<Selector>(view->instanceVariable("_action")), tapped);
        EXPECT_EQ(view->respondsTo(Selector("_handleTap:")), style == 2);
    }
    EXPECT_EQ(fine->target(), target);
    EXPECT_EQ(fine->action(), tapped);
    EXPECT_EQ(flat->target(), target);
    EXPECT_EQ(flat->action(), tapped);
}
