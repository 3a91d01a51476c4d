#include "platform/views/MovieScrubber.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

/// More pictures than this in one strip tell nothing more, whatever the movie's shape.
constexpr double kMostThumbnails = 200;
/// How far, in points, a handle is put beyond the zoomed strip at most: out of sight is enough.
constexpr double kOutOfSight = 60;
/// Over what is to be cut away.
constexpr Color kShade{0, 0, 0, 0.62};

} // namespace

MovieScrubber::MovieScrubber(const MessageCatalog& words) : Control({{0, 0}, {0, kHeight}}), m_words(words)
{
    setClipsToBounds(true);
}

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
    assertHere();
    if (m_edgeInset == points)
        return;
    m_edgeInset = points;
    setNeedsDisplay();
    setNeedsLayout();
}

void MovieScrubber::setEditable(bool editable)
{
    assertHere();
    if (m_editable == editable)
        return;
    m_editable = editable;
    setNeedsDisplay();
    setNeedsLayout();
}

void MovieScrubber::setValue(double seconds)
{
    assertHere();
    double value = std::isfinite(seconds) ? std::max(0.0, seconds) : 0;
    if (m_duration > 0)
        value = std::min(value, m_duration);
    if (value == m_value)
        return;
    m_value = value;
    placePlayHead();
}

void MovieScrubber::setEditing_animated(bool editing, bool animated)
{
    assertHere();
    if (m_editing == editing)
        return;
    m_editing = editing;
    if (!editing) {
        letGo();
        m_range = {0, m_duration};
    }
    if (animated)
        placePartsAnimated();
    else
        placeParts();
}

void MovieScrubber::reloadData()
{
    assertHere();
    const auto keepAlive = shared_from_this();
    // What is under the finger may be elsewhere afterwards.
    letGo();
    const auto source = dataSource();
    const double duration = source ? source->movieScrubberDuration(*this) : 0;
    const double aspectRatio = source ? source->movieScrubberThumbnailAspectRatio(*this) : 1;
    const double former = m_duration;
    m_duration = std::isfinite(duration) && duration > 0 ? duration : 0;
    m_aspectRatio = std::isfinite(aspectRatio) && aspectRatio > 0 ? aspectRatio : 1;
    if (!m_editing || former != m_duration)
        m_range = {0, m_duration};
    m_visible = {0, m_duration};
    if (m_duration > 0)
        setValue(m_value);
    else
        endDrag();
    requestThumbnails(true);
    placeParts();
    setNeedsDisplay();
}

