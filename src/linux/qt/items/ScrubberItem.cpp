#include "linux/qt/items/ScrubberItem.h"

#include "linux/qt/items/Bitmaps.h"

#include <QPainter>
#include <QPainterPath>

#include <algorithm>
#include <cmath>
#include <iterator>

namespace qtui {

namespace {

constexpr double kTrackCorner = 6;
/// Ticks of a zoomed strip: they grow with what they stand for.
constexpr double kTickWidth = 1;
constexpr double kSecondTick = 8;
constexpr double kTenthTick = 4;

const QColor kTrackGround(0x16, 0x16, 0x1A);
const QColor kFilmFrame(255, 255, 255, 24);
const QColor kTick(255, 255, 255, 210);
const QColor kTickShadow(0, 0, 0, 120);

/// The part of the picture that fills `target` without being squeezed.
QRectF coveringPart(const QSizeF& picture, const QSizeF& target)
{
    const double scale = std::max(target.width() / picture.width(), target.height() / picture.height());
    const QSizeF part = target / scale;
    return {(picture.width() - part.width()) / 2, (picture.height() - part.height()) / 2, part.width(), part.height()};
}

/// As long as there are no pictures: frames of a film with nothing on them.
void drawFilm(QPainter& painter, const QRectF& track)
{
    const double frameWidth = track.height() * 1.2;
    const auto count = static_cast<int>(std::ceil(track.width() / frameWidth));
    for (int i = 0; i < count; ++i) {
        const QRectF frame(track.left() + i * track.width() / count, track.top(), track.width() / count,
                           track.height());
        painter.fillRect(frame.adjusted(1, 5, -1, -5), kFilmFrame);
    }
}

/// The picture of that moment or, as long as it is on its way, the one nearest to it.
platform::ImageRef pictureAt(double timestamp, const std::map<double, platform::ImageRef>& pictures, bool orNearest)
{
    const auto found = pictures.find(timestamp);
    if (found != pictures.end())
        return found->second;
    if (!orNearest || pictures.empty())
        return nullptr;
    const auto after = pictures.lower_bound(timestamp);
    if (after == pictures.begin())
        return after->second;
    const auto before = std::prev(after);
    const bool isAfterNearer = after != pictures.end() && after->first - timestamp < timestamp - before->first;
    return isAfterNearer ? after->second : before->second;
}

} // namespace

std::vector<Sprite> ScrubberItem::draw(platform::View& view)
{
    assertHere();
    const auto& scrubber = dynamic_cast<const platform::MovieScrubber&>(view);
    const auto inset = [](const base::Rect& rect) {
        constexpr double kInset = platform::MovieScrubber::kTrackInset;
        return toQRectF(rect).adjusted(0, kInset, 0, -kInset);
    };
    TrackState state{inset(scrubber.stripRect()), inset(scrubber.trackRect()), scrubber.timestamps(),
                     scrubber.thumbnails(),       scrubber.isZoomed(),         scrubber.visibleStart(),
                     scrubber.visibleEnd(),       stage().generation};
    if (state != m_trackState) {
        m_track = drawTrack(state);
        m_trackState = std::move(state);
    }
    std::vector<Sprite> sprites = ViewItem::draw(view);
    sprites.push_back(m_track);
    return sprites;
}

Sprite ScrubberItem::drawTrack(const TrackState& state) const
{
    if (state.strip.isEmpty())
        return {};
    return paintedSprite(state.strip.adjusted(-1, -1, 1, 1), stage().scale, [&](QPainter& painter) {
        QPainterPath outline;
        outline.addRoundedRect(state.strip, kTrackCorner, kTrackCorner);
        painter.fillPath(outline, kTrackGround);
        painter.save();
        painter.setClipPath(outline);
        painter.setClipRect(state.track, Qt::IntersectClip);
        if (state.thumbnails.empty())
            drawFilm(painter, state.track);
        drawThumbnails(painter, state);
        if (state.zoomed)
            drawRuler(painter, state);
        painter.restore();
        // Keeps a dark movie's strip apart from a dark ground.
        painter.setPen(QPen(stage().theme.hairline, 1));
        painter.drawPath(outline);
    });
}

void ScrubberItem::drawThumbnails(QPainter& painter, const TrackState& state) const
{
    const auto count = static_cast<double>(state.timestamps.size());
    for (std::size_t i = 0; i < state.timestamps.size(); ++i) {
        const auto found = pictureAt(state.timestamps[i], state.thumbnails, state.zoomed);
        const QImage picture = found ? toQImage(found) : QImage();
        if (picture.isNull())
            continue;
        const double left = stage().snapped(state.track.width() * static_cast<double>(i) / count);
        const double right = stage().snapped(state.track.width() * static_cast<double>(i + 1) / count);
        const QRectF slot(state.track.left() + left, state.track.top(), right - left, state.track.height());
        painter.drawImage(slot, picture, coveringPart(picture.size(), slot.size()));
    }
}

void ScrubberItem::drawRuler(QPainter& painter, const TrackState& state) const
{
    const double seconds = state.visibleEnd - state.visibleStart;
    if (seconds <= 0)
        return;
    const auto first = static_cast<long long>(std::ceil(state.visibleStart * 10));
    const auto last = static_cast<long long>(std::floor(state.visibleEnd * 10));
    for (long long tenth = first; tenth <= last; ++tenth) {
        const double part = (static_cast<double>(tenth) / 10 - state.visibleStart) / seconds;
        const double x = stage().snapped(state.track.left() + part * state.track.width());
        const double height = tenth % 10 == 0 ? kSecondTick : kTenthTick;
        const QRectF tick(x, state.track.bottom() - height, kTickWidth, height);
        painter.fillRect(tick.adjusted(-kTickWidth, -kTickWidth, kTickWidth, 0), kTickShadow);
        painter.fillRect(tick, kTick);
    }
}

} // namespace qtui
