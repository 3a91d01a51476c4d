#include "EditorFixture.h"

#include "overlay/VKFlatVideoOverlayButton.h"

#include <functional>

using base::EdgeInsets;
using base::Rect;
using platform::InterfaceIdiom;

namespace {

class Layout : public EditorTest {};

} // namespace

TEST_F(Layout, APhoneHeldUprightHasTwoBarsAndTheStripRestsOnTheLower)
{
    open();
    EXPECT_FALSE(editor->isPadMode());
    EXPECT_EQ(top(), phoneTop(editor->cancelButton(), editor->saveButton()));
    EXPECT_EQ(bottom(), (Items{editor->shareButton(), editor->flexSpace()}));
    EXPECT_EQ(editor->bottomToolBar()->superview(), editor->view());
    EXPECT_EQ(stripFrame(), Rect::make(0, 720 - 44 - 38, 360, 38));
    EXPECT_EQ(editor->playButton()->imageInsets(), EdgeInsets{});
    EXPECT_EQ(editor->shareButton()->imageInsets(), EdgeInsets{});
}

TEST_F(Layout, AWidePhoneHasOneBarAndTheStripOnTheLowerEdge)
{
    makePlatform({720, 360});
    open();
    EXPECT_TRUE(editor->isPadMode());
    EXPECT_EQ(top(), pad(editor->cancelButton(), {editor->shareButton(), editor->saveButton()}));
    EXPECT_EQ(top().size(), 7U);
    EXPECT_EQ(editor->bottomToolBar()->superview(), nullptr);
    EXPECT_EQ(stripFrame(), Rect::make(0, 360 - 38, 720, 38));
    EXPECT_EQ(editor->playButton()->imageInsets(), (EdgeInsets{8, 0, -8, 0}));
    EXPECT_EQ(editor->pauseButton()->imageInsets(), (EdgeInsets{8, 0, -8, 0}));
    EXPECT_EQ(editor->shareButton()->imageInsets(), (EdgeInsets{5, 0, -5, 0}));
}

TEST_F(Layout, ATabletHasOneBarHoweverItIsHeld)
{
    for (const base::Size size : {base::Size{1024, 768}, base::Size{768, 1024}}) {
        makePlatform(size);
        fake->device.idiom = InterfaceIdiom::Pad;
        open();
        EXPECT_TRUE(editor->isPadMode());
        EXPECT_EQ(stripFrame(), Rect::make(0, size.height - 38, size.width, 38));
        TearDown();
    }
}

TEST_F(Layout, ADeviceThatCannotTellItsIdiomGoesByItsShape)
{
    fake->device.idiom = std::nullopt;
    open();
    EXPECT_FALSE(editor->isPadMode());
    turnTo({720, 360});
    EXPECT_TRUE(editor->isPadMode());
}

TEST_F(Layout, ASquareViewCountsAsUpright)
{
    makePlatform({600, 600});
    open();
    EXPECT_EQ(editor->currentOrientation(), 0);
    EXPECT_FALSE(editor->isPadMode());
}

TEST_F(Layout, AfterTheFirstPlayTheBarsHoldPlay)
{
    open();
    editor->setIntroMode(false);
    editor->applyPhoneUILayout();
    EXPECT_EQ(bottom(), (Items{editor->shareButton(), editor->flexSpace(), editor->playButton(), editor->flexSpace()}));
    editor->applyPadUILayout();
    EXPECT_EQ(top(), pad(editor->cancelButton(), {editor->playButton(), editor->shareButton(), editor->saveButton()}));
    EXPECT_EQ(top().size(), 9U);
}

TEST_F(Layout, InTrimModeThePhoneHasCancelAndDoneAboveAndPlayAloneBelow)
{
    open();
    editor->setTrimming(true);
    editor->applyPhoneUILayout();
    EXPECT_EQ(top(), phoneTop(editor->cancelTrimButton(), editor->trimButton()));
    EXPECT_EQ(bottom(), (Items{editor->flexSpace(), editor->playButton(), editor->flexSpace()}));
}

