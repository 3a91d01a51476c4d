#include "platform/views/Control.h"

namespace platform {

const runtime::Class& Control::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<Control>("Control", &View::classObject()).build();
    return instance;
}

const runtime::Class& Control::isa() const
{
    return classObject();
}

void Control::addTarget(const std::weak_ptr<runtime::Object>& target, const runtime::Selector& action, unsigned events)
{
    assertHere();
    m_registrations.push_back({runtime::TargetAction(target, action), events});
}

void Control::sendActionsFor(unsigned events)
{
    assertHere();
    // A target may take this control away, or add targets to it, while it is told.
    const auto keepAlive = shared_from_this();
    const auto registrations = m_registrations;
    for (const Registration& registration : registrations)
        if ((registration.events & events) != 0)
            registration.targetAction.send(keepAlive);
}

void Control::setEnabled(bool enabled)
{
    assertHere();
    if (m_enabled == enabled)
        return;
    m_enabled = enabled;
    setNeedsDisplay();
    if (!enabled && m_trackedTouch)
        touchCancelled({*m_trackedTouch, {}, {}});
}

void Control::setHighlighted(bool highlighted)
{
    assertHere();
    if (m_highlighted == highlighted)
        return;
    m_highlighted = highlighted;
    setNeedsDisplay();
}

std::shared_ptr<View> Control::hitTest(base::Point point)
{
    assertHere();
    // A control is one thing to a finger, whatever it is made of.
    return View::hitTest(point) ? self<View>() : nullptr;
}

void Control::touchBegan(const Touch& touch)
{
    assertHere();
    if (!m_enabled || m_trackedTouch)
        return;
    m_trackedTouch = touch.id;
    setHighlighted(true);
    sendActionsFor(kTouchDown);
}

void Control::touchMoved(const Touch& touch)
{
    assertHere();
    if (m_trackedTouch != touch.id)
        return;
    const bool inside = isInside(touch);
    setHighlighted(inside);
    sendActionsFor(inside ? kTouchDragInside : kTouchDragOutside);
}

void Control::touchEnded(const Touch& touch)
{
    assertHere();
    if (m_trackedTouch != touch.id)
        return;
    m_trackedTouch.reset();
    setHighlighted(false);
    sendActionsFor(isInside(touch) ? kTouchUpInside : kTouchUpOutside);
}

void Control::touchCancelled(const Touch& touch)
{
    assertHere();
    if (m_trackedTouch != touch.id)
        return;
    m_trackedTouch.reset();
    setHighlighted(false);
    sendActionsFor(kTouchCancel);
}

bool Control::isInside(const Touch& touch) const
{
    return bounds().outset(kTrackingMargin).contains(convertFromRoot(touch.position));
}

} // namespace platform
