#include "platform/views/View.h"

#include "Fixture.h"

namespace {

using base::Rect;
using platform::LayoutAttribute;
using platform::LayoutConstraint;
using platform::View;

struct Autoresizing : testing::Test {
    std::shared_ptr<View> parent = std::make_shared<View>(Rect::make(0, 0, 100, 200));

    Rect resized(Rect frame, unsigned mask, base::Size newSize)
    {
        const auto view = std::make_shared<View>(frame);
        view->setAutoresizingMask(mask);
        parent->addSubview(view);
        parent->setFrame({{0, 0}, newSize});
        return view->frame();
    }
};

TEST_F(Autoresizing, WithoutFlexiblePartsAViewStaysWhereItIs)
{
    EXPECT_EQ(resized(Rect::make(10, 20, 30, 40), platform::kAutoresizingNone, {200, 400}), Rect::make(10, 20, 30, 40));
}

TEST_F(Autoresizing, AFlexibleWidthTakesTheWholeChange)
{
    EXPECT_EQ(resized(Rect::make(10, 20, 30, 40), platform::kFlexibleWidth, {250, 400}), Rect::make(10, 20, 180, 40));
}

TEST_F(Autoresizing, AFlexibleWidthGrowsFromNothing)
{
    EXPECT_EQ(resized(Rect::make(0, 0, 0, 40), platform::kFlexibleWidth, {150, 200}), Rect::make(0, 0, 50, 40));
}

TEST_F(Autoresizing, AFlexibleTopMarginKeepsAViewAtTheBottom)
{
    EXPECT_EQ(resized(Rect::make(0, 150, 100, 50), platform::kFlexibleTopMargin, {100, 300}),
              Rect::make(0, 250, 100, 50));
}

TEST_F(Autoresizing, FlexiblePartsShareTheChangeInProportionToTheirSize)
{
    EXPECT_EQ(resized(Rect::make(20, 0, 60, 10), platform::kFlexibleLeftMargin | platform::kFlexibleWidth, {180, 200}),
              Rect::make(40, 0, 120, 10));
}

TEST_F(Autoresizing, FlexiblePartsOfNoSizeShareEqually)
{
    EXPECT_EQ(
        resized(Rect::make(0, 0, 100, 10), platform::kFlexibleLeftMargin | platform::kFlexibleRightMargin, {150, 200}),
        Rect::make(25, 0, 100, 10));
}

TEST_F(Autoresizing, FourFlexibleMarginsKeepACentredViewCentred)
{
    const unsigned all = platform::kFlexibleLeftMargin | platform::kFlexibleRightMargin | platform::kFlexibleTopMargin
                         | platform::kFlexibleBottomMargin;
    EXPECT_EQ(resized(Rect::make(35, 85, 30, 30), all, {333, 77}), Rect::make(151.5, 23.5, 30, 30));
}

TEST_F(Autoresizing, ThereAndBackAgainIsWhereItWas)
{
    const auto view = std::make_shared<View>(Rect::make(7, 0, 31, 10));
    view->setAutoresizingMask(platform::kFlexibleLeftMargin | platform::kFlexibleWidth
                              | platform::kFlexibleRightMargin);
    parent->addSubview(view);
    for (int i = 0; i < 1000; ++i) {
        parent->setFrame(Rect::make(0, 0, 333, 200));
        parent->setFrame(Rect::make(0, 0, 100, 200));
    }
    EXPECT_NEAR(view->frame().minX(), 7, 1e-6);
    EXPECT_NEAR(view->frame().width(), 31, 1e-6);
}

TEST_F(Autoresizing, ViewsUnderConstraintsAreNotResizedByMasks)
{
    const auto view = std::make_shared<View>(Rect::make(0, 0, 50, 10));
    view->setAutoresizingMask(platform::kFlexibleWidth);
    view->setTranslatesAutoresizingMaskIntoConstraints(false);
    parent->addSubview(view);
    parent->setFrame(Rect::make(0, 0, 500, 200));
    EXPECT_EQ(view->frame().width(), 50);
}

struct Constraints : tests::WindowFixture {
    std::shared_ptr<View> root = add(Rect::make(0, 0, 400, 800), window);
    std::shared_ptr<View> bar = add(Rect::make(0, 756, 400, 44), root);
    std::shared_ptr<View> strip = free({});

    std::shared_ptr<View> free(Rect frame)
    {
        auto view = add(frame, root);
        view->setTranslatesAutoresizingMaskIntoConstraints(false);
        return view;
    }
    static LayoutConstraint equal(const std::shared_ptr<View>& first, LayoutAttribute attribute,
                                  const std::shared_ptr<View>& second, LayoutAttribute other, double constant = 0,
                                  double multiplier = 1)
    {
        return {first, attribute, second, other, multiplier, constant};
    }
    static LayoutConstraint constant(const std::shared_ptr<View>& first, LayoutAttribute attribute, double value)
    {
        return {first, attribute, {}, LayoutAttribute::None, 1, value};
    }
    void addSides()
    {
        root->addConstraint(equal(strip, LayoutAttribute::Leading, root, LayoutAttribute::Leading));
        root->addConstraint(equal(strip, LayoutAttribute::Trailing, root, LayoutAttribute::Trailing));
        root->addConstraint(constant(strip, LayoutAttribute::Height, 38));
    }
    void addOnBar()
    {
        addSides();
        root->addConstraint(equal(strip, LayoutAttribute::Bottom, bar, LayoutAttribute::Top));
    }
    void addOnEdge()
    {
        addSides();
        root->addConstraint(equal(strip, LayoutAttribute::Bottom, root, LayoutAttribute::Bottom));
    }
};

TEST_F(Constraints, PlaceAViewOnAnother)
{
    addOnBar();
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame(), Rect::make(0, 718, 400, 38));
}

