#include "platform/views/View.h"

#include "platform/views/GestureRecognizer.h"
#include "platform/views/ViewController.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <utility>

namespace platform {

namespace {

/// Below this a view is as good as invisible, and takes no touches.
constexpr double kLeastAlphaForTouches = 0.01;

} // namespace

View::View(base::Rect frame) : m_frame(frame) {}

View::~View()
{
    assertHere();
}

const runtime::Class& View::classObject()
{
    static const runtime::Class& instance = runtime::ClassBuilder<View>("View", &Responder::classObject()).build();
    return instance;
}

const runtime::Class& View::isa() const
{
    return classObject();
}

void View::setCenter(base::Point center)
{
    assertHere();
    setFrame({{center.x - m_frame.width() / 2, center.y - m_frame.height() / 2}, m_frame.size});
}

void View::sizeToFit()
{
    assertHere();
    setFrame({m_frame.origin, sizeThatFits()});
}

base::Point View::convertToRoot(base::Point point) const
{
    assertHere();
    const View* view = this;
    for (auto above = superview(); above; above = above->superview()) {
        point.x += view->m_frame.minX();
        point.y += view->m_frame.minY();
        view = above.get();
    }
    return point;
}

base::Point View::convertFromRoot(base::Point point) const
{
    assertHere();
    const base::Point origin = convertToRoot({});
    return {point.x - origin.x, point.y - origin.y};
}

void View::setAlpha(double alpha)
{
    assertHere();
    const double clamped = std::clamp(alpha, 0.0, 1.0);
    if (clamped == m_alpha)
        return;
    noteAnimation(AnimatedProperty::Alpha, m_frame, m_alpha);
    m_alpha = clamped;
    setNeedsDisplay();
}

void View::setHidden(bool hidden)
{
    assertHere();
    if (m_hidden == hidden)
        return;
    m_hidden = hidden;
    setNeedsDisplay();
    if (const auto itsWindow = hidden ? window() : nullptr)
        itsWindow->forgetStrays();
}

void View::setBackgroundColor(Color color)
{
    assertHere();
    if (m_backgroundColor == color)
        return;
    m_backgroundColor = color;
    setNeedsDisplay();
}

void View::setClipsToBounds(bool clips)
{
    assertHere();
    if (m_clipsToBounds == clips)
        return;
    m_clipsToBounds = clips;
    setNeedsDisplay();
}

void View::setTintColor(std::optional<Color> color)
{
    assertHere();
    if (m_tintColor == color)
        return;
    m_tintColor = color;
    markTintChanged();
}

void View::markTintChanged()
{
    setNeedsDisplay();
    for (const auto& view : subviews())
        if (!view->m_tintColor)
            view->markTintChanged();
}

std::optional<Color> View::effectiveTintColor() const
{
    assertHere();
    if (m_tintColor)
        return m_tintColor;
    const auto above = superview();
    return above ? above->effectiveTintColor() : std::nullopt;
}

void View::setBackdropMaskFlags(unsigned flags)
{
    assertHere();
    if (m_backdropMaskFlags == flags)
        return;
    m_backdropMaskFlags = flags;
    setNeedsDisplay();
}

void View::setAccessibilityLabel(std::string label)
{
    assertHere();
    if (m_accessibilityLabel == label)
        return;
    m_accessibilityLabel = std::move(label);
    setNeedsDisplay();
}

Accessibility View::accessibility() const
{
    assertHere();
    Accessibility description;
    description.name = m_accessibilityLabel;
    return description;
}

std::shared_ptr<View> View::hitTest(base::Point point)
{
    assertHere();
    if (m_hidden || m_alpha < kLeastAlphaForTouches || !m_userInteractionEnabled || !pointInside(point))
        return nullptr;
    const auto below = subviews();
    for (auto view = below.rbegin(); view != below.rend(); ++view) {
        const base::Point origin = (*view)->frame().origin;
        if (auto hit = (*view)->hitTest({point.x - origin.x, point.y - origin.y}))
            return hit;
    }
    return self<View>();
}

void View::addGestureRecognizer(const std::shared_ptr<GestureRecognizer>& recognizer)
{
    assertHere();
    if (std::find(m_recognizers.begin(), m_recognizers.end(), recognizer) == m_recognizers.end())
        m_recognizers.push_back(recognizer);
}

std::vector<PropertyAnimation> View::takeAnimations()
{
    assertHere();
    return std::exchange(m_animations, {});
}

void View::setNeedsDisplay()
{
    ++m_revision;
    noteChange();
}

void View::noteChange()
{
    if (const auto itsWindow = window())
        itsWindow->noteChange();
}

void View::noteAnimation(AnimatedProperty property, base::Rect fromFrame, double fromAlpha)
{
    const base::Instant duration = currentAnimationDuration();
    if (duration <= base::Instant(0))
        return;
    const auto waiting = std::find_if(m_animations.begin(), m_animations.end(),
                                      [&](const PropertyAnimation& each) { return each.property == property; });
    // What is on screen is still where the waiting one starts from.
    if (waiting != m_animations.end())
        waiting->duration = duration;
    else
        m_animations.push_back({property, fromAlpha, fromFrame, duration});
}

} // namespace platform
