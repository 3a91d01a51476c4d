#include "linux/qt/items/ViewItem.h"

#include <QPainter>

#include <algorithm>
#include <cmath>
#include <utility>

namespace qtui {

double Stage::snapped(double points) const
{
    return std::round(points * scale) / scale;
}

QPointF PeerItem::place(const QRectF& frame, QPointF parentOrigin)
{
    assertHere();
    m_origin = m_stage.snapped(parentOrigin + frame.topLeft());
    const QPointF end = m_stage.snapped(parentOrigin + frame.bottomRight());
    m_size = QSizeF(std::max(0.0, end.x() - m_origin.x()), std::max(0.0, end.y() - m_origin.y()));
    setPosition(m_origin - parentOrigin);
    setSize(m_size);
    return m_origin;
}

QRectF PeerItem::drawnRect() const
{
    assertHere();
    QRectF rect = ownRect();
    for (const Sprite& sprite : sprites())
        rect = rect.united(sprite.rect);
    return rect.translated(m_origin);
}

void PeerItem::setShown(bool hidden, double alpha, bool standsInGroup)
{
    assertHere();
    m_hidden = hidden;
    m_alpha = alpha;
    setVisible(!hidden && !standsInGroup);
    setOpacity(alpha);
}

void PeerItem::showGroup(const QRectF& windowRect)
{
    assertHere();
    std::vector<Ingredient> ingredients{{windowRect, 0, 0, 1}};
    collect(ingredients);
    // Its own alpha is not part of the picture: a fade does not paint it anew.
    if (std::exchange(m_ingredients, ingredients) == ingredients)
        return;
    setStandIn(Sprite{windowRect.translated(-m_origin), {}, painted(windowRect), false});
}

void PeerItem::endGroup()
{
    assertHere();
    m_ingredients.clear();
    setStandIn(std::nullopt);
}

std::vector<PeerItem*> PeerItem::peersBelow() const
{
    std::vector<PeerItem*> peers;
    for (QQuickItem* child : childItems())
        if (auto* peer = dynamic_cast<PeerItem*>(child); peer && !peer->m_hidden && peer->m_alpha > 0)
            peers.push_back(peer);
    std::stable_sort(peers.begin(), peers.end(), [](const auto* a, const auto* b) { return a->z() < b->z(); });
    return peers;
}

void PeerItem::collect(std::vector<Ingredient>& ingredients) const
{
    for (const Sprite& sprite : sprites())
        ingredients.push_back({sprite.rect.translated(m_origin), sprite.color.rgba(), sprite.image.cacheKey(), 1});
    for (const PeerItem* peer : peersBelow()) {
        ingredients.push_back({peer->windowRect(), peer->clip(), 0, peer->m_alpha});
        peer->collect(ingredients);
    }
}

void PeerItem::paint(QPainter& painter, const QRectF& windowRect) const
{
    painter.save();
    if (clip())
        painter.setClipRect(PeerItem::windowRect(), Qt::IntersectClip);
    for (const Sprite& sprite : sprites()) {
        const QRectF rect = sprite.rect.translated(m_origin);
        painter.setRenderHint(QPainter::SmoothPixmapTransform, sprite.smooth);
        if (sprite.isPicture())
            painter.drawImage(rect, sprite.image);
        else
            painter.fillRect(rect, sprite.color);
    }
    for (const PeerItem* peer : peersBelow())
        peer->paintWithAlpha(painter, windowRect);
    painter.restore();
}

void PeerItem::paintWithAlpha(QPainter& painter, const QRectF& windowRect) const
{
    if (m_alpha >= 1) {
        paint(painter, windowRect);
        return;
    }
    painter.save();
    painter.setOpacity(painter.opacity() * m_alpha);
    painter.drawImage(windowRect, painted(windowRect));
    painter.restore();
}

QImage PeerItem::painted(const QRectF& windowRect) const
{
    return paintedSprite(windowRect, m_stage.scale,
                         [&](QPainter& painter) {
                             painter.setRenderHint(QPainter::Antialiasing, false);
                             paint(painter, windowRect);
                         })
        .image;
}

} // namespace qtui