TEST_F(Constraints, FollowWhenWhatTheySpeakOfMoves)
{
    addOnBar();
    window->commit();
    bar->setFrame(Rect::make(0, 700, 400, 100));
    window->commit();
    EXPECT_EQ(strip->frame(), Rect::make(0, 662, 400, 38));
    root->setFrame(Rect::make(0, 0, 800, 400));
    bar->setFrame(Rect::make(0, 356, 800, 44));
    window->commit();
    EXPECT_EQ(strip->frame(), Rect::make(0, 318, 800, 38));
}

TEST_F(Constraints, TheNewerOfTwoThatContradictEachOtherHolds)
{
    addOnBar();
    addOnEdge();
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame(), Rect::make(0, 762, 400, 38));
    addOnBar();
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame(), Rect::make(0, 718, 400, 38));
}

TEST_F(Constraints, AnEqualOneIsNotKeptTwiceButBecomesTheNewest)
{
    addOnBar();
    addOnBar();
    EXPECT_EQ(root->constraints().size(), 4U);
    root->addConstraint(constant(strip, LayoutAttribute::Height, 50));
    root->addConstraint(constant(strip, LayoutAttribute::Height, 38));
    EXPECT_EQ(root->constraints().size(), 5U);
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame().height(), 38);
}

TEST_F(Constraints, GoWithTheViewsThatTheySpeakOf)
{
    addOnBar();
    bar->removeFromSuperview();
    EXPECT_EQ(root->constraints().size(), 3U);
    strip->removeFromSuperview();
    EXPECT_EQ(root->constraints().size(), 0U);
}

TEST_F(Constraints, GoWithAViewThatStandsBelowTheOneThatLeaves)
{
    const auto box = add(Rect::make(0, 100, 100, 100), root);
    const auto inner = add(Rect::make(10, 10, 10, 10), box);
    root->addConstraint(equal(strip, LayoutAttribute::Top, inner, LayoutAttribute::Bottom));
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame().minY(), 120);
    const auto other = std::make_shared<View>();
    other->addSubview(box);
    EXPECT_EQ(root->constraints().size(), 0U);
}

TEST_F(Constraints, StayWhenAViewComesToTheFront)
{
    addOnBar();
    root->addSubview(bar);
    EXPECT_EQ(root->constraints().size(), 4U);
}

TEST_F(Constraints, OfViewsThatDiedAreForgotten)
{
    addOnBar();
    auto lost = std::make_shared<View>();
    root->addConstraint(equal(strip, LayoutAttribute::Width, lost, LayoutAttribute::Width));
    lost.reset();
    root->layoutIfNeeded();
    EXPECT_EQ(root->constraints().size(), 4U);
    EXPECT_EQ(strip->frame(), Rect::make(0, 718, 400, 38));
}

TEST_F(Constraints, WhatTheyLeaveOpenStaysAsItIsSizesBeforePositions)
{
    strip->setFrame(Rect::make(10, 20, 100, 30));
    root->addConstraint(equal(strip, LayoutAttribute::Trailing, root, LayoutAttribute::Trailing, -50));
    root->addConstraint(equal(strip, LayoutAttribute::CenterY, root, LayoutAttribute::CenterY));
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame(), Rect::make(250, 385, 100, 30));
}

TEST_F(Constraints, BetweenTwoFreeViewsAreSolvedTogether)
{
    const auto other = free(Rect::make(0, 0, 10, 10));
    root->addConstraint(equal(strip, LayoutAttribute::Leading, root, LayoutAttribute::Leading));
    root->addConstraint(equal(other, LayoutAttribute::Trailing, root, LayoutAttribute::Trailing));
    root->addConstraint(equal(strip, LayoutAttribute::Trailing, other, LayoutAttribute::Leading, -10));
    root->addConstraint(equal(strip, LayoutAttribute::Width, other, LayoutAttribute::Width, 0, 2));
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame(), Rect::make(0, 0, 260, 0));
    EXPECT_EQ(other->frame(), Rect::make(270, 0, 130, 10));
}

TEST_F(Constraints, FramesComeOutWithoutNoise)
{
    root->addConstraint(equal(strip, LayoutAttribute::Leading, root, LayoutAttribute::Trailing, 0.25, 0.1));
    root->addConstraint(equal(strip, LayoutAttribute::Width, root, LayoutAttribute::Width, 0, 0.3));
    root->layoutIfNeeded();
    EXPECT_EQ(strip->frame(), Rect::make(40.25, 0, 120, 0));
}

TEST_F(Constraints, SettleAfterOnePassAndDoNotAskForAnother)
{
    addOnBar();
    addOnEdge();
    window->commit();
    EXPECT_FALSE(root->needsLayout());
    int changes = 0;
    window->setNeedsCommitHandler([&] { ++changes; });
    const auto before = strip->revision();
    root->setNeedsLayout();
    window->commit();
    EXPECT_EQ(strip->revision(), before);
    EXPECT_FALSE(root->needsLayout());
    EXPECT_EQ(changes, 1);
}

} // namespace
