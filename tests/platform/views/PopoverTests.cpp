// Popovers: where they stand, and what they point at.
#include "PresentationFixture.h"

#include "platform/views/BarButtonItem.h"
#include "platform/views/Toolbar.h"

namespace tests {

namespace {

using platform::ModalPresentationStyle;
using platform::SurfaceView;

struct Popping : Presenting {
    std::shared_ptr<platform::Toolbar> bar = std::make_shared<platform::Toolbar>(base::Rect::make(0, 0, 1000, 60));
    std::shared_ptr<platform::BarButtonItem> share = std::make_shared<platform::BarButtonItem>(
        words, platform::BarButtonItem::Kind::Action, target, Target::action());
    std::shared_ptr<platform::BarButtonItem> save =
        std::make_shared<platform::BarButtonItem>(words, platform::BarButtonItem::Kind::Save, target, Target::action());

    Popping()
    {
        window->transitionToSize({1000, 700});
        behind->removeFromSuperview();
        bar->setAutoresizingMask(platform::kFlexibleWidth);
        bar->setItems({platform::BarButtonItem::flexibleSpace(), share, save});
        root->view()->addSubview(bar);
        shown->setModalPresentationStyle(ModalPresentationStyle::Popover);
        shown->setPopoverSource(share);
        window->commit();
    }
    double sourceMiddle() const { return share->view()->convertToRoot({22, 0}).x; }
    double arrow() const { return surface().minX() + window->topPresentation()->surface()->arrow().position; }
    SurfaceView::Arrow::Edge edge() const { return window->topPresentation()->surface()->arrow().edge; }
};

TEST_F(Popping, APopoverPointsAtWhatItCameFrom)
{
    presentAndSettle();
    EXPECT_EQ(static_cast<int>(platform::ModalPresentationStyle::Popover), 7);
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Top);
    EXPECT_EQ(arrow(), sourceMiddle());
    EXPECT_EQ(surface().minY(), share->view()->convertToRoot({0, 44}).y + SurfaceView::kArrowHeight);
    EXPECT_LE(surface().maxX(), 992);
    EXPECT_EQ(surface().height(), 300);
}

TEST_F(Popping, APopoverStaysAtItsSourceThroughSizesAndChangesOfTheBar)
{
    presentAndSettle();
    window->transitionToSize({700, 1000});
    window->commit();
    EXPECT_EQ(arrow(), sourceMiddle());
    const double before = arrow();
    bar->setItems({share, platform::BarButtonItem::flexibleSpace(), save});
    window->commit();
    EXPECT_NE(sourceMiddle(), before);
    EXPECT_EQ(arrow(), sourceMiddle());
    bar->setFrame(base::Rect::make(0, 940, 700, 60));
    window->commit();
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Bottom);
    EXPECT_EQ(surface().maxY(), share->view()->convertToRoot({0, 0}).y - SurfaceView::kArrowHeight);
}

TEST_F(Popping, APopoverWhoseSourceIsNowhereStandsInTheMiddle)
{
    presentAndSettle();
    bar->setItems({save});
    window->commit();
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::None);
    EXPECT_EQ(surface().center(), (base::Point{500, 350}));
    bar->setItems({share});
    window->commit();
    EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Top);
    bar->setHidden(true);
    window->commit();
    EXPECT_EQ(surface().center(), (base::Point{500, 350}));
}

TEST_F(Popping, APopoverStandsInTheMiddleOfItsSourceWhereThereIsRoom)
{
    bar->setItems({platform::BarButtonItem::flexibleSpace(), share, platform::BarButtonItem::flexibleSpace()});
    presentAndSettle();
    EXPECT_EQ(surface().width(), 376);
    EXPECT_EQ(surface().center().x, sourceMiddle());
    EXPECT_EQ(shown->view()->frame(), base::Rect::make(0, 0, 376, 300));
    EXPECT_TRUE(grabber()->isHidden());
    EXPECT_EQ(dim()->backgroundColor(), (platform::Color{0, 0, 0, 0.15})) << "what it points at can be made out";
}

TEST_F(Popping, AtTheScreensEdgesItsArrowKeepsClearOfItsCorners)
{
    constexpr double kInset = SurfaceView::kCorner + SurfaceView::kArrowWidth / 2;
    const auto position = [this] { return window->topPresentation()->surface()->arrow().position; };
    presentAndSettle();
    bar->setItems({share});
    window->commit();
    EXPECT_EQ(surface().minX(), 8);
    EXPECT_EQ(position(), std::max(kInset, sourceMiddle() - 8));
    bar->setItems({platform::BarButtonItem::flexibleSpace(), share});
    window->commit();
    EXPECT_EQ(surface().maxX(), 992);
    EXPECT_EQ(position(), std::min(376 - kInset, sourceMiddle() - surface().minX()));
    bar->setFrame(base::Rect::make(20, 0, 1000, 60)); // a bit of the source stands out of the window
    window->commit();
    EXPECT_EQ(position(), 376 - kInset);
}

TEST_F(Popping, AHighPopoverStaysOnTheScreen)
{
    shown->height = 5000;
    presentAndSettle();
    EXPECT_EQ(surface().maxY(), 692);
    bar->setFrame(base::Rect::make(0, 640, 1000, 60));
    window->commit();
    EXPECT_EQ(surface().minY(), 8);
    bar->setItems({save});
    window->commit();
    EXPECT_EQ(surface(), base::Rect::make(312, 24, 376, 652));
    window->transitionToSize({300, 700});
    window->commit();
    EXPECT_EQ(surface(), base::Rect::make(8, 24, 284, 652));
}

TEST_F(Popping, ASourceThatIsOutOfTheWindowIsNowhere)
{
    presentAndSettle();
    for (const base::Point away : {base::Point{0, -60}, {0, 700}, {-1000, 0}, {1000, 0}}) {
        bar->setFrame(base::Rect::make(away.x, away.y, 1000, 60));
        window->commit();
        EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::None) << away.x << ", " << away.y;
        bar->setFrame(base::Rect::make(0, 0, 1000, 60));
        window->commit();
        EXPECT_EQ(edge(), SurfaceView::Arrow::Edge::Top);
    }
}

TEST_F(Popping, ItFollowsTheMirroredBar)
{
    presentAndSettle();
    window->setRightToLeft(true);
    window->commit();
    EXPECT_LT(sourceMiddle(), 500);
    EXPECT_EQ(arrow(), sourceMiddle());
    EXPECT_GE(surface().minX(), 8);
}

} // namespace

} // namespace tests
