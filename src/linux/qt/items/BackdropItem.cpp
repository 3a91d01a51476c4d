#include "linux/qt/items/BackdropItem.h"

#include "linux/qt/items/Bitmaps.h"
#include "platform/views/Button.h"
#include "platform/views/ImageView.h"

#include <QPainter>

#include <algorithm>

namespace qtui {

namespace {

/// Over the blur where a glyph is opaque. The glyph view's own faint picture comes on top.
const QColor kGlyphShade(0, 0, 0, 176);

/// Around a cut-out shape, so that a light disc shows on a white page, too.
const QColor kRim(0, 0, 0, 56);
constexpr double kRimWidth = 1; // points

platform::ImageRef maskImage(const platform::View& view)
{
    if (const auto* picture = dynamic_cast<const platform::ImageView*>(&view))
        return picture->image();
    if (const auto* button = dynamic_cast<const platform::Button*>(&view))
        return button->currentImage();
    return nullptr;
}

base::Rect united(const base::Rect& a, const base::Rect& b)
{
    if (a.isEmpty())
        return b;
    const double left = std::min(a.minX(), b.minX());
    const double top = std::min(a.minY(), b.minY());
    return base::Rect::make(left, top, std::max(a.maxX(), b.maxX()) - left, std::max(a.maxY(), b.maxY()) - top);
}

} // namespace

base::Rect BackdropItem::modelFrame(const platform::View& view) const
{
    assertHere();
    base::Rect frame = view.frame();
    if (!frame.isEmpty())
        return frame;
    for (const auto& mask : dynamic_cast<const platform::BackdropView&>(view).maskViews())
        frame = united(frame, mask->frame());
    return frame;
}

std::vector<BackdropItem::Mask> BackdropItem::masksOf(const platform::BackdropView& backdrop) const
{
    const base::Point origin = modelFrame(backdrop).origin;
    std::vector<Mask> masks;
    for (const auto& view : backdrop.maskViews()) {
        const base::Rect frame = view->frame();
        masks.push_back(
            {base::Rect::make(frame.minX() - origin.x, frame.minY() - origin.y, frame.width(), frame.height()),
             maskImage(*view), view->backdropMaskFlags()});
    }
    return masks;
}

QColor BackdropItem::tint(const platform::BackdropView& backdrop) const
{
    return stage().material(backdrop.maskViews().empty() ? stage().theme.chrome : stage().theme.disc);
}

bool BackdropItem::needsDrawing(platform::View& view, bool visible)
{
    assertHere();
    const auto& backdrop = dynamic_cast<const platform::BackdropView&>(view);
    if (!visible)
        return false;
    return m_masks != masksOf(backdrop) || (stage().liveBlur && m_blur.isStale(stage(), windowRect(), tint(backdrop)));
}

std::vector<Sprite> BackdropItem::draw(platform::View& view)
{
    assertHere();
    const auto& backdrop = dynamic_cast<const platform::BackdropView&>(view);
    const QColor color = tint(backdrop);
    m_masks = masksOf(backdrop);
    QImage blur;
    if (stage().liveBlur) {
        if (m_blur.isStale(stage(), windowRect(), color))
            m_blur.update(stage(), windowRect(), color);
        blur = m_blur.image();
    } else {
        blur = QImage(1, 1, QImage::Format_ARGB32_Premultiplied);
        blur.fill(color);
    }
    if (m_masks.empty() || blur.isNull())
        return {{ownRect(), {}, blur, true}};
    return {{ownRect(), {}, masked(blur), false}};
}

QImage BackdropItem::masked(const QImage& blur) const
{
    const double scale = stage().scale;
    const QSize size = (ownRect().size() * scale).toSize();
    const auto layer = [&](const auto& paint) {
        QImage image(size, QImage::Format_ARGB32_Premultiplied);
        image.fill(Qt::transparent);
        QPainter painter(&image);
        painter.setRenderHint(QPainter::SmoothPixmapTransform);
        painter.scale(scale, scale);
        paint(painter);
        painter.end();
        return image;
    };
    using namespace platform;
    const auto has = [](const Mask& mask, unsigned flag) { return (mask.flags & flag) != 0; };
    const bool shaped =
        std::any_of(m_masks.begin(), m_masks.end(), [&](const Mask& mask) { return has(mask, kBackdropMaskShape); });

    // A shape's own darkening would only show as a rim: nothing is left where it is opaque.
    const QImage shade = layer([&](QPainter& painter) {
        for (const Mask& mask : m_masks)
            if (has(mask, kBackdropMaskColor) && !has(mask, kBackdropMaskShape))
                painter.drawImage(toQRectF(mask.frame), toQImage(mask.image));
        painter.setCompositionMode(QPainter::CompositionMode_SourceIn);
        painter.fillRect(ownRect(), kGlyphShade);
    });
    const QImage shape = layer([&](QPainter& painter) {
        for (const Mask& mask : m_masks)
            if (!shaped || has(mask, kBackdropMaskShape))
                painter.fillRect(toQRectF(mask.frame), Qt::black);
        painter.setCompositionMode(QPainter::CompositionMode_DestinationOut);
        for (const Mask& mask : m_masks)
            if (has(mask, kBackdropMaskShape))
                painter.drawImage(toQRectF(mask.frame), toQImage(mask.image));
    });
    const QImage rim = layer([&](QPainter& painter) {
        painter.fillRect(ownRect(), shaped ? kRim : QColor(Qt::transparent));
        painter.setCompositionMode(QPainter::CompositionMode_DestinationOut);
        painter.drawImage(ownRect().adjusted(kRimWidth, kRimWidth, -kRimWidth, -kRimWidth), shape);
    });
    return layer([&](QPainter& painter) {
        painter.drawImage(ownRect(), blur);
        painter.drawImage(ownRect(), shade);
        painter.drawImage(ownRect(), rim);
        painter.setCompositionMode(QPainter::CompositionMode_DestinationIn);
        painter.drawImage(ownRect(), shape);
    });
}

} // namespace qtui
