// Where a view's subviews go when its size changes: autoresizing masks, constraints, layout passes.
#include "platform/views/View.h"

#include "platform/views/LayoutEngine.h"
#include "platform/views/ViewController.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

/// A layout that never settles is cut short after so many passes; it goes on with the next picture.
constexpr int kMaxPasses = 4;

struct Span {
    double origin;
    double size;
};

/// One direction of autoresizing: who is flexible shares the change of `oldTotal` to `newTotal`.
Span resized(Span span, double oldTotal, double newTotal, bool flexibleBefore, bool flexibleSize, bool flexibleAfter)
{
    const int flexible = int(flexibleBefore) + int(flexibleSize) + int(flexibleAfter);
    const double change = newTotal - oldTotal;
    if (flexible == 0 || change == 0)
        return span;
    const double after = oldTotal - span.origin - span.size;
    const double shared =
        (flexibleBefore ? span.origin : 0) + (flexibleSize ? span.size : 0) + (flexibleAfter ? after : 0);
    const auto share = [&](double part) {
        return std::abs(shared) < 1e-9 ? change / flexible : change * part / shared;
    };
    return {flexibleBefore ? withoutNoise(span.origin + share(span.origin)) : span.origin,
            flexibleSize ? withoutNoise(span.size + share(span.size)) : span.size};
}

} // namespace

void View::setFrame(base::Rect frame)
{
    assertHere();
    if (frame == m_frame)
        return;
    const base::Rect old = m_frame;
    noteAnimation(AnimatedProperty::Frame, old, m_alpha);
    m_frame = frame;
    setNeedsDisplay();
    const bool resizes = old.size != frame.size;
    if (resizes) {
        setNeedsLayout();
        resizeSubviews(old.size);
    }
    const auto direct = superview();
    if (resizes && direct && !direct->m_layingOut)
        direct->setNeedsLayout();
    for (auto above = direct; above; above = above->superview())
        above->markConstraintsReferringTo(*this);
}

void View::resizeSubviews(base::Size oldSize)
{
    for (const auto& view : subviews())
        if (view->m_translatesAutoresizing)
            view->setFrame(view->autoresizedFrame(oldSize, m_frame.size));
}

base::Rect View::autoresizedFrame(base::Size oldParent, base::Size newParent) const
{
    const auto has = [this](Autoresizing flag) { return (m_autoresizingMask & flag) != 0; };
    const Span across = resized({m_frame.minX(), m_frame.width()}, oldParent.width, newParent.width,
                                has(kFlexibleLeftMargin), has(kFlexibleWidth), has(kFlexibleRightMargin));
    const Span down = resized({m_frame.minY(), m_frame.height()}, oldParent.height, newParent.height,
                              has(kFlexibleTopMargin), has(kFlexibleHeight), has(kFlexibleBottomMargin));
    return base::Rect::make(across.origin, down.origin, across.size, down.size);
}

void View::setTranslatesAutoresizingMaskIntoConstraints(bool translates)
{
    assertHere();
    if (m_translatesAutoresizing == translates)
        return;
    m_translatesAutoresizing = translates;
    for (auto above = superview(); above; above = above->superview())
        above->markConstraintsReferringTo(*this);
}

void View::addConstraint(const LayoutConstraint& constraint)
{
    assertHere();
    std::erase_if(m_constraints, [&](const LayoutConstraint& kept) { return kept.isDead() || kept == constraint; });
    m_constraints.push_back(constraint);
    setNeedsLayout();
}

void View::dropConstraintsReferringTo(const View& view)
{
    const auto isBelow = [&](const std::weak_ptr<View>& weak) {
        const auto each = weak.lock();
        return each && each->isDescendantOf(view);
    };
    const auto dropped = std::erase_if(m_constraints, [&](const LayoutConstraint& constraint) {
        return constraint.isDead() || isBelow(constraint.first) || isBelow(constraint.second);
    });
    if (dropped > 0)
        setNeedsLayout();
}

void View::markConstraintsReferringTo(const View& view)
{
    const bool concerned = std::any_of(m_constraints.begin(), m_constraints.end(),
                                       [&](const LayoutConstraint& each) { return each.refersTo(view); });
    if (concerned && !m_layingOut)
        setNeedsLayout();
}

void View::setNeedsLayout()
{
    assertHere();
    m_needsLayout = true;
    noteChange();
}

void View::layoutIfNeeded()
{
    assertHere();
    const auto keepAlive = shared_from_this();
    for (int pass = 0; pass < kMaxPasses; ++pass) {
        if (m_needsLayout) {
            m_needsLayout = false;
            m_layingOut = true;
            layoutSubviews();
            m_layingOut = false;
            if (const auto controller = viewController())
                controller->viewDidLayoutSubviews();
        }
        for (const auto& view : subviews())
            view->layoutIfNeeded();
        if (!m_needsLayout)
            return;
    }
}

void View::layoutSubviews()
{
    assertHere();
    std::erase_if(m_constraints, [](const LayoutConstraint& constraint) { return constraint.isDead(); });
    if (!m_constraints.empty())
        solveConstraints(*this, m_constraints);
}

} // namespace platform
