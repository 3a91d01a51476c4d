#include "platform/views/Button.h"
#include "platform/views/Control.h"
#include "platform/views/GestureRecognizer.h"

#include "Fixture.h"

namespace {

using base::Rect;
using platform::Control;
using platform::TapGestureRecognizer;
using platform::View;
using testing::ElementsAre;
using testing::IsEmpty;

/// Writes down which events its control sends.
class EventTarget final : public runtime::Object {
public:
    static const runtime::Class& classObject()
    {
        static runtime::ClassBuilder<EventTarget> builder("TestEventTarget", &Object::classObject());
        static const runtime::Class& instance = builder.method("down:", &EventTarget::down)
                                                    .method("dragInside:", &EventTarget::dragInside)
                                                    .method("dragOutside:", &EventTarget::dragOutside)
                                                    .method("upInside:", &EventTarget::upInside)
                                                    .method("upOutside:", &EventTarget::upOutside)
                                                    .method("cancel:", &EventTarget::cancel)
                                                    .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    void down() { said.emplace_back("down"); }
    void dragInside() { said.emplace_back("inside"); }
    void dragOutside() { said.emplace_back("outside"); }
    void upInside() { said.emplace_back("up inside"); }
    void upOutside() { said.emplace_back("up outside"); }
    void cancel() { said.emplace_back("cancel"); }

    std::vector<std::string> said;
};

struct Touches : tests::WindowFixture {
    std::shared_ptr<Control> control = add<Control>(Rect::make(100, 100, 50, 50), window);
    std::shared_ptr<EventTarget> target = std::make_shared<EventTarget>();
    std::shared_ptr<tests::Target> other = std::make_shared<tests::Target>();

