#include "linux/qt/items/ViewItem.h"

#include <QVariant>

#include <cmath>

namespace qtui {

double Stage::snapped(double points) const
{
    return std::round(points * scale) / scale;
}

QPointF PeerItem::place(const QRectF& frame, QPointF parentOrigin)
{
    m_origin = m_stage.snapped(parentOrigin + frame.topLeft());
    const QPointF end = m_stage.snapped(parentOrigin + frame.bottomRight());
    m_position = m_origin - parentOrigin;
    m_size = QSizeF(std::max(0.0, end.x() - m_origin.x()), std::max(0.0, end.y() - m_origin.y()));
    applyGeometry();
    return m_origin;
}

QRectF PeerItem::drawnRect() const
{
    QRectF rect = ownRect();
    for (const Sprite& sprite : sprites())
        rect = rect.united(sprite.rect);
    return rect.translated(m_origin);
}

void PeerItem::setShownAlpha(double alpha, bool hasChildren)
{
    setOpacity(alpha);
    setGrouped(hasChildren && alpha > 0 && alpha < 1);
}

void PeerItem::setGroupRect(const QRectF& rect)
{
    const QRectF wanted = m_grouped && rect != ownRect() ? rect : QRectF();
    if (wanted == m_groupRect)
        return;
    m_groupRect = wanted;
    applyGeometry();
    for (QQuickItem* child : childItems())
        if (auto* peer = dynamic_cast<PeerItem*>(child))
            peer->applyGeometry();
}

void PeerItem::setGrouped(bool grouped)
{
    if (m_grouped == grouped)
        return;
    m_grouped = grouped;
    // The layer has no public class, but it is a public property whose value is an object.
    if (auto* layer = property("layer").value<QObject*>()) {
        layer->setProperty("enabled", grouped);
        layer->setProperty("smooth", false);
    }
    if (!grouped)
        setGroupRect({});
}

QPointF PeerItem::shift() const
{
    // A layer keeps only what lies inside its item. So a group grows over all that belongs to it, and what it draws
    // and its children move by as much.
    return m_groupRect.isNull() ? QPointF() : -m_groupRect.topLeft();
}

void PeerItem::applyGeometry()
{
    const auto* above = dynamic_cast<const PeerItem*>(parentItem());
    setPosition(m_position - shift() + (above ? above->shift() : QPointF()));
    setSize(m_groupRect.isNull() ? m_size : m_groupRect.size());
    setSpriteOffset(shift());
}

void ViewItem::refresh(platform::View& view, bool visible)
{
    setClip(view.clipsToBounds());
    const bool asks = needsDrawing(view, visible);
    if (!asks && m_revision == view.revision() && m_generation == stage().generation && m_drawnSize == shownSize())
        return;
    m_revision = view.revision();
    m_generation = stage().generation;
    m_drawnSize = shownSize();
    ++stage().statistics.drawings;
    setSprites(draw(view));
}

std::vector<Sprite> ViewItem::draw(platform::View& view)
{
    return {{ownRect(), toQColor(view.backgroundColor()), {}, false}};
}

} // namespace qtui
