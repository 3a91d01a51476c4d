// What fingers, keys and assistive technology do to a scrubber: the play head, the two handles, and zooming.
#include "platform/views/MovieScrubber.h"
#include "platform/views/Window.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

bool isTrimHandle(ScrubberHandle handle)
{
    return handle == ScrubberHandle::Start || handle == ScrubberHandle::End;
}

ScrubberHandle otherOf(ScrubberHandle handle)
{
    return handle == ScrubberHandle::Start ? ScrubberHandle::End : ScrubberHandle::Start;
}

/// How far `x` is from the stretch; 0 on it.
double distance(double x, double from, double to)
{
    return std::max({0.0, from - x, x - to});
}

} // namespace

void MovieScrubber::touchBegan(const Touch& touch)
{
    assertHere();
    if (!isEnabled() || m_duration <= 0 || m_held != ScrubberHandle::None)
        return;
    const auto keepAlive = shared_from_this();
    const double x = convertFromRoot(touch.position).x;
    const ScrubberHandle handle = handleAt(x);
    m_draggingTouch = touch.id;
    if (isTrimHandle(handle)) {
        holdHandle(handle, x);
        return;
    }
    // A thumb that takes the play head moves it from where it is; elsewhere the play head comes to the finger.
    m_grabOffset = handle == ScrubberHandle::PlayHead ? playHeadX() - x : 0;
    beginDrag();
    touchMoved(touch);
}

ScrubberHandle MovieScrubber::handleAt(double x) const
{
    ScrubberHandle nearest = ScrubberHandle::None;
    double least = std::abs(x - playHeadX());
    if (least <= kGrabDistance)
        nearest = ScrubberHandle::PlayHead;
    if (!m_editable)
        return nearest;
    const auto consider = [&](ScrubberHandle handle, double from) {
        const double away = distance(x, from, from + TrimFrameView::kGripWidth);
        if (away > kGripReach || (nearest != ScrubberHandle::None && away >= least))
            return;
        nearest = handle;
        least = away;
    };
    consider(ScrubberHandle::Start, xOf(m_range.start) - TrimFrameView::kGripWidth);
    consider(ScrubberHandle::End, xOf(m_range.end));
    return nearest;
}

void MovieScrubber::touchMoved(const Touch& touch)
{
    assertHere();
    if (m_draggingTouch != touch.id)
        return;
    const double x = convertFromRoot(touch.position).x;
    if (!isTrimHandle(m_held)) {
        dragTo(secondsAt(x + m_grabOffset));
        return;
    }
    const auto keepAlive = shared_from_this();
    if (std::abs(x - m_stillX) > kStillness)
        waitForStillness(x);
    setEdge(m_held, secondsAt(x + m_grabOffset));
}

void MovieScrubber::touchEnded(const Touch& touch)
{
    assertHere();
    if (m_draggingTouch != touch.id)
        return;
    const auto keepAlive = shared_from_this();
    if (isTrimHandle(m_held)) {
        // A finger that lifts rolls a little: what it has placed stays.
        if (std::abs(convertFromRoot(touch.position).x - m_stillX) > kStillness)
            touchMoved(touch);
        letGo();
        return;
    }
    touchMoved(touch);
    endDrag();
}

void MovieScrubber::touchCancelled(const Touch& touch)
{
    assertHere();
    if (m_draggingTouch != touch.id)
        return;
    if (isTrimHandle(m_held))
        letGo();
    else
        endDrag();
}

// The play head

void MovieScrubber::scrubTo(double seconds)
{
    assertHere();
    if (!isEnabled() || m_duration <= 0 || !std::isfinite(seconds) || isTrimHandle(m_held))
        return;
    const auto keepAlive = shared_from_this();
    const bool isHeld = m_held == ScrubberHandle::PlayHead;
    if (!isHeld)
        beginDrag();
    dragTo(seconds);
    if (!isHeld)
        endDrag();
}

void MovieScrubber::beginDrag()
{
    m_held = ScrubberHandle::PlayHead;
    setHighlighted(true);
    placePlayHead();
    if (const auto told = delegate())
        told->movieScrubberDidBeginScrubbing_withHandle(*this, static_cast<int>(ScrubberHandle::PlayHead));
}

void MovieScrubber::dragTo(double seconds)
{
    const auto keepAlive = shared_from_this();
    const double previous = m_value;
    if (m_held != ScrubberHandle::PlayHead || m_duration <= 0)
        return;
    setValue(seconds);
    if (m_value == previous)
        return;
    if (const auto told = delegate())
        told->movieScrubber_valueDidChange(*this, m_value);
    sendActionsFor(kValueChanged);
}

