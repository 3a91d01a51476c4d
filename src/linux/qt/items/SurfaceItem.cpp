#include "linux/qt/items/SurfaceItem.h"

#include <QPainter>

#include <algorithm>

namespace qtui {

namespace {

using platform::SurfaceView;

constexpr int kShadowRings = 8;

} // namespace

std::vector<Sprite> SurfaceItem::draw(platform::View& view)
{
    assertHere();
    const auto& surface = dynamic_cast<const SurfaceView&>(view);
    const Theme& theme = stage().theme;
    switch (surface.style()) {
    case SurfaceView::Style::Sheet:
        return sheet();
    case SurfaceView::Style::Popover:
    case SurfaceView::Style::Alert:
        return floating(surface);
    case SurfaceView::Style::Grabber:
    case SurfaceView::Style::Scroller:
        return {rounded(theme.mark)};
    case SurfaceView::Style::Separator:
        return {{ownRect(), theme.hairline, {}, false}};
    case SurfaceView::Style::Track:
        return {rounded(theme.track)};
    case SurfaceView::Style::Fill:
        return {rounded(theme.accent)};
    case SurfaceView::Style::Dot:
        return {rounded(theme.text)};
    }
    return {};
}

Sprite SurfaceItem::rounded(const QColor& color) const
{
    const double radius = std::min(ownRect().width(), ownRect().height()) / 2;
    return paintedSprite(ownRect(), stage().scale, [&](QPainter& painter) {
        painter.setPen(Qt::NoPen);
        painter.setBrush(color);
        painter.drawRoundedRect(ownRect(), radius, radius);
    });
}

std::vector<Sprite> SurfaceItem::sheet() const
{
    constexpr double kCorner = SurfaceView::kCorner;
    // Only its top needs a picture. The rest goes on a little below the screen: it is never seen to end, not even while it
    // springs back.
    const QRectF top(0, 0, ownRect().width(), std::min(kCorner, ownRect().height()));
    const QRectF rest(0, top.height(), ownRect().width(), ownRect().height() - top.height() + kCorner);
    const double hairline = 1 / stage().scale;
    const Sprite corners = paintedSprite(top, stage().scale, [&](QPainter& painter) {
        painter.setPen(QPen(stage().theme.edge, hairline));
        painter.setBrush(stage().theme.surface);
        painter.drawRoundedRect(
            QRectF(0, 0, top.width(), 3 * kCorner).adjusted(hairline / 2, hairline / 2, -hairline / 2, 0), kCorner,
            kCorner);
    });
    return {corners, {rest, stage().theme.surface, {}, false}};
}

QPainterPath SurfaceItem::outline(const SurfaceView& surface) const
{
    QPainterPath path;
    path.addRoundedRect(ownRect(), SurfaceView::kCorner, SurfaceView::kCorner);
    const SurfaceView::Arrow arrow = surface.arrow();
    if (arrow.edge == SurfaceView::Arrow::Edge::None)
        return path;
    const bool up = arrow.edge == SurfaceView::Arrow::Edge::Top;
    const double foot = up ? ownRect().top() : ownRect().bottom();
    const double height = up ? -SurfaceView::kArrowHeight : SurfaceView::kArrowHeight;
    const double half = SurfaceView::kArrowWidth / 2;
    constexpr double kTip = 2; // not as sharp as a needle
    QPainterPath triangle;
    triangle.moveTo(arrow.position - half, foot - height * 0.1);
    triangle.lineTo(arrow.position - half, foot);
    triangle.lineTo(arrow.position - kTip, foot + height * 0.9);
    triangle.quadTo(arrow.position, foot + height * 1.05, arrow.position + kTip, foot + height * 0.9);
    triangle.lineTo(arrow.position + half, foot);
    triangle.lineTo(arrow.position + half, foot - height * 0.1);
    triangle.closeSubpath();
    return path.united(triangle);
}

std::vector<Sprite> SurfaceItem::floating(const SurfaceView& surface) const
{
    const double hairline = 1 / stage().scale;
    const double around = kShadowRings + SurfaceView::kArrowHeight;
    const QPainterPath path = outline(surface);
    return {paintedSprite(ownRect().adjusted(-around, -around, around, around), stage().scale, [&](QPainter& painter) {
        painter.setBrush(Qt::NoBrush);
        for (int ring = kShadowRings; ring > 0; --ring) {
            painter.setPen(QPen(stage().theme.shadow, 2 * ring, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
            painter.drawPath(path);
        }
        painter.setPen(QPen(stage().theme.edge, hairline));
        painter.fillPath(path, stage().theme.surface);
        painter.drawPath(path);
    })};
}

} // namespace qtui