// Pictures

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
        m_timestamps = source->movieScrubber_evenlySpacedTimestamps_startingAt_endingAt(*this, m_thumbnailCount,
                                                                                        m_visible.start, m_visible.end);
    std::erase_if(m_timestamps, [](double timestamp) { return !std::isfinite(timestamp); });
    if (!m_zoomed)
        m_overview = m_timestamps;
    const auto holds = [](const std::vector<double>& timestamps, double timestamp) {
        return std::find(timestamps.begin(), timestamps.end(), timestamp) != timestamps.end();
    };
    std::erase_if(m_thumbnails, [&](const auto& thumbnail) {
        return !holds(m_timestamps, thumbnail.first) && !holds(m_overview, thumbnail.first);
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
    assertHere();
    const auto isOn = [timestamp](const std::vector<double>& timestamps) {
        return std::find(timestamps.begin(), timestamps.end(), timestamp) != timestamps.end();
    };
    if (!image || (!isOn(m_timestamps) && !isOn(m_overview)))
        return;
    m_thumbnails[timestamp] = std::move(image);
    setNeedsDisplay();
}

// Places

base::Rect MovieScrubber::stripRect() const
{
    assertHere();
    const double width = std::max(0.0, bounds().width() - 2 * m_edgeInset);
    return base::Rect::make(m_edgeInset, 0, width, bounds().height());
}

base::Rect MovieScrubber::trackRect() const
{
    assertHere();
    const base::Rect strip = stripRect();
    const double grip = m_editable ? std::min(TrimFrameView::kGripWidth, strip.width() / 2) : 0;
    return base::Rect::make(strip.minX() + grip, 0, strip.width() - 2 * grip, strip.height());
}

double MovieScrubber::xOf(double seconds) const
{
    const base::Rect track = trackRect();
    const double shown = m_visible.end - m_visible.start;
    return track.minX() + (shown > 0 ? (seconds - m_visible.start) / shown * track.width() : 0);
}

double MovieScrubber::playHeadX() const
{
    assertHere();
    return xOf(std::min(m_value, m_duration));
}

double MovieScrubber::secondsAt(double x) const
{
    const base::Rect track = trackRect();
    if (track.isEmpty())
        return m_value;
    const double part = std::clamp((x - track.minX()) / track.width(), 0.0, 1.0);
    // Not start + part × length, which misses the end by a hair.
    return part < 1 ? m_visible.start + part * (m_visible.end - m_visible.start) : m_visible.end;
}

void MovieScrubber::layoutSubviews()
{
    assertHere();
    Control::layoutSubviews();
    makeParts();
    placeParts();
    if (thumbnailCount() != m_thumbnailCount)
        requestThumbnails(false);
}

void MovieScrubber::makeParts()
{
    if (m_playHead)
        return;
    m_shadeBefore = std::make_shared<View>();
    m_shadeAfter = std::make_shared<View>();
    for (const auto& shade : {m_shadeBefore, m_shadeAfter}) {
        shade->setBackgroundColor(kShade);
        shade->setAlpha(0);
    }
    m_frameView = std::make_shared<TrimFrameView>();
    m_startHandle = std::make_shared<TrimHandleView>(ScrubberHandle::Start);
    m_endHandle = std::make_shared<TrimHandleView>(ScrubberHandle::End);
    m_playHead = std::make_shared<PlayHeadView>();
    for (const std::shared_ptr<View>& part : std::initializer_list<std::shared_ptr<View>>{
             m_shadeBefore, m_shadeAfter, m_frameView, m_startHandle, m_endHandle, m_playHead})
        addSubview(part);
}

void MovieScrubber::placeParts()
{
    if (!m_playHead)
        return;
    const bool canTrim = m_editable && m_duration > 0 && !trackRect().isEmpty();
    for (const std::shared_ptr<View>& part :
         std::initializer_list<std::shared_ptr<View>>{m_frameView, m_startHandle, m_endHandle})
        part->setHidden(!canTrim);

    const base::Rect track = trackRect();
    const double height = track.height();
    const double grip = TrimFrameView::kGripWidth;
    const double start = std::max(xOf(m_range.start), track.minX() - kOutOfSight);
    const double end = std::min(xOf(m_range.end), track.maxX() + kOutOfSight);
    m_frameView->setFrame(base::Rect::make(start - grip, 0, end - start + 2 * grip, height));
    m_startHandle->setFrame(base::Rect::make(start - grip, 0, grip, height));
    m_endHandle->setFrame(base::Rect::make(end, 0, grip, height));
    const double pictures = std::max(0.0, height - 2 * kTrackInset);
    m_shadeBefore->setFrame(base::Rect::make(track.minX(), kTrackInset, std::max(0.0, start - track.minX()), pictures));
    m_shadeAfter->setFrame(base::Rect::make(end, kTrackInset, std::max(0.0, track.maxX() - end), pictures));
    m_shadeBefore->setAlpha(m_editing ? 1 : 0);
    m_shadeAfter->setAlpha(m_editing ? 1 : 0);
    m_frameView->setEditing(m_editing);
    m_frameView->setHeld(m_held);
    placePlayHead();
}

void MovieScrubber::placePlayHead()
{
    if (!m_playHead)
        return;
    const double x = playHeadX();
    const base::Rect track = trackRect();
    // While a handle is held the picture is the handle's, and so is the play head's place.
    const bool isElsewhere = m_held == ScrubberHandle::Start || m_held == ScrubberHandle::End;
    m_playHead->setHidden(m_duration <= 0 || isElsewhere || x < track.minX() || x > track.maxX());
    m_playHead->setHeld(m_held == ScrubberHandle::PlayHead);
    m_playHead->setFrame(base::Rect::make(x - PlayHeadView::kWidth / 2, 0, PlayHeadView::kWidth, bounds().height()));
}

void MovieScrubber::placePartsAnimated()
{
    if (const auto itsWindow = window())
        animate(itsWindow->mainQueue(), kFrameDuration, [this] { placeParts(); });
    else
        placeParts();
}

Accessibility MovieScrubber::accessibility() const
{
    assertHere();
    Accessibility description = Control::accessibility();
    description.role = AccessibilityRole::Slider;
    if (description.name.empty())
        description.name = m_words.text("SCRUBBER_POSITION");
    description.value = m_words.text("SCRUBBER_POSITION_VALUE", {{"position", m_words.duration(m_value, 0)},
                                                                 {"duration", m_words.duration(m_duration, 0)}});
    description.enabled = isEnabled() && m_duration > 0;
    description.maximum = m_duration;
    description.number = m_value;
    description.step = std::min(1.0, m_duration / 10); // short movies have ten steps too
    return description;
}

} // namespace platform
