#include "platform/views/MovieScrubber.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace platform {

namespace {

/// More pictures than this in one strip tell nothing more, whatever the movie's shape.
constexpr double kMostThumbnails = 200;

std::string clockText(double seconds)
{
    const auto whole = static_cast<long long>(seconds);
    char text[48];
    if (whole >= 3600)
        std::snprintf(text, sizeof text, "%lld:%02lld:%02lld", whole / 3600, whole / 60 % 60, whole % 60);
    else
        std::snprintf(text, sizeof text, "%lld:%02lld", whole / 60, whole % 60);
    return text;
}

} // namespace

MovieScrubber::MovieScrubber() : Control({{0, 0}, {0, kHeight}}) {}

const runtime::Class& MovieScrubber::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<MovieScrubber>("MovieScrubber", &Control::classObject()).build();
    return instance;
}

const runtime::Class& MovieScrubber::isa() const
{
    return classObject();
}

void MovieScrubber::setEdgeInset(double points)
{
    if (m_edgeInset == points)
        return;
    m_edgeInset = points;
    setNeedsDisplay();
    setNeedsLayout();
}

void MovieScrubber::setValue(double seconds)
{
    double value = std::isfinite(seconds) ? std::max(0.0, seconds) : 0;
    if (m_duration > 0)
        value = std::min(value, m_duration);
    if (value == m_value)
        return;
    m_value = value;
    setNeedsDisplay();
}

void MovieScrubber::setEditing_animated(bool editing, bool /*animated*/)
{
    if (m_editing == editing)
        return;
    m_editing = editing;
    setNeedsDisplay();
}

void MovieScrubber::reloadData()
{
    const auto keepAlive = shared_from_this();
    const auto source = dataSource();
    const double duration = source ? source->movieScrubberDuration(*this) : 0;
    const double aspectRatio = source ? source->movieScrubberThumbnailAspectRatio(*this) : 1;
    m_duration = std::isfinite(duration) && duration > 0 ? duration : 0;
    m_aspectRatio = std::isfinite(aspectRatio) && aspectRatio > 0 ? aspectRatio : 1;
    if (m_duration > 0)
        setValue(m_value);
    else
        endDrag();
    requestThumbnails(true);
    setNeedsDisplay();
}

void MovieScrubber::layoutSubviews()
{
    Control::layoutSubviews();
    if (thumbnailCount() != m_thumbnailCount)
        requestThumbnails(false);
}

std::int32_t MovieScrubber::thumbnailCount() const
{
    const base::Rect track = trackRect();
    if (track.isEmpty() || m_duration <= 0)
        return 0;
    return static_cast<std::int32_t>(
        std::min(kMostThumbnails, std::ceil(track.width() / (track.height() * m_aspectRatio))));
}

void MovieScrubber::requestThumbnails(bool all)
{
    const auto source = dataSource();
    m_thumbnailCount = source ? thumbnailCount() : 0;
    m_timestamps.clear();
    if (m_thumbnailCount > 0)
        m_timestamps =
            source->movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(*this, m_thumbnailCount, 0, m_duration);
    std::erase_if(m_timestamps, [](double timestamp) { return !std::isfinite(timestamp); });
    std::erase_if(m_thumbnails, [this](const auto& thumbnail) {
        return std::find(m_timestamps.begin(), m_timestamps.end(), thumbnail.first) == m_timestamps.end();
    });
    setNeedsDisplay();
    // Copies: a source that has a picture at hand answers before the request returns.
    const auto timestamps = m_timestamps;
    const auto alreadyHere = m_thumbnails;
    for (const double timestamp : timestamps)
        if (all || alreadyHere.count(timestamp) == 0)
            source->movieScrubber_requestThumbnailImageForTimestamp(*this, timestamp);
}

void MovieScrubber::setThumbnailImage_forTimestamp(ImageRef image, double timestamp)
{
    if (!image || std::find(m_timestamps.begin(), m_timestamps.end(), timestamp) == m_timestamps.end())
        return;
    m_thumbnails[timestamp] = std::move(image);
    setNeedsDisplay();
}

base::Rect MovieScrubber::trackRect() const
{
    const double width = std::max(0.0, bounds().width() - 2 * m_edgeInset);
    return base::Rect::make(m_edgeInset, 0, width, bounds().height());
}

double MovieScrubber::playHeadX() const
{
    const base::Rect track = trackRect();
    return track.minX() + (m_duration > 0 ? std::min(1.0, m_value / m_duration) * track.width() : 0);
}

double MovieScrubber::secondsAt(double x) const
{
    const base::Rect track = trackRect();
    if (track.isEmpty())
        return m_value;
    return std::clamp((x - track.minX()) / track.width(), 0.0, 1.0) * m_duration;
}

Accessibility MovieScrubber::accessibility() const
{
    Accessibility description = Control::accessibility();
    description.role = AccessibilityRole::Slider;
    if (description.name.empty())
        description.name = "Position";
    description.value = clockText(m_value) + " of " + clockText(m_duration);
    description.enabled = isEnabled() && m_duration > 0;
    description.maximum = m_duration;
    description.number = m_value;
    description.step = std::min(1.0, m_duration / 10); // short movies have ten steps too
    return description;
}

void MovieScrubber::touchBegan(const Touch& touch)
{
    if (!isEnabled() || m_duration <= 0 || m_dragging)
        return;
    const auto keepAlive = shared_from_this();
    m_draggingTouch = touch.id;
    // A thumb that takes the play head moves it from where it is; elsewhere the play head comes to the finger.
    const double away = playHeadX() - convertFromRoot(touch.position).x;
    m_grabOffset = std::abs(away) <= kGrabDistance ? away : 0;
    beginDrag();
    touchMoved(touch);
}

void MovieScrubber::touchMoved(const Touch& touch)
{
    if (m_draggingTouch == touch.id)
        dragTo(secondsAt(convertFromRoot(touch.position).x + m_grabOffset));
}

void MovieScrubber::touchEnded(const Touch& touch)
{
    if (m_draggingTouch != touch.id)
        return;
    const auto keepAlive = shared_from_this();
    touchMoved(touch);
    endDrag();
}

void MovieScrubber::touchCancelled(const Touch& touch)
{
    if (m_draggingTouch == touch.id)
        endDrag();
}

void MovieScrubber::scrubTo(double seconds)
{
    if (!isEnabled() || m_duration <= 0 || !std::isfinite(seconds))
        return;
    const auto keepAlive = shared_from_this();
    const bool isHeld = m_dragging;
    if (!isHeld)
        beginDrag();
    dragTo(seconds);
    if (!isHeld)
        endDrag();
}

void MovieScrubber::beginDrag()
{
    m_dragging = true;
    setHighlighted(true);
    if (const auto told = delegate())
        told->movieScrubberDidBeginScrubbing_withHandle(*this, static_cast<int>(ScrubberHandle::PlayHead));
}

void MovieScrubber::dragTo(double seconds)
{
    const auto keepAlive = shared_from_this();
    const double previous = m_value;
    if (!m_dragging || m_duration <= 0)
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
    if (!m_dragging)
        return;
    const auto keepAlive = shared_from_this();
    m_dragging = false;
    m_draggingTouch.reset();
    setHighlighted(false);
    if (const auto told = delegate())
        told->movieScrubberDidEndScrubbing_withHandle(*this, static_cast<int>(ScrubberHandle::PlayHead));
}

} // namespace platform
