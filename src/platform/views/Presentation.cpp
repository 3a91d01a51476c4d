#include "platform/views/Presentation.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

const runtime::Selector& tapBesideSelector()
{
    static const runtime::Selector selector("tapBeside");
    return selector;
}

const runtime::Selector& escapeSelector()
{
    static const runtime::Selector selector("escape");
    return selector;
}

/// Black; what lies behind a sheet steps back, and can still be made out. A popover points at it, and dims less.
constexpr double kDim = 0.4;
constexpr double kPopoverDim = 0.15;

/// A sheet that was pulled down by so much of its height, or thrown so fast (points a second), closes.
constexpr double kClosingPart = 1.0 / 3;
constexpr double kClosingVelocity = 700;

SurfaceView::Style surfaceStyleOf(ModalPresentationStyle style)
{
    switch (style) {
    case ModalPresentationStyle::Popover:
        return SurfaceView::Style::Popover;
    case ModalPresentationStyle::Alert:
        return SurfaceView::Style::Alert;
    case ModalPresentationStyle::Sheet:
        break;
    }
    return SurfaceView::Style::Sheet;
}

} // namespace

Presentation::Presentation(const std::shared_ptr<ViewController>& presenting, std::shared_ptr<ViewController> presented)
    : m_presenting(presenting), m_presented(std::move(presented)), m_source(m_presented->popoverSource()),
      m_style(m_presented->modalPresentationStyle()), m_dim(std::make_shared<View>()),
      m_surface(std::make_shared<SurfaceView>(surfaceStyleOf(m_style))),
      m_grabber(std::make_shared<SurfaceView>(SurfaceView::Style::Grabber))
{
    m_dim->setBackgroundColor(Color{0, 0, 0, m_style == ModalPresentationStyle::Popover ? kPopoverDim : kDim});
    m_dim->setAlpha(0);
    m_grabber->setHidden(m_style != ModalPresentationStyle::Sheet);
    m_grabber->setUserInteractionEnabled(false);
}

const runtime::Class& Presentation::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<Presentation>("Presentation", &View::classObject())
                                                .method(tapBesideSelector().name(), &Presentation::tapBeside)
                                                .method(escapeSelector().name(), &Presentation::escape)
                                                .build();
    return instance;
}

const runtime::Class& Presentation::isa() const
{
    return classObject();
}

base::Instant Presentation::duration(bool animated) const
{
    if (!animated)
        return base::Instant(0);
    return m_style == ModalPresentationStyle::Sheet ? kSlideDuration : kFadeDuration;
}

void Presentation::begin(Window& window, bool animated, Completion shown)
{
    assertHere();
    const auto keepAlive = self<Presentation>();
    const auto weak = weakSelf<Presentation>();
    m_formerFocus = window.focusedView();
    m_formerResponder = window.firstResponder();
    m_phase = Phase::Coming;
    m_isAnimated = animated;
    m_shownHandler = std::move(shown);
    m_surface->setUserInteractionEnabled(false); // what moves is not pressed
    m_dim->addGestureRecognizer(std::make_shared<TapGestureRecognizer>(weak, tapBesideSelector()));
    if (m_style == ModalPresentationStyle::Sheet)
        m_surface->addGestureRecognizer(std::make_shared<PanGestureRecognizer>(
            m_surface,
            [weak](bool isDownwards) {
                const auto presentation = weak.lock();
                return isDownwards && presentation && presentation->m_phase == Phase::Shown;
            },
            [weak](const PanGestureRecognizer::Pan& pan) {
                if (const auto presentation = weak.lock())
                    presentation->drag(pan);
            }));
    withoutAnimation([&] {
        setFrame(window.bounds());
        setAutoresizingMask(kFlexibleWidth | kFlexibleHeight);
        addSubview(m_dim);
        addSubview(m_surface);
        m_surface->addSubview(m_presented->view());
        m_surface->addSubview(m_grabber);
        m_surface->setAccessibilityLabel(m_presented->title());
        window.pushPresentation(keepAlive);
        window.clearFocus();
        window.setFirstResponder(keepAlive);
        window.addSubview(keepAlive);
        m_presented->becomeFirstResponder();
        layoutIfNeeded();
    });
    if (m_phase != Phase::Coming)
        return; // whoever appeared has ended it
    m_isUp = true;
    const auto comeUp = [this] {
        setNeedsLayout();
        layoutIfNeeded();
    };
    m_motions = 1;
    animate(window.mainQueue(), duration(animated), comeUp, [weak](bool) {
        if (const auto presentation = weak.lock())
            presentation->motionDidEnd();
    });
}

void Presentation::contentSizeDidChange()
{
    assertHere();
    if (m_phase == Phase::Shown || (m_phase == Phase::Coming && m_takesSizes))
        setNeedsLayout();
}

