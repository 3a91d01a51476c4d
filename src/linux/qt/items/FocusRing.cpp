#include "linux/qt/items/FocusRing.h"

#include <QPainter>

#include <limits>

namespace qtui {

FocusRing::FocusRing(Stage& stage) : PeerItem(stage)
{
    setZ(std::numeric_limits<float>::max());
}

void FocusRing::showAround(const QRectF& target, const QRectF& window)
{
    assertHere();
    constexpr double kContrast = 1;
    constexpr double kWidth = metrics::kFocusRing;
    constexpr double kAway = kWidth + kContrast;
    // Where there is no room outside, the ring lies inside.
    const QRectF ring = target.isEmpty() ? QRectF() : target.adjusted(-kAway, -kAway, kAway, kAway).intersected(window);
    if (ring == m_ring && m_generation == stage().generation)
        return;
    m_ring = ring;
    m_generation = stage().generation;
    place(ring, {});
    if (ring.isEmpty()) {
        setSprites({});
        return;
    }
    setSprites({paintedSprite(ownRect(), stage().scale, [&](QPainter& painter) {
        painter.setBrush(Qt::NoBrush);
        const auto stroke = [&](double width, double inset, const QColor& color) {
            painter.setPen(QPen(color, width));
            painter.drawRoundedRect(ownRect().adjusted(inset, inset, -inset, -inset), metrics::kCorner,
                                    metrics::kCorner);
        };
        stroke(kWidth + 2 * kContrast, kWidth / 2 + kContrast, stage().theme.focusContrast);
        stroke(kWidth, kWidth / 2 + kContrast, stage().theme.focusRing);
    })});
}

} // namespace qtui
