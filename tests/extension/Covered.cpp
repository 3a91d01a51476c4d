// A payload that comes in pieces builds an editor again, on top of the former one, which nobody can reach any more.
#include "ExtensionFixture.h"

namespace {

class ACoveredEditor : public ExtensionTest {
protected:
    ACoveredEditor()
    {
        offerRequired();
        offer(VKVideoEditorExtensionOverrideShareMessageKey);
        start();
        deliverRequired();
        fake.machine.mainQueue.drain();
        show();
        covered = editor();
    }
    void cover()
    {
        deliver(VKVideoEditorExtensionOverrideShareMessageKey, std::string("look"));
        fake.machine.mainQueue.drain();
        fake.window->commit();
    }
    bool isCovered(const std::shared_ptr<platform::View>& view) const
    {
        return view && view->isDescendantOf(*covered->view());
    }

    std::shared_ptr<VKVideoEditorViewController> covered;
};

} // namespace

TEST_F(ACoveredEditor, StaysWhereItIsAndIsNotSeen)
{
    cover();
    ASSERT_NE(editor(), covered);
    EXPECT_EQ(covered->parent(), controller);
    EXPECT_EQ(covered->view()->superview(), controller->view());
    EXPECT_TRUE(covered->view()->isHidden()) << "what is hidden is nothing to touch, and nothing to read aloud";
    EXPECT_FALSE(editor()->view()->isHidden());
}

TEST_F(ACoveredEditor, TakesNoFocus)
{
    fake.window->moveFocus(true);
    ASSERT_TRUE(isCovered(fake.window->focusedView()));
    cover();
    EXPECT_FALSE(isCovered(fake.window->focusedView())) << "the focus that it had";
    for (int i = 0; i < 20; ++i) {
        fake.window->moveFocus(true);
        ASSERT_TRUE(fake.window->focusedView());
        ASSERT_FALSE(isCovered(fake.window->focusedView()));
    }
}

TEST_F(ACoveredEditor, SavesNothingByReturn)
{
    while (!fake.window->focusedView() || fake.window->focusedView()->accessibility().name != "Save")
        fake.window->moveFocus(true);
    cover();
    fake.window->keyDown(platform::Key::Return);
    EXPECT_TRUE(covered->activityTypes()->empty());
    EXPECT_TRUE(editor()->activityTypes()->empty());
}

TEST_F(ACoveredEditor, TakesNoTouch)
{
    cover();
    for (double x = 5; x < tests::FakePlatform::kPhone.width; x += 10)
        for (double y = 5; y < tests::FakePlatform::kPhone.height; y += 10)
            ASSERT_FALSE(isCovered(fake.window->hitTest({x, y}))) << x << ", " << y;
}

TEST_F(ACoveredEditor, HearsNoKeyAndNoShake)
{
    cover();
    EXPECT_EQ(fake.window->firstResponder(), editor());
}
