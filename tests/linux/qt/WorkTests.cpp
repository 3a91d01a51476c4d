// What is under way in the background, as it is seen and read out.
#include "Stage.h"

#include "linux/qt/items/WorkLine.h"

#include <QAccessible>
#include <QAccessibleValueInterface>

namespace tests {

namespace {

class Work : public Stage {
protected:
    Work() { addColor(base::Rect::make(0, 0, 200, 100), kGreen); }

    QAccessibleInterface* root() { return QAccessible::queryAccessibleInterface(&presenter->quickWindow()); }
};

TEST_F(Work, ALineGrowsAlongTheUpperEdge)
{
    const QColor plain = colorAt(150, 1);
    presenter->showWork(0.5);
    settle();
    keep("work");
    EXPECT_NE(colorAt(50, 1), plain);
    EXPECT_NE(colorAt(150, 1), plain) << "the way that is left can be seen";
    EXPECT_NE(colorAt(50, 1), colorAt(150, 1));
    EXPECT_GE(contrast(colorAt(50, 1), colorAt(150, 1)), 3);
    EXPECT_EQ(colorAt(50, qtui::WorkLine::kHeight + 1), plain);
    presenter->showWork(0.9);
    settle();
    EXPECT_EQ(colorAt(150, 1), colorAt(50, 1));
}

TEST_F(Work, ItStandsOverTheWholeEdgeWhileNobodyKnowsHowFarItIs)
{
    presenter->showWork(std::nullopt);
    settle();
    EXPECT_EQ(colorAt(10, 1), colorAt(190, 1));
    EXPECT_NE(colorAt(10, 1), colorAt(10, 50));
}

TEST_F(Work, ItGoesWithTheWork)
{
    const QColor plain = colorAt(50, 1);
    presenter->showWork(0.5);
    settle();
    presenter->hideWork();
    settle();
    EXPECT_EQ(colorAt(50, 1), plain);
}

TEST_F(Work, AssistiveTechnologySeesAProgressBar)
{
    settle();
    const int before = root()->childCount();
    presenter->showWork(0.25);
    ASSERT_EQ(root()->childCount(), before + 1);
    QAccessibleInterface* bar = root()->child(before);
    ASSERT_TRUE(bar);
    EXPECT_EQ(bar->role(), QAccessible::ProgressBar);
    EXPECT_FALSE(bar->text(QAccessible::Name).isEmpty());
    ASSERT_TRUE(bar->valueInterface());
    EXPECT_EQ(bar->valueInterface()->currentValue(), 25);
    EXPECT_EQ(bar->parent(), root());
    presenter->hideWork();
    EXPECT_EQ(root()->childCount(), before);
}

} // namespace

} // namespace tests
