// Fingers, mouse, keys, sizes and closing: what the user does reaches the views.
#include "Stage.h"

#include "platform/views/GestureRecognizer.h"

#include <QTest>

namespace tests {

namespace {

using platform::Key;
using ::testing::ElementsAre;

/// Answers every key that it has a command for, and shakes.
class Keyboard final : public platform::ViewController {
public:
    static const runtime::Class& classObject()
    {
        static const runtime::Class& instance =
            runtime::ClassBuilder<Keyboard>("TestKeyboard", &ViewController::classObject())
                .method("hit", &Keyboard::hit)
                .build();
        return instance;
    }
    const runtime::Class& isa() const override { return classObject(); }

    bool canBecomeFirstResponder() const override { return true; }
    std::vector<platform::KeyCommand> keyCommands() const override { return {command}; }
    void motionEnded_withEvent(platform::MotionSubtype, const platform::MotionEvent&) override { ++shakes; }
    void hit() { ++hits; }

    platform::KeyCommand command{Key::Space, 0, false, runtime::Selector("hit")};
    int hits = 0;
    int shakes = 0;
};

class Input : public Stage {
protected:
    QQuickWindow* quickWindow() { return &presenter->quickWindow(); }
    void press(QPoint at) { QTest::mousePress(quickWindow(), Qt::LeftButton, {}, at); }
    void release(QPoint at) { QTest::mouseRelease(quickWindow(), Qt::LeftButton, {}, at); }
    void hit(Qt::Key key, Qt::KeyboardModifiers modifiers = {}) { QTest::keyClick(quickWindow(), key, modifiers); }

    std::shared_ptr<Keyboard> addKeyboard()
    {
        auto keyboard = std::make_shared<Keyboard>();
        window->setRootViewController(keyboard);
        keyboard->becomeFirstResponder();
        return keyboard;
    }
    std::shared_ptr<platform::Button> addButton(base::Rect frame, const std::shared_ptr<Target>& target)
    {
        auto button = add<platform::Button>(frame);
        button->setTitle("OK");
        button->addTarget(target, Target::action(), platform::kTouchUpInside);
        return button;
    }

