// What a window does with fingers, keys and shakes.
#include "platform/views/Window.h"

#include "base/Text.h"
#include "platform/views/GestureRecognizer.h"
#include "platform/views/Presentation.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

template <typename T> std::vector<std::shared_ptr<T>> locked(const std::vector<std::weak_ptr<T>>& weak)
{
    std::vector<std::shared_ptr<T>> strong;
    for (const auto& each : weak)
        if (auto object = each.lock())
            strong.push_back(std::move(object));
    return strong;
}

bool canBeReached(const View& view)
{
    return !view.isHidden() && view.alpha() >= 0.01 && view.isUserInteractionEnabled();
}

void collectFocusable(const std::shared_ptr<View>& view, std::vector<std::shared_ptr<View>>& found)
{
    if (!canBeReached(*view))
        return;
    if (view->canBecomeFocused() && !view->bounds().isEmpty())
        found.push_back(view);
    for (const auto& below : view->subviews())
        collectFocusable(below, found);
}

bool isArrow(Key key)
{
    return key == Key::Left || key == Key::Right;
}

/// Where the view's upper edge can be seen: what is scrolled out of sight stands at the edge behind which it is.
double visibleTop(const View& view)
{
    double top = view.convertToRoot({}).y;
    for (auto above = view.superview(); above; above = above->superview())
        if (above->clipsToBounds()) {
            const double edge = above->convertToRoot({}).y;
            top = std::clamp(top, edge, edge + above->bounds().height());
        }
    return top;
}

bool concernsFocus(Key key)
{
    return key == Key::Return || key == Key::Space || isArrow(key);
}

bool matches(const KeyCommand& command, Key key, char character, bool control, bool shift)
{
    return command.key == key && command.control == control && (!control || command.shift == shift)
           && (key != Key::Character || base::lowercase(command.character) == base::lowercase(character));
}

} // namespace

void Window::touchDown(const Touch& touch)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    cancelTouch(touch.id);
    const auto hit = hitTest(touch.position);
    if (!hit)
        return;
    std::vector<std::shared_ptr<GestureRecognizer>> recognizers;
    for (auto view = hit; view; view = view->superview()) {
        recognizers.insert(recognizers.end(), view->gestureRecognizers().begin(), view->gestureRecognizers().end());
        if (!view->passesTouchesToSuperviewRecognizers())
            break;
    }
    m_touches[touch.id] = {touch, hit, {recognizers.begin(), recognizers.end()}};
    hit->touchBegan(touch);
    for (const auto& recognizer : recognizers)
        recognizer->touchBegan(touch);
}

void Window::touchMove(const Touch& touch)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    const auto found = m_touches.find(touch.id);
    if (found == m_touches.end())
        return;
    const auto view = found->second.view.lock();
    if (!view || view->window().get() != this) {
        cancelTouch(touch.id);
        return;
    }
    found->second.last = touch;
    const auto recognizers = locked(found->second.recognizers);
    view->touchMoved(touch);
    for (const auto& recognizer : recognizers)
        recognizer->touchMoved(touch);
}

void Window::touchUp(const Touch& touch)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    const auto found = m_touches.find(touch.id);
    if (found == m_touches.end())
        return;
    const auto view = found->second.view.lock();
    if (!view || view->window().get() != this) {
        cancelTouch(touch.id);
        return;
    }
    const auto recognizers = locked(found->second.recognizers);
    m_touches.erase(found);
    view->touchEnded(touch);
    for (const auto& recognizer : recognizers)
        recognizer->touchEnded(touch);
}

void Window::touchCancel(const Touch& touch)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    cancelTouch(touch.id);
}

void Window::claimTouch(int id, const std::shared_ptr<GestureRecognizer>& recognizer, const std::shared_ptr<View>& view)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    const auto found = m_touches.find(id);
    if (found == m_touches.end())
        return;
    const Touch last = found->second.last;
    const auto previous = found->second.view.lock();
    const auto others = locked(found->second.recognizers);
    found->second.view = view;
    found->second.recognizers = {recognizer};
    if (previous && previous != view)
        previous->touchCancelled(last);
    for (const auto& other : others)
        if (other != recognizer)
            other->touchCancelled(last);
}

bool Window::scroll(base::Point position, double points)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    for (auto view = hitTest(position); view; view = view->superview())
        if (view->scrollBy(points))
            return true;
    return false;
}

