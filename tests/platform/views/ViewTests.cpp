#include "platform/views/BackdropView.h"
#include "platform/views/Button.h"
#include "platform/views/Label.h"
#include "platform/views/View.h"

#include "Fixture.h"

namespace {

using namespace std::chrono_literals;
using base::Rect;
using platform::View;
using testing::ElementsAre;
using testing::IsEmpty;

struct Views : tests::WindowFixture {
    std::shared_ptr<View> root = std::make_shared<View>(Rect::make(0, 0, 400, 800));
};

TEST_F(Views, AddingAViewAgainBringsItToTheFront)
{
    const auto a = add({}, root);
    const auto b = add({}, root);
    const auto before = root->revision();
    root->addSubview(a);
    EXPECT_THAT(root->subviews(), ElementsAre(b, a));
    EXPECT_GT(root->revision(), before);
    const auto settled = root->revision();
    root->addSubview(a);
    EXPECT_EQ(root->revision(), settled);
}

TEST_F(Views, AViewIsInsertedBelowItsSibling)
{
    const auto a = add({}, root);
    const auto b = add({}, root);
    const auto c = std::make_shared<View>();
    root->insertSubview_belowSubview(c, b);
    EXPECT_THAT(root->subviews(), ElementsAre(a, c, b));
    root->insertSubview_belowSubview(b, a);
    EXPECT_THAT(root->subviews(), ElementsAre(b, a, c));
}

TEST_F(Views, AViewHasOneSuperview)
{
    const auto other = std::make_shared<View>();
    const auto a = add({}, root);
    other->addSubview(a);
    EXPECT_THAT(root->subviews(), IsEmpty());
    EXPECT_EQ(a->superview(), other);
    a->removeFromSuperview();
    EXPECT_EQ(a->superview(), nullptr);
    EXPECT_THAT(other->subviews(), IsEmpty());
}

TEST_F(Views, ViewsDieWithTheirTree)
{
    const std::weak_ptr<View> weak = add({}, root);
    root.reset();
    EXPECT_TRUE(weak.expired());
}

TEST_F(Views, PointsAreConvertedThroughAllViewsAbove)
{
    const auto a = add(Rect::make(10, 20, 100, 100), root);
    const auto b = add(Rect::make(1, 2, 50, 50), a);
    EXPECT_EQ(b->convertToRoot({3, 4}), (base::Point{14, 26}));
    EXPECT_EQ(b->convertFromRoot({14, 26}), (base::Point{3, 4}));
}

TEST_F(Views, SettingWhatIsSetAlreadyChangesNothing)
{
    const auto before = root->revision();
    root->setFrame(root->frame());
    root->setAlpha(1);
    root->setHidden(false);
    root->setBackgroundColor(platform::Color::clear());
    EXPECT_EQ(root->revision(), before);
    root->setAlpha(0.5);
    EXPECT_GT(root->revision(), before);
}

TEST_F(Views, TheTintComesFromAboveAndItsChangeIsDrawnBelow)
{
    const auto a = add({}, root);
    const auto before = a->revision();
    root->setTintColor(platform::Color::black());
    EXPECT_EQ(a->effectiveTintColor(), platform::Color::black());
    EXPECT_GT(a->revision(), before);
}

TEST_F(Views, AChangeOfTheFrameKeepsTheCentreWhenTheCentreIsSet)
{
    root->setCenter({100, 100});
    EXPECT_EQ(root->frame(), Rect::make(-100, -300, 400, 800));
}

TEST_F(Views, ChangesInsideAnAnimationAreNotedWithWhereTheyStart)
{
    root->setAlpha(0.2);
    EXPECT_THAT(root->takeAnimations(), IsEmpty());
    platform::animate(machine.mainQueue, 250ms, [&] {
        root->setAlpha(0.5);
        root->setAlpha(1);
        root->setFrame(Rect::make(5, 5, 400, 800));
    });
    const auto animations = root->takeAnimations();
    ASSERT_EQ(animations.size(), 2U);
    EXPECT_EQ(animations[0].property, platform::AnimatedProperty::Alpha);
    EXPECT_EQ(animations[0].fromAlpha, 0.2);
    EXPECT_EQ(animations[0].duration, 250ms);
    EXPECT_EQ(animations[1].fromFrame, Rect::make(0, 0, 400, 800));
    EXPECT_THAT(root->takeAnimations(), IsEmpty());
}

TEST_F(Views, TheInnermostAnimationGivesTheDuration)
{
    platform::animate(machine.mainQueue, 250ms, [&] {
        platform::animate(machine.mainQueue, 100ms, [] { EXPECT_EQ(platform::currentAnimationDuration(), 100ms); });
        EXPECT_EQ(platform::currentAnimationDuration(), 250ms);
        platform::withoutAnimation([] { EXPECT_EQ(platform::currentAnimationDuration(), 0ms); });
    });
    EXPECT_EQ(platform::currentAnimationDuration(), 0ms);
}

TEST_F(Views, AnAnimationCompletesWhenItsTimeHasPassedAndNotBefore)
{
    int completed = 0;
    platform::animate(
        machine.mainQueue, 250ms, [] {}, [&](bool finished) { completed += finished ? 1 : 100; });
    machine.advance(249ms);
    EXPECT_EQ(completed, 0);
    machine.advance(1ms);
    EXPECT_EQ(completed, 1);
}

TEST_F(Views, LayersStandAmongTheViewsAndTellWhenTheyChange)
{
    const auto layer = std::make_shared<platform::Layer>();
    const auto below = add({}, window);
    below->addSublayer(layer);
    below->addSublayer(layer);
    EXPECT_EQ(below->children().size(), 1U);
    window->commit();
    int changes = 0;
    window->setNeedsCommitHandler([&] { ++changes; });
    layer->setFrame(Rect::make(0, 0, 10, 10));
    EXPECT_EQ(changes, 1);
}

TEST_F(Views, TheWindowTellsOfChangesOnceUntilTheyAreCommitted)
{
    int changes = 0;
    window->setNeedsCommitHandler([&] { ++changes; });
    window->commit();
    const auto view = add({}, window);
    view->setAlpha(0.5);
    view->setFrame(Rect::make(0, 0, 10, 10));
    EXPECT_EQ(changes, 1);
    window->commit();
    EXPECT_EQ(changes, 1);
    view->setAlpha(1);
    EXPECT_EQ(changes, 2);
    view->removeFromSuperview();
    window->commit();
    view->setAlpha(0);
    EXPECT_EQ(changes, 2);
}

TEST_F(Views, LabelsAndButtonsDescribeThemselves)
{
    const auto label = std::make_shared<platform::Label>();
    label->setText("Movie");
    EXPECT_EQ(label->accessibility().role, platform::AccessibilityRole::Label);
    EXPECT_EQ(label->accessibility().value, "Movie");
    const auto button = std::make_shared<platform::Button>();
    button->setTitle("Save");
    EXPECT_EQ(button->accessibility().name, "Save");
    button->setAccessibilityLabel("Save the movie");
    button->setEnabled(false);
    EXPECT_EQ(button->accessibility().name, "Save the movie");
    EXPECT_FALSE(button->accessibility().enabled);
}

TEST_F(Views, ABackdropKeepsItsMaskViewsWeaklyAndOnlyWhileTheyCarryFlags)
{
    const auto backdrop = std::make_shared<platform::BackdropView>(platform::BackdropView::kStyleChrome);
    auto mask = std::make_shared<View>();
    mask->setBackdropMaskFlags(platform::kBackdropMaskShape);
    backdrop->updateMaskViewsFor(mask);
    backdrop->updateMaskViewsFor(mask);
    EXPECT_THAT(backdrop->maskViews(), ElementsAre(mask));
    mask->setBackdropMaskFlags(0);
    backdrop->updateMaskViewsFor(mask);
    EXPECT_THAT(backdrop->maskViews(), IsEmpty());
    mask->setBackdropMaskFlags(platform::kBackdropMaskColor);
    backdrop->updateMaskViewsFor(mask);
    mask.reset();
    EXPECT_THAT(backdrop->maskViews(), IsEmpty());
}

TEST_F(Views, EveryClassIsKnownByItsName)
{
    (void)platform::Button::classObject();
    (void)platform::Label::classObject();
    const auto* button = runtime::Class::named("Button");
    ASSERT_TRUE(button);
    EXPECT_TRUE(button->isSubclassOf(*runtime::Class::named("Control")));
    EXPECT_TRUE(button->isSubclassOf(*runtime::Class::named("View")));
    EXPECT_TRUE(button->isSubclassOf(*runtime::Class::named("Responder")));
    EXPECT_EQ(runtime::Class::named("Label")->superclass(), runtime::Class::named("View"));
}

TEST_F(Views, ColoursAreReadFromHexText)
{
    using platform::Color;
    EXPECT_EQ(Color::fromHex("#FF0000"), (Color{1, 0, 0, 1}));
    EXPECT_EQ(Color::fromHex("#00ff0000"), (Color{0, 1, 0, 0}));
    for (const char* text : {"", "#", "FF0000", "#FF000", "#GG0000", "#FF00000", "# F0000", "#-10000"})
        EXPECT_FALSE(Color::fromHex(text)) << text;
}

} // namespace
