#include "platform/views/ScrollView.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <chrono>
#include <cmath>

namespace platform {

namespace {

constexpr base::Instant kStep = std::chrono::milliseconds(16);
constexpr double kStepSeconds = 0.016;
/// What is left of the speed after a step; comes to rest within about a second.
constexpr double kFriction = 0.95;
/// Slower than this, in points a second, nobody sees it move.
constexpr double kRest = 20;

constexpr double kScrollerWidth = 3;
constexpr double kScrollerMargin = 3;
constexpr double kLeastScroller = 24;
/// Left free above and below what the focus goes to: the ring, and a bit of the neighbour.
constexpr double kRevealMargin = 8;

} // namespace

ScrollView::ScrollView(base::Rect frame)
    : View(frame), m_content(std::make_shared<View>()),
      m_scroller(std::make_shared<SurfaceView>(SurfaceView::Style::Scroller))
{
    setClipsToBounds(true);
    m_scroller->setUserInteractionEnabled(false);
}

const runtime::Class& ScrollView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<ScrollView>("ScrollView", &View::classObject()).build();
    return instance;
}

const runtime::Class& ScrollView::isa() const
{
    return classObject();
}

void ScrollView::didMoveToWindow()
{
    // Not in the constructor: neither children nor recognisers can be had before there is a reference to this.
    if (m_recognizer)
        return;
    addSubview(m_content);
    addSubview(m_scroller);
    const auto weak = weakSelf<ScrollView>();
    m_recognizer = std::make_shared<PanGestureRecognizer>(
        weak,
        [weak](bool isDownwards) {
            const auto view = weak.lock();
            return view && (isDownwards ? view->m_offset > 0 : view->m_offset < view->maximumOffset());
        },
        [weak](const PanGestureRecognizer::Pan& pan) {
            if (const auto view = weak.lock())
                view->pan(pan);
        });
    addGestureRecognizer(m_recognizer);
}

void ScrollView::setContentHeight(double height)
{
    assertHere();
    if (m_contentHeight == height)
        return;
    m_contentHeight = height;
    setNeedsLayout();
}

double ScrollView::maximumOffset() const
{
    assertHere();
    return std::max(0.0, m_contentHeight - bounds().height());
}

void ScrollView::setContentOffset(double offset)
{
    assertHere();
    const double allowed = std::clamp(offset, 0.0, maximumOffset());
    if (m_offset == allowed)
        return;
    m_offset = allowed;
    setNeedsLayout();
}

bool ScrollView::scrollBy(double points)
{
    assertHere();
    ++m_coasts;
    const double before = m_offset;
    setContentOffset(m_offset - points);
    return m_offset != before;
}

void ScrollView::reveal(const View& view)
{
    assertHere();
    if (!view.isDescendantOf(*m_content))
        return;
    const double top = view.convertToRoot({}).y - m_content->convertToRoot({}).y;
    const double bottom = top + view.bounds().height();
    ++m_coasts;
    if (top - kRevealMargin < m_offset)
        setContentOffset(top - kRevealMargin);
    else if (bottom + kRevealMargin > m_offset + bounds().height())
        setContentOffset(bottom + kRevealMargin - bounds().height());
}

void ScrollView::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    m_offset = std::clamp(m_offset, 0.0, maximumOffset());
    m_content->setFrame(base::Rect::make(0, -m_offset, bounds().width(), std::max(m_contentHeight, bounds().height())));
    placeScroller();
}

void ScrollView::placeScroller()
{
    const double height = bounds().height();
    const double most = maximumOffset();
    m_scroller->setHidden(most <= 0 || height <= 0);
    if (m_scroller->isHidden())
        return;
    const double room = height - 2 * kScrollerMargin;
    const double length = std::min(room, std::max(kLeastScroller, room * height / m_contentHeight));
    const auto itsWindow = window();
    const double x =
        itsWindow && itsWindow->isRightToLeft() ? kScrollerMargin : bounds().width() - kScrollerWidth - kScrollerMargin;
    m_scroller->setFrame(
        base::Rect::make(x, kScrollerMargin + (room - length) * m_offset / most, kScrollerWidth, length));
}

void ScrollView::pan(const PanGestureRecognizer::Pan& pan)
{
    using State = PanGestureRecognizer::State;
    switch (pan.state) {
    case State::Down:
        ++m_coasts; // a finger stops what is on its way
        break;
    case State::Began:
        m_offsetAtStart = m_offset;
        break;
    case State::Moved:
        setContentOffset(m_offsetAtStart - pan.translation);
        break;
    case State::Ended:
        setContentOffset(m_offsetAtStart - pan.translation);
        coast(-pan.velocity);
        break;
    case State::GaveUp:
        break;
    }
}

void ScrollView::coast(double velocity)
{
    coastOn(velocity, ++m_coasts);
}

void ScrollView::coastOn(double velocity, std::uint64_t run)
{
    const auto itsWindow = window();
    if (run != m_coasts || !itsWindow || std::abs(velocity) < kRest)
        return;
    itsWindow->mainQueue().postAfter(kStep, [weak = weakSelf<ScrollView>(), velocity, run] {
        const auto view = weak.lock();
        if (!view || run != view->m_coasts)
            return;
        const double before = view->m_offset;
        view->setContentOffset(before + velocity * kStepSeconds);
        if (view->m_offset != before)
            view->coastOn(velocity * kFriction, run);
    });
}

} // namespace platform