void Presentation::motionDidEnd()
{
    if (m_phase != Phase::Coming)
        return;
    const auto keepAlive = shared_from_this();
    layoutIfNeeded(); // with what came since the last picture
    m_takesSizes = false;
    if (--m_motions == 0)
        didShow();
}

void Presentation::didShow()
{
    const auto keepAlive = shared_from_this();
    m_phase = Phase::Shown;
    m_surface->setUserInteractionEnabled(true);
    // Who steers by keys goes on with them.
    if (const auto itsWindow = window(); itsWindow && m_formerFocus.lock() && !itsWindow->focusedView()) {
        itsWindow->restoreFocus(m_presented->preferredFocusView());
        if (!itsWindow->focusedView())
            itsWindow->moveFocus(true);
    }
    m_presented->presentationDidShow();
    if (const auto shown = std::exchange(m_shownHandler, {}))
        shown();
    if (m_phase != Phase::Shown)
        return;
    if (m_waitingEnd)
        leave(*m_waitingEnd);
    else if (std::exchange(m_closesWhenShown, false))
        closeForUser();
}

void Presentation::end(bool animated, Completion gone)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (gone)
        m_goneHandlers.push_back(std::move(gone));
    if (m_phase == Phase::Coming)
        m_waitingEnd = animated;
    else if (m_phase == Phase::Shown)
        leave(animated);
}

void Presentation::close(Completion gone)
{
    assertHere();
    m_goneHandlers.push_back(std::move(gone));
    escape();
}

void Presentation::leave(bool animated)
{
    const auto itsWindow = window();
    if (!itsWindow)
        return;
    m_presented->abandonPresented();
    m_phase = Phase::Leaving;
    m_isUp = false;
    setUserInteractionEnabled(false);
    const auto goDown = [this] {
        setNeedsLayout();
        layoutIfNeeded();
    };
    animate(itsWindow->mainQueue(), duration(animated), goDown, [weak = weakSelf<Presentation>()](bool) {
        if (const auto presentation = weak.lock())
            presentation->didLeave();
    });
}

void Presentation::didLeave()
{
    if (m_phase != Phase::Leaving)
        return;
    const auto keepAlive = shared_from_this();
    abandon();
    const auto presenting = m_presenting.lock();
    if (presenting)
        presenting->forgetPresentation(*this);
    m_presented->presentationDidEnd();
    if (presenting)
        presenting->presentedViewControllerDidEnd(*m_presented);
    for (const Completion& gone : std::exchange(m_goneHandlers, {}))
        gone();
}

void Presentation::abandon()
{
    assertHere();
    if (m_phase == Phase::Gone)
        return;
    m_phase = Phase::Gone;
    const auto keepAlive = shared_from_this();
    m_presented->abandonPresented();
    const auto itsWindow = window();
    if (!itsWindow)
        return;
    itsWindow->popPresentation(*this);
    removeFromSuperview();
    m_presented->view()->removeFromSuperview();
    const auto responder = m_formerResponder.lock();
    const bool isStillThere = responder && responder->window() == itsWindow;
    itsWindow->setFirstResponder(isStillThere ? responder : nullptr);
    const auto focus = m_formerFocus.lock();
    itsWindow->restoreFocus(focus && focus->window() == itsWindow ? focus : nullptr);
}

std::vector<KeyCommand> Presentation::keyCommands() const
{
    assertHere();
    return {{Key::Escape, 0, false, escapeSelector()}};
}

void Presentation::tapBeside()
{
    assertHere();
    // What is still coming up may have been asked for by the first of two taps.
    if (m_phase == Phase::Shown && m_style != ModalPresentationStyle::Alert)
        closeForUser();
}

void Presentation::escape()
{
    assertHere();
    if (m_phase == Phase::Coming)
        m_closesWhenShown = true;
    else if (m_phase == Phase::Shown)
        closeForUser();
}

void Presentation::closeForUser()
{
    const auto keepAlive = shared_from_this();
    if (m_presented->presentationShouldClose() && m_phase == Phase::Shown)
        leave(true);
}

void Presentation::drag(const PanGestureRecognizer::Pan& pan)
{
    using State = PanGestureRecognizer::State;
    const auto itsWindow = window();
    if (pan.state == State::Down || m_phase != Phase::Shown || !itsWindow)
        return;
    const auto keepAlive = shared_from_this();
    m_dragged = std::max(0.0, pan.translation);
    if (pan.state != State::Ended && pan.state != State::GaveUp) {
        setNeedsLayout();
        return;
    }
    const bool closes = pan.state == State::Ended
                        && (m_dragged > m_surface->bounds().height() * kClosingPart || pan.velocity > kClosingVelocity);
    if (closes)
        closeForUser();
    if (m_phase != Phase::Shown)
        return;
    m_dragged = 0;
    animate(itsWindow->mainQueue(), kSlideDuration, [this] {
        setNeedsLayout();
        layoutIfNeeded();
    });
}

} // namespace platform
