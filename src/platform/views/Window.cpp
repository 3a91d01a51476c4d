#include "platform/views/Window.h"

#include "platform/views/Presentation.h"

#include <cassert>
#include <utility>

namespace platform {

namespace {

bool isHiddenInTree(std::shared_ptr<View> view)
{
    for (; view; view = view->superview())
        if (view->isHidden())
            return true;
    return false;
}

void setNeedsLayoutInTree(View& view)
{
    view.setNeedsLayout();
    for (const auto& each : view.subviews())
        setNeedsLayoutInTree(*each);
}

const TextMeasuring& estimate()
{
    static const EstimatedText instance;
    return instance;
}

} // namespace

const TextMeasuring& textMeasuringFor(const View& view)
{
    const auto window = view.window();
    return window ? window->textMeasuring() : estimate();
}

Window::Window(base::MainQueue& mainQueue, base::Size size, double scale)
    : View({{0, 0}, size}), m_mainQueue(mainQueue), m_scale(scale)
{
}

const runtime::Class& Window::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<Window>("Window", &View::classObject()).build();
    return instance;
}

const runtime::Class& Window::isa() const
{
    return classObject();
}

void Window::setRightToLeft(bool rightToLeft)
{
    assertHere();
    m_isRightToLeft = rightToLeft;
    setNeedsLayoutInTree(*this);
}

const TextMeasuring& Window::textMeasuring() const
{
    assertHere();
    return m_textMeasuring ? *m_textMeasuring : estimate();
}

void Window::setTextMeasuring(const TextMeasuring* measuring)
{
    assertHere();
    m_textMeasuring = measuring;
    setNeedsLayoutInTree(*this);
}

void Window::setScale(double scale)
{
    assertHere();
    if (m_scale == scale)
        return;
    m_scale = scale;
    setNeedsDisplay();
    setNeedsLayout();
}

std::shared_ptr<Window> Window::window() const
{
    assertHere();
    // Empty during construction and destruction.
    return std::static_pointer_cast<Window>(std::const_pointer_cast<runtime::Object>(weak_from_this().lock()));
}

void Window::setRootViewController(const std::shared_ptr<ViewController>& controller)
{
    assertHere();
    if (m_root == controller)
        return;
    const auto keepAlive = shared_from_this();
    if (const auto previous = std::exchange(m_root, controller)) {
        previous->abandonPresented();
        previous->view()->removeFromSuperview();
    }
    if (!controller)
        return;
    controller->view()->setFrame(bounds());
    insertSubview_belowSubview(controller->view(), m_presentations.empty() ? nullptr : m_presentations.front().lock());
}

std::shared_ptr<Presentation> Window::topPresentation() const
{
    assertHere();
    return m_presentations.empty() ? nullptr : m_presentations.back().lock();
}

void Window::pushPresentation(const std::shared_ptr<Presentation>& presentation)
{
    assertHere();
    m_presentations.push_back(presentation);
    for (const auto& [id, tracking] : std::map(m_touches))
        cancelTouch(id); // a finger that is down behind it would go on there
}

void Window::popPresentation(const Presentation& presentation)
{
    assertHere();
    std::erase_if(m_presentations, [&](const std::weak_ptr<Presentation>& each) {
        const auto locked = each.lock();
        return !locked || locked.get() == &presentation;
    });
}

void Window::setVisible(bool visible)
{
    assertHere();
    if (m_visible == visible)
        return;
    const auto keepAlive = shared_from_this();
    m_visible = visible;
    for (const auto& controller : topControllers())
        controller->setAppeared(visible);
}

void Window::layoutSubviews()
{
    assertHere();
    View::layoutSubviews();
    if (m_root && m_root->isViewLoaded() && m_root->view()->superview().get() == this)
        m_root->view()->setFrame(bounds());
}

void Window::requestSize(base::Size size)
{
    assertHere();
    const bool isWaiting = m_requestedSize.has_value();
    m_requestedSize = size;
    if (isWaiting)
        return;
    m_mainQueue.post([weak = weakSelf<Window>()] {
        if (const auto window = weak.lock())
            window->transitionToSize(std::exchange(window->m_requestedSize, std::nullopt).value());
    });
}

void Window::transitionToSize(base::Size size)
{
    assertHere();
    if (size == bounds().size)
        return;
    const auto keepAlive = shared_from_this();
    const auto root = m_root;
    const auto coordinator = std::make_shared<TransitionCoordinator>(kTransitionDuration);
    ++m_transitions;
    if (root)
        root->viewWillTransitionToSize_withTransitionCoordinator(size, *coordinator);
    for (const auto& each : std::vector(m_presentations))
        if (const auto presentation = each.lock())
            presentation->presented()->viewWillTransitionToSize_withTransitionCoordinator(size, *coordinator);
    const auto changes = [&] {
        setFrame({{0, 0}, size});
        if (root)
            root->view()->setFrame(bounds());
        coordinator->runAlongside();
        layoutIfNeeded();
    };
    animate(m_mainQueue, kTransitionDuration, changes, [coordinator](bool) { coordinator->runCompletions(); });
}

void Window::setFirstResponder(const std::shared_ptr<Responder>& responder)
{
    assertHere();
    m_firstResponder = responder;
}

void Window::forgetStrays()
{
    const auto isHere = [this](const Responder& responder) { return responder.window().get() == this; };
    if (const auto responder = firstResponder(); responder && !isHere(*responder))
        m_firstResponder.reset();
    if (const auto view = m_focusedView.lock(); view && (!isHere(*view) || isHiddenInTree(view)))
        clearFocus();
}

void Window::commit()
{
    assertHere();
    const auto keepAlive = shared_from_this();
    m_needsCommit = true; // what the layout changes is part of this picture
    layoutIfNeeded();
    for (const auto& each : std::vector(m_presentations))
        if (const auto presentation = each.lock())
            presentation->followSource();
    m_needsCommit = false;
}

void Window::noteChange()
{
    assertHere();
    if (std::exchange(m_needsCommit, true) || !m_needsCommitHandler)
        return;
    const auto handler = m_needsCommitHandler; // may replace itself
    handler();
}

} // namespace platform