    std::unique_ptr<QPointingDevice> screen{QTest::createTouchDevice()};
};

TEST_F(Input, AFingerReachesTheViewBelowIt)
{
    const auto view = add<TouchedView>(base::Rect::make(50, 20, 100, 60));
    QTest::touchEvent(quickWindow(), screen.get()).press(1, {60, 30}, quickWindow());
    QTest::touchEvent(quickWindow(), screen.get()).move(1, {70, 40}, quickWindow());
    QTest::touchEvent(quickWindow(), screen.get()).release(1, {71, 40}, quickWindow());
    EXPECT_THAT(view->touches, ElementsAre("began 10,10", "moved 20,20", "ended 21,20"));
}

TEST_F(Input, AFingerCountsFromTheWindowsCornerWhereverItStands)
{
    const auto view = add<TouchedView>(base::Rect::make(50, 20, 100, 60));
    presenter->quickWindow().setPosition(300, 200);
    settle();
    QTest::touchEvent(quickWindow(), screen.get()).press(1, {60, 30}, quickWindow());
    EXPECT_THAT(view->touches, ElementsAre("began 10,10"));
}

TEST_F(Input, FingersAreToldApart)
{
    const auto left = add<TouchedView>(base::Rect::make(0, 0, 100, 100));
    const auto right = add<TouchedView>(base::Rect::make(100, 0, 100, 100));
    QTest::touchEvent(quickWindow(), screen.get()).press(1, {10, 10}, quickWindow());
    QTest::touchEvent(quickWindow(), screen.get()).stationary(1).press(2, {110, 10}, quickWindow());
    QTest::touchEvent(quickWindow(), screen.get()).move(1, {20, 10}, quickWindow()).move(2, {120, 10}, quickWindow());
    QTest::touchEvent(quickWindow(), screen.get()).release(1, {20, 10}, quickWindow()).stationary(2);
    QTest::touchEvent(quickWindow(), screen.get()).release(2, {120, 10}, quickWindow());
    EXPECT_THAT(left->touches, ElementsAre("began 10,10", "moved 20,10", "ended 20,10"));
    EXPECT_THAT(right->touches, ElementsAre("began 10,10", "moved 20,10", "ended 20,10"));
    EXPECT_NE(left->ids.front(), right->ids.front());
}

TEST_F(Input, AFingerIsNotAMouseToo)
{
    const auto target = std::make_shared<Target>();
    addButton(base::Rect::make(0, 0, 100, 50), target);
    QTest::touchEvent(quickWindow(), screen.get()).press(1, {10, 10}, quickWindow());
    QTest::touchEvent(quickWindow(), screen.get()).release(1, {10, 10}, quickWindow());
    settle();
    EXPECT_EQ(target->senders.size(), 1U);
}

TEST_F(Input, CancelledTouchesAreNotTaps)
{
    const auto view = add<TouchedView>(base::Rect::make(0, 0, 100, 100));
    QTest::touchEvent(quickWindow(), screen.get()).press(1, {10, 10}, quickWindow());
    QTouchEvent cancel(QEvent::TouchCancel, screen.get());
    QCoreApplication::sendEvent(quickWindow(), &cancel);
    EXPECT_THAT(view->touches, ElementsAre("began 10,10", "cancelled 10,10"));
}

TEST_F(Input, TheMouseIsOneTouchAtATime)
{
    const auto view = add<TouchedView>(base::Rect::make(0, 0, 100, 100));
    QTest::mouseMove(quickWindow(), {5, 5});
    press({10, 10});
    QTest::mouseMove(quickWindow(), {30, 10});
    release({30, 10});
    QTest::mouseMove(quickWindow(), {40, 10});
    EXPECT_THAT(view->touches, ElementsAre("began 10,10", "moved 30,10", "ended 30,10"));
}

TEST_F(Input, OtherMouseButtonsTouchNothing)
{
    const auto view = add<TouchedView>(base::Rect::make(0, 0, 100, 100));
    QTest::mouseClick(quickWindow(), Qt::RightButton, {}, {10, 10});
    EXPECT_TRUE(view->touches.empty());
}

TEST_F(Input, MouseEventsMadeUpFromTouchesAreDropped)
{
    const auto view = add<TouchedView>(base::Rect::make(0, 0, 100, 100));
    QMouseEvent made(QEvent::MouseButtonPress, {10, 10}, {10, 10}, {10, 10}, Qt::LeftButton, Qt::LeftButton, {},
                     Qt::MouseEventSynthesizedBySystem);
    QCoreApplication::sendEvent(quickWindow(), &made);
    EXPECT_TRUE(view->touches.empty());
}

TEST_F(Input, ADoubleClickIsTwoTaps)
{
    const auto target = std::make_shared<Target>();
    addButton(base::Rect::make(0, 0, 100, 50), target);
    QTest::mouseDClick(quickWindow(), Qt::LeftButton, {}, {10, 10});
    EXPECT_EQ(target->senders.size(), 2U);
}

TEST_F(Input, KeysArriveByTheirMeaning)
{
    const auto keyboard = addKeyboard();
    const std::vector<std::pair<Qt::Key, Key>> meanings{
        {Qt::Key_Space, Key::Space},   {Qt::Key_Escape, Key::Escape}, {Qt::Key_Return, Key::Return},
        {Qt::Key_Enter, Key::Return},  {Qt::Key_Left, Key::Left},     {Qt::Key_Right, Key::Right},
        {Qt::Key_Home, Key::Home},     {Qt::Key_End, Key::End},       {Qt::Key_Comma, Key::Comma},
        {Qt::Key_Period, Key::Period}, {Qt::Key_Up, Key::Up},         {Qt::Key_Down, Key::Down},
    };
    for (const auto& [key, meaning] : meanings) {
        keyboard->command.key = meaning;
        keyboard->hits = 0;
        hit(key);
        EXPECT_EQ(keyboard->hits, 1) << key;
    }
}

TEST_F(Input, LettersArriveWithControl)
{
    const auto keyboard = addKeyboard();
    keyboard->command = {Key::Character, 's', true, runtime::Selector("hit")};
    hit(Qt::Key_S);
    EXPECT_EQ(keyboard->hits, 0);
    hit(Qt::Key_S, Qt::ControlModifier);
    EXPECT_EQ(keyboard->hits, 1);
}

TEST_F(Input, HoldingSpaceIsOnePress)
{
    const auto keyboard = addKeyboard();
    QKeyEvent again(QEvent::KeyPress, Qt::Key_Space, {}, " ", true);
    hit(Qt::Key_Space);
    QCoreApplication::sendEvent(quickWindow(), &again);
    EXPECT_EQ(keyboard->hits, 1);
    keyboard->command.key = Key::Right;
    QKeyEvent right(QEvent::KeyPress, Qt::Key_Right, {}, "", true);
    QCoreApplication::sendEvent(quickWindow(), &right);
    QCoreApplication::sendEvent(quickWindow(), &right);
    EXPECT_EQ(keyboard->hits, 3) << "but arrows repeat";
}

TEST_F(Input, UndoIsAShake)
{
    const auto keyboard = addKeyboard();
    hit(Qt::Key_Z, Qt::ControlModifier);
    EXPECT_EQ(keyboard->shakes, 1);
    hit(Qt::Key_Z);
    EXPECT_EQ(keyboard->shakes, 1);
}

TEST_F(Input, TabMovesTheFocusAndReturnPresses)
{
    const auto target = std::make_shared<Target>();
    const auto first = addButton(base::Rect::make(10, 10, 60, 44), target);
    const auto second = addButton(base::Rect::make(110, 10, 60, 44), target);
    hit(Qt::Key_Tab);
    EXPECT_EQ(window->focusedView(), first);
    hit(Qt::Key_Tab);
    EXPECT_EQ(window->focusedView(), second);
    hit(Qt::Key_Return);
    EXPECT_THAT(target->senders, ElementsAre(second));
    hit(Qt::Key_Backtab, Qt::ShiftModifier);
    EXPECT_EQ(window->focusedView(), first);
}

TEST_F(Input, TheFocusHasARingUntilAFingerComes)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    const auto target = std::make_shared<Target>();
    const auto button = addButton(base::Rect::make(60, 30, 60, 44), target);
    const QColor ring = qtui::Theme::forScheme(qtui::Scheme::Light).focusRing;
    EXPECT_EQ(colorAt(58, 50), QColor(255, 255, 255));
    hit(Qt::Key_Tab);
    EXPECT_EQ(colorAt(58, 50), ring);
    EXPECT_EQ(colorAt(59, 50), ring) << "two points wide";
    EXPECT_EQ(colorAt(121, 50), ring);
    EXPECT_EQ(colorAt(90, 28), ring);
    EXPECT_EQ(colorAt(90, 75), ring);
    button->setFrame(base::Rect::make(100, 30, 60, 44));
    EXPECT_EQ(colorAt(98, 50), ring) << "it goes along";
    press({5, 5});
    release({5, 5});
    EXPECT_EQ(colorAt(98, 50), QColor(255, 255, 255));
}

TEST_F(Input, TheRingStaysInsideTheWindow)
{
    addColor(base::Rect::make(0, 0, 200, 100), platform::Color::white(1));
    addButton(base::Rect::make(0, 0, 200, 100), std::make_shared<Target>());
    hit(Qt::Key_Tab);
    const QColor ring = qtui::Theme::forScheme(qtui::Scheme::Light).focusRing;
    for (const QPointF at : {QPointF(1, 50), QPointF(198, 50), QPointF(100, 1), QPointF(100, 98)})
        EXPECT_EQ(colorAt(at.x(), at.y()), ring);
}

TEST_F(Input, SizesArriveOnceHoweverOftenTheyChange)
{
    const auto root = addKeyboard();
    const auto before = window->transitionCount();
    for (const int width : {210, 250, 300, 320})
        presenter->quickWindow().resize(width, 150);
    EXPECT_TRUE(settleUntil([&] { return window->View::bounds().size == base::Size{320, 150}; }));
    EXPECT_EQ(window->transitionCount(), before + 1);
    clock.advance(std::chrono::seconds(1));
    EXPECT_EQ(look().size(), QSize(320, 150));
    EXPECT_EQ(root->view()->frame().size, (base::Size{320, 150}));
}

TEST_F(Input, ClosingIsLeftToTheHandler)
{
    int asked = 0;
    presenter->setCloseHandler([&] { ++asked; });
    presenter->quickWindow().close();
    settle();
    EXPECT_EQ(asked, 1);
    EXPECT_TRUE(presenter->quickWindow().isVisible());
    hit(Qt::Key_W, Qt::ControlModifier);
    hit(Qt::Key_Q, Qt::ControlModifier);
    settle();
    EXPECT_EQ(asked, 3);
    presenter->setCloseHandler({});
    presenter->quickWindow().close();
    EXPECT_FALSE(presenter->quickWindow().isVisible());
}

TEST_F(Input, ACloseHandlerMayEndThePresenter)
{
    presenter->setCloseHandler([this] { presenter.reset(); });
    presenter->quickWindow().close();
    settle();
    EXPECT_EQ(presenter, nullptr);
}

} // namespace

} // namespace tests
