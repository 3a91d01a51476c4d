/// What lies behind a rectangle of the window, blurred on the CPU: works on every rendering backend. GUI thread.
#pragma once

#include "base/Affinity.h"
#include "linux/qt/items/Stage.h"

#include <QImage>

#include <vector>

namespace qtui {

/// Blurs again only when what lies behind has changed.
class Blur {
public:
    /// Whether `image()` would be another one now.
    bool isStale(const Stage& stage, const QRectF& windowRect, const QColor& tint) const;
    /// Blurs what was painted so far in this commit, and lays `tint` over it.
    void update(Stage& stage, const QRectF& windowRect, const QColor& tint);

    /// A few pixels, opaque: to be stretched smoothly over the rectangle.
    const QImage& image() const
    {
        m_affinity.assertHere();
        return m_image;
    }

private:
    struct Source {
        QRectF rect;
        QRgb color = 0;
        qint64 picture = 0;
        friend bool operator==(const Source&, const Source&) = default;
    };

    static std::vector<Source> sourcesBehind(const Stage& stage, const QRectF& windowRect);

    base::Affinity m_affinity;
    QImage m_image;
    QRectF m_rect;
    QColor m_tint;
    std::vector<Source> m_sources;
};

} // namespace qtui