TEST_F(Layout, InTrimModeThePadHasPlayAndDoneApartByTheFixedSpace)
{
    open();
    editor->setTrimming(true);
    editor->applyPadUILayout();
    EXPECT_EQ(top(), pad(editor->cancelTrimButton(), {editor->playButton(), editor->trimButton()}));
}

TEST_F(Layout, TurningAPhoneThereAndBackLeavesItsBarBelowAndTheStripAsHigh)
{
    open();
    turnTo({720, 360});
    EXPECT_TRUE(editor->isPadMode());
    EXPECT_EQ(editor->bottomToolBar()->superview(), nullptr);
    EXPECT_EQ(stripFrame(), Rect::make(0, 322, 720, 38));

    turnTo({360, 720});
    EXPECT_FALSE(editor->isPadMode());
    EXPECT_EQ(editor->bottomToolBar()->superview(), editor->view());
    EXPECT_EQ(editor->bottomToolBar()->frame(), Rect::make(0, 676, 360, 44));
    EXPECT_EQ(stripFrame(), Rect::make(0, 638, 360, 38));
}

TEST_F(Layout, TheBarsFramesFollowTheViewEvenOutOfIt)
{
    open();
    turnTo({720, 360});
    EXPECT_EQ(editor->topToolBar()->frame(), Rect::make(0, 0, 720, 60));
    EXPECT_EQ(editor->bottomToolBar()->frame(), Rect::make(0, 316, 720, 44));
    editor->setHasHomeButton(false);
    turnTo({360, 720});
    EXPECT_EQ(editor->topToolBar()->frame(), Rect::make(0, 0, 360, 85));
    EXPECT_EQ(editor->bottomToolBar()->frame(), Rect::make(0, 656, 360, 64));
    EXPECT_EQ(stripFrame(), Rect::make(0, 656 - 38, 360, 38));
}

TEST_F(Layout, TheScrubberAndTheTapAreaAreAsWideAsTheView)
{
    open();
    EXPECT_EQ(editor->avTrimmer()->frame(), Rect::make(0, 0, 360, 38));
    turnTo({720, 360});
    EXPECT_EQ(editor->avTrimmer()->frame(), Rect::make(0, 0, 720, 38));
    EXPECT_EQ(editor->videoOverlay()->frame(), Rect::make(0, 0, 720, 360));
}

TEST_F(Layout, TheLargePlayButtonStaysInTheMiddleInBothItsLooks)
{
    for (const int quality : {100, 10}) {
        SCOPED_TRACE(quality);
        makePlatform(tests::FakePlatform::kPhone);
        fake->device.quality = quality;
        open();
        const auto button = editor->videoOverlayPlayButton()->asView();
        EXPECT_EQ(std::dynamic_pointer_cast<VKFlatVideoOverlayButton>(button) != nullptr, quality == 10);
        const base::Size size = button->frame().size;
        for (const base::Size screen : {base::Size{720, 360}, {30, 20}, {1024, 768}, tests::FakePlatform::kPhone}) {
            turnTo(screen);
            EXPECT_EQ(button->frame().center(), (base::Point{screen.width / 2, screen.height / 2}));
            EXPECT_EQ(button->frame().size, size);
        }
        TearDown();
    }
}

TEST_F(Layout, TheLargePlayButtonIsInTheMiddleOfTheScreenNotOfTheView)
{
    editor = VKVideoEditorViewController::initWithBundleIdentifier_URL_applicationName_overrideTintColor_size(
        fake->platform, {}, base::Url::fromPath(kMovie), {}, {}, Rect::make(0, 0, 200, 300));
    EXPECT_EQ(editor->videoOverlayPlayButton()->asView()->frame().center(), (base::Point{180, 360}));
}

TEST_F(Layout, TheTitleKeepsItsSize)
{
    open();
    turnTo({720, 360});
    EXPECT_EQ(editor->titleLabel()->frame().size, (base::Size{120, 17}));
}

TEST_F(Layout, TheBackgroundAndThePictureFillTheViewAtOnce)
{
    open();
    editor->view()->setFrame(Rect::make(0, 0, 500, 300));
    editor->refreshAVRotation();
    EXPECT_EQ(editor->avPlayerLayer()->frame(), Rect::make(0, 0, 500, 300)) << "before the next layout";
    EXPECT_EQ(editor->view()->subviews().front()->frame(), Rect::make(0, 0, 500, 300));
}

