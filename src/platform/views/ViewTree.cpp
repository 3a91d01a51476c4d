// A view's place in the tree: what stands above and below it, and who is told when that changes.
#include "platform/views/View.h"

#include "platform/views/ViewController.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <cassert>
#include <utility>

namespace platform {

namespace {

const View* viewOf(const View::Child& child)
{
    const auto* view = std::get_if<std::shared_ptr<View>>(&child);
    return view ? view->get() : nullptr;
}

} // namespace

std::vector<std::shared_ptr<View>> View::subviews() const
{
    assertHere();
    std::vector<std::shared_ptr<View>> views;
    for (const Child& child : m_children)
        if (const auto* view = std::get_if<std::shared_ptr<View>>(&child))
            views.push_back(*view);
    return views;
}

void View::addSubview(const std::shared_ptr<View>& view)
{
    assertHere();
    placeSubview(view, nullptr);
}

void View::insertSubview_belowSubview(const std::shared_ptr<View>& view, const std::shared_ptr<View>& sibling)
{
    assertHere();
    placeSubview(view, sibling.get());
}

void View::placeSubview(const std::shared_ptr<View>& view, const View* below)
{
    assert(view && !isDescendantOf(*view));
    const auto keepAlive = shared_from_this();
    const auto previous = view->superview();
    if (previous.get() == this) {
        if (reorderSubview(*view, below))
            setNeedsDisplay();
        return;
    }
    const auto previousWindow = view->window();
    const auto newWindow = window();
    if (previous && previousWindow == newWindow && previous->showsControllers() == showsControllers())
        previous->detachSubview(*view); // moves within what is shown: nobody comes or goes
    else
        view->removeFromSuperview();

    m_children.insert(positionOf(below), view);
    view->m_superview = weakSelf<View>();
    setNeedsDisplay();
    setNeedsLayout();
    if (newWindow && newWindow != previousWindow)
        view->didMoveToWindowWithSubviews();
    if (view->superview().get() == this && showsControllers())
        view->appearControllers();
}

std::vector<View::Child>::iterator View::positionOf(const View* view)
{
    return std::find_if(m_children.begin(), m_children.end(),
                        [&](const Child& child) { return view && viewOf(child) == view; });
}

bool View::reorderSubview(const View& view, const View* below)
{
    if (&view == below)
        return false;
    const auto from = positionOf(&view);
    const auto to = positionOf(below);
    if (from + 1 == to)
        return false;
    if (from < to)
        std::rotate(from, from + 1, to);
    else
        std::rotate(to, from, from + 1);
    return true;
}

void View::addSublayer(const std::shared_ptr<Layer>& layer)
{
    assertHere();
    std::erase_if(m_children, [&](const Child& child) {
        const auto* each = std::get_if<std::shared_ptr<Layer>>(&child);
        return each && *each == layer;
    });
    m_children.emplace_back(layer);
    layer->setDisplayHandler([weak = weakSelf<View>()] {
        if (const auto view = weak.lock())
            view->noteChange();
    });
    setNeedsDisplay();
}

void View::removeFromSuperview()
{
    assertHere();
    const auto above = superview();
    if (!above)
        return;
    const auto keepAlive = shared_from_this();
    const auto previousWindow = window();
    std::vector<std::shared_ptr<ViewController>> leaving;
    if (above->showsControllers())
        for (const auto& controller : topControllers())
            controller->beginDisappearing(leaving);
    if (superview() == above) { // whoever was told may have moved this view already
        above->detachSubview(*this);
        if (previousWindow) {
            didMoveToWindowWithSubviews();
            previousWindow->forgetStrays();
        }
    }
    ViewController::endDisappearing(leaving);
}

void View::detachSubview(View& view)
{
    for (auto above = self<View>(); above; above = above->superview())
        above->dropConstraintsReferringTo(view);
    m_children.erase(positionOf(&view));
    view.m_superview.reset();
    setNeedsDisplay();
    setNeedsLayout();
}

bool View::isDescendantOf(const View& ancestor) const
{
    assertHere();
    if (this == &ancestor)
        return true;
    const auto above = superview();
    return above && above->isDescendantOf(ancestor);
}

std::shared_ptr<Window> View::window() const
{
    assertHere();
    const auto above = superview();
    return above ? above->window() : nullptr;
}

std::shared_ptr<Responder> View::nextResponder() const
{
    assertHere();
    if (auto controller = viewController())
        return controller;
    return superview();
}

std::shared_ptr<ViewController> View::viewController() const
{
    assertHere();
    return m_viewController.lock();
}

void View::didMoveToWindowWithSubviews()
{
    didMoveToWindow();
    for (const auto& view : subviews())
        view->didMoveToWindowWithSubviews();
}

bool View::showsControllers() const
{
    // The nearest controller knows; only where there is none it is for the window to say.
    if (const auto controller = viewController())
        return controller->hasAppeared();
    if (const auto* asWindow = dynamic_cast<const Window*>(this))
        return asWindow->isVisible();
    const auto above = superview();
    return above && above->showsControllers();
}

std::vector<std::shared_ptr<ViewController>> View::topControllers() const
{
    if (auto controller = viewController())
        return {std::move(controller)};
    std::vector<std::shared_ptr<ViewController>> found;
    for (const auto& view : subviews())
        for (auto& controller : view->topControllers())
            found.push_back(std::move(controller));
    return found;
}

void View::appearControllers()
{
    for (const auto& controller : topControllers())
        controller->setAppeared(true);
}

} // namespace platform