    Touches()
    {
        using runtime::Selector;
        control->addTarget(target, Selector("down:"), platform::kTouchDown);
        control->addTarget(target, Selector("dragInside:"), platform::kTouchDragInside);
        control->addTarget(target, Selector("dragOutside:"), platform::kTouchDragOutside);
        control->addTarget(target, Selector("upInside:"), platform::kTouchUpInside);
        control->addTarget(target, Selector("upOutside:"), platform::kTouchUpOutside);
        control->addTarget(target, Selector("cancel:"), platform::kTouchCancel);
    }
    std::shared_ptr<TapGestureRecognizer> recognizeTaps(const std::shared_ptr<View>& view)
    {
        auto recognizer = std::make_shared<TapGestureRecognizer>(other, tests::Target::action());
        view->addGestureRecognizer(recognizer);
        return recognizer;
    }
    std::size_t taps() const { return other->senders.size(); }
};

TEST_F(Touches, AControlIsPressedAndReleased)
{
    window->touchDown({1, {110, 110}, {}});
    EXPECT_TRUE(control->isHighlighted());
    window->touchUp({1, {110, 110}, {}});
    EXPECT_FALSE(control->isHighlighted());
    EXPECT_THAT(target->said, ElementsAre("down", "up inside"));
}

TEST_F(Touches, TheHighlightFollowsTheFinger)
{
    window->touchDown({1, {110, 110}, {}});
    window->touchMove({1, {165, 110}, {}});
    EXPECT_TRUE(control->isHighlighted());
    window->touchMove({1, {175, 110}, {}});
    EXPECT_FALSE(control->isHighlighted());
    window->touchMove({1, {110, 110}, {}});
    EXPECT_TRUE(control->isHighlighted());
    window->touchMove({1, {300, 110}, {}});
    window->touchUp({1, {300, 110}, {}});
    EXPECT_FALSE(control->isHighlighted());
    EXPECT_THAT(target->said, ElementsAre("down", "inside", "outside", "inside", "outside", "up outside"));
}

TEST_F(Touches, ACancelledTouchIsNoTap)
{
    window->touchDown({1, {110, 110}, {}});
    window->touchCancel({1, {110, 110}, {}});
    window->touchUp({1, {110, 110}, {}});
    EXPECT_FALSE(control->isHighlighted());
    EXPECT_THAT(target->said, ElementsAre("down", "cancel"));
}

TEST_F(Touches, OnlyTheFingerThatPressedReleases)
{
    window->touchDown({1, {110, 110}, {}});
    window->touchDown({2, {110, 110}, {}});
    window->touchUp({2, {110, 110}, {}});
    EXPECT_TRUE(control->isHighlighted());
    window->touchUp({1, {110, 110}, {}});
    EXPECT_THAT(target->said, ElementsAre("down", "up inside"));
}

TEST_F(Touches, ADisabledControlSwallowsThemSilently)
{
    control->setEnabled(false);
    const auto behind = add<Control>(Rect::make(100, 100, 50, 50), window);
    behind->addTarget(other, tests::Target::action(), platform::kTouchUpInside);
    window->addSubview(control);
    tap(110, 110);
    EXPECT_THAT(target->said, IsEmpty());
    EXPECT_EQ(taps(), 0U);
}

TEST_F(Touches, AControlThatIsDisabledWhilePressedLetsGo)
{
    window->touchDown({1, {110, 110}, {}});
    control->setEnabled(false);
    window->touchUp({1, {110, 110}, {}});
    EXPECT_FALSE(control->isHighlighted());
    EXPECT_THAT(target->said, ElementsAre("down", "cancel"));
}

TEST_F(Touches, PassWhatIsHiddenTransparentOrNotInteractive)
{
    const auto cover = add(Rect::make(0, 0, 400, 800), window);
    EXPECT_EQ(window->hitTest({110, 110}), cover);
    cover->setAlpha(0.009);
    EXPECT_EQ(window->hitTest({110, 110}), control);
    cover->setAlpha(0.01);
    EXPECT_EQ(window->hitTest({110, 110}), cover);
    cover->setHidden(true);
    EXPECT_EQ(window->hitTest({110, 110}), control);
    cover->setHidden(false);
    add<Control>(Rect::make(0, 0, 400, 800), cover);
    cover->setUserInteractionEnabled(false);
    EXPECT_EQ(window->hitTest({110, 110}), control);
    EXPECT_EQ(window->hitTest({-1, 110}), nullptr);
}

TEST_F(Touches, ATapNearWhereItBeganIsRecognised)
{
    const auto recognizer = recognizeTaps(window);
    window->touchDown({1, {300, 300}, {}});
    window->touchUp({1, {310, 300}, {}});
    EXPECT_THAT(other->senders, ElementsAre(recognizer));
    window->touchDown({1, {300, 300}, {}});
    window->touchMove({1, {320, 300}, {}});
    window->touchUp({1, {300, 300}, {}});
    EXPECT_EQ(taps(), 1U);
}

TEST_F(Touches, TwoFingersAreNoTap)
{
    recognizeTaps(window);
    window->touchDown({1, {300, 300}, {}});
    window->touchDown({2, {200, 300}, {}});
    window->touchUp({1, {300, 300}, {}});
    window->touchUp({2, {200, 300}, {}});
    EXPECT_EQ(taps(), 0U);
    tap(300, 300);
    EXPECT_EQ(taps(), 1U);
}

TEST_F(Touches, RecognisersAboveAControlSeeItsTouchesUnlessItKeepsThem)
{
    recognizeTaps(window);
    tap(110, 110);
    EXPECT_EQ(taps(), 1U);
    control->setPassesTouchesToSuperviewRecognizers(false);
    tap(110, 110);
    EXPECT_EQ(taps(), 1U);
    recognizeTaps(control);
    tap(110, 110);
    EXPECT_EQ(taps(), 2U);
    EXPECT_EQ(target->said.size(), 6U);
}

TEST_F(Touches, ATargetMayTakeTheControlAwayWhileItIsPressed)
{
    control->addTarget(other, tests::Target::action(), platform::kTouchDown);
    other->onAct = [this] {
        control->removeFromSuperview();
        control.reset();
    };
    window->touchDown({1, {110, 110}, {}});
    window->touchMove({1, {110, 110}, {}});
    window->touchUp({1, {110, 110}, {}});
    EXPECT_EQ(taps(), 1U);
}

TEST_F(Touches, AControlThatLeftTheWindowIsToldThatItsTouchIsOver)
{
    window->touchDown({1, {110, 110}, {}});
    control->removeFromSuperview();
    window->touchUp({1, {110, 110}, {}});
    EXPECT_THAT(target->said, ElementsAre("down", "cancel"));
}

TEST_F(Touches, ATargetMayReleaseTheWholeScreen)
{
    auto root = controller("root");
    window->setRootViewController(root);
    const auto button = add<Control>(Rect::make(100, 100, 50, 50), root->view());
    button->addTarget(other, tests::Target::action(), platform::kTouchUpInside);
    const std::weak_ptr<tests::Controller> weak = root;
    root.reset();
    other->onAct = [this] { window->setRootViewController(nullptr); };
    recognizeTaps(window);
    tap(110, 110);
    EXPECT_TRUE(weak.expired());
    EXPECT_EQ(taps(), 2U);
}

TEST_F(Touches, AButtonThatIsActivatedDoesWhatATapDoes)
{
    const auto button = add<platform::Button>(Rect::make(0, 0, 50, 50), window);
    button->addTarget(target, runtime::Selector("down:"), platform::kTouchDown);
    button->addTarget(target, runtime::Selector("upInside:"), platform::kTouchUpInside);
    EXPECT_TRUE(button->activate());
    EXPECT_THAT(target->said, ElementsAre("down", "up inside"));
    button->setEnabled(false);
    EXPECT_FALSE(button->activate());
}

TEST_F(Touches, AButtonShowsItsHighlightedImageWhilePressed)
{
    const auto image = [](int size) {
        return std::make_shared<const platform::Image>(platform::Bitmap::transparent(size, size), 2.0);
    };
    const auto button = add<platform::Button>(Rect::make(0, 0, 50, 50), window);
    const auto normal = image(20);
    button->setImage(normal, platform::Button::State::Normal);
    window->touchDown({1, {10, 10}, {}});
    EXPECT_EQ(button->currentImage(), normal);
    const auto pressed = image(30);
    button->setImage(pressed, platform::Button::State::Highlighted);
    EXPECT_EQ(button->currentImage(), pressed);
    EXPECT_EQ(button->sizeThatFits(), (base::Size{10, 10}));
}

} // namespace
