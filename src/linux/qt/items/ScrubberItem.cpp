#include "linux/qt/items/ScrubberItem.h"

#include "linux/qt/items/Bitmaps.h"

#include <QPainter>
#include <QPainterPath>

#include <algorithm>
#include <cmath>

namespace qtui {

namespace {

constexpr double kTrackInset = 4; ///< above and below the strip, so that the play head stands out of it
constexpr double kTrackCorner = 6;
constexpr double kHeadWidth = 4;
constexpr double kHeadOutline = 1;
constexpr double kKnobRadius = 8;
constexpr double kKnobRadiusHeld = 10;

const QColor kTrackGround(0x16, 0x16, 0x1A);
const QColor kFilmFrame(255, 255, 255, 24);
const QColor kOutline(0, 0, 0, 190);

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

} // namespace

std::vector<Sprite> ScrubberItem::draw(platform::View& view)
{
    const auto& scrubber = dynamic_cast<const platform::MovieScrubber&>(view);
    const QRectF track = toQRectF(scrubber.trackRect()).adjusted(0, kTrackInset, 0, -kTrackInset);
    TrackState state{track, scrubber.timestamps(), scrubber.thumbnails(), scrubber.duration() > 0, stage().generation};
    if (state != m_trackState) {
        m_track = drawTrack(state);
        m_trackState = std::move(state);
    }
    std::vector<Sprite> sprites = ViewItem::draw(view);
    sprites.push_back(m_track);
    if (m_trackState.loaded)
        sprites.push_back(drawPlayHead(scrubber.playHeadX(), scrubber.isHighlighted()));
    return sprites;
}

Sprite ScrubberItem::drawTrack(const TrackState& state) const
{
    if (state.rect.isEmpty())
        return {};
    return paintedSprite(state.rect.adjusted(-1, -1, 1, 1), stage().scale, [&](QPainter& painter) {
        QPainterPath outline;
        outline.addRoundedRect(state.rect, kTrackCorner, kTrackCorner);
        painter.fillPath(outline, kTrackGround);
        painter.save();
        painter.setClipPath(outline);
        if (state.thumbnails.empty())
            drawFilm(painter, state.rect);
        const auto count = static_cast<double>(state.timestamps.size());
        for (std::size_t i = 0; i < state.timestamps.size(); ++i) {
            const auto found = state.thumbnails.find(state.timestamps[i]);
            if (found == state.thumbnails.end())
                continue;
            const QImage picture = toQImage(found->second);
            const double left = stage().snapped(state.rect.width() * static_cast<double>(i) / count);
            const double right = stage().snapped(state.rect.width() * static_cast<double>(i + 1) / count);
            const QRectF slot(state.rect.left() + left, state.rect.top(), right - left, state.rect.height());
            if (!picture.isNull())
                painter.drawImage(slot, picture, coveringPart(picture.size(), slot.size()));
        }
        painter.restore();
        // Keeps a dark movie's strip apart from a dark ground.
        painter.setPen(QPen(stage().theme.hairline, 1));
        painter.drawPath(outline);
    });
}

Sprite ScrubberItem::drawPlayHead(double x, bool held) const
{
    const double radius = held ? kKnobRadiusHeld : kKnobRadius;
    const QPointF center(stage().snapped(x), ownRect().center().y());
    const QRectF area = QRectF(center.x() - radius - 2, 0, 2 * radius + 4, ownRect().height());
    return paintedSprite(area, stage().scale, [&](QPainter& painter) {
        const QRectF bar(center.x() - kHeadWidth / 2, kHeadOutline, kHeadWidth, ownRect().height() - 2 * kHeadOutline);
        QPainterPath shape;
        shape.setFillRule(Qt::WindingFill);
        shape.addRoundedRect(bar, kHeadWidth / 2, kHeadWidth / 2);
        shape.addEllipse(center, radius, radius);
        const QPainterPath whole = shape.simplified();
        painter.strokePath(whole, QPen(kOutline, 2 * kHeadOutline));
        painter.fillPath(whole, Qt::white);
        painter.setPen(Qt::NoPen);
        painter.setBrush(Theme::forScheme(Scheme::Light).accent); // stands on white in both schemes
        painter.drawEllipse(center, radius - 4.5, radius - 4.5);
    });
}

} // namespace qtui
