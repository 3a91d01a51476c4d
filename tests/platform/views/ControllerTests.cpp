#include "platform/views/ViewController.h"

#include "Fixture.h"

namespace {

using platform::View;
using testing::ElementsAre;
using testing::IsEmpty;

struct Controllers : tests::WindowFixture {
    std::shared_ptr<tests::Controller> root = controller("root");
    std::shared_ptr<tests::Controller> child = controller("child");

    void contain(const std::shared_ptr<tests::Controller>& parent, const std::shared_ptr<tests::Controller>& inner)
    {
        parent->addChildViewController(inner);
        parent->view()->addSubview(inner->view());
        inner->didMoveToParentViewController(parent.get());
    }
};

TEST_F(Controllers, TheViewIsLoadedOnFirstUse)
{
    EXPECT_FALSE(root->isViewLoaded());
    EXPECT_EQ(root->view()->viewController(), root);
    EXPECT_EQ(root->view()->autoresizingMask(), platform::kFlexibleWidth | platform::kFlexibleHeight);
    root->view();
    EXPECT_THAT(taken(), ElementsAre("root didLoad"));
}

TEST_F(Controllers, AppearAndDisappearWithTheWindow)
{
    window->setRootViewController(root);
    contain(root, child);
    taken();
    window->setVisible(true);
    EXPECT_THAT(taken(), ElementsAre("root willAppear", "child willAppear", "child didAppear", "root didAppear"));
    window->setVisible(true);
    EXPECT_THAT(taken(), IsEmpty());
    window->setVisible(false);
    EXPECT_THAT(taken(),
                ElementsAre("root willDisappear", "child willDisappear", "child didDisappear", "root didDisappear"));
}

TEST_F(Controllers, ARootOfAVisibleWindowAppearsAtOnceAndTheFormerOneDisappears)
{
    window->setVisible(true);
    window->setRootViewController(root);
    EXPECT_THAT(taken(), ElementsAre("root didLoad", "root willAppear", "root didAppear"));
    EXPECT_EQ(root->view()->frame(), window->bounds());
    window->setRootViewController(child);
    EXPECT_THAT(taken(), ElementsAre("root willDisappear", "root didDisappear", "child didLoad", "child willAppear",
                                     "child didAppear"));
}

TEST_F(Controllers, AChildThatIsAddedWhileItsParentAppearsAppearsOnce)
{
    root->onWillAppear = [this] { contain(root, child); };
    window->setRootViewController(root);
    window->setVisible(true);
    EXPECT_THAT(taken(), ElementsAre("root didLoad", "root willAppear", "child willMove", "child didLoad",
                                     "child willAppear", "child didAppear", "child didMove", "root didAppear"));
}

TEST_F(Controllers, AChildThatIsTakenOutDisappears)
{
    window->setRootViewController(root);
    window->setVisible(true);
    contain(root, child);
    taken();
    child->willMoveToParentViewController(nullptr);
    child->view()->removeFromSuperview();
    child->removeFromParentViewController();
    EXPECT_THAT(taken(), ElementsAre("child willMoveToNothing", "child willDisappear", "child didDisappear",
                                     "child didMoveToNothing"));
    EXPECT_THAT(root->childViewControllers(), IsEmpty());
    EXPECT_EQ(child->parent(), nullptr);
}

TEST_F(Controllers, AChildThatIsAddedToAnotherLeavesItsFormerParent)
{
    const auto other = controller("other");
    contain(root, child);
    taken();
    contain(other, child);
    EXPECT_THAT(taken(), ElementsAre("child willMove", "other didLoad", "child didMove"));
    EXPECT_THAT(root->childViewControllers(), IsEmpty());
    EXPECT_EQ(child->parent(), other);
}

#ifndef NDEBUG
TEST_F(Controllers, AChildIsToldBeforeAndAfterAndMovesWithItsView)
{
    const auto moved = "m_moving";
    EXPECT_DEATH(child->didMoveToParentViewController(root.get()), moved) << "it was not added";
    root->addChildViewController(child);
    EXPECT_DEATH(child->didMoveToParentViewController(root.get()), moved) << "its view is not there";
    root->view()->addSubview(child->view());
    EXPECT_DEATH(child->willMoveToParentViewController(nullptr), moved) << "it has not been told that it moved";
    child->didMoveToParentViewController(root.get());
    EXPECT_DEATH(child->removeFromParentViewController(), moved) << "it does not know";
    child->willMoveToParentViewController(nullptr);
    EXPECT_DEATH(child->removeFromParentViewController(), moved) << "its view is still there";
}
#endif

TEST_F(Controllers, AChildAppearsWithAParentThatIsInNoWindow)
{
    root->setAppeared(true);
    taken();
    contain(root, child);
    EXPECT_TRUE(child->hasAppeared());
    root->setAppeared(false);
    EXPECT_FALSE(child->hasAppeared());
}

TEST_F(Controllers, ComingToTheFrontOrMovingWithinTheWindowIsNoAppearance)
{
    window->setRootViewController(root);
    window->setVisible(true);
    contain(root, child);
    const auto box = add({}, root->view());
    taken();
    root->view()->addSubview(child->view());
    box->addSubview(child->view());
    EXPECT_THAT(taken(), IsEmpty());
    EXPECT_EQ(child->view()->superview(), box);
}

TEST_F(Controllers, AViewThatLeavesWhileItIsToldThatItAppearsDoesNotFinishAppearing)
{
    window->setVisible(true);
    root->onWillAppear = [this] { root->view()->removeFromSuperview(); };
    window->setRootViewController(root);
    EXPECT_THAT(taken(), ElementsAre("root didLoad", "root willAppear", "root willDisappear", "root didDisappear"));
}

TEST_F(Controllers, AreToldOfEachLayoutPassOfTheirView)
{
    window->setRootViewController(root);
    window->commit();
    const int before = root->layouts;
    EXPECT_GE(before, 1);
    window->commit();
    EXPECT_EQ(root->layouts, before);
    root->view()->setNeedsLayout();
    window->commit();
    EXPECT_EQ(root->layouts, before + 1);
}

TEST_F(Controllers, StandInTheResponderChainBetweenTheirViewAndTheViewAbove)
{
    window->setRootViewController(root);
    contain(root, child);
    const auto inner = add({}, child->view());
    EXPECT_EQ(inner->nextResponder(), child->view());
    EXPECT_EQ(child->view()->nextResponder(), child);
    EXPECT_EQ(child->nextResponder(), root->view());
    EXPECT_EQ(root->view()->nextResponder(), root);
    EXPECT_EQ(root->nextResponder(), window);
    EXPECT_EQ(window->nextResponder(), nullptr);
    child->view()->removeFromSuperview();
    EXPECT_EQ(child->nextResponder(), root);
}

TEST_F(Controllers, OnlyInAWindowCanOneBecomeFirstResponder)
{
    EXPECT_FALSE(root->becomeFirstResponder());
    root->view();
    EXPECT_FALSE(root->becomeFirstResponder());
    window->setRootViewController(root);
    EXPECT_TRUE(root->becomeFirstResponder());
    EXPECT_TRUE(root->isFirstResponder());
    root->resignFirstResponder();
    EXPECT_EQ(window->firstResponder(), nullptr);
    EXPECT_FALSE(root->view()->becomeFirstResponder());
}

TEST_F(Controllers, AFirstResponderThatLeavesTheWindowIsForgotten)
{
    window->setRootViewController(root);
    root->becomeFirstResponder();
    root->view()->removeFromSuperview();
    EXPECT_EQ(window->firstResponder(), nullptr);
}

TEST_F(Controllers, AShakeTravelsUpTheChainToWhoHandlesIt)
{
    window->setRootViewController(root);
    contain(root, child);
    child->becomeFirstResponder();
    window->motion(platform::MotionSubtype::Shake);
    taken();
    root->handlesMotion = true;
    window->motion(platform::MotionSubtype::Shake);
    EXPECT_THAT(taken(), ElementsAre("root shake"));
    window->setFirstResponder(nullptr);
    window->motion(platform::MotionSubtype::Shake);
    EXPECT_THAT(taken(), IsEmpty());
}

} // namespace
