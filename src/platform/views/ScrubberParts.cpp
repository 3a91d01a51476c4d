#include "platform/views/ScrubberParts.h"

#include "platform/views/MovieScrubber.h"

#include <algorithm>
#include <cstdio>

namespace platform {

namespace {

constexpr double kLargestStep = 1;    // seconds, of a long movie's handle
constexpr double kSmallestStep = 0.1; // seconds, of a short one's
constexpr double kStepsInAMovie = 100;
constexpr int kDecimals = 2; // of the seconds where a handle stands

/// To a hundredth, cut off: what is not reached yet is not shown.

} // namespace

const runtime::Class& PlayHeadView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<PlayHeadView>("PlayHeadView", &View::classObject()).build();
    return instance;
}

const runtime::Class& PlayHeadView::isa() const
{
    return classObject();
}

void PlayHeadView::setHeld(bool held)
{
    assertHere();
    if (m_held == held)
        return;
    m_held = held;
    setNeedsDisplay();
}

const runtime::Class& TrimFrameView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<TrimFrameView>("TrimFrameView", &View::classObject()).build();
    return instance;
}

const runtime::Class& TrimFrameView::isa() const
{
    return classObject();
}

void TrimFrameView::setEditing(bool editing)
{
    assertHere();
    if (m_editing == editing)
        return;
    m_editing = editing;
    setNeedsDisplay();
}

void TrimFrameView::setHeld(ScrubberHandle held)
{
    assertHere();
    if (m_held == held)
        return;
    m_held = held;
    setNeedsDisplay();
}

const runtime::Class& TrimHandleView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<TrimHandleView>("TrimHandleView", &View::classObject()).build();
    return instance;
}

const runtime::Class& TrimHandleView::isa() const
{
    return classObject();
}

std::shared_ptr<MovieScrubber> TrimHandleView::scrubber() const
{
    return std::dynamic_pointer_cast<MovieScrubber>(superview());
}

bool TrimHandleView::canBecomeFocused() const
{
    assertHere();
    const auto whole = scrubber();
    return whole && whole->isEnabled();
}

Accessibility TrimHandleView::accessibility() const
{
    assertHere();
    Accessibility description = View::accessibility();
    const auto whole = scrubber();
    if (!whole)
        return description;
    const bool isStart = m_handle == ScrubberHandle::Start;
    const double least = whole->leastRange();
    description.role = AccessibilityRole::Slider;
    description.name = whole->words().text(isStart ? "SCRUBBER_TRIM_START" : "SCRUBBER_TRIM_END");
    description.enabled = whole->isEnabled();
    description.minimum = isStart ? 0 : whole->editingStartValue() + least;
    description.maximum = isStart ? whole->editingEndValue() - least : whole->duration();
    description.number = isStart ? whole->editingStartValue() : whole->editingEndValue();
    description.step = std::clamp(whole->duration() / kStepsInAMovie, kSmallestStep, kLargestStep);
    description.value = whole->words().duration(description.number, kDecimals);
    return description;
}

bool TrimHandleView::adjust(int steps)
{
    assertHere();
    const Accessibility now = accessibility();
    setNumber(now.number + steps * now.step);
    return true;
}

void TrimHandleView::setNumber(double seconds)
{
    assertHere();
    if (const auto whole = scrubber())
        whole->moveHandle(m_handle, seconds);
}

} // namespace platform