void Window::cancelTouch(int id)
{
    const auto found = m_touches.find(id);
    if (found == m_touches.end())
        return;
    const Touch last = found->second.last;
    const auto view = found->second.view.lock();
    const auto recognizers = locked(found->second.recognizers);
    m_touches.erase(found);
    if (view)
        view->touchCancelled(last);
    for (const auto& recognizer : recognizers)
        recognizer->touchCancelled(last);
}

void Window::motion(MotionSubtype subtype)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (const auto responder = responderForKeys())
        responder->motionEnded_withEvent(subtype, {subtype});
}

bool Window::keyDown(Key key, char character, bool control, bool shift)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (const auto view = focusedView(); view && !control && concernsFocus(key))
        if (isReachable(view) && (isArrow(key) ? view->adjust(key == Key::Right ? 1 : -1) : view->activate()))
            return true;
    for (auto responder = responderForKeys(); responder; responder = responder->nextResponder())
        for (const KeyCommand& command : responder->keyCommands())
            if (matches(command, key, character, control, shift) && responder->respondsTo(command.action)) {
                responder->perform(command.action);
                return true;
            }
    return !control && moveFocusByArrow(key);
}

std::shared_ptr<Responder> Window::responderForKeys() const
{
    const auto first = firstResponder();
    const auto presentation = topPresentation();
    if (!presentation)
        return first;
    for (auto responder = first; responder; responder = responder->nextResponder())
        if (responder == presentation)
            return first;
    return presentation;
}

bool Window::moveFocusByArrow(Key key)
{
    // What is presented is a list of things to do; on the screen behind, up and down mean nothing.
    if (!topPresentation() || (key != Key::Up && key != Key::Down))
        return false;
    const auto preferred = focusedView() ? nullptr : topPresentation()->presented()->preferredFocusView();
    if (preferred && isReachable(preferred))
        focus(preferred);
    else
        moveFocus(key == Key::Down);
    return true;
}

bool Window::isReachable(const std::shared_ptr<View>& view) const
{
    const auto reachable = focusableViews();
    return std::find(reachable.begin(), reachable.end(), view) != reachable.end();
}

std::shared_ptr<View> Window::focusedView() const
{
    assertHere();
    return m_focusedView.lock();
}

std::vector<std::shared_ptr<View>> Window::focusableViews() const
{
    std::vector<std::shared_ptr<View>> views;
    if (const auto presentation = topPresentation())
        collectFocusable(presentation, views);
    else
        for (const auto& view : subviews())
            collectFocusable(view, views);
    const auto top = [](const std::shared_ptr<View>& view) { return visibleTop(*view); };
    const auto left = [](const std::shared_ptr<View>& view) { return view->convertToRoot({}).x; };
    std::stable_sort(views.begin(), views.end(), [&](const auto& a, const auto& b) { return top(a) < top(b); });
    // A row is what begins above the middle of its first view: buttons of one bar do not all begin at the same height.
    for (auto row = views.begin(); row != views.end();) {
        const double middle = top(*row) + (*row)->bounds().height() / 2;
        const auto end = std::find_if(row, views.end(), [&](const auto& view) { return top(view) >= middle; });
        std::stable_sort(row, end, [&](const auto& a, const auto& b) {
            return isRightToLeft() ? left(b) < left(a) : left(a) < left(b);
        });
        row = end;
    }
    return views;
}

void Window::moveFocus(bool forward)
{
    assertHere();
    const auto views = focusableViews();
    if (views.empty()) {
        clearFocus();
        return;
    }
    const auto current = std::find(views.begin(), views.end(), focusedView());
    if (current == views.end())
        focus(forward ? views.front() : views.back());
    else if (forward)
        focus(current + 1 == views.end() ? views.front() : *(current + 1));
    else
        focus(current == views.begin() ? views.back() : *(current - 1));
}

void Window::clearFocus()
{
    assertHere();
    focus(nullptr);
}

void Window::restoreFocus(const std::shared_ptr<View>& view)
{
    assertHere();
    focus(view && isReachable(view) ? view : nullptr);
}

void Window::focus(const std::shared_ptr<View>& view)
{
    const auto previous = m_focusedView.lock();
    if (previous == view)
        return;
    m_focusedView = view;
    for (const auto& changed : {previous, view})
        if (changed)
            changed->setNeedsDisplay();
    noteChange();
    for (auto above = view ? view->superview() : nullptr; above; above = above->superview())
        above->reveal(*view);
}

} // namespace platform