TEST_F(Layout, EachArrangementAddsItsFourConstraintsInOrder)
{
    using Attribute = platform::LayoutAttribute;
    open();
    const auto strip = editor->scrubberContainterView();
    const auto latest = [&] {
        const auto& all = editor->view()->constraints();
        return std::vector<platform::LayoutConstraint>(all.end() - 4, all.end());
    };
    const auto expected = [&](const std::shared_ptr<platform::View>& below, Attribute edge) {
        return std::vector<platform::LayoutConstraint>{
            {strip, Attribute::Leading, editor->view(), Attribute::Leading, 1, 0},
            {strip, Attribute::Trailing, editor->view(), Attribute::Trailing, 1, 0},
            {strip, Attribute::Bottom, below, edge, 1, 0},
            {strip, Attribute::Height, {}, Attribute::None, 1, 38},
        };
    };
    EXPECT_EQ(latest(), expected(editor->bottomToolBar(), Attribute::Top));
    editor->applyPadUILayout();
    EXPECT_EQ(latest(), expected(editor->view(), Attribute::Bottom));
    editor->applyPhoneUILayout();
    EXPECT_EQ(latest(), expected(editor->bottomToolBar(), Attribute::Top));
    EXPECT_EQ(editor->view()->constraints().size(), 5U) << "the pad's stays in force, as the older";
}

TEST_F(Layout, ThePadsOneBarLeavesTheItemsOfTheOtherAsTheyWere)
{
    open();
    const auto before = bottom();
    editor->applyPadUILayout();
    EXPECT_EQ(bottom(), before);
    turnTo({720, 360});
    EXPECT_EQ(bottom(), Items{}) << "turning empties both bars first";
}

TEST_F(Layout, TheGlyphsGoBackWhereTheyWereWhenThePadsBarGoes)
{
    open();
    turnTo({720, 360});
    turnTo({360, 720});
    for (const auto& item : {editor->playButton(), editor->pauseButton(), editor->shareButton()})
        EXPECT_EQ(item->imageInsets(), EdgeInsets{});
}

TEST_F(Layout, ControllersInsideTheEditorAreToldOfATurnFirst)
{
    class Inner final : public platform::ViewController {
    public:
        std::function<void()> alongside;
        void viewWillTransitionToSize_withTransitionCoordinator(base::Size /*size*/,
                                                                platform::TransitionCoordinator& coordinator) override
        {
            coordinator.animateAlongsideTransition(alongside, {});
        }
    };
    open();
    const auto inner = std::make_shared<Inner>();
    std::vector<Items> seen;
    inner->alongside = [&] { seen.push_back(top()); };
    editor->addChildViewController(inner);
    const auto before = top();
    turnTo({720, 360});
    EXPECT_EQ(seen, (std::vector<Items>{before})) << "before the bars are filled anew";
}

TEST_F(Layout, AnEditorThatGoesBeforeItsTurnIsNotKeptForIt)
{
    open();
    platform::TransitionCoordinator turn(platform::Window::kTransitionDuration);
    editor->viewWillTransitionToSize_withTransitionCoordinator({720, 360}, turn);
    const std::weak_ptr<VKVideoEditorViewController> gone = editor;
    close();
    EXPECT_TRUE(gone.expired());
    turn.runAlongside();
}

TEST_F(Layout, AThousandTransitionsLeaveNothingBehind)
{
    open();
    const auto measure = [this] {
        return std::tuple(editor->view()->constraints().size(), editor->view()->children().size(),
                          editor->topToolBar()->children().size(), editor->avPlayerItem()->observerCount(),
                          fake->notifications.registrationCount());
    };
    turnTo({720, 360});
    turnTo({360, 720});
    const auto before = measure();
    for (int i = 0; i < 500; ++i) {
        turnTo({720, 360});
        turnTo({360, 720});
    }
    EXPECT_EQ(measure(), before);
    EXPECT_LE(editor->view()->constraints().size(), 5U);
    EXPECT_EQ(stripFrame(), Rect::make(0, 638, 360, 38));
}
