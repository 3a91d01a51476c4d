/// What an item draws: filled rectangles and pictures, back to front. Works the same on every rendering backend.
#pragma once

#include "base/Affinity.h"

#include <QColor>
#include <QImage>
#include <QQuickItem>

#include <functional>
#include <optional>
#include <vector>

class QPainter;

namespace qtui {

/// One rectangle, in the item's coordinates: a picture stretched over it, or a colour where there is none.
struct Sprite {
    QRectF rect;
    QColor color;
    QImage image;
    bool smooth = false; ///< interpolated when stretched; sharp pixels otherwise

    bool isPicture() const { return !image.isNull(); }
};

/// A picture of `area` (item coordinates, points) at `scale` pixels per point, painted by `paint` in points.
Sprite paintedSprite(const QRectF& area, double scale, const std::function<void(QPainter&)>& paint);

/// An item that shows sprites. GUI thread, except where Qt Quick says otherwise.
class SpriteItem : public QQuickItem {
public:
    SpriteItem();

    const std::vector<Sprite>& sprites() const { return here(m_sprites); }
    /// Draws them with the next picture.
    void setSprites(std::vector<Sprite> sprites);
    /// Draws this instead of the sprites, until there is none again.
    void setStandIn(std::optional<Sprite> standIn);

protected:
    /// Runs on the render thread while the GUI thread stands still.
    QSGNode* updatePaintNode(QSGNode* node, UpdatePaintNodeData* data) override;

    /// First thing in each entry point.
    void assertHere(base::SourceLocation where = base::SourceLocation::current()) const
    {
        m_affinity.assertHere(where);
    }
    /// The same where all that is done is reading or setting `member`, which it gives.
    template <typename T> T& here(T& member, base::SourceLocation where = base::SourceLocation::current()) const
    {
        assertHere(where);
        return member;
    }

private:
    base::Affinity m_affinity;
    std::vector<Sprite> m_sprites;
    std::optional<Sprite> m_standIn;
};

} // namespace qtui
