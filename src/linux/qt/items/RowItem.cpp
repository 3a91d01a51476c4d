#include "linux/qt/items/RowItem.h"

#include "linux/qt/items/Bitmaps.h"
#include "linux/qt/items/Text.h"
#include "platform/views/Window.h"

#include <QPainter>

#include <algorithm>

namespace qtui {

namespace {

using platform::ListRow;

/// Between the ground of a pressed row and the list's edges.
constexpr double kGroundMargin = 8;
constexpr int kTitleLines = 2;

QColor faded(QColor color, double opacity)
{
    color.setAlphaF(color.alphaF() * static_cast<float>(opacity));
    return color;
}

double opacityOf(const ListRow& row)
{
    return row.isEnabled() || row.isBusy() ? 1 : metrics::kDisabledOpacity;
}

bool runsRightToLeft(const platform::View& view)
{
    const auto window = view.window();
    return window && window->isRightToLeft();
}

} // namespace

QColor RowItem::tint(const platform::View& view) const
{
    const auto own = view.effectiveTintColor();
    return own ? toQColor(*own) : stage().theme.accent;
}

QRectF RowItem::placed(double start, double width) const
{
    const double x = m_rightToLeft ? ownRect().width() - start - width : start;
    return {x, 0, width, ownRect().height()};
}

bool RowItem::needsDrawing(platform::View& view, bool)
{
    assertHere();
    return m_drawnTint.isValid() && (tint(view) != m_drawnTint || runsRightToLeft(view) != m_rightToLeft);
}

std::vector<Sprite> RowItem::draw(platform::View& view)
{
    assertHere();
    const auto& row = dynamic_cast<const ListRow&>(view);
    std::vector<Sprite> sprites = ViewItem::draw(view);
    m_drawnTint = tint(view);
    m_rightToLeft = runsRightToLeft(view);
    if (row.isHighlighted()) {
        const QRectF ground = ownRect().adjusted(kGroundMargin, 0, -kGroundMargin, 0);
        sprites.push_back(paintedSprite(ground, stage().scale, [&](QPainter& painter) {
            painter.setPen(Qt::NoPen);
            painter.setBrush(stage().theme.pressed);
            painter.drawRoundedRect(ground, metrics::kCorner, metrics::kCorner);
        }));
    }
    drawIcon(row, sprites);
    drawTitle(row, sprites);
    return sprites;
}

void RowItem::drawIcon(const ListRow& row, std::vector<Sprite>& sprites) const
{
    const QRectF column = placed(ListRow::kMargin, ListRow::kIconSize);
    const auto centered = [&](QSizeF size) {
        const QPointF corner(column.center().x() - size.width() / 2, column.center().y() - size.height() / 2);
        return QRectF(stage().snapped(corner), size);
    };
    if (const auto image = row.currentImage()) {
        const QImage picture = toQImage(image);
        const QSizeF size = QSizeF(picture.size()).scaled(ListRow::kIconSize, ListRow::kIconSize, Qt::KeepAspectRatio);
        sprites.push_back({centered(size), {}, opacityOf(row) < 1 ? dimmed(picture, opacityOf(row)) : picture, true});
    } else if (!row.glyph().empty()) {
        const QImage glyph = stage().icons.glyph(row.glyph(), faded(m_drawnTint, opacityOf(row)), stage().scale);
        sprites.push_back({centered(QSizeF(glyph.size()) / stage().scale), {}, glyph, false});
    }
}

void RowItem::drawTitle(const ListRow& row, std::vector<Sprite>& sprites) const
{
    const double trailing = std::max(ListRow::kMargin, row.trailingInset());
    const QRectF column = placed(ListRow::kTitleStart, ownRect().width() - ListRow::kTitleStart - trailing);
    if (row.title().empty() || column.width() <= 0)
        return;
    const QFont font = systemFont(metrics::kTitleSize);
    const QString title = QString::fromStdString(row.title()).simplified();
    const double height = lineHeight(font);
    const int most = row.trailingInset() > 0 || 2 * height > ownRect().height() ? 1 : kTitleLines;
    const auto lines = wrapped(title, font, column.width(), most);
    QRectF frame(column.left(), (ownRect().height() - height * static_cast<double>(lines.size())) / 2, column.width(),
                 height);
    const QColor color = faded(stage().theme.text, opacityOf(row));
    for (const QString& each : lines) {
        const TextLine line{each, font, m_rightToLeft ? Qt::AlignRight : Qt::AlignLeft};
        sprites.push_back(paintedSprite(textArea(line, frame), stage().scale, [&](QPainter& painter) {
            drawText(painter, line, frame, color, stage().scale);
        }));
        frame.translate(0, height);
    }
}

} // namespace qtui