void MovieScrubber::endDrag()
{
    if (m_held != ScrubberHandle::PlayHead)
        return;
    const auto keepAlive = shared_from_this();
    m_held = ScrubberHandle::None;
    m_draggingTouch.reset();
    setHighlighted(false);
    placePlayHead();
    if (const auto told = delegate())
        told->movieScrubberDidEndScrubbing_withHandle(*this, static_cast<int>(ScrubberHandle::PlayHead));
}

// The trim handles

void MovieScrubber::holdHandle(ScrubberHandle handle, double x)
{
    m_held = handle;
    m_grabOffset = xOf(handle == ScrubberHandle::Start ? m_range.start : m_range.end) - x;
    setHighlighted(true);
    placeParts();
    waitForStillness(x);
    beginEditingWith(handle);
}

void MovieScrubber::letGo()
{
    if (!isTrimHandle(m_held))
        return;
    m_held = ScrubberHandle::None;
    m_draggingTouch.reset();
    ++m_stillness;
    setHighlighted(false);
    endZoom();
    placeParts();
}

bool MovieScrubber::beginEditingWith(ScrubberHandle handle)
{
    if (m_editing)
        return true;
    setEditing_animated(true, false);
    if (const auto told = delegate())
        told->movieScrubberDidBeginEditing(*this);
    // The other end first: the picture that is shown at last is that of the handle in question.
    for (const ScrubberHandle each : {otherOf(handle), handle})
        if (m_editing)
            tellEdge(each);
    return m_editing;
}

void MovieScrubber::moveHandle(ScrubberHandle handle, double seconds)
{
    assertHere();
    const bool isOtherHeld = m_held != ScrubberHandle::None && m_held != handle;
    if (!isEnabled() || !m_editable || m_duration <= 0 || !std::isfinite(seconds) || isOtherHeld)
        return;
    const auto keepAlive = shared_from_this();
    if (beginEditingWith(handle))
        setEdge(handle, seconds);
}

void MovieScrubber::setEdge(ScrubberHandle handle, double seconds)
{
    const double least = leastRange();
    Span range = m_range;
    if (handle == ScrubberHandle::Start)
        range.start = std::clamp(seconds, 0.0, std::max(0.0, range.end - least));
    else
        range.end = std::clamp(seconds, std::min(m_duration, range.start + least), m_duration);
    if (!m_editing || range == m_range)
        return;
    m_range = range;
    placeParts();
    tellEdge(handle);
}

void MovieScrubber::tellEdge(ScrubberHandle handle)
{
    const auto told = delegate();
    if (!told)
        return;
    if (handle == ScrubberHandle::Start)
        told->movieScrubber_editingStartValueDidChange(*this, m_range.start);
    else
        told->movieScrubber_editingEndValueDidChange(*this, m_range.end);
}

// Zooming

void MovieScrubber::waitForStillness(double x)
{
    m_stillX = x;
    const unsigned mine = ++m_stillness;
    const auto itsWindow = window();
    if (m_zoomed || m_zoomDelay <= 0 || !itsWindow)
        return;
    itsWindow->mainQueue().postAfter(
        std::chrono::duration_cast<base::Instant>(std::chrono::duration<double>(m_zoomDelay)),
        [weak = weakSelf<MovieScrubber>(), mine] {
            const auto self = weak.lock();
            if (self && self->m_stillness == mine && isTrimHandle(self->m_held))
                self->zoomAround(self->m_held);
        });
}

void MovieScrubber::zoomAround(ScrubberHandle handle)
{
    const double span = std::min(kZoomedSeconds, m_duration * kZoomedPart);
    const double moment = handle == ScrubberHandle::Start ? m_range.start : m_range.end;
    if (m_zoomed || m_duration <= 0 || trackRect().isEmpty())
        return;
    const auto keepAlive = shared_from_this();
    // The handle stays under the finger; so what is shown stays inside the movie.
    const double part = moment / m_duration;
    m_visible = {moment - part * span, moment + (1 - part) * span};
    m_zoomed = true;
    placePartsAnimated();
    requestThumbnails(false);
}

void MovieScrubber::endZoom()
{
    if (!m_zoomed)
        return;
    const auto keepAlive = shared_from_this();
    m_zoomed = false;
    m_visible = {0, m_duration};
    placePartsAnimated();
    requestThumbnails(false);
}

} // namespace platform
