#include "platform/views/GestureRecognizer.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace platform {

namespace {

double distance(base::Point a, base::Point b)
{
    return std::hypot(a.x - b.x, a.y - b.y);
}

} // namespace

TapGestureRecognizer::TapGestureRecognizer(std::weak_ptr<runtime::Object> target, runtime::Selector action)
    : m_targetAction(std::move(target), std::move(action))
{
}

const runtime::Class& TapGestureRecognizer::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<TapGestureRecognizer>("TapGestureRecognizer", &runtime::Object::classObject()).build();
    return instance;
}

const runtime::Class& TapGestureRecognizer::isa() const
{
    return classObject();
}

void TapGestureRecognizer::touchBegan(const Touch& touch)
{
    assertHere();
    ++m_fingers;
    if (m_fingers == 1)
        m_start = touch;
    else
        m_start.reset();
}

void TapGestureRecognizer::touchMoved(const Touch& touch)
{
    assertHere();
    if (m_start && m_start->id == touch.id && distance(m_start->position, touch.position) > kSlop)
        m_start.reset();
}

void TapGestureRecognizer::touchEnded(const Touch& touch)
{
    assertHere();
    m_fingers = std::max(0, m_fingers - 1);
    touchMoved(touch);
    const bool tapped = m_start && m_start->id == touch.id;
    m_start.reset();
    if (tapped)
        m_targetAction.send(self<runtime::Object>());
}

void TapGestureRecognizer::touchCancelled(const Touch&)
{
    assertHere();
    m_fingers = std::max(0, m_fingers - 1);
    m_start.reset();
}

} // namespace platform
