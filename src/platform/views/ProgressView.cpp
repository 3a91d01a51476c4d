#include "platform/views/ProgressView.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <chrono>
#include <utility>

namespace platform {

namespace {

constexpr base::Instant kRun = std::chrono::milliseconds(900);
constexpr base::Instant kPulse = std::chrono::milliseconds(300);
/// Of the bar: the piece that runs along it.
constexpr double kPiece = 0.3;

constexpr int kDots = 3;
constexpr double kDotSize = 6;
constexpr double kDotDistance = 10;
constexpr double kFaintDot = 0.3;

} // namespace

ProgressView::ProgressView(base::Rect frame)
    : View(frame), m_track(std::make_shared<SurfaceView>(SurfaceView::Style::Track)),
      m_fill(std::make_shared<SurfaceView>(SurfaceView::Style::Fill))
{
    setUserInteractionEnabled(false);
}

const runtime::Class& ProgressView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<ProgressView>("ProgressView", &View::classObject()).build();
    return instance;
}

const runtime::Class& ProgressView::isa() const
{
    return classObject();
}

void ProgressView::didMoveToWindow()
{
    if (!m_track->superview()) {
        addSubview(m_track);
        addSubview(m_fill);
    }
    run();
}

void ProgressView::setProgress(std::optional<double> progress, std::string spoken)
{
    assertHere();
    if (progress)
        progress = std::clamp(*progress, 0.0, 1.0);
    if (m_progress == progress && m_spoken == spoken)
        return;
    m_progress = progress;
    m_spoken = std::move(spoken);
    setNeedsDisplay();
    setNeedsLayout();
    run();
}

base::Rect ProgressView::fillFrame() const
{
    const double width = bounds().width();
    const double length = width * m_progress.value_or(kPiece);
    const auto itsWindow = window();
    const bool fromRight = itsWindow && itsWindow->isRightToLeft();
    const bool atEnd = !m_progress && !m_atStart;
    return base::Rect::make(fromRight != atEnd ? width - length : 0, 0, length, bounds().height());
}

void ProgressView::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    m_track->setFrame(bounds());
    m_fill->setFrame(fillFrame());
}

void ProgressView::run()
{
    const auto itsWindow = window();
    if (m_progress || m_runs || !itsWindow)
        return;
    m_runs = true;
    m_atStart = !m_atStart;
    const auto goOn = [weak = weakSelf<ProgressView>()](bool) {
        if (const auto view = weak.lock()) {
            view->m_runs = false;
            view->run();
        }
    };
    animate(
        itsWindow->mainQueue(), kRun, [this] { m_fill->setFrame(fillFrame()); }, goOn);
}

Accessibility ProgressView::accessibility() const
{
    assertHere();
    Accessibility description = View::accessibility();
    description.role = AccessibilityRole::Progress;
    if (m_progress) {
        description.maximum = 1;
        description.number = *m_progress;
        description.value = m_spoken;
    }
    return description;
}

ActivityIndicator::ActivityIndicator(base::Rect frame) : View(frame)
{
    for (int i = 0; i < kDots; ++i)
        m_dots.push_back(std::make_shared<SurfaceView>(SurfaceView::Style::Dot));
    setUserInteractionEnabled(false);
}

void ActivityIndicator::didMoveToWindow()
{
    for (const auto& dot : m_dots)
        if (!dot->superview())
            addSubview(dot);
    step();
}

void ActivityIndicator::setAnimating(bool animating)
{
    assertHere();
    m_isAnimating = animating;
    step();
}

void ActivityIndicator::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    const double start = (bounds().width() - kDotSize - (kDots - 1) * kDotDistance) / 2;
    for (std::size_t i = 0; i < m_dots.size(); ++i)
        m_dots[i]->setFrame(base::Rect::make(start + static_cast<double>(i) * kDotDistance,
                                             (bounds().height() - kDotSize) / 2, kDotSize, kDotSize));
}

void ActivityIndicator::step()
{
    const auto itsWindow = window();
    if (m_runs || !m_isAnimating || !itsWindow)
        return;
    m_runs = true;
    const auto light = [this] {
        for (std::size_t i = 0; i < m_dots.size(); ++i)
            m_dots[i]->setAlpha(i == m_next ? 1 : kFaintDot);
    };
    animate(itsWindow->mainQueue(), kPulse, light, [weak = weakSelf<ActivityIndicator>()](bool) {
        if (const auto view = weak.lock()) {
            view->m_runs = false;
            view->m_next = (view->m_next + 1) % view->m_dots.size();
            view->step();
        }
    });
}

} // namespace platform
