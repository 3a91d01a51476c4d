/// What the items of one window share while they are drawn. GUI thread.
#pragma once

#include "base/Geometry.h"
#include "linux/qt/Icons.h"
#include "linux/qt/Theme.h"
#include "platform/files/MessageCatalog.h"

#include <QRectF>

#include <algorithm>
#include <cstdint>
#include <vector>

namespace qtui {

class VideoItem;

/// Something opaque that was drawn already, in window coordinates: what a backdrop blurs.
struct Painted {
    QRectF rect;
    QColor color;                     ///< where there is no video
    const VideoItem* video = nullptr; ///< alive until the end of the commit
};

/// What was done so far; for tests, and to see what a change costs.
struct Statistics {
    std::uint64_t commits = 0;  ///< times the tree was walked
    std::uint64_t drawings = 0; ///< items that were drawn anew
    std::uint64_t pictures = 0; ///< video pictures converted
    std::uint64_t blurs = 0;
};

struct Stage {
    explicit Stage(const platform::MessageCatalog& messages) : words(messages) {}

    const platform::MessageCatalog& words;
    Theme theme = Theme::forScheme(Scheme::Light);
    double scale = 1; ///< pixels per point
    bool liveBlur = true;
    /// Grows when every item has to be drawn anew.
    std::uint64_t generation = 1;
    Icons icons;
    Statistics statistics;
    std::vector<Painted> painted; ///< in the commit that is running, back to front

    /// What stands over the content: a tint that the blur shines through or, without a blur, one that hides all text.
    QColor material(QColor tint) const
    {
        constexpr int kOpaqueEnough = 247;
        if (!liveBlur)
            tint.setAlpha(std::max(tint.alpha(), kOpaqueEnough));
        return tint;
    }

    /// To whole pixels, so that what is drawn there is sharp.
    double snapped(double points) const;
    QPointF snapped(QPointF point) const { return {snapped(point.x()), snapped(point.y())}; }
};

inline QRectF toQRectF(const base::Rect& rect)
{
    return rect.isNull() ? QRectF() : QRectF(rect.minX(), rect.minY(), rect.width(), rect.height());
}

} // namespace qtui
