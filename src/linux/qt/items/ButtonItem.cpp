#include "linux/qt/items/ButtonItem.h"

#include "linux/qt/items/Bitmaps.h"
#include "linux/qt/items/Text.h"
#include "platform/views/Button.h"

#include <QPainter>

namespace qtui {

namespace {

/// Between a title and the button's edges: least, when there is little room.
constexpr double kTitleMargin = 2;

QColor faded(QColor color, double opacity)
{
    color.setAlphaF(color.alphaF() * static_cast<float>(opacity));
    return color;
}

} // namespace

QColor ButtonItem::tint(const platform::View& view) const
{
    const auto* button = dynamic_cast<const platform::Button*>(&view);
    if (button && button->isDestructive())
        return stage().theme.destructive;
    const auto own = view.effectiveTintColor();
    return own ? toQColor(*own) : stage().theme.accent;
}

bool ButtonItem::needsDrawing(platform::View& view, bool)
{
    assertHere();
    return m_drawnTint.isValid() && tint(view) != m_drawnTint;
}

std::vector<Sprite> ButtonItem::draw(platform::View& view)
{
    assertHere();
    const auto& button = dynamic_cast<const platform::Button&>(view);
    std::vector<Sprite> sprites = ViewItem::draw(view);
    m_drawnTint = tint(view);
    const double opacity = !button.isEnabled()      ? metrics::kDisabledOpacity
                           : button.isHighlighted() ? metrics::kPressedOpacity
                                                    : 1.0;
    const base::EdgeInsets insets = button.imageInsets();
    const QPointF center = ownRect().adjusted(insets.left, insets.top, -insets.right, -insets.bottom).center();
    const auto centered = [&](QSizeF size) {
        const QPointF corner(center.x() - size.width() / 2, center.y() - size.height() / 2);
        return QRectF(stage().snapped(corner), size);
    };

    if (const auto image = button.currentImage()) {
        const QImage picture = toQImage(image);
        // A picture says itself how it looks when pressed, by its second image or its opacity.
        const bool sharp = image->scale() == stage().scale;
        const QImage shown = button.isEnabled() ? picture : dimmed(picture, metrics::kDisabledOpacity);
        sprites.push_back({centered({image->size().width, image->size().height}), {}, shown, !sharp});
    } else if (!button.glyph().empty()) {
        const QImage glyph = stage().icons.glyph(button.glyph(), faded(m_drawnTint, opacity), stage().scale);
        sprites.push_back({centered(QSizeF(glyph.size()) / stage().scale), {}, glyph, false});
    } else if (!button.title().empty()) {
        const auto weight = button.isEmphasized() ? QFont::DemiBold : QFont::Normal;
        const TextLine line = squeezed({QString::fromStdString(button.title()).simplified(),
                                        systemFont(metrics::kTitleSize, weight), Qt::AlignHCenter},
                                       ownRect().width() - 2 * kTitleMargin);
        sprites.push_back(paintedSprite(textArea(line, ownRect()), stage().scale, [&](QPainter& painter) {
            drawText(painter, line, ownRect(), faded(m_drawnTint, opacity), stage().scale);
        }));
    }
    return sprites;
}

} // namespace qtui
