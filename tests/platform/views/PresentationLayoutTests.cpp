// Where what is presented stands, and how what is behind it steps back.
#include "PresentationFixture.h"

namespace tests {

namespace {

using platform::Color;
using platform::ModalPresentationStyle;

struct Standing : Presenting {
    base::Rect frameIn(base::Size size)
    {
        window->transitionToSize(size);
        window->commit();
        return surface();
    }
};

TEST_F(Standing, ASheetHasAGrabberAboveWhatItShows)
{
    shown->setTitle("Share");
    presentAndSettle();
    EXPECT_EQ(grabber()->frame(), base::Rect::make(182, 8, 36, 4));
    EXPECT_FALSE(grabber()->isHidden());
    EXPECT_EQ(shown->view()->frame(), base::Rect::make(0, 16, 400, 300));
    EXPECT_EQ(window->topPresentation()->surface()->accessibility().name, "Share");
}

TEST_F(Standing, ASheetLeavesAPlaceForATapAboveIt)
{
    shown->height = 5000;
    presentAndSettle();
    EXPECT_EQ(shown->room, (base::Size{400, 800 - 48 - 16}));
    EXPECT_EQ(frameIn({800, 480}), base::Rect::make(120, 48, 560, 432));
    EXPECT_EQ(frameIn({800, 479}), base::Rect::make(120, 24, 560, 455)) << "there is no room to lose";
}

TEST_F(Standing, WhatIsBehindASheetIsDimmedAsFarAsItIsUp)
{
    presentAndSettle();
    EXPECT_EQ(dim()->frame(), window->bounds());
    EXPECT_EQ(dim()->backgroundColor(), (Color{0, 0, 0, 0.4}));
    EXPECT_EQ(dim()->alpha(), 1);
    window->touchDown({1, {200, 600}, {}});
    window->touchMove({1, {200, 612}, {}});
    window->touchMove({1, {200, 662}, std::chrono::seconds(1)});
    window->commit();
    EXPECT_NEAR(dim()->alpha(), 1 - 50.0 / 316, 1e-6);
    window->touchUp({1, {200, 662}, std::chrono::seconds(2)});
    settle();
    EXPECT_EQ(dim()->alpha(), 1);
    const auto behindIt = dim();
    root->dismiss(true);
    EXPECT_EQ(behindIt->alpha(), 0);
}

TEST_F(Standing, AnAlertStandsInTheMiddleAndFades)
{
    shown->setModalPresentationStyle(ModalPresentationStyle::Alert);
    presentAndSettle();
    EXPECT_EQ(surface(), base::Rect::make(56, 250, 288, 300));
    EXPECT_EQ(shown->view()->frame(), base::Rect::make(0, 0, 288, 300));
    EXPECT_TRUE(grabber()->isHidden());
    EXPECT_EQ(dim()->backgroundColor(), (Color{0, 0, 0, 0.4}));
    const auto it = window->topPresentation()->surface();
    EXPECT_EQ(it->alpha(), 1);
    root->dismiss(true);
    EXPECT_EQ(it->alpha(), 0);
    EXPECT_EQ(it->frame(), base::Rect::make(56, 250, 288, 300)) << "where it was";
}

TEST_F(Standing, AnAlertFitsIntoEachWindow)
{
    shown->setModalPresentationStyle(ModalPresentationStyle::Alert);
    shown->height = 5000;
    presentAndSettle();
    EXPECT_EQ(surface(), base::Rect::make(56, 24, 288, 752));
    EXPECT_EQ(frameIn({280, 800}), base::Rect::make(8, 24, 264, 752));
    EXPECT_EQ(frameIn({800, 480}), base::Rect::make(256, 24, 288, 432));
    EXPECT_EQ(frameIn({800, 479}), base::Rect::make(256, 8, 288, 463));
}

} // namespace

} // namespace tests
