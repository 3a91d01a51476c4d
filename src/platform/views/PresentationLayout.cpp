// Where what is presented stands in its window.
#include "platform/views/Presentation.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

/// Above a sheet that would like to be higher: what it came from is still there, and a place for a tap beside it.
constexpr double kLeastAbove = 48;
/// On a low screen there is no room to lose.
constexpr double kLowScreen = 480;
constexpr double kLeastAboveOnLowScreen = 24;
constexpr double kWidestSheet = 560;
constexpr double kGrabberRoom = 16;
constexpr double kGrabberWidth = 36;
constexpr double kGrabberHeight = 4;

constexpr double kPopoverWidth = 376;
constexpr double kAlertWidth = 288;
/// Between a popover or an alert and the screen's edges.
constexpr double kMargin = 8;
constexpr double kAlertMargin = 24;
/// An arrow does not stand on a round corner.
constexpr double kArrowInset = SurfaceView::kCorner + SurfaceView::kArrowWidth / 2;

} // namespace

std::optional<base::Rect> Presentation::sourceRect() const
{
    const auto item = m_source.lock();
    const auto view = item ? item->view() : nullptr;
    const auto itsWindow = window();
    if (!view || !itsWindow || view->window() != itsWindow || view->bounds().isEmpty())
        return std::nullopt;
    for (auto above = view; above; above = above->superview())
        if (above->isHidden())
            return std::nullopt;
    const base::Rect rect{view->convertToRoot({}), view->bounds().size};
    const base::Rect screen = itsWindow->bounds();
    const bool isSeen = rect.maxX() > screen.minX() && rect.minX() < screen.maxX() && rect.maxY() > screen.minY()
                        && rect.minY() < screen.maxY();
    return isSeen ? std::optional(rect) : std::nullopt;
}

void Presentation::followSource()
{
    assertHere();
    if (m_style == ModalPresentationStyle::Popover && sourceRect() != m_anchor)
        setNeedsLayout();
    layoutIfNeeded();
}

void Presentation::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    const bool isOnItsWay = m_phase == Phase::Coming && m_isUp && m_isAnimated;
    if (isOnItsWay && currentAnimationDuration() == base::Instant(0))
        placeInMotion();
    else
        place();
}

void Presentation::placeInMotion()
{
    const auto itsWindow = window();
    const base::Rect before = m_surface->frame();
    animate(itsWindow->mainQueue(), kFadeDuration, [this] { place(); });
    if (m_surface->frame() == before)
        return;
    ++m_motions;
    itsWindow->mainQueue().postAfter(kFadeDuration, [weak = weakSelf<Presentation>()] {
        if (const auto presentation = weak.lock())
            presentation->motionDidEnd();
    });
}

void Presentation::place()
{
    m_dim->setFrame(bounds());
    base::Rect frame;
    switch (m_style) {
    case ModalPresentationStyle::Sheet:
        frame = sheetFrame();
        break;
    case ModalPresentationStyle::Popover:
        frame = popoverFrame();
        break;
    case ModalPresentationStyle::Alert:
        frame = alertFrame();
        break;
    }
    m_surface->setFrame(frame); // before what is in it, which would follow its size otherwise
    const bool slides = m_style == ModalPresentationStyle::Sheet;
    const double above = slides ? kGrabberRoom : 0;
    m_presented->view()->setFrame(base::Rect::make(0, above, frame.width(), frame.height() - above));
    m_grabber->setFrame(base::Rect::make((frame.width() - kGrabberWidth) / 2, (kGrabberRoom - kGrabberHeight) / 2 + 2,
                                         kGrabberWidth, kGrabberHeight));
    const double pulled = slides && frame.height() > 0 ? std::min(1.0, m_dragged / frame.height()) : 0;
    m_dim->setAlpha(m_isUp ? 1 - pulled : 0);
    if (!slides)
        m_surface->setAlpha(m_isUp ? 1 : 0);
}

base::Rect Presentation::sheetFrame() const
{
    const base::Size screen = bounds().size;
    const double width = std::min(screen.width, kWidestSheet);
    const double most = screen.height - (screen.height < kLowScreen ? kLeastAboveOnLowScreen : kLeastAbove);
    const double wanted = m_presented->contentSizeThatFits({width, most - kGrabberRoom}).height + kGrabberRoom;
    const double height = std::clamp(std::round(wanted), 0.0, std::max(0.0, most));
    const double y = m_isUp ? screen.height - height + m_dragged : screen.height;
    return base::Rect::make(std::round((screen.width - width) / 2), y, width, height);
}

base::Rect Presentation::alertFrame() const
{
    const base::Size screen = bounds().size;
    const double width = std::min(kAlertWidth, screen.width - 2 * kMargin);
    const double most = screen.height - 2 * (screen.height < kLowScreen ? kMargin : kAlertMargin);
    const double height = std::min(most, std::round(m_presented->contentSizeThatFits({width, most}).height));
    return base::Rect::make(std::round((screen.width - width) / 2), std::round((screen.height - height) / 2), width,
                            height);
}

base::Rect Presentation::popoverFrame()
{
    const base::Size screen = bounds().size;
    const double width = std::min(kPopoverWidth, screen.width - 2 * kMargin);
    m_anchor = sourceRect();
    if (!m_anchor) {
        m_surface->setArrow({});
        const double most = screen.height - 2 * kAlertMargin;
        const double height = std::min(most, std::round(m_presented->contentSizeThatFits({width, most}).height));
        return base::Rect::make(std::round((screen.width - width) / 2), std::round((screen.height - height) / 2), width,
                                height);
    }
    const double above = m_anchor->minY() - SurfaceView::kArrowHeight - kMargin;
    const double below = screen.height - m_anchor->maxY() - SurfaceView::kArrowHeight - kMargin;
    const bool isBelow = below >= above;
    const double most = std::max(0.0, isBelow ? below : above);
    const double height = std::min(most, std::round(m_presented->contentSizeThatFits({width, most}).height));
    const double middle = m_anchor->center().x;
    const double furthestX = std::max(kMargin, screen.width - width - kMargin);
    const double x = std::clamp(std::round(middle - width / 2), kMargin, furthestX);
    const double y =
        isBelow ? m_anchor->maxY() + SurfaceView::kArrowHeight : m_anchor->minY() - SurfaceView::kArrowHeight - height;
    const double furthestArrow = std::max(kArrowInset, width - kArrowInset);
    using Edge = SurfaceView::Arrow::Edge;
    m_surface->setArrow({isBelow ? Edge::Top : Edge::Bottom, std::clamp(middle - x, kArrowInset, furthestArrow)});
    return base::Rect::make(x, y, width, height);
}

} // namespace platform
