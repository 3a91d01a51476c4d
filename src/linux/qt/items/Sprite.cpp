#include "linux/qt/items/Sprite.h"

#include <QPainter>
#include <QQuickWindow>
#include <QSGImageNode>
#include <QSGRectangleNode>

#include <cmath>
#include <memory>

namespace qtui {

namespace {

/// The node of one sprite, and which picture its texture was made from. A transform node, though it moves nothing: the
/// software renderer draws what joins a plain node later as if it stood in the window's corner.
class SpriteNode final : public QSGTransformNode {
public:
    void show(const Sprite& sprite, QQuickWindow& window)
    {
        if (sprite.isPicture())
            showPicture(sprite, window);
        else
            showColor(sprite, window);
    }

private:
    void showPicture(const Sprite& sprite, QQuickWindow& window)
    {
        if (!m_picture) {
            clear();
            m_picture = window.createImageNode();
            m_picture->setOwnsTexture(true);
            m_picture->setFlag(QSGNode::OwnedByParent);
        }
        if (!m_picture->texture() || m_key != sprite.image.cacheKey()) {
            m_key = sprite.image.cacheKey();
            const bool opaque = !sprite.image.hasAlphaChannel();
            m_picture->setTexture(window.createTextureFromImage(
                sprite.image, opaque ? QQuickWindow::TextureIsOpaque : QQuickWindow::TextureHasAlphaChannel));
            m_picture->setSourceRect(QRectF(QPointF(), sprite.image.size()));
        }
        m_picture->setFiltering(sprite.smooth ? QSGTexture::Linear : QSGTexture::Nearest);
        if (m_picture->rect() != sprite.rect)
            m_picture->setRect(sprite.rect);
        // A node without a texture crashes the software backend, so it joins the tree only now.
        if (!m_picture->parent())
            appendChildNode(m_picture);
    }

    void showColor(const Sprite& sprite, QQuickWindow& window)
    {
        if (!m_rectangle) {
            clear();
            m_rectangle = window.createRectangleNode();
            m_rectangle->setFlag(QSGNode::OwnedByParent);
            appendChildNode(m_rectangle);
        }
        if (m_rectangle->rect() != sprite.rect)
            m_rectangle->setRect(sprite.rect);
        if (m_rectangle->color() != sprite.color)
            m_rectangle->setColor(sprite.color);
    }

    void clear()
    {
        // One by one: the software renderer never hears of what removeAllChildNodes() takes away.
        while (firstChild())
            removeChildNode(firstChild());
        delete m_picture;
        delete m_rectangle;
        m_picture = nullptr;
        m_rectangle = nullptr;
    }

    QSGImageNode* m_picture = nullptr;
    QSGRectangleNode* m_rectangle = nullptr;
    qint64 m_key = 0;
};

} // namespace

Sprite paintedSprite(const QRectF& area, double scale, const std::function<void(QPainter&)>& paint)
{
    // Grown outwards to whole pixels: a picture that is not stretched stays sharp.
    const double left = std::floor(area.left() * scale + 1e-6);
    const double top = std::floor(area.top() * scale + 1e-6);
    const double right = std::ceil(area.right() * scale - 1e-6);
    const double bottom = std::ceil(area.bottom() * scale - 1e-6);
    if (!(right > left) || !(bottom > top))
        return {};
    QImage image(static_cast<int>(right - left), static_cast<int>(bottom - top), QImage::Format_ARGB32_Premultiplied);
    image.fill(Qt::transparent);
    QPainter painter(&image);
    painter.setRenderHints(QPainter::Antialiasing | QPainter::TextAntialiasing | QPainter::SmoothPixmapTransform);
    painter.translate(-left, -top);
    painter.scale(scale, scale);
    paint(painter);
    painter.end();
    return {QRectF(left / scale, top / scale, (right - left) / scale, (bottom - top) / scale), {}, image, false};
}

SpriteItem::SpriteItem()
{
    setFlag(ItemHasContents);
}

void SpriteItem::setSprites(std::vector<Sprite> sprites)
{
    assertHere();
    std::erase_if(sprites, [](const Sprite& sprite) {
        return sprite.rect.isEmpty() || (!sprite.isPicture() && sprite.color.alpha() == 0);
    });
    m_sprites = std::move(sprites);
    update();
}

void SpriteItem::setStandIn(std::optional<Sprite> standIn)
{
    assertHere();
    if (!m_standIn && !standIn)
        return;
    m_standIn = std::move(standIn);
    update();
}

QSGNode* SpriteItem::updatePaintNode(QSGNode* node, UpdatePaintNodeData*)
{
    const std::vector<Sprite> shownSprites = m_standIn ? std::vector{*m_standIn} : m_sprites;
    if (shownSprites.empty()) {
        delete node;
        return nullptr;
    }
    if (!node)
        node = new QSGTransformNode; // like the sprites' nodes
    while (node->childCount() > static_cast<int>(shownSprites.size())) {
        QSGNode* last = node->lastChild();
        node->removeChildNode(last);
        delete last;
    }
    QSGNode* child = node->firstChild();
    for (const Sprite& sprite : shownSprites) {
        auto* shown = static_cast<SpriteNode*>(child);
        if (!shown) {
            shown = new SpriteNode;
            shown->setFlag(QSGNode::OwnedByParent);
            node->appendChildNode(shown);
        }
        shown->show(sprite, *window());
        child = shown->nextSibling();
    }
    return node;
}

} // namespace qtui
